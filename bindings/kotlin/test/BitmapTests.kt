// SPDX-License-Identifier: Apache-2.0
// Bitmaps: stubs of Android's class and of libjnigraphics.so. What they show is the binding's own half.
package ovrin.resize.test

import android.graphics.Bitmap
import java.nio.ByteBuffer
import org.junit.Assert.assertEquals
import org.junit.Test
import org.junit.runner.RunWith
import org.junit.runners.Parameterized
import ovrin.resize.BitmapFilter
import ovrin.resize.Bitmaps
import ovrin.resize.NativeBitmaps
import ovrin.resize.PixelFormat
import ovrin.resize.Resizer
import ovrin.resize.Size

private const val GAP: Byte = 55

/** A bitmap with noise, whose rows are [gap] bytes longer than their pixels. */
private fun bitmap(size: Size, gap: Int = 0, config: Bitmap.Config = Bitmap.Config.ARGB_8888): Bitmap {
    val result = Bitmap(size.width, size.height, config, true, 4 * size.width + gap)
    val noise = picture(4 * size.width * size.height)
    for (i in 0 until result.pixels().capacity()) result.pixels().put(i, GAP)
    for (y in 0 until size.height) {
        for (x in 0 until 4 * size.width) {
            result.pixels().put(y * result.rowBytes + x, noise.get(y * 4 * size.width + x))
        }
    }
    return result
}

private fun packed(bitmap: Bitmap): ByteBuffer {
    val result = ByteBuffer.allocateDirect(4 * bitmap.width * bitmap.height)
    for (y in 0 until bitmap.height) {
        for (x in 0 until 4 * bitmap.width) {
            result.put(y * 4 * bitmap.width + x, bitmap.pixels().get(y * bitmap.rowBytes + x))
        }
    }
    return result
}

private fun gapsAreIntact(bitmap: Bitmap) = (0 until bitmap.pixels().capacity()).all {
    it % bitmap.rowBytes < 4 * bitmap.width || bitmap.pixels().get(it) == GAP
}

private fun resized(src: ByteBuffer, from: Size, to: Size, filter: BitmapFilter): ByteBuffer {
    val result = ByteBuffer.allocateDirect(4 * to.width * to.height)
    when (filter) {
        BitmapFilter.QUARTER -> Resizer.rgba(src, from, result, to)
        BitmapFilter.NEAREST -> Resizer.nearest(src, from, result, to)
        BitmapFilter.BILINEAR -> Resizer.bilinear(src, from, result, to, PixelFormat.RGBA8888)
        BitmapFilter.LANCZOS -> Resizer.lanczos(src, from, result, to)
    }
    return result
}

/** Reductions, for which no filter reads behind the picture, and each result is whole. */
private val shapes = listOf(
    Size(8, 6) to Size(4, 3), Size(64, 48) to Size(16, 12), Size(31, 22) to Size(10, 11),
    Size(20, 1100) to Size(5, 100),
)

@RunWith(Parameterized::class)
class BitmapFilters(
    private val filter: BitmapFilter, private val shape: Int, private val srcGap: Int, private val dstGap: Int,
) {
    private val from = shapes[shape].first
    private val to = shapes[shape].second
    private val src = bitmap(from, srcGap)
    private val dst = bitmap(to, dstGap)
    private val expected = resized(packed(src), from, to, filter)

    private fun check(result: ByteBuffer) {
        assertEquals(expected, result)
        assertEquals(0, src.locks)
        assertEquals(0, dst.locks)
        check(gapsAreIntact(src) && gapsAreIntact(dst)) { "bytes between rows were written" }
    }

    @Test
    fun fromBitmapToBitmap() {
        Bitmaps.resize(src, dst, filter)
        check(packed(dst))
    }

    @Test
    fun fromBufferToBitmap() {
        Bitmaps.resize(packed(src), from, dst, filter)
        check(packed(dst))
    }

    @Test
    fun fromBitmapToBuffer() {
        val result = ByteBuffer.allocateDirect(expected.capacity())
        Bitmaps.resize(src, result, to, filter)
        check(result)
    }

    companion object {
        @JvmStatic
        @Parameterized.Parameters(name = "{0}, {1}, {2}, {3}")
        fun parameters(): List<Array<Any>> = BitmapFilter.values().flatMap { filter ->
            shapes.indices.flatMap { shape ->
                listOf(0 to 0, 12 to 0, 0 to 64, 4 to 4).map { arrayOf<Any>(filter, shape, it.first, it.second) }
            }
        }
    }
}

class BitmapRefusals {
    private val size = Size(8, 6)
    private val good = bitmap(size)
    private val buffer = ByteBuffer.allocateDirect(4 * 8 * 6)

    /** As a source and as a destination, through the Kotlin half and past it. */
    private fun everywhere(bad: Bitmap, safe: String, raw: String, rawOnly: Boolean = false) {
        val other = bitmap(Size(4, 3))
        if (!rawOnly) {
            refusedSaying("source", "source $safe") { Bitmaps.resize(bad, other) }
            refusedSaying("destination", "destination $safe") { Bitmaps.resize(other, bad) }
            refusedSaying("source", "source $safe") { Bitmaps.resize(bad, buffer, size) }
            refusedSaying("destination", "destination $safe") { Bitmaps.resize(buffer, size, bad) }
        }
        refusedSaying("source", "source$raw") { NativeBitmaps.resize(bad, other, 0) }
        refusedSaying("destination", "destination$raw") { NativeBitmaps.resize(other, bad, 0) }
        refusedSaying("source", "source$raw") { NativeBitmaps.resizeInto(bad, buffer, 8, 6, 0) }
        refusedSaying("destination", "destination$raw") { NativeBitmaps.resizeFrom(buffer, 8, 6, bad, 0) }
        assertEquals(0, bad.locks)
        assertEquals(0, other.locks)
    }

    @Test
    fun recycled() {
        val bad = bitmap(size)
        bad.recycle()
        everywhere(bad, "is recycled", ": AndroidBitmap_getInfo gives -1")
    }

    @Test
    fun hardware() = everywhere(
        bitmap(size, config = Bitmap.Config.HARDWARE),
        "is HARDWARE (8 x 6), must be ARGB_8888", ": AndroidBitmap_lockPixels gives -1",
    )

    @Test
    fun rgb565() = everywhere(
        bitmap(size, config = Bitmap.Config.RGB_565),
        "is RGB_565 (8 x 6), must be ARGB_8888", " has pixels of format 4, must be ARGB_8888",
    )

    @Test
    fun otherConfigurations() {
        for (config in listOf(Bitmap.Config.ALPHA_8, Bitmap.Config.ARGB_4444, Bitmap.Config.RGBA_F16)) {
            refusedSaying("$config", "source is $config (8 x 6), must be ARGB_8888") {
                Bitmaps.resize(bitmap(size, config = config), good)
            }
        }
    }

    @Test
    fun notMutable() = refusedSaying("fixed", "destination (8 x 6) is not mutable") {
        Bitmaps.resize(bitmap(Size(4, 3)), Bitmap(8, 6, Bitmap.Config.ARGB_8888, false, 32))
    }

    @Test
    fun notLockable() {
        val bad = bitmap(size)
        bad.lockResult = -2
        everywhere(bad, "", ": AndroidBitmap_lockPixels gives -2", rawOnly = true)
        bad.infoResult = -2
        everywhere(bad, "", ": AndroidBitmap_getInfo gives -2", rawOnly = true)
    }

    @Test
    fun noMemoryForPixels() {
        val bad = bitmap(size)
        bad.lockResult = -3
        val message = try {
            Bitmaps.resize(bad, bitmap(Size(4, 3)))
            null
        } catch (e: OutOfMemoryError) {
            e.message
        }
        assertEquals("no memory for a bitmap's pixels", message)
    }

    @Test
    fun ontoItself() {
        val text = "src and dst: RGBA and RGBA overlap in 192 bytes"
        refusedSaying("the same", text) { Bitmaps.resize(good, good) }
        refusedSaying("its pixels", text) { Bitmaps.resize(good, good.pixels(), size) }
        assertEquals(0, good.locks)
    }

    @Test
    fun buffers() {
        val text = "holds 191 bytes, 192 needed (8 x 6 x 4)"
        refusedSaying("source", "source $text") { Bitmaps.resize(buffer.part(0, 191), size, good) }
        refusedSaying("destination", "destination $text") {
            Bitmaps.resize(good, buffer.part(0, 191), size)
        }
        refusedSaying("read-only", "destination is read-only") {
            Bitmaps.resize(good, buffer.asReadOnlyBuffer(), size)
        }
        refusedSaying("heap", "source is not a direct buffer") {
            Bitmaps.resize(ByteBuffer.allocate(192), size, good)
        }
        refusedSaying("raw", "source holds 191 bytes, 192 needed") {
            NativeBitmaps.resizeFrom(buffer.part(0, 191), 8, 6, good, 0)
        }
        refusedSaying("raw", "destination holds 191 bytes, 192 needed") {
            NativeBitmaps.resizeInto(good, buffer.part(0, 191), 8, 6, 0)
        }
    }

    @Test
    fun numbers() {
        for (filter in listOf(-1, 4, Int.MAX_VALUE)) {
            val text = "filter is $filter, must be 0 to 3"
            refusedSaying("raw", text) { NativeBitmaps.resize(good, bitmap(size), filter) }
            refusedSaying("raw", text) { NativeBitmaps.resizeFrom(buffer, 8, 6, good, filter) }
            refusedSaying("raw", text) { NativeBitmaps.resizeInto(good, buffer, 8, 6, filter) }
        }
        for (side in listOf(0, -1, 32768, Int.MAX_VALUE)) {
            refusedSaying("raw", "sides must be 1 to") { NativeBitmaps.resizeFrom(buffer, side, 6, good, 0) }
            refusedSaying("raw", "sides must be 1 to") { NativeBitmaps.resizeInto(good, buffer, 8, side, 0) }
        }
        refusedSaying("wide", "source is 32768 x 1, sides must be 1 to 32767") {
            Bitmaps.resize(bitmap2(32768, 1), good)
        }
    }

    private fun bitmap2(width: Int, height: Int) = Bitmap.createBitmap(width, height, Bitmap.Config.ARGB_8888)

    /** Of a colour no channel is above alpha, before and after. */
    @Test
    fun premultipliedStaysPremultiplied() {
        val src = bitmap(Size(40, 30))
        for (i in 0 until 40 * 30) {
            val alpha = src.pixels().get(4 * i + 3).toInt() and 0xFF
            for (c in 0 until 3) {
                val value = src.pixels().get(4 * i + c).toInt() and 0xFF
                src.pixels().put(4 * i + c, (value * alpha / 255).toByte())
            }
        }
        val dst = bitmap(Size(10, 10))
        Bitmaps.resize(src, dst)
        for (i in 0 until 100) {
            val alpha = dst.pixels().get(4 * i + 3).toInt() and 0xFF
            for (c in 0 until 3) check(dst.pixels().get(4 * i + c).toInt() and 0xFF <= alpha) { "pixel $i" }
        }
    }
}
