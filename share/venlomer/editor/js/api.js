// The server's JSON API. Every answer the page shows comes from here: the page draws, the
// server (and through it the library) decides. A request that gets no answer at all means
// the server is gone; whoever listens through onGone() is told, and told again when an
// answer comes back.
const listeners = [];
let gone = false;

export function onGone(listener) {
  listeners.push(listener);
}

function reachable(yes) {
  if (gone === !yes) return;
  gone = !yes;
  for (const listener of listeners) listener(gone);
}

async function send(path, init) {
  let response;
  try {
    response = await fetch(path, { cache: 'no-store', ...init });
  } catch (error) {
    reachable(false);
    throw new Error('the editor\'s server does not answer');
  }
  reachable(true);
  return answer(response);
}

export function get(path) {
  return send(path, {});
}

export function post(path, body = {}) {
  return send(path, {
    method: 'POST',
    headers: { 'Content-Type': 'application/json' },
    body: JSON.stringify(body),
  });
}

async function answer(response) {
  const data = await response.json().catch(() => ({ error: `HTTP ${response.status}` }));
  if (!response.ok) {
    const error = new Error(data.error || `HTTP ${response.status}`);
    error.data = data;
    throw error;
  }
  return data;
}
