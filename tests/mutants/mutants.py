#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Mutation testing: changes one operator, number or statement of src/ at a time and runs the tests.

A mutant that does not compile, or compiles to the same code, is left out. One is killed when a test
goes red, crashes or hangs; one that no test kills shows what no test looks at. Sources are changed
in a copy below the build folder.

  mutants.py FOLDER random COUNT [--seed N] [--only PATH]   some, evenly over the files
  mutants.py FOLDER listed FILE                             those of a list; all must be killed
"""

import argparse
import dataclasses
import hashlib
import json
import os
import pathlib
import random
import re
import resource
import shutil
import signal
import subprocess
import sys
import time

PROJECT = pathlib.Path(__file__).resolve().parents[2]
COPIED = ["CMakeLists.txt", "CMakePresets.json", "LICENSE", "README.md", "bindings", "cmake", "docs",
          "examples", "include", "src", "tests"]
# What this machine does not compile.
FOREIGN = re.compile(r"_neon\.|_wasm\.|pool_without_threads|exact_fma")

# ---- Mutations -------------------------------------------------------------------------------

SWAPS = {"+": ["-"], "-": ["+"], "*": ["/", "+"], "/": ["*"], "%": ["/"],
         "<": ["<=", ">="], "<=": ["<", ">"], ">": [">=", "<="], ">=": [">", "<"],
         "==": ["!="], "!=": ["=="], "&&": ["||"], "||": ["&&"], "<<": [">>"], ">>": ["<<"],
         "+=": ["-=", "="], "-=": ["+=", "="], "*=": ["/="], "/=": ["*="],
         "++": ["--"], "--": ["++"], "&": ["|"], "|": ["&"], "|=": ["&="], "&=": ["|="],
         "true": ["false"], "false": ["true"],
         "__ATOMIC_ACQUIRE": ["__ATOMIC_RELAXED"], "__ATOMIC_RELEASE": ["__ATOMIC_RELAXED"]}
# The layout tells binary operators, which have spaces on both sides, from pointers and templates.
TOKEN = re.compile(r"""
    (?P<skip> //[^\n]* | /\*.*?\*/ | "(?:\\.|[^"\\])*" | ^[ \t]*\#(?:\\\n|[^\n])* )
  | (?P<number> (?<![\w.]) \d+ (?![\w.']) )
  | (?P<word> \w+ )
  | (?P<operator> (?<=\ ) (?: [-+*/%&|<>=!]= | && | \|\| | << | >> | [-+*/%<>&|] ) (?=\s)
                | \+\+ | -- )
""", re.VERBOSE | re.DOTALL | re.MULTILINE)
# A whole line that is a call, an assignment or a jump.
STATEMENT = re.compile(r"^[ ]+(?!return\b|using\b|static_assert\b|const\b|constexpr\b|struct\b)"
                       r"(?:[\w.>:*\[\]-]+ ?(?:\(.*\)|[-+*/|&]?= [^;{]*)|\+\+[\w.>-]+|break|continue);$",
                       re.MULTILINE)
CONDITION = re.compile(r"^[ ]*(?:\} else )?(?:if|while) \((.*?)\) (?=\{$|return|continue|break)",
                       re.MULTILINE)


@dataclasses.dataclass(frozen=True)
class Mutant:
    path: str
    start: int
    end: int
    text: str

    def apply(self, source):
        return source[:self.start] + self.text + source[self.end:]

    def lines(self, source):
        """The line that changes, before and after."""
        begin = source.rfind("\n", 0, self.start) + 1
        end = source.find("\n", self.end)
        return source[begin:end], source[begin:self.start] + self.text + source[self.end:end]

    def describe(self, source):
        before, after = self.lines(source)
        number = source.count("\n", 0, self.start) + 1
        return f"{self.path}:{number}\n    - {before.strip()}\n    + {after.strip() or '(nothing)'}"


def mutants_of(path, source):
    found = []
    skipped = []
    for match in TOKEN.finditer(source):
        token = match.group()
        span = match.span()
        if match.lastgroup == "skip":
            skipped.append(span)
        elif match.lastgroup == "number":
            found += [Mutant(path, *span, str(n)) for n in (int(token) + 1, int(token) - 1) if n >= 0]
        else:
            found += [Mutant(path, *span, swap) for swap in SWAPS.get(token, [])]
    for match in STATEMENT.finditer(source):
        found.append(Mutant(path, *match.span(), ""))
    for match in CONDITION.finditer(source):
        found.append(Mutant(path, *match.span(1), f"!({match.group(1)})"))
    return [m for m in found if not any(a <= m.start < b for a, b in skipped)]


def random_mutants(sources, count, seed, only):
    """One of each file in turn, in a random order."""
    chance = random.Random(seed)
    pools = [mutants_of(path, source) for path, source in sorted(sources.items()) if only in path]
    for pool in pools:
        chance.shuffle(pool)
    chance.shuffle(pools)
    chosen = []
    while len(chosen) < count and any(pools):
        chosen += [pool.pop() for pool in pools if pool]
    return chosen[:count]


def listed_mutants(sources, lines):
    """A list has three lines for each: the file, the line before and the line after."""
    entries = [line.rstrip("\n") for line in lines if line.strip() and not line.startswith("#")]
    chosen = []
    for path, before, after in zip(entries[0::3], entries[1::3], entries[2::3]):
        source = sources.get(path, "")
        if source.count(before[2:]) != 1:
            sys.exit(f"{path} does not have this line once; mend the list:\n  {before}")
        start = source.index(before[2:])
        chosen.append(Mutant(path, start, start + len(before) - 2, after[2:]))
    return chosen

# ---- Building and testing --------------------------------------------------------------------

class Build:
    def __init__(self, folder):
        self.tree = folder / "tree"
        self.build = folder / "build"
        self.log = open(folder / "build.log", "w", encoding="utf-8")
        self.environment = {**os.environ, "CCACHE_DIR": str(folder / "ccache"),
                            "CCACHE_NOHASHDIR": "1", "GTEST_FAIL_FAST": "1"}
        for name in COPIED:
            copy(PROJECT / name, self.tree / name)
        self.run(["cmake", "-G", "Ninja", "-S", self.tree, "-B", self.build,
                  "-DCMAKE_BUILD_TYPE=Release", "-DOVRINRESIZE_BUILD_TESTS=ON",
                  "-DCMAKE_CXX_COMPILER_LAUNCHER=ccache"], check=True)
        self.ninja([], check=True)
        self.original_code = self.code()
        self.tests = self.find_tests()
        self.seconds = {}
        self.kills = {}

    def run(self, command, check=False):
        return subprocess.run([str(part) for part in command], env=self.environment, check=check,
                              stdin=subprocess.DEVNULL, stdout=self.log, stderr=self.log).returncode == 0

    def ninja(self, targets, check=False):
        return self.run(["ninja", "-C", self.build, "-j", str(os.cpu_count() or 2), *targets], check)

    def code(self):
        """The object files of the library, by their contents."""
        objects = self.build / "CMakeFiles" / "ovrinresize_objects.dir"
        return {path: hashlib.sha256(path.read_bytes()).digest() for path in objects.rglob("*.o")}

    def find_tests(self):
        """Commands by target, each program whole."""
        listing = subprocess.run(["ctest", "--test-dir", self.build, "--show-only=json-v1"],
                                 check=True, capture_output=True, env=self.environment).stdout
        tests = {}
        for test in json.loads(listing)["tests"]:
            command = [part for part in test.get("command", []) if not part.startswith("--gtest")]
            program = pathlib.Path(command[0]) if command else None
            if program is None or self.build not in program.parents:
                continue
            tests[" ".join([program.name, *(pathlib.Path(c).name for c in command[1:])])] = command
        return tests

    def passes(self, name, divisor):
        environment = {**self.environment, "OVRIN_TEST_DIVISOR": str(divisor)}
        limit = 30 + 10 * self.seconds.get((name, divisor), 60)
        start = time.monotonic()
        test = subprocess.Popen(self.tests[name], env=environment, cwd=self.build,
                                stdin=subprocess.DEVNULL, stdout=self.log, stderr=self.log,
                                start_new_session=True, preexec_fn=set_limits)
        try:
            outcome = test.wait(limit)
        except subprocess.TimeoutExpired:
            os.killpg(test.pid, signal.SIGKILL)
            test.wait()
            return False
        self.seconds.setdefault((name, divisor), time.monotonic() - start)
        return outcome == 0

    def order(self, path):
        """Those that have killed mutants of this file or folder come first, then quick ones."""
        def rank(name):
            file_kills = self.kills.get((name, path), 0)
            folder_kills = self.kills.get((name, os.path.dirname(path)), 0)
            return (-file_kills, -folder_kills, self.seconds.get((name, 20), 0))
        return sorted(self.tests, key=rank)

    def killer(self, mutant):
        """The test that kills it, or None; "no code" and "same code" are no mutants."""
        if not self.ninja(["ovrinresize_objects"]):
            return "no code"
        if self.code() == self.original_code:
            return "same code"
        for divisor in (20, 1):
            for name in self.order(mutant.path):
                target = pathlib.Path(self.tests[name][0]).relative_to(self.build)
                if not self.ninja([target]) or not self.passes(name, divisor):
                    for key in (mutant.path, os.path.dirname(mutant.path)):
                        self.kills[name, key] = self.kills.get((name, key), 0) + 1
                    return name
        return None

    def judge(self, mutant, source):
        file = self.tree / mutant.path
        file.write_text(mutant.apply(source), encoding="utf-8")
        try:
            return self.killer(mutant)
        finally:
            file.write_text(source, encoding="utf-8")


def set_limits():
    resource.setrlimit(resource.RLIMIT_CORE, (0, 0))
    resource.setrlimit(resource.RLIMIT_AS, (20 << 30, 20 << 30))


def copy(source, target):
    """Files that have not changed keep their times."""
    if source.is_dir():
        for entry in source.iterdir():
            copy(entry, target / entry.name)
    elif not target.exists() or target.read_bytes() != source.read_bytes():
        target.parent.mkdir(parents=True, exist_ok=True)
        shutil.copy2(source, target)
        os.utime(target)


def read_sources():
    files = [path for suffix in ("*.cpp", "*.h") for path in (PROJECT / "src").rglob(suffix)]
    return {str(path.relative_to(PROJECT)): path.read_text(encoding="utf-8")
            for path in files if not FOREIGN.search(path.name)}


def main():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    parser.add_argument("folder", type=pathlib.Path)
    parser.add_argument("kind", choices=["random", "listed"])
    parser.add_argument("what")
    parser.add_argument("--seed", type=int, default=1)
    parser.add_argument("--skip", type=int, default=0, help="of the random ones, the first so many")
    parser.add_argument("--only", default="", help="files with this in their path")
    options = parser.parse_args()

    folder = options.folder.resolve()
    folder.mkdir(parents=True, exist_ok=True)
    sources = read_sources()
    if options.kind == "listed":
        with open(options.what, encoding="utf-8") as lines:
            mutants = listed_mutants(sources, lines)
    else:
        mutants = random_mutants(sources, int(options.what) + options.skip, options.seed,
                                 options.only)[options.skip:]
    print(f"{len(mutants)} mutants; building what they are made of", flush=True)
    build = Build(folder)
    for name in build.tests:
        if not build.passes(name, 20):
            sys.exit(f"{name} fails without any change")

    outcomes = {"killed": 0, "alive": 0, "no code": 0, "same code": 0}
    for mutant in mutants:
        start = time.monotonic()
        killer = build.judge(mutant, sources[mutant.path])
        outcome = killer if killer in outcomes else "killed" if killer else "alive"
        outcomes[outcome] += 1
        by = f" by {killer}" if outcome == "killed" else ""
        print(f"{outcome.upper() if outcome == 'alive' else outcome}{by}, "
              f"{time.monotonic() - start:.0f} s: {mutant.describe(sources[mutant.path])}", flush=True)

    counted = outcomes["killed"] + outcomes["alive"]
    print(f"\n{counted} mutants: {outcomes['killed']} killed, {outcomes['alive']} alive; besides, "
          f"{outcomes['no code']} did not compile and {outcomes['same code']} gave the same code")
    missed = len(mutants) - outcomes["killed"] if options.kind == "listed" else 0
    sys.exit(1 if missed else 0)


if __name__ == "__main__":
    main()
