#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""Proves that the integer arithmetic of positions stays in its types, for all sizes to 2^31 - 1.

Each claim quotes the lines of src/ that it is about, so that it cannot outlive them, and says what
must hold; z3 looks for sizes for which it does not. A claim may have a broken twin, for which z3
must find such sizes: otherwise the claim would say nothing.
"""

import pathlib
import sys

import z3

SOURCES = pathlib.Path(__file__).resolve().parents[2] / "src"
MAX = 2**31 - 1
LONG = 2**63
failures = []


def size(name, sort=z3.Int):
    """Products are looked at in real numbers, where z3 always decides: what holds there holds for
    whole numbers too."""
    value = sort(name)
    return value, z3.And(value >= 1, value <= MAX)


def fits32(value):
    return z3.And(value >= -MAX - 1, value <= MAX)


def fits64(value):
    return z3.And(value >= -LONG, value < LONG)


def counterexample(premises, conclusion):
    solver = z3.Solver()
    solver.set("timeout", 20000)
    solver.add(*premises, z3.Not(conclusion))
    outcome = solver.check()
    if outcome == z3.unknown:
        return "not decided"
    return str(solver.model()) if outcome == z3.sat else None


def claim(text, quotes, premises, conclusion, broken=None):
    """broken: a conclusion that must turn out to be wrong."""
    for path, line in quotes:
        if line not in (SOURCES / path).read_text(encoding="utf-8"):
            failures.append(text)
            print(f"FAILED: {text}\n    src/{path} no longer has: {line}")
    found = counterexample(premises, conclusion)
    if found is not None:
        failures.append(text)
        print(f"FAILED: {text}\n    {found}")
    elif broken is not None and counterexample(premises, broken) in (None, "not decided"):
        failures.append(text)
        print(f"FAILED: {text}\n    its broken twin was not refuted")
    else:
        print(f"proved: {text}")


S, s_in_range = size("source")
D, d_in_range = size("destination")
sizes = [s_in_range, d_in_range]
k = z3.Int("k")
quarter = S / 4
three_quarters = 3 * S / 4

real_S, real_s_in_range = size("real source", z3.Real)
real_D, real_d_in_range = size("real destination", z3.Real)
real_sizes = [real_s_in_range, real_d_in_range]

# ---- Quarter points ---------------------------------------------------------------------------

POINTS = "kernels/quarter_points.h"

claim("a three-quarter point fits 32 bits",
      [(POINTS, "return static_cast<int32_t>((int64_t{3} * source) >> 2);")],
      sizes, fits32(three_quarters), broken=fits32(3 * S))

# A step from the invariant: cell * D + remainder is the point, and the remainder below D. With
# quotients and remainders of the source written out, no division is left.
cell, remainder, step_cells, step_remainder = z3.Ints("cell remainder step_cells step_remainder")
carried = remainder + step_remainder >= D
next_cell = cell + step_cells + z3.If(carried, 1, 0)
next_remainder = remainder + step_remainder - z3.If(carried, D, 0)
walking = [*sizes, 0 <= remainder, remainder < D, 0 <= step_remainder, step_remainder < D]
step = [(POINTS, "const int64_t remainder = int64_t{remainder_} + step_remainder_;"),
        (POINTS, "const bool carry = remainder >= destination_;")]
claim("a step along an axis keeps the remainder below the destination's size", step, walking,
      z3.And(next_remainder >= 0, next_remainder < D),
      broken=z3.And(next_remainder >= 0, next_remainder < D - 1))
claim("... and moves the point by exactly the source's size", step, walking,
      z3.Implies(carried, next_remainder - remainder + D == step_remainder))
claim("... and would not fit 32 bits before the carry", step,
      [*walking, remainder + step_remainder > MAX], carried)

# The last point of the last cell, and so every point, lies inside the source.
claim("taps lie inside the source row",
      [(POINTS, "const Tap tap = {static_cast<int32_t>(left.cell()), "
                "static_cast<int32_t>(right.cell())};")],
      [*sizes, k >= 0, k <= D - 1], three_quarters + k * S < D * S,
      broken=three_quarters + (k + 1) * S < D * S)
claim("... and the first point is not negative", [], sizes, quarter >= 0)
row = z3.Int("row")
claim("the points of any row fit 64 bits",
      [("quarter/sampler.cpp", "return {point + int64_t{row} * plane.src_rows, plane.src_rows, "
                               "plane.dst_rows};")],
      [*sizes, row >= 0, row < D], fits64(three_quarters + row * S), broken=fits32(row * S))

# ---- Windows ----------------------------------------------------------------------------------

WINDOWS = "kernels/quarter_windows_inl.h"
samples, n, window_bytes = z3.Ints("samples n window_bytes")
vectors = [*sizes, samples >= 1, samples <= 64, n >= 1, n <= 4, window_bytes >= 16,
           window_bytes <= 64]
points = (samples - 1) * S + three_quarters - quarter
cells = (points + D - 1) / D
windows = ((cells + 1) * n + window_bytes - 1) / window_bytes
formula = [(WINDOWS, "const int64_t points = (samples - 1) * s + ((3 * s) >> 2) - (s >> 2);"),
           (WINDOWS, "const int64_t cells = (points + shape.dst_columns - 1) / shape.dst_columns;"),
           (WINDOWS, "const int64_t windows = ((cells + 1) * shape.sample_bytes + window_bytes - 1) "
                     "/ window_bytes;")]
span_points = z3.Real("points")
claim("what windows are counted from fits 64 bits", formula,
      [*real_sizes, span_points >= 0, span_points <= 63 * real_S + real_S / 2 + 1],
      fits64((span_points + 2 * real_D) * 4 + 64), broken=fits32(span_points))
# Two points `p` apart, the first of them `r` past the start of its cell, lie at most
# ceil(p / D) cells apart: q is how many whole cells and t the rest of p.
r, q, t = z3.Ints("r q t")
claim("no tap of a vector lies further on than the windows' count assumes", formula,
      [*sizes, 0 <= r, r < D, 0 <= t, t < D, q >= 0],
      q + z3.If(r + t >= D, 1, 0) <= q + z3.If(t > 0, 1, 0),
      broken=z3.If(r + t >= D, 1, 0) <= 0)
claim("windows hold all bytes of their taps", formula,
      [0 <= cells, z3.Int("c") >= 0, n >= 1, n <= 4, window_bytes >= 16, window_bytes <= 64],
      ((z3.Int("c") + 1) * n + window_bytes - 1) / window_bytes * window_bytes
      >= (z3.Int("c") + 1) * n,
      broken=((z3.Int("c") + 1) * n) / window_bytes * window_bytes >= (z3.Int("c") + 1) * n)

row_bytes, span = z3.Ints("row_bytes span")
claim("the last place of a window fits 32 bits",
      [(WINDOWS, "const bool fits = windows <= max_windows && windows * window_bytes <= row_bytes;"),
       (WINDOWS, "return fits && row_bytes <= INT32_MAX ? static_cast<int32_t>(windows) : 0;"),
       (WINDOWS, "const auto last_base = static_cast<int32_t>(plan.row_bytes - span);")],
      [row_bytes == S * n, row_bytes <= MAX, span >= 16, span <= row_bytes],
      z3.And(fits32(row_bytes - span), row_bytes - span >= 0))
claim("a tap's first byte fits 32 bits",
      [(WINDOWS, "const int32_t first = n * taps[0].left;")],
      [*sizes, n >= 1, n <= 4, S * n <= MAX, k >= 0, k < S], fits32(n * k))

# ---- Simple ratios ----------------------------------------------------------------------------

RATIOS = "kernels/quarter_ratios_inl.h"
a, b, first = z3.Ints("a b first")
claim("what simple ratios are told by fits 64 bits",
      [(RATIOS, "if (int64_t{shape.src_columns} * ratio.dst != int64_t{shape.dst_columns} * "
                "ratio.src) {"),
       (RATIOS, "const int64_t read = int64_t{samples} / ratio.dst * ratio.src;")],
      [*sizes, a >= 1, a <= 4, b >= 1, b <= 3],
      z3.And(fits64(S * b), fits64(D * a)), broken=fits32(D * a))

# ---- Bands ------------------------------------------------------------------------------------

SPLIT = "bands/split.h"
height, count, i = z3.Ints("height count i")
split = [(SPLIT, "return static_cast<int32_t>((int64_t{rows} + (height >> 1)) / height);")]
banded = [d_in_range, height >= 32, height <= MAX, count == (D + height / 2) / height]
claim("the number of bands fits 32 bits", split, banded, z3.And(count >= 0, fits32(count)))
claim("a band's first row lies inside the picture",
      [("lanczos/threaded.cpp", "band.first_row = i * height;"),
       ("bilinear/threaded.cpp", "bands[i].first_row = i * height;")],
      [d_in_range, height >= 32, height <= MAX, i >= 0, i < count,
       count * height <= D + height / 2],
      z3.And(i * height < D, i * height >= 0), broken=(i + 1) * height <= D)
claim("a band's end needs more than 32 bits, and fits 64",
      [("bilinear/threaded.cpp", "const int64_t end = (int64_t{i} + 1) * height;")],
      [d_in_range, height >= 32, height <= MAX, i >= 0, i < count,
       count * height <= D + height / 2],
      fits64((i + 1) * height), broken=fits32((i + 1) * height))
claim("a band height that is doubled until it is 32 or more fits 32 bits",
      [(SPLIT, "while (height <= 31) height *= 2;")], [height >= 1, height <= 31],
      height * 2 <= 62)
bands, band = z3.Reals("bands band")
claim("shares of rows fit 64 bits and lie inside the picture",
      [("quarter/sampler.cpp", "return static_cast<int32_t>(int64_t{plane.rows} * band / "
                               "turns.bands());")],
      [real_d_in_range, bands >= 1, bands <= MAX, band >= 0, band <= bands],
      z3.And(fits64(real_D * band), real_D * band <= real_D * bands), broken=fits32(real_D * band))
passes = z3.Real("passes")
left = z3.Int("left")
claim("the count of all passes fits 64 bits",
      [("bands/turns.h", "const int64_t begin = pass_ * turns_.bands;")],
      [bands >= 1, bands <= MAX, passes >= 0, passes <= 3], fits64((passes + 1) * bands + 8))
claim("a turn takes at least one band and no more than are left",
      [("bands/turns.h", "return (left + kShares - 1) / kShares;")],
      [left >= 1, left <= 3 * MAX], z3.And((left + 7) / 8 >= 1, (left + 7) / 8 <= left),
      broken=(left + 8) / 8 <= left - 1)

# Records count points in 32 bits, which wrap; their distance from the row at hand must not.
top = z3.Int("distance")
claim("a point's distance fits 32 bits when source and destination rows together do",
      [("quarter/scan.h", "used, which stays below source + destination rows.")],
      [*sizes, S + D <= MAX, top >= 0, top < S + D], fits32(top), broken=fits32(top + S + D))

# ---- Strips and loops -------------------------------------------------------------------------

x, width, strip = z3.Ints("x width strip")
claim("the start of the next strip fits 32 bits",
      [("rgba/nearest.cpp", "for (int32_t x = 0; x < p.width; x += count) {"),
       ("bilinear/rows.cpp", "for (int32_t first = samples.first; first < samples.end; "
                             "first += columns.count) {"),
       ("lanczos/rows.cpp", "for (int32_t x = 0; x < picture.dst_w; x += columns.count) {")],
      [x >= 0, x < width, width <= MAX, strip >= 1,
       count == z3.If(width - x < strip, width - x, strip)],
      fits32(x + count), broken=fits32(x + strip))
claim("every second row needs more than 32 bits to step past the last one",
      [("bilinear/rows.cpp", "for (int64_t r = plane.first_row(rows.first); r < rows.end; r += step)")],
      [x >= 0, x < width, width <= MAX], fits64(x + 2), broken=fits32(x + 2))
claim("the luma column of a chroma column lies inside the picture",
      [("bilinear/rows.cpp", "const int32_t c = (first + i) * plane.subsampling;"),
       ("bilinear/rows.cpp", "static_cast<int32_t>((int64_t{columns} - 1) / subsampling + 1)")],
      [d_in_range, i >= 0, i < (D - 1) / 2 + 1], z3.And(2 * i < D, fits32(2 * i)),
      broken=2 * i < D - 1)

# ---- Planes and canvases ----------------------------------------------------------------------

W, w_in_range = size("width")
real_W, real_w_in_range = size("real width", z3.Real)
real_H, real_h_in_range = size("real height", z3.Real)
LAYOUT = "canvas/yuv420_layout.h"
for bytes_, planes in ((1, 2), (2, 1)):
    half_w, half_h = z3.Reals("half_w half_h")
    claim(f"the bytes of a 4:2:0 picture with {planes} chroma planes fit 64 bits",
          [(LAYOUT, "ptrdiff_t luma_size() const { return luma_pitch() * height; }"),
           (LAYOUT, "return luma_size() + plane * chroma_size();")],
          [real_w_in_range, real_h_in_range, half_w >= 1, half_w <= 2**30, half_h >= 1, half_h <= 2**30],
          fits64(real_W * real_H + planes * (half_w * bytes_ * half_h)))
claim("half of a size, rounded up, is at most 2^30",
      [(LAYOUT, "return static_cast<int32_t>((int64_t{luma} + 1) >> 1);")],
      [w_in_range], z3.And((W + 1) / 2 >= 1, (W + 1) / 2 <= 2**30), broken=(W + 1) / 2 < 2**30)
claim("a grid's size fits 32 bits where a picture has one",
      [("yuv420/grid.h", "constexpr int32_t kLargestGridSize = INT32_MAX / kGridStep * kGridStep;")],
      [w_in_range, W <= MAX // 4 * 4], (W + 3) / 4 * 4 <= MAX,
      broken=(W + 3) / 4 * 4 < MAX // 4 * 4)
real_x, y, h, dst_w = z3.Reals("x y h dst_w")
claim("where an RGBA8888 picture ends in its canvas fits 64 bits, whatever its position",
      [("canvas/placement.cpp", "if (width < 1 || width < target.dst_width) return false;"),
       ("canvas/placement.cpp", "const int64_t last_row = first + width * (int64_t{target.dst_height} "
                                "- 1);")],
      [real_w_in_range, fits32(y), fits32(real_x), fits32(h), fits32(dst_w), real_W >= dst_w],
      z3.And(fits64(real_W * y + real_x), fits64(real_W * y + real_x + real_W * (h - 1)),
             z3.Implies(real_W * y + real_x >= 0,
                        fits64(real_W * y + real_x + real_W * (h - 1) + dst_w))),
      broken=fits64(3 * real_W * y + real_x))
claim("what a canvas has room for fits 64 bits",
      [("canvas/placement.h", "const int64_t room = int64_t{canvas_size} - position;")],
      [fits32(W), fits32(x)], fits64(W - x), broken=fits32(W - x))
claim("the words of a halved picture fit 64 bits",
      [("bilinear/progressive.cpp", "int64_t words = (int64_t{src_w} * src_h + 3) / 4;"),
       ("bilinear/progressive.cpp", "int64_t{target->src_stride} * (int64_t{target->src_height} + 2) "
                                    "+ 2;")],
      [real_w_in_range, real_h_in_range],
      z3.And(fits64(real_W * real_H + 3), fits64(real_W * (real_H + 2) + 2)))

# ---- Single and double precision --------------------------------------------------------------

# Positions of the bilinear engine go through two roundings, each by a factor of at most
# 1 + 2^-24. With fewer than 2^23 destination samples none reaches the source's size; with more, as
# the header says, one may.
claim("bilinear positions lie inside the source up to 2^23 - 1 destination samples",
      [("bilinear/plan.cpp", "const float position = static_cast<float>(i) * scale;")],
      [*sizes, D <= 2**23 - 1],
      (D - 1) * (2**24 + 1) * (2**24 + 1) < D * 2**48,
      broken=(D - 1) * (2**24 + 2) * (2**24 + 2) < D * 2**48)
claim("a nearest-neighbour step fits 32 bits",
      [("rgba/nearest.cpp", "static_cast<int32_t>(static_cast<double>(src) / dst + 0.5)")],
      sizes, (2 * S + D) / (2 * D) <= MAX, broken=(2 * S + D) / (2 * D) < MAX)

print(f"\n{len(failures)} failed")
sys.exit(1 if failures else 0)
