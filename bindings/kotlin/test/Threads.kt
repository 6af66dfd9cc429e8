// SPDX-License-Identifier: Apache-2.0
// Several threads resize at once, from one source into results of their own.
package ovrin.resize.test

import java.nio.ByteBuffer
import java.util.concurrent.Callable
import java.util.concurrent.Executors
import org.junit.Test
import ovrin.resize.Resizer
import ovrin.resize.Size

/** Ten at once. */
class Threads {
    @Test
    fun tenAtOnce() {
        val source = picture(64 * 1100 * 4)
        val size = Size(64, 1100)
        val result = Size(20, 300)
        fun resized(): ByteBuffer {
            val buffer = ByteBuffer.allocateDirect(20 * 300 * 4)
            Resizer.rgba(source, size, buffer, result)
            return buffer
        }
        val expected = resized()
        val pool = Executors.newFixedThreadPool(10)
        try {
            val tasks = List(200) { Callable { resized() == expected } }
            for (future in pool.invokeAll(tasks)) check(future.get()) { "threads gave other bytes" }
        } finally {
            pool.shutdown()
        }
    }
}
