// SPDX-License-Identifier: Apache-2.0
package ovrin.resize

/** How the bilinear engine goes about it. */
enum class BilinearMode {
    /** Blends four pixels of the source for each of the result, on the calling thread. */
    BLENDED,

    /**
     * As [BLENDED] for results of less than 1024 rows. Taller ones are made by several threads,
     * which do not blend: they take one pixel of the source for each of the result.
     */
    THREADED,

    /**
     * As [THREADED], but a picture that shrinks to a quarter or less in both directions is halved
     * first, repeatedly, so that more of its pixels count.
     */
    HALVING,
}

/**
 * How far the bilinear engine reads. It blends each pixel with its right and lower neighbours, also
 * where there are none: behind the source it reads up to a row and a pixel. Reductions mostly stay
 * inside the picture; which ones do depends on where exactly the engine samples, and that is what is
 * computed here.
 */
internal object BilinearReach {
    fun sourceBytes(source: Size, result: Size, format: PixelFormat, mode: BilinearMode): Long {
        val direct = onePass(source, result, format)
        val halves = mode == BilinearMode.HALVING &&
            source.width / result.width >= 4 && source.height / result.height >= 4
        if (!halves) return direct
        // Without memory for halving, the engine does it directly.
        return maxOf(direct, onePass(source, Size(source.width / 2, source.height / 2), format))
    }

    private fun onePass(source: Size, result: Size, format: PixelFormat): Long {
        val columns = Axis(source.width, result.width)
        val rows = Axis(source.height, result.height)
        val luma = Plane(source.width.toLong(), source.width.toLong(), 1, 0).samples(columns, rows)
        val pitch = halfRoundedUp(source.width)
        val read = when (format) {
            PixelFormat.RGBA8888 -> 4 * luma
            PixelFormat.I420 -> {
                val chroma = Plane(pitch, source.width.toLong(), 2, 1).samples(columns, rows)
                maxOf(luma, source.pixels + source.chromaSamples + chroma)
            }
            PixelFormat.NV21 -> {
                val chroma = Plane(pitch, pitch, 2, 0).samples(columns, rows)
                maxOf(luma, source.pixels + 2 * chroma)
            }
            PixelFormat.RGB888 ->
                throw IllegalArgumentException("the bilinear engine does not take RGB888")
        }
        return maxOf(format.bytes(source), read)
    }

    /** Where one axis is sampled; in single precision, as the engine does it. Never decreases. */
    private class Axis(private val source: Int, private val result: Int) {
        private val scale = source.toFloat() / result.toFloat()

        /**
         * The first sample of the result that is not blended along this axis: one that lies exactly
         * on the last but one of the source. [result] when there is none.
         */
        private val edge: Int = firstNotBelow(source - 2).let {
            if (it < result && at(it) == source - 2) it else result
        }

        val hasBlended: Boolean get() = edge > 0

        fun at(sample: Int): Int = (sample.toFloat() * scale).toInt()

        /** The last sample, of every one ([step] 1) or of every second one as in chroma. */
        fun last(step: Int): Int = (result - 1) / step * step

        fun lastBlended(step: Int): Int = (edge - 1) / step * step

        fun hasEdge(step: Int): Boolean = last(step) >= edge

        private fun firstNotBelow(position: Int): Int {
            var begin = 0
            var end = result
            while (begin < end) {
                val middle = (begin + end) / 2
                if (at(middle) >= position) end = middle else begin = middle + 1
            }
            return begin
        }
    }

    /**
     * A plane whose rows are [pitch] samples apart; in the columns at the edge the lower sample lies
     * [edgePitch] behind the upper one. [roundUp] is 1 when the chroma of an odd column lies to its
     * right.
     */
    private class Plane(
        private val pitch: Long,
        private val edgePitch: Long,
        private val step: Int,
        private val roundUp: Int,
    ) {
        /** The samples up to the last that is read. */
        fun samples(columns: Axis, rows: Axis): Long {
            var samples = 0L
            if (rows.hasBlended) {
                val row = rowStart(rows, rows.lastBlended(step))
                if (columns.hasBlended) {
                    samples = row + pitch + column(columns, columns.lastBlended(step)) + 2
                }
                if (columns.hasEdge(step)) {
                    samples =
                        maxOf(samples, row + edgePitch + column(columns, columns.last(step)) + 1)
                }
            }
            if (rows.hasEdge(step)) {
                val row = rowStart(rows, rows.last(step))
                samples = maxOf(samples, row + column(columns, columns.last(step)) + 2)
            }
            return samples
        }

        private fun rowStart(rows: Axis, sample: Int): Long = rows.at(sample) / step * pitch

        private fun column(columns: Axis, sample: Int): Long =
            ((columns.at(sample) + roundUp) / step).toLong()
    }
}
