// SPDX-License-Identifier: Apache-2.0
// Compiled, not run: what callers may write, and what they may not.
import { type Engine, ENGINES, fit, load, type Place, Resizer } from '../js/index.js';

const resizer: Resizer = await load({ simd: false });
const pixels: Uint8ClampedArray = resizer.resize(new Uint8Array(16), 2, 2, 1, 1);
const image: ImageData = resizer.resize(new ImageData(2, 2), 1, 1, { engine: 'lanczos' });
new ImageData(resizer.letterbox(pixels, 1, 1, 4, 4, { engine: 'nearest' }), 4, 4);
const frame: Uint8Array = resizer.resizeNv21(new Uint8Array(6), 2, 2, 4, 4, { engine: 'bilinear' });
const engines: readonly Engine[] = ENGINES;
const place: Place = fit(1, 2, 3, 4);
resizer.letterboxI420(frame, 2, 2, place.width, place.height);

// @ts-expect-error: not an engine
resizer.resize(pixels, 1, 1, 1, 1, { engine: 'cubic' });
// @ts-expect-error: not for planes
resizer.resizeI420(frame, 2, 2, 1, 1, { engine: 'nearest' });
// @ts-expect-error: a size is missing
resizer.resize(pixels, 1, 1, 1);
// @ts-expect-error: numbers, not bytes
resizer.resize([1, 2, 3, 4], 1, 1, 1, 1);

export { engines, image };
