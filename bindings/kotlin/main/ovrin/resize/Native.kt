// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

import java.nio.ByteBuffer

/**
 * The native methods. They take buffers from their first byte to their capacity, and check all that
 * they are given once more. JNI_OnLoad finds this class and the methods by their names.
 */
internal object Native {
    init {
        System.loadLibrary("ovrinresize_jni")
    }

    /** The library is loaded when this returns. */
    @JvmStatic
    fun load() = Unit

    @JvmStatic
    external fun rgba(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    @JvmStatic
    external fun rgb(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    @JvmStatic
    external fun nearest(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    @JvmStatic
    external fun i420(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    @JvmStatic
    external fun nv21(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    @JvmStatic
    external fun rgbaInCanvas(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int, srcStride: Int,
        dst: ByteBuffer, canvasWidth: Int, canvasHeight: Int,
        x: Int, y: Int, width: Int, height: Int,
    )

    @JvmStatic
    external fun i420InCanvas(
        srcY: ByteBuffer, srcU: ByteBuffer, srcV: ByteBuffer,
        srcWidth: Int, srcHeight: Int, srcStride: Int,
        dst: ByteBuffer, canvasWidth: Int, canvasHeight: Int,
        x: Int, y: Int, width: Int, height: Int,
    )

    @JvmStatic
    external fun nv21InCanvas(
        srcY: ByteBuffer, srcVu: ByteBuffer,
        srcWidth: Int, srcHeight: Int, srcStride: Int,
        dst: ByteBuffer, canvasWidth: Int, canvasHeight: Int,
        x: Int, y: Int, width: Int, height: Int,
    )

    /** [format]: 0 RGBA8888, 1 I420, 2 NV21. [mode]: the ordinal of a [BilinearMode]. */
    @JvmStatic
    external fun bilinear(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
        format: Int, mode: Int,
    )

    @JvmStatic
    external fun lanczos(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    @JvmStatic
    external fun lanczosComponents(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
        components: Int,
    )

    @JvmStatic
    external fun lanczosFullChroma(
        src: ByteBuffer, srcWidth: Int, srcHeight: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
    )

    /** [format]: 1 I420, 2 NV21. */
    @JvmStatic
    external fun resizeYuv420(
        y: ByteBuffer, u: ByteBuffer, v: ByteBuffer,
        yRowStride: Int, uvRowStride: Int, uvPixelStride: Int, width: Int, height: Int,
        dst: ByteBuffer, dstWidth: Int, dstHeight: Int,
        format: Int,
    )

    /** As [resizeYuv420], into a picture of the same size. */
    @JvmStatic
    external fun copyYuv420(
        y: ByteBuffer, u: ByteBuffer, v: ByteBuffer,
        yRowStride: Int, uvRowStride: Int, uvPixelStride: Int, width: Int, height: Int,
        dst: ByteBuffer,
        format: Int,
    )
}
