// SPDX-License-Identifier: Apache-2.0
package ovrin.resize.test

import java.nio.Buffer
import java.nio.ByteBuffer

fun check(condition: Boolean, message: () -> String) {
    if (!condition) throw AssertionError(message())
}

/** The message of the IllegalArgumentException that [call] must throw. */
inline fun refused(what: String, call: () -> Unit): String {
    val message = try {
        call()
        null
    } catch (e: IllegalArgumentException) {
        e.message ?: ""
    }
    check(message != null) { "accepted: $what" }
    return message!!
}

fun refusedSaying(what: String, text: String, call: () -> Unit) {
    val message = refused(what, call)
    check(text in message) { "$what: '$message' does not say '$text'" }
}

/** [bytes] bytes from [offset] on. */
fun ByteBuffer.part(offset: Int, bytes: Int): ByteBuffer {
    val copy = duplicate()
    (copy as Buffer).position(offset)
    (copy as Buffer).limit(offset + bytes)
    return copy.slice()
}

/** A slope with noise on it, the same as in expected.c. */
fun picture(bytes: Int): ByteBuffer {
    val buffer = ByteBuffer.allocateDirect(bytes)
    var noise = 1
    for (i in 0 until bytes) {
        noise = noise * 1664525 + 1013904223
        buffer.put(i, (i / 5 + (noise ushr 27)).toByte())
    }
    return buffer
}
