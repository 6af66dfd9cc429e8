# SPDX-License-Identifier: Apache-2.0
"""A scheduler and workers on this machine, each a process, for the test and for the figures."""

from __future__ import annotations

import json
import subprocess
import sys
import time
from pathlib import Path
from typing import Any, List


class Cluster:
    def __init__(self, folder: Path, workers: int):
        """Leaves its log and the scheduler's address in the folder."""
        self.folder = folder
        contact = folder / "scheduler.json"
        contact.unlink(missing_ok=True)
        self.scheduler = self.start("scheduler", "--scheduler-file", contact, "--port", 0)
        self.workers: List[subprocess.Popen[bytes]] = []
        while not (contact.exists() and contact.read_text()):
            assert self.scheduler.poll() is None, (folder / "log").read_text()
            time.sleep(0.05)
        self.address = json.loads(contact.read_text())["address"]
        for _ in range(workers):
            worker = self.start("worker", self.address, "--nthreads", 1, "--no-nanny")
            self.workers.append(worker)

    def start(self, what: str, *arguments: object) -> subprocess.Popen[bytes]:
        module = f"distributed.cli.dask_{what}"
        command = [sys.executable, "-m", module, *map(str, arguments), "--no-dashboard"]
        with open(self.folder / "log", "ab") as log:
            return subprocess.Popen(command, cwd=self.folder, stdout=log, stderr=log)

    def __enter__(self) -> Cluster:
        return self

    def __exit__(self, *_: Any) -> None:
        for process in (*self.workers, self.scheduler):
            process.kill()
            process.wait()
