// SPDX-License-Identifier: Apache-2.0
// The WebAssembly module's functions with sizes and buffers checked. Knows nothing of files: index.js
// loads the module, or whoever has it elsewhere.

/** Products of two sides up to this one fit the 32 bits in which the library counts. */
export const LARGEST_SIDE = 32767;

export const ENGINES = Object.freeze(['quarter', 'bilinear', 'lanczos', 'nearest']);

// A function that splats a byte over a vector.
const SIMD_PROBE = new Uint8Array([
    0x00, 0x61, 0x73, 0x6d, 0x01, 0x00, 0x00, 0x00, 0x01, 0x04, 0x01, 0x60, 0x00, 0x00, 0x03, 0x02,
    0x01, 0x00, 0x0a, 0x09, 0x01, 0x07, 0x00, 0x41, 0x00, 0xfd, 0x0f, 0x1a, 0x0b,
]);

/** Whether this engine runs WebAssembly's vector instructions. */
export function hasSimd() {
    return WebAssembly.validate(SIMD_PROBE);
}

// Format codes of the bilinear engine.
const BILINEAR = { rgba: 7, i420: 2, nv21: 18 };

const half = (side) => (side + 1) >> 1;

const FORMATS = {
    rgba: { bytes: (w, h) => 4 * w * h, formula: (w, h) => `${w} x ${h} x 4`, sample: 4 },
    i420: {
        bytes: (w, h) => w * h + 2 * half(w) * half(h),
        formula: (w, h) => `${w} x ${h} + 2 x ${half(w)} x ${half(h)}`,
        sample: 1,
    },
};
FORMATS.nv21 = { ...FORMATS.i420, sample: 2 };

function checkSide(name, value) {
    if (!Number.isInteger(value) || value < 1 || value > LARGEST_SIDE) {
        throw new RangeError(`${name} is ${value}, must be a whole number from 1 to ${LARGEST_SIDE}`);
    }
}

function checkSizes(sizes) {
    for (const [name, value] of Object.entries(sizes)) checkSide(name, value);
}

function checkEngine(engine, known) {
    if (!known.includes(engine)) {
        throw new TypeError(`engine is ${JSON.stringify(engine)}, must be one of ${known.join(', ')}`);
    }
}

// The first bytes of the picture, of which there must be enough.
function bytesOf(picture, format, width, height) {
    if (!(picture instanceof Uint8Array || picture instanceof Uint8ClampedArray)) {
        throw new TypeError('the picture is neither a Uint8ClampedArray nor a Uint8Array');
    }
    const needed = FORMATS[format].bytes(width, height);
    if (picture.length < needed) {
        const formula = FORMATS[format].formula(width, height);
        throw new RangeError(`the picture holds ${picture.length} bytes, ${needed} needed (${formula})`);
    }
    return picture.subarray(0, needed);
}

function isImageData(value) {
    return typeof value === 'object' && value !== null && 'data' in value && 'width' in value;
}

// What the engines need besides the pictures: 4:2:0 a work buffer, Lanczos weights for each column
// and row and some source rows, bilinear tables.
function workBytes(width, height, newWidth, newHeight) {
    return 2 * (newWidth + 3) * (newHeight + 3) + 128 * (width + newWidth + newHeight) + (1 << 20);
}

/**
 * The largest size of the ratio width : height in a canvas, and its place in the middle, at even
 * positions: chroma then lies where its luma does.
 */
export function fit(width, height, canvasWidth, canvasHeight) {
    checkSizes({ width, height, canvasWidth, canvasHeight });
    const scaled = (side, to, from) => Math.max(1, Math.floor((side * to) / from));
    const wider = width * canvasHeight > canvasWidth * height;
    const w = wider ? canvasWidth : scaled(width, canvasHeight, height);
    const h = wider ? scaled(height, canvasWidth, width) : canvasHeight;
    const middle = (room) => Math.floor(room / 4) * 2;
    return { x: middle(canvasWidth - w), y: middle(canvasHeight - h), width: w, height: h };
}

/** One instance of the module. Its memory grows to what the largest picture took. */
export class Resizer {
    #library;

    /** `module` is what index.js, or whoever else, has compiled of one of the two .wasm files. */
    constructor(module) {
        this.#library = new WebAssembly.Instance(module, {}).exports;
        this.#library._initialize();
    }

    /**
     * RGBA pixels, four bytes each, or an ImageData: resize(image, newWidth, newHeight, options). An
     * ImageData gives an ImageData, bytes give a Uint8ClampedArray.
     */
    resize(picture, ...rest) {
        if (isImageData(picture)) {
            const [newWidth, newHeight, options] = rest;
            const { data, width, height } = picture;
            const pixels = this.resize(data, width, height, newWidth, newHeight, options);
            return new ImageData(pixels, newWidth, newHeight);
        }
        const [width, height, newWidth, newHeight, { engine = 'quarter' } = {}] = rest;
        checkEngine(engine, ENGINES);
        return this.#resize(picture, 'rgba', engine, width, height, newWidth, newHeight);
    }

    /** A plane of Y, then U and V at half the size in either direction, rounded up. */
    resizeI420(picture, width, height, newWidth, newHeight, { engine = 'quarter' } = {}) {
        return this.#resizePlanes(picture, 'i420', engine, width, height, newWidth, newHeight);
    }

    /** A plane of Y, then V and U in turn, at half the size in either direction, rounded up. */
    resizeNv21(picture, width, height, newWidth, newHeight, { engine = 'quarter' } = {}) {
        return this.#resizePlanes(picture, 'nv21', engine, width, height, newWidth, newHeight);
    }

    /**
     * RGBA pixels, or an ImageData, as large as fits into the middle of a canvas of zeros: transparent
     * black. Takes the arguments of resize(), with the canvas's size as the new one.
     */
    letterbox(picture, ...rest) {
        if (isImageData(picture)) {
            const [canvasWidth, canvasHeight, options] = rest;
            const { data, width, height } = picture;
            const pixels = this.letterbox(data, width, height, canvasWidth, canvasHeight, options);
            return new ImageData(pixels, canvasWidth, canvasHeight);
        }
        const [width, height, canvasWidth, canvasHeight, { engine = 'quarter' } = {}] = rest;
        checkEngine(engine, ENGINES);
        if (engine === 'quarter') {
            return this.#letterbox(picture, 'rgba', width, height, canvasWidth, canvasHeight);
        }
        const place = fit(width, height, canvasWidth, canvasHeight);
        const scaled = this.resize(picture, width, height, place.width, place.height, { engine });
        const canvas = new Uint8ClampedArray(4 * canvasWidth * canvasHeight);
        const row = 4 * place.width;
        for (let y = 0; y < place.height; ++y) {
            const at = 4 * ((place.y + y) * canvasWidth + place.x);
            canvas.set(scaled.subarray(y * row, (y + 1) * row), at);
        }
        return canvas;
    }

    /** An I420 picture in the middle of a black canvas. */
    letterboxI420(picture, width, height, canvasWidth, canvasHeight) {
        return this.#letterbox(picture, 'i420', width, height, canvasWidth, canvasHeight);
    }

    /** An NV21 picture in the middle of a black canvas. */
    letterboxNv21(picture, width, height, canvasWidth, canvasHeight) {
        return this.#letterbox(picture, 'nv21', width, height, canvasWidth, canvasHeight);
    }

    #resizePlanes(picture, format, engine, width, height, newWidth, newHeight) {
        checkEngine(engine, ['quarter', 'bilinear', 'lanczos']);
        return this.#resize(picture, format, engine, width, height, newWidth, newHeight);
    }

    #resize(picture, format, engine, width, height, newWidth, newHeight) {
        checkSizes({ width, height, newWidth, newHeight });
        const source = bytesOf(picture, format, width, height);
        const call = { format, engine, width, height, newWidth, newHeight };
        return this.#run(source, call, (src, dst) => this.#call(src, dst, call));
    }

    #letterbox(picture, format, width, height, newWidth, newHeight) {
        const place = fit(width, height, newWidth, newHeight);
        const source = bytesOf(picture, format, width, height);
        const call = { format, engine: 'quarter', width, height, newWidth, newHeight };
        return this.#run(source, call, (src, dst) => {
            this.#withTarget(call, place, dst, (target) => {
                const luma = width * height;
                const chroma = half(width) * half(height);
                const lib = this.#library;
                if (format === 'rgba') {
                    lib.ovrin_resize_rgba8888_keep_ratio(src, width, height, target);
                } else if (format === 'nv21') {
                    lib.ovrin_resize_y_nv21_keep_ratio(src, src + luma, width, height, target);
                } else {
                    const u = src + luma;
                    lib.ovrin_resize_y_u_v_keep_ratio(src, u, u + chroma, width, height, target);
                }
            });
        });
    }

    // An ovrin_resize_target in the module's memory: 32-bit words, pointers too.
    #withTarget({ width, height, newWidth, newHeight }, place, dst, use) {
        const words = [
            0, 0, 0, 0, width, height, width, height, 0,
            dst, place.width, place.height, newWidth, newHeight, place.x, place.y,
        ];
        const target = this.#allocate(4 * words.length);
        try {
            new Uint32Array(this.#library.memory.buffer, target, words.length).set(words);
            use(target);
        } finally {
            this.#library.free(target);
        }
    }

    #call(src, dst, { format, engine, width, height, newWidth, newHeight }) {
        const lib = this.#library;
        const sizes = [width, height, newWidth, newHeight];
        if (engine === 'bilinear') {
            lib.ov_bilinear_sg(src, dst, ...sizes, BILINEAR[format], 0);
        } else if (engine === 'nearest') {
            lib.ovrin_resize_nearest_rgba8888(src, dst, ...sizes);
        } else if (engine === 'lanczos') {
            this.#lanczos(src, dst, format, sizes);
        } else if (format === 'rgba') {
            lib.ovrin_resize_rgba8888(src, dst, ...sizes);
        } else if (format === 'nv21') {
            lib.ovrin_resize_nv21(src, dst, ...sizes);
        } else {
            lib.ovrin_resize_yuv420(src, dst, ...sizes);
        }
    }

    // Planes one by one.
    #lanczos(src, dst, format, [width, height, newWidth, newHeight]) {
        const lib = this.#library;
        if (format === 'rgba') {
            lib.ovrin_resize_lanczos(src, dst, width, height, newWidth, newHeight, 4);
            return;
        }
        lib.ov_lanczos(src, width, height, dst, newWidth, newHeight, 1);
        const [w, h, newW, newH] = [width, height, newWidth, newHeight].map(half);
        const from = src + width * height;
        const to = dst + newWidth * newHeight;
        if (format === 'nv21') {
            lib.ov_lanczos(from, w, h, to, newW, newH, 2);
        } else {
            lib.ov_lanczos(from, w, h, to, newW, newH, 1);
            lib.ov_lanczos(from + w * h, w, h, to + newW * newH, newW, newH, 1);
        }
    }

    // Copies the source in, lets `use` work on addresses, and copies the result out.
    #run(source, { format, width, height, newWidth, newHeight }, use) {
        // The bilinear engine reads up to a row and two samples behind a plane.
        const { sample, bytes } = FORMATS[format];
        const padding = 2 * sample * (width + 4);
        const needed = bytes(newWidth, newHeight);
        const lib = this.#library;
        let src = 0;
        let dst = 0;
        try {
            src = this.#allocate(source.length + padding);
            dst = this.#allocate(needed);
            // The library says nothing when it lacks memory. So there must be some.
            lib.free(this.#allocate(workBytes(width, height, newWidth, newHeight)));
            const memory = new Uint8Array(lib.memory.buffer);
            memory.set(source, src);
            this.#repeatEnd(src + source.length, sample, padding);
            // Nearest neighbour leaves what it does not reach.
            memory.fill(0, dst, dst + needed);
            use(src, dst);
            const Bytes = format === 'rgba' ? Uint8ClampedArray : Uint8Array;
            return new Bytes(lib.memory.buffer, dst, needed).slice();
        } finally {
            lib.free(src);
            lib.free(dst);
        }
    }

    // What lies behind the source can reach the last row and column: it repeats the last sample.
    #repeatEnd(end, sample, bytes) {
        const memory = new Uint8Array(this.#library.memory.buffer);
        memory.copyWithin(end, end - sample, end);
        for (let done = sample; done < bytes; done *= 2) {
            memory.copyWithin(end + done, end, end + Math.min(done, bytes - done));
        }
    }

    #allocate(bytes) {
        // Addresses come as signed numbers; so would sizes be taken.
        const address = bytes < 2 ** 32 - 65536 ? this.#library.malloc(bytes) >>> 0 : 0;
        if (address === 0) throw new RangeError(`no memory for ${bytes} bytes`);
        return address;
    }
}
