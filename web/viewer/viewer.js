// The viewer's page: files in, events to the program, pictures out. What is shown and what can be changed comes from the program,
// as JSON. ?file=URL shows these files, several with further &file=; &samples=1 is without antialiasing.
import createFront from './front.js';
import {fail, fetchAll, hasWebGL, progress} from './page.js';
import {inspector} from './inspector.js';
import {unzip} from './zip.js';

const element = id => document.getElementById(id);
const canvas = element('canvas'), query = new URLSearchParams(location.search);
// Numbers of events, of keys' modifiers, and keys that have other names.
const kDown = 0, kMove = 1, kUp = 2, kWheel = 3, kPinch = 4, kKey = 5;
const kKeys = {' ': 'Space', ArrowLeft: 'Left', ArrowRight: 'Right', ArrowUp: 'Up', ArrowDown: 'Down'};
const kPanButton = 2, kUpdate = 100;  // milliseconds between two looks at the state

let module, state = {}, panel, asked = true, shownAt = 0, said = 0, loads = -1, failed = 0, lost = false;

const ratio = () => window.devicePixelRatio || 1;
const modifiersOf = e => (e.shiftKey ? 1 : 0) | (e.ctrlKey ? 2 : 0) | (e.altKey ? 4 : 0);
const ask = name => module.ccall(`Page_${name}`, 'string', [], []);

// Draws again with the next frame.
function redraw() {
    asked = true;
}

function send(kind, x, y, button = 0, amount = 0, modifiers = 0, text = '') {
    module.ccall('Page_Event', null, ['number', 'number', 'number', 'number', 'number', 'number', 'string'],
        [kind, x, y, button, amount, modifiers, text]);
    redraw();
}

function set(properties) {
    module.ccall('Page_Set', 'number', ['string'], [JSON.stringify(properties)]);
    redraw();
}

function say(text) {
    element('message').textContent = text;
}

function give(name, file) {
    const place = module._malloc(file.bytes.length || 1);
    module.HEAPU8.set(file.bytes, place);
    const result = module.ccall(`Page_${name}`, 'string', ['string', 'number', 'number'], [file.name, place, file.bytes.length]);
    module._free(place);
    return result;
}

// Files of any kind: zips are opened, all others go to the program, which shows what it knows.
async function add(files) {
    for (const {name, bytes} of files) {
        let inside = [{name, bytes}];
        try {
            if (/\.zip$/i.test(name)) inside = await unzip(bytes);
        } catch (error) {
            say(`${name}: ${error.message}`);
            continue;
        }
        for (const file of inside) give('Add', file);
    }
    redraw();
}

const readAll = files => Promise.all(Array.from(files, async file => ({name: file.name, bytes: new Uint8Array(await file.arrayBuffer())})));

const keep = async files => (await readAll(files)).map(file => give('Keep', file));

// The files of dropped folders, too.
async function filesOf(items) {
    const entries = Array.from(items, item => item.webkitGetAsEntry?.()).filter(Boolean), files = [];
    while (entries.length) {
        const entry = entries.pop();
        if (entry.isFile) files.push(await new Promise((done, failed) => entry.file(done, failed)));
        if (!entry.isDirectory) continue;
        const reader = entry.createReader();
        for (let more; (more = await new Promise((done, failed) => reader.readEntries(done, failed))).length;) entries.push(...more);
    }
    return files;
}

function takeDrops() {
    const stage = element('stage');
    window.addEventListener('dragover', event => {
        event.preventDefault();
        stage.classList.add('over');
    });
    window.addEventListener('dragleave', event => event.relatedTarget || stage.classList.remove('over'));
    window.addEventListener('drop', async event => {
        event.preventDefault();
        stage.classList.remove('over');
        const {items, files} = event.dataTransfer, plain = Array.from(files);
        const found = items?.length ? await filesOf(items) : [];
        add(await readAll(found.length ? found : plain));
    });
    element('files').addEventListener('change', async event => {
        await add(await readAll(event.target.files));
        event.target.value = '';
    });
}

// One finger is the mouse; two pan with their middle and come nearer by their distance.
function takePointers() {
    const pointers = new Map();
    const middle = () => {
        const [a, b = a] = [...pointers.values()];
        return {x: (a.x + b.x) / 2, y: (a.y + b.y) / 2, distance: Math.hypot(a.x - b.x, a.y - b.y)};
    };
    const place = event => ({x: event.offsetX * ratio(), y: event.offsetY * ratio()});
    canvas.addEventListener('pointerdown', event => {
        canvas.setPointerCapture(event.pointerId);
        pointers.set(event.pointerId, place(event));
        const at = middle();
        if (pointers.size === 1) send(kDown, at.x, at.y, event.button + 1, 0, modifiersOf(event));
        if (pointers.size === 2) send(kDown, at.x, at.y, kPanButton);
    });
    canvas.addEventListener('pointermove', event => {
        if (!pointers.has(event.pointerId)) return;
        const before = middle();
        pointers.set(event.pointerId, place(event));
        const at = middle();
        send(kMove, at.x, at.y);
        if (pointers.size === 2 && before.distance > 0) send(kPinch, at.x, at.y, 0, at.distance / before.distance);
    });
    for (const name of ['pointerup', 'pointercancel'])
        canvas.addEventListener(name, event => {
            const at = middle();
            if (!pointers.delete(event.pointerId)) return;
            send(kUp, at.x, at.y, event.button + 1, 0, modifiersOf(event));
        });
    canvas.addEventListener('wheel', event => {
        event.preventDefault();
        const notch = event.deltaMode === 0 ? 100 : 3;
        send(kWheel, event.offsetX * ratio(), event.offsetY * ratio(), 0, -event.deltaY / notch, modifiersOf(event));
    }, {passive: false});
    canvas.addEventListener('contextmenu', event => event.preventDefault());
    canvas.addEventListener('dblclick', () => set({frameAll: true}));
}

function takeKeys() {
    window.addEventListener('keydown', event => {
        if (/INPUT|SELECT|BUTTON|SUMMARY/.test(event.target.tagName) || event.ctrlKey || event.metaKey) return;
        const key = kKeys[event.key] ?? (event.key.length === 1 ? event.key.toUpperCase() : event.key);
        send(kKey, 0, 0, 0, 0, key === '?' ? 0 : modifiersOf(event), key);
        if (event.key in kKeys) event.preventDefault();
    });
}

function save(blob, name) {
    const link = document.createElement('a');
    link.href = URL.createObjectURL(blob);
    link.download = name;
    link.click();
    setTimeout(() => URL.revokeObjectURL(link.href), 10000);
}

function takeButtons() {
    element('frameAll').onclick = () => set({frameAll: true});
    element('help').onclick = () => send(kKey, 0, 0, 0, 0, 0, '?');
    element('screenshot').onclick = () => {
        module._Page_DrawPlain(canvas.width, canvas.height);
        canvas.toBlob(blob => save(blob, 'picture.png'));
        redraw();
    };
    element('copy').onclick = async () => {
        const line = module.ccall('Page_Command', 'string', ['number', 'number'], [canvas.width, canvas.height]);
        await navigator.clipboard?.writeText(line).catch(() => {});
        say(line);
    };
    element('panel').onclick = () => {
        const hidden = element('inspector').toggleAttribute('hidden');
        element('panel').setAttribute('aria-expanded', String(!hidden));
        redraw();
    };
    element('play').onclick = () => set({plays: !state.plays});
    element('back').onclick = () => send(kKey, 0, 0, 0, 0, 0, 'Left');
    element('on').onclick = () => send(kKey, 0, 0, 0, 0, 0, 'Right');
    element('frame').oninput = event => set({frame: Number(event.target.value)});
    element('speed').onchange = event => set({speed: Number(event.target.value)});
}

// Shows the state on the page.
function show() {
    state = JSON.parse(ask('State'));
    if (state.said !== said) say(state.messages.at(-1) ?? '');
    said = state.said;
    if (state.failed !== failed) progress(0);
    failed = state.failed;
    progress(state.loading ?? 0);
    if (state.loads !== loads) {
        loads = state.loads;
        const scene = JSON.parse(ask('Scene'));
        panel.rebuild(scene);
        document.title = scene ? `${scene.name} - Qex` : 'Qex: viewer';
        element('name').textContent = scene?.name ?? 'Drop a scene here';
        element('animation').hidden = !(scene?.frames > 1);
        element('frame').max = Math.max((scene?.frames ?? 0) - 1, 0);
        document.body.dataset.loads = loads;
    }
    document.body.dataset.failed = failed;
    element('play').textContent = state.plays ? 'Pause' : 'Play';
    if (document.activeElement !== element('frame') || state.plays) element('frame').value = state.frame;
    element('at').textContent = state.frame.toFixed(1);
    element('keys').hidden = !state.help;
    panel.update(state);
}

function frame(now, before) {
    requestAnimationFrame(next => frame(next, now));
    const width = Math.max(1, Math.round(canvas.clientWidth * ratio())), height = Math.max(1, Math.round(canvas.clientHeight * ratio()));
    if (width !== canvas.width || height !== canvas.height) {
        Object.assign(canvas, {width, height});
        redraw();
    }
    // Pictures that would be the same are not drawn.
    if (lost || !(asked || state.plays || state.loading !== null || state.moves)) return;
    asked = false;
    const start = performance.now();
    module._Page_Frame((now - before) / 1000, width, height);
    panel.measure(performance.now() - start);
    if (now - shownAt < kUpdate && state.plays) return;
    shownAt = now;
    show();
    if (state.loading !== null) redraw();
    document.body.dataset.frames = Number(document.body.dataset.frames ?? 0) + 1;
}

function takeLosses() {
    canvas.addEventListener('webglcontextlost', event => {
        event.preventDefault();
        lost = true;
        module._Page_ContextLost();
    });
    canvas.addEventListener('webglcontextrestored', () => {
        lost = false;
        module._Page_ContextRestored();
        redraw();
    });
}

async function run() {
    if (!hasWebGL()) return fail('This browser has no WebGL, or it is switched off: the viewer cannot draw.');
    const urls = query.has('file') ? query.getAll('file') : ['boat.pod', 'hull.pvr', 'sails.pvr'].map(name => `scene/${name}`);
    const [wasmBinary] = await fetchAll(['front.wasm'], [Number(document.documentElement.dataset.wasm)]);
    module = await createFront({wasmBinary, canvas, print: line => console.info(line), printErr: line => console.warn(line)});
    const plain = query.get('samples') === '1';
    if (module._Page_Start(canvas.clientWidth, canvas.clientHeight, plain ? 0 : 1, plain ? 1 : 0) !== 0)
        return fail('This browser has no WebGL, or it is switched off: the viewer cannot draw.');
    const choices = JSON.parse(ask('Choices'));
    element('keys').textContent = `${choices.help}two fingers  pan, nearer and farther`;
    panel = inspector(element('inspector'), choices, canvas, {set, save, keep, memory: () => module.HEAPU8.length, emitters: () => JSON.parse(ask('Emitters'))});
    takeDrops();
    takePointers();
    takeKeys();
    takeButtons();
    takeLosses();
    if (window.innerWidth <= 700) element('panel').click();
    document.body.dataset.state = 'runs';
    say('');
    requestAnimationFrame(now => frame(now, now));
    const names = urls.map(url => decodeURIComponent(url.split(/[?#]/)[0].split('/').pop()));
    const contents = await Promise.all(urls.map(url => fetchAll([url], [100000]).then(([bytes]) => bytes)));
    progress(0);
    if (!query.has('file')) set({floor: true, shadow: true});
    await add(names.map((name, i) => ({name, bytes: contents[i]})));
}

window.addEventListener('unhandledrejection', event => fail(event.reason.message));
run();
