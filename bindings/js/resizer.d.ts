// SPDX-License-Identifier: Apache-2.0

export type PlaneEngine = 'quarter' | 'bilinear' | 'lanczos';
export type Engine = PlaneEngine | 'nearest';

export interface ResizeOptions {
    /** Default: 'quarter', the fastest. */
    engine?: Engine;
}

export interface PlaneOptions {
    engine?: PlaneEngine;
}

export type Pixels = Uint8ClampedArray | Uint8Array;

export interface Place {
    x: number;
    y: number;
    width: number;
    height: number;
}

/** The largest width or height. */
export const LARGEST_SIDE: 32767;

export const ENGINES: readonly ['quarter', 'bilinear', 'lanczos', 'nearest'];

/** Whether this engine runs WebAssembly's vector instructions. */
export function hasSimd(): boolean;

/**
 * The largest size of the ratio width : height in a canvas, and its place in the middle, at even
 * positions.
 */
export function fit(
    width: number,
    height: number,
    canvasWidth: number,
    canvasHeight: number,
): Place;

/**
 * One instance of the module. Its memory grows to what the largest picture took, and is released with
 * the instance.
 *
 * Sides are whole numbers from 1 to LARGEST_SIDE. What does not fit throws RangeError, what is of the
 * wrong kind TypeError; so does nothing else. Sources are not changed; bytes of theirs behind the
 * picture are ignored.
 */
export class Resizer {
    /** `module`: one of the package's two .wasm files, compiled. */
    constructor(module: WebAssembly.Module);

    /** RGBA, four bytes per pixel. */
    resize(
        pixels: Pixels,
        width: number,
        height: number,
        newWidth: number,
        newHeight: number,
        options?: ResizeOptions,
    ): Uint8ClampedArray<ArrayBuffer>;
    resize(
        image: ImageData,
        newWidth: number,
        newHeight: number,
        options?: ResizeOptions,
    ): ImageData;

    /** As large as fits into the middle of a canvas of transparent black. */
    letterbox(
        pixels: Pixels,
        width: number,
        height: number,
        canvasWidth: number,
        canvasHeight: number,
        options?: ResizeOptions,
    ): Uint8ClampedArray<ArrayBuffer>;
    letterbox(
        image: ImageData,
        canvasWidth: number,
        canvasHeight: number,
        options?: ResizeOptions,
    ): ImageData;

    /** A plane of Y, then U and V at half the size in either direction, rounded up. */
    resizeI420(
        picture: Pixels,
        width: number,
        height: number,
        newWidth: number,
        newHeight: number,
        options?: PlaneOptions,
    ): Uint8Array<ArrayBuffer>;

    /** A plane of Y, then V and U in turn, at half the size in either direction, rounded up. */
    resizeNv21(
        picture: Pixels,
        width: number,
        height: number,
        newWidth: number,
        newHeight: number,
        options?: PlaneOptions,
    ): Uint8Array<ArrayBuffer>;

    /** In the middle of a black canvas. */
    letterboxI420(
        picture: Pixels,
        width: number,
        height: number,
        canvasWidth: number,
        canvasHeight: number,
    ): Uint8Array<ArrayBuffer>;

    letterboxNv21(
        picture: Pixels,
        width: number,
        height: number,
        canvasWidth: number,
        canvasHeight: number,
    ): Uint8Array<ArrayBuffer>;
}
