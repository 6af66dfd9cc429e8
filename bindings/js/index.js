// SPDX-License-Identifier: Apache-2.0
// Loads the module that this engine can run.
import { hasSimd, Resizer } from './resizer.js';

export { ENGINES, fit, hasSimd, LARGEST_SIDE, Resizer } from './resizer.js';

async function compiled(url) {
    if (url.protocol === 'file:' && typeof process !== 'undefined') {
        const { readFile } = await import('node:fs/promises');
        return WebAssembly.compile(await readFile(url));
    }
    const response = await fetch(url);
    if (!response.ok) throw new Error(`${url} cannot be loaded: ${response.status}`);
    // Not compileStreaming: that insists on a media type which not every server sends.
    return WebAssembly.compile(await response.arrayBuffer());
}

/** A Resizer. Its module has vector instructions where they run, unless `simd` is false. */
export async function load({ simd = hasSimd() } = {}) {
    const url = simd
        ? new URL('./ovrinresize.wasm', import.meta.url)
        : new URL('./ovrinresize-scalar.wasm', import.meta.url);
    return new Resizer(await compiled(url));
}
