// Runs the page's sample on its canvas. ?picture draws the picture that the program draws without a window;
// &samples=1 without antialiasing.
import createSamples from './samples.js';
import {fail, fetchAll, hasWebGL, log, progress} from './page.js';

async function run({sample, files, wasm}) {
    if (!hasWebGL()) return fail('This browser has no WebGL, or it is switched off: the picture is what would be drawn.');
    const [wasmBinary, ...contents] = await fetchAll(
        ['samples.wasm', ...files.map(file => `files/${file.name}`)], [wasm, ...files.map(file => file.size)]);
    const module = await createSamples({
        wasmBinary,
        canvas: document.getElementById('canvas'),
        print: line => console.info(line),
        printErr: log,
        onFrame: count => { document.body.dataset.frames = count; },
    });
    files.forEach((file, i) => module.FS.writeFile(`/${file.name}`, contents[i]));
    progress(0);
    const query = new URLSearchParams(location.search);
    document.body.dataset.state = query.has('picture') ? 'picture' : 'runs';
    module.callMain([sample, ...(query.has('picture') ? ['picture', query.get('samples') ?? '4'] : [])]);
}

run(JSON.parse(document.getElementById('sample').textContent)).catch(error => fail(error.message));
