#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Mutation testing: changes one operator, number or statement of src/ at a time and runs the tests.

A mutant that does not compile, or compiles to the same code, is left out. One is killed when a test
goes red, crashes or hangs; one that no test kills shows what no test looks at. Sources are changed
in a copy below FOLDER, which may be kept: it remembers what has been built and which tests killed.

  mutants.py random FOLDER COUNT   some, evenly over the files
  mutants.py listed FOLDER FILE    those of a list; all must be killed
  mutants.py again FOLDER LOG...   those that these runs left alive
  mutants.py sum LOG...            all outcomes of these runs, the last where a mutant has several

With --aarch64 the NEON kernels are changed, and tested under qemu-user; with --wasm what the WebAssembly
modules compile and x86-64 does not, and tested in Node. With --sanitize all is built with these sanitizers,
which kill what is undefined and does no harm otherwise.
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
          "examples", "include", "src", "tests", "tools"]
# What a program says for instructions that the processor does not have.
SKIPPED = 77


@dataclasses.dataclass(frozen=True)
class Target:
    """What is changed for one kind of processor, how it is built, and what tests it."""
    files: str  # those of src/ that are changed, as a regular expression
    needs: tuple  # programs
    builds: dict  # by folder: arguments for CMake, and what is built there before anything is changed
    changed: tuple  # the folders where a mutant gives other code...
    code: str  # ... and in which files
    scripts: dict = dataclasses.field(default_factory=dict)  # in Node: names of tests, and which they are
    divisors: tuple = (20, 1)  # of the rounds of random tests, one after the other
    most_memory: int = 20 << 30


OBJECTS = "CMakeFiles/ovrinresize_objects.dir/**/*.o"
TARGETS = {
    "native": Target(
        files=r"^(?!.*(_neon\.|_wasm\.|pool_without_threads|exact_fma))",
        needs=("ccache",),
        builds={"native": ([], ["all"])},
        changed=("native",), code=OBJECTS),
    # The programs that reach kernels; an emulator is slow.
    "aarch64": Target(
        files=r"_neon\.",
        needs=("ccache", "aarch64-linux-gnu-g++", "qemu-aarch64"),
        builds={"aarch64": (["-DCMAKE_TOOLCHAIN_FILE=cmake/aarch64-linux-gnu.cmake"],
                            ["kernel_plans", "quarter_kernels", "bilinear_kernels", "lanczos_kernels",
                             "copy_kernels", "engine_kernels", "golden_sets", "rgba8888", "rgb888",
                             "keep_ratio_rgba", "yuv420", "bilinear", "bilinear_ex", "lanczos"])},
        changed=("aarch64",), code=OBJECTS),
    # Objects have still to be optimized when modules are linked, so those are compared. The package's
    # tests ask the tool for what the native library does; Node reserves more memory than it uses.
    "wasm": Target(
        files=r"_wasm\.|pool_without_threads|exact_fma|/(bilinear|quarter)_neon\.",
        needs=("ccache", "clang++-19", "wasm-ld-19", "node"),
        builds={"wasm": (["-DCMAKE_TOOLCHAIN_FILE=cmake/wasm32.cmake"], ["ovrinresize", "golden"]),
                "wasm-scalar": (["-DCMAKE_TOOLCHAIN_FILE=cmake/wasm32.cmake", "-DOVRINRESIZE_SIMD128=OFF"],
                                ["ovrinresize"]),
                "release": (["-DOVRINRESIZE_BUILD_TOOLS=ON"], ["exact_fma", "ovrinresize_tool"])},
        changed=("wasm", "wasm-scalar"), code="ovrinresize",
        scripts={"golden": "golden bytes", "both": "both modules", "pictures": "native library"},
        divisors=(1,), most_memory=resource.RLIM_INFINITY),
}

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
        return f"{self.path}:{number}\n    - {before.strip()}\n    + {after.strip() or NOTHING}"


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

# ---- Logs ------------------------------------------------------------------------------------

OUTCOME = re.compile(r"^(ALIVE|killed|no code|same code)(?: by .*)?, \d+ s: (\S+):(\d+)\n"
                     r"    - (.*)\n    \+ (.*)$", re.MULTILINE)
NOTHING = "(nothing)"


def outcomes_of(logs):
    """What became of each mutant: by file, line number, line before and line after."""
    found = {}
    for log in logs:
        for outcome, *mutant in OUTCOME.findall(pathlib.Path(log).read_text(encoding="utf-8")):
            found[tuple(mutant)] = outcome.lower()
    return found


def alive_mutants(sources, logs):
    chosen = []
    for (path, number, before, after), outcome in outcomes_of(logs).items():
        if outcome != "alive" or path not in sources:
            continue
        starts = [m.start(1) for m in re.finditer(rf"^[ ]*({re.escape(before)})$", sources[path], re.M)]
        if not starts:
            print(f"gone since: {path}:{number}\n    - {before}")
            continue
        # Where a line stands more than once: the one nearest to where it was.
        start = min(starts, key=lambda at: abs(sources[path].count("\n", 0, at) + 1 - int(number)))
        chosen.append(Mutant(path, start, start + len(before), "" if after == NOTHING else after))
    return chosen


def summary(outcomes):
    killed, alive, no_code, same_code = [outcomes.count(outcome) for outcome in
                                         ("killed", "alive", "no code", "same code")]
    share = f" ({100 * killed / (killed + alive):.1f} %)" if killed + alive else ""
    return (f"{killed + alive} mutants: {killed} killed{share}, {alive} alive; besides, "
            f"{no_code} did not compile and {same_code} gave the same code")

# ---- Building and testing --------------------------------------------------------------------

class Build:
    def __init__(self, folder, options):
        self.target = TARGETS[options.target]
        self.tree = folder / "tree"
        self.builds = self.tree / "build"
        self.log = open(folder / "build.log", "w", encoding="utf-8")
        temporary = folder / "temporary"
        temporary.mkdir(exist_ok=True)
        self.environment = {**os.environ, "CCACHE_DIR": str(folder / "ccache"),
                            "CCACHE_NOHASHDIR": "1", "GTEST_FAIL_FAST": "1",
                            "QEMU_CPU": "cortex-a53", "OVRIN_ROOT": str(self.tree),
                            "TMPDIR": str(temporary)}
        for name in COPIED:
            copy(PROJECT / name, self.tree / name)
        for name, (arguments, targets) in self.target.builds.items():
            self.run(["cmake", "-G", "Ninja", "-S", self.tree, "-B", self.builds / name,
                      f"-DCMAKE_BUILD_TYPE={'RelWithDebInfo' if options.sanitize else 'Release'}",
                      f"-DCMAKE_CXX_FLAGS={sanitizer_flags(options.sanitize)}",
                      "-DOVRINRESIZE_BUILD_TESTS=ON", "-DCMAKE_CXX_COMPILER_LAUNCHER=ccache",
                      "-DCMAKE_LINK_DEPENDS_NO_SHARED=ON", *arguments], check=True)
            self.ninja(name, targets, check=True)
        self.original_code = self.code()
        self.tests = {**self.find_tests(), **self.find_scripts()}
        # The address sanitizer maps far more than this.
        self.most_memory = resource.RLIM_INFINITY if options.sanitize else self.target.most_memory
        self.divisors = self.target.divisors[:1] if options.quick else self.target.divisors
        self.seconds = {}
        self.kills_file = folder / "kills.json"
        self.kills = json.loads(self.kills_file.read_text()) if self.kills_file.exists() else {}

    def run(self, command, check=False):
        return subprocess.run([str(part) for part in command], env=self.environment, check=check,
                              stdin=subprocess.DEVNULL, stdout=self.log, stderr=self.log).returncode == 0

    def ninja(self, name, targets, check=False):
        return self.run(["ninja", "-C", self.builds / name, "-j", str(os.cpu_count() or 2), *targets],
                        check)

    def code(self):
        """What the library is compiled to, by its contents."""
        return {path: hashlib.sha256(path.read_bytes()).digest()
                for name in self.target.changed for path in (self.builds / name).glob(self.target.code)}

    def find_tests(self):
        """By name: the folder of the build, the program there and the command. Each program is one test."""
        tests = {}
        for name in self.target.builds:
            build = self.builds / name
            listing = subprocess.run(["ctest", "--test-dir", build, "--show-only=json-v1"],
                                     check=True, capture_output=True, env=self.environment).stdout
            for test in json.loads(listing)["tests"]:
                command = [part for part in test.get("command", []) if not part.startswith("--gtest")]
                own = [n for n, part in enumerate(command) if build in pathlib.Path(part).parents]
                # An emulator may stand in front of the program; a script's arguments are not programs.
                if not own or "qemu" not in command[0] and own[0] != 0:
                    continue
                program = pathlib.Path(command[own[0]])
                if program.exists():
                    words = [pathlib.Path(part).name for part in command[own[0]:]]
                    tests[" ".join(words)] = (name, program.relative_to(build), command)
        return tests

    def find_scripts(self):
        """Those of the package, which is made of links to the modules. Nothing is to be built for them."""
        if not self.target.scripts:
            return {}
        package = self.builds / "js"
        for name in ("index.js", "resizer.js", "package.json"):
            copy(PROJECT / "bindings/js" / name, package / name)
        for name, file in (("wasm", "ovrinresize.wasm"), ("wasm-scalar", "ovrinresize-scalar.wasm")):
            if not (package / file).is_symlink():
                (package / file).symlink_to(self.builds / name / "ovrinresize")
        script = self.tree / "tests/web/package_test.mjs"
        return {name: ("js", None, ["node", f"--test-name-pattern={pattern}", str(script)])
                for name, pattern in self.target.scripts.items()}

    def passes(self, name, divisor):
        """Limits count what the program and we ourselves were given of the processor, not the clock:
        others may need the machine. So a test that took long by the clock gets a second chance."""
        outcome, waited = self.run_test(name, divisor)
        if outcome not in (0, SKIPPED, -signal.SIGXCPU) and waited > 5:
            outcome, waited = self.run_test(name, divisor)
        return outcome in (0, SKIPPED)

    def run_test(self, name, divisor):
        environment = {**self.environment, "OVRIN_TEST_DIVISOR": str(divisor)}
        usual = self.seconds.get((name, divisor),
                                 20 * self.seconds.get((name, self.divisors[0]), 30))
        begin = time.monotonic()
        spent = processor_seconds()
        folder, _, command = self.tests[name]
        test = subprocess.Popen(command, env=environment, cwd=self.builds / folder,
                                stdin=subprocess.DEVNULL, stdout=self.log, stderr=self.log,
                                start_new_session=True,
                                preexec_fn=lambda: set_limits(int(10 + 10 * usual), self.most_memory))
        outcome = None
        patience = 60 + 10 * usual
        while outcome is None:
            try:
                outcome = test.wait(0.25)
            except subprocess.TimeoutExpired:
                patience -= 0.25
                if patience < 0:
                    os.killpg(test.pid, signal.SIGKILL)
                    outcome = test.wait()
        if outcome == 0:
            self.seconds.setdefault((name, divisor), processor_seconds() - spent)
        return outcome, time.monotonic() - begin

    def order(self, path):
        """Those that have killed mutants of this file or folder come first, then quick ones."""
        def rank(name):
            return (*(-self.kills.get(place, {}).get(name, 0) for place in (path, os.path.dirname(path))),
                    self.seconds.get((name, self.divisors[0]), 0))
        return sorted(self.tests, key=rank)

    def remember(self, name, path):
        for place in (path, os.path.dirname(path)):
            counts = self.kills.setdefault(place, {})
            counts[name] = counts.get(name, 0) + 1
        self.kills_file.write_text(json.dumps(self.kills, indent=1), encoding="utf-8")

    def killer(self, mutant):
        """The test that kills it, or None; "no code" and "same code" are no mutants."""
        # Programs load the shared library when they start; they need not be linked again for it.
        if not all(self.ninja(name, ["ovrinresize"]) for name in self.target.changed):
            return "no code"
        if self.code() == self.original_code:
            return "same code"
        for divisor in self.divisors:
            for name in self.order(mutant.path):
                folder, program, _ = self.tests[name]
                if program and not self.ninja(folder, [program]) or not self.passes(name, divisor):
                    self.remember(name, mutant.path)
                    return name
        return None

    def judge(self, mutant, source):
        file = self.tree / mutant.path
        file.write_text(mutant.apply(source), encoding="utf-8")
        try:
            return self.killer(mutant)
        finally:
            file.write_text(source, encoding="utf-8")


def processor_seconds():
    """Of all programs that have ended."""
    used = resource.getrusage(resource.RUSAGE_CHILDREN)
    return used.ru_utime + used.ru_stime


def sanitizer_flags(names):
    if not names:
        return ""
    return f"-fsanitize={names} -fno-sanitize-recover=all -fno-omit-frame-pointer"


def set_limits(seconds, memory):
    resource.setrlimit(resource.RLIMIT_CPU, (seconds, seconds + 5))
    resource.setrlimit(resource.RLIMIT_CORE, (0, 0))
    resource.setrlimit(resource.RLIMIT_AS, (memory, memory))


def copy(source, target):
    """Files that have not changed keep their times."""
    if source.is_dir():
        for entry in source.iterdir():
            copy(entry, target / entry.name)
    elif not target.exists() or target.read_bytes() != source.read_bytes():
        target.parent.mkdir(parents=True, exist_ok=True)
        shutil.copy2(source, target)
        os.utime(target)


def read_sources(files):
    paths = [path for suffix in ("*.cpp", "*.h") for path in (PROJECT / "src").rglob(suffix)]
    sources = {str(path.relative_to(PROJECT)): path.read_text(encoding="utf-8") for path in paths}
    return {path: source for path, source in sources.items() if re.search(files, path)}


def read_options():
    parser = argparse.ArgumentParser(description=__doc__,
                                     formatter_class=argparse.RawDescriptionHelpFormatter)
    kinds = parser.add_subparsers(dest="kind", required=True)
    for kind in ("random", "listed", "again"):
        options = kinds.add_parser(kind)
        options.add_argument("folder", type=pathlib.Path)
        target = options.add_mutually_exclusive_group()
        for flag, words in (("aarch64", "the NEON kernels, under qemu-user"),
                            ("wasm", "what only the WebAssembly modules compile, in Node")):
            target.add_argument(f"--{flag}", dest="target", action="store_const", const=flag,
                                default="native", help=words)
        options.add_argument("--sanitize", default="", metavar="NAMES",
                             help="such as address,undefined or thread")
        options.add_argument("--quick", action="store_true",
                             help="random tests with a twentieth of their rounds only")
        if kind == "random":
            options.add_argument("count", type=int)
            options.add_argument("--seed", type=int, default=1)
            options.add_argument("--skip", type=int, default=0, help="the first so many")
            options.add_argument("--only", default="", help="files with this in their path")
        else:
            options.add_argument("files", nargs="+" if kind == "again" else 1)
    kinds.add_parser("sum").add_argument("files", nargs="+")
    options = parser.parse_args()
    if options.kind != "sum" and options.target == "wasm" and options.sanitize:
        parser.error("the sanitizers are not for WebAssembly")
    return options


def chosen_mutants(options, sources):
    if options.kind == "again":
        return alive_mutants(sources, options.files)
    if options.kind == "listed":
        with open(options.files[0], encoding="utf-8") as lines:
            return listed_mutants(sources, lines)
    return random_mutants(sources, options.count + options.skip, options.seed,
                          options.only)[options.skip:]


def main():
    options = read_options()
    if options.kind == "sum":
        print(summary(list(outcomes_of(options.files).values())))
        return

    target = TARGETS[options.target]
    missing = [program for program in target.needs if not shutil.which(program)]
    if missing:
        print(f"skipped: there is no {' or '.join(missing)}")
        sys.exit(SKIPPED)
    folder = options.folder.resolve()
    folder.mkdir(parents=True, exist_ok=True)
    sources = read_sources(target.files)
    mutants = chosen_mutants(options, sources)
    print(f"{len(mutants)} mutants; building what they are made of", flush=True)
    build = Build(folder, options)
    for name in build.tests:
        if not build.passes(name, build.divisors[0]):
            sys.exit(f"{name} fails without any change")

    outcomes = []
    for mutant in mutants:
        spent = processor_seconds()
        killer = build.judge(mutant, sources[mutant.path])
        outcome = killer if killer in ("no code", "same code") else "killed" if killer else "alive"
        outcomes.append(outcome)
        by = f" by {killer}" if outcome == "killed" else ""
        print(f"{outcome.upper() if outcome == 'alive' else outcome}{by}, "
              f"{processor_seconds() - spent:.0f} s: {mutant.describe(sources[mutant.path])}", flush=True)

    print("\n" + summary(outcomes))
    missed = len(mutants) - outcomes.count("killed") if options.kind == "listed" else 0
    sys.exit(1 if missed else 0)


if __name__ == "__main__":
    main()
