// SPDX-License-Identifier: Apache-2.0
// The package in a browser, in a worker: golden bytes, and pictures.
import assert from 'node:assert/strict';
import { readFileSync } from 'node:fs';
import { join } from 'node:path';
import { after, before, test } from 'node:test';

import { PATIENCE_MS, serve, startBrowser } from './browser.mjs';
import { differences } from './golden.mjs';
import { assertSame, nativeFrame, noise, root } from './native.mjs';

let browser;
let server;
let page;

before(async () => {
    browser = await startBrowser();
    server = await serve();
    page = await browser.newPage();
    page.setDefaultTimeout(PATIENCE_MS);
    await page.goto(server.url);
});

after(async () => {
    await browser.close();
    server.close();
});

// What a module worker answers to a message.
function inWorker(code, message) {
    const whole = `${code}
        onmessage = async ({ data }) => {
            try {
                postMessage({ result: await answer(data) });
            } catch (error) {
                postMessage({ error: String(error) });
            }
        };`;
    return page.evaluate(
        ([script, data]) =>
            new Promise((resolve, reject) => {
                const url = URL.createObjectURL(new Blob([script], { type: 'text/javascript' }));
                const worker = new Worker(url, { type: 'module' });
                worker.onmessage = (event) =>
                    event.data.error ? reject(new Error(event.data.error)) : resolve(event.data.result);
                worker.onerror = (event) => reject(new Error(event.message));
                worker.postMessage(data);
            }),
        [whole, message],
    );
}

for (const name of ['ovrinresize.wasm', 'ovrinresize-scalar.wasm']) {
    test(`${name} gives the golden bytes`, async () => {
        const lines = await inWorker(
            `import { goldenLines } from '${server.url}/tests/web/golden.mjs';
            const bytes = async (path) => (await fetch('${server.url}/build/' + path)).arrayBuffer();
            const answer = async (name) =>
                goldenLines(await bytes('js/' + name), await bytes('wasm/golden'));`,
            name,
        );
        const file = (path) => readFileSync(join(root, 'tests/golden', path), 'utf8');
        assert.ok(lines.split('\n').length > 1000);
        assert.deepEqual(differences(lines, file('golden.txt'), file('without_threads.txt')), []);
    });
}

test('an ImageData is resized as the native library does it', async () => {
    const source = noise(4 * 90 * 60);
    const [w, h] = [41, 27];
    for (const engine of ['quarter', 'bilinear', 'lanczos', 'nearest']) {
        const found = await inWorker(
            `import { load } from '${server.url}/build/js/index.js';
            const answer = async ({ source, w, h, engine }) => {
                const image = new ImageData(new Uint8ClampedArray(source), 90, 60);
                const result = (await load()).resize(image, w, h, { engine });
                return result instanceof ImageData && [...result.data];
            };`,
            { source: [...source], w, h, engine },
        );
        const wanted = nativeFrame(source, 'rgba', 90, 60, '--size', `${w}x${h}!`, '-e', engine);
        assertSame(found, wanted, engine);
    }
});
