// SPDX-License-Identifier: Apache-2.0
// Every function of the binding in one shape, and what each needs, counted here once more.
package ovrin.resize.test

import java.nio.ByteBuffer
import ovrin.resize.BilinearMode
import ovrin.resize.CameraFrame
import ovrin.resize.Native
import ovrin.resize.PixelFormat
import ovrin.resize.Placement
import ovrin.resize.Resizer
import ovrin.resize.Size

/** The numbers of a call, right or wrong. Without a canvas, it is as large as the picture. */
data class Numbers(
    val srcW: Int, val srcH: Int, val stride: Int,
    val dstW: Int, val dstH: Int,
    val canvasW: Int = dstW, val canvasH: Int = dstH,
    val x: Int = 0, val y: Int = 0,
) {
    val source get() = Size(srcW, srcH)
    val result get() = Size(dstW, dstH)
    val placement get() = Placement(Size(canvasW, canvasH), result, x, y)

    fun areValid() = listOf(srcW, srcH, dstW, dstH, canvasW, canvasH).all { it in 1..32767 } &&
        stride in srcW..32767 && x >= 0 && y >= 0 &&
        x.toLong() + dstW <= canvasW && y.toLong() + dstH <= canvasH
}

fun half(luma: Int): Long = (luma.toLong() + 1) shr 1

fun yuv(w: Int, h: Int): Long = w.toLong() * h + 2 * half(w) * half(h)

fun times(factor: Int, w: Int, h: Int): Long = Math.multiplyExact(factor.toLong(), w.toLong() * h)

fun chroma(n: Numbers): Long = (half(n.srcH) - 1) * half(n.stride) + half(n.srcW)

fun luma(n: Numbers): Long = (n.srcH - 1L) * n.stride + n.srcW

/**
 * @property sources the bytes that each source buffer needs
 * @property result the bytes that the destination needs
 * @property spare bytes behind the only source that the function may ask for, or may not
 * @property exact the bytes with which it is content
 * @property safe the call through the Kotlin checks
 * @property raw the call of the native method past them; null where another operation makes it
 */
class Operation(
    val name: String,
    val sources: List<(Numbers) -> Long>,
    val result: (Numbers) -> Long,
    val inCanvas: Boolean = false,
    val strided: Boolean = false,
    val slow: Boolean = false,
    val dstAlignment: Int = 1,
    val srcAlignment: Int = 1,
    val spare: (Numbers) -> Long = { 0 },
    val exact: (Numbers) -> List<Long> = { n -> sources.map { it(n) } },
    val isFrame: Boolean = false,
    val raw: ((List<ByteBuffer>, ByteBuffer, Numbers) -> Unit)?,
    val safe: (List<ByteBuffer>, ByteBuffer, Numbers) -> Unit,
) {
    /** How messages name the first source. */
    val firstSource get() = if (sources.size > 1) "Y plane" else "source"

    override fun toString() = name
}

private typealias PlainNative = (ByteBuffer, Int, Int, ByteBuffer, Int, Int) -> Unit
private typealias PlainSafe = (ByteBuffer, Size, ByteBuffer, Size) -> Unit

private fun plain(
    name: String,
    bytes: (Int, Int) -> Long,
    native: PlainNative,
    safe: PlainSafe,
    slow: Boolean = false,
    dstAlignment: Int = 1,
    srcAlignment: Int = 1,
) = Operation(
    name,
    sources = listOf { n -> bytes(n.srcW, n.srcH) },
    result = { n -> bytes(n.dstW, n.dstH) },
    slow = slow,
    dstAlignment = dstAlignment,
    srcAlignment = srcAlignment,
    raw = { src, dst, n -> native(src[0], n.srcW, n.srcH, dst, n.dstW, n.dstH) },
    safe = { src, dst, n -> safe(src[0], n.source, dst, n.result) },
)

private val rgba = { w: Int, h: Int -> times(4, w, h) }
private val full = { w: Int, h: Int -> times(3, w, h) }

private fun canvasOperations() = listOf(
    Operation(
        "rgbaInCanvas",
        sources = listOf { n -> 4 * luma(n) },
        result = { n -> rgba(n.canvasW, n.canvasH) },
        inCanvas = true, strided = true, dstAlignment = 4,
        raw = { src, dst, n ->
            Native.rgbaInCanvas(
                src[0], n.srcW, n.srcH, n.stride, dst, n.canvasW, n.canvasH, n.x, n.y, n.dstW, n.dstH,
            )
        },
        safe = { src, dst, n ->
            if (n.stride == n.srcW) {
                Resizer.rgbaInCanvas(src[0], n.source, dst, n.placement)
            } else {
                Resizer.rgbaInCanvas(src[0], n.source, dst, n.placement, n.stride)
            }
        },
    ),
    Operation(
        "i420InCanvas",
        sources = listOf { n -> yuv(n.srcW, n.srcH) },
        result = { n -> yuv(n.canvasW, n.canvasH) },
        inCanvas = true,
        raw = null,
        safe = { src, dst, n -> Resizer.i420InCanvas(src[0], n.source, dst, n.placement) },
    ),
    Operation(
        "i420PlanesInCanvas",
        sources = listOf(::luma, ::chroma, ::chroma),
        result = { n -> yuv(n.canvasW, n.canvasH) },
        inCanvas = true, strided = true,
        raw = { src, dst, n ->
            Native.i420InCanvas(
                src[0], src[1], src[2], n.srcW, n.srcH, n.stride,
                dst, n.canvasW, n.canvasH, n.x, n.y, n.dstW, n.dstH,
            )
        },
        safe = { src, dst, n ->
            Resizer.i420PlanesInCanvas(
                src[0], src[1], src[2], n.source, n.stride, dst, n.placement,
            )
        },
    ),
    Operation(
        "nv21InCanvas",
        sources = listOf { n -> yuv(n.srcW, n.srcH) },
        result = { n -> yuv(n.canvasW, n.canvasH) },
        inCanvas = true,
        raw = null,
        safe = { src, dst, n -> Resizer.nv21InCanvas(src[0], n.source, dst, n.placement) },
    ),
    Operation(
        "nv21PlanesInCanvas",
        sources = listOf(::luma, { n -> 2 * chroma(n) }),
        result = { n -> yuv(n.canvasW, n.canvasH) },
        inCanvas = true, strided = true,
        raw = { src, dst, n ->
            Native.nv21InCanvas(
                src[0], src[1], n.srcW, n.srcH, n.stride,
                dst, n.canvasW, n.canvasH, n.x, n.y, n.dstW, n.dstH,
            )
        },
        safe = { src, dst, n ->
            Resizer.nv21PlanesInCanvas(src[0], src[1], n.source, n.stride, dst, n.placement)
        },
    ),
)

private fun bilinear(format: PixelFormat, mode: BilinearMode): Operation {
    val number = listOf(PixelFormat.RGBA8888, PixelFormat.I420, PixelFormat.NV21).indexOf(format)
    val bytes = if (format == PixelFormat.RGBA8888) rgba else ::yuv
    val sample = if (format == PixelFormat.RGBA8888) 4 else 2
    val family = if (format == PixelFormat.RGBA8888) "rgba" else format.name.lowercase()
    return Operation(
        "${mode.name.lowercase()}_$family",
        sources = listOf { n -> bytes(n.srcW, n.srcH) },
        result = { n -> bytes(n.dstW, n.dstH) },
        spare = { n -> sample * (n.srcW + 1L) },
        exact = { n -> listOf(Resizer.bilinearSourceBytes(n.source, n.result, format, mode)) },
        raw = { src, dst, n ->
            Native.bilinear(src[0], n.srcW, n.srcH, dst, n.dstW, n.dstH, number, mode.ordinal)
        },
        safe = { src, dst, n -> Resizer.bilinear(src[0], n.source, dst, n.result, format, mode) },
    )
}

private fun lanczosComponents(components: Int) = Operation(
    if (components == 2) "lanczos_components" else "lanczos_components_$components",
    sources = listOf { n -> times(components, n.srcW, n.srcH) },
    result = { n -> times(components, n.dstW, n.dstH) },
    slow = true,
    raw = { src, dst, n ->
        Native.lanczosComponents(src[0], n.srcW, n.srcH, dst, n.dstW, n.dstH, components)
    },
    safe = { src, dst, n -> Resizer.lanczos(src[0], n.source, dst, n.result, components) },
)

private val frames = listOf(PixelFormat.I420, PixelFormat.NV21)

/** Frames whose U and V have memory of their own. Rows are a little longer than they must be. */
private fun frame(format: PixelFormat, pixelStride: Int): Operation {
    fun yRow(n: Numbers) = n.srcW + 5
    fun uvRow(n: Numbers) = half(n.srcW).toInt() * pixelStride + 3
    fun chroma(n: Numbers) = (half(n.srcH) - 1) * uvRow(n) + (half(n.srcW) - 1) * pixelStride + 1
    return Operation(
        "frame_${format.name.lowercase()}_$pixelStride",
        sources = listOf({ n -> (n.srcH - 1L) * yRow(n) + n.srcW }, ::chroma, ::chroma),
        result = { n -> yuv(n.dstW, n.dstH) },
        isFrame = true,
        raw = { src, dst, n ->
            Native.resizeYuv420(
                src[0], src[1], src[2], yRow(n), uvRow(n), pixelStride, n.srcW, n.srcH,
                dst, n.dstW, n.dstH, 1 + frames.indexOf(format),
            )
        },
        safe = { src, dst, n ->
            CameraFrame.fromYuv420(
                src[0], src[1], src[2], yRow(n), uvRow(n), pixelStride, n.srcW, n.srcH,
            ).resizeTo(dst, n.result, format)
        },
    )
}

val operations: List<Operation> = listOf(
    plain("rgba", rgba, Native::rgba, Resizer::rgba, dstAlignment = 4),
    plain("rgb", full, Native::rgb, Resizer::rgb),
    plain("nearest", rgba, Native::nearest, Resizer::nearest, dstAlignment = 4, srcAlignment = 4),
    plain("i420", ::yuv, Native::i420, Resizer::i420),
    plain("nv21", ::yuv, Native::nv21, Resizer::nv21),
) + canvasOperations() +
    listOf(PixelFormat.RGBA8888, PixelFormat.I420, PixelFormat.NV21).flatMap { format ->
        BilinearMode.values().map { mode -> bilinear(format, mode) }
    } +
    plain("lanczos", rgba, Native::lanczos, Resizer::lanczos, slow = true) +
    (1..4).map(::lanczosComponents) +
    plain(
        "lanczosFullChroma", full, Native::lanczosFullChroma, Resizer::lanczosFullChroma, slow = true,
    ) +
    frames.flatMap { format -> (1..2).map { stride -> frame(format, stride) } }
