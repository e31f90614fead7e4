// The engine on a canvas. README.md shows how it is used, index.d.ts what there is.
import createModule from './qex.js';

const kDirectional = 1, kPoint = 0;

async function bytesOf(source) {
    if (source instanceof ArrayBuffer) return new Uint8Array(source);
    if (ArrayBuffer.isView(source)) return new Uint8Array(source.buffer, source.byteOffset, source.byteLength);
    const response = await fetch(source);
    if (!response.ok) throw new Error(`${source}: cannot be loaded (${response.status})`);
    return new Uint8Array(await response.arrayBuffer());
}

const nameOf = source => String(source).split(/[?#]/)[0].split('/').pop();

class Model {
    constructor(qex, pointer) {
        Object.assign(this, {qex, pointer});
    }

    // 16 numbers, columns one after the other.
    set matrix(values) {
        this.qex.module.HEAPF32.set(values, this.qex.module._QexWeb_GetPlace(this.pointer) >> 2);
    }

    get bounds() {
        const box = this.qex.scratch;
        this.qex.module._QexWeb_GetBounds(this.pointer, box);
        const numbers = Array.from(this.qex.module.HEAPF32.subarray(box >> 2, (box >> 2) + 6));
        return {min: numbers.slice(0, 3), max: numbers.slice(3)};
    }

    dispose() {
        if (this.pointer) this.qex.module._QexWeb_UnloadModel(this.pointer);
        this.qex.models.delete(this);
        this.pointer = 0;
    }
}

class Qex {
    constructor(module, canvas, context, handle) {
        Object.assign(this, {module, canvas, context, handle, models: new Set(), folders: 0});
        this.scratch = module._malloc(64);
        this.listeners = {
            webglcontextlost: event => {
                event.preventDefault();
                module._QexEngine_ContextLost();
            },
            webglcontextrestored: () => {
                module.GL.currentContext.initExtensionsDone = false;
                module.GL.initExtensions(module.GL.currentContext);
                module._QexEngine_ContextRestored();
            },
        };
        for (const [name, listener] of Object.entries(this.listeners)) canvas.addEventListener(name, listener);
    }

    numbers(values) {
        this.module.HEAPF32.set(values, this.scratch >> 2);
        return this.scratch;
    }

    async loadModel(source, {textures = []} = {}) {
        const {FS} = this.module, folder = `/model${++this.folders}/`;
        const base = typeof source === 'string' || source instanceof URL ? new URL(source, document.baseURI) : document.baseURI;
        const named = Array.isArray(textures) ? textures.map(url => [nameOf(url), new URL(url, base)]) : Object.entries(textures);
        const [scene, ...contents] = await Promise.all([source, ...named.map(([, from]) => from)].map(bytesOf));
        FS.mkdir(folder);
        FS.writeFile(`${folder}scene.pod`, scene);
        named.forEach(([name], i) => FS.writeFile(folder + name, contents[i]));
        const pointer = this.module.ccall('QexWeb_LoadModel', 'number', ['string', 'string'], [folder, 'scene.pod']);
        if (!pointer) throw new Error(`${base}: is not a scene that can be drawn; the console has the reason`);
        const model = new Model(this, pointer);
        this.models.add(model);
        return model;
    }

    setCamera({eye, target = [0, 0, 0], fov = 0.8, near = 0.1, far = 100}) {
        this.module._QexWeb_SetCamera(this.numbers([...eye, ...target]), fov, near, far);
    }

    setLights(lights) {
        this.module._QexWeb_ClearLights();
        for (const {position, direction, colour = [1, 1, 1]} of lights)
            this.module._QexWeb_AddLight(direction ? kDirectional : kPoint,
                                         this.numbers([...(direction ?? position), ...colour]));
    }

    // Follows the canvas's size on the page.
    resize(ratio = globalThis.devicePixelRatio) {
        const width = Math.max(1, Math.round(this.canvas.clientWidth * ratio));
        const height = Math.max(1, Math.round(this.canvas.clientHeight * ratio));
        if (width === this.canvas.width && height === this.canvas.height) return;
        Object.assign(this.canvas, {width, height});
        this.module._QexWeb_Resize(width, height);
    }

    draw({seconds = 0, clear = [0.25, 0.3, 0.4], models = this.models} = {}) {
        if (this.module._QexEngine_IsContextLost()) return false;
        this.module.GL.makeContextCurrent(this.handle);
        this.module._QexWeb_Clear(...clear);
        for (const model of models) this.module._QexWeb_Draw(model.pointer, seconds);
        return true;
    }

    dispose() {
        for (const [name, listener] of Object.entries(this.listeners)) this.canvas.removeEventListener(name, listener);
        for (const model of [...this.models]) model.dispose();
        this.module._QexWeb_Stop();
        this.module._free(this.scratch);
        this.module.GL.deleteContext(this.handle);
    }
}

export async function createQex(canvas, {antialias = true, wasm, log = line => console.error(line), ...attributes} = {}) {
    const module = await createModule({
        canvas,
        printErr: line => (line.startsWith('I/') ? console.info(line) : log(line)),
        ...(wasm ? {wasmBinary: await bytesOf(wasm)} : {}),
    });
    const handle = module.GL.createContext(canvas, {alpha: false, depth: true, stencil: true, antialias,
                                                    majorVersion: 1, minorVersion: 0, ...attributes});
    if (!handle) throw new Error('this browser has no WebGL, or it is switched off');
    module.GL.makeContextCurrent(handle);
    if (module._QexWeb_Start(canvas.width, canvas.height) !== 0) throw new Error('the engine does not start');
    return new Qex(module, canvas, module.GL.currentContext.GLctx, handle);
}
