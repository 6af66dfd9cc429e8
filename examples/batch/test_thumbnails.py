# SPDX-License-Identifier: Apache-2.0
"""The example on a cluster of a scheduler and three workers, each a process, one of which is killed."""

from __future__ import annotations

import hashlib
import json
import os
import signal
import subprocess
import sys
import time
from collections import Counter
from pathlib import Path

import numpy as np
import pytest
from PIL import Image
from watchdog.events import FileSystemEvent, FileSystemEventHandler
from watchdog.observers import Observer

import thumbnails
from cluster import Cluster

SCRIPT = Path(thumbnails.__file__)
GOOD, BROKEN = 1960, 40
SIZE = (48, 48)
FOLDERS = ["", "a", "a/b", "ü"]


def noise(seed: int, width: int, height: int, channels: int) -> Image.Image:
    pixels = np.random.default_rng(seed).integers(0, 256, (height, width, channels), np.uint8)
    return Image.fromarray(pixels)


def make_picture(path: Path, seed: int) -> None:
    width, height = 100 + seed % 37, 80 + seed % 41
    if path.suffix == ".jpg":
        noise(seed, width, height, 3).save(path, quality=80)
    elif path.suffix == ".webp":
        noise(seed, width // 4, height // 4, 3).save(path)
    else:
        noise(seed, width, height, 3 + seed % 2).save(path, compress_level=0)


def break_picture(path: Path, way: int) -> None:
    contents = path.read_bytes()
    if way == 0:
        path.write_bytes(contents[: len(contents) // 2])
    elif way == 1:
        path.write_bytes(b"")
    elif way == 2:
        path.write_bytes(b"not a picture " * 100)
    else:
        path.unlink()
        path.symlink_to("nothing")


@pytest.fixture(scope="module")
def pictures(tmp_path_factory):
    """The folder, and the paths of those that are broken."""
    folder = tmp_path_factory.mktemp("pictures")
    broken = set()
    for name in FOLDERS:
        (folder / name).mkdir(exist_ok=True)
    for i in range(GOOD + BROKEN):
        suffix = (".jpg", ".png", ".webp")[i % 3]
        path = folder / FOLDERS[i % len(FOLDERS)] / f"{i:04}{suffix}"
        make_picture(path, i)
        if i % 50 == 7:
            break_picture(path, i // 50 % 4)
            broken.add(str(path.relative_to(folder)))
    (folder / "notes.txt").write_text("not a picture, and not called one")
    assert len(broken) == BROKEN
    return folder, broken


@pytest.fixture
def cluster(tmp_path):
    with Cluster(tmp_path, 3) as cluster:
        yield cluster


class Arrivals(FileSystemEventHandler):
    """How often each thumbnail has appeared."""

    def __init__(self) -> None:
        self.count: Counter[str] = Counter()

    def on_moved(self, event: FileSystemEvent) -> None:
        self.count[event.dest_path] += 1


def command(source: Path, output: Path, *arguments: str) -> list[str]:
    size = f"{SIZE[0]}x{SIZE[1]}"
    return [sys.executable, str(SCRIPT), str(source), str(output), "--size", size, *arguments]


def files_in(folder: Path) -> dict[str, str]:
    """Contents by path."""
    return {
        str(path.relative_to(folder)): hashlib.sha256(path.read_bytes()).hexdigest()
        for path in folder.rglob("*")
        if path.is_file() and path.name != "failed.jsonl"
    }


def failed_in(output: Path) -> list[str]:
    return [json.loads(line)["path"] for line in (output / "failed.jsonl").read_text().splitlines()]


def wait_for(number: int, arrivals: Arrivals, run: subprocess.Popen[str]) -> None:
    while len(arrivals.count) < number:
        assert run.poll() is None, "it has ended"
        time.sleep(0.01)


def test_a_worker_is_killed(pictures, cluster, tmp_path):
    source, broken = pictures
    output, alone = tmp_path / "output", tmp_path / "alone"
    for name in FOLDERS:
        (output / name).mkdir(parents=True, exist_ok=True)

    arrivals = Arrivals()
    observer = Observer()
    observer.schedule(arrivals, str(output), recursive=True)
    observer.start()
    run = subprocess.Popen(
        command(source, output, "--scheduler", cluster.address), stdout=subprocess.PIPE, text=True
    )
    wait_for(GOOD // 4, arrivals, run)
    cluster.workers[1].send_signal(signal.SIGKILL)
    at_kill = len(arrivals.count)
    printed, _ = run.communicate(timeout=900)
    soon = time.monotonic() + 120
    while len(arrivals.count) < GOOD and time.monotonic() < soon:
        time.sleep(0.01)  # what the system has told, and the observer not yet
    observer.stop()
    observer.join()

    assert run.returncode == 1, printed
    assert cluster.workers[1].poll() == -signal.SIGKILL
    assert [worker.poll() for worker in cluster.workers[::2]] == [None, None]
    assert at_kill < GOOD, "it was killed after the end"

    # Every good picture once; of those whose tasks were lost, other workers found some there.
    assert len(arrivals.count) == GOOD
    assert set(arrivals.count.values()) == {1}
    assert sorted(failed_in(output)) == sorted(broken)
    done, skipped, failed = (int(part.split()[0]) for part in printed.split(" in ")[0].split(", "))
    assert (done + skipped, failed) == (GOOD, BROKEN)
    assert skipped < 16 * 9, "more than there were tasks in hand"

    # The same as on this machine, in this process.
    options = thumbnails.Options(str(source), str(alone), SIZE, "quarter")
    paths = list(thumbnails.pictures_in(source))
    outcomes = Counter(what for _, what, _ in thumbnails.make_batch(paths, options))
    assert outcomes == {"done": GOOD, "failed": BROKEN}
    assert files_in(output) == files_in(alone)
    for path, contents in files_in(output).items():
        with Image.open(output / path) as thumbnail:
            assert max(thumbnail.size) <= 48

    # Once more: nothing to do but what is newer, and what has gone.
    newer = source / "a/0001.png"
    os.utime(newer)
    (output / "0000.jpg").unlink()
    again = subprocess.run(
        command(source, output, "--scheduler", cluster.address), capture_output=True, text=True
    )
    assert again.stdout.startswith(f"2 done, {GOOD - 2} skipped, {BROKEN} failed in ")
    assert files_in(output) == files_in(alone)


def test_transparency_and_orientation(tmp_path):
    source, output = tmp_path / "in", tmp_path / "out"
    source.mkdir()
    hidden = np.zeros((64, 64, 4), np.uint8)
    hidden[:, ::2] = (200, 0, 0, 255)
    hidden[:, 1::2] = (0, 200, 0, 0)
    Image.fromarray(hidden).save(source / "hidden.png")
    sideways = Image.fromarray(np.full((40, 80, 3), 128, np.uint8))
    exif = sideways.getexif()
    exif[0x0112] = 6
    sideways.save(source / "sideways.jpg", exif=exif)
    options = thumbnails.Options(str(source), str(output), (16, 16), "lanczos")
    assert thumbnails.make_batch(["hidden.png", "sideways.jpg"], options) == [
        ("hidden.png", "done", ""),
        ("sideways.jpg", "done", ""),
    ]
    with Image.open(output / "sideways.jpg") as image:
        assert image.size == (8, 16)
    with Image.open(output / "hidden.png") as image:
        pixels = np.asarray(image)
    assert pixels.shape == (16, 16, 4) and not pixels[..., 1].any()


def test_two_pictures_of_one_name(tmp_path):
    for name in ("a.bmp", "a.bmp.png"):
        noise(1, 8, 8, 3).save(tmp_path / name)
    run = subprocess.run(command(tmp_path, tmp_path / "out"), capture_output=True, text=True)
    assert run.returncode == 1
    assert run.stderr == "more than one picture would become a.bmp.png\n"
