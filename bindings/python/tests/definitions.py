# SPDX-License-Identifier: Apache-2.0
"""What the filters are, in numpy. Shares nothing with the library.

A plane is an array of shape (height, width, bytes of a sample).
"""

from __future__ import annotations

import functools
import itertools
import math

import numpy as np
from numpy.typing import NDArray

Bytes = NDArray[np.uint8]
Numbers = NDArray[np.int64]


def half(side: int) -> int:
    return (side + 1) // 2


# ---- Quarter --------------------------------------------------------------------------------------


def quarter_points(src: int, dst: int) -> tuple[Numbers, Numbers]:
    """Where the quarter and the three-quarter point of each of dst cells lie among src cells."""
    k = np.arange(dst, dtype=np.int64)
    return (k * src + src // 4) // dst, (k * src + 3 * src // 4) // dst


def quarter(plane: Bytes, width: int, height: int) -> Bytes:
    """Positions in a row are computed in bytes, and count samples."""
    sample = plane.shape[2]
    rows = quarter_points(plane.shape[0], height)
    columns = [c[:width] for c in quarter_points(plane.shape[1] * sample, width * sample)]
    parts = plane >> 2
    return sum(parts[r][:, c] for r in rows for c in columns).astype(np.uint8)


def quarter_pixels(picture: Bytes, width: int, height: int) -> Bytes:
    """Pixels: positions are computed in pixels."""
    rows = quarter_points(picture.shape[0], height)
    columns = quarter_points(picture.shape[1], width)
    parts = picture >> 2
    return sum(parts[r][:, c] for r in rows for c in columns).astype(np.uint8)


def quarter_planes(planes: list[Bytes], width: int, height: int) -> list[Bytes]:
    """Chroma is sampled for sizes rounded up to multiples of 4, and cut."""
    luma, *chroma = planes
    grid_width, grid_height = -(-width // 4) * 4, -(-height // 4) * 4
    grids = [quarter(plane, grid_width // 2, grid_height // 2) for plane in chroma]
    return [quarter(luma, width, height)] + [g[: half(height), : half(width)] for g in grids]


# ---- Nearest --------------------------------------------------------------------------------------


def nearest_points(src: int, dst: int) -> Numbers:
    step = int(src / dst + 0.5)
    points = np.arange(dst, dtype=np.int64) * step + math.ceil(step / 2)
    return points[points < src]


def nearest(picture: Bytes, before: Bytes) -> Bytes:
    """Each row closes up to its left; the rest keeps what was there."""
    result = before.copy()
    rows = nearest_points(picture.shape[0], before.shape[0])
    columns = nearest_points(picture.shape[1], before.shape[1])
    result[: len(rows), : len(columns)] = picture[rows][:, columns]
    return result


# ---- Bilinear -------------------------------------------------------------------------------------


def bilinear_axis(src: int, dst: int) -> tuple[Numbers, Numbers, int]:
    """The sample before each position, the weight of the one after it in 4096ths, and the first position
    that has no sample after it."""
    positions = np.arange(dst, dtype=np.float32) * (np.float32(src) / np.float32(dst))
    index = positions.astype(np.int64)
    fraction = positions - index.astype(np.float32)
    weight = ((fraction.astype(np.float64) + 0.25) * 4096).astype(np.int64)
    last = np.flatnonzero(index == src - 2)
    return index, weight, int(last[0]) if len(last) else dst


class Blend:
    """Blends samples of a packed picture with their neighbours. Behind the picture its last row, of
    `repeat` bytes, is repeated."""

    def __init__(self, packed: Bytes, repeat: int, src: tuple[int, int], dst: tuple[int, int]):
        self.packed = packed
        self.repeat = repeat
        self.columns = bilinear_axis(src[0], dst[0])
        self.rows = bilinear_axis(src[1], dst[1])

    def at(self, offsets: Numbers) -> Numbers:
        end = len(self.packed)
        behind = np.maximum(offsets - end, 0) % self.repeat + end - self.repeat
        return self.packed[np.where(offsets < end, offsets, behind)].astype(np.int64)

    def __call__(
        self, first: Numbers, right: int, down: int, down_at_edge: int, every: int = 1
    ) -> Bytes:
        """`first`: the offsets of the upper left samples, for every so many positions."""
        wx = self.columns[1][::every][None, :, None]
        wy = self.rows[1][::every][:, None, None]
        at_right = np.arange(0, len(self.columns[0]), every)[None, :, None] >= self.columns[2]
        at_bottom = np.arange(0, len(self.rows[0]), every)[:, None, None] >= self.rows[2]
        wx = np.where(at_right & ~at_bottom, 0, wx)
        wy = np.where(at_bottom, 0, wy)
        below = first + np.where(at_right, down_at_edge, down)
        upper = self.at(first) * (4096 - wx) + self.at(first + right) * wx
        lower = self.at(below) * (4096 - wx) + self.at(below + right) * wx
        return (((upper * (4096 - wy) + lower * wy) & 0xFFFFFFFF) >> 24).astype(np.uint8)

    def luma(self, width: int, sample: int) -> Bytes:
        offsets = (self.rows[0][:, None] * width + self.columns[0][None, :]) * sample
        pitch = width * sample
        return self(offsets[:, :, None] + np.arange(sample), sample, pitch, pitch)

    def chroma(self, start: int, width: int, sample: int) -> Bytes:
        """Takes every other luma position. U and V round columns up, pairs down; and at the right edge, U
        and V take a row of luma for a row of theirs."""
        pitch = half(width) * sample
        columns = self.columns[0][::2]
        columns = (columns + 1) // 2 if sample == 1 else columns // 2
        offsets = start + (self.rows[0][::2] // 2)[:, None] * pitch + columns[None, :] * sample
        at_edge = width if sample == 1 else pitch
        return self(offsets[:, :, None] + np.arange(sample), sample, pitch, at_edge, 2)


def bilinear_planes(planes: list[Bytes], width: int, height: int) -> list[Bytes]:
    packed = np.concatenate([plane.ravel() for plane in planes])
    src_height, src_width, sample = planes[0].shape
    repeat = planes[-1].shape[1] * planes[-1].shape[2]
    blend = Blend(packed, repeat, (src_width, src_height), (width, height))
    result = [blend.luma(src_width, sample)]
    start = planes[0].size
    for plane in planes[1:]:
        result.append(blend.chroma(start, src_width, plane.shape[2]))
        start += plane.size
    return result


def top_left(picture: Bytes, width: int, height: int) -> Bytes:
    """What bands make of tall results."""
    rows, columns = bilinear_axis(picture.shape[0], height), bilinear_axis(picture.shape[1], width)
    return picture[rows[0]][:, columns[0]]


def bilinear_halving(picture: Bytes, width: int, height: int) -> Bytes:
    """Two buffers take turns; what one held before lies behind the picture that it holds now."""
    h, w, _ = picture.shape
    sizes = [(width, height)]
    if width * height <= w * h:
        by = 1
        while by < min(w // width, h // height) // 2:
            sizes.insert(-1, (w // (2 * by), h // (2 * by)))
            by *= 2
    buffers = np.zeros((2, w * h), np.uint8)
    packed, repeat = picture.ravel(), w * 4
    for i, size in enumerate(sizes):
        picture = Blend(packed, repeat, (w, h), size).luma(w, 4)
        if i + 1 < len(sizes):
            packed = buffers[i % 2]
            packed[: picture.size] = picture.ravel()
            w, h = size
    return picture


# ---- Lanczos --------------------------------------------------------------------------------------


@functools.lru_cache(None)
def lanczos_table() -> NDArray[np.float64]:
    def sinc(x: float) -> float:
        return 1.0 if x < 0.00025 else math.sin(math.pi * x) / (math.pi * x)

    distances = np.concatenate(([0.0], np.cumsum(np.full(15999, 0.00025))))
    weights = [0.0 if x >= 3 else sinc(x) * sinc(x / 3) for x in distances.tolist()]
    return np.array(weights, np.float32).astype(np.float64)


def lanczos_axis(positions: list[float], src: int) -> tuple[Numbers, NDArray[np.float64]]:
    """For each position the seven samples around it, clamped, and their weights."""
    table = lanczos_table()
    scale = float(np.float32(len(positions)) / np.float32(src))
    samples, weights = [], []
    for position in positions:
        fraction = position - int(position)
        raw = []
        for step in range(-3, 4):
            distance = (fraction + step) * scale if scale < 1 else fraction + step
            raw.append(float(table[min(int(abs(distance) * 4000), 15999)]))
        total = functools.reduce(lambda a, b: a + b, raw)
        samples.append(np.clip(np.arange(-3, 4) + int(position), 0, src - 1))
        weights.append([weight / total for weight in reversed(raw)])
    return np.array(samples), np.array(weights)


def lanczos(plane: Bytes, width: int, height: int) -> Bytes:
    """Sums are in double precision, and each product joins its sum unrounded: that of a double and a byte
    fits the longer format that they are added in."""
    src_height, src_width, sample = plane.shape
    ratio = src_width / width
    across = list(itertools.accumulate(itertools.repeat(ratio, width - 1), initial=0.0))
    columns, column_weights = lanczos_axis(across, src_width)
    rows, row_weights = lanczos_axis([src_height / height * y for y in range(height)], src_height)
    total = np.zeros((height, width, sample))
    for j, i in itertools.product(range(7), range(7)):
        weight = row_weights[:, j, None] * column_weights[None, :, i]
        taps = plane[rows[:, j]][:, columns[:, i]]
        total = (total + weight.astype(np.longdouble)[:, :, None] * taps).astype(np.float64)
    return np.clip(np.trunc(total + 0.5), 0, 255).astype(np.uint8)
