// SPDX-License-Identifier: Apache-2.0
// What the native library makes of a picture, by way of the command-line tool.
import assert from 'node:assert/strict';
import { execFileSync } from 'node:child_process';
import { mkdtempSync, readFileSync, writeFileSync } from 'node:fs';
import { tmpdir } from 'node:os';
import { join } from 'node:path';

export const root = process.env.OVRIN_ROOT;
const tool = join(root, 'build/release/tools/ovrinresize');
export const folder = mkdtempSync(join(tmpdir(), 'ovrinresize-'));

// A size is meant exactly, whatever the ratio.
function run(input, output, options) {
    const fit = options.includes('--size') && !options.includes('--fit') ? ['--fit', 'exact'] : [];
    execFileSync(tool, [input, output, ...options, ...fit]);
}

/** The bytes of the picture file, resized and in the raw format. */
export function nativePixels(file, format, ...options) {
    const output = join(folder, `result.${format}`);
    run(file, output, options);
    return new Uint8Array(readFileSync(output));
}

/** The same of a raw picture. */
export function nativeFrame(bytes, format, width, height, ...options) {
    const input = join(folder, `source.${format}`);
    writeFileSync(input, bytes);
    return nativePixels(input, format, '--format', format, '--input-size', `${width}x${height}`, ...options);
}

/** A file that the tool writes. */
export function nativeFile(file, name, ...options) {
    const output = join(folder, name);
    run(file, output, options);
    return output;
}

/** Bytes that look like nothing in particular, the same in every run. */
export function noise(count, seed = 1) {
    const bytes = new Uint8Array(count);
    let state = seed;
    for (let i = 0; i < count; ++i) {
        state = (Math.imul(state, 1664525) + 1013904223) >>> 0;
        bytes[i] = state >>> 24;
    }
    return bytes;
}

/** That two pictures have the same bytes; where they first differ if not. */
export function assertSame(found, wanted, name) {
    assert.equal(found.length, wanted.length, name);
    const at = wanted.findIndex((byte, i) => byte !== found[i]);
    assert.equal(at, -1, `${name}: byte ${at} is ${found[at]}, not ${wanted[at]}`);
}
