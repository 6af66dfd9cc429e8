# SPDX-License-Identifier: Apache-2.0
# The compiled module. Names of formats, filters and the like are checked there.
import numpy as np
from numpy.typing import NDArray

_Planes = tuple[NDArray[np.uint8], ...]
_Rect = tuple[int, int, int, int]

VERSION: str
LARGEST_SIDE: int

def resize(
    format: str,
    src: _Planes,
    dst: _Planes,
    width: int,
    height: int,
    filter: str,
    threads: str,
) -> None: ...
def letterbox(
    format: str,
    src: _Planes,
    canvas: _Planes,
    width: int,
    height: int,
    fit: str,
    gravity: str,
    threads: str,
) -> None: ...
def placement(
    format: str,
    src_width: int,
    src_height: int,
    canvas_width: int,
    canvas_height: int,
    fit: str,
    gravity: str,
) -> tuple[_Rect, _Rect]: ...
def picture_bytes(format: str, width: int, height: int, name: str) -> int: ...
def premultiply(picture: NDArray[np.uint8]) -> None: ...
def unpremultiply(picture: NDArray[np.uint8], opaque: int) -> None: ...
def white_after(filter: str) -> int: ...
