// SPDX-License-Identifier: Apache-2.0
// build.mjs PACKAGE SAMPLE OUTPUT: the page as one file, which runs from a folder too: browsers load
// neither modules nor WebAssembly from there. PACKAGE is the folder with the two .wasm files.
import { readFileSync, writeFileSync } from 'node:fs';
import { dirname, join } from 'node:path';
import { fileURLToPath } from 'node:url';

const [packageFolder, sample, output] = process.argv.slice(2);
const web = dirname(fileURLToPath(import.meta.url));

const text = (file) => readFileSync(join(web, file), 'utf8');
const base64 = (file) => readFileSync(file).toString('base64');

// Modules that import nothing but each other, in the order of need, as one script.
function script(...files) {
    const parts = files.map((file) =>
        text(file)
            .replace(/^import [^;]*;\n/gm, '')
            .replace(/^export /gm, ''),
    );
    const whole = `'use strict';\n(() => {\n${parts.join('\n')}\n})();\n`;
    if (/<\/script/i.test(whole)) throw new Error('a script would end early');
    return whole;
}

const resizer = '../bindings/js/resizer.js';
const parts = {
    '/*STYLE*/': text('style.css'),
    '/*SIMD*/': base64(join(packageFolder, 'ovrinresize.wasm')),
    '/*SCALAR*/': base64(join(packageFolder, 'ovrinresize-scalar.wasm')),
    '/*SAMPLE*/': base64(sample),
    '/*WORKER*/': script(resizer, 'worker.js'),
    '/*PAGE*/': script(resizer, 'view.js', 'page.js'),
};

let page = text('index.html');
for (const [place, content] of Object.entries(parts)) {
    if (page.split(place).length !== 2) throw new Error(`${place} is not there once`);
    page = page.replace(place, () => content);
}
writeFileSync(output, page);
