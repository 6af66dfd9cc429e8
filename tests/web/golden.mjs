// SPDX-License-Identifier: Apache-2.0
// The golden cases on a module, in Node and in browsers.

const PAGE = 65536;
const ROOM = 48 << 20; // the second module's data begin at 32 MB

/** The lines of golden.txt, as the module computes them. Both arguments are bytes of .wasm files. */
export async function goldenLines(libraryBytes, goldenBytes) {
    const library = (await WebAssembly.instantiate(libraryBytes, {})).instance.exports;
    library._initialize();
    const { memory } = library;
    memory.grow(ROOM / PAGE - memory.buffer.byteLength / PAGE);
    const refuse = () => {
        throw new Error('the cases use no files');
    };
    const files = { fd_close: refuse, fd_seek: refuse, fd_write: refuse };
    const golden = await WebAssembly.instantiate(goldenBytes, {
        env: { ...library, library_free: library.free },
        wasi_snapshot_preview1: files,
    });
    golden.instance.exports._initialize();
    const start = golden.instance.exports.golden_lines();
    const bytes = new Uint8Array(memory.buffer);
    return new TextDecoder().decode(bytes.slice(start, bytes.indexOf(0, start)));
}

/**
 * What differs from the two files' lines, of which the second one's win: there are no threads. Cases
 * that only one side has differ too.
 */
export function differences(lines, golden, withoutThreads) {
    const parsed = (text) => text.trim().split('\n').map((line) => line.split(' '));
    const wanted = new Map([...parsed(golden), ...parsed(withoutThreads)]);
    const found = new Map(parsed(lines));
    const names = new Set([...wanted.keys(), ...found.keys()]);
    return [...names].filter((name) => wanted.get(name) !== found.get(name));
}
