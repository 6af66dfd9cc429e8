// SPDX-License-Identifier: Apache-2.0
// What both sides of the binding must not let through.
package ovrin.resize.test

import java.nio.Buffer
import java.nio.ByteBuffer
import java.nio.ByteOrder
import org.junit.Test
import org.junit.runner.RunWith
import org.junit.runners.Parameterized
import ovrin.resize.Native
import ovrin.resize.PixelFormat
import ovrin.resize.Placement
import ovrin.resize.Resizer
import ovrin.resize.Size

class Way(
    val operation: Operation,
    val side: String,
    val call: (List<ByteBuffer>, ByteBuffer, Numbers) -> Unit,
) {
    override fun toString() = "$operation, $side"
}

val ways = operations.flatMap { o ->
    listOfNotNull(Way(o, "safe", o.safe), o.raw?.let { Way(o, "raw", it) })
}

private val someNumbers = listOf(
    Numbers(8, 6, 8, 4, 3),
    Numbers(7, 5, 7, 9, 11),
    Numbers(1, 1, 1, 1, 1),
    Numbers(13, 9, 13, 13, 9),
)

private fun numbersFor(operation: Operation): List<Numbers> {
    if (!operation.inCanvas) return someNumbers
    return someNumbers.map { n ->
        n.copy(
            stride = if (operation.strided) n.stride + 3 else n.stride,
            canvasW = n.dstW + 4, canvasH = n.dstH + 3, x = 3, y = 1,
        )
    }
}

private fun direct(bytes: Long): ByteBuffer = ByteBuffer.allocateDirect(bytes.toInt())

private class Buffers(operation: Operation, n: Numbers) {
    val sources = operation.exact(n).map(::direct)
    val result = direct(operation.result(n))

    fun withSource(i: Int, buffer: ByteBuffer) =
        sources.mapIndexed { j, source -> if (i == j) buffer else source }
}


private val wrong = listOf(0, -1, Int.MIN_VALUE, 32768, Int.MAX_VALUE)

/** What holds of every function, through the Kotlin checks and past them. */
@RunWith(Parameterized::class)
class Refusals(private val way: Way) {
    private inline fun everyNumbers(test: (Numbers, Buffers) -> Unit) {
        for (n in numbersFor(way.operation)) test(n, Buffers(way.operation, n))
    }

    @Test
    fun capacities() = everyNumbers { n, buffers ->
        way.call(buffers.sources, buffers.result, n)
        for ((i, source) in buffers.sources.withIndex()) {
            val bytes = source.capacity()
            val short = buffers.withSource(i, source.part(0, bytes - 1))
            refusedSaying("$way $n, source $i short", "holds ${bytes - 1} bytes, $bytes needed") {
                way.call(short, buffers.result, n)
            }
            val picture = way.operation.sources[i](n)
            val most = picture + way.operation.spare(n)
            check(bytes in picture..most) { "$way $n: $bytes bytes, picture $picture" }
        }
        val bytes = buffers.result.capacity()
        refusedSaying("$way $n, destination short", "holds ${bytes - 1} bytes, $bytes needed") {
            way.call(buffers.sources, buffers.result.part(0, bytes - 1), n)
        }
        refusedSaying("$way $n, empty destination", "needed") {
            way.call(buffers.sources, buffers.result.part(0, 0), n)
        }
    }

    @Test
    fun kinds() = everyNumbers { n, buffers ->
        for ((i, source) in buffers.sources.withIndex()) {
            val onHeap = buffers.withSource(i, ByteBuffer.allocate(source.capacity()))
            refusedSaying("$way, source $i on the heap", "not a direct buffer") {
                way.call(onHeap, buffers.result, n)
            }
            way.call(buffers.withSource(i, source.asReadOnlyBuffer()), buffers.result, n)
        }
        refusedSaying("$way, destination on the heap", "destination is not a direct buffer") {
            way.call(buffers.sources, ByteBuffer.allocate(buffers.result.capacity()), n)
        }
        refusedSaying("$way, read-only destination", "destination is read-only") {
            way.call(buffers.sources, buffers.result.asReadOnlyBuffer(), n)
        }
    }

    @Test
    fun alignments() = everyNumbers { n, buffers ->
        val bytes = buffers.result.capacity()
        val odd = direct(bytes + 1L).part(1, bytes)
        if (way.operation.dstAlignment == 1) {
            way.call(buffers.sources, odd, n)
        } else {
            refusedSaying("$way, odd destination", "no multiple of 4") {
                way.call(buffers.sources, odd, n)
            }
        }
        val sourceBytes = buffers.sources[0].capacity()
        val shifted = buffers.withSource(0, direct(sourceBytes + 1L).part(1, sourceBytes))
        if (way.operation.srcAlignment == 1) {
            way.call(shifted, buffers.result, n)
        } else {
            refusedSaying("$way, odd source", "no multiple of 4") {
                way.call(shifted, buffers.result, n)
            }
        }
    }

    @Test
    fun overlaps() = everyNumbers { n, buffers ->
        val bytes = buffers.result.capacity()
        for ((i, source) in buffers.sources.withIndex()) {
            // Starts of destinations stay multiples of 4.
            val behind = (source.capacity() + 3) / 4 * 4
            val shared = direct(behind + bytes.toLong())
            val front = buffers.withSource(i, shared.part(0, source.capacity()))
            way.call(front, shared.part(behind, bytes), n)
            refusedSaying("$way $n, source $i and destination the same", "overlaps") {
                way.call(front, shared.part(0, bytes), n)
            }
            val onLastByte = (source.capacity() - 1) / 4 * 4
            refusedSaying("$way $n, destination on the end of source $i", "overlaps") {
                way.call(front, shared.part(onLastByte, bytes), n)
            }
        }
    }

    @Test
    fun numbers() {
        val n = numbersFor(way.operation)[0]
        val buffers = Buffers(way.operation, n)
        val changes = mutableListOf<Numbers>()
        for (value in wrong) {
            changes += n.copy(srcW = value)
            changes += n.copy(srcH = value)
            changes += n.copy(dstW = value)
            changes += n.copy(dstH = value)
            // Products of these pass 2^31, and 2^32 as well.
            changes += n.copy(srcW = value, srcH = value, stride = value)
            changes += n.copy(dstW = value, dstH = value, canvasW = value, canvasH = value)
            if (way.operation.inCanvas) {
                changes += n.copy(canvasW = value)
                changes += n.copy(canvasH = value)
                if (value != 0) changes += n.copy(x = value)
                if (value != 0) changes += n.copy(y = value)
            }
            if (way.operation.strided) changes += n.copy(stride = value)
        }
        if (way.operation.strided) changes += n.copy(stride = n.srcW - 1)
        if (way.operation.inCanvas) {
            changes += n.copy(x = n.canvasW - n.dstW + 1)
            changes += n.copy(y = n.canvasH - n.dstH + 1)
        }
        for (bad in changes) {
            refused("$way $bad") { way.call(buffers.sources, buffers.result, bad) }
        }
    }

    /** Sizes that are right, of pictures that no buffer can hold. */
    @Test
    fun largest() {
        val side = Size.LARGEST_SIDE
        val n = numbersFor(way.operation)[0]
        val buffers = Buffers(way.operation, n)
        val largeSource = n.copy(srcW = side, srcH = side, stride = side)
        refusedSaying("$way, largest source", way.operation.firstSource) {
            way.call(buffers.sources, buffers.result, largeSource)
        }
        val largeResult = n.copy(dstW = side, dstH = side, canvasW = side, canvasH = side, x = 0, y = 0)
        refusedSaying("$way, largest result", "needed") {
            way.call(buffers.sources, buffers.result, largeResult)
        }
    }

    companion object {
        @JvmStatic
        @Parameterized.Parameters(name = "{0}")
        fun parameters() = ways
    }
}

class Messages {
    @Test
    fun pictureOfTheLargestSize() {
        val side = Size.LARGEST_SIDE
        val small = direct(400)
        val text = "source holds 400 bytes, 4294705156 needed"
        val size = Size(side, side)
        refusedSaying("largest, safe", text) { Resizer.rgba(small, size, small, Size(1, 1)) }
        refusedSaying("largest, raw", text) { Native.rgba(small, side, side, small, 1, 1) }
    }

    /** Numbers that only native methods take. */
    @Test
    fun codes() {
        val small = direct(4096)
        for (code in listOf(-1, 3, 7, Int.MIN_VALUE, Int.MAX_VALUE)) {
            refusedSaying("format $code", "format") {
                Native.bilinear(small, 2, 2, direct(16), 2, 2, code, 0)
            }
            refusedSaying("mode $code", "mode") {
                Native.bilinear(small, 2, 2, direct(16), 2, 2, 0, code)
            }
        }
        for (components in listOf(-1, 0, 5, Int.MIN_VALUE, Int.MAX_VALUE)) {
            refusedSaying("components $components", "components is $components") {
                Native.lanczosComponents(small, 2, 2, direct(16), 2, 2, components)
            }
            refusedSaying("components $components", "components is $components") {
                Resizer.lanczos(small, Size(2, 2), direct(16), Size(2, 2), components)
            }
        }
        refusedSaying("bilinear RGB888", "RGB888") {
            Resizer.bilinear(small, Size(2, 2), direct(16), Size(2, 2), PixelFormat.RGB888)
        }
    }

    @Test
    fun messages() {
        val small = direct(100)
        val size = Size(10, 10)
        refusedSaying("RGBA", "destination holds 100 bytes, 400 needed (10 x 10 x 4)") {
            Resizer.rgba(direct(400), size, small, size)
        }
        refusedSaying("I420", "source holds 100 bytes, 131 needed (9 x 9 + 2 x 5 x 5)") {
            Resizer.i420(small, Size(9, 9), direct(400), size)
        }
        refusedSaying("stride", "srcStride is 9, must be 10 (the source's width) to 32767") {
            Resizer.rgbaInCanvas(direct(400), size, direct(400), Placement(size, size, 0, 0), 9)
        }
        refusedSaying("U plane", "source U plane holds 28 bytes, 29 needed (5 x 5, rows 6 apart)") {
            Resizer.i420PlanesInCanvas(
                direct(200), direct(28), direct(30), size, 12, direct(150), Placement(size, size, 0, 0),
            )
        }
        refusedSaying("size", "width is -3, must be 1 to 32767") { Size(-3, 1) }
        refusedSaying("size", "height is 32768, must be 1 to 32767") { Size(1, 32768) }
        refusedSaying("placement", "picture of 10 x 10 at (1, 0) does not lie inside the canvas of 10 x 10") {
            Placement(size, size, 1, 0)
        }
    }

    /** Pictures lie from the position on; position, limit and order stay; so do bytes behind. */
    @Test
    fun positions() {
        val src = picture(64 * 4 + 12)
        val plain = direct(16)
        Resizer.rgba(src.part(8, 256), Size(8, 8), plain, Size(2, 2))
        val dst = direct(40)
        for (i in 0 until 40) dst.put(i, 77)
        (src as Buffer).position(8)
        (dst as Buffer).position(12)
        (dst as Buffer).limit(30)
        src.order(ByteOrder.LITTLE_ENDIAN)
        Resizer.rgba(src, Size(8, 8), dst, Size(2, 2))
        check(src.position() == 8 && src.limit() == 268 && src.order() == ByteOrder.LITTLE_ENDIAN) {
            "the source's state has changed: $src"
        }
        check(dst.position() == 12 && dst.limit() == 30) { "the destination's state has changed: $dst" }
        (dst as Buffer).clear()
        for (i in 0 until 40) {
            val expected = if (i in 12 until 28) plain.get(i - 12) else 77
            check(dst.get(i) == expected) { "byte $i is ${dst.get(i)}, not $expected" }
        }
        (dst as Buffer).position(12)
        (dst as Buffer).limit(27)
        refusedSaying("limit", "destination holds 15 bytes, 16 needed (2 x 2 x 4)") {
            Resizer.rgba(src, Size(8, 8), dst, Size(2, 2))
        }
    }

    /** On wide canvases, too, where the library's threads would draw nothing. */
    @Test
    fun tallPicturesOnWideCanvases() {
        val source = Size(4, 1024)
        val placement = Placement(Size(100, 10), Size(4, 8), 60, 0)
        for (format in listOf(PixelFormat.I420, PixelFormat.NV21)) {
            val canvas = direct(format.bytes(placement.canvas))
            val from = picture(format.bytes(source).toInt())
            if (format == PixelFormat.I420) {
                Resizer.i420InCanvas(from, source, canvas, placement)
            } else {
                Resizer.nv21InCanvas(from, source, canvas, placement)
            }
            check((0 until 8).all { canvas.get(100 * it + 60).toInt() != 0 }) { "$format was not drawn" }
        }
    }

    @Test
    fun placements() {
        fun fits(source: Size, canvas: Size, expected: String) {
            val text = Placement.fit(source, canvas).toString()
            check(text == expected) { "$source in $canvas: $text, not $expected" }
        }
        fits(Size(400, 300), Size(640, 360), "480 x 360 at (80, 0) of 640 x 360")
        fits(Size(300, 400), Size(100, 200), "100 x 133 at (0, 32) of 100 x 200")
        fits(Size(100, 100), Size(10, 10), "10 x 10 at (0, 0) of 10 x 10")
        fits(Size(32767, 1), Size(5, 5), "5 x 1 at (0, 2) of 5 x 5")
        fits(Size(1, 32767), Size(5, 5), "1 x 5 at (2, 0) of 5 x 5")
    }

    @Test
    fun formats() {
        val size = Size(3, 5)
        val expected = mapOf(
            PixelFormat.RGBA8888 to 60L, PixelFormat.RGB888 to 45L,
            PixelFormat.I420 to 27L, PixelFormat.NV21 to 27L,
        )
        for ((format, bytes) in expected) check(format.bytes(size) == bytes) { "$format" }
        check(PixelFormat.RGBA8888.bytes(Size(32767, 32767)) == 4294705156L) { "bytes past 2^32" }
    }
}
