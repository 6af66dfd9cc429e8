// SPDX-License-Identifier: Apache-2.0
// What is on the page. The work is done in worker.js, the drawing in view.js.
import { ENGINES, hasSimd } from '../bindings/js/resizer.js';
import { View } from './view.js';

const LARGEST_RESULT = 100e6; // pixels: six results of these are kept
const SETTLE_MS = 120; // after the last change of a size

const LABELS = {
    quarter: 'Quarter',
    bilinear: 'Bilinear',
    lanczos: 'Lanczos',
    nearest: 'Nearest',
    drawImage: 'drawImage',
    createImageBitmap: 'createImageBitmap',
};
const HINTS = { drawImage: 'the browser’s, high quality', createImageBitmap: 'the browser’s, high quality' };

const TEXTS = {
    'not-a-picture': 'That is not a picture that this browser can read. PNG, JPEG, WebP and the like can be opened.',
    'too-large': 'That is too large for the memory that a page gets. Take a smaller picture or a smaller size.',
    unknown: 'That did not work, and the browser says no more than this: ',
};

const element = (id) => document.getElementById(id);
const decimal = (number, digits) =>
    number.toLocaleString('en', { minimumFractionDigits: digits, maximumFractionDigits: digits });

let worker = null;
let request = 0; // number of the newest
let source = null; // its { width, height }
let openedName = '';
let wanted = null; // the newest size asked for
let timer = 0;
const times = new Map();

// ---- Panes, figures and messages ----

const view = new View(() => {
    element('zoom').textContent = `${decimal(view.zoom * 100, view.zoom < 0.1 ? 1 : 0)} %`;
});
const panes = new Map();

function makePane(name) {
    const pane = element('pane').content.cloneNode(true).firstElementChild;
    pane.dataset.engine = name;
    pane.querySelector('h2').textContent = LABELS[name];
    const button = pane.querySelector('button');
    button.setAttribute('aria-label', `Download the ${LABELS[name]} result as PNG`);
    button.addEventListener('click', () => worker.postMessage({ type: 'png', name }));
    button.disabled = true;
    const canvas = pane.querySelector('canvas');
    canvas.setAttribute('aria-label', `${LABELS[name]} result`);
    element('panes').append(pane);
    const figures = pane.querySelector('.figures');
    panes.set(name, { button, figures, pane: view.addPane(canvas) });
}

function showError(text) {
    element('error').textContent = text;
    element('error').hidden = text === '';
}

function showStatus(text) {
    element('status').textContent = text;
}

function megapixelsPerSecond(ms) {
    return (source.width * source.height) / 1000 / ms;
}

function showTimes() {
    const most = Math.max(...times.values());
    element('times').replaceChildren(
        ...[...times].map(([name, ms]) => {
            const row = document.createElement('tr');
            const head = document.createElement('th');
            head.scope = 'row';
            head.textContent = LABELS[name];
            if (HINTS[name]) {
                const hint = document.createElement('small');
                hint.textContent = HINTS[name];
                head.append(' ', hint);
            }
            const [time, rate, bar] = ['td', 'td', 'td'].map((tag) => document.createElement(tag));
            time.textContent = decimal(ms, ms < 100 ? 2 : 0);
            rate.textContent = decimal(megapixelsPerSecond(ms), 0);
            const line = document.createElement('i');
            line.style.width = `${Math.max(1, (100 * ms) / most)}%`;
            bar.append(line);
            row.className = HINTS[name] ? 'browser' : '';
            row.append(head, time, rate, bar);
            return row;
        }),
    );
}

// ---- Opening ----

function openBlob(blob, name) {
    showError('');
    showStatus('Reading the picture');
    clearTimeout(timer);
    openedName = name;
    worker.postMessage({ type: 'open', id: ++request, blob });
}

function bytesOf(id) {
    return Uint8Array.from(atob(element(id).textContent), (character) => character.charCodeAt(0));
}

function openSample() {
    openBlob(new Blob([bytesOf('sample-png')], { type: 'image/png' }), 'Sample picture');
}

function openFile(file) {
    if (file) openBlob(file, file.name || 'Pasted picture');
}

function opened({ width, height }) {
    source = { width, height };
    element('name').textContent = openedName;
    element('about').textContent =
        `${width} × ${height}, ${decimal((width * height) / 1e6, 1)} megapixels`;
    element('ratio').checked = true;
    element('letterbox').checked = false;
    setScale(pleasantScale());
    view.isFitted = true;
    resizeNow();
}

// ---- Sizes ----

const side = (id) => element(id).valueAsNumber;

function setSides(width, height) {
    element('width').value = Math.max(1, Math.round(width));
    element('height').value = Math.max(1, Math.round(height));
}

function setScale(percent) {
    element('scale').value = percent;
    setSides((source.width * percent) / 100, (source.height * percent) / 100);
    showScale(percent);
}

// A whole number of pixels for each, so that the nearest one steps evenly.
function pleasantScale() {
    const most = Math.max(source.width, source.height);
    return [50, 25, 10].find((percent) => (most * percent) / 100 <= 1000) ?? 5;
}

function showScale(percent) {
    element('percent').textContent = `${decimal(percent, percent < 10 ? 1 : 0)} %`;
}

function sideChanged(changed) {
    if (!source) return;
    const value = side(changed);
    if (element('ratio').checked && value >= 1) {
        const { width, height } = source;
        if (changed === 'width') setSides(value, (value * height) / width);
        else setSides((value * width) / height, value);
    }
    const percent = (100 * side('width')) / source.width;
    element('scale').value = percent;
    showScale(percent);
    resizeSoon();
}

function wantedSize() {
    const width = side('width');
    const height = side('height');
    for (const [name, value] of Object.entries({ width, height })) {
        if (!Number.isInteger(value) || value < 1 || value > 16384) {
            return `The ${name} must be a whole number from 1 to 16384.`;
        }
    }
    if (width * height > LARGEST_RESULT) {
        return `${width} × ${height} is more than the ${LARGEST_RESULT / 1e6} megapixels that this page makes.`;
    }
    return { width, height, letterbox: element('letterbox').checked };
}

function resizeSoon() {
    clearTimeout(timer);
    timer = setTimeout(resizeNow, SETTLE_MS);
}

function resizeNow() {
    if (!source) return;
    const size = wantedSize();
    if (typeof size === 'string') {
        showError(size);
        return;
    }
    showError('');
    showStatus('Resizing');
    wanted = size;
    times.clear();
    worker.postMessage({ type: 'run', id: ++request, size });
}

// ---- What the worker says ----

function showResult({ name, bitmap, ms }) {
    times.set(name, ms);
    showTimes();
    const shown = panes.get(name);
    if (!shown) {
        bitmap.close();
        return;
    }
    const { width, height } = wanted;
    if (view.size.width !== width || view.size.height !== height) {
        const aspect = Math.min(1.8, Math.max(0.75, width / height));
        element('panes').style.setProperty('--aspect', aspect);
        view.setSize(width, height);
    }
    shown.pane.show(bitmap);
    shown.button.disabled = false;
    shown.figures.textContent =
        `${decimal(ms, ms < 100 ? 2 : 0)} ms · ${decimal(megapixelsPerSecond(ms), 0)} MP/s`;
}

function askForDifference() {
    const names = [element('first').value, element('second').value];
    worker.postMessage({ type: 'difference', id: request, names });
}

function showDifference({ bitmap, largest, share }) {
    differencePane.show(bitmap);
    element('difference-figures').textContent =
        largest === 0
            ? 'The two are the same.'
            : `${decimal(100 * share, 1)} % of the pixels differ, by ${largest} of 255 at most.`;
}

function savePng({ name, blob }) {
    const link = document.createElement('a');
    link.href = URL.createObjectURL(blob);
    link.download = `${name}-${wanted.width}x${wanted.height}.png`;
    link.click();
    setTimeout(() => URL.revokeObjectURL(link.href), 10000);
}

function failed({ reason, text }) {
    showStatus('');
    showError(TEXTS[reason] + (reason === 'unknown' ? text : ''));
}

const HEARD = {
    ready: () => openSample(),
    opened,
    result: showResult,
    done: () => {
        showStatus(`${source.width} × ${source.height} to ${wanted.width} × ${wanted.height}`);
        askForDifference();
    },
    difference: showDifference,
    png: savePng,
    failed,
};

function hear({ data }) {
    if (data.id !== undefined && data.id !== request) {
        data.bitmap?.close();
        return;
    }
    HEARD[data.type](data);
}

function startWorker() {
    if (typeof WebAssembly !== 'object' || typeof OffscreenCanvas !== 'function') {
        element('module').textContent = 'not started';
        showError('This browser is too old: the page needs WebAssembly, and canvases in workers.');
        return;
    }
    const simd = hasSimd();
    const bytes = bytesOf(simd ? 'module-simd' : 'module-scalar');
    const code = new Blob([element('worker').textContent], { type: 'text/javascript' });
    worker = new Worker(URL.createObjectURL(code));
    worker.onmessage = hear;
    worker.onerror = (event) => showError(TEXTS.unknown + event.message);
    element('module').textContent =
        `WebAssembly ${simd ? 'with vectors' : 'without vectors: this browser has none'}, ${decimal(bytes.length / 1000, 0)} KB`;
    element('module').dataset.simd = simd;
    worker.postMessage({ type: 'init', bytes });
}

// ---- Camera ----

const CAMERA_TEXTS = {
    NotAllowedError: 'The browser does not let this page use the camera.',
    NotFoundError: 'There is no camera.',
    NotReadableError: 'The camera is in use elsewhere.',
};

async function startCamera() {
    showError('');
    try {
        const video = { width: { ideal: 4096 }, height: { ideal: 4096 } };
        const stream = await navigator.mediaDevices.getUserMedia({ video });
        element('video').srcObject = stream;
        await element('video').play();
        element('camera-dialog').showModal();
    } catch (error) {
        showError(CAMERA_TEXTS[error.name] ?? 'This browser gives no camera to this page.');
    }
}

function stopCamera() {
    for (const track of element('video').srcObject?.getTracks() ?? []) track.stop();
    element('video').srcObject = null;
}

async function takePicture() {
    const bitmap = await createImageBitmap(element('video'));
    const canvas = document.createElement('canvas');
    canvas.width = bitmap.width;
    canvas.height = bitmap.height;
    canvas.getContext('2d').drawImage(bitmap, 0, 0);
    canvas.toBlob((blob) => openBlob(blob, 'Picture from the camera'));
    element('camera-dialog').close();
}

// ---- The page ----

for (const engine of ENGINES) makePane(engine);
const differencePane = view.addPane(element('difference'));

for (const [id, chosen] of [['first', 'lanczos'], ['second', 'bilinear']]) {
    for (const [name, label] of Object.entries(LABELS)) {
        element(id).append(new Option(label, name, false, name === chosen));
    }
    element(id).addEventListener('change', askForDifference);
}

element('choose').addEventListener('click', () => element('file').click());
element('file').addEventListener('change', (event) => {
    openFile(event.target.files[0]);
    event.target.value = '';
});
element('sample').addEventListener('click', openSample);
element('camera').addEventListener('click', startCamera);
element('take').addEventListener('click', takePicture);
element('camera-close').addEventListener('click', () => element('camera-dialog').close());
element('camera-dialog').addEventListener('close', stopCamera);

for (const id of ['width', 'height']) element(id).addEventListener('input', () => sideChanged(id));
element('scale').addEventListener('input', () => {
    if (!source) return;
    setScale(Number(element('scale').value));
    resizeSoon();
});
element('ratio').addEventListener('change', () => sideChanged('width'));
element('letterbox').addEventListener('change', () => {
    // A canvas of the picture's own ratio would have no bars.
    element('ratio').checked = !element('letterbox').checked;
    if (element('ratio').checked) sideChanged('width');
    else resizeSoon();
});
element('size').addEventListener('submit', (event) => event.preventDefault());

element('zoom-in').addEventListener('click', () => view.zoomBy(2));
element('zoom-out').addEventListener('click', () => view.zoomBy(0.5));
element('zoom-one').addEventListener('click', () => view.zoomBy(1 / view.zoom));
element('zoom-fit').addEventListener('click', () => view.fit());

const hasFiles = (event) => [...(event.dataTransfer?.types ?? [])].includes('Files');
for (const type of ['dragenter', 'dragover']) {
    window.addEventListener(type, (event) => {
        if (!hasFiles(event)) return;
        event.preventDefault();
        element('drop').hidden = false;
    });
}
window.addEventListener('dragleave', (event) => {
    if (event.relatedTarget === null) element('drop').hidden = true;
});
window.addEventListener('drop', (event) => {
    event.preventDefault();
    element('drop').hidden = true;
    openFile(event.dataTransfer.files[0]);
});
window.addEventListener('paste', (event) => openFile(event.clipboardData.files[0]));

startWorker();
