#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Writes loads and stores of vectors in one way, so that they cost what they are, not how a
compiler wrote them. Reads and prints assembly.

LLVM's models set different costs for one and the same access: on the A55 an ldr of 16 bytes takes
one cycle, an ld1 two, as the processor's path of 64 bits does, and an ldp six for twice as much; on
the N1 an str costs twice as much as an st1. So all of them become ld1 and st1, one vector each.

LLVM's N1 takes half a cycle for a multiplication of vectors of 32 bits by one element, and two for
one by a vector; the processor takes two for both. So all become the latter.

And a load into one lane waits as long for the register's other lanes as for its address. Processors
load first and then insert, so that is what such a load becomes.
"""

import collections
import re
import sys

WHOLE = re.compile(
    r"(ld|st)(?:r|ur|p|np) q(\d+)(?:, q(\d+))?, \[(\w+)(?:, ([wx]\d+))?[^]]*\](!|, .*)?$")
LANE = re.compile(r"ld[1-4] {(.*)}\[(\d+)\], \[(\w+)\](, .*)?$")
BY_ELEMENT = re.compile(r"((?:mul|mla|mls|sqr?dmulh) v\d+\.(4s|8h), v\d+\.\w+, v\d+)\.[sh]\[\d+\]$")
PREFETCH_BELOW = re.compile(r"prfm (.*, #?-\d+\])$")
LANE_BYTES = {"b": 1, "h": 2, "s": 4, "d": 8}
LOAD_OF = {1: "b", 2: "h", 4: "s", 8: "d"}


def whole_vectors(found):
    kind, first, second, base, offset, moves = found.groups()
    # What was added last decides when the address is known.
    address = "x" + offset[1:] if offset else base
    lines = [f"{kind}1 {{ v{v}.16b }}, [{address}]" for v in (first, second) if v]
    if moves:
        lines[-1] += ", #16"
    return lines


def lanes(found, spare):
    registers, lane, base, moves = found.groups()
    parts = re.findall(r"v(\d+)\.([bhsd])", registers)
    kind = parts[0][1]
    size = LANE_BYTES[kind] * len(parts)
    lines = [f"ldr {LOAD_OF.get(size, 'q')}{spare}, [{base}]" + (f", #{size}" if moves else "")]
    for i, (register, _) in enumerate(parts):
        lines.append(f"mov v{register}.{kind}[{lane}], v{spare}.{kind}[{i}]")
    return lines


def spare_register(lines):
    """The vector register that the lines name least often."""
    uses = collections.Counter(int(r) for line in lines for r in re.findall(r"\b[vqdshb](\d+)\b", line))
    return min(range(32), key=lambda register: uses[register])


def even_out(lines):
    """The lines of some assembly, instructions written with single spaces."""
    spare = spare_register(lines)
    for line in lines:
        if found := WHOLE.match(line):
            yield from whole_vectors(found)
        elif found := LANE.match(line):
            yield from lanes(found, spare)
        elif found := BY_ELEMENT.match(line):
            yield f"{found[1]}.{found[2]}"
        elif found := PREFETCH_BELOW.match(line):
            # g++ leaves it to its assembler to say so.
            yield "prfum " + found[1]
        else:
            yield line


if __name__ == "__main__":
    for evened in even_out([" ".join(line.split()) for line in sys.stdin]):
        print(evened)
