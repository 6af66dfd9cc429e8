// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

import android.graphics.Bitmap
import java.nio.ByteBuffer

/**
 * The native methods for bitmaps, which only the library for Android has. JNI_OnLoad finds this class
 * and the methods by their names. `filter` is the ordinal of a [BitmapFilter].
 */
internal object NativeBitmaps {
    init {
        Native.load()
    }

    @JvmStatic
    external fun resize(src: Bitmap, dst: Bitmap, filter: Int)

    @JvmStatic
    external fun resizeFrom(src: ByteBuffer, srcWidth: Int, srcHeight: Int, dst: Bitmap, filter: Int)

    @JvmStatic
    external fun resizeInto(src: Bitmap, dst: ByteBuffer, dstWidth: Int, dstHeight: Int, filter: Int)
}
