// Drives the editor page in Debian's chromium, headless, as a user would: search, select a
// bank, assign by drag and through the port's panel, undo, redo, save; then nextpnr-ice40
// must place the design with the saved constraint file, and a screenshot must show
// something. A missing tool fails the test and names scripts/bootstrap.
//
//   node editor.test.mjs VENLOMER VERILOG WORKDIR
import { spawn, spawnSync } from 'node:child_process';
import { existsSync, mkdirSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
import { createRequire } from 'node:module';
import path from 'node:path';

const [venlomer, verilog, work] = process.argv.slice(2);
const CHROMIUM = '/usr/bin/chromium';
const BOOTSTRAP = 'run scripts/bootstrap (it installs chromium, yosys, nextpnr-ice40 and ' +
  'playwright-core into tests/browser/node_modules)';

function fail(why) {
  console.error(`FAIL: ${why}`);
  process.exit(1);
}

function check(condition, what) {
  if (!condition) throw new Error(what);
  console.log(`ok - ${what}`);
}

let chromium;
try {
  ({ chromium } = createRequire(import.meta.url)('playwright-core'));
} catch {
  fail(`playwright-core is not installed: ${BOOTSTRAP}`);
}
for (const tool of ['yosys', 'nextpnr-ice40']) {
  if (spawnSync('which', [tool]).status !== 0) fail(`${tool} is not installed: ${BOOTSTRAP}`);
}
if (!existsSync(CHROMIUM)) fail(`${CHROMIUM} is not installed: ${BOOTSTRAP}`);

rmSync(work, { recursive: true, force: true });
mkdirSync(work, { recursive: true });
const netlist = path.join(work, 'top.json');
const pcf = path.join(work, 'top.pcf');
const synth = spawnSync('yosys', ['-q', '-p', `synth_ice40 -top top -json ${netlist}`, verilog],
  { encoding: 'utf8' });
if (synth.status !== 0) fail(`yosys failed: ${synth.stderr}`);
writeFileSync(pcf, '# board pins\n');

const spawned = Date.now();
const server = spawn(venlomer, ['edit', '--design', netlist, '--pcf', pcf, '--device', '8k'],
  { stdio: ['ignore', 'pipe', 'inherit'] });
const url = await new Promise((resolve, reject) => {
  let out = '';
  server.stdout.on('data', (chunk) => {
    out += chunk;
    const found = out.match(/http:\/\/127\.0\.0\.1:\d+\//);
    if (found) resolve(found[0]);
  });
  server.on('exit', (code) => reject(new Error(`venlomer edit exited with ${code}: ${out}`)));
  setTimeout(() => reject(new Error(`no URL within 60 s: ${out}`)), 60000);
});
const listening = Date.now() - spawned;

let status = 0;
let browser = null;
try {
  // A fresh profile in the work folder: nothing of a user's browser leaks in.
  browser = await chromium.launchPersistentContext(path.join(work, 'profile'), {
    executablePath: CHROMIUM,
    headless: true,
    viewport: { width: 1400, height: 900 },
    bypassCSP: true, // the test's own waits evaluate code; the page needs no such leave
    args: ['--headless', '--no-sandbox', '--disable-gpu', '--disable-quic', '--no-first-run',
      '--disable-background-networking', '--disable-component-update', '--disable-sync'],
  });
  const page = await browser.newPage();
  const errors = [];
  page.on('pageerror', (error) => errors.push(error.message));
  const opening = Date.now();
  await page.goto(url);
  await page.waitForSelector('body[data-ready="true"]', { timeout: 30000 });
  // Information only; timing is scripts/bench-editor's job.
  console.log(`# listening ${listening} ms after start; page ready ${Date.now() - opening} ms after opening it`);
  check(await page.locator('#floorplan rect').count() === 1152, 'the 8k floorplan shows 1152 tiles');
  check(await page.locator('#floorplan circle.pin').count() === 206, 'and 206 pins of ct256');

  const count = (selector) => page.locator(selector).count();
  const settle = () => page.waitForLoadState('networkidle');

  // Search Bank = 0 (exact): its 52 pins are highlighted in the first selected-path colour.
  await page.fill('#property', 'Bank');
  await page.click('header h1');
  await page.keyboard.press('/');
  check(await page.evaluate(() => document.activeElement.id) === 'value', '/ goes to the search box');
  await page.keyboard.type('0');
  await page.keyboard.press('Enter');
  await page.waitForFunction(() => document.querySelectorAll('#floorplan circle.hl').length > 0);
  check(await count('#floorplan circle.hl') === 52, 'search Bank=0 highlights 52 pins');
  const colours = await page.$$eval('#floorplan circle.hl', (all) => [...new Set(all.map((c) => c.getAttribute('fill')))]);
  const device = await (await page.request.get(`${url}api/device`)).json();
  check(colours.length === 1 && colours[0] === device.selectedPath[0], 'in the first selected-path colour');

  // Esc clears the search; a bank's node selects its pins.
  await page.keyboard.press('Escape');
  await page.waitForFunction(() => document.querySelectorAll('#floorplan circle.hl').length === 0);
  await page.click('#tree .node[data-id="bank:1"]');
  await page.waitForFunction(() => document.querySelectorAll('#floorplan circle.sel').length > 0);
  check(await count('#floorplan circle.sel') === 52, 'the node of bank 1 selects its 52 pins');

  // Drag led[0] onto pin A1.
  await page.dragAndDrop('#ports li[data-id="port:led[0]"]', '#floorplan circle[data-name="A1"]');
  await page.waitForFunction(() => document.querySelector('#ports li[data-id="port:led[0]"] .pin').textContent === 'A1');
  check(true, 'dragging led[0] onto A1 assigns it');

  // Choose B1 for led[1] in its panel.
  await page.click('#ports li[data-id="port:led[1]"]');
  await page.waitForSelector('#pinChoice');
  await page.selectOption('#pinChoice', 'A2');
  await page.waitForFunction(() => document.querySelector('#ports li[data-id="port:led[1]"] .pin').textContent === 'A2');
  check(true, 'choosing A2 in the panel of led[1] assigns it');
  check(await page.textContent('#saved') === 'unsaved', 'the plan shows unsaved');

  // Undo and redo, by keyboard.
  await page.locator('body').click({ position: { x: 5, y: 5 } }).catch(() => {});
  await page.keyboard.press('Control+z');
  await page.waitForFunction(() => document.querySelector('#ports li[data-id="port:led[1]"] .pin').textContent === '—');
  check(true, 'Ctrl+Z takes led[1] off A2');
  await page.keyboard.press('Control+Shift+Z');
  await page.waitForFunction(() => document.querySelector('#ports li[data-id="port:led[1]"] .pin').textContent === 'A2');
  check(true, 'Ctrl+Shift+Z puts it back');

  // Auto gives the rest a pin (clock on a global-buffer pin); Ctrl+S saves.
  await page.click('#auto');
  await page.waitForFunction(() => [...document.querySelectorAll('#ports li .pin')].every((p) => p.textContent !== '—'));
  await page.keyboard.press('Control+s');
  await page.waitForFunction(() => document.querySelector('#saved').textContent === 'saved');
  check(true, 'Auto, then Ctrl+S saves');
  const saved = readFileSync(pcf, 'utf8');
  check(saved.startsWith('# board pins\n') && saved.includes('set_io led[0] A1') &&
        saved.includes('set_io led[1] A2'), 'the file keeps its comment and holds both assignments');

  const screenshot = path.join(work, 'editor.png');
  await page.screenshot({ path: screenshot });
  const distinct = await page.evaluate(async (data) => {
    const image = new Image();
    image.src = `data:image/png;base64,${data}`;
    await image.decode();
    const canvas = document.createElement('canvas');
    canvas.width = image.width;
    canvas.height = image.height;
    const context = canvas.getContext('2d');
    context.drawImage(image, 0, 0);
    const pixels = context.getImageData(0, 0, image.width, image.height).data;
    const seen = new Set();
    for (let i = 0; i < pixels.length; i += 4 * 97) seen.add((pixels[i] << 16) | (pixels[i + 1] << 8) | pixels[i + 2]);
    return seen.size;
  }, readFileSync(screenshot).toString('base64'));
  check(distinct > 12, `the screenshot ${screenshot} is not blank (${distinct} colours sampled)`);
  check(errors.length === 0, `the page raised no error${errors.length ? ': ' + errors.join('; ') : ''}`);

  // The judge: nextpnr-ice40 places the design with the file the editor saved.
  const log = spawnSync('nextpnr-ice40', ['--hx8k', '--package', 'ct256', '--json', netlist,
    '--pcf', pcf, '--asc', path.join(work, 'top.asc')], { encoding: 'utf8' });
  check(log.status === 0, `nextpnr-ice40 accepts the saved file${log.status ? ': ' + log.stderr.slice(-400) : ''}`);
  check(/constrained 'led\[0\]' to bel 'X\d+\/Y\d+\/io\d'/.test(log.stderr + log.stdout), 'and constrains led[0] to a bel');
} catch (error) {
  console.error(`FAIL: ${error.message}`);
  status = 1;
} finally {
  await browser?.close();
  server.kill('SIGTERM');
  await new Promise((resolve) => server.on('exit', resolve));
}
process.exit(status);
