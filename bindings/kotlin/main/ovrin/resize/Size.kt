// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

/**
 * The size of a picture in pixels.
 *
 * @throws IllegalArgumentException unless both sides are 1 to [LARGEST_SIDE].
 */
data class Size(val width: Int, val height: Int) {
    init {
        requireSide("width", width)
        requireSide("height", height)
    }

    internal val pixels: Long get() = width.toLong() * height

    internal val chromaSamples: Long get() = halfRoundedUp(width) * halfRoundedUp(height)

    override fun toString() = "$width x $height"

    companion object {
        /** Products of two sides up to this one fit the 32 bits in which the library counts. */
        const val LARGEST_SIDE: Int = 32767

        private fun requireSide(name: String, value: Int) {
            require(value in 1..LARGEST_SIDE) { "$name is $value, must be 1 to $LARGEST_SIDE" }
        }
    }
}

internal fun halfRoundedUp(luma: Int): Long = (luma.toLong() + 1) / 2
