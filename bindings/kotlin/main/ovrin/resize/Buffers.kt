// SPDX-License-Identifier: Apache-2.0
// What the functions demand of their buffers.
package ovrin.resize

import java.nio.Buffer
import java.nio.ByteBuffer

/** Rows of [row] bytes, [stride] bytes apart. */
internal fun strided(row: Long, rows: Long, stride: Long): Long = (rows - 1) * stride + row

internal fun sourceOf(format: PixelFormat, buffer: ByteBuffer, size: Size): ByteBuffer =
    sourceOf("source", buffer, format.bytes(size)) { format.formula(size) }

internal fun destinationOf(buffer: ByteBuffer, format: PixelFormat, size: Size): ByteBuffer =
    destinationOf(buffer, format.bytes(size)) { format.formula(size) }

internal inline fun destinationOf(
    buffer: ByteBuffer,
    needed: Long,
    formula: () -> String,
): ByteBuffer {
    require(!buffer.isReadOnly) { "destination is read-only" }
    return sourceOf("destination", buffer, needed, formula)
}

/** The buffer from its position to its limit; both are where the native side expects them. */
internal inline fun sourceOf(
    name: String,
    buffer: ByteBuffer,
    needed: Long,
    formula: () -> String,
): ByteBuffer {
    require(buffer.isDirect) { "$name is not a direct buffer" }
    require(buffer.remaining() >= needed) {
        "$name holds ${buffer.remaining()} bytes, $needed needed (${formula()})"
    }
    return buffer.slice()
}

internal fun part(buffer: ByteBuffer, offset: Int, bytes: Int): ByteBuffer {
    val copy = buffer.duplicate()
    // Through the base class: Java 8 and older Android have these methods only there.
    (copy as Buffer).position(offset)
    (copy as Buffer).limit(offset + bytes)
    return copy.slice()
}
