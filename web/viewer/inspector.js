// The panel beside the scene: sections of controls, each of which shows a property and changes it.

const make = (tag, properties = {}, ...children) => {
    const node = Object.assign(document.createElement(tag), properties);
    node.append(...children);
    return node;
};
const toHex = colour => '#' + colour.map(c => Math.round(Math.min(Math.max(c, 0), 1) * 255).toString(16).padStart(2, '0')).join('');
const toNumbers = hex => [1, 3, 5].map(i => parseInt(hex.slice(i, i + 2), 16) / 255);

// Controls update what they show unless they are in use.
class Controls {
    constructor(set) {
        Object.assign(this, {set, updates: []});
    }

    row(label, ...inputs) {
        return make('label', {className: 'row'}, make('span', {textContent: label, title: label}), ...inputs);
    }

    bind(input, field, read, event, write) {
        input.addEventListener(event, () => this.set(write(input)));
        this.updates.push(state => {
            if (document.activeElement !== input || input.type === 'checkbox') input[field] = read(state);
        });
        return input;
    }

    check(label, read, write) {
        return this.row(label, this.bind(make('input', {type: 'checkbox'}), 'checked', read, 'change', i => write(i.checked)));
    }

    number(label, read, write, step = 0.1) {
        return this.row(label, this.bind(make('input', {type: 'number', step}), 'value', read, 'input', i => write(Number(i.value))));
    }

    range(label, read, write, min, max) {
        const input = make('input', {type: 'range', min, max, step: (max - min) / 200});
        return this.row(label, this.bind(input, 'value', read, 'input', i => write(Number(i.value))));
    }

    colour(label, read, write) {
        return this.row(label, this.bind(make('input', {type: 'color'}), 'value', read, 'input', i => write(i.value)));
    }

    choice(label, options, read, write) {
        const select = make('select', {}, ...options.map(([value, textContent]) => make('option', {value, textContent})));
        return this.row(label, this.bind(select, 'value', read, 'change', i => write(i.value)));
    }
}

const section = (title, open, ...rows) => make('details', {open}, make('summary', {textContent: title}), ...rows);

// `set` changes properties, `save` writes a file, `keep` takes files into the program and tells their paths there, `memory` tells
// its bytes, `emitters` what emitters there are.
export function inspector(root, choices, canvas, {set, save, keep, memory, emitters}) {
    let controls = new Controls(set), scene = null, lightRows = null, calls = 0, lastCalls = 0, times = [], counts = false;
    const graph = make('canvas', {id: 'graph', width: 280, height: 48}), figures = make('div', {id: 'figures', className: 'faint'});
    const statistics = section('Statistics', false, graph, figures), lights = make('div'), particles = make('div');
    let emitterNames = null;

    // GL calls are counted while the section is open.
    statistics.addEventListener('toggle', () => {
        const gl = canvas.getContext('webgl');
        if (counts || !gl) return;
        counts = true;
        for (const name in gl) {
            const call = gl[name];
            if (typeof call === 'function') gl[name] = (...a) => (++calls, call.apply(gl, a));
        }
    });

    function view(c) {
        const modules = [['', 'default look'], ...choices.shaders.map(name => [name, name])];
        const cameras = Array.from({length: scene?.cameras ?? 0}, (_, i) => [String(i), `camera ${i}`]);
        return [
            c.choice('shader', modules, s => s.shader, shader => ({shader})),
            c.choice('drawing', [['lean', 'lean'], ['described', 'described']], s => (s.lean ? 'lean' : 'described'),
                name => ({lean: name === 'lean'})),
            c.choice('up', choices.axes.map(axis => [axis, axis]), s => s.up, up => ({up})),
            ...(cameras.length ? [c.choice('camera', [['', 'free'], ...cameras], () => '', i => (i === '' ? {frameAll: true} : {camera: Number(i)}))] : []),
            c.colour('background', s => s.background, background => ({background})),
            ...choices.overlays.map(name => c.check(name, s => s.overlays[name], on => ({overlays: {[name]: on}}))),
        ];
    }

    function nodes(c) {
        const children = scene.nodes.map(() => []), roots = [];
        scene.nodes.forEach((node, i) => (node.parent >= 0 ? children[node.parent] : roots).push(i));
        const rows = [];
        const add = (i, depth) => {
            const {name} = scene.nodes[i];
            const shown = make('input', {type: 'checkbox', title: 'shown', checked: true});
            const row = make('div', {className: 'node', textContent: name, title: name});
            row.prepend(shown);
            row.style.paddingLeft = `${12 * depth}px`;
            row.onclick = event => event.target === shown || set({selected: i});
            let hidden = [];
            shown.onchange = () => set({hidden: shown.checked ? hidden.filter(other => other !== name) : [...hidden, name]});
            c.updates.push(state => {
                hidden = state.hidden;
                shown.checked = !hidden.includes(name);
                if (row.classList.toggle('chosen', state.selected === i) && !row.seen) row.scrollIntoView({block: 'nearest'});
                row.seen = state.selected === i;
            });
            rows.push(row);
            for (const child of children[i]) add(child, depth + 1);
        };
        roots.forEach(i => add(i, 0));
        return rows;
    }

    function material(c, m, index) {
        const change = (name, read = v => v) => value => {
            m[name] = read(value);
            return {material: {index, [name]: m[name]}};
        };
        const t = m.texture;
        return section(m.name, false,
            c.colour('diffuse', () => toHex(m.diffuse), change('diffuse', toNumbers)),
            c.colour('specular', () => toHex(m.specular), change('specular', toNumbers)),
            c.number('shininess', () => m.shininess, change('shininess'), 1),
            c.range('opacity', () => m.opacity, change('opacity'), 0, 1),
            make('div', {className: 'faint', textContent: t ? `${t.name}: ${t.width} x ${t.height}, ${t.format}` : 'no texture'}));
    }

    // One picture or six.
    function sky() {
        const input = make('input', {type: 'file', accept: '.png,.jpg,.jpeg,.tga,.bmp', multiple: true});
        input.onchange = async () => set({sky: await keep(input.files)});
        return input;
    }

    // What is selected, while something is.
    function selected(c) {
        const part = make('div'), modules = [['', 'that of the scene'], ...choices.shaders.map(name => [name, name])];
        let node = null;
        c.updates.push(state => {
            node = state.node;
            part.hidden = !node;
        });
        const place = name => ['x', 'y', 'z'].map((axis, k) => c.number(`${name} ${axis}`, s => s.node?.[name][k] ?? 0,
            v => ({node: {[name]: node[name].map((old, at) => (at === k ? v : old))}}), 'any'));
        part.append(...place('move'), ...place('turn'), c.choice('module', modules, s => s.node?.shader ?? '', shader => ({node: {shader}})));
        return part;
    }

    function effects(c) {
        const part = (name, value) => s => ({depthOfField: {...s, [name]: value}});
        let blur = null;
        c.updates.push(state => { blur = state.depthOfField; });
        const field = (name, min, max) => c.range(name, s => s.depthOfField?.[name] ?? 0, v => (blur ? part(name, v)(blur) : {}), min, max);
        return [
            c.check('floor', s => s.floor !== null, floor => ({floor})),
            c.check('shadow', s => s.shadow, shadow => ({shadow})),
            c.check('mirror', s => s.mirror !== null, mirror => ({mirror})),
            c.row('sky', sky(), make('button', {textContent: 'None', onclick: () => set({sky: []})})),
            c.check('water', s => s.water !== null, water => ({water})),
            c.choice('stereo', [['0', 'off'], ['1', 'red, blue'], ['2', 'red, cyan'], ['3', 'side by side']], s => String(s.stereo),
                mode => ({stereo: Number(mode)})),
            c.check('depth of field', s => s.depthOfField !== null, on => ({depthOfField: on ? {} : null})),
            field('focus', 0, 1), field('range', 0, 10), field('sigma', 0.1, 20),
        ];
    }

    // As many rows as there are lights.
    function showLights(state) {
        if (lightRows && lightRows.count === state.lights.length) return lightRows.updates.forEach(update => update(state));
        const c = lightRows = Object.assign(new Controls(set), {count: state.lights.length});
        const current = () => controls.state.lights.map(light => ({...light}));
        const change = (i, name, value) => {
            const all = current();
            all[i][name] = value(all[i][name]);
            return {lights: all};
        };
        lights.replaceChildren(
            ...state.lights.flatMap((_, i) => [
                ...['x', 'y', 'z'].map((axis, k) => c.number(`light ${i} ${axis}`, s => s.lights[i]?.place[k] ?? 0,
                    v => change(i, 'place', place => place.map((old, at) => (at === k ? v : old))))),
                c.colour('colour', s => toHex(s.lights[i]?.colour ?? [1, 1, 1]), v => change(i, 'colour', () => toNumbers(v))),
                make('button', {textContent: 'Remove', onclick: () => set({lights: current().filter((_, at) => at !== i)})}),
            ]),
            ...(state.lights.length ? [] : [make('button', {textContent: "Take the scene's", onclick: () => set({sceneLights: true})})]),
            make('button', {textContent: 'Add a light', onclick: () => set({lights: [...current(), {place: [0, 0, 0]}]})}));
        c.updates.forEach(update => update(state));
    }

    // A row of numbers is as many inputs; several rows are a text.
    function field(index, name, value) {
        const change = rows => set({emitter: {index, fields: {[name]: rows}}});
        const plain = !Array.isArray(value) || (!Array.isArray(value[0]) && value.length <= 4);
        if (!plain) {
            const input = make('input', {value: JSON.stringify(value)});
            input.onchange = () => {
                try {
                    change(JSON.parse(input.value));
                } catch {
                    input.value = JSON.stringify(value);
                }
            };
            return controls.row(name, input);
        }
        const inputs = [value].flat().map(number => make('input', {type: 'number', step: 'any', value: number}));
        for (const input of inputs) input.oninput = () => change(Array.isArray(value) ? inputs.map(i => Number(i.value)) : Number(input.value));
        return controls.row(name, ...inputs);
    }

    function showEmitters(state) {
        const names = JSON.stringify(state.emitters);
        if (names === emitterNames) return;
        emitterNames = names;
        const all = emitters();
        particles.replaceChildren(...all.map(({name, fields}, index) => section(name, all.length === 1,
            ...Object.entries(fields).map(([key, value]) => field(index, key, value)),
            make('button', {
                textContent: 'Save the description',
                onclick: () => save(new Blob([JSON.stringify(emitters()[index].fields, null, 2)]), name.replace(/\.\w+$/, '.json')),
            }),
            make('button', {textContent: 'Remove', onclick: () => set({emitters: state.emitters.filter((_, i) => i !== index)})}))));
        if (!all.length) particles.textContent = 'none; drop an emitter file or a description of one';
    }

    function drawGraph() {
        const to = graph.getContext('2d'), most = Math.max(4, ...times);
        to.clearRect(0, 0, graph.width, graph.height);
        to.fillStyle = '#7fb8df';
        times.forEach((time, i) => to.fillRect(i * 2, graph.height * (1 - time / most), 2, graph.height));
        const mean = times.reduce((sum, time) => sum + time, 0) / Math.max(times.length, 1);
        figures.textContent = `${mean.toFixed(2)} ms a picture, ${lastCalls} GL calls, ${scene?.triangles ?? 0} triangles, ` +
            `${(memory() / 1048576).toFixed(1)} MB`;
    }

    return {
        rebuild(newScene) {
            const open = new Map([...root.children].map(part => [part.firstChild.textContent, part.open]));
            scene = newScene;
            controls = new Controls(set);
            lightRows = emitterNames = null;
            const c = controls;
            root.replaceChildren(section('View', true, ...view(c)));
            if (scene)
                root.append(section('Nodes', true, make('div', {className: 'nodes'}, ...nodes(c)), selected(c)),
                    section('Materials', false, ...scene.materials.map((m, i) => material(c, m, i))),
                    section('Lights', false, lights), section('Effects', true, ...effects(c)),
                    section('Emitters', false, particles));
            root.append(statistics);
            for (const part of root.children) part.open = open.get(part.firstChild.textContent) ?? part.open;
        },
        update(state) {
            controls.state = state;
            if (scene) showLights(state);
            if (scene) showEmitters(state);
            for (const update of controls.updates) update(state);
            if (statistics.open) drawGraph();
        },
        // The time of a picture, in milliseconds.
        measure(time) {
            times = [...times.slice(-139), time];
            lastCalls = calls;
            calls = 0;
        },
    };
}
