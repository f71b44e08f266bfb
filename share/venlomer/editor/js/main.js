// The editor page: draws what the server answers and sends what the user does.
import { get, onGone, post } from './api.js';
import { Floorplan } from './floorplan.js';
import { Tree } from './tree.js';

// The compare-flag words come from the server, which is what judges them.
let FLAGS = [];
const $ = (id) => document.getElementById(id);

let state = null;
let device = null;
let floorplan = null;
let tree = null;

function show(error) {
  const box = $('message');
  box.textContent = error.message || String(error);
  box.hidden = false;
  clearTimeout(show.timer);
  show.timer = setTimeout(() => { box.hidden = true; }, 5000);
}

// An answer holds only the part of the state its request can change (the plan, or the
// selection and the highlight); every field of that part is there, so laying it over
// what the page holds gives the server's state after the change.
async function act(promise) {
  try {
    // Spread after the wait: another answer may have come in meanwhile.
    const answer = await promise;
    render({ ...state, ...answer });
  } catch (error) {
    show(error);
  }
}

function element(tag, props = {}, ...children) {
  const node = document.createElement(tag);
  Object.assign(node, props);
  for (const child of children) node.append(child);
  return node;
}

function render(next) {
  state = next;
  const matched = new Set(state.matches);
  const selected = new Set(state.selected);
  const problemPorts = new Set(state.problemPorts);
  $('files').textContent = `${state.files.pcf} · ${state.files.design} · ${device.name} ${device.package}`;
  const saved = $('saved');
  saved.dataset.saved = String(state.saved);
  saved.textContent = state.saved ? 'saved' : 'unsaved';
  $('undo').disabled = !state.canUndo;
  $('redo').disabled = !state.canRedo;
  $('found').textContent = state.matches.length ? `${state.matches.length} found` : '';

  floorplan.update(state);
  tree.update(selected, matched);

  const list = $('ports');
  list.replaceChildren();
  for (const port of state.ports) {
    const item = element('li', { draggable: true, title: `${port.direction}${port.clock ? ', clock' : ''}` },
      element('span', { className: 'name', textContent: port.name }),
      element('span', { className: 'pin', textContent: port.pin || '—' }));
    item.dataset.id = port.id;
    item.classList.toggle('sel', selected.has(port.id));
    item.classList.toggle('hl', matched.has(port.id));
    item.classList.toggle('problem', problemPorts.has(port.name));
    item.addEventListener('click', (event) => select(port.id, event.shiftKey, false));
    item.addEventListener('dragstart', (event) => {
      event.dataTransfer.setData('text/plain', port.name);
      event.dataTransfer.effectAllowed = 'link';
    });
    list.append(item);
  }

  const problems = $('problems');
  problems.replaceChildren();
  for (const problem of state.problems) {
    problems.append(element('li', { className: problem.severity, textContent: problem.message }));
  }
  $('problemCount').textContent = state.problems.length ? `(${state.problems.length})` : '';
  loadProperties();
}

async function loadProperties() {
  const panel = $('properties-panel');
  let answer;
  try {
    answer = await get('/api/properties');
  } catch (error) {
    show(error);
    return;
  }
  panel.replaceChildren();
  if (!answer.id) {
    panel.textContent = 'Nothing selected.';
    return;
  }
  const table = element('table');
  for (const property of answer.properties) {
    table.append(element('tr', {}, element('td', { textContent: property.name }),
      element('td', { textContent: String(property.value) })));
  }
  panel.append(element('div', { className: 'what', textContent: answer.id }), table);
  if (answer.kind === 'port') {
    const port = answer.id.slice('port:'.length);
    const current = state.ports.find((p) => p.name === port);
    const choose = element('select', { id: 'pinChoice' });
    choose.append(element('option', { value: '', textContent: '(no pin)' }));
    for (const pin of device.pins) {
      const taken = state.assignments[pin.name];
      choose.append(element('option', {
        value: pin.name,
        textContent: `${pin.name} (bank ${pin.bank})${taken && taken !== port ? ' – ' + taken : ''}`,
      }));
    }
    choose.value = current ? current.pin : '';
    choose.addEventListener('change', () => {
      if (choose.value) {
        act(post('/api/assign', { port, pin: choose.value }));
      } else {
        act(post('/api/unassign', { port }));
      }
    });
    panel.append(element('label', {}, 'Pin ', choose));
  }
}

function select(id, shift, descend) {
  act(post('/api/select', { id, mode: shift ? 'toggle' : 'replace', descend }));
}

function search(event) {
  event?.preventDefault();
  const flags = FLAGS.filter((flag) => $(`flag-${flag}`).checked);
  act(post('/api/search', { property: $('property').value, value: $('value').value, flags }));
}

function clearAll() {
  $('value').value = '';
  act(post('/api/search', { clear: true }).then(() => post('/api/select', { clear: true })));
}

function undo(redo) {
  if (!state) return;
  act(post(redo ? '/api/redo' : '/api/undo', { step: state.revision }));
}

async function save() {
  try {
    render({ ...state, ...await post('/api/save') });
  } catch (error) {
    if (error.data?.changedOnDisk) {
      conflict(error.data);
    } else {
      show(error);
    }
  }
}

// Save found the file changed by someone else: the user chooses what to keep.
function conflict(data) {
  $('conflictText').textContent = data.error;
  const lines = $('conflictLines');
  lines.replaceChildren(...(data.conflicts || []).map((line) => element('li', { textContent: line })));
  $('reapply').disabled = (data.conflicts || []).length > 0;
  $('conflict').hidden = false;
}

async function takeDisk(reapply) {
  try {
    render({ ...state, ...await post('/api/take-disk', { reapply }) });
    $('conflict').hidden = true;
  } catch (error) {
    if (error.data?.changedOnDisk) {
      conflict(error.data);
    } else {
      show(error);
    }
  }
}

// While the server is gone the page is covered, so that nothing looks editable, and asks
// every 2 seconds; when it answers again the page starts over from its state.
function watchServer() {
  onGone((gone) => {
    $('gone').hidden = !gone;
    document.body.dataset.gone = String(gone);
    clearInterval(watchServer.timer);
    if (gone) {
      watchServer.timer = setInterval(() => get('/api/ping').catch(() => {}), 2000);
    } else if (state) {
      location.reload();
    }
  });
  setInterval(() => { if ($('gone').hidden) get('/api/ping').catch(() => {}); }, 5000);
}

function keys(event) {
  const typing = ['INPUT', 'SELECT', 'TEXTAREA'].includes(document.activeElement?.tagName);
  const ctrl = event.ctrlKey || event.metaKey;
  if (event.key === '/' && !typing) {
    event.preventDefault();
    $('value').focus();
  } else if (event.key === 'Escape') {
    document.activeElement?.blur();
    clearAll();
  } else if (ctrl && event.key.toLowerCase() === 'z') {
    event.preventDefault();
    undo(event.shiftKey);
  } else if (ctrl && event.key.toLowerCase() === 's') {
    event.preventDefault();
    save();
  }
}

async function start() {
  FLAGS = (await get('/api/flags')).flags;
  for (const flag of FLAGS) {
    const box = element('input', { type: 'checkbox', id: `flag-${flag}`, checked: flag === 'exact' });
    $('flags').append(element('label', {}, box, ` ${flag}`));
  }
  [device, state] = await Promise.all([get('/api/device'), get('/api/state')]);
  document.documentElement.style.setProperty('--sel', device.selectedPath[1] || '#4477aa');
  floorplan = new Floorplan($('floorplan'), $('tip'), device, {
    select,
    assign: (port, pin) => act(post('/api/assign', { port, pin })),
  });
  floorplan.legend($('legend'));
  tree = new Tree($('tree'), await get('/api/tree'), select);
  $('search').addEventListener('submit', search);
  $('clear').addEventListener('click', clearAll);
  $('undo').addEventListener('click', () => undo(false));
  $('redo').addEventListener('click', () => undo(true));
  $('auto').addEventListener('click', () => act(post('/api/auto')));
  $('save').addEventListener('click', save);
  $('reapply').addEventListener('click', () => takeDisk(true));
  $('takeDisk').addEventListener('click', () => takeDisk(false));
  $('keepEditing').addEventListener('click', () => { $('conflict').hidden = true; });
  document.addEventListener('keydown', keys);
  render(state);
  document.body.dataset.ready = 'true';
}

watchServer();
start().catch(show);
