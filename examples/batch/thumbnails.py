#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Makes thumbnails of all pictures in a folder, on as many machines as a Dask cluster has.

Pillow reads and writes, ovrinresize resizes. What is there and newer than its picture is left alone, so
a run that was cut short goes on where it stopped. A picture that fails is recorded; the others go on.
"""

from __future__ import annotations

import argparse
import json
import math
import os
import sys
import tempfile
import time
from collections import Counter
from dataclasses import dataclass
from pathlib import Path
from typing import Any, Dict, Iterator, List, Tuple

import numpy as np
import ovrinresize
from distributed import Client, as_completed
from PIL import Image, ImageOps
from tqdm import tqdm

SUFFIXES = {".jpg", ".jpeg", ".png", ".webp", ".tif", ".tiff", ".bmp", ".gif"}
UNFINISHED = ".part"


@dataclass(frozen=True)
class Options:
    """What all pictures have in common."""

    source: str  # the folder that paths are relative to
    output: str
    size: Tuple[int, int]  # what a thumbnail fits into
    filter: ovrinresize.Filter


# A picture's path, what became of it (done, skipped, failed), and why it failed.
Outcome = Tuple[str, str, str]

# ---- One picture ----------------------------------------------------------------------------------


def target_of(path: str) -> str:
    """JPEG files give JPEG files, all others PNG."""
    suffix = Path(path).suffix.lower()
    return path if suffix in (".jpg", ".jpeg", ".png") else path + ".png"


def shrink(pixels: np.ndarray[Any, np.dtype[np.uint8]], options: Options) -> Image.Image:
    """The picture as large as fits into the size, and no larger than it is."""
    height, width, channels = pixels.shape
    _, _, w, h = ovrinresize.placement((width, height), options.size).rect
    if w >= width:
        return Image.fromarray(pixels)
    if channels == 4:
        pixels = pixels.copy()
        ovrinresize.premultiply(pixels)
    # Every core has a picture of its own.
    small = ovrinresize.resize(pixels, (w, h), filter=options.filter, threads="one")
    if channels == 4:
        ovrinresize.unpremultiply(small, ovrinresize.white_after(options.filter))
    return Image.fromarray(small)


def read(source: Path) -> np.ndarray[Any, np.dtype[np.uint8]]:
    """Upright pixels: RGBA where there is transparency, else RGB."""
    with Image.open(source) as image:
        upright = ImageOps.exif_transpose(image)
        has_alpha = upright.mode in ("RGBA", "LA", "PA") or "transparency" in upright.info
        return np.asarray(upright.convert("RGBA" if has_alpha else "RGB"))


def make_thumbnail(source: Path, target: Path, options: Options) -> None:
    """The target appears when it is whole. It is dated as the reading began, by the clock of the target's
    own file system: a picture that changes meanwhile is newer."""
    target.parent.mkdir(parents=True, exist_ok=True)
    handle, name = tempfile.mkstemp(UNFINISHED, f".{target.name}.", target.parent)
    try:
        with os.fdopen(handle, "wb") as file:
            began = os.fstat(file.fileno()).st_mtime_ns
            thumbnail = shrink(read(source), options)
            thumbnail.save(file, "PNG" if target.suffix.lower() == ".png" else "JPEG")
            os.fchmod(file.fileno(), source.stat().st_mode & 0o666)
            file.flush()
            os.utime(file.fileno(), ns=(began, began))
        os.replace(name, target)
    except BaseException:
        os.unlink(name)
        raise


def is_newer(target: Path, source: Path) -> bool:
    try:
        return target.stat().st_mtime_ns > source.stat().st_mtime_ns
    except FileNotFoundError:
        return False


def outcome_of(path: str, options: Options) -> Outcome:
    source = Path(options.source, path)
    target = Path(options.output, target_of(path))
    try:
        if is_newer(target, source):
            return path, "skipped", ""
        make_thumbnail(source, target, options)
    except Exception as error:  # whatever is wrong with one picture, the others go on
        return path, "failed", f"{type(error).__name__}: {error}"
    return path, "done", ""


# ---- All of them ----------------------------------------------------------------------------------


def make_batch(paths: List[str], options: Options) -> List[Outcome]:
    """What a worker does at a time. Done again, after a worker was lost, it skips what is there."""
    return [outcome_of(path, options) for path in paths]


class Threads:
    """How many the cluster has: workers come and go. Asking takes the scheduler longer than a task does."""

    def __init__(self, client: Client):
        self.client = client
        self.count = 0
        self.asked = -math.inf

    def now(self) -> int:
        if time.monotonic() > self.asked + 2:
            workers = self.client.scheduler_info()["workers"]
            self.count = sum(worker["nthreads"] for worker in workers.values())
            self.asked = time.monotonic()
        return self.count


def run(client: Client, paths: List[str], options: Options, per_task: int) -> Iterator[Outcome]:
    """Hands out a few tasks for each thread, and more as they end: neither the scheduler nor this process
    ever holds all of them. What a worker had in hand when it was lost, others do."""
    batches = [paths[i : i + per_task] for i in range(0, len(paths), per_task)]
    batches.reverse()
    in_hand: Dict[str, List[str]] = {}
    ended = as_completed()

    threads = Threads(client)

    def hand_out() -> None:
        while batches and len(in_hand) < max(8, 3 * threads.now()):
            batch = batches.pop()
            future = client.submit(make_batch, batch, options, pure=False)
            in_hand[future.key] = batch
            ended.add(future)

    hand_out()
    for future in ended:
        batch = in_hand.pop(future.key)
        error = future.exception()
        if error is None:
            yield from future.result()
        elif len(batch) == 1:
            yield batch[0], "failed", f"{type(error).__name__}: {error}"
        else:  # one of them takes workers with it: find out which
            batches.extend([path] for path in batch)
        # A result that is still wanted would be made again if its worker were lost.
        future.release()
        hand_out()


def pictures_in(folder: Path) -> Iterator[str]:
    for where, folders, files in os.walk(folder):
        folders.sort()
        for name in sorted(files):
            if Path(name).suffix.lower() in SUFFIXES and not name.startswith("."):
                yield os.path.relpath(os.path.join(where, name), folder)


def check_targets(paths: List[str]) -> None:
    targets = Counter(map(target_of, paths))
    twice = [target for target, count in targets.items() if count > 1]
    if twice:
        sys.exit(f"more than one picture would become {twice[0]}")


def remove_unfinished(folder: Path) -> None:
    """What workers that were killed have left. None works any more."""
    for name in folder.rglob(f".*{UNFINISHED}"):
        name.unlink(missing_ok=True)


def parse_size(text: str) -> Tuple[int, int]:
    width, height = map(int, text.split("x"))
    return width, height


def parse(arguments: List[str]) -> argparse.Namespace:
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("source", type=Path, help="folder of pictures")
    parser.add_argument("output", type=Path, help="folder of thumbnails, with the same names")
    parser.add_argument("--size", type=parse_size, default=(256, 256), metavar="WxH")
    parser.add_argument("--filter", choices=ovrinresize.FILTERS, default="quarter")
    parser.add_argument("--list", type=argparse.FileType(), metavar="FILE",
                        help="paths below the source folder, one a line, instead of all pictures")
    parser.add_argument("--scheduler", metavar="ADDRESS",
                        help="of the cluster (default: one of this machine's cores)")
    parser.add_argument("--per-task", type=int, default=16, metavar="N", help="pictures in a task")
    return parser.parse_args(arguments)  # fmt: skip


def main(arguments: List[str]) -> int:
    args = parse(arguments)
    paths = args.list.read().splitlines() if args.list else list(pictures_in(args.source))
    check_targets(paths)
    args.output.mkdir(parents=True, exist_ok=True)
    source, output = str(args.source.resolve()), str(args.output.resolve())
    options = Options(source, output, args.size, args.filter)
    counts: Counter[str] = Counter(done=0, skipped=0, failed=0)
    start = time.monotonic()
    report = args.output / "failed.jsonl"
    # Without an address, Dask starts a cluster of this machine's cores.
    with Client(args.scheduler, **({} if args.scheduler else {"threads_per_worker": 1})) as client:
        with open(report, "w", encoding="utf-8") as failures:
            with tqdm(total=len(paths), unit=" pictures", disable=None) as bar:
                for path, what, why in run(client, paths, options, args.per_task):
                    counts[what] += 1
                    bar.update()
                    if what == "failed":
                        print(json.dumps({"path": path, "error": why}), file=failures, flush=True)
    remove_unfinished(args.output)
    seconds = time.monotonic() - start
    print(", ".join(f"{count} {what}" for what, count in counts.items()), end="")
    print(f" in {seconds:.1f} s: {len(paths) / seconds:.0f} pictures per second")
    if counts["failed"]:
        print(f"Why they failed stands in {report}")
    return 1 if counts["failed"] else 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
