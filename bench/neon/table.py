#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Prints the table of ./dev count.

Instructions and bytes were counted. Cycles are what llvm-mca takes for the instructions in the
order in which they were executed: with all data in the first-level cache, branches foreseen, and
loads and stores that never overlap.
"""

import argparse
import collections
import concurrent.futures
import fractions
import math
import pathlib
import re
import subprocess

import even_out

LLVM = "19"
# The Neoverse N1 is the Cortex-A76 of servers, the V2 the Cortex-X3.
PROCESSORS = ["cortex-a55", "neoverse-n1", "neoverse-v2"]
SIMPLE_RATIOS = {fractions.Fraction(s) for s in ("2", "3", "4", "3/2", "2/3")}


class Call:
    """One call: who made it, what for, and what was executed."""

    def __init__(self, path, case, contender, pixels, kind):
        self.case, self.contender, self.pixels = case, contender, int(pixels)
        self.blends = kind == "blends"
        self.blocks = []
        for line in path.read_text().splitlines():
            name, *values = line.split()
            if name == "block":
                self.blocks.append((int(values[0]), values[1:]))
            elif name == "sequence":
                self.sequence = [self.blocks[int(number)][1] for number in values]
            else:
                setattr(self, name, int(values[0]))
        self.instructions = sum(runs * len(words) for runs, words in self.blocks)
        self.cycles = {}

    def model(self, texts):
        sequence = [texts[word] for words in self.sequence for word in words]
        assembly = "\n".join(even_out.even_out(sequence))
        for processor in PROCESSORS:
            self.cycles[processor] = (
                modelled_cycles(assembly, processor) * self.instructions / len(sequence))

    def cost(self, what):
        return getattr(self, what) if hasattr(self, what) else self.cycles[what]

    def per_pixel(self, what):
        return self.cost(what) / self.pixels


def read_calls(directory):
    """The calls of one run of the program, in their order."""
    lines = (directory / "calls.txt").read_text().splitlines()
    return [Call(directory / f"count.{number}", *rest)
            for number, *rest in (line.split("\t") for line in lines)]


def as_jump(instruction):
    """Calls and returns as jumps: llvm-mca would add a fixed 100 cycles."""
    operation, _, operands = instruction.partition(" ")
    return {"bl": "b #4", "blr": "br " + operands, "ret": "br x30", "svc": "nop"}.get(
        operation, instruction)


def disassemble(calls):
    """The text of every instruction word that a call has executed."""
    words = sorted({word for call in calls for _, block in call.blocks for word in block})
    bytes_of = [int(word, 16).to_bytes(4, "little") for word in words]
    source = "\n".join(" ".join(hex(byte) for byte in four) for four in bytes_of)
    output = subprocess.run(
        ["llvm-mc-" + LLVM, "--disassemble", "--triple=aarch64", "--mattr=+all",
         "--output-asm-variant=0"], input=source, text=True, capture_output=True, check=True).stdout
    lines = [" ".join(line.split()) for line in output.splitlines()]
    instructions = [line for line in lines if line and not line.startswith(".")]
    assert len(instructions) == len(words)
    return dict(zip(words, map(as_jump, instructions)))


def modelled_cycles(assembly, processor):
    output = subprocess.run(
        ["llvm-mca-" + LLVM, "-mtriple=aarch64", "-mcpu=" + processor, "-mattr=+all",
         "-iterations=1", "-instruction-info=0", "-resource-pressure=0"],
        input=assembly, text=True, capture_output=True, check=True).stdout
    return int(re.search(r"Total Cycles:\s+(\d+)", output)[1])


def gains_over(peers, ours):
    """What the best of the peers needs, as multiples of what we need."""
    return [min(peer.cost(what) for peer in peers) / ours.cost(what)
            for what in ("instructions", *PROCESSORS)]


def print_table(rows, texts):
    """The first row is the head; so many columns are texts, the others numbers."""
    widths = [max(map(len, column)) for column in zip(*rows)]
    rule = ["-" * width if i < texts else "-" * (width - 1) + ":" for i, width in enumerate(widths)]
    for row in [rows[0], rule, *rows[1:]]:
        cells = [cell.ljust(width) if i < texts else cell.rjust(width)
                 for i, (cell, width) in enumerate(zip(row, widths))]
        print("| " + " | ".join(cells) + " |")


def row_of(ours, best, gains):
    """A call of ours by every compiler, the best peer's, and what is gained over the peers."""
    call = ours[0]
    return [call.case, best.contender,
            *(two_places(other.per_pixel("instructions")) for other in ours), bytes_cell(call),
            *(two_places(call.per_pixel(processor)) for processor in PROCESSORS),
            two_places(best.per_pixel("instructions")), bytes_cell(best), *map(two_places, gains)]


def print_calls(runs, peers):
    """Ours are the first of the runs; of the others, instructions alone. Cases in which a peer
    copies single samples do not count for the means: no peer that is left was made for them."""
    short = [processor.partition("-")[2].upper() for processor in PROCESSORS]
    gained = ["x insn", *("x " + name for name in short)]
    rows = [["case", "peer", *runs, "bytes", *short, "insn", "bytes", *gained]]
    copiers = [["copies single samples", *gained]]
    gains = collections.defaultdict(list)
    for ours in zip(*runs.values()):
        call = ours[0]
        rivals = [peer for peer in peers if peer.case == call.case and peer.blends]
        copying = [peer for peer in peers if peer.case == call.case and not peer.blends]
        best = min(rivals, key=lambda peer: peer.instructions)
        rows.append(row_of(ours, best, gains_over(rivals, call)))
        copiers += [[f"{peer.contender} in {peer.case}",
                     *map(two_places, gains_over([peer], call))] for peer in copying]
        if not copying:
            gains[kind_of(call.case)].append(gains_over(rivals, call))
    means = [[kind, *map(geometric_mean, zip(*all_gains))] for kind, all_gains in gains.items()]
    print_table(rows, 2)
    print()
    print_table([["geometric means", *gained], *means], 1)
    if len(copiers) > 1:
        print()
        print_table(copiers, 1)


def two_places(number):
    return f"{number:.2f}"


def geometric_mean(numbers):
    return two_places(math.exp(sum(map(math.log, numbers)) / len(numbers)))


def bytes_cell(call):
    return f"{call.per_pixel('loaded'):.1f} + {call.per_pixel('stored'):.1f}"


def kind_of(case):
    engine = re.match("bilinear|Lanczos", case)
    if engine:
        return engine[0]
    source, destination = map(int, re.search(r"(\d+)x\d+ to (\d+)x", case).groups())
    simple = fractions.Fraction(source, destination) in SIMPLE_RATIOS
    return "simple ratios" if simple else "other ratios"


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("peers", type=pathlib.Path, help="directory with their calls")
    parser.add_argument("ours", type=pathlib.Path, nargs="+",
                        help="directories with ours, named for the compilers")
    options = parser.parse_args()
    peers = read_calls(options.peers)
    runs = {directory.name.replace('-', ' '): read_calls(directory) for directory in options.ours}
    modelled = peers + next(iter(runs.values()))
    texts = disassemble(modelled)
    with concurrent.futures.ThreadPoolExecutor() as pool:
        list(pool.map(lambda call: call.model(texts), modelled))
    print_calls(runs, peers)


if __name__ == "__main__":
    main()
