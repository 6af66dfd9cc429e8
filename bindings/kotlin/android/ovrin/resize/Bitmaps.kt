// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

import android.graphics.Bitmap
import java.nio.ByteBuffer

/** How a bitmap is resized. */
enum class BitmapFilter {
    /**
     * Four pixels of the source for each of the result, on four threads from 1024 source rows on.
     * Drops the two low bits: 255 becomes 252, in alpha as well.
     */
    QUARTER,

    /** One pixel of the source for each of the result; see [Resizer.nearest]. */
    NEAREST,

    /** Blends four neighbours; see [Resizer.bilinear]. Its results can wrap beside strong edges. */
    BILINEAR,

    /** The sharpest and slowest. Beside edges it overshoots: a colour may come out above its alpha. */
    LANCZOS,
}

/**
 * Resizes bitmaps of Android whose configuration is `ARGB_8888`.
 *
 * Pixels are bytes here: whether colours are multiplied by alpha, as bitmaps mostly have them, stays as
 * it is. A bitmap is locked until the call returns, and may be in use by nobody else. One whose rows
 * have bytes between them is copied first, or last.
 *
 * A bitmap that is recycled, of hardware, or of another configuration throws
 * [IllegalArgumentException], and so does a destination that cannot be changed. [OutOfMemoryError]
 * says that a copy had no memory. Nothing is written then.
 */
object Bitmaps {
    /** Resizes one bitmap into another; the sizes are theirs. */
    @JvmStatic
    @JvmOverloads
    fun resize(src: Bitmap, dst: Bitmap, filter: BitmapFilter = BitmapFilter.QUARTER) =
        NativeBitmaps.resize(readable("source", src), writable(dst), filter.ordinal)

    /** Resizes packed RGBA8888 in a direct buffer into a bitmap. */
    @JvmStatic
    @JvmOverloads
    fun resize(
        src: ByteBuffer,
        srcSize: Size,
        dst: Bitmap,
        filter: BitmapFilter = BitmapFilter.QUARTER,
    ) = NativeBitmaps.resizeFrom(
        sourceOf(PixelFormat.RGBA8888, src, srcSize), srcSize.width, srcSize.height,
        writable(dst), filter.ordinal,
    )

    /** Resizes a bitmap into packed RGBA8888 in a direct buffer, at an address that is a multiple of 4. */
    @JvmStatic
    @JvmOverloads
    fun resize(
        src: Bitmap,
        dst: ByteBuffer,
        dstSize: Size,
        filter: BitmapFilter = BitmapFilter.QUARTER,
    ) = NativeBitmaps.resizeInto(
        readable("source", src),
        destinationOf(dst, PixelFormat.RGBA8888, dstSize), dstSize.width, dstSize.height,
        filter.ordinal,
    )

    private fun readable(name: String, bitmap: Bitmap): Bitmap {
        require(!bitmap.isRecycled) { "$name is recycled" }
        // By its name, as older Android has no such configuration.
        require(bitmap.config?.name == "ARGB_8888") {
            "$name is ${bitmap.config} (${bitmap.width} x ${bitmap.height}), must be ARGB_8888"
        }
        return bitmap
    }

    private fun writable(bitmap: Bitmap): Bitmap {
        readable("destination", bitmap)
        require(bitmap.isMutable) { "destination (${bitmap.width} x ${bitmap.height}) is not mutable" }
        return bitmap
    }
}
