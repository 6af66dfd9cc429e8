// SPDX-License-Identifier: Apache-2.0
// docs_test.mjs: the site of ./dev docs in a browser, on a phone and on a desk, light and dark.
import assert from 'node:assert/strict';
import { after, before, test } from 'node:test';

import { PATIENCE_MS, serve, startBrowser } from './browser.mjs';

const PAGES = ['index', 'group__c3', 'md_docs_functions', 'md_docs_coming_from', 'md_docs_performance',
    'md_docs_kernels', 'md_docs_neon', 'md_docs_resamplers', 'namespaceovrin_1_1v1'];
let browser;
let server;

before(async () => {
    browser = await startBrowser();
    server = await serve();
});
after(async () => {
    await browser.close();
    server.close();
});

async function open(name, width, colorScheme) {
    const page = await browser.newPage({ viewport: { width, height: 800 }, colorScheme });
    page.setDefaultTimeout(PATIENCE_MS);
    page.complaints = [];
    page.on('console', (message) => {
        const ours = !message.location().url.endsWith('/favicon.ico'); // the browser's own wish
        if (ours && ['error', 'warning'].includes(message.type())) page.complaints.push(message.text());
    });
    page.on('pageerror', (error) => page.complaints.push(String(error)));
    page.on('request', (request) => {
        if (!request.url().startsWith(server.url) && !/^(data|blob):/.test(request.url())) page.complaints.push(`request: ${request.url()}`);
    });
    await page.goto(`${server.url}/build/docs/html/${name}.html`);
    return page;
}

// In the page: how bright the text and what is behind it are, 0 to 255.
function brightness() {
    const grey = (color) => color.match(/\d+/g).slice(0, 3).reduce((sum, part) => sum + Number(part), 0) / 3;
    return {
        text: grey(getComputedStyle(document.querySelector('.contents, .textblock')).color),
        ground: grey(getComputedStyle(document.body).backgroundColor),
    };
}

for (const width of [1440, 360]) {
    for (const scheme of ['light', 'dark']) {
        test(`pages fit ${width} pixels and can be read, ${scheme}`, async () => {
            for (const name of PAGES) {
                const page = await open(name, width, scheme);
                const { text, ground } = await page.evaluate(brightness);
                assert.ok(scheme === 'dark' ? ground < 60 : ground > 220, `${name}: ground ${ground}`);
                assert.ok(Math.abs(text - ground) > 120, `${name}: text ${text} on ${ground}`);
                const over = await page.evaluate(() => Math.max(
                    ...[document.documentElement, document.querySelector('#doc-content')].map(
                        (element) => element.scrollWidth - element.clientWidth)));
                assert.ok(over <= 0, `${name} is ${over} pixels too wide`);
                const broken = await page.evaluate(() => [...document.querySelectorAll('.contents img')]
                    .filter((image) => !image.complete || image.naturalWidth === 0).map((image) => image.src));
                assert.deepEqual(broken, []);
                assert.deepEqual(page.complaints, []);
                await page.close();
            }
        });
    }
}

test('a function is found by a part of its name', async () => {
    for (const [typed, found] of [['nv21', 'ovrin_resize_nv21'], ['ov_lanc', 'ov_lanczos'], ['keep', 'ovrin_resize_y_u_v_keep_ratio'],
        ['coming', 'Coming from libyuv, OpenCV, stb or swscale']]) {
        const page = await open('index', 1440, 'light');
        await page.locator('#MSearchField').pressSequentially(typed, { delay: 20 });
        const results = page.frameLocator('#MSearchResults');
        await results.getByText(found, { exact: true }).first().click();
        await page.waitForURL(/group__|md_docs/);
        assert.ok((await page.textContent('body')).includes(found));
        assert.deepEqual(page.complaints, []);
        await page.close();
    }
});
