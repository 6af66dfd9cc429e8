# SPDX-License-Identifier: Apache-2.0
"""What is wrong is said in a sentence, and nothing is written."""

from __future__ import annotations

import re
import resource

import numpy as np
import pytest

import ovrinresize as ovrin
from pictures import SANITIZED, noise, noise_planes

U8 = np.uint8
RGBA = noise(1, 6, 8, 4)
RGB = noise(2, 6, 8, 3)
I420 = noise_planes(3, "i420", 8, 6)
NV21 = noise_planes(4, "nv21", 8, 6)
READ_ONLY = np.frombuffer(bytes(4 * 3 * 4), U8).reshape(3, 4, 4)
LONG = np.broadcast_to(RGBA[:1, :1], (3_000_000_000, 1, 4))


def out(*shape):
    return np.full(shape, 7, U8)


def i420_out(width, height):
    return ovrin.i420_planes(out(ovrin.picture_bytes("i420", (width, height))), (width, height))


RESIZE = [
    # Pictures
    ([[1, 2]], (2, 2), {}, TypeError, "src: a numpy array of uint8 is needed, not list"),
    (None, (2, 2), {}, TypeError, "src: a numpy array of uint8 is needed, not NoneType"),
    (RGBA.astype(np.float32), (2, 2), {}, TypeError,
     "src: a numpy array of uint8 is needed, not of float32"),
    (RGBA.astype(np.int8), (2, 2), {}, TypeError, "src: a numpy array of uint8 is needed, not of int8"),
    (RGBA[:, :, 0], (2, 2), {}, ValueError,
     "src: the shape (6, 8) is no picture; (height, width, 4) is RGBA8888, (height, width, 3) RGB888"),
    (RGBA[:, :, :2], (2, 2), {}, ValueError,
     "src: the shape (6, 8, 2) is no picture; (height, width, 4) is RGBA8888, (height, width, 3) RGB888"),
    (RGBA[:0], (2, 2), {}, ValueError, "src: RGBA8888 8x0 is empty"),
    (RGB[:, :0], (2, 2), {}, ValueError, "src: RGB888 0x6 is empty"),
    (np.zeros((1, 32768, 4), U8), (2, 2), {}, ValueError,
     "src: RGBA8888 32768x1 is too large, sides go up to 32767"),
    (LONG, (2, 2), {}, ValueError, "src: 1x3000000000 is too large, sides go up to 32767"),
    # Sizes
    (RGBA, (0, 2), {}, ValueError, "dst: RGBA8888 0x2 is empty"),
    (RGBA, (2, -5), {}, ValueError, "dst: RGBA8888 2x-5 is empty"),
    (RGBA, (32768, 1), {}, ValueError, "dst: RGBA8888 32768x1 is too large, sides go up to 32767"),
    (RGBA, (2**40, 1), {}, ValueError, "dst: 1099511627776x1 is too large, sides go up to 32767"),
    (RGBA, (-(2**80), 1), {}, ValueError,
     "dst: -1208925819614629174706176x1 is too large, sides go up to 32767"),
    (RGBA, 4, {}, TypeError, "dst: a size is two whole numbers, (width, height), not 4"),
    (RGBA, (4, 3, 2), {}, TypeError,
     "dst: a size is two whole numbers, (width, height), not (4, 3, 2)"),
    (RGBA, (4.0, 3), {}, TypeError, "dst: a size is two whole numbers, (width, height), not (4.0, 3)"),
    # Names
    (RGBA, (4, 3), {"filter": "cubic"}, ValueError,
     "filter 'cubic' is unknown; there are quarter, nearest, bilinear, bilinear_bands, "
     "bilinear_halving, lanczos"),
    (RGBA, (4, 3), {"filter": 1}, TypeError, "filter: a name is needed, not int"),
    (RGBA, (4, 3), {"threads": "some"}, ValueError,
     "threads 'some' is unknown; there are auto, one, many"),
    (RGBA, (4, 3), {"threads": 4}, TypeError, "threads: a name is needed, not int"),
    (RGB, (4, 3), {"filter": "nearest"}, ValueError, "the nearest filter takes RGBA8888, not RGB888"),
    (RGB, (4, 3), {"filter": "bilinear"}, ValueError, "the bilinear filter does not take RGB888"),
    # Results
    (RGBA, (4, 3), {"out": [1]}, TypeError, "dst: a numpy array of uint8 is needed, not list"),
    (RGBA, (4, 3), {"out": out(3, 4, 4).astype(np.uint16)}, TypeError,
     "dst: a numpy array of uint8 is needed, not of uint16"),
    (RGBA, (4, 3), {"out": out(4, 3, 4)}, ValueError,
     "dst: RGBA needs the shape (3, 4, 4), has (4, 3, 4)"),
    (RGBA, (4, 3), {"out": out(48)}, ValueError, "dst: RGBA needs the shape (3, 4, 4), has (48,)"),
    (RGBA, (4, 3), {"out": out(3, 4, 3)}, ValueError,
     "dst: RGBA needs the shape (3, 4, 4), has (3, 4, 3)"),
    (RGBA, (4, 3), {"out": READ_ONLY}, ValueError, "dst: the array is read-only"),
    (RGBA, (4, 3), {"out": out(3, 4, 4)[::-1]}, ValueError,
     "dst: strides of (-16, 4, 1) cannot be written; rows and samples must go forward, and the bytes of "
     "a sample lie side by side"),
    (RGBA, (4, 3), {"out": out(3, 4, 4)[..., ::-1]}, ValueError,
     "dst: strides of (16, 4, -1) cannot be written; rows and samples must go forward, and the bytes of "
     "a sample lie side by side"),
    (RGBA, (8, 6), {"out": RGBA}, ValueError, "src and dst: RGBA and RGBA overlap in 192 bytes"),
    (RGBA, (4, 3), {"out": RGBA[3:, 4:]}, ValueError,
     "src and dst: RGBA and RGBA overlap in 80 bytes"),
]  # fmt: skip

PLANES = [
    (ovrin.resize_i420, I420[0], (4, 3), {}, TypeError,
     "src: a tuple of planes is needed, not ndarray"),
    (ovrin.resize_i420, I420[:2], (4, 3), {}, ValueError, "src: 3 planes are needed, not 2"),
    (ovrin.resize_nv21, I420, (4, 3), {}, ValueError, "src: 2 planes are needed, not 3"),
    (ovrin.resize_nv21, (*NV21[:1], [1]), (4, 3), {}, TypeError,
     "src: a numpy array of uint8 is needed, not list"),
    (ovrin.resize_i420, (RGBA, *I420[1:]), (4, 3), {}, ValueError,
     "src: Y needs 2 axes, has the shape (6, 8, 4)"),
    (ovrin.resize_i420, (I420[0], I420[1], I420[2][1:]), (4, 3), {}, ValueError,
     "src: V needs the shape (3, 4), has (2, 4)"),
    (ovrin.resize_nv21, (NV21[0], I420[1]), (4, 3), {}, ValueError,
     "src: VU needs the shape (3, 4, 2), has (3, 4)"),
    (ovrin.resize_nv21, (NV21[0][:0], NV21[1]), (4, 3), {}, ValueError, "src: NV21 8x0 is empty"),
    (ovrin.resize_i420, I420, (4, 0), {}, ValueError, "dst: I420 4x0 is empty"),
    (ovrin.resize_i420, I420, (4, 3), {"out": out(18)}, TypeError,
     "dst: a tuple of planes is needed, not ndarray"),
    (ovrin.resize_i420, I420, (4, 3), {"out": i420_out(4, 4)}, ValueError,
     "dst: Y needs the shape (3, 4), has (4, 4)"),
    (ovrin.resize_i420, I420, (4, 3), {"filter": "nearest"}, ValueError,
     "the nearest filter takes RGBA8888, not I420"),
    (ovrin.resize_i420, I420, (2, 2), {"out": (out(2, 2), *2 * [out(1, 1)])}, ValueError,
     "dst: U and V plane of I420 2x2 overlap"),
    (ovrin.letterbox, RGB, (4, 3), {}, ValueError,
     "a canvas takes RGBA8888, I420 or NV21, not RGB888"),
    (ovrin.letterbox, RGBA, (0, 3), {}, ValueError, "canvas: RGBA8888 0x3 is empty"),
    (ovrin.letterbox, RGBA, (4, 3), {"fit": "crop"}, ValueError,
     "fit 'crop' is unknown; there are contain, cover, fill"),
    (ovrin.letterbox, RGBA, (4, 3), {"gravity": "up"}, ValueError,
     "gravity 'up' is unknown; there are northwest, north, northeast, west, center, east, southwest, "
     "south, southeast"),
    (ovrin.letterbox, RGBA, (4, 3), {"out": out(3, 8, 4)[:, :4]}, ValueError,
     "canvas: RGBA8888 4x3 must be packed in one buffer"),
    (ovrin.letterbox, RGBA, (4, 3), {"out": out(49)[1:].reshape(3, 4, 4)}, ValueError,
     "canvas: RGBA8888 must lie at a multiple of 4 bytes"),
    (ovrin.letterbox, RGBA, (8, 6), {"out": RGBA}, ValueError,
     "src and canvas: RGBA and RGBA overlap in 192 bytes"),
    (ovrin.letterbox_i420, I420, (2, 2), {"out": (out(2, 2), out(1, 1), out(1, 1))}, ValueError,
     "canvas: I420 2x2 must be packed in one buffer"),
    (ovrin.letterbox_nv21, NV21, (2, 2), {"out": (out(2, 2),)}, ValueError,
     "canvas: 2 planes are needed, not 1"),
    (ovrin.i420_planes, out(17), (4, 3), {}, ValueError, "buffer: I420 4x3 needs 20 bytes, has 17"),
    (ovrin.nv21_planes, out(40)[::2], (4, 3), {}, ValueError, "buffer: the array must be C-contiguous"),
    (ovrin.nv21_planes, bytes(40), (4, 3), {}, TypeError,
     "buffer: a numpy array of uint8 is needed, not bytes"),
    (ovrin.nv21_planes, np.zeros(40), (4, 3), {}, TypeError,
     "buffer: a numpy array of uint8 is needed, not of float64"),
    (ovrin.nv21_planes, out(40), (4, 0), {}, ValueError, "buffer: NV21 4x0 is empty"),
    (ovrin.picture_bytes, "yuv", (4, 3), {}, ValueError,
     "format 'yuv' is unknown; there are rgba, rgb, i420, nv21"),
    (ovrin.picture_bytes, "rgb", (4, 0), {}, ValueError, "picture: RGB888 4x0 is empty"),
    (ovrin.placement, (0, 5), (4, 3), {}, ValueError, "src: RGBA8888 0x5 is empty"),
    (ovrin.placement, (5, 5), (4, 40000), {}, ValueError,
     "canvas: RGBA8888 4x40000 is too large, sides go up to 32767"),
    (ovrin.unpremultiply, out(3, 4, 4), 256, {}, ValueError, "opaque is 256, not 1 to 255"),
    (ovrin.unpremultiply, out(3, 4, 3), 255, {}, ValueError,
     "picture: RGBA needs the shape (3, 4, 4), has (3, 4, 3)"),
    (ovrin.unpremultiply, READ_ONLY, 255, {}, ValueError, "picture: the array is read-only"),
]  # fmt: skip


def raises(error, sentence):
    return pytest.raises(error, match="^" + re.escape(sentence) + "$")


@pytest.mark.parametrize("picture, size, options, error, sentence", RESIZE)
def test_resize(picture, size, options, error, sentence):
    result = options.get("out")
    before = result.copy() if isinstance(result, np.ndarray) else None
    with raises(error, sentence):
        ovrin.resize(picture, size, **options)
    assert before is None or np.array_equal(result, before)


@pytest.mark.parametrize("function, first, second, options, error, sentence", PLANES)
def test_others(function, first, second, options, error, sentence):
    with raises(error, sentence):
        function(first, second, **options)


# Of as much memory as nobody has touched. numpy copies the first; the C++ layer the second.
LARGE = {
    "rows backward": lambda: np.zeros((20000, 20000, 4), U8)[::-1],
    "gaps between rows": lambda: np.zeros((20000, 20001, 4), U8)[:, 1:],
}


@pytest.mark.skipif(SANITIZED, reason="the sanitizer takes more memory than there could be")
@pytest.mark.parametrize("layout", LARGE)
def test_no_memory(layout):
    """For a copy, where the process may not have so much."""
    picture = LARGE[layout]()
    with open("/proc/self/statm", encoding="ascii") as statm:
        pages = int(statm.read().split()[0])
    limits = resource.getrlimit(resource.RLIMIT_AS)
    resource.setrlimit(resource.RLIMIT_AS, (pages * resource.getpagesize() + 2**28, limits[1]))
    try:
        with pytest.raises(MemoryError, match="1600000000 bytes|1.49 GiB"):
            ovrin.resize(picture, (1, 1))
    finally:
        resource.setrlimit(resource.RLIMIT_AS, limits)


def test_names_are_those_of_the_module():
    """Every name that the types offer is one that the compiled module knows."""
    for format in ovrin.FORMATS:
        assert ovrin.picture_bytes(format, (2, 2)) in (6, 12, 16)
    for fit in ovrin.FITS:
        for gravity in ovrin.GRAVITIES:
            ovrin.placement((2, 2), (2, 2), fit=fit, gravity=gravity)
