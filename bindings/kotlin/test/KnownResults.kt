// SPDX-License-Identifier: Apache-2.0
// The binding gives the bytes that a program in C gets from the library.
package ovrin.resize.test

import java.io.File
import java.nio.ByteBuffer

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

fun testKnownResults(file: File): String {
    val byName = operations.associateBy { it.name }
    val seen = mutableSetOf<String>()
    val lines = file.readLines()
    for (line in lines) {
        val words = line.split(" ")
        val operation = byName.getValue(words[0])
        val v = words.subList(1, 10).map { it.toInt() }
        val n = Numbers(v[0], v[1], v[2], v[3], v[4], v[5], v[6], v[7], v[8])
        check(resultOf(operation, n, operation.safe) == words[10]) { "other bytes: $line" }
        operation.raw?.let { raw ->
            check(resultOf(operation, n, raw) == words[10]) { "other bytes, natively: $line" }
        }
        seen += operation.name
    }
    // Numbers of components other than 2 differ from it in nothing but the number.
    val missing = operations.map { it.name }.filter { it !in seen && "components_" !in it }
    check(missing.isEmpty()) { "no result known of $missing" }
    return "${lines.size} pictures as from C, ${seen.size} functions"
}
