// The page in chromium when things go wrong around it: the constraint file changed on disk
// before a Save (the page offers to re-apply its edits on the new file), and the server
// gone and back (the page covers itself and recovers). The bundled demo device keeps it
// quick; no synthesis needed.
//
//   node editor-reliability.test.mjs VENLOMER WORKDIR
import { spawn } from 'node:child_process';
import { existsSync, mkdirSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
import { createRequire } from 'node:module';
import path from 'node:path';

const [venlomer, work] = process.argv.slice(2);
const CHROMIUM = '/usr/bin/chromium';
const chipdb = process.env.VENLOMER_DEMO_CHIPDB;

function check(condition, what) {
  if (!condition) throw new Error(what);
  console.log(`ok - ${what}`);
}

const { chromium } = createRequire(import.meta.url)('playwright-core');
if (!existsSync(CHROMIUM)) {
  console.error(`FAIL: ${CHROMIUM} is not installed: run scripts/bootstrap`);
  process.exit(1);
}
rmSync(work, { recursive: true, force: true });
mkdirSync(work, { recursive: true });
const design = path.join(work, 'top.json');
const pcf = path.join(work, 'top.pcf');
writeFileSync(design, JSON.stringify({
  creator: 'Yosys',
  modules: { top: { attributes: { top: '1' }, ports: { a: { direction: 'input', bits: [2] },
    b: { direction: 'output', bits: [3] } }, cells: {}, netnames: {} } },
}));
writeFileSync(pcf, '# pins\n');

function start(port, extra = []) {
  const child = spawn(venlomer, ['edit', '--design', design, '--pcf', pcf, '--chipdb', chipdb,
    '--package', 'dq50', '--port', String(port), ...extra], { stdio: ['ignore', 'pipe', 'inherit'] });
  const exited = new Promise((resolve) => child.on('exit', resolve));
  return new Promise((resolve, reject) => {
    let out = '';
    child.stdout.on('data', (chunk) => {
      out += chunk;
      const found = out.match(/http:\/\/127\.0\.0\.1:(\d+)\//);
      if (found) resolve({ child, exited, url: found[0], port: Number(found[1]) });
    });
    child.on('exit', (code) => reject(new Error(`venlomer edit exited with ${code}: ${out}`)));
    setTimeout(() => reject(new Error(`no URL within 30 s: ${out}`)), 30000);
  });
}

let server = await start(0);
let browser = null;
let status = 0;
try {
  browser = await chromium.launchPersistentContext(path.join(work, 'profile'), {
    executablePath: CHROMIUM,
    headless: true,
    bypassCSP: true,
    args: ['--headless', '--no-sandbox', '--disable-gpu', '--no-first-run',
      '--disable-background-networking', '--disable-component-update', '--disable-sync'],
  });
  const page = await browser.newPage();
  await page.goto(server.url);
  await page.waitForSelector('body[data-ready="true"]', { timeout: 30000 });

  // An edit here, a line added by hand there, then Save.
  await page.click('#ports li[data-id="port:b"]');
  await page.waitForSelector('#pinChoice');
  await page.selectOption('#pinChoice', '10');
  await page.waitForFunction(() => document.querySelector('#saved').textContent === 'unsaved');
  writeFileSync(pcf, '# pins\nset_io a 11\n');
  await page.click('#save');
  await page.waitForSelector('#conflict:not([hidden])');
  check(readFileSync(pcf, 'utf8') === '# pins\nset_io a 11\n', 'Save leaves a file changed on disk alone and asks');
  await page.click('#reapply');
  await page.waitForSelector('#conflict', { state: 'hidden' });
  await page.click('#save');
  await page.waitForFunction(() => document.querySelector('#saved').textContent === 'saved');
  check(readFileSync(pcf, 'utf8') === '# pins\nset_io a 11\nset_io b 10\n', 'the new file with this editor\'s edit on top is saved');

  // The server goes: the page covers itself instead of looking editable.
  server.child.kill('SIGTERM');
  await server.exited;
  await page.waitForSelector('#gone:not([hidden])', { timeout: 15000 });
  check(await page.isVisible('#gone'), 'the page says plainly that the server is gone');
  // And it comes back on the same port: the page starts over from its state.
  server = await start(server.port);
  await page.waitForSelector('#gone', { state: 'hidden', timeout: 15000 });
  await page.waitForSelector('body[data-ready="true"]', { timeout: 15000 });
  const pin = await page.textContent('#ports li[data-id="port:b"] .pin');
  check(pin === '10', 'and recovers when it is back');
} catch (error) {
  console.error(`FAIL: ${error.stack || error}`);
  status = 1;
} finally {
  await browser?.close();
  server.child.kill('SIGTERM');
  await server.exited;
}
process.exit(status);
