// SPDX-License-Identifier: Apache-2.0
// The binding gives the bytes that a program in C gets from the library.
package ovrin.resize.test

import java.io.File
import java.nio.ByteBuffer
import org.junit.Assert.assertEquals
import org.junit.Test
import org.junit.runner.RunWith
import org.junit.runners.Parameterized

private fun hashOf(buffer: ByteBuffer): String {
    var hash = -0x340d631b7bdddcdbL
    for (i in 0 until buffer.capacity()) {
        hash = (hash xor (buffer.get(i).toLong() and 0xFF)) * 0x100000001B3L
    }
    return String.format("%016x", hash)
}

/** The planes lie in one buffer, each behind the other with the stride's row length. */
private fun sourcesOf(operation: Operation, n: Numbers): List<ByteBuffer> {
    val all = picture(4 * n.stride * (n.srcH + 2) + 64)
    val luma = n.stride * n.srcH
    val chroma = (half(n.stride) * half(n.srcH)).toInt()
    return when (operation.sources.size) {
        1 -> listOf(all)
        2 -> listOf(all, all.part(luma, all.capacity() - luma))
        else -> listOf(
            all, all.part(luma, chroma), all.part(luma + chroma, all.capacity() - luma - chroma),
        )
    }
}

private fun resultOf(
    operation: Operation,
    n: Numbers,
    call: (List<ByteBuffer>, ByteBuffer, Numbers) -> Unit,
): String {
    val result = ByteBuffer.allocateDirect(operation.result(n).toInt())
    for (i in 0 until result.capacity()) result.put(i, 0x5A)
    call(sourcesOf(operation, n), result, n)
    return hashOf(result)
}

private val lines = File(System.getProperty("ovrin.expected")).readLines()

@RunWith(Parameterized::class)
class KnownResults(private val line: String) {
    @Test
    fun bytesAreThoseOfC() {
        val words = line.split(" ")
        val operation = operations.first { it.name == words[0] }
        val v = words.subList(1, 10).map { it.toInt() }
        val n = Numbers(v[0], v[1], v[2], v[3], v[4], v[5], v[6], v[7], v[8])
        assertEquals(words[10], resultOf(operation, n, operation.safe))
        operation.raw?.let { raw -> assertEquals(words[10], resultOf(operation, n, raw)) }
    }

    companion object {
        @JvmStatic
        @Parameterized.Parameters(name = "{0}")
        fun parameters() = lines
    }
}

class KnownFunctions {
    /** Numbers of components other than 2 differ from it in nothing but the number. */
    @Test
    fun everyFunctionHasKnownResults() {
        val seen = lines.map { it.substringBefore(' ') }.toSet()
        val names = operations.filter { !it.isFrame }.map { it.name }
        assertEquals(listOf<String>(), names.filter { it !in seen && "components_" !in it })
    }
}
