# SPDX-License-Identifier: Apache-2.0
"""What calls do to the process around them: its lock, its memory, its references."""

from __future__ import annotations

import ctypes
import gc
import importlib.metadata
import sys
import threading
import time
import tracemalloc
from concurrent.futures import ThreadPoolExecutor

import numpy as np
import pytest

import ovrinresize as ovrin
from pictures import SANITIZED, noise, noise_planes

def second_thread_ran_inside(call) -> bool:
    """Whether this thread got on while another one was in the middle of a call."""
    span: list[float] = []

    def timed() -> None:
        span.append(time.perf_counter())
        call()
        span.append(time.perf_counter())

    worker = threading.Thread(target=timed)
    worker.start()
    seen = []
    while worker.is_alive():
        seen.append(time.perf_counter())
    start, end = span
    assert end - start > 0.05, "the call is too short to tell"
    third = (end - start) / 3
    return any(start + third < moment < end - third for moment in seen)


def large_call(name):
    """Nothing but the call itself may take time. Its result has no memory behind it yet, so that it takes
    some on every machine."""
    small, side = noise(1, 8, 8, 4), 10000 if name == "resize" else 16000
    out = np.empty((side, side, 4), np.uint8)
    return {
        "resize": lambda: ovrin.resize(
            small, (side, side), filter="lanczos", threads="one", out=out
        ),
        "letterbox": lambda: ovrin.letterbox(small, (side, side), threads="one", out=out),
        "premultiply": lambda: ovrin.premultiply(out),
    }[name]


def holding_the_lock() -> None:
    ctypes.PyDLL(None).usleep(200_000)


@pytest.mark.parametrize("name", ["resize", "letterbox", "premultiply"])
def test_other_threads_run_on(name):
    """A busy machine may deny the second thread its turn, so it gets ten."""
    assert any(second_thread_ran_inside(large_call(name)) for _ in range(10))


def test_that_the_lock_would_be_noticed():
    """A busy machine may keep the worker from its call so long that others run before it."""
    assert not all(second_thread_ran_inside(holding_the_lock) for _ in range(10))


def test_threads_of_python_give_the_same():
    pictures = [noise(seed, 300 + seed, 200, 4) for seed in range(40)]
    alone = [ovrin.resize(picture, (90, 70), filter="lanczos") for picture in pictures]
    with ThreadPoolExecutor(4) as pool:
        together = list(pool.map(lambda p: ovrin.resize(p, (90, 70), filter="lanczos"), pictures))
    assert all(map(np.array_equal, alone, together))


def every_way(src, out, planes, planes_out):
    """Calls that succeed with and without copies, and calls that fail."""
    ovrin.resize(src, (20, 15))
    ovrin.resize(src[::-1], (20, 15), out=out, filter="lanczos")
    ovrin.resize(src, (9, 15), out=out[:, 1:10])
    ovrin.letterbox(src[:, 1:], (20, 15), out=out)
    ovrin.resize_nv21(planes, (20, 15), out=planes_out, filter="bilinear")
    ovrin.letterbox_nv21((planes[0], planes[1][:, ::-1]), (20, 15))
    ovrin.premultiply(out)
    for arguments in ((src, (0, 1)), (src, (20, 14), out), (src, (20, 15), src), (src, "xy")):
        with pytest.raises((ValueError, TypeError)):
            ovrin.resize(*arguments[:2], out=arguments[2] if arguments[2:] else None)
    with pytest.raises(ValueError):
        ovrin.resize_nv21(planes[:1], (20, 15))
    with pytest.raises(TypeError):
        ovrin.resize_nv21(planes, (20, 15), out=(out, None))


class Mallinfo(ctypes.Structure):
    names = "arena ordblks smblks hblks hblkhd usmblks fsmblks uordblks fordblks keepcost".split()
    _fields_ = [(name, ctypes.c_size_t) for name in names]


def bytes_of_malloc() -> int:
    """All that the C library has given out and not got back."""
    mallinfo2 = ctypes.CDLL(None).mallinfo2
    mallinfo2.restype = Mallinfo
    info = mallinfo2()
    return info.uordblks + info.hblkhd


def test_nothing_is_left_behind():
    src, out = noise(1, 60, 80, 4), np.zeros((15, 20, 4), np.uint8)
    planes, planes_out = noise_planes(2, "nv21", 80, 60), noise_planes(3, "nv21", 20, 15)
    held = [src, out, *planes, *planes_out, planes, planes_out]
    every_way(src, out, planes, planes_out)
    gc.collect()
    references = [sys.getrefcount(value) for value in held]
    tracemalloc.start()
    every_way(src, out, planes, planes_out)
    gc.collect()
    traced, native = tracemalloc.get_traced_memory()[0], bytes_of_malloc()
    for _ in range(300):
        every_way(src, out, planes, planes_out)
    gc.collect()
    grown = tracemalloc.get_traced_memory()[0] - traced
    grown_native = bytes_of_malloc() - native
    tracemalloc.stop()
    assert [sys.getrefcount(value) for value in held] == references
    # Less than an object, or a small block, for every hundredth round.
    assert grown < 3 * 100
    assert SANITIZED or grown_native < 20_000


def test_the_module_shows_nothing_of_the_library():
    """Another copy of the library, in the same process, must not be taken for the one in here."""
    module = ctypes.CDLL(ovrin._native.__file__)
    assert not hasattr(module, "ovrin_resize_rgba8888")
    assert hasattr(module, "PyInit__native")


@pytest.mark.skipif(SANITIZED, reason="that module is not installed")
def test_version():
    assert ovrin.__version__ == importlib.metadata.version("ovrinresize")
