// SPDX-License-Identifier: Apache-2.0
// Frames as phones deliver them, in every layout: they give what the packed picture gives.
package ovrin.resize.test

import java.nio.Buffer
import java.nio.ByteBuffer
import java.util.Random
import org.junit.Assert.assertEquals
import org.junit.Test
import org.junit.runner.RunWith
import org.junit.runners.Parameterized
import ovrin.resize.CameraFrame
import ovrin.resize.Native
import ovrin.resize.PixelFormat
import ovrin.resize.Resizer
import ovrin.resize.Size

/** How U and V lie; [pixelStride] bytes from sample to sample. */
private enum class Chroma(val pixelStride: Int) {
    PLANES(1),

    /** One behind the other in the memory of Y. */
    BEHIND_Y(1),

    /** Rows of U and V take turns. */
    ROW_BY_ROW(1),
    V_FIRST(2),
    U_FIRST(2),

    /** Gaps between samples, in buffers of their own. */
    GAPS(2),
}

private class Rows(val name: String, val y: (Int) -> Int, val uv: (Chroma, Int) -> Int) {
    override fun toString() = name
}

private fun row(chroma: Chroma, width: Int) = half(width).toInt() * chroma.pixelStride

private val rows = listOf(
    Rows("packed", { it }, ::row),
    Rows("padded alike", { (it + 15) / 16 * 16 }, { c, w -> row(c, (w + 15) / 16 * 16) }),
    Rows("only Y padded", { it + 64 }, ::row),
    Rows("only U and V padded", { it }, { c, w -> row(c, w) + 26 }),
    Rows("odd", { it + 1 - it % 2 }, { c, w -> row(c, w) or 1 }),
)

private val sizes = listOf(
    Size(1, 1), Size(2, 2), Size(1, 6), Size(7, 1), Size(7, 5), Size(16, 12), Size(33, 17), Size(64, 48),
)

/** A frame in memory that ends with each plane's last sample. */
private class Frame(val chroma: Chroma, rows: Rows, val size: Size) {
    val yRow = rows.y(size.width)
    val uvRow = rows.uv(chroma, size.width) * (if (chroma == Chroma.ROW_BY_ROW) 2 else 1)
    private val lumaBytes = (size.height - 1) * yRow + size.width
    private val chromaWidth = half(size.width).toInt()
    private val chromaHeight = half(size.height).toInt()
    private val chromaBytes = (chromaHeight - 1) * uvRow + (chromaWidth - 1) * chroma.pixelStride + 1

    val y: ByteBuffer
    val u: ByteBuffer
    val v: ByteBuffer

    init {
        val behind = lumaBytes + chromaBytes
        val all = picture(behind + chromaBytes)
        val own = chroma == Chroma.PLANES || chroma == Chroma.GAPS
        y = if (chroma == Chroma.BEHIND_Y) all.part(0, lumaBytes) else picture(lumaBytes)
        val turn = when (chroma) {
            Chroma.ROW_BY_ROW -> uvRow / 2
            Chroma.BEHIND_Y -> chromaBytes
            else -> 1
        }
        val shared = if (chroma == Chroma.BEHIND_Y) all.part(lumaBytes, 2 * chromaBytes) else
            noise(chromaBytes + turn)
        val first = if (own) noise(chromaBytes) else shared.part(0, chromaBytes)
        val second = if (own) noise(chromaBytes) else shared.part(turn, chromaBytes)
        u = if (chroma == Chroma.V_FIRST) second else first
        v = if (chroma == Chroma.V_FIRST) first else second
    }

    private fun noise(bytes: Int): ByteBuffer {
        val buffer = ByteBuffer.allocateDirect(bytes)
        for (i in 0 until bytes) buffer.put(i, (i * 37 + i / 7 + bytes).toByte())
        return buffer
    }

    fun frame(change: (ByteBuffer) -> ByteBuffer = { it }): CameraFrame = CameraFrame.fromYuv420(
        change(y), change(u), change(v), yRow, uvRow, chroma.pixelStride, size.width, size.height,
    )

    fun packed(): ByteBuffer {
        val result = ByteBuffer.allocateDirect(PixelFormat.I420.bytes(size).toInt())
        fun add(plane: ByteBuffer, width: Int, height: Int, row: Int, pixel: Int) {
            for (j in 0 until height) for (i in 0 until width) result.put(plane.get(j * row + i * pixel))
        }
        add(y, size.width, size.height, yRow, 1)
        add(u, chromaWidth, chromaHeight, uvRow, chroma.pixelStride)
        add(v, chromaWidth, chromaHeight, uvRow, chroma.pixelStride)
        (result as Buffer).clear()
        return result
    }
}

/** I420 as NV21. */
private fun nv21Of(i420: ByteBuffer, size: Size): ByteBuffer {
    val luma = size.width * size.height
    val samples = (i420.capacity() - luma) / 2
    val result = ByteBuffer.allocateDirect(i420.capacity())
    for (i in 0 until luma) result.put(i, i420.get(i))
    for (i in 0 until samples) {
        result.put(luma + 2 * i, i420.get(luma + samples + i))
        result.put(luma + 2 * i + 1, i420.get(luma + i))
    }
    return result
}

private fun bytesOf(buffer: ByteBuffer) = List(buffer.capacity()) { buffer.get(it) }

private const val MARK: Byte = 77

/** What [write] puts into a destination of this size, behind which nothing may change. */
private fun written(size: Size, write: (ByteBuffer) -> Unit): List<Byte> {
    val bytes = PixelFormat.NV21.bytes(size).toInt()
    val destination = ByteBuffer.allocateDirect(bytes + 9)
    for (i in 0 until destination.capacity()) destination.put(i, MARK)
    (destination as Buffer).position(3)
    write(destination)
    assertEquals(3, destination.position())
    for (i in listOf(0, 1, 2) + (bytes + 3 until bytes + 9)) assertEquals(MARK, destination.get(i))
    return bytesOf(destination.part(3, bytes))
}

private fun resized(packed: ByteBuffer, from: Size, to: Size): ByteBuffer {
    val result = ByteBuffer.allocateDirect(PixelFormat.I420.bytes(to).toInt())
    Resizer.i420(packed, from, result, to)
    return result
}

private fun checkResizes(source: Frame, frame: CameraFrame, to: Size) {
    val expected = resized(source.packed(), source.size, to)
    assertEquals(bytesOf(expected), written(to) { frame.resizeTo(it, to, PixelFormat.I420) })
    val nv21 = bytesOf(nv21Of(expected, to))
    assertEquals(nv21, written(to) { frame.resizeTo(it, to, PixelFormat.NV21) })
}

private fun checkCopies(source: Frame, frame: CameraFrame) {
    val packed = source.packed()
    val size = source.size
    assertEquals(bytesOf(packed), written(size) { frame.copyTo(it, PixelFormat.I420) })
    assertEquals(
        bytesOf(nv21Of(packed, size)),
        written(size) { frame.copyTo(it, PixelFormat.NV21) },
    )
}

@RunWith(Parameterized::class)
class CameraFrames(private val chroma: String, private val rows: Int, private val size: Size) {
    private val source = Frame(Chroma.valueOf(chroma), ovrin.resize.test.rows[rows], size)

    @Test
    fun resizes() {
        for (to in listOf(Size(1, 1), Size(4, 8), Size(7, 5), Size(20, 11))) {
            checkResizes(source, source.frame(), to)
        }
    }

    @Test
    fun copies() = checkCopies(source, source.frame())

    @Test
    fun readsFromPositionToLimit() {
        val moved = source.frame { plane ->
            val larger = ByteBuffer.allocateDirect(plane.capacity() + 12)
            (larger as Buffer).position(5)
            larger.put(plane.duplicate())
            (larger as Buffer).limit(larger.position())
            (larger as Buffer).position(5)
            larger.asReadOnlyBuffer()
        }
        // Moved into buffers of their own, U and V are no longer neighbours.
        checkResizes(source, moved, Size(4, 4))
        checkCopies(source, moved)
    }

    @Test
    fun everyByteIsNeeded() {
        val planes = listOf(source.y, source.u, source.v)
        for ((i, name) in listOf("Y", "U", "V").withIndex()) {
            val bytes = planes[i].capacity()
            val short = planes.toMutableList()
            short[i] = planes[i].part(0, bytes - 1)
            refusedSaying("$name short", "$name plane holds ${bytes - 1} bytes, $bytes needed") {
                CameraFrame.fromYuv420(
                    short[0], short[1], short[2], source.yRow, source.uvRow,
                    source.chroma.pixelStride, size.width, size.height,
                )
            }
            refusedSaying("$name short, raw", "$name plane holds ${bytes - 1} bytes, $bytes needed") {
                Native.copyYuv420(
                    short[0], short[1], short[2], source.yRow, source.uvRow,
                    source.chroma.pixelStride, size.width, size.height,
                    ByteBuffer.allocateDirect(PixelFormat.I420.bytes(size).toInt()), 1,
                )
            }
        }
    }

    @Test
    fun destinationSharesNoByte() {
        for (plane in listOf(source.y, source.u, source.v)) {
            val bytes = PixelFormat.I420.bytes(size).toInt()
            val memory = ByteBuffer.allocateDirect(plane.capacity() + bytes)
            val shared = memory.part(0, plane.capacity())
            val frame = source.frame { if (it === plane) shared else it }
            frame.copyTo(memory.part(plane.capacity(), bytes), PixelFormat.I420)
            for (format in listOf(PixelFormat.I420, PixelFormat.NV21)) {
                val onLastByte = memory.part(plane.capacity() - 1, bytes)
                refusedSaying("on the last byte", "destination overlaps a source") {
                    frame.copyTo(onLastByte, format)
                }
                refusedSaying("on the last byte", "destination overlaps a source") {
                    frame.resizeTo(onLastByte, Size(1, 1), format)
                }
            }
        }
    }

    companion object {
        @JvmStatic
        @Parameterized.Parameters(name = "{0}, {1}, {2}")
        fun parameters(): List<Array<Any>> = Chroma.values().flatMap { chroma ->
            rows.indices.flatMap { row -> sizes.map { arrayOf<Any>(chroma.name, row, it) } }
        }
    }
}

class LargeCameraFrames {
    /** From 1024 rows on the library uses threads, where it can. */
    @Test
    fun resize() {
        for (chroma in Chroma.values()) {
            for (rows in rows) {
                val source = Frame(chroma, rows, Size(90, 1100))
                checkResizes(source, source.frame(), Size(21, 130))
                checkResizes(source, source.frame(), Size(24, 128))
            }
        }
    }

    @Test
    fun randomFrames() {
        val random = Random(java.lang.Long.getLong("ovrin.seed"))
        repeat(Integer.getInteger("ovrin.calls") / 200) {
            val size = Size(1 + random.nextInt(60), 1 + random.nextInt(60))
            val chroma = Chroma.values()[random.nextInt(Chroma.values().size)]
            val padding = random.nextInt(40)
            val distance = 2 * random.nextInt(20)
            val source = Frame(
                chroma, Rows("random", { it + padding }, { c, w -> row(c, w) + distance }), size,
            )
            checkResizes(source, source.frame(), Size(1 + random.nextInt(50), 1 + random.nextInt(50)))
            checkCopies(source, source.frame())
        }
    }
}

class CameraFrameRefusals {
    private val plane = picture(64)

    private fun frame(
        yRow: Int = 8, uvRow: Int = 8, pixel: Int = 2, width: Int = 8, height: Int = 6,
    ) = CameraFrame.fromYuv420(plane, plane, plane, yRow, uvRow, pixel, width, height)

    private fun raw(
        yRow: Int = 8, uvRow: Int = 8, pixel: Int = 2, width: Int = 8, height: Int = 6, format: Int = 1,
    ) = Native.resizeYuv420(
        plane, plane, plane, yRow, uvRow, pixel, width, height,
        ByteBuffer.allocateDirect(6), 2, 2, format,
    )

    @Test
    fun pixelStrides() {
        for (stride in listOf(0, -1, 3, 4, Int.MIN_VALUE, Int.MAX_VALUE)) {
            refusedSaying("pixel stride", "uvPixelStride is $stride, must be 1 or 2") {
                frame(pixel = stride)
            }
            refusedSaying("raw", "pixel stride of U and V is $stride, must be 1 to 2") {
                raw(pixel = stride)
            }
        }
    }

    @Test
    fun rowStridesOfY() {
        for (stride in listOf(7, 0, -8, Int.MIN_VALUE)) {
            refusedSaying("Y", "yRowStride is $stride, must be at least 8 (the width)") {
                frame(yRow = stride)
            }
            refusedSaying("raw", "row stride of Y is $stride, must be 8 to 2147483647") {
                raw(yRow = stride)
            }
        }
        refusedSaying("huge", "Y plane holds 64 bytes, 10737418243 needed") { frame(Int.MAX_VALUE) }
        refusedSaying("raw", "Y plane holds 64 bytes, 10737418243 needed") { raw(Int.MAX_VALUE) }
    }

    @Test
    fun rowStridesOfChroma() {
        for (stride in listOf(6, 0, -8, Int.MIN_VALUE)) {
            refusedSaying("UV", "uvRowStride is $stride, must be at least 7 (4 samples, 2 apart)") {
                frame(uvRow = stride)
            }
            refusedSaying("raw", "row stride of U and V is $stride, must be 7 to 2147483647") {
                raw(uvRow = stride)
            }
        }
        refusedSaying("planes", "must be at least 4 (4 samples, 1 apart)") { frame(uvRow = 3, pixel = 1) }
        refusedSaying("huge", "U plane holds 64 bytes, 4294967301 needed") {
            frame(uvRow = Int.MAX_VALUE)
        }
        refusedSaying("raw", "U plane holds 64 bytes, 4294967301 needed") { raw(uvRow = Int.MAX_VALUE) }
    }

    @Test
    fun sizes() {
        for (side in listOf(0, -1, 32768, Int.MIN_VALUE, Int.MAX_VALUE)) {
            refusedSaying("width", "width is $side, must be 1 to 32767") { frame(width = side) }
            refusedSaying("height", "height is $side, must be 1 to 32767") { frame(height = side) }
            refusedSaying("raw", "sides must be 1 to 32767") { raw(width = side) }
            refusedSaying("raw", "sides must be 1 to 32767") { raw(height = side) }
        }
    }

    @Test
    fun formats() {
        for (format in listOf(PixelFormat.RGBA8888, PixelFormat.RGB888)) {
            val text = "a frame becomes I420 or NV21, not $format"
            val dst = ByteBuffer.allocateDirect(400)
            refusedSaying("$format", text) { frame().resizeTo(dst, Size(2, 2), format) }
            refusedSaying("$format", text) { frame().copyTo(dst, format) }
        }
        for (number in listOf(0, 3, -1, Int.MAX_VALUE)) {
            refusedSaying("raw", "format is $number, must be 1 to 2") { raw(format = number) }
        }
    }

    @Test
    fun kindsOfBuffers() {
        val heap = ByteBuffer.allocate(64)
        refusedSaying("Y", "Y plane is not a direct buffer") {
            CameraFrame.fromYuv420(heap, plane, plane, 8, 8, 2, 8, 6)
        }
        refusedSaying("U", "U plane is not a direct buffer") {
            CameraFrame.fromYuv420(plane, heap, plane, 8, 8, 2, 8, 6)
        }
        refusedSaying("V", "V plane is not a direct buffer") {
            CameraFrame.fromYuv420(plane, plane, heap, 8, 8, 2, 8, 6)
        }
        val frame = frame()
        val bytes = ByteBuffer.allocateDirect(72)
        refusedSaying("read-only", "destination is read-only") {
            frame.copyTo(bytes.asReadOnlyBuffer(), PixelFormat.NV21)
        }
        refusedSaying("heap", "destination is not a direct buffer") {
            frame.copyTo(ByteBuffer.allocate(72), PixelFormat.NV21)
        }
        refusedSaying("short", "destination holds 71 bytes, 72 needed (8 x 6 + 2 x 4 x 3)") {
            frame.copyTo(bytes.part(0, 71), PixelFormat.NV21)
        }
        refusedSaying("raw", "source V plane is not a direct buffer") {
            Native.copyYuv420(plane, plane, heap, 8, 8, 2, 8, 6, bytes, 1)
        }
        refusedSaying("raw", "destination is read-only") {
            Native.copyYuv420(plane, plane, plane, 8, 8, 2, 8, 6, bytes.asReadOnlyBuffer(), 1)
        }
    }

    @Test
    fun saysWhatItIs() {
        assertEquals(
            "8 x 6, rows 8 and 8 apart, samples of U and V 2 apart", frame().toString(),
        )
    }
}
