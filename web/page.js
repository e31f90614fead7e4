// What pages that run the engine share: files fetched with a loading bar, a line for what goes wrong.

const element = id => document.getElementById(id);

// Says what is wrong, in one line on the page.
export function fail(text) {
    element('message').textContent = text;
    document.body.dataset.state = 'failed';
}

export function progress(share) {
    element('bar').style.width = `${100 * share}%`;
}

export function hasWebGL() {
    return Boolean(document.createElement('canvas').getContext('webgl'));
}

async function fetchOne(url, onBytes) {
    const response = await fetch(url);
    if (!response.ok) throw new Error(`${url.split('/').pop()}: cannot be loaded (${response.status})`);
    const chunks = [], reader = response.body.getReader();
    for (let part; !(part = await reader.read()).done;) {
        chunks.push(part.value);
        onBytes(part.value.length);
    }
    return new Uint8Array(await new Blob(chunks).arrayBuffer());
}

// Fetches files, of which the sizes are known, at once. The bytes, in their order.
export function fetchAll(urls, sizes) {
    const total = sizes.reduce((sum, size) => sum + size, 0);
    let got = 0;
    return Promise.all(urls.map(url => fetchOne(url, bytes => progress(Math.min(1, (got += bytes) / total)))));
}

// The engine's log: I/ lines are for the console, others on the page as well, the first one of them.
export function log(line) {
    if (line.startsWith('I/')) return console.info(line);
    console.error(line);
    if (document.body.dataset.state !== 'failed') fail(line.replace(/^E\/\w+: /, ''));
}
