// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

import java.nio.ByteBuffer

/**
 * A frame in the layout that Android calls `YUV_420_888`: planes of Y, U and V in direct buffers,
 * with rows and samples as far apart as the strides say. U and V may be planes of their own, or take
 * turns byte by byte in one memory, in either order.
 *
 * Nothing is copied when it is made, and it owns no memory: the buffers must stay valid, and the
 * frame unchanged, while it is in use. An `Image` must not be closed before that.
 *
 * [resizeTo] reads the frame where it lies. Only U and V that are 2 bytes from sample to sample, but
 * are not each other's neighbours, or whose rows are then an odd number of bytes apart, are copied
 * first: a third of the frame.
 */
class CameraFrame private constructor(
    private val y: ByteBuffer,
    private val u: ByteBuffer,
    private val v: ByteBuffer,
    private val yRowStride: Int,
    private val uvRowStride: Int,
    private val uvPixelStride: Int,
    /** The size of the frame. */
    val size: Size,
) {
    /**
     * Resizes the frame into an NV21 or I420 picture, as [Resizer.nv21] and [Resizer.i420] do: white
     * (255) becomes 252.
     *
     * Memory is needed for no more than the result, and none when its sides are multiples of 4 and
     * it has U and V in pairs as the frame has, or in planes as the frame has.
     *
     * @throws IllegalArgumentException when the destination does not fit, shares bytes with the
     *   frame, or has another format.
     * @throws OutOfMemoryError when there is no memory for that; nothing is written then.
     */
    fun resizeTo(dst: ByteBuffer, dstSize: Size, format: PixelFormat) {
        requireYuv(format)
        Native.resizeYuv420(
            y, u, v, yRowStride, uvRowStride, uvPixelStride, size.width, size.height,
            destinationOf(dst, format, dstSize), dstSize.width, dstSize.height,
            format.nativeNumber,
        )
    }

    /**
     * Copies the frame into an NV21 or I420 picture of its size. No sample changes.
     *
     * @throws IllegalArgumentException as [resizeTo] does.
     */
    fun copyTo(dst: ByteBuffer, format: PixelFormat) {
        requireYuv(format)
        Native.copyYuv420(
            y, u, v, yRowStride, uvRowStride, uvPixelStride, size.width, size.height,
            destinationOf(dst, format, size),
            format.nativeNumber,
        )
    }

    override fun toString() =
        "$size, rows $yRowStride and $uvRowStride apart, samples of U and V $uvPixelStride apart"

    companion object {
        /**
         * A frame of these planes; every number is as an `Image.Plane` gives it.
         *
         * A plane lies in its buffer from the position on and may end with its last sample: the
         * padding behind the last row need not be there, nor the byte behind the last V of a frame
         * whose V and U take turns. That byte is the last U, and is read from U's buffer.
         *
         * @param yRowStride bytes from one row of Y to the next, at least the width
         * @param uvRowStride bytes from one row of U to the next, and of V
         * @param uvPixelStride bytes from one sample of U to the next, and of V: 1 or 2
         * @throws IllegalArgumentException when a number is out of range, or a buffer too short or
         *   not direct; it says which, and what was expected.
         */
        @JvmStatic
        fun fromYuv420(
            y: ByteBuffer,
            u: ByteBuffer,
            v: ByteBuffer,
            yRowStride: Int,
            uvRowStride: Int,
            uvPixelStride: Int,
            width: Int,
            height: Int,
        ): CameraFrame {
            val size = Size(width, height)
            require(uvPixelStride in 1..2) { "uvPixelStride is $uvPixelStride, must be 1 or 2" }
            require(yRowStride >= width) {
                "yRowStride is $yRowStride, must be at least $width (the width)"
            }
            val chromaWidth = halfRoundedUp(width)
            val row = (chromaWidth - 1) * uvPixelStride + 1
            require(uvRowStride >= row) {
                "uvRowStride is $uvRowStride, must be at least $row ($chromaWidth samples, $uvPixelStride apart)"
            }
            val luma = strided(width.toLong(), height.toLong(), yRowStride.toLong())
            val chroma = strided(row, halfRoundedUp(height), uvRowStride.toLong())
            fun chromaOf(name: String, buffer: ByteBuffer) = sourceOf(name, buffer, chroma) {
                "$chromaWidth x ${halfRoundedUp(height)}, " +
                    "samples $uvPixelStride and rows $uvRowStride apart"
            }
            return CameraFrame(
                sourceOf("Y plane", y, luma) { "$size, rows $yRowStride apart" },
                chromaOf("U plane", u),
                chromaOf("V plane", v),
                yRowStride, uvRowStride, uvPixelStride, size,
            )
        }

        private fun requireYuv(format: PixelFormat) =
            require(format == PixelFormat.I420 || format == PixelFormat.NV21) {
                "a frame becomes I420 or NV21, not $format"
            }
    }
}
