// SPDX-License-Identifier: Apache-2.0
// Images of Camera2 and of ImageReader.
package ovrin.examples

import android.graphics.ImageFormat
import android.media.Image
import java.nio.ByteBuffer
import ovrin.resize.CameraFrame
import ovrin.resize.PixelFormat
import ovrin.resize.Size

/** The frame, which lies in the image: do not close that while the frame is in use. */
fun frameOf(image: Image): CameraFrame {
    // Other formats have other planes: PRIVATE has none, JPEG one of compressed bytes.
    require(image.format == ImageFormat.YUV_420_888) { "an image of format ${image.format}" }
    val (y, u, v) = image.planes
    return CameraFrame.fromYuv420(
        y.buffer, u.buffer, v.buffer, y.rowStride, u.rowStride, u.pixelStride, image.width, image.height,
    )
}

/** All of it, as NV21. */
fun nv21Of(image: Image): ByteBuffer = image.use {
    val result = ByteBuffer.allocateDirect(PixelFormat.NV21.bytes(Size(it.width, it.height)).toInt())
    frameOf(it).copyTo(result, PixelFormat.NV21)
    result
}
