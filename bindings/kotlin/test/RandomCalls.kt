// SPDX-License-Identifier: Apache-2.0
// Right and wrong calls mixed: each ends as it must, and no byte outside the result changes.
package ovrin.resize.test

import java.nio.ByteBuffer
import java.util.Random
import org.junit.Test

private const val ARENA = 1 shl 20
private const val MARGIN = 64
private const val PATTERN: Byte = 0x5A

private enum class Outcome { ACCEPTED, REFUSED }

private class Caller(seed: Long) {
    private val random = Random(seed)
    private val sources = List(3) { picture(ARENA) }
    private val results: ByteBuffer = ByteBuffer.allocateDirect(ARENA)
    private val counts = mutableMapOf<Outcome, Int>()

    fun count(outcome: Outcome) = counts.getOrDefault(outcome, 0)

    private fun below(bound: Int) = random.nextInt(bound)

    private fun oneIn(n: Int) = below(n) == 0

    private fun side(operation: Operation): Int = when {
        oneIn(300) -> listOf(0, -1, -70, Int.MIN_VALUE, Int.MAX_VALUE, 32767, 32768, 65536).random()
        operation.slow -> 1 + below(12)
        oneIn(400) -> 1000 + below(200)
        else -> 1 + below(40)
    }

    private fun <T> List<T>.random(): T = this[below(size)]

    private fun numbers(operation: Operation): Numbers {
        val srcW = side(operation)
        val dstW = side(operation)
        val dstH = side(operation)
        var n = Numbers(srcW, side(operation), srcW, dstW, dstH)
        if (operation.strided) {
            n = n.copy(stride = if (oneIn(50)) below(1 shl 20) - 1000 else srcW + below(9))
        }
        if (operation.inCanvas) {
            n = n.copy(
                canvasW = dstW + below(20), canvasH = dstH + below(20),
                x = below(22) - 1 - below(4), y = below(22) - 1 - below(4),
            )
        }
        return n
    }

    /** Mostly what is needed, sometimes a little more, less, or something else. */
    private fun bytesFor(needed: Long): Int {
        val bytes = when (below(40)) {
            0 -> needed - 1
            1 -> needed - 1 - below(50)
            2 -> below(4000).toLong()
            3, 4, 5 -> needed + below(100)
            else -> needed
        }
        return bytes.coerceIn(0L, (ARENA - 3L * MARGIN)).toInt()
    }

    private class Chosen(val buffer: ByteBuffer, val fits: Boolean)

    private fun choose(arena: ByteBuffer, offset: Int, needed: Long, surely: Long): Chosen {
        val bytes = bytesFor(surely)
        val direct = !oneIn(200)
        val buffer = if (direct) arena.part(offset, bytes) else ByteBuffer.allocate(bytes)
        return Chosen(buffer, direct && bytes >= needed)
    }

    private fun offset(alignment: Int) =
        MARGIN + if (alignment > 1 && !oneIn(100)) 4 * below(8) else below(32)

    fun call() {
        val operation = operations.random()
        val native = operation.raw?.takeIf { oneIn(2) }
        val n = numbers(operation)
        val numbersFit = n.areValid()
        // Of wrong numbers nothing can be said but that they are refused.
        val exact = if (numbersFit) operation.exact(n) else operation.sources.map { 100L }
        val srcOffset = offset(operation.srcAlignment)
        val from = exact.mapIndexed { i, bytes -> choose(sources[i], srcOffset, bytes, bytes) }
        val needed = if (numbersFit) operation.result(n) else 100L
        val dstOffset = offset(operation.dstAlignment)
        val to = choose(results, dstOffset, needed, needed)
        val readOnly = oneIn(200)
        val result = if (readOnly) to.buffer.asReadOnlyBuffer() else to.buffer
        val expected = numbersFit && to.fits && from.all { it.fits } && !readOnly &&
            dstOffset % operation.dstAlignment == 0 && srcOffset % operation.srcAlignment == 0
        val written = if (expected) needed.toInt() else 0
        fillAround(dstOffset, written)
        val outcome = try {
            (native ?: operation.safe)(from.map { it.buffer }, result, n)
            Outcome.ACCEPTED
        } catch (e: IllegalArgumentException) {
            Outcome.REFUSED
        }
        counts[outcome] = count(outcome) + 1
        val side = if (native != null) "raw" else "safe"
        check((outcome == Outcome.ACCEPTED) == expected) { "$outcome: $operation, $side, $n" }
        checkAround(dstOffset, written) { "$operation, $side, $n" }
    }

    private fun fillAround(offset: Int, written: Int) {
        for (i in offset - MARGIN until offset) results.put(i, PATTERN)
        for (i in offset + written until offset + written + MARGIN) results.put(i, PATTERN)
    }

    private fun checkAround(offset: Int, written: Int, describe: () -> String) {
        for (i in offset - MARGIN until offset) checkByte(i, describe)
        for (i in offset + written until offset + written + MARGIN) checkByte(i, describe)
    }

    private fun checkByte(i: Int, describe: () -> String) {
        if (results.get(i) != PATTERN) throw AssertionError("byte $i was written: ${describe()}")
    }

    fun checkSources() {
        val expected = picture(ARENA)
        for (source in sources) check(source == expected) { "a source was written" }
    }
}

class RandomCalls {
    @Test
    fun endAsTheyMust() {
        val calls = Integer.getInteger("ovrin.calls")
        val seed = java.lang.Long.getLong("ovrin.seed")
        val caller = Caller(seed)
        try {
            repeat(calls) { caller.call() }
            caller.checkSources()
        } catch (e: AssertionError) {
            throw AssertionError("${e.message} (seed $seed)", e)
        }
        val accepted = caller.count(Outcome.ACCEPTED)
        val refused = caller.count(Outcome.REFUSED)
        println("$accepted of $calls random calls accepted, $refused refused")
        check(accepted > calls / 2) { "only $accepted of $calls accepted" }
        check(refused > calls / 20) { "only $refused of $calls refused" }
    }
}
