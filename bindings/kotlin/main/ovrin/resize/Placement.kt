// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

/**
 * Where a picture goes in a larger canvas: scaled to the size [picture], its top left pixel at column
 * [x] of row [y].
 *
 * In I420 and NV21, chroma lies at half the position, rounded up: with an odd [x] or [y] it is one
 * pixel further right or down than the luma, and the chroma that then passes the right edge or the
 * end goes to the start of the next row, or is dropped. Choose even positions; [fit] does.
 *
 * @throws IllegalArgumentException unless the picture lies inside the canvas.
 */
class Placement(val canvas: Size, val picture: Size, val x: Int, val y: Int) {
    init {
        require(
            x >= 0 && y >= 0 &&
                x <= canvas.width - picture.width && y <= canvas.height - picture.height,
        ) { "picture of $picture at ($x, $y) does not lie inside the canvas of $canvas" }
    }

    override fun toString() = "$picture at ($x, $y) of $canvas"

    companion object {
        /**
         * The largest place for a picture of the size [source] that keeps its ratio of width and
         * height, in the middle of the canvas, at an even position.
         */
        @JvmStatic
        fun fit(source: Size, canvas: Size): Placement {
            val picture = largest(source, canvas)
            return Placement(
                canvas,
                picture,
                x = (canvas.width - picture.width) / 2 / 2 * 2,
                y = (canvas.height - picture.height) / 2 / 2 * 2,
            )
        }

        private fun largest(source: Size, canvas: Size): Size {
            val sourceIsWider = source.width.toLong() * canvas.height >
                canvas.width.toLong() * source.height
            return if (sourceIsWider) {
                Size(canvas.width, scaled(source.height, canvas.width, source.width))
            } else {
                Size(scaled(source.width, canvas.height, source.height), canvas.height)
            }
        }

        private fun scaled(side: Int, to: Int, from: Int): Int =
            (side.toLong() * to / from).toInt().coerceAtLeast(1)
    }
}
