// SPDX-License-Identifier: Apache-2.0
// The four band walkers: chains from the first row on, and from any state.
#include "bands_support.h"
#include "reference/band_walkers.h"

using namespace fuzz;

namespace {

struct Picture {
    Sizes sizes;
    int32_t band_rows, stride, canvas_w;
};

// A state that no walk has made. Points may lie before the row, far behind it, and apart.
int32_t somewhere(Input& in) {
    return in.flag() ? in.byte() : in.word() - 32768;
}

template <class Band>
void scramble(Input& in, Band& band, const reference::PlaneFields<Band>& plane) {
    for (const auto field :
         {plane.start_row, plane.top_point, plane.bottom_point, plane.row_base, plane.top_left,
          plane.top_right, plane.bottom_left, plane.bottom_right}) {
        band.*field = somewhere(in);
    }
}

void scramble(Input& in, ovrin_rgba_band& band) {
    scramble(in, band, reference::kRgbaFields);
    band.src_offset = somewhere(in);
}

template <class Band>
void scramble(Input& in, Band& band) {
    constexpr auto chroma = reference::kChromaFields<Band>;
    scramble(in, band, reference::kLumaFields<Band>);
    scramble(in, band, chroma);
    band.src_y_offset = somewhere(in);
    band.*chroma.src_offset = somewhere(in);
}

// Walks the library's record and the replayed one side by side, past the end of the picture.
template <class Band, class Walk, class Replay>
void chain(Input& in, Band band, const Picture& p, Walk walk, Replay replay) {
    reference::start_at_the_top(band);
    if (in.byte() % 4 == 0) scramble(in, band);
    Band expected = band;
    int32_t steps = p.band_rows > 0 ? p.sizes.src_h / p.band_rows + 2 : 2;
    if (steps > 12) steps = 12;
    for (int32_t step = 0; step < steps; ++step) {
        walk(band);
        replay(expected);
        require(same(band, expected), "not the record that a replay gives", "any");
    }
}

template <class Band>
Band first_of_planes(const Picture& p) {
    auto band = garbage<Band>();
    band.band_rows = p.band_rows;
    band.src_row_bytes = p.stride;
    return band;
}

ovrin_rgba_band first_rgba(const Picture& p) {
    auto band = garbage<ovrin_rgba_band>();
    band.band_rows = p.band_rows;
    band.src_stride = p.stride;
    return band;
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    Input in(data, size);
    const uint8_t which = in.byte() % 4;
    Picture p;
    p.sizes = {in.width(), in.between(1, 130), in.width(), in.between(0, 130)};
    if (in.byte() % 16 == 0) p.sizes.src_h += in.word() % 1500;
    p.band_rows = in.byte() % 70 - 1;
    p.stride = p.sizes.src_w + in.between(0, 9);
    p.canvas_w = p.sizes.dst_w + in.between(0, 9);
    const Sizes& s = p.sizes;
    switch (which) {
        case 0:
            chain(
                in, first_rgba(p), p,
                [&](ovrin_rgba_band& band) {
                    ovrin_resize_rgba8888_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, &band);
                },
                [&](ovrin_rgba_band& band) {
                    reference::rgba8888_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, band);
                });
            break;
        case 1:
            chain(
                in, first_rgba(p), p,
                [&](ovrin_rgba_band& band) {
                    ovrin_resize_rgba8888_get_pos_keep_ratio(s.src_w, s.src_h, s.dst_w, s.dst_h,
                                                             p.canvas_w, -77, &band);
                },
                [&](ovrin_rgba_band& band) {
                    reference::rgba8888_get_pos_keep_ratio(s.src_h, s.dst_h, p.canvas_w, band);
                });
            break;
        case 2:
            chain(
                in, first_of_planes<ovrin_yuv_band>(p), p,
                [&](ovrin_yuv_band& band) {
                    ovrin_resize_yuv420_get_pos(-77, s.src_h, s.dst_w, s.dst_h, &band);
                },
                [&](ovrin_yuv_band& band) {
                    reference::yuv420_get_pos(s.src_h, s.dst_w, s.dst_h, band);
                });
            break;
        default:
            chain(
                in, first_of_planes<ovrin_nv21_band>(p), p,
                [&](ovrin_nv21_band& band) {
                    ovrin_resize_nv21_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, &band);
                },
                [&](ovrin_nv21_band& band) {
                    reference::nv21_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, band);
                });
    }
    return 0;
}
