// SPDX-License-Identifier: Apache-2.0
// CameraX hands every frame to an analyzer.
package ovrin.examples

import androidx.camera.core.ImageAnalysis
import androidx.camera.core.ImageProxy
import java.nio.ByteBuffer
import ovrin.resize.CameraFrame
import ovrin.resize.PixelFormat
import ovrin.resize.Size

class FrameAnalyzer(private val size: Size, private val use: (ByteBuffer) -> Unit) : ImageAnalysis.Analyzer {
    private val small = ByteBuffer.allocateDirect(PixelFormat.NV21.bytes(size).toInt())

    override fun analyze(image: ImageProxy) = image.use {
        val (y, u, v) = it.planes
        CameraFrame.fromYuv420(
            y.buffer, u.buffer, v.buffer, y.rowStride, u.rowStride, u.pixelStride, it.width, it.height,
        ).resizeTo(small, size, PixelFormat.NV21)
        use(small)
    }
}
