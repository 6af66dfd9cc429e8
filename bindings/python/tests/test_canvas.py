# SPDX-License-Identifier: Apache-2.0
"""Letterboxes against their definition."""

from __future__ import annotations

import numpy as np
import pytest
from hypothesis import given
from hypothesis import strategies as st

import definitions
import ovrinresize as ovrin
from definitions import half
from pictures import FORWARD, OTHER, SEEDS, SIZES, laid_out, noise, noise_planes, same_planes
from pictures import with_samples

CHOICES = {
    "fit": st.sampled_from(ovrin.FITS),
    "gravity": st.sampled_from(ovrin.GRAVITIES),
}
THREADS = st.sampled_from(ovrin.THREADS)
LAYOUTS = st.sampled_from(FORWARD + OTHER)


def scaled(side: int, to: int, by: int) -> int:
    """To the nearest whole number, halves up, and at least 1."""
    return max(1, (2 * side * to + by) // (2 * by))


def inside(room, shape, gravity, grid):
    """The largest rectangle of a shape that a room takes."""
    if shape[0] * room[1] > shape[1] * room[0]:
        size = room[0], scaled(shape[1], room[0], shape[0])
    else:
        size = scaled(shape[0], room[1], shape[1]), room[1]
    across = 0 if "west" in gravity else 2 if "east" in gravity else 1
    down = 0 if "north" in gravity else 2 if "south" in gravity else 1
    x, y = ((r - s) * share // 2 for r, s, share in zip(room, size, (across, down)))
    return x - x % grid, y - y % grid, *size


def placed(src, canvas, fit, gravity, grid):
    part = inside(src, canvas, gravity, grid) if fit == "cover" else (0, 0, *src)
    rect = inside(canvas, src, gravity, grid) if fit == "contain" else (0, 0, *canvas)
    return part, rect


@given(src=SIZES, canvas=SIZES, format=st.sampled_from(ovrin.FORMATS), **CHOICES)
def test_placement(src, canvas, format, fit, gravity):
    grid = 2 if format in ("i420", "nv21") else 1
    result = ovrin.placement(src, canvas, fit=fit, gravity=gravity, format=format)
    assert result == placed(src, canvas, fit, gravity, grid)
    assert result.rect.x == result[1][0]


@given(src=SIZES, size=SIZES, seed=SEEDS, layout=LAYOUTS, threads=THREADS, **CHOICES)
def test_pixels(src, size, seed, layout, threads, fit, gravity):
    picture = noise(seed, src[1], src[0], 4)
    (px, py, pw, ph), (x, y, w, h) = placed(src, size, fit, gravity, 1)
    expected = np.zeros((size[1], size[0], 4), np.uint8)
    part = picture[py : py + ph, px : px + pw]
    expected[y : y + h, x : x + w] = definitions.quarter_pixels(part, w, h)
    canvas = noise(seed, size[1], size[0], 4)
    source = laid_out(picture, layout)
    result = ovrin.letterbox(source, size, fit=fit, gravity=gravity, threads=threads, out=canvas)
    assert result is canvas
    assert np.array_equal(canvas, expected)


@pytest.mark.parametrize("format", ["i420", "nv21"])
@given(src=SIZES, size=SIZES, seed=SEEDS, layout=LAYOUTS, threads=THREADS, **CHOICES)
def test_planes(format, src, size, seed, layout, threads, fit, gravity):
    planes = noise_planes(seed, format, *src)
    (px, py, pw, ph), (x, y, w, h) = placed(src, size, fit, gravity, 2)
    luma, *chroma = with_samples(planes)
    cut = [luma[py : py + ph, px : px + pw]]
    for plane in chroma:
        cut.append(plane[py // 2 :, px // 2 :][: half(ph), : half(pw)])
    expected = []
    drawn = definitions.quarter_planes(cut, w, h)
    for plane, drawn_plane, step in zip(with_samples(planes), drawn, (1, 2, 2)):
        shape = -(-size[1] // step), -(-size[0] // step), plane.shape[2]
        canvas = np.full(shape, 0 if step == 1 else 128, np.uint8)
        rows, columns = drawn_plane.shape[:2]
        canvas[y // step : y // step + rows, x // step : x // step + columns] = drawn_plane
        expected.append(canvas)
    function = {"i420": ovrin.letterbox_i420, "nv21": ovrin.letterbox_nv21}[format]
    given_planes = tuple(
        laid_out(plane, "packed" if layout == "bytes backward" and plane.ndim == 2 else layout)
        for plane in planes
    )
    result = function(given_planes, size, fit=fit, gravity=gravity, threads=threads)
    assert same_planes(result, expected)


def test_rgb_by_placement():
    """What the documentation says for pictures that letterbox does not take."""
    picture = noise(1, 30, 40, 3)
    canvas = np.zeros((50, 50, 3), np.uint8)
    x, y, w, h = ovrin.placement((40, 30), (50, 50)).rect
    ovrin.resize(picture, (w, h), filter="lanczos", out=canvas[y : y + h, x : x + w])
    assert np.array_equal(canvas[y : y + h, x : x + w], definitions.lanczos(picture, w, h))
    assert (w, h) == (50, 38) and not canvas[:y].any() and not canvas[y + h :].any()
