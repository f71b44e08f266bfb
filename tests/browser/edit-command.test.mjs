// venlomer edit as a process: it prints its URL, stops cleanly on SIGTERM and SIGINT,
// keeps unsaved changes in the recovery file after every change, refuses to start over
// them, and loads them with --recover; one editor per constraint file, a killed editor's
// lock taken over, and no torn or lost file when editors are killed while saving. No
// browser: Node's fetch speaks to the API as the page does.
//
//   node edit-command.test.mjs VENLOMER WORKDIR
import { spawn, spawnSync } from 'node:child_process';
import { existsSync, mkdirSync, readdirSync, readFileSync, rmSync, writeFileSync } from 'node:fs';
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

const empty = spawnSync(venlomer, ['edit', '--design', design, '--pcf', pcf, '--chipdb', ''],
  { encoding: 'utf8', timeout: 30000 });
check(empty.status === 2 && /--chipdb wants a name/.test(empty.stderr), `--chipdb "" is bad usage, exit 2 (${empty.status}: ${empty.stderr})`);

// One editor per constraint file: the second names the first.
run = await start();
const second = await start();
check(second.code === 1 && second.output().includes(`pid ${run.child.pid}`) &&
  second.output().includes(`127.0.0.1:${run.port}`), `a second editor is refused naming the first's pid and port (${second.output()})`);
// A kill -9 loses nothing: the change before it is in the recovery file already.
await post(run.url, 'assign', { port: 'a', pin: '11' });
run.child.kill('SIGKILL');
await run.exited;
check(readFileSync(recovery, 'utf8') === '# mine\nset_io b 10\nset_io a 11\n', 'the recovery file holds the last change before a kill -9');
run = await start(['--recover']);
check(run.url && /Took over .*top\.pcf\.lock/.test(run.output()), `the killed editor's lock is taken over (${run.output()})`);
const recovered = await (await fetch(`${run.url}api/state`)).json();
check(recovered.assignments['11'] === 'a', 'and its last change is back');

// Saving over a file someone changed meanwhile is refused; nothing is written.
writeFileSync(pcf, '# mine\nset_io b 10\n# added by hand\n');
const clash = await post(run.url, 'save', {});
check(clash.status === 409 && clash.body.changedOnDisk === true, 'Save refuses a file changed on disk');
check(readFileSync(pcf, 'utf8') === '# mine\nset_io b 10\n# added by hand\n', 'and leaves it as it is');
const merged = await post(run.url, 'take-disk', { reapply: true });
check(merged.status === 200 && (await post(run.url, 'save', {})).status === 200, 'the new file with the edits on top is saved');
check(readFileSync(pcf, 'utf8') === '# mine\nset_io b 10\n# added by hand\nset_io a 11\n', 'keeping both');
run.child.kill('SIGTERM');
await run.exited;

// The longest legal name still has a recovery file.
const longPcf = path.join(work, `${'p'.repeat(251)}.pcf`);
writeFileSync(longPcf, '');
run = await start([], longPcf);
await post(run.url, 'assign', { port: 'b', pin: '12' });
run.child.kill('SIGKILL');
await run.exited;
const kept = readdirSync(work).filter((name) => name.endsWith('.recovery') && name.startsWith('ppp'));
check(kept.length === 1 && readFileSync(path.join(work, kept[0]), 'utf8') === 'set_io b 12\n', `a 255-byte name keeps its recovery (${kept})`);
run = await start(['--recover'], longPcf);
check(run.url && /Loaded the unsaved changes/.test(run.output()), 'and a later start finds it');
run.child.kill('SIGTERM');
await run.exited;

// Two editors, the first killed while saving, again and again: the file is always one
// whole plan, never torn, and each new editor takes over the lock and the recovery.
writeFileSync(pcf, '# mine\n');
rmSync(recovery, { force: true });
const whole = new Set(['# mine\n', '# mine\nset_io b 10\n', '# mine\nset_io b 11\n']);
for (let round = 0; round < 12; round += 1) {
  const editor = await start(existsSync(recovery) ? ['--recover'] : []);
  check(editor.url, `round ${round}: an editor starts`);
  const held = existsSync(recovery) ? readFileSync(recovery, 'utf8') : null;
  const rival = await start(['--discard-recovery']);
  check(rival.code === 1 && /pid/.test(rival.output()), `round ${round}: the second is refused while the first runs`);
  check((existsSync(recovery) ? readFileSync(recovery, 'utf8') : null) === held, `round ${round}: and the first one's recovery is untouched`);
  const state = await (await fetch(`${editor.url}api/state`)).json();
  const pin = state.assignments['10'] === 'b' ? '11' : '10';
  await post(editor.url, 'take-disk', { reapply: false }).catch(() => {});
  await post(editor.url, 'assign', { port: 'b', pin });
  const saving = post(editor.url, 'save', {}).catch(() => null);
  await new Promise((resolve) => setTimeout(resolve, round * 3));
  editor.child.kill('SIGKILL');
  await editor.exited;
  await saving;
  check(whole.has(readFileSync(pcf, 'utf8')), `round ${round}: the file is whole after a kill -9 while saving`);
}
