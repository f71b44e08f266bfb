// venlomer edit as a process: it prints its URL, stops cleanly on SIGTERM and SIGINT,
// keeps unsaved changes in the recovery file, refuses to start over them, and loads them
// with --recover. No browser: Node's fetch speaks to the API as the page does.
//
//   node edit-command.test.mjs VENLOMER WORKDIR
import { spawn } from 'node:child_process';
import { existsSync, mkdirSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
import path from 'node:path';

const [venlomer, work] = process.argv.slice(2);
rmSync(work, { recursive: true, force: true });
mkdirSync(work, { recursive: true });
const design = path.join(work, 'top.json');
const pcf = path.join(work, 'top.pcf');
const recovery = `${pcf}.recovery`;
writeFileSync(design, JSON.stringify({
  creator: 'Yosys',
  modules: { top: { attributes: { top: '1' }, ports: { a: { direction: 'input', bits: [2] },
    b: { direction: 'output', bits: [3] } }, cells: {}, netnames: {} } },
}));
writeFileSync(pcf, '# mine\n');
const chipdb = process.env.VENLOMER_DEMO_CHIPDB;

function check(condition, what) {
  if (!condition) {
    console.error(`FAIL: ${what}`);
    process.exit(1);
  }
  console.log(`ok - ${what}`);
}

// Runs venlomer edit; resolves with {url, child, output()} once the URL is printed, or with
// {code, output} when it exits first.
function start(extra = [], plan = pcf) {
  const child = spawn(venlomer, ['edit', '--design', design, '--pcf', plan, '--chipdb', chipdb,
    '--package', 'dq50', ...extra], { stdio: ['ignore', 'pipe', 'pipe'] });
  let out = '';
  child.stdout.on('data', (chunk) => { out += chunk; });
  child.stderr.on('data', (chunk) => { out += chunk; });
  const exited = new Promise((resolve) => child.on('exit', (code) => resolve(code)));
  return new Promise((resolve, reject) => {
    const timer = setTimeout(() => reject(new Error(`no answer within 60 s: ${out}`)), 60000);
    child.stdout.on('data', () => {
      const found = out.match(/http:\/\/127\.0\.0\.1:(\d+)\//);
      if (found) {
        clearTimeout(timer);
        resolve({ url: found[0], port: Number(found[1]), child, exited, output: () => out });
      }
    });
    exited.then((code) => {
      clearTimeout(timer);
      resolve({ code, output: () => out });
    });
  });
}

async function post(url, route, body) {
  const response = await fetch(`${url}api/${route}`, {
    method: 'POST', headers: { 'Content-Type': 'application/json' }, body: JSON.stringify(body),
  });
  return { status: response.status, body: await response.json() };
}

let run = await start();
check(run.url, `it prints the URL to open (${run.url})`);
const assigned = await post(run.url, 'assign', { port: 'b', pin: '10' });
check(assigned.status === 200 && assigned.body.saved === false, 'an assignment leaves unsaved work');

// Another session cannot take the port of a running one.
const busy = await start(['--port', String(run.port)], path.join(work, 'other.pcf'));
check(busy.code === 1 && /cannot listen/.test(busy.output()), `a port in use is refused, exit 1 (${busy.code}: ${busy.output()})`);

run.child.kill('SIGTERM');
check(await run.exited === 0, 'SIGTERM stops it with exit 0');
check(/unsaved changes kept in .*top\.pcf\.recovery/.test(run.output()), 'and it says where the unsaved work went');
check(readFileSync(recovery, 'utf8') === '# mine\nset_io b 10\n', 'the recovery file holds the plan');
check(readFileSync(pcf, 'utf8') === '# mine\n', 'the constraint file is untouched');

run = await start();
check(run.code === 1 && /--recover/.test(run.output()), 'a start over unsaved work is refused and names --recover');

run = await start(['--recover']);
check(run.url && /Loaded the unsaved changes/.test(run.output()), '--recover loads them');
const state = await (await fetch(`${run.url}api/state`)).json();
check(state.assignments['10'] === 'b' && state.saved === false, 'as unsaved work');
const saved = await post(run.url, 'save', {});
check(saved.status === 200 && saved.body.saved, 'Save writes them');
check(!existsSync(recovery), 'and removes the recovery file');
run.child.kill('SIGINT');
check(await run.exited === 0 && /nothing unsaved/.test(run.output()), 'SIGINT stops it; nothing unsaved');
check(readFileSync(pcf, 'utf8') === '# mine\nset_io b 10\n', 'the constraint file holds the plan');

const usage = await start(['--port', 'eighty']);
check(usage.code === 2, 'a malformed --port is bad usage, exit 2');
