# SPDX-License-Identifier: Apache-2.0
"""Every filter and format against its definition, whatever the strides."""

from __future__ import annotations

import numpy as np
import pytest
from hypothesis import assume, given
from hypothesis import strategies as st

import definitions
import ovrinresize as ovrin
from pictures import (
    FORWARD,
    OTHER,
    SEEDS,
    SIZES,
    empty_like,
    guard_is_whole,
    laid_out,
    noise,
    noise_planes,
    same_planes,
    with_samples,
)

THREADS = st.sampled_from(ovrin.THREADS)
LAYOUTS = st.sampled_from(FORWARD + OTHER)
OUT_LAYOUTS = st.sampled_from(FORWARD)

PIXELS = {
    ("quarter", 3): definitions.quarter_pixels,
    ("quarter", 4): definitions.quarter_pixels,
    ("lanczos", 3): definitions.lanczos,
    ("lanczos", 4): definitions.lanczos,
    ("bilinear", 4): lambda p, w, h: definitions.bilinear_planes([p], w, h)[0],
    ("bilinear_bands", 4): lambda p, w, h: definitions.bilinear_planes([p], w, h)[0],
    ("bilinear_halving", 4): definitions.bilinear_halving,
    ("nearest", 4): lambda p, w, h: definitions.nearest(p, np.zeros((h, w, 4), np.uint8)),
}

PLANES = {
    "quarter": definitions.quarter_planes,
    "bilinear": definitions.bilinear_planes,
    "lanczos": lambda planes, w, h: [definitions.lanczos(planes[0], w, h)]
    + [definitions.lanczos(p, definitions.half(w), definitions.half(h)) for p in planes[1:]],
}

FUNCTIONS = {"i420": ovrin.resize_i420, "nv21": ovrin.resize_nv21}


@pytest.mark.parametrize("filter, channels", PIXELS)
@given(src=SIZES, dst=SIZES, seed=SEEDS, threads=THREADS, layout=LAYOUTS)
def test_pixels(filter, channels, src, dst, seed, threads, layout):
    picture = noise(seed, src[1], src[0], channels)
    expected = PIXELS[filter, channels](picture, *dst)
    result = ovrin.resize(laid_out(picture, layout), dst, filter=filter, threads=threads)
    assert np.array_equal(result, expected)
    assert result.flags.c_contiguous


@given(src=SIZES, dst=SIZES, seed=SEEDS, layout=OUT_LAYOUTS, filter=st.sampled_from(ovrin.FILTERS))
def test_pixels_into_out(src, dst, seed, layout, filter):
    picture = noise(seed, src[1], src[0], 4)
    out = empty_like((dst[1], dst[0], 4), layout)
    before = out.copy()
    result = ovrin.resize(picture, dst, filter=filter, out=out)
    assert result is out
    if filter == "nearest":
        assert np.array_equal(out, definitions.nearest(picture, before))
    else:
        assert np.array_equal(out, PIXELS[filter, 4](picture, *dst))
    assert guard_is_whole(out)


@pytest.mark.parametrize("format", FUNCTIONS)
@pytest.mark.parametrize("filter", PLANES)
@given(src=SIZES, dst=SIZES, seed=SEEDS, threads=THREADS, layouts=st.tuples(*3 * [LAYOUTS]))
def test_planes(format, filter, src, dst, seed, threads, layouts):
    planes = noise_planes(seed, format, *src)
    expected = PLANES[filter](with_samples(planes), *dst)
    given_planes = tuple(
        laid_out(plane, "packed" if layout == "bytes backward" and plane.ndim == 2 else layout)
        for plane, layout in zip(planes, layouts)
    )
    result = FUNCTIONS[format](given_planes, dst, filter=filter, threads=threads)
    assert same_planes(result, expected)
    assert result[0].base.nbytes == ovrin.picture_bytes(format, dst)


@pytest.mark.parametrize("format", FUNCTIONS)
@given(src=SIZES, dst=SIZES, seed=SEEDS, layouts=st.tuples(*3 * [OUT_LAYOUTS]))
def test_planes_into_out(format, src, dst, seed, layouts):
    planes = noise_planes(seed, format, *src)
    shapes = [plane.shape for plane in noise_planes(0, format, *dst)]
    out = tuple(map(empty_like, shapes, layouts))
    assert FUNCTIONS[format](planes, dst, out=out) is out
    assert same_planes(out, definitions.quarter_planes(with_samples(planes), *dst))
    assert all(map(guard_is_whole, out))


@pytest.mark.parametrize("format", FUNCTIONS)
@pytest.mark.parametrize("filter", PLANES)
@given(src=SIZES, dst=SIZES, seed=SEEDS)
def test_planes_of_one_buffer(format, filter, src, dst, seed):
    planes = noise_planes(seed, format, *src)
    split = {"i420": ovrin.i420_planes, "nv21": ovrin.nv21_planes}[format]
    frame = np.concatenate([plane.ravel() for plane in planes])
    small = np.zeros(ovrin.picture_bytes(format, dst) + 5, np.uint8)
    assert all(np.array_equal(a, b) for a, b in zip(split(frame, src), planes))
    FUNCTIONS[format](split(frame, src), dst, filter=filter, out=split(small, dst))
    assert same_planes(split(small, dst), PLANES[filter](with_samples(planes), *dst))
    assert not small[-5:].any()


@given(seed=SEEDS, layout=LAYOUTS)
def test_cameras_planes(seed, layout):
    """U and V as every other byte of one plane."""
    y, vu = noise_planes(seed, "nv21", 64, 48)
    whole = laid_out(vu, layout)
    planes = y, whole[:, :, 1], whole[:, :, 0]
    result = ovrin.resize_i420(planes, (20, 16))
    expected = [y, vu[:, :, 1], vu[:, :, 0]]
    assert same_planes(result, definitions.quarter_planes(with_samples(tuple(expected)), 20, 16))


def test_chroma_of_out_may_take_turns():
    planes = noise_planes(3, "i420", 40, 30)
    luma, pairs = np.zeros((15, 20), np.uint8), np.zeros((8, 10, 2), np.uint8)
    ovrin.resize_i420(planes, (20, 15), out=(luma, pairs[:, :, 0], pairs[:, :, 1]))
    expected = definitions.quarter_planes(with_samples(planes), 20, 15)
    assert same_planes((luma, pairs[:, :, 0], pairs[:, :, 1]), expected)


@given(size=SIZES, dst=SIZES, value=SEEDS)
def test_one_pixel_for_all(size, dst, value):
    """Strides of 0 are not what the library takes them for, packed rows."""
    pixel = noise(value, 1, 1, 4)
    picture = np.broadcast_to(pixel, (size[1], size[0], 4))
    expected = definitions.quarter_pixels(picture, *dst)
    assert np.array_equal(ovrin.resize(picture, dst), expected)


@pytest.mark.parametrize("threads", ovrin.THREADS)
@pytest.mark.parametrize("filter", ["quarter", "lanczos", "bilinear"])
def test_tall_pictures(filter, threads):
    """Tall enough for threads."""
    picture = noise(7, 2100, 37, 4)
    result = ovrin.resize(picture, (11, 1030), filter=filter, threads=threads)
    assert np.array_equal(result, PIXELS[filter, 4](picture, 11, 1030))


def test_tall_results_of_bands_are_not_interpolated():
    picture = noise(8, 1500, 20, 4)
    result = ovrin.resize(picture, (15, 1200), filter="bilinear_bands")
    assert np.array_equal(result, definitions.top_left(picture, 15, 1200))


@given(src=st.tuples(*2 * [st.integers(60, 200)]), by=st.integers(4, 20), seed=SEEDS)
def test_large_reductions_by_halves(src, by, seed):
    dst = src[0] // by, src[1] // by
    assume(min(dst) > 0)
    picture = noise(seed, src[1], src[0], 4)
    result = ovrin.resize(picture, dst, filter="bilinear_halving")
    assert np.array_equal(result, definitions.bilinear_halving(picture, *dst))


@given(size=SIZES, dst=SIZES, seed=SEEDS)
def test_alpha(size, dst, seed):
    """Premultiplied colours come back; what is transparent does not show."""
    picture = noise(seed, size[1], size[0], 4)
    picture[..., 3] = np.where(picture[..., 3] < 128, 0, 255)
    multiplied = laid_out(picture, "gaps between samples")
    ovrin.premultiply(multiplied)
    assert np.array_equal(multiplied, np.where(picture[..., 3:] == 0, 0, picture) * (1, 1, 1, 1))
    assert guard_is_whole(multiplied)
    ovrin.unpremultiply(multiplied)
    assert np.array_equal(multiplied[picture[..., 3] == 255], picture[picture[..., 3] == 255])


def test_white_after():
    white = np.full((8, 8, 4), 255, np.uint8)
    for filter in ovrin.FILTERS:
        result = ovrin.resize(white, (4, 4), filter=filter)
        assert set(result.ravel().tolist()) == {ovrin.white_after(filter)}
    ovrin.unpremultiply(result := ovrin.resize(white, (4, 4)), ovrin.white_after("quarter"))
    assert set(result[..., 3].ravel().tolist()) == {255}
