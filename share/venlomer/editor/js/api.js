// The server's JSON API. Every answer the page shows comes from here: the page draws, the
// server (and through it the library) decides.
export async function get(path) {
  const response = await fetch(path, { cache: 'no-store' });
  return answer(response);
}

export async function post(path, body = {}) {
  const response = await fetch(path, {
    method: 'POST',
    headers: { 'Content-Type': 'application/json' },
    body: JSON.stringify(body),
  });
  return answer(response);
}

async function answer(response) {
  const data = await response.json().catch(() => ({ error: `HTTP ${response.status}` }));
  if (!response.ok) {
    throw new Error(data.error || `HTTP ${response.status}`);
  }
  return data;
}
