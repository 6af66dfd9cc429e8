#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""figures.py [--check]: puts today's numbers where the documents say <!--NAME-->NUMBER.

With --check, changes nothing and fails where a number is another. How many tests there are only a run
can tell: that number comes from the log of ./dev test, and --check lets it be.
"""
import glob
import os
import re
import sys

os.chdir(os.path.join(os.path.dirname(os.path.abspath(__file__)), ".."))


def text(path):
    with open(path, encoding="utf-8") as file:
        return file.read()


def matches(pattern, *globs):
    files = [path for each in globs for path in glob.glob(each, recursive=True)]
    return sum(len(re.findall(pattern, text(path), re.MULTILINE)) for path in files)


def fuzz_totals():
    """Of the library's fuzzers: without sanitizers, with them."""
    totals = re.search(r"^\| all of the library \| ([\d,]+) \| ([\d,]+) ", text("docs/fuzzing.md"), re.M)
    return [int(total.replace(",", "")) for total in totals.groups()]


def fuzzers():
    """Those of the library."""
    names = re.search(r"^fuzzers=\(([\w\s]+)\)", text("fuzz/run.sh"), re.M).group(1)
    return len(names.split())


def native_tests():
    try:
        found = re.search(r"tests failed out of (\d+)", text("build/logs/release.log"))
    except FileNotFoundError:
        return None
    return found and int(found.group(1))


FIGURES = {
    "functions": lambda: matches(r"^OVRIN_API ", "include/ovrinresize.h"),
    "tests": native_tests,
    "golden": lambda: matches(r"^\S+ [0-9a-f]{16}$", "tests/golden/golden.txt"),
    "fuzzers": fuzzers,
    "fuzz runs": lambda: fuzz_totals()[0],
    "fuzz runs under sanitizers": lambda: fuzz_totals()[1],
    "tool cases": lambda: matches(r"^[^#\s][^|]*\|", "tests/tool/cases/*.txt"),
}


def filled(document, values):
    def number(match):
        name, old = match.groups()
        value = values[name]
        return match.group(0) if value is None else f"<!--{name}-->{value:,}"

    return re.sub(r"<!--([a-z ]+)-->([\d,]+)", number, document)


def main():
    check = sys.argv[1:] == ["--check"]
    values = {name: count() for name, count in FIGURES.items()}
    if check:
        values["tests"] = None
    stale = []
    for path in ["README.md", "SECURITY.md", *sorted(glob.glob("docs/*.md"))]:
        old = text(path)
        new = filled(old, values)
        if new == old:
            continue
        stale.append(path)
        if not check:
            with open(path, "w", encoding="utf-8") as file:
                file.write(new)
    if stale and check:
        sys.exit(f"numbers out of date in {', '.join(stale)}; docs/figures.py writes them")


main()
