// SPDX-License-Identifier: Apache-2.0
// The package in Node.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdirSync, readFileSync, writeFileSync } from 'node:fs';
import { join } from 'node:path';
import { test } from 'node:test';
import { pathToFileURL } from 'node:url';
import { Worker } from 'node:worker_threads';

import { differences, goldenLines } from './golden.mjs';
import { assertSame, folder, nativeFrame, noise, root } from './native.mjs';

const packageFolder = join(root, 'build/js');
const { ENGINES, fit, LARGEST_SIDE, load, Resizer } = await import(
    pathToFileURL(join(packageFolder, 'index.js'))
);

const MODULES = ['ovrinresize.wasm', 'ovrinresize-scalar.wasm'];
const moduleBytes = (name) => readFileSync(join(packageFolder, name));
const text = (name) => readFileSync(join(root, name), 'utf8');
const bytesOf420 = (w, h) => w * h + 2 * ((w + 1) >> 1) * ((h + 1) >> 1);

for (const name of MODULES) {
    test(`${name} is small and imports nothing`, async () => {
        const bytes = moduleBytes(name);
        assert.ok(bytes.length <= 100000, `${bytes.length} bytes`);
        assert.deepEqual(WebAssembly.Module.imports(await WebAssembly.compile(bytes)), []);
    });

    test(`${name} gives the golden bytes`, async () => {
        const cases = readFileSync(join(root, 'build/wasm/golden'));
        const lines = await goldenLines(moduleBytes(name), cases);
        const golden = text('tests/golden/golden.txt');
        assert.ok(lines.split('\n').length > 1000);
        assert.deepEqual(differences(lines, golden, text('tests/golden/without_threads.txt')), []);
    });
}

// Resizes between random sizes with pictures that end where the memory does: what lies behind it cannot
// be read or written.
test('both modules give the same bytes and keep to their pictures', async () => {
    const modules = await Promise.all(MODULES.map(async (name) => {
        const { instance } = await WebAssembly.instantiate(moduleBytes(name), {});
        const lib = instance.exports;
        lib._initialize();
        const [other, room] = [lib.malloc(1 << 20), lib.malloc(1 << 20)];
        lib.free(room); // for the engines, so that the memory does not grow
        lib.memory.grow(1);
        return { lib, other, memory: new Uint8Array(lib.memory.buffer) };
    }));
    const pixels = (n) => (w, h) => n * w * h;
    const lanczos = (n) => [pixels(n), (lib, ...call) => lib.ovrin_resize_lanczos(...call, n)];
    // Reads, and blends, up to a row and two samples behind each plane.
    const bilinear = (bytes, code) => [bytes, (lib, ...call) => lib.ov_bilinear_sg(...call, code, 0), true];
    const engines = [
        [pixels(4), (lib, ...call) => lib.ovrin_resize_rgba8888(...call)],
        [pixels(3), (lib, ...call) => lib.ovrin_resize_rgb888(...call)],
        [bytesOf420, (lib, ...call) => lib.ovrin_resize_yuv420(...call)],
        [bytesOf420, (lib, ...call) => lib.ovrin_resize_nv21(...call)],
        [pixels(4), (lib, ...call) => lib.ovrin_resize_nearest_rgba8888(...call)],
        lanczos(1), lanczos(2), lanczos(3), lanczos(4),
        bilinear(pixels(4), 7), bilinear(bytesOf420, 2), bilinear(bytesOf420, 18),
    ];
    for (let i = 0; i < 150; ++i) {
        const [w, h, newW, newH] = noise(4, 7919 * i).map((byte, k) => 1 + (k % 2 ? byte % 24 : byte));
        for (const [engine, [bytes, resize, readsBehind]] of engines.entries()) {
            const source = noise(bytes(w, h), i);
            const length = bytes(newW, newH);
            const padded = source.length + (readsBehind ? 8 * (w + 4) : 0);
            const words = `engine ${engine}, ${w}x${h} to ${newW}x${newH}`;
            const run = ({ lib, memory }, src, dst) => {
                memory.fill(0, src, src + padded);
                memory.fill(0, dst, dst + length);
                memory.set(source, src);
                assert.doesNotThrow(() => resize(lib, src, dst, w, h, newW, newH), words);
                return memory.slice(dst, dst + length);
            };
            const results = modules.flatMap((module) => [
                run(module, module.memory.length - padded, module.other),
                run(module, module.other, module.memory.length - length),
            ]);
            for (const found of results) assertSame(found, results[0], words);
        }
    }
});

for (const simd of [true, false]) {
    const SIZES = [
        [64, 48, 32, 24], [67, 41, 33, 19], [33, 17, 66, 35], [1, 1, 1, 1], [2, 2, 5, 4], [130, 70, 129, 69],
        [40, 1100, 30, 500],
    ];

    test(`RGBA is what the native library makes of it, simd ${simd}`, async () => {
        const resizer = await load({ simd });
        for (const [w, h, newW, newH] of SIZES) {
            const source = noise(4 * w * h, w);
            for (const engine of ENGINES) {
                const wanted = nativeFrame(source, 'rgba', w, h, '--size', `${newW}x${newH}!`, '-e', engine);
                const found = resizer.resize(source, w, h, newW, newH, { engine });
                assert.ok(found instanceof Uint8ClampedArray);
                assertSame(found, wanted, `${engine} ${w}x${h} to ${newW}x${newH}`);
            }
        }
    });

    test(`I420 and NV21 are what the native library makes of them, simd ${simd}`, async () => {
        const resizer = await load({ simd });
        for (const [w, h, newW, newH] of SIZES) {
            const source = noise(bytesOf420(w, h), h);
            for (const [format, method] of [['i420', 'resizeI420'], ['nv21', 'resizeNv21']]) {
                for (const engine of ['quarter', 'bilinear', 'lanczos']) {
                    // What lies behind the source reaches the borders, and the tool has other bytes there.
                    if (engine === 'bilinear' && w < 2 * newW) continue;
                    const size = ['--size', `${newW}x${newH}!`, '-e', engine];
                    const wanted = nativeFrame(source, format, w, h, ...size);
                    const found = resizer[method](source, w, h, newW, newH, { engine });
                    assertSame(found, wanted, `${format} ${engine} ${w}x${h} to ${newW}x${newH}`);
                }
            }
        }
    });

    test(`letterboxes are what the native library makes of them, simd ${simd}`, async () => {
        const resizer = await load({ simd });
        // The tool centres RGBA at odd positions, too; here it has no reason to.
        for (const [w, h, canvasW, canvasH] of [[64, 48, 44, 24], [30, 90, 64, 48], [50, 40, 200, 164]]) {
            const canvas = ['--canvas', `${canvasW}x${canvasH}`, '-e', 'quarter'];
            const rgba = noise(4 * w * h, 5);
            const planes = noise(bytesOf420(w, h), 6);
            const found = resizer.letterbox(rgba, w, h, canvasW, canvasH);
            assertSame(found, nativeFrame(rgba, 'rgba', w, h, ...canvas), `rgba ${w}x${h} in ${canvasW}x${canvasH}`);
            for (const [format, method] of [['i420', 'letterboxI420'], ['nv21', 'letterboxNv21']]) {
                const wanted = nativeFrame(planes, format, w, h, ...canvas);
                const name = `${format} ${w}x${h} in ${canvasW}x${canvasH}`;
                assertSame(resizer[method](planes, w, h, canvasW, canvasH), wanted, name);
            }
            // The other engines have no canvas: the picture lies in zeros.
            const place = fit(w, h, canvasW, canvasH);
            const options = { engine: 'lanczos' };
            const boxed = resizer.letterbox(rgba, w, h, canvasW, canvasH, options);
            const inner = resizer.resize(rgba, w, h, place.width, place.height, options);
            for (let y = 0; y < canvasH; ++y) {
                for (let x = 0; x < canvasW; ++x) {
                    const [i, j] = [x - place.x, y - place.y];
                    const inside = i >= 0 && j >= 0 && i < place.width && j < place.height;
                    const wanted = inside ? inner[4 * (j * place.width + i)] : 0;
                    assert.equal(boxed[4 * (y * canvasW + x)], wanted, `${x}, ${y}`);
                }
            }
        }
    });
}

test('an ImageData gives an ImageData', async (t) => {
    globalThis.ImageData ??= class {
        constructor(data, width, height) {
            Object.assign(this, { data, width, height });
        }
    };
    t.after(() => delete globalThis.ImageData);
    const resizer = await load();
    const image = new ImageData(new Uint8ClampedArray(noise(4 * 40 * 30)), 40, 30);
    for (const method of ['resize', 'letterbox']) {
        const found = resizer[method](image, 10, 12, { engine: 'bilinear' });
        const wanted = resizer[method](image.data, 40, 30, 10, 12, { engine: 'bilinear' });
        assert.ok(found instanceof ImageData);
        assert.deepEqual([found.width, found.height, found.data], [10, 12, wanted]);
    }
});

test('what does not fit is refused in words', async () => {
    const resizer = await load();
    const pixels = new Uint8Array(4 * 4 * 4);
    const refusals = [
        [() => resizer.resize(pixels, 4, 5, 2, 2), RangeError, /holds 64 bytes, 80 needed \(4 x 5 x 4\)/],
        [() => resizer.resize(pixels, 0, 4, 2, 2), RangeError, /width is 0/],
        [() => resizer.resize(pixels, 4, -1, 2, 2), RangeError, /height is -1/],
        [() => resizer.resize(pixels, 4, 4, 1.5, 2), RangeError, /newWidth is 1.5/],
        [() => resizer.resize(pixels, 4, 4, 2, LARGEST_SIDE + 1), RangeError, /newHeight is 32768/],
        [() => resizer.resize(pixels, 4, 4, 2), RangeError, /newHeight is undefined/],
        [() => resizer.resize([1, 2, 3, 4], 1, 1, 1, 1), TypeError, /neither a Uint8ClampedArray nor/],
        [() => resizer.resize(null, 1, 1, 1, 1), TypeError, /neither/],
        [() => resizer.resize(pixels, 4, 4, 2, 2, { engine: 'cubic' }), TypeError, /engine is "cubic"/],
        [() => resizer.resizeNv21(pixels, 4, 4, 2, 2, { engine: 'nearest' }), TypeError, /must be one of/],
        [() => resizer.resizeI420(pixels, 9, 8, 2, 2), RangeError, /112 needed \(9 x 8 \+ 2 x 5 x 4\)/],
        [() => resizer.letterbox(pixels, 4, 4, 0, 2), RangeError, /canvasWidth is 0/],
        [() => resizer.letterboxNv21(pixels, 16, 4, 8, 2), RangeError, /96 needed/],
        [() => resizer.resize(pixels, 4, 4, LARGEST_SIDE, LARGEST_SIDE), RangeError, /no memory/],
    ];
    for (const [call, type, words] of refusals) {
        assert.throws(call, (error) => error instanceof type && words.test(error.message), String(call));
    }
    assert.equal(resizer.resize(pixels, 4, 4, 2, 2).length, 16, 'it still works');
});

test('calls leave no memory behind', async () => {
    // The module's memory cannot be seen from here, but what is refused in the end can.
    const module = await WebAssembly.compile(moduleBytes(MODULES[0]));
    const instance = await instanceBehind(module);
    const source = noise(4 * 1100 * 1100);
    const tall = new Uint8Array(4 * 1000 * 12000);
    const work = () => {
        for (const engine of ENGINES) instance.resizer.resize(source, 1100, 1100, 300, 300, { engine });
        // Tall enough for threads, if there were any.
        instance.resizer.resize(source, 550, 2200, 200, 900);
        instance.resizer.resize(source, 1, 1, 1500, 1500, { engine: 'lanczos' });
        instance.resizer.letterbox(source, 1100, 1100, 300, 200);
        instance.resizer.resize(tall, 1000, 12000, 100, 6000);
        instance.resizer.letterbox(tall, 1000, 12000, 500, 6000);
        instance.resizer.resizeNv21(source, 1100, 1100, 301, 303);
        assert.throws(() => instance.resizer.resize(source, 1100, 1100, 32767, 32767), RangeError);
    };
    work();
    work();
    const before = instance.bytes();
    for (let i = 0; i < 30; ++i) work();
    assert.equal(instance.bytes(), before);
});

// A Resizer, and the size of its memory.
async function instanceBehind(module) {
    const { Instance } = WebAssembly;
    let memory = null;
    WebAssembly.Instance = class extends Instance {
        constructor(...given) {
            super(...given);
            ({ memory } = this.exports);
        }
    };
    const resizer = new Resizer(module);
    WebAssembly.Instance = Instance;
    return { resizer, bytes: () => memory.buffer.byteLength };
}

test('it runs in a worker', async () => {
    const url = pathToFileURL(join(packageFolder, 'index.js'));
    const code = `
        import { parentPort } from 'node:worker_threads';
        import { load } from '${url}';
        const resizer = await load();
        parentPort.postMessage(resizer.resize(new Uint8Array(64).fill(255), 4, 4, 2, 2));`;
    const worker = new Worker(new URL(`data:text/javascript,${encodeURIComponent(code)}`));
    const pixels = await new Promise((resolve, reject) => {
        worker.once('message', resolve);
        worker.once('error', reject);
    });
    assert.deepEqual([...pixels], Array(16).fill(252));
});

test('npm packs it, and what it packs works', async () => {
    const packed = execFileSync('npm', ['pack', '--json', '--pack-destination', folder], {
        cwd: packageFolder,
        encoding: 'utf8',
        stdio: ['ignore', 'pipe', 'ignore'],
    });
    const [{ filename, files }] = JSON.parse(packed);
    assert.deepEqual(
        files.map((file) => file.path).sort(),
        ['LICENSE', 'README.md', 'index.d.ts', 'index.js', 'ovrinresize-scalar.wasm', 'ovrinresize.wasm',
            'package.json', 'resizer.d.ts', 'resizer.js', 'third-party.txt'],
    );
    const modules = join(folder, 'app/node_modules/ovrinresize');
    mkdirSync(modules, { recursive: true });
    execFileSync('tar', ['xzf', join(folder, filename), '-C', modules, '--strip-components=1']);
    const program = join(folder, 'app/main.mjs');
    writeFileSync(program, `
        import { load } from 'ovrinresize';
        const resizer = await load();
        console.log(resizer.resize(new Uint8Array(64).fill(255), 4, 4, 1, 1).join());`);
    assert.equal(execFileSync('node', [program], { encoding: 'utf8' }), '252,252,252,252\n');
    assert.ok(text('include/ovrinresize.h').includes(`#define OVRINRESIZE_VERSION "${versionOf(packageFolder)}"\n`));
});

function versionOf(where) {
    return JSON.parse(readFileSync(join(where, 'package.json'), 'utf8')).version;
}

test('its types are those of its functions', () => {
    execFileSync('node', ['node_modules/typescript/bin/tsc', '--noEmit', '--strict', '--target', 'es2022',
        '--module', 'nodenext', '--lib', 'es2022,dom', 'types_test.ts'], { stdio: 'inherit' });
});
