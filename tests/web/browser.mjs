// SPDX-License-Identifier: Apache-2.0
// A browser for tests, and a file server for it.
import assert from 'node:assert/strict';
import { readFile } from 'node:fs/promises';
import { createServer } from 'node:http';
import { extname, join, normalize } from 'node:path';
import { pathToFileURL } from 'node:url';

import { chromium } from 'playwright-core';

import { root } from './native.mjs';

const TYPES = {
    '': 'text/html',
    '.css': 'text/css',
    '.html': 'text/html',
    '.js': 'text/javascript',
    '.mjs': 'text/javascript',
    '.svg': 'image/svg+xml',
    other: 'application/octet-stream',
};
const FLAGS = [
    '--disable-gpu', '--disable-quic', '--no-first-run', '--disable-background-networking',
    '--disable-component-update', '--disable-sync', '--use-fake-device-for-media-stream',
    '--use-fake-ui-for-media-stream',
];

// On a busy machine everything takes long; what never comes is given up then.
export const PATIENCE_MS = 180000;

export function startBrowser() {
    return chromium.launch({
        executablePath: '/usr/bin/chromium', chromiumSandbox: false, args: FLAGS, timeout: PATIENCE_MS,
    });
}

/** Serves the folder of the project, and an empty page at its root; gives { url, close }. */
export async function serve() {
    const server = createServer(async (request, response) => {
        const path = normalize(new URL(request.url, 'http://host').pathname);
        try {
            const body = path === '/' ? '' : await readFile(join(root, path));
            response.setHeader('content-type', TYPES[extname(path)] ?? TYPES.other);
            response.end(body);
        } catch {
            response.statusCode = 404;
            response.end();
        }
    });
    await new Promise((resolve) => server.listen(0, '127.0.0.1', resolve));
    return { url: `http://127.0.0.1:${server.address().port}`, close: () => server.close() };
}

/** A page that fails the test when it complains, or asks for anything but itself. */
export async function watchedPage(context, address) {
    const page = await context.newPage();
    page.setDefaultTimeout(PATIENCE_MS);
    page.complaints = [];
    page.on('console', (message) => {
        if (message.type() === 'error' || message.type() === 'warning') page.complaints.push(message.text());
    });
    page.on('pageerror', (error) => page.complaints.push(String(error)));
    page.on('request', (request) => {
        const url = request.url();
        if (url !== address && !/^(data|blob):/.test(url)) page.complaints.push(`request: ${url}`);
    });
    await page.goto(address);
    return page;
}

export function assertNoComplaints(page) {
    assert.deepEqual(page.complaints, []);
}

const pagePath = join(root, 'build/web/index.html');
export const pageFile = String(pathToFileURL(pagePath));
