# SPDX-License-Identifier: Apache-2.0
"""The programs in the documents run, and print what stands below them."""

from __future__ import annotations

import re
import subprocess
import sys
from pathlib import Path

import pytest

ROOT = Path(__file__).resolve().parents[3]
BLOCK = re.compile(r"```python\n(.*?)```(?:\n+```text\n(.*?)```)?", re.DOTALL)
PAGES = ["README.md", "bindings/python/README.md", "docs/python.md"]
PROGRAMS = [(page, *found) for page in PAGES for found in BLOCK.findall((ROOT / page).read_text())]


def test_each_page_has_programs():
    assert {page for page, _, _ in PROGRAMS} == set(PAGES)
    assert all(printed for page, _, printed in PROGRAMS if page == "docs/python.md")


@pytest.mark.parametrize("page, program, printed", PROGRAMS)
def test_program(page, program, printed, tmp_path):
    run = subprocess.run(
        [sys.executable, "-W", "error", "-c", program], cwd=tmp_path, capture_output=True, text=True
    )
    assert (run.returncode, run.stderr) == (0, "")
    assert run.stdout == printed
