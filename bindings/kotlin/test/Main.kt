// SPDX-License-Identifier: Apache-2.0
// Arguments: the file with the known results, the number of random calls, the seed.
package ovrin.resize.test

import java.io.File

fun main(arguments: Array<String>) {
    println(testKnownResults(File(arguments[0])))
    println(testRefusals())
    println(FromJava.run())
    println(testThreads())
    println(testRandomCalls(arguments[1].toInt(), arguments[2].toLong()))
    println("all passed, $checks checks")
}
