#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""measure.py FOLDER [PICTURES]: pictures per second with one, two and three workers, and what a task costs
the scheduler. Puts its pictures, of 12 megapixels, into the folder."""

from __future__ import annotations

import os
import shutil
import subprocess
import sys
import time
from pathlib import Path

import numpy as np
from distributed import Client
from PIL import Image, ImageFilter

import thumbnails
from cluster import Cluster


def make_pictures(folder: Path, number: int) -> None:
    """Like photographs in what a JPEG file of them takes: blurred noise, with a little that is sharp."""
    folder.mkdir(parents=True, exist_ok=True)
    random = np.random.default_rng(1)
    coarse = random.integers(0, 256, (375, 500, 3), np.uint8)
    base = Image.fromarray(coarse).filter(ImageFilter.GaussianBlur(3)).resize((4000, 3000))
    pixels = np.asarray(base).astype(np.int16) + random.integers(-9, 10, (3000, 4000, 1), np.int16)
    Image.fromarray(np.clip(pixels, 0, 255).astype(np.uint8)).save(folder / "0.jpg", quality=85)
    for i in range(1, number):
        (folder / f"{i}.jpg").unlink(missing_ok=True)
        os.link(folder / "0.jpg", folder / f"{i}.jpg")


def cpu_seconds(process: subprocess.Popen[bytes]) -> float:
    fields = Path(f"/proc/{process.pid}/stat").read_text().rsplit(")", 1)[1].split()
    return (int(fields[11]) + int(fields[12])) / os.sysconf("SC_CLK_TCK")


def seconds_for(client: Client, paths: list[str], options: thumbnails.Options, per_task: int) -> float:
    start = time.perf_counter()
    for _, what, why in thumbnails.run(client, paths, options, per_task):
        assert what == "done" or not options.source, why
    return time.perf_counter() - start


def main(folder: Path, number: int) -> None:
    make_pictures(folder / "in", number)
    mebibytes = (folder / "in" / "0.jpg").stat().st_size / 2**20
    print(f"{number} JPEG files of 4000x3000, {mebibytes:.1f} MiB each, to 256x192")
    paths = list(thumbnails.pictures_in(folder / "in"))
    options = thumbnails.Options(str(folder / "in"), str(folder / "out"), (256, 256), "quarter")
    for workers in (1, 2, 3):
        shutil.rmtree(folder / "out", ignore_errors=True)
        with Cluster(folder, workers) as cluster, Client(cluster.address) as client:
            client.upload_file(thumbnails.__file__)
            client.wait_for_workers(workers)
            seconds = seconds_for(client, paths, options, 4)
        print(f"{workers} workers: {number / seconds:.1f} pictures per second")

    # Pictures that are not there fail at once: what is left is the tasks themselves.
    nothing = thumbnails.Options("", str(folder / "out"), (256, 256), "quarter")
    with Cluster(folder, 1) as cluster, Client(cluster.address) as client:
        client.upload_file(thumbnails.__file__)
        client.wait_for_workers(1)
        before = cpu_seconds(cluster.scheduler)
        seconds = seconds_for(client, ["none"] * 5000, nothing, 1)
        used = cpu_seconds(cluster.scheduler) - before
    print(f"5000 empty tasks: {5000 / seconds:.0f} per second, {used / 5:.2f} ms of the scheduler each")


if __name__ == "__main__":
    main(Path(sys.argv[1]).resolve(), int(sys.argv[2]) if sys.argv[2:] else 60)
