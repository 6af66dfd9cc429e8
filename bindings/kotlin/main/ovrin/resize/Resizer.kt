// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

import java.nio.ByteBuffer

/**
 * Resizes raw pictures in direct byte buffers that the caller owns.
 *
 * - A picture lies in its buffer from the position on; it must end at the limit or before. Position,
 *   limit and byte order are neither used otherwise nor changed. Bytes of the destination behind the
 *   picture keep their values.
 * - Buffers must be direct, a destination must not be read-only, and no byte of a destination may
 *   belong to a source. Destinations of 32-bit pixels must start at an address that is a multiple of
 *   4; every new direct buffer does.
 * - What does not fit throws [IllegalArgumentException] before anything is written.
 * - Nothing is kept between calls. Any number of threads may resize at once; nobody else may use the
 *   buffers of a call until it returns.
 * - A lack of memory throws [OutOfMemoryError], and the destination is as it was. Two cases do not
 *   show: of a large [lanczos] result, rows for which a thread found none are 0, and the chroma of
 *   [lanczosFullChroma] keeps what it held.
 *
 * Resizing without a further name in the function ([rgba], [rgb], [i420], [nv21] and what goes into
 * a canvas) takes four pixels of the source for each of the result, and drops their two low bits:
 * white (255) becomes 252. From 1024 source rows on it uses four threads.
 */
object Resizer {
    /** Resizes RGBA8888, or any other four bytes per pixel. */
    @JvmStatic
    fun rgba(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        resize(PixelFormat.RGBA8888, src, srcSize, dst, dstSize, Native::rgba)

    /** Resizes RGB888, or any other three bytes per pixel; always on the calling thread. */
    @JvmStatic
    fun rgb(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        resize(PixelFormat.RGB888, src, srcSize, dst, dstSize, Native::rgb)

    /**
     * Copies one RGBA8888 pixel of the source for each of the result. The step from one to the next
     * is a whole number, the ratio of the sizes rounded to the nearest. Where the steps pass the end
     * of the source, the rest of the destination keeps its bytes: enlarging is of no use here. The
     * source, too, must start at an address that is a multiple of 4.
     */
    @JvmStatic
    fun nearest(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        resize(PixelFormat.RGBA8888, src, srcSize, dst, dstSize, Native::nearest)

    /**
     * Resizes I420. When the width or height of the result is not a multiple of 4, its chroma covers
     * a little less of the source than its luma.
     */
    @JvmStatic
    fun i420(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        resize(PixelFormat.I420, src, srcSize, dst, dstSize, Native::i420)

    /** Resizes NV21, as [i420] does I420. */
    @JvmStatic
    fun nv21(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        resize(PixelFormat.NV21, src, srcSize, dst, dstSize, Native::nv21)

    /**
     * Fills the canvas with 0 and resizes an RGBA8888 picture into it.
     *
     * @param srcStride pixels from one row of the source to the next. The last row may end with its
     *   own pixels.
     */
    @JvmStatic
    @JvmOverloads
    fun rgbaInCanvas(
        src: ByteBuffer,
        srcSize: Size,
        dst: ByteBuffer,
        placement: Placement,
        srcStride: Int = srcSize.width,
    ) {
        requireStride(srcStride, srcSize)
        val needed = 4 * strided(srcSize.width.toLong(), srcSize.height.toLong(), srcStride.toLong())
        val from = sourceOf("source", src, needed) { "$srcSize x 4, rows $srcStride x 4 apart" }
        Native.rgbaInCanvas(
            from, srcSize.width, srcSize.height, srcStride,
            destinationOf(dst, PixelFormat.RGBA8888, placement.canvas),
            placement.canvas.width, placement.canvas.height,
            placement.x, placement.y, placement.picture.width, placement.picture.height,
        )
    }

    /** Paints an I420 canvas black and resizes an I420 picture into it. */
    @JvmStatic
    fun i420InCanvas(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, placement: Placement) {
        val from = sourceOf(PixelFormat.I420, src, srcSize)
        val luma = srcSize.pixels.toInt()
        val chroma = srcSize.chromaSamples.toInt()
        i420PlanesInCanvas(
            part(from, 0, luma),
            part(from, luma, chroma),
            part(from, luma + chroma, chroma),
            srcSize, srcSize.width, dst, placement,
        )
    }

    /**
     * As [i420InCanvas], from three planes.
     *
     * @param srcStride bytes from one row of Y to the next. In U and V it is half as many, rounded
     *   up. The last row of a plane may end with its own bytes.
     */
    @JvmStatic
    fun i420PlanesInCanvas(
        srcY: ByteBuffer,
        srcU: ByteBuffer,
        srcV: ByteBuffer,
        srcSize: Size,
        srcStride: Int,
        dst: ByteBuffer,
        placement: Placement,
    ) {
        requireStride(srcStride, srcSize)
        Native.i420InCanvas(
            lumaOf(srcY, srcSize, srcStride),
            chromaOf("source U plane", srcU, srcSize, srcStride, 1),
            chromaOf("source V plane", srcV, srcSize, srcStride, 1),
            srcSize.width, srcSize.height, srcStride,
            destinationOf(dst, PixelFormat.I420, placement.canvas),
            placement.canvas.width, placement.canvas.height,
            placement.x, placement.y, placement.picture.width, placement.picture.height,
        )
    }

    /** Paints an NV21 canvas black and resizes an NV21 picture into it. */
    @JvmStatic
    fun nv21InCanvas(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, placement: Placement) {
        val from = sourceOf(PixelFormat.NV21, src, srcSize)
        val luma = srcSize.pixels.toInt()
        nv21PlanesInCanvas(
            part(from, 0, luma),
            part(from, luma, 2 * srcSize.chromaSamples.toInt()),
            srcSize, srcSize.width, dst, placement,
        )
    }

    /**
     * As [nv21InCanvas], from two planes.
     *
     * @param srcStride bytes from one row of Y to the next, and of VU pairs when it is even; when it
     *   is odd, those are one byte more apart. The last row of a plane may end with its own bytes.
     */
    @JvmStatic
    fun nv21PlanesInCanvas(
        srcY: ByteBuffer,
        srcVu: ByteBuffer,
        srcSize: Size,
        srcStride: Int,
        dst: ByteBuffer,
        placement: Placement,
    ) {
        requireStride(srcStride, srcSize)
        Native.nv21InCanvas(
            lumaOf(srcY, srcSize, srcStride),
            chromaOf("source VU plane", srcVu, srcSize, srcStride, 2),
            srcSize.width, srcSize.height, srcStride,
            destinationOf(dst, PixelFormat.NV21, placement.canvas),
            placement.canvas.width, placement.canvas.height,
            placement.x, placement.y, placement.picture.width, placement.picture.height,
        )
    }

    /**
     * Resizes RGBA8888, I420 or NV21 with the bilinear engine, by any ratio.
     *
     * Beside a much brighter pixel a dark one can come out bright: the engine's weights overshoot,
     * and its results wrap. It reads beyond the source unless it shrinks it: give the source
     * [bilinearSourceBytes] bytes. What lies behind the picture can reach the last column and row of
     * the result.
     *
     * @throws IllegalArgumentException also for RGB888.
     */
    @JvmStatic
    @JvmOverloads
    fun bilinear(
        src: ByteBuffer,
        srcSize: Size,
        dst: ByteBuffer,
        dstSize: Size,
        format: PixelFormat,
        mode: BilinearMode = BilinearMode.BLENDED,
    ) {
        val from = sourceOf("source", src, bilinearSourceBytes(srcSize, dstSize, format, mode)) {
            "${format.formula(srcSize)}, and what the engine reads behind"
        }
        Native.bilinear(
            from, srcSize.width, srcSize.height,
            destinationOf(dst, format, dstSize), dstSize.width, dstSize.height,
            format.nativeNumber,
            mode.ordinal,
        )
    }

    /**
     * The bytes that [bilinear] demands of its source: those of the picture, and when it does not
     * shrink in both directions up to a row and a pixel more.
     *
     * @throws IllegalArgumentException for RGB888.
     */
    @JvmStatic
    @JvmOverloads
    fun bilinearSourceBytes(
        srcSize: Size,
        dstSize: Size,
        format: PixelFormat,
        mode: BilinearMode = BilinearMode.BLENDED,
    ): Long = BilinearReach.sourceBytes(srcSize, dstSize, format, mode)

    /**
     * Resizes RGBA8888 with the Lanczos engine, the sharpest and slowest, on four threads and the
     * calling one.
     */
    @JvmStatic
    fun lanczos(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        resize(PixelFormat.RGBA8888, src, srcSize, dst, dstSize, Native::lanczos)

    /**
     * Resizes packed pixels of 1 to 4 [components] of a byte each with the Lanczos engine, on the
     * calling thread: grey, a plane of Y, of U or V, of VU pairs, RGB888, RGBA8888.
     */
    @JvmStatic
    fun lanczos(
        src: ByteBuffer,
        srcSize: Size,
        dst: ByteBuffer,
        dstSize: Size,
        components: Int,
    ) {
        require(components in 1..4) { "components is $components, must be 1 to 4" }
        Native.lanczosComponents(
            sourceOf("source", src, components * srcSize.pixels) { "$srcSize x $components" },
            srcSize.width, srcSize.height,
            destinationOf(dst, components * dstSize.pixels) { "$dstSize x $components" },
            dstSize.width, dstSize.height,
            components,
        )
    }

    /**
     * Resizes a plane of Y and the VU pairs behind it, one pair per pixel, with the Lanczos engine on
     * the calling thread. This is not NV21, which has a pair for every four pixels: both pictures
     * take 3 bytes per pixel.
     */
    @JvmStatic
    fun lanczosFullChroma(src: ByteBuffer, srcSize: Size, dst: ByteBuffer, dstSize: Size) =
        Native.lanczosFullChroma(
            sourceOf("source", src, 3 * srcSize.pixels) { "$srcSize x 3" },
            srcSize.width, srcSize.height,
            destinationOf(dst, 3 * dstSize.pixels) { "$dstSize x 3" },
            dstSize.width, dstSize.height,
        )

    private inline fun resize(
        format: PixelFormat,
        src: ByteBuffer,
        srcSize: Size,
        dst: ByteBuffer,
        dstSize: Size,
        native: (ByteBuffer, Int, Int, ByteBuffer, Int, Int) -> Unit,
    ) = native(
        sourceOf(format, src, srcSize), srcSize.width, srcSize.height,
        destinationOf(dst, format, dstSize), dstSize.width, dstSize.height,
    )

    private fun requireStride(stride: Int, size: Size) =
        require(stride in size.width..Size.LARGEST_SIDE) {
            "srcStride is $stride, must be ${size.width} (the source's width) to ${Size.LARGEST_SIDE}"
        }

    private fun lumaOf(buffer: ByteBuffer, size: Size, stride: Int): ByteBuffer {
        val needed = strided(size.width.toLong(), size.height.toLong(), stride.toLong())
        return sourceOf("source Y plane", buffer, needed) { "$size, rows $stride apart" }
    }

    private fun chromaOf(
        name: String,
        buffer: ByteBuffer,
        size: Size,
        stride: Int,
        sampleBytes: Int,
    ): ByteBuffer {
        val width = sampleBytes * halfRoundedUp(size.width)
        val height = halfRoundedUp(size.height)
        val distance = sampleBytes * halfRoundedUp(stride)
        return sourceOf(name, buffer, strided(width, height, distance)) {
            "$width x $height, rows $distance apart"
        }
    }
}
