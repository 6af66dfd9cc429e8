#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Fails unless docs/testing.md lists each atomic operation of src/, with its order, and no other."""

import pathlib
import re
import sys

PROJECT = pathlib.Path(__file__).resolve().parents[3]
OPERATION = re.compile(r"__atomic_(\w+)\(&([\w.>-]+),([^;]*?)\)[;,)\s]", re.DOTALL)
ROW = re.compile(r"^\| `([\w/.]+)` \| `(\w+)` \| (\w+), (\w+) \|", re.MULTILINE)


def operations():
    for path in sorted((PROJECT / "src").rglob("*")):
        if path.suffix not in (".h", ".cpp"):
            continue
        text = path.read_text(encoding="utf-8")
        found = OPERATION.findall(text)
        if len(found) != text.count("__atomic_"):
            sys.exit(f"{path}: an atomic operation that this script does not understand")
        for name, target, arguments in found:
            orders = re.findall(r"__ATOMIC_(\w+)", arguments)
            field = re.split(r"[.>]", target)[-1]
            kind = {"load_n": "load", "store_n": "store"}.get(name, "exchange")
            yield str(path.relative_to(PROJECT / "src")), field, kind, orders[0].lower()


used = set(operations())
listed = set(ROW.findall((PROJECT / "docs/testing.md").read_text(encoding="utf-8")))
for missing in sorted(used - listed):
    print("docs/testing.md does not list:", *missing)
for gone in sorted(listed - used):
    print("docs/testing.md lists, but src/ has not:", *gone)
print(f"{len(used)} kinds of atomic operations, each with its reason" if used == listed else "FAIL")
sys.exit(used != listed)
