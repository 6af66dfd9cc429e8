#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Times the package beside the bindings of OpenCV and Pillow, and prints a table for docs/python.md.

All on one thread, from array to new array (Pillow: from image to image). Medians of calls that take turns.
"""

from __future__ import annotations

import argparse
import statistics
import time
from typing import Callable, Dict, List

import cv2
import numpy as np
from PIL import Image

import ovrinresize

SIZES = [
    ((4000, 3000), (1000, 750)),
    ((1920, 1080), (1280, 720)),
    ((1600, 1200), (2400, 1800)),
    ((640, 480), (224, 224)),
    ((32, 32), (16, 16)),
]

# What comes nearest: our filter, then those of OpenCV and Pillow.
PEERS = [
    ("quarter", "INTER_LINEAR", "BOX"),
    ("bilinear", "INTER_LINEAR", "BILINEAR"),
    ("lanczos", "INTER_LANCZOS4", "LANCZOS"),
    ("nearest", "INTER_NEAREST", "NEAREST"),
]


def medians(calls: Dict[str, Callable[[], object]], seconds: float) -> Dict[str, float]:
    """In milliseconds. Calls take turns, so that what slows the machine down slows all of them."""
    times: Dict[str, List[float]] = {name: [] for name in calls}
    end = time.perf_counter() + seconds
    while time.perf_counter() < end or len(times["ours"]) < 5:
        for name, call in calls.items():
            start = time.perf_counter()
            call()
            times[name].append((time.perf_counter() - start) * 1000)
    return {name: statistics.median(values) for name, values in times.items()}


def row(src: tuple[int, int], dst: tuple[int, int], channels: int, peers: tuple[str, str, str],
        seconds: float) -> str:  # fmt: skip
    ours, opencv, pillow = peers
    picture = np.random.default_rng(1).integers(0, 256, (src[1], src[0], channels), np.uint8)
    image = Image.fromarray(picture)
    flag, resampling = getattr(cv2, opencv), getattr(Image.Resampling, pillow)
    ms = medians(
        {
            "ours": lambda: ovrinresize.resize(picture, dst, filter=ours, threads="one"),
            "opencv": lambda: cv2.resize(picture, dst, interpolation=flag),
            "pillow": lambda: image.resize(dst, resampling),
        },
        seconds,
    )
    cells = [f"{src[0]}x{src[1]} to {dst[0]}x{dst[1]}", "RGBA" if channels == 4 else "RGB", ours]
    cells.append(f"{ms['ours']:.3f}")
    for peer, name in (("opencv", opencv), ("pillow", pillow)):
        cells += [f"{ms[peer]:.3f} {name}", f"{ms[peer] / ms['ours']:.1f}"]
    return "| " + " | ".join(cells) + " |"


def main() -> None:
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("--seconds", type=float, default=2, help="for each row")
    seconds = parser.parse_args().seconds
    cv2.setNumThreads(1)
    print(f"OpenCV {cv2.__version__}, Pillow {Image.__version__}, numpy {np.__version__}\n")
    print("| Pictures | | Filter | ms | OpenCV, ms | times ours | Pillow, ms | times ours |")
    print("|---|---|---|---|---|---|---|---|")
    for src, dst in SIZES:
        for channels in (4, 3):
            for peers in PEERS:
                if channels == 4 or peers[0] in ("quarter", "lanczos"):
                    print(row(src, dst, channels, peers, seconds), flush=True)


if __name__ == "__main__":
    main()
