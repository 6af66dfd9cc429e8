// SPDX-License-Identifier: Apache-2.0
// The examples, with stubs of the classes that Android and CameraX hand them.
package ovrin.resize.test

import android.graphics.Bitmap
import android.hardware.HardwareBuffer
import android.media.Image
import androidx.camera.core.ImageProxy
import java.nio.ByteBuffer
import org.junit.Assert.assertEquals
import org.junit.Test
import ovrin.examples.FrameAnalyzer
import ovrin.examples.nv21Of
import ovrin.examples.thumbnail
import ovrin.resize.Size

/** 4 x 2 pixels, rows of 6 bytes; U before V, in turn. */
private class Planes {
    var closed = 0
    val luma: ByteBuffer = ByteBuffer.allocateDirect(10)
    val chroma: ByteBuffer = ByteBuffer.allocateDirect(4)

    init {
        for (i in 0 until 10) luma.put(i, (4 * i).toByte())
        for (i in 0 until 4) chroma.put(i, (100 + 4 * i).toByte())
    }

    val buffers = listOf(luma, chroma.part(0, 3), chroma.part(1, 3))
    val nv21 = listOf(0, 4, 8, 12, 24, 28, 32, 36, 104, 100, 112, 108)
}

private class Proxy(val planesOf: Planes) : ImageProxy {
    override fun getWidth() = 4
    override fun getHeight() = 2
    override fun getPlanes() = Array<ImageProxy.PlaneProxy>(3) {
        object : ImageProxy.PlaneProxy {
            override fun getBuffer() = planesOf.buffers[it]
            override fun getRowStride() = 6
            override fun getPixelStride() = if (it == 0) 1 else 2
        }
    }
    override fun close() {
        planesOf.closed++
    }
}

private class CameraImage(val planesOf: Planes, val kind: Int) : Image() {
    override fun getFormat() = kind
    override fun getWidth() = 4
    override fun getHeight() = 2
    override fun getPlanes() = Array<Plane>(3) {
        object : Plane() {
            override fun getBuffer() = planesOf.buffers[it]
            override fun getRowStride() = 6
            override fun getPixelStride() = if (it == 0) 1 else 2
        }
    }
    override fun getHardwareBuffer(): HardwareBuffer = throw UnsupportedOperationException()
    override fun close() {
        planesOf.closed++
    }
}

private fun numbersIn(buffer: ByteBuffer) = List(buffer.capacity()) { buffer.get(it).toInt() and 0xFF }

class ExampleTests {
    @Test
    fun analyzer() {
        val planes = Planes()
        var seen = listOf<Int>()
        FrameAnalyzer(Size(2, 1)) { seen = numbersIn(it) }.analyze(Proxy(planes))
        assertEquals(listOf(14, 22, 104, 100), seen)
        assertEquals(1, planes.closed)
    }

    @Test
    fun image() {
        val planes = Planes()
        assertEquals(planes.nv21, numbersIn(nv21Of(CameraImage(planes, 35))))
        assertEquals(1, planes.closed)
        refusedSaying("JPEG", "an image of format 256") { nv21Of(CameraImage(planes, 256)) }
        assertEquals(2, planes.closed)
    }

    @Test
    fun hardwareBitmap() {
        for (config in listOf(Bitmap.Config.HARDWARE, Bitmap.Config.ARGB_8888)) {
            val picture = Bitmap.createBitmap(8, 8, config)
            for (i in 0 until 256) picture.pixels().put(i, 200.toByte())
            val small = thumbnail(picture, 2, 2)
            assertEquals(List(16) { 200 }, numbersIn(small.pixels()))
            check(!picture.isRecycled) { "$config was recycled" }
        }
    }
}
