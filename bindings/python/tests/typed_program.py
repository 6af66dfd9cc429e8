# SPDX-License-Identifier: Apache-2.0
"""For mypy: what the installed package's types say of a program."""

from __future__ import annotations

import numpy as np
from numpy.typing import NDArray

import ovrinresize


def thumbnail(photo: NDArray[np.uint8]) -> NDArray[np.uint8]:
    height, width, _ = photo.shape
    rect = ovrinresize.placement((width, height), (256, 256), fit="contain").rect
    return ovrinresize.resize(photo, (rect.width, rect.height), filter="lanczos", threads="one")


def preview(y: NDArray[np.uint8], vu: NDArray[np.uint8]) -> ovrinresize.Nv21:
    return ovrinresize.letterbox_nv21((y, vu), (320, 240), gravity="north")


# Names that there are none of; strict mypy complains of a comment that ignores nothing.
ovrinresize.resize(np.zeros((1, 1, 4), np.uint8), (1, 1), filter="cubic")  # type: ignore[arg-type]
ovrinresize.resize(np.zeros((1, 1, 4)), (1, 1))  # type: ignore[arg-type]
ovrinresize.resize_i420(preview(*ovrinresize.nv21_planes(np.zeros(6, np.uint8), (2, 2))), (1, 1))  # type: ignore[arg-type]
