# SPDX-License-Identifier: Apache-2.0
"""Small, fast resizing of raw pictures in memory, as numpy arrays.

Pictures are arrays of uint8, rows first. Sizes are ``(width, height)`` in pixels, each from 1 to
LARGEST_SIDE, as they are for Pillow and OpenCV.

==========  ===========================================  ================================
Format      Arrays                                       Functions
==========  ===========================================  ================================
RGBA8888    ``(height, width, 4)``                       resize, letterbox
RGB888      ``(height, width, 3)``                       resize
I420        Y ``(height, width)``, U and V               resize_i420, letterbox_i420
            ``((height + 1) // 2, (width + 1) // 2)``
NV21        Y ``(height, width)``, VU                    resize_nv21, letterbox_nv21
            ``((height + 1) // 2, (width + 1) // 2, 2)``
==========  ===========================================  ================================

Channels may come in any order: BGR stays BGR.

What is wrong raises before anything is written: TypeError for something that is no array of uint8,
ValueError for shapes, sizes, names and arrays that share memory, MemoryError. In its sentence "src" is
the picture, and "dst" or "canvas" the result or ``out``.

A picture may have any strides; it is copied when rows or pixels do not go forward (``picture[::-1]``),
or when the bytes of a pixel do not lie side by side (``picture[..., ::-1]``). An ``out`` like that is a
ValueError; any other may have gaps between its rows and pixels, and so be a part of a larger array.

The interpreter's lock is released while pixels are worked on: other threads run on. They must not
write to the arrays meanwhile.
"""

from __future__ import annotations

import operator
from typing import Literal, NamedTuple, Optional, Tuple, get_args

import numpy as np
from numpy.typing import NDArray

from . import _native

__all__ = [
    "FILTERS",
    "FITS",
    "FORMATS",
    "GRAVITIES",
    "LARGEST_SIDE",
    "THREADS",
    "Filter",
    "Fit",
    "Format",
    "Gravity",
    "I420",
    "Nv21",
    "Picture",
    "Placement",
    "Rect",
    "Size",
    "Threads",
    "i420_planes",
    "letterbox",
    "letterbox_i420",
    "letterbox_nv21",
    "nv21_planes",
    "picture_bytes",
    "placement",
    "premultiply",
    "resize",
    "resize_i420",
    "resize_nv21",
    "unpremultiply",
    "white_after",
]

__version__ = _native.VERSION

LARGEST_SIDE = _native.LARGEST_SIDE
"""The largest width and height, in pixels."""

Format = Literal["rgba", "rgb", "i420", "nv21"]
FORMATS: Tuple[Format, ...] = get_args(Format)

Filter = Literal[
    "quarter", "nearest", "bilinear", "bilinear_bands", "bilinear_halving", "lanczos"
]
"""How pixels are made.

- ``quarter``: from four source pixels; the fastest, for all formats. White (255) becomes 252.
- ``nearest``: copies pixels, at whole-number steps. RGBA only. What a step leaves uncovered keeps
  what ``out`` held, or is 0.
- ``bilinear``: fixed point; all formats but RGB.
- ``bilinear_bands``: the same with threads; from 1024 rows of the result on, not interpolated.
- ``bilinear_halving``: for large reductions, by halves first.
- ``lanczos``: seven taps in either direction; the sharpest and the slowest, for all formats.
"""

FILTERS: Tuple[Filter, ...] = get_args(Filter)

Threads = Literal["auto", "one", "many"]
"""Never changes a byte. ``auto``: four more threads from 1024 source rows on, where the filter has any;
``one``: the calling thread only; ``many``: threads for small pictures too. The filters bilinear_bands and
bilinear_halving choose for themselves."""

THREADS: Tuple[Threads, ...] = get_args(Threads)

Fit = Literal["contain", "cover", "fill"]
"""``contain``: the whole picture, with bars at two sides; ``cover``: the whole canvas, with two sides of
the picture cut off; ``fill``: both whole, the picture's shape gives way."""

FITS: Tuple[Fit, ...] = get_args(Fit)

Gravity = Literal[
    "northwest", "north", "northeast",
    "west", "center", "east",
    "southwest", "south", "southeast",
]  # fmt: skip
"""Where the picture goes when there is room, and which part stays when some is cut off."""

GRAVITIES: Tuple[Gravity, ...] = get_args(Gravity)

Size = Tuple[int, int]
"""Width and height in pixels."""

Picture = NDArray[np.uint8]
"""Shape ``(height, width, 4)`` or ``(height, width, 3)``."""

I420 = Tuple[NDArray[np.uint8], NDArray[np.uint8], NDArray[np.uint8]]
"""Planes Y, U and V."""

Nv21 = Tuple[NDArray[np.uint8], NDArray[np.uint8]]
"""Planes Y and VU."""


class Rect(NamedTuple):
    """Pixels; x and y are those of the upper left corner."""

    x: int
    y: int
    width: int
    height: int


class Placement(NamedTuple):
    """Which part of a picture is shown, and in which rectangle of the canvas."""

    part: Rect
    rect: Rect


def _sides(size: Size, name: str) -> Size:
    try:
        width, height = (operator.index(side) for side in size)
    except (TypeError, ValueError):
        message = f"{name}: a size is two whole numbers, (width, height), not {size!r}"
        raise TypeError(message) from None
    if max(abs(width), abs(height)) >= 2**31:
        message = f"{name}: {width}x{height} is too large, sides go up to {LARGEST_SIDE}"
        raise ValueError(message)
    return width, height


def _bytes(format: Format, size: Size, name: str) -> int:
    return _native.picture_bytes(format, *_sides(size, name), name)


def _format_of(picture: Picture) -> Format:
    if not isinstance(picture, np.ndarray):
        return "rgba"  # the compiled module says what it is instead
    channels = picture.shape[2] if picture.ndim == 3 else 0
    if channels not in (3, 4):
        raise ValueError(
            f"src: the shape {picture.shape} is no picture; "
            "(height, width, 4) is RGBA8888, (height, width, 3) RGB888"
        )
    return "rgb" if channels == 3 else "rgba"


def _planes(planes: Tuple[NDArray[np.uint8], ...], name: str) -> Tuple[NDArray[np.uint8], ...]:
    if not isinstance(planes, (tuple, list)):
        raise TypeError(f"{name}: a tuple of planes is needed, not {type(planes).__name__}")
    return tuple(planes)


def _new(format: Format, size: Size, name: str, filter: Filter = "quarter") -> NDArray[np.uint8]:
    """Memory for a packed picture. All filters but nearest write all of it."""
    make = np.zeros if filter == "nearest" else np.empty
    return make(_bytes(format, size, name), np.uint8)


def _half(side: int) -> int:
    return (side + 1) // 2


# ---- Pictures of pixels ---------------------------------------------------------------------------


def resize(
    picture: Picture,
    size: Size,
    *,
    filter: Filter = "quarter",
    threads: Threads = "auto",
    out: Optional[Picture] = None,
) -> Picture:
    """Resizes pixels of four bytes, or of three.

    :param picture: ``(height, width, 4)`` or ``(height, width, 3)``.
    :param size: of the result: width and height in pixels.
    :param out: where the result goes: an array of its shape that shares no memory with the picture.
    :return: ``out``, or a new array of shape ``(size[1], size[0], channels)``.
    """
    format = _format_of(picture)
    width, height = _sides(size, "dst")
    if out is None:
        out = _new(format, size, "dst", filter).reshape(height, width, -1)
    _native.resize(format, (picture,), (out,), width, height, filter, threads)
    return out


def letterbox(
    picture: Picture,
    size: Size,
    *,
    fit: Fit = "contain",
    gravity: Gravity = "center",
    threads: Threads = "auto",
    out: Optional[Picture] = None,
) -> Picture:
    """Puts RGBA pixels on a canvas of zeros, by the quarter filter.

    :param picture: ``(height, width, 4)``. RGB is a ValueError: ``placement`` and ``resize`` do that.
    :param size: of the canvas: width and height in pixels.
    :param out: the canvas: a C-contiguous array of its shape, at an address that is a multiple of 4.
    :return: ``out``, or a new array of shape ``(size[1], size[0], 4)``.
    """
    format = _format_of(picture)
    width, height = _sides(size, "canvas")
    if out is None:
        out = _new(format, size, "canvas").reshape(height, width, -1)
    _native.letterbox(format, (picture,), (out,), width, height, fit, gravity, threads)
    return out


# ---- Pictures in 4:2:0 ----------------------------------------------------------------------------


def _packed(format: Format, buffer: NDArray[np.uint8], size: Size) -> NDArray[np.uint8]:
    """The buffer's first bytes, as many as the picture has, in one row."""
    if not isinstance(buffer, np.ndarray):
        raise TypeError(f"buffer: a numpy array of uint8 is needed, not {type(buffer).__name__}")
    if buffer.dtype != np.uint8:
        raise TypeError(f"buffer: a numpy array of uint8 is needed, not of {buffer.dtype}")
    if not buffer.flags.c_contiguous:
        raise ValueError("buffer: the array must be C-contiguous")
    count = _bytes(format, size, "buffer")
    if buffer.size < count:
        width, height = size
        raise ValueError(
            f"buffer: {format.upper()} {width}x{height} needs {count} bytes, has {buffer.size}"
        )
    return buffer.reshape(-1)[:count]


def i420_planes(buffer: NDArray[np.uint8], size: Size) -> I420:
    """Y, U and V of a picture that lies packed in one buffer, as views of it.

    :param buffer: C-contiguous, of any shape, at least ``picture_bytes("i420", size)`` long.
    :param size: of the picture: width and height in pixels.
    """
    width, height = _sides(size, "buffer")
    packed = _packed("i420", buffer, (width, height))
    luma, chroma = width * height, _half(width) * _half(height)
    y, u, v = np.split(packed, (luma, luma + chroma))
    shape = (_half(height), _half(width))
    return y.reshape(height, width), u.reshape(shape), v.reshape(shape)


def nv21_planes(buffer: NDArray[np.uint8], size: Size) -> Nv21:
    """Y and VU of a picture that lies packed in one buffer, as views of it.

    :param buffer: C-contiguous, of any shape, at least ``picture_bytes("nv21", size)`` long.
    :param size: of the picture: width and height in pixels.
    """
    width, height = _sides(size, "buffer")
    packed = _packed("nv21", buffer, (width, height))
    y, vu = np.split(packed, (width * height,))
    return y.reshape(height, width), vu.reshape(_half(height), _half(width), 2)


def resize_i420(
    planes: I420,
    size: Size,
    *,
    filter: Filter = "quarter",
    threads: Threads = "auto",
    out: Optional[I420] = None,
) -> I420:
    """Resizes Y, U and V.

    :param planes: Y ``(height, width)``; U and V ``((height + 1) // 2, (width + 1) // 2)``.
    :param size: of the result: width and height in pixels.
    :param out: where the result goes: three arrays of its shapes.
    :return: ``out``, or new planes, which lie packed in one buffer: ``result[0].base``.
    """
    width, height = _sides(size, "dst")
    if out is None:
        out = i420_planes(_new("i420", size, "dst"), size)
    src, dst = _planes(planes, "src"), _planes(out, "dst")
    _native.resize("i420", src, dst, width, height, filter, threads)
    return out


def resize_nv21(
    planes: Nv21,
    size: Size,
    *,
    filter: Filter = "quarter",
    threads: Threads = "auto",
    out: Optional[Nv21] = None,
) -> Nv21:
    """Resizes Y and VU. NV12 is the same with U before V.

    :param planes: Y ``(height, width)``; VU ``((height + 1) // 2, (width + 1) // 2, 2)``.
    :param size: of the result: width and height in pixels.
    :param out: where the result goes: two arrays of its shapes.
    :return: ``out``, or new planes, which lie packed in one buffer: ``result[0].base``.
    """
    width, height = _sides(size, "dst")
    if out is None:
        out = nv21_planes(_new("nv21", size, "dst"), size)
    src, dst = _planes(planes, "src"), _planes(out, "dst")
    _native.resize("nv21", src, dst, width, height, filter, threads)
    return out


def letterbox_i420(
    planes: I420,
    size: Size,
    *,
    fit: Fit = "contain",
    gravity: Gravity = "center",
    threads: Threads = "auto",
    out: Optional[I420] = None,
) -> I420:
    """Puts Y, U and V on a black canvas (0, chroma 128), by the quarter filter, at even positions.

    :param planes: Y ``(height, width)``; U and V ``((height + 1) // 2, (width + 1) // 2)``.
    :param size: of the canvas: width and height in pixels.
    :param out: the canvas: planes that lie packed in one buffer, such as ``i420_planes`` gives.
    :return: ``out``, or new planes, which lie packed in one buffer: ``result[0].base``.
    """
    width, height = _sides(size, "canvas")
    if out is None:
        out = i420_planes(_new("i420", size, "canvas"), size)
    src, canvas = _planes(planes, "src"), _planes(out, "canvas")
    _native.letterbox("i420", src, canvas, width, height, fit, gravity, threads)
    return out


def letterbox_nv21(
    planes: Nv21,
    size: Size,
    *,
    fit: Fit = "contain",
    gravity: Gravity = "center",
    threads: Threads = "auto",
    out: Optional[Nv21] = None,
) -> Nv21:
    """Puts Y and VU on a black canvas (0, chroma 128), by the quarter filter, at even positions.

    :param planes: Y ``(height, width)``; VU ``((height + 1) // 2, (width + 1) // 2, 2)``.
    :param size: of the canvas: width and height in pixels.
    :param out: the canvas: planes that lie packed in one buffer, such as ``nv21_planes`` gives.
    :return: ``out``, or new planes, which lie packed in one buffer: ``result[0].base``.
    """
    width, height = _sides(size, "canvas")
    if out is None:
        out = nv21_planes(_new("nv21", size, "canvas"), size)
    src, canvas = _planes(planes, "src"), _planes(out, "canvas")
    _native.letterbox("nv21", src, canvas, width, height, fit, gravity, threads)
    return out


# ---- Sizes and alpha ------------------------------------------------------------------------------


def picture_bytes(format: Format, size: Size) -> int:
    """How many bytes a packed picture of this width and height, in pixels, has."""
    return _bytes(format, size, "picture")


def placement(
    src: Size,
    canvas: Size,
    *,
    fit: Fit = "contain",
    gravity: Gravity = "center",
    format: Format = "rgba",
) -> Placement:
    """Where the letterbox functions put a picture, from sizes alone.

    :param src: width and height of the picture, in pixels.
    :param canvas: width and height of the canvas, in pixels.
    :param format: pictures in 4:2:0 are placed and cut at even pixels.
    """
    sizes = (*_sides(src, "src"), *_sides(canvas, "canvas"))
    part, rect = _native.placement(format, *sizes, fit, gravity)
    return Placement(Rect(*part), Rect(*rect))


def premultiply(picture: Picture) -> None:
    """Multiplies colours by alpha, the last byte of each pixel, in place.

    Resizing then does not mix in the colours of transparent pixels.

    :param picture: ``(height, width, 4)``.
    """
    _native.premultiply(picture)


def unpremultiply(picture: Picture, opaque: int = 255) -> None:
    """Undoes premultiply, after resizing, in place.

    :param picture: ``(height, width, 4)``.
    :param opaque: the alpha that has become of 255, ``white_after(filter)``; it becomes 255 again.
    """
    _native.unpremultiply(picture, opaque)


def white_after(filter: Filter) -> int:
    """What a filter makes of 255 everywhere: 252 or 255."""
    return _native.white_after(filter)
