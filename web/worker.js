// SPDX-License-Identifier: Apache-2.0
// Does the work beside the page: reads pictures, resizes them in every way, compares the results. The
// page only ever sees what it draws.
import { ENGINES, fit, Resizer } from '../bindings/js/resizer.js';

const MOST_PIXELS = 200e6; // four bytes each, twice: what a page gets
const ENOUGH_MS = 40; // of measuring
const MOST_RUNS = 20;

let resizer = null;
let picture = null; // { pixels, bitmap, width, height }
let results = new Map(); // by name: { pixels, width, height }
let latest = 0; // number of the newest request; older ones give up

const tell = (message, transfer = []) => self.postMessage(message, transfer);
const yieldToMessages = () => new Promise((resolve) => setTimeout(resolve, 0));

function canvasOf(width, height) {
    const canvas = new OffscreenCanvas(width, height);
    const context = canvas.getContext('2d', { willReadFrequently: true });
    if (context === null) throw new Error('too-large');
    return { canvas, context };
}

async function decoded(blob) {
    try {
        return await createImageBitmap(blob, { colorSpaceConversion: 'none' });
    } catch {
        throw new Error('not-a-picture');
    }
}

function isOpaque(pixels) {
    return new Uint32Array(pixels.buffer).every((pixel) => pixel >>> 24 === 255);
}

// Engines treat alpha as a colour, and the quarter engine makes 252 of 255. Of opaque pictures only
// what an engine leaves empty is transparent.
function makeOpaque(pixels) {
    for (let i = 3; i < pixels.length; i += 4) pixels[i] = pixels[i] === 0 ? 0 : 255;
}

async function open({ id, blob }) {
    const bitmap = await decoded(blob);
    const { width, height } = bitmap;
    const isTooLarge = width * height > MOST_PIXELS;
    if (isTooLarge || id !== latest) {
        bitmap.close();
        if (isTooLarge) throw new Error('too-large');
        return;
    }
    const { context } = canvasOf(width, height);
    context.drawImage(bitmap, 0, 0);
    picture?.bitmap.close();
    const pixels = context.getImageData(0, 0, width, height).data;
    picture = { bitmap, width, height, pixels, isOpaque: isOpaque(pixels) };
    results = new Map();
    tell({ type: 'opened', id, width, height });
}

// ---- The ways of resizing ----

function byEngine(engine, { width, height, letterbox }) {
    const method = letterbox ? 'letterbox' : 'resize';
    const { pixels, width: w, height: h } = picture;
    return resizer[method](pixels, w, h, width, height, { engine });
}

function placeOf({ width, height, letterbox }) {
    if (letterbox) return fit(picture.width, picture.height, width, height);
    return { x: 0, y: 0, width, height };
}

function byDrawImage(size) {
    const place = placeOf(size);
    const { context } = canvasOf(size.width, size.height);
    context.imageSmoothingQuality = 'high';
    context.drawImage(picture.bitmap, place.x, place.y, place.width, place.height);
    return context.getImageData(0, 0, size.width, size.height).data;
}

async function byCreateImageBitmap(size) {
    const place = placeOf(size);
    const bitmap = await createImageBitmap(picture.bitmap, {
        resizeWidth: place.width,
        resizeHeight: place.height,
        resizeQuality: 'high',
    });
    const { context } = canvasOf(size.width, size.height);
    context.drawImage(bitmap, place.x, place.y);
    bitmap.close();
    return context.getImageData(0, 0, size.width, size.height).data;
}

const WAYS = [
    ...ENGINES.map((engine) => ({ name: engine, resize: (size) => byEngine(engine, size) })),
    { name: 'drawImage', resize: byDrawImage },
    { name: 'createImageBitmap', resize: byCreateImageBitmap },
];

// The result, and the milliseconds that it takes once everything is warm.
async function timed(resize, size) {
    let start = performance.now();
    const pixels = await resize(size);
    let total = performance.now() - start;
    if (total > ENOUGH_MS) return { pixels, ms: total };
    let runs = 0;
    start = performance.now();
    do {
        await resize(size);
        ++runs;
        total = performance.now() - start;
    } while (total < ENOUGH_MS && runs < MOST_RUNS);
    return { pixels, ms: total / runs };
}

async function run({ id, size }) {
    const { width, height } = size;
    const made = new Map();
    for (const { name, resize } of WAYS) {
        await yieldToMessages();
        if (id !== latest) return;
        const { pixels, ms } = await timed(resize, size);
        if (id !== latest) return;
        if (picture.isOpaque) makeOpaque(pixels);
        made.set(name, { pixels, width, height });
        const bitmap = await createImageBitmap(new ImageData(pixels, width, height));
        tell({ type: 'result', id, name, bitmap, ms }, [bitmap]);
    }
    if (id !== latest) return;
    results = made;
    tell({ type: 'done', id });
}

// ---- What becomes of results ----

// Each colour eight times as far from black as the two results lie apart.
async function difference({ id, names }) {
    const [a, b] = names.map((name) => results.get(name));
    if (!a || !b) return;
    const { width, height } = a;
    const pixels = new Uint8ClampedArray(a.pixels.length);
    let largest = 0;
    let differing = 0;
    for (let i = 0; i < pixels.length; i += 4) {
        let most = 0;
        for (let c = i; c < i + 3; ++c) {
            const apart = Math.abs(a.pixels[c] - b.pixels[c]);
            pixels[c] = 8 * apart;
            if (apart > most) most = apart;
        }
        pixels[i + 3] = 255;
        if (most > 0) ++differing;
        if (most > largest) largest = most;
    }
    const bitmap = await createImageBitmap(new ImageData(pixels, width, height));
    const share = differing / (width * height);
    tell({ type: 'difference', id, bitmap, largest, share }, [bitmap]);
}

async function png({ name }) {
    const result = results.get(name);
    if (!result) return;
    const { canvas, context } = canvasOf(result.width, result.height);
    context.putImageData(new ImageData(result.pixels, result.width, result.height), 0, 0);
    tell({ type: 'png', name, blob: await canvas.convertToBlob({ type: 'image/png' }) });
}

async function init({ bytes }) {
    resizer = new Resizer(await WebAssembly.compile(bytes));
    tell({ type: 'ready' });
}

const HANDLERS = { init, open, run, difference, png };

self.onmessage = async ({ data }) => {
    if (data.type === 'open' || data.type === 'run') latest = data.id;
    try {
        await HANDLERS[data.type](data);
    } catch (error) {
        const known = ['not-a-picture', 'too-large'].includes(error.message);
        const reason = known ? error.message : error instanceof RangeError ? 'too-large' : 'unknown';
        tell({ type: 'failed', id: data.id, reason, text: String(error) });
    }
};
