// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

/** How the pixels of a picture lie in its buffer. Rows are packed, without bytes between them. */
enum class PixelFormat {
    /** Four bytes per pixel, in any order of the channels. */
    RGBA8888,

    /** Three bytes per pixel, in any order of the channels. */
    RGB888,

    /** A plane of Y, then U and V at half the size in either direction, rounded up. */
    I420,

    /** A plane of Y, then one of V and U in turn, at half the size in either direction, rounded up. */
    NV21;

    /**
     * The bytes of a picture of this [size]. More than `Int.MAX_VALUE` for sizes that no buffer can
     * hold.
     */
    fun bytes(size: Size): Long = when (this) {
        RGBA8888 -> 4 * size.pixels
        RGB888 -> 3 * size.pixels
        I420, NV21 -> size.pixels + 2 * size.chromaSamples
    }

    /** What the native methods call it that take several formats. */
    internal val nativeNumber: Int
        get() = when (this) {
            RGBA8888 -> 0
            I420 -> 1
            NV21 -> 2
            RGB888 -> throw IllegalArgumentException("RGB888 has no number")
        }

    /** How [bytes] comes about. */
    internal fun formula(size: Size): String = when (this) {
        RGBA8888 -> "$size x 4"
        RGB888 -> "$size x 3"
        I420, NV21 -> "$size + 2 x ${halfRoundedUp(size.width)} x ${halfRoundedUp(size.height)}"
    }
}
