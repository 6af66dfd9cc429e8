# SPDX-License-Identifier: Apache-2.0
"""Random pictures, and arrays whose samples lie in unusual ways."""

from __future__ import annotations

import os

import numpy as np
from hypothesis import strategies as st

from definitions import Bytes, half

SIDES = st.integers(1, 70)
SIZES = st.tuples(SIDES, SIDES)
SEEDS = st.integers(0, 2**32 - 1)

# What `out` may be, and what only a source may be.
FORWARD = ["packed", "gaps between rows", "gaps between samples"]
OTHER = ["rows backward", "samples backward", "columns first", "bytes backward"]

GUARD = 0xA5

SANITIZED = "libasan" in os.environ.get("LD_PRELOAD", "")


def noise(seed: int, *shape: int) -> Bytes:
    """Half of the bytes are extreme ones."""
    random = np.random.default_rng(seed)
    bytes = random.integers(0, 256, shape, np.uint8)
    extreme = random.choice(np.array([0, 255], np.uint8), shape)
    return np.where(random.integers(0, 2, shape) == 0, bytes, extreme)


def empty_like(shape: tuple[int, ...], layout: str) -> Bytes:
    """An array of that shape, inside a larger one that is full of GUARD."""
    height, width, *sample = shape
    if layout == "packed":
        whole = np.full((height + 2, width, *sample), GUARD, np.uint8)
        return whole[1:-1]
    if layout == "columns first":
        whole = np.full((width, height, *sample), GUARD, np.uint8)
        return whole.swapaxes(0, 1)
    whole = np.full((2 * height + 1, 3 * width + 2, *sample), GUARD, np.uint8)
    if layout == "gaps between rows":
        return whole[1 : height + 1, 1 : width + 1]
    if layout == "gaps between samples":
        return whole[1::2, 1 : 3 * width : 3]
    if layout == "rows backward":
        return whole[height:0:-1, 1 : width + 1]
    if layout == "samples backward":
        return whole[1 : height + 1, width:0:-1]
    assert layout == "bytes backward"
    return whole[1 : height + 1, 1 : width + 1, ..., ::-1]


def laid_out(array: Bytes, layout: str) -> Bytes:
    """An equal array."""
    result = empty_like(array.shape, layout)
    result[...] = array
    return result


def guard_is_whole(part: Bytes) -> bool:
    """Whether what surrounds such an array is as it was."""
    whole = part.base
    assert whole is not None
    kept = part.copy()
    part[...] = GUARD
    untouched = bool((whole == GUARD).all())
    part[...] = kept
    return untouched


def noise_planes(seed: int, format: str, width: int, height: int) -> tuple[Bytes, ...]:
    """Planes as the package takes them."""
    w, h = half(width), half(height)
    luma = noise(seed, height, width)
    if format == "i420":
        return luma, noise(seed + 1, h, w), noise(seed + 2, h, w)
    return luma, noise(seed + 1, h, w, 2)


def with_samples(planes: tuple[Bytes, ...]) -> list[Bytes]:
    """Planes as the definitions take them: samples of one byte have an axis too."""
    return [plane if plane.ndim == 3 else plane[:, :, None] for plane in planes]


def same_planes(planes: tuple[Bytes, ...], expected: list[Bytes]) -> bool:
    pairs = zip(with_samples(planes), expected)
    return len(planes) == len(expected) and all(np.array_equal(a, b) for a, b in pairs)
