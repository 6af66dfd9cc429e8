// SPDX-License-Identifier: Apache-2.0
// What the native side asks of the system is refused, request by request; and nothing is kept. Needs
// faults.c loaded before all else, in a virtual machine of its own.
package ovrin.resize.test

import java.nio.ByteBuffer
import java.util.concurrent.Callable
import java.util.concurrent.Executors
import org.junit.Assert.assertEquals
import org.junit.Before
import org.junit.Test
import org.junit.runner.RunWith
import org.junit.runners.Parameterized

internal object Faults {
    init {
        System.load(System.getProperty("ovrin.faults"))
    }

    @JvmStatic
    external fun watch(): Int

    @JvmStatic
    external fun refuse(nth: Int, later: Boolean)

    @JvmStatic
    external fun requests(): Int

    @JvmStatic
    external fun refusals(): Int

    @JvmStatic
    external fun liveBlocks(): Int
}

/** Blocks that are kept; a pool that is given up may be released in the background. */
private fun keptBlocks(): Int {
    val end = System.nanoTime() + 60_000_000_000
    while (Faults.liveBlocks() > 0 && System.nanoTime() < end) Thread.sleep(1)
    return Faults.liveBlocks()
}

/** On the calling thread and on several; with sides that are multiples of 4 and others. */
private fun shapes(operation: Operation): List<Numbers> {
    val small = listOf(Numbers(31, 22, 31, 10, 7), Numbers(32, 24, 32, 8, 8))
    val tall = listOf(Numbers(40, 1100, 40, 9, 130), Numbers(20, 30, 20, 9, 1030))
    return (if (operation.slow) small + Numbers(20, 30, 20, 9, 130) else small + tall).map { n ->
        if (!operation.inCanvas) n else n.copy(
            stride = if (operation.strided) n.stride + 4 else n.stride,
            canvasW = n.dstW + 3, canvasH = n.dstH + 5, x = 2, y = 2,
        )
    }
}

private fun sourcesOf(operation: Operation, n: Numbers) = operation.exact(n).map { picture(it.toInt()) }

private fun filled(bytes: Int): ByteBuffer {
    val buffer = ByteBuffer.allocateDirect(bytes)
    for (i in 0 until bytes) buffer.put(i, 0x5A)
    return buffer
}

/**
 * Without memory the bilinear engine does not halve, or blends where its threads would not; and Lanczos
 * rows for which a thread finds none are left 0, its full chroma as it was, without a word.
 */
private fun mayDiffer(operation: Operation, n: Numbers) =
    operation.name.startsWith("threaded_") || operation.name.startsWith("halving_") ||
        operation.name == "lanczos" && n.dstH >= 48 || operation.name == "lanczosFullChroma"

@RunWith(Parameterized::class)
class Memory(private val way: Way) {
    @Before
    fun watch() {
        way.call(sourcesOf(way.operation, shapes(way.operation)[0]), filled(
            way.operation.result(shapes(way.operation)[0]).toInt(),
        ), shapes(way.operation)[0])
        check(Faults.watch() >= 2) { "not all of our libraries are loaded" }
        Faults.refuse(0, false)
    }

    private fun refuseEach(n: Numbers): Int {
        val sources = sourcesOf(way.operation, n)
        val bytes = way.operation.result(n).toInt()
        val untouched = filled(bytes)
        val expected = filled(bytes)
        way.call(sources, expected, n)
        var errors = 0
        for (later in listOf(false, true)) {
            var nth = 0
            do {
                val result = filled(bytes)
                Faults.refuse(++nth, later)
                val whole = try {
                    way.call(sources, result, n)
                    true
                } catch (e: OutOfMemoryError) {
                    check("no memory" in e.message!!) { "${e.message}" }
                    errors++
                    false
                }
                val refused = Faults.refusals() > 0
                Faults.refuse(0, false)
                if (!(whole && mayDiffer(way.operation, n))) {
                    check(result == (if (whole) expected else untouched)) { "$n, request $nth" }
                }
                assertEquals("blocks kept, $n, request $nth", 0, keptBlocks())
            } while (refused)
        }
        return errors
    }

    @Test
    fun refusedOneByOne() {
        val errors = shapes(way.operation).sumOf { refuseEach(it) }
        val needsNone = way.operation.name in listOf("rgba", "rgb", "nearest", "rgbaInCanvas")
        check((errors == 0) == needsNone) { "$errors errors" }
    }

    companion object {
        @JvmStatic
        @Parameterized.Parameters(name = "{0}")
        fun parameters() = ways
    }
}

class MemoryOfThreads {
    @Test
    fun tenThreadsKeepNothing() {
        val tasks = ways.map { way ->
            Callable {
                val n = shapes(way.operation)[0]
                val result = filled(way.operation.result(n).toInt())
                val sources = sourcesOf(way.operation, n)
                repeat(20) { way.call(sources, result, n) }
            }
        }
        ways.forEach { way ->
            val n = shapes(way.operation)[0]
            way.call(sourcesOf(way.operation, n), filled(way.operation.result(n).toInt()), n)
        }
        check(Faults.watch() >= 2) { "not all of our libraries are loaded" }
        Faults.refuse(0, false)
        val pool = Executors.newFixedThreadPool(10)
        try {
            for (future in pool.invokeAll(tasks)) future.get()
        } finally {
            pool.shutdown()
        }
        check(Faults.requests() > 1000) { "only ${Faults.requests()} requests were seen" }
        assertEquals(0, keptBlocks())
        println("${Faults.requests()} requests of ten threads, all given back")
    }
}
