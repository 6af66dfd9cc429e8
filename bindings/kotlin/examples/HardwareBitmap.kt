// SPDX-License-Identifier: Apache-2.0
// What lies in the memory of a graphics processor cannot be read where it is: neither a bitmap whose
// configuration is HARDWARE, nor the HardwareBuffer that it wraps. A copy can.
package ovrin.examples

import android.graphics.Bitmap
import ovrin.resize.Bitmaps

fun thumbnail(picture: Bitmap, width: Int, height: Int): Bitmap {
    val small = Bitmap.createBitmap(width, height, Bitmap.Config.ARGB_8888)
    val isReadable = picture.config == Bitmap.Config.ARGB_8888
    val readable = if (isReadable) picture else picture.copy(Bitmap.Config.ARGB_8888, false)
    Bitmaps.resize(readable, small)
    if (!isReadable) readable.recycle()
    return small
}
