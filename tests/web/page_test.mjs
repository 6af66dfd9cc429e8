// SPDX-License-Identifier: Apache-2.0
// The page in a browser: opened from a folder, except where a test says otherwise.
import assert from 'node:assert/strict';
import { readFileSync, writeFileSync } from 'node:fs';
import { join } from 'node:path';
import { after, afterEach, before, beforeEach, test } from 'node:test';
import { deflateSync } from 'node:zlib';

import { assertNoComplaints, pageFile, serve, startBrowser, watchedPage } from './browser.mjs';
import { assertSame, folder, nativeFile, nativePixels, nativePng, root } from './native.mjs';

const ENGINES = ['quarter', 'bilinear', 'lanczos', 'nearest'];
const sample = join(root, 'build/web/sample.png');
const axeSource = readFileSync('node_modules/axe-core/axe.min.js', 'utf8');

let browser;
let context;
let page;

before(async () => {
    browser = await startBrowser();
});

after(() => browser.close());

beforeEach(async () => {
    context = await browser.newContext({ viewport: { width: 1440, height: 1000 } });
    page = await watchedPage(context, pageFile);
    await finished();
});

afterEach(async () => {
    assertNoComplaints(page);
    await context.close();
});

// ---- What a person does, and sees ----

// Until all results are there, of that size if one is given, and the difference of two.
async function finished(size = '') {
    await page.waitForFunction(
        (end) =>
            document.getElementById('status').textContent.includes(' to ') &&
            document.getElementById('status').textContent.endsWith(end) &&
            document.querySelectorAll('#times tr').length === 6 &&
            document.getElementById('difference-figures').textContent.length > 5,
        size,
    );
}

async function clearDifference() {
    await page.evaluate(() => {
        document.getElementById('difference-figures').textContent = '';
    });
}

// What has changed is drawn in the next frame, and once more when panes have got another size by it.
async function drawn() {
    await page.evaluate(async () => {
        for (let frames = 0; frames < 4; ++frames) await new Promise(requestAnimationFrame);
    });
}

// A change that starts the work anew, waited for to its end.
async function reworked(change, size) {
    await clearDifference();
    await page.evaluate(() => document.getElementById('times').replaceChildren());
    await change();
    await finished(size);
}

async function setSize(width, height) {
    await reworked(async () => {
        await page.locator('#ratio').uncheck();
        await page.locator('#width').fill(String(width));
        await page.locator('#height').fill(String(height));
    }, ` to ${width} × ${height}`);
}

// For the difference, which is made anew.
async function choose(list, engine) {
    await clearDifference();
    await page.locator(list).selectOption(engine);
    await finished();
}

// The pixels that a pane shows, each of them once.
async function shownPixels(selector, width, height) {
    await page.locator('#zoom-one').click();
    await drawn();
    return page.locator(selector).evaluate(
        (canvas, [w, h]) => {
            const x = Math.round(canvas.width / 2 - w / 2);
            const y = Math.round(canvas.height / 2 - h / 2);
            if (x < 0 || y < 0) throw new Error('the pane is too small');
            const copy = new OffscreenCanvas(w, h);
            const copied = copy.getContext('2d', { willReadFrequently: true });
            copied.drawImage(canvas, -x, -y);
            return [...copied.getImageData(0, 0, w, h).data];
        },
        [width, height],
    );
}

const paneCanvas = (engine) => `[data-engine=${engine}] canvas`;

// The native library's result as the page shows it: an opaque picture stays opaque.
function native(file, engine, width, height) {
    return shown(nativePng(file, '--size', `${width}x${height}!`, '-e', engine));
}

function shown(pixels) {
    return pixels.map((byte, i) => (i % 4 === 3 && byte !== 0 ? 255 : byte));
}

// The four results are the native library's of the same picture.
async function assertNative(file, width, height, engines = ENGINES) {
    for (const engine of engines) {
        const found = await shownPixels(paneCanvas(engine), width, height);
        assertSame(found, native(file, engine, width, height), `${engine} ${width}x${height}`);
    }
}

const about = () => page.locator('#about').textContent();

// ---- Tests ----

test('the results are those of the native library', async () => {
    assert.match(await page.locator('#module').textContent(), /with vectors/);
    await setSize(200, 150);
    await assertNative(sample, 200, 150);
    // Nearest steps unevenly here, and leaves a part transparent.
    await setSize(317, 211);
    await assertNative(sample, 317, 211);
});

test('without vectors they are the same', async () => {
    await context.addInitScript(() => {
        WebAssembly.validate = () => false;
    });
    await page.reload();
    await finished();
    assert.match(await page.locator('#module').textContent(), /without vectors/);
    await setSize(317, 211);
    await assertNative(sample, 317, 211);
});

test('a letterbox is the native one', async () => {
    await page.locator('#letterbox').check();
    await setSize(300, 120);
    // At an even position, and rounded down, as the package places it.
    const canvas = ['--canvas', '300x120', '--size', '160x120!', '-e', 'quarter'];
    const wanted = shown(nativePng(sample, ...canvas));
    assertSame(await shownPixels(paneCanvas('quarter'), 300, 120), wanted, 'letterbox');
    for (const engine of ENGINES) {
        const pixels = await shownPixels(paneCanvas(engine), 300, 120);
        assert.deepEqual(pixels.slice(0, 4 * 70), Array(4 * 70).fill(0), `${engine}: bar`);
        assert.notEqual(pixels[4 * (60 * 300 + 150) + 3], 0, `${engine}: picture`);
    }
});

test('the difference is eight times that of two results', async () => {
    const [width, height] = [200, 150];
    await setSize(width, height);
    const [a, b] = ['nearest', 'quarter'].map((engine) => native(sample, engine, width, height));
    await choose('#first', 'nearest');
    await choose('#second', 'quarter');
    const wanted = a.map((byte, i) => (i % 4 === 3 ? 255 : Math.min(255, 8 * Math.abs(byte - b[i]))));
    assertSame(await shownPixels('#difference', width, height), wanted, 'difference');
    await page.locator('#second').selectOption('nearest');
    await page.getByText('The two are the same.').waitFor();
    // Also with the browser's own.
    await page.locator('#second').selectOption('drawImage');
    await page.getByText(/% of the pixels differ/).waitFor();
});

test('pictures are dropped, pasted and chosen', async () => {
    const files = [[120, 90], [90, 120], [64, 64]].map(([w, h]) =>
        nativeFile(sample, `picture-${w}x${h}.png`, '--size', `${w}x${h}!`),
    );
    const transfer = (path) =>
        page.evaluateHandle((base64) => {
            const bytes = Uint8Array.from(atob(base64), (character) => character.charCodeAt(0));
            const data = new DataTransfer();
            data.items.add(new File([bytes], 'given.png', { type: 'image/png' }));
            return data;
        }, readFileSync(path, 'base64'));

    const dropped = await transfer(files[0]);
    await page.dispatchEvent('body', 'dragenter', { dataTransfer: dropped });
    assert.ok(await page.locator('#drop').isVisible());
    await reworked(() => page.dispatchEvent('body', 'drop', { dataTransfer: dropped }));
    assert.ok(!(await page.locator('#drop').isVisible()));
    assert.match(await about(), /^120 × 90,/);
    await setSize(60, 45);
    await assertNative(files[0], 60, 45);

    const pasted = await transfer(files[1]);
    await reworked(() =>
        page.evaluate((clipboardData) => {
            window.dispatchEvent(new ClipboardEvent('paste', { clipboardData }));
        }, pasted),
    );
    assert.match(await about(), /^90 × 120,/);
    await setSize(45, 61);
    await assertNative(files[1], 45, 61);

    await reworked(() => page.locator('#file').setInputFiles(files[2]));
    assert.match(await about(), /^64 × 64,/);
    assert.equal(await page.locator('#name').textContent(), 'picture-64x64.png');
    await reworked(() => page.locator('#sample').click());
    assert.match(await about(), /^800 × 600,/);
});

test('sizes are typed and dragged, and keep the ratio', async () => {
    await reworked(() => page.locator('#width').fill('200'));
    assert.equal(await page.locator('#height').inputValue(), '150');
    await reworked(() => page.locator('#height').fill('300'));
    assert.equal(await page.locator('#width').inputValue(), '400');
    await reworked(async () => {
        const box = await page.locator('#scale').boundingBox();
        await page.mouse.move(box.x + box.width / 6, box.y + box.height / 2);
        await page.mouse.down();
        await page.mouse.move(box.x + box.width / 3, box.y + box.height / 2, { steps: 5 });
        await page.mouse.up();
    });
    const width = Number(await page.locator('#width').inputValue());
    assert.ok(width > 700 && width < 900, `${width}`);
    assert.equal(Number(await page.locator('#height').inputValue()), Math.round(width * 0.75));
    await setSize(100, 100);
    await assertNative(sample, 100, 100, ['lanczos']);
    await page.locator('#width').fill('0');
    await page.getByText('The width must be a whole number from 1 to 16384.').waitFor();
    await page.locator('#width').fill('16000');
    await page.locator('#height').fill('16000');
    await page.getByText('16000 × 16000 is more than the 100 megapixels').waitFor();
    await setSize(50, 40);
    assert.ok(!(await page.locator('#error').isVisible()));
});

test('all panes show the same part of their pictures', async () => {
    const [width, height, zoom] = [200, 150, 8];
    await setSize(width, height);
    await page.locator('#zoom-one').click();
    const pane = page.locator(paneCanvas('bilinear'));
    await pane.focus();
    for (let i = 0; i < 3; ++i) await page.keyboard.press('+');
    assert.equal(await page.locator('#zoom').textContent(), '800 %');
    for (const key of ['ArrowRight', 'ArrowRight', 'ArrowDown']) await page.keyboard.press(key);
    const box = await pane.boundingBox();
    await page.mouse.move(box.x + 100, box.y + 100);
    await page.mouse.down();
    await page.mouse.move(box.x + 124, box.y + 92, { steps: 4 });
    await page.mouse.up();
    await drawn();
    // 80 pixels right by keys and 24 left by mouse; 40 down and 8 down.
    const middle = { x: width / 2 + 56 / zoom, y: height / 2 + 48 / zoom };
    for (const engine of ENGINES) {
        const wanted = native(sample, engine, width, height);
        const found = await page.locator(paneCanvas(engine)).evaluate((canvas, [step, count]) => {
            // The middles of the large pixels right of the pane's own middle.
            const [x, y] = [canvas.width, canvas.height].map((side) => Math.round(side / 2) + step / 2);
            const copy = new OffscreenCanvas(step * count, 1);
            const copied = copy.getContext('2d', { willReadFrequently: true });
            copied.drawImage(canvas, -x, -y);
            const { data } = copied.getImageData(0, 0, step * count, 1);
            return Array.from({ length: count }, (_, i) => [...data.slice(4 * step * i, 4 * step * i + 4)]).flat();
        }, [zoom, 10]);
        const at = 4 * (middle.y * width + middle.x);
        assertSame(found, wanted.slice(at, at + 40), engine);
    }
    // The wheel zooms, Fit shows all again.
    await page.mouse.wheel(0, -240);
    await page.getByText('1,600 %').waitFor();
    await page.locator('#zoom-fit').click();
    assert.equal(await page.locator('#zoom').textContent(), '100 %');
});

test('a result is downloaded as PNG', async () => {
    await setSize(317, 211);
    for (const engine of ['lanczos', 'quarter']) {
        const [download] = await Promise.all([
            page.waitForEvent('download'),
            page.locator(`[data-engine=${engine}] button`).click(),
        ]);
        assert.equal(download.suggestedFilename(), `${engine}-317x211.png`);
        const path = join(folder, 'download.png');
        await download.saveAs(path);
        const wanted = native(sample, engine, 317, 211);
        // The tool's own size: it decodes the file, and its equal sizes copy with Lanczos.
        assertSame(nativePixels(path, 'rgba', '--size', '317x211!', '-e', 'lanczos'), wanted, engine);
    }
});

test('what is no picture is refused in words, and what was there stays', async () => {
    const broken = readFileSync(sample).fill(0, 30, 2000);
    for (const [name, bytes] of [['broken.png', broken], ['text.txt', Buffer.from('no picture')],
        ['empty.png', Buffer.alloc(0)]]) {
        const path = join(folder, name);
        writeFileSync(path, bytes);
        await page.locator('#file').setInputFiles(path);
        await page.getByText('That is not a picture that this browser can read.').waitFor();
        await setSize(120, 90);
        assert.ok(!(await page.locator('#error').isVisible()));
        await assertNative(sample, 120, 90, ['bilinear']);
    }
});

// A PNG of one bit per pixel, all of them black.
function blackPng(width, height) {
    const chunk = (type, data) => {
        const body = Buffer.concat([Buffer.from(type, 'latin1'), data]);
        const [length, sum] = [Buffer.alloc(4), Buffer.alloc(4)];
        length.writeUInt32BE(data.length);
        sum.writeUInt32BE(checksum(body));
        return Buffer.concat([length, body, sum]);
    };
    const header = Buffer.alloc(13);
    header.writeUInt32BE(width);
    header.writeUInt32BE(height, 4);
    header[8] = 1;
    const rows = deflateSync(Buffer.alloc((1 + Math.ceil(width / 8)) * height));
    const signature = Buffer.from('\x89PNG\r\n\x1a\n', 'latin1');
    const chunks = [chunk('IHDR', header), chunk('IDAT', rows), chunk('IEND', Buffer.alloc(0))];
    return Buffer.concat([signature, ...chunks]);
}

// CRC-32, as PNG wants it.
function checksum(bytes) {
    let sum = ~0;
    for (const byte of bytes) {
        sum ^= byte;
        for (let i = 0; i < 8; ++i) sum = (sum >>> 1) ^ (sum & 1 ? 0xedb88320 : 0);
    }
    return ~sum >>> 0;
}

test('a picture too large for a page is refused in words', async () => {
    const path = join(folder, 'too-large.png');
    writeFileSync(path, blackPng(14400, 14400));
    await page.locator('#file').setInputFiles(path);
    await page.getByText('That is too large for the memory that a page gets.').waitFor();
    writeFileSync(path, blackPng(1440, 1440));
    await reworked(() => page.locator('#file').setInputFiles(path));
    assert.match(await about(), /^1440 × 1440,/);
});

test('50 megapixels do not keep the page busy', async () => {
    const large = nativeFile(sample, 'large.jpg', '--size', '8660x5774!', '-q', '80');
    await page.evaluate(() => {
        window.gaps = [];
        let last = performance.now();
        const tick = () => {
            const now = performance.now();
            window.gaps.push(now - last);
            last = now;
            setTimeout(tick, 0);
        };
        tick();
    });
    const longest = [];
    // A machine with other work may keep the page waiting, but not every time.
    while (longest.length < 10 && !(Math.min(...longest) <= 100)) {
        await page.evaluate(() => {
            window.gaps.length = 0;
        });
        await useWith(large);
        const gaps = await page.evaluate(() => window.gaps);
        assert.ok(gaps.length > 10);
        longest.push(Math.max(...gaps));
    }
    console.log(`longest time without an answer: ${longest.map(Math.round).join(', ')} ms`);
    assert.ok(Math.min(...longest) <= 100, `${longest} ms`);
});

// Opens the picture, and uses the page while a large result is made.
async function useWith(file) {
    await reworked(() => page.locator('#file').setInputFiles(file));
    assert.match(await about(), /50\.0 megapixels/);
    await reworked(async () => {
        await page.locator('#width').fill('4330');
        await page.waitForTimeout(300);
        for (let answers = 0; answers < 6; ++answers) {
            const before = await page.locator('#zoom').textContent();
            await page.locator(answers % 2 === 0 ? '#zoom-in' : '#zoom-out').click();
            assert.notEqual(await page.locator('#zoom').textContent(), before);
        }
    });
}

test('a picture is taken with the camera', async () => {
    const server = await serve();
    const served = await watchedPage(context, `${server.url}/build/web/index.html`);
    await context.grantPermissions(['camera']);
    await served.locator('#camera').click();
    await served.locator('#camera-dialog').waitFor();
    await served.locator('#take').click();
    await served.getByText('Picture from the camera').waitFor();
    assert.ok(!(await served.locator('#camera-dialog').isVisible()));
    await context.clearPermissions();
    await served.evaluate(() => {
        navigator.mediaDevices.getUserMedia = () =>
            Promise.reject(new DOMException('', 'NotAllowedError'));
    });
    await served.locator('#camera').click();
    await served.getByText('The browser does not let this page use the camera.').waitFor();
    assertNoComplaints(served);
    server.close();
});

test('everything is reached by keyboard', async () => {
    const reached = new Set();
    await page.locator('h1').click();
    for (let i = 0; i < 40; ++i) {
        await page.keyboard.press('Tab');
        reached.add(
            await page.evaluate(() => {
                const { activeElement: at } = document;
                return at.id || `${at.tagName} of ${at.closest('[data-engine]')?.dataset.engine}`;
            }),
        );
    }
    const wanted = ['choose', 'camera', 'sample', 'width', 'height', 'scale', 'ratio', 'letterbox', 'zoom-out',
        'zoom-in', 'zoom-one', 'zoom-fit', 'first', 'second', 'difference'];
    for (const engine of ENGINES) wanted.push(`BUTTON of ${engine}`, `CANVAS of ${engine}`);
    assert.deepEqual(wanted.filter((name) => !reached.has(name)), []);
});

for (const colorScheme of ['light', 'dark']) {
    for (const width of [1440, 360]) {
        test(`axe finds nothing, ${colorScheme}, ${width} pixels wide`, async () => {
            await page.emulateMedia({ colorScheme });
            await page.setViewportSize({ width, height: 800 });
            // Its code is not the page's, which would not let it in.
            const session = await context.newCDPSession(page);
            await session.send('Runtime.evaluate', { expression: axeSource });
            const findings = async () => {
                const { result } = await session.send('Runtime.evaluate', {
                    expression: 'axe.run().then((found) => JSON.stringify(found.violations))',
                    awaitPromise: true,
                    returnByValue: true,
                });
                return JSON.parse(result.value).map((found) => `${found.id}: ${found.nodes[0].html}`);
            };
            assert.deepEqual(await findings(), []);
            await page.locator('#width').fill('0');
            await page.locator('#error').waitFor();
            assert.deepEqual(await findings(), []);
            await page.evaluate(() => document.getElementById('camera-dialog').showModal());
            assert.deepEqual(await findings(), []);
            // Nothing is wider than the page.
            const overhang = await page.evaluate(
                () => document.documentElement.scrollWidth - document.documentElement.clientWidth,
            );
            assert.equal(overhang, 0);
        });
    }
}
