/** Three numbers: a place, a direction, or red, green and blue from 0 to 1. */
export type Vector = [number, number, number];
/** A URL, or the bytes of a file. */
export type Source = string | URL | ArrayBuffer | ArrayBufferView;

export interface Options extends WebGLContextAttributes {
    /** Where qex.wasm is, when it is not beside the module. */
    wasm?: Source;
    /** Gets the engine's errors and warnings, a line each; the console without. */
    log?: (line: string) => void;
}

/** A direction makes a light far away, a position a lamp. */
export interface Light {
    position?: Vector;
    direction?: Vector;
    colour?: Vector;
}

export interface Model {
    /** Where it stands: 16 numbers, columns one after the other. */
    matrix: ArrayLike<number>;
    /** The box around it, where it stood when it was loaded or drawn. */
    readonly bounds: {min: Vector; max: Vector};
    dispose(): void;
}

export interface Qex {
    /** Loads a POD scene and the textures (PVR, KTX) that it names: URLs, relative to the scene's, or bytes by name. Rejects,
     * with the file's name, where one cannot be had. */
    loadModel(source: Source, options?: {textures?: string[] | Record<string, Source>}): Promise<Model>;
    /** `fov` is across the canvas, in radians. */
    setCamera(camera: {eye: Vector; target?: Vector; fov?: number; near?: number; far?: number}): void;
    /** Replaces all lights, four at most. */
    setLights(lights: Light[]): void;
    /** Gives the canvas as many pixels as it has on the page; call it before setCamera. */
    resize(pixelRatio?: number): void;
    /** Draws a frame, animations moved on by `seconds`. False while the context is lost. */
    draw(frame?: {seconds?: number; clear?: Vector; models?: Iterable<Model>}): boolean;
    dispose(): void;
    /** The WebGL context. */
    readonly context: WebGLRenderingContext;
    /** Emscripten's module: every function of the engine as `_QexName`, memory, and the file system `FS`. */
    readonly module: any;
}

/** Starts the engine on a canvas. Rejects where there is no WebGL. Contexts that are lost come back by themselves. */
export function createQex(canvas: HTMLCanvasElement, options?: Options): Promise<Qex>;
