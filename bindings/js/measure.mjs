// SPDX-License-Identifier: Apache-2.0
// measure.mjs PACKAGE: milliseconds for a picture inside the two modules of the built package, without
// the copies that resizer.js makes: the median of as many calls as take 300 ms.
import { readFileSync } from 'node:fs';
import { join } from 'node:path';

const [folder] = process.argv.slice(2);
const ENOUGH_MS = 300;
const SIZES = [
    [4000, 3000, 1000, 750],
    [1920, 1080, 1280, 720],
    [1600, 1200, 2400, 1800],
];
const CALLS = {
    'RGBA quarter': (lib, src, dst, sizes) => lib.ovrin_resize_rgba8888(src, dst, ...sizes),
    'NV21 quarter': (lib, src, dst, sizes) => lib.ovrin_resize_nv21(src, dst, ...sizes),
    'RGBA bilinear': (lib, src, dst, sizes) => lib.ov_bilinear_sg(src, dst, ...sizes, 7, 0),
    'RGBA Lanczos': (lib, src, dst, sizes) => lib.ovrin_resize_lanczos(src, dst, ...sizes, 4),
    'RGBA nearest': (lib, src, dst, sizes) => lib.ovrin_resize_nearest_rgba8888(src, dst, ...sizes),
};

async function load(name) {
    const { instance } = await WebAssembly.instantiate(readFileSync(join(folder, name)), {});
    instance.exports._initialize();
    return instance.exports;
}

// Waves with a little noise.
function fill(bytes) {
    let state = 1;
    for (let i = 0; i < bytes.length; ++i) {
        state = (Math.imul(state, 1664525) + 1013904223) >>> 0;
        bytes[i] = 120 + 100 * Math.sin(i / 4000) + (state >>> 28);
    }
}

function median(call) {
    const times = [];
    for (let i = 0; i < 3; ++i) call();
    const begin = performance.now();
    do {
        const start = performance.now();
        call();
        times.push(performance.now() - start);
    } while (performance.now() - begin < ENOUGH_MS);
    return times.sort((a, b) => a - b)[times.length >> 1];
}

function measured(lib, call, sizes) {
    const [w, h, newW, newH] = sizes;
    const bytes = 4 * (w * h + w + 1);
    const src = lib.malloc(bytes);
    const dst = lib.malloc(4 * newW * newH);
    fill(new Uint8Array(lib.memory.buffer, src, bytes));
    const time = median(() => call(lib, src, dst, sizes));
    lib.free(src);
    lib.free(dst);
    return time;
}

const simd = await load('ovrinresize.wasm');
const scalar = await load('ovrinresize-scalar.wasm');
console.log('| Pictures | Engine | vectors, ms | without, ms | times |\n|---|---|---|---|---|');
for (const sizes of SIZES) {
    for (const [name, call] of Object.entries(CALLS)) {
        const [fast, slow] = [simd, scalar].map((lib) => measured(lib, call, sizes));
        const [w, h, newW, newH] = sizes;
        const cells = [`${w}x${h} to ${newW}x${newH}`, name, fast.toFixed(2), slow.toFixed(2), (slow / fast).toFixed(1)];
        console.log(`| ${cells.join(' | ')} |`);
    }
}
