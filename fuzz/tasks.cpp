// SPDX-License-Identifier: Apache-2.0
// The six band tasks of the quarter-point formats, on bands that the replayed walkers lead to.
#include "reference/band_tasks.h"

#include <algorithm>

#include "bands_support.h"

using namespace fuzz;

namespace {

using Task = decltype(_resize_rgba8888_tp);

// What a target holds before: four samples of at most 63 still fit each byte.
std::vector<uint8_t> before(Pixels& pixels, size_t count) {
    std::vector<uint8_t> bytes(count);
    pixels.fill(bytes.data(), count);
    for (uint8_t& byte : bytes) byte &= 3;
    return bytes;
}

// The task must turn a target of `content` into `expected`, and of the record set only `done`. aim
// points the record to the target.
template <class Band, class Aim>
void check_task(Task* task, const Band& band, const std::vector<uint8_t>& content,
                const std::vector<uint8_t>& expected, Flush where, Aim aim) {
    check_drawing(expected, where, 0, [&](const Buffer& target, const char* set) {
        if (!content.empty()) memcpy(target.data(), content.data(), content.size());
        Band passed = band;
        aim(passed, target);
        Band after = passed;
        after.done = 1;
        task(&passed);
        require(same(passed, after), "the record was written", set);
    });
}

void rgba(Input& in, const Sizes& s) {
    const bool in_canvas = in.flag();
    const int32_t stride = s.src_w + (in_canvas ? in.between(0, 5) : 0);
    auto band = garbage<ovrin_rgba_band>();
    start(band);
    band.src_w = s.src_w;
    band.src_h = s.src_h;
    band.src_stride = stride;
    band.dst_w = s.dst_w;
    band.dst_h = s.dst_h;
    band.dst_x = in_canvas ? in.between(0, 6) : 0;
    band.dst_skip = in_canvas ? in.between(0, 6) : 0;
    band.band_rows = in.between(1, s.src_h);
    const int32_t row = band.dst_x + s.dst_w + band.dst_skip;
    const int32_t steps = in.between(0, (s.src_h - 1) / band.band_rows);
    for (int32_t i = 0; i < steps; ++i) {
        reference::rgba8888_get_pos_keep_ratio(s.src_h, s.dst_h, row, band);
    }
    band.rows_to_do = in.between(0, std::min(band.band_rows, s.src_h - band.start_row));

    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, int64_t{s.src_w} * 4, s.src_h, int64_t{stride} * 4, where);
    band.src = src.first();
    std::vector<uint32_t> words(static_cast<size_t>((s.dst_h - 1) * row + band.dst_x + s.dst_w));
    const auto content = before(pixels, bytes_of(words));
    memcpy(words.data(), content.data(), content.size());
    (in_canvas ? reference::resize_rgba8888_keep_ratio_tp : reference::resize_rgba8888_tp)(
        band, words.data());
    std::vector<uint8_t> expected(content.size());
    memcpy(expected.data(), words.data(), expected.size());
    if (!in_canvas) band.src_stride = band.dst_x = band.dst_skip = -5;  // packed, whatever they say
    check_task(in_canvas ? _resize_rgba8888_keep_ratio_tp : _resize_rgba8888_tp, band, content,
               expected, where,
               [](ovrin_rgba_band& record, const Buffer& dst) { record.dst = dst.words(); });
    src.check_unchanged("some");
}

void replay(const Sizes& s, ovrin_yuv_band& band) {
    reference::yuv420_get_pos(s.src_h, s.dst_w, s.dst_h, band);
}
void replay(const Sizes& s, ovrin_nv21_band& band) {
    reference::nv21_get_pos(s.src_w, s.src_h, s.dst_w, s.dst_h, band);
}
int32_t& chroma_rows(ovrin_yuv_band& band) {
    return band.uv_rows;
}
int32_t& chroma_rows(ovrin_nv21_band& band) {
    return band.vu_rows;
}
int32_t& chroma_start(ovrin_yuv_band& band) {
    return band.uv_start_row;
}
int32_t& chroma_start(ovrin_nv21_band& band) {
    return band.vu_start_row;
}

// The record of a band that a driver would make: the last one takes what is left.
template <class Band>
Band walk(Input& in, const Sizes& s, int32_t stride) {
    auto band = garbage<Band>();
    start(band);
    band.src_width = s.src_w;
    band.src_height = s.src_h;
    band.src_row_bytes = stride;
    band.dst_width = s.dst_w;
    band.dst_height = s.dst_h;
    band.band_rows = in.between(1, s.src_h);
    const int32_t steps = in.between(0, (s.src_h - 1) / band.band_rows);
    for (int32_t i = 0; i < steps; ++i) replay(s, band);
    Band next = band;
    replay(s, next);
    band.y_rows = next.y_rows;
    chroma_rows(band) = chroma_rows(next);
    if (band.y_start_row + band.band_rows >= s.src_h) {
        band.y_rows = s.src_h - band.y_start_row;
        const int32_t rows = (s.src_h + 1) >> 1;
        if (rows > chroma_start(band)) chroma_rows(band) = rows - chroma_start(band);
    }
    return band;
}

// Runs the task into the destination or the work buffer, whichever is due, with the other one set
// to something that must not be touched.
template <class Band, class Definition>
void check_planes(Input& in, const Sizes& s, Pixels& pixels, Task* task, const Band& band,
                  bool prefers_work, Flush where, Definition definition) {
    const int32_t w = reference::grid_side(s.dst_w);
    const int32_t h = reference::grid_side(s.dst_h);
    const auto content = before(pixels, static_cast<size_t>(w * h + w * h / 2));
    std::vector<uint8_t> expected = content;
    definition(band, expected.data());
    const bool fits = w == s.dst_w && h == s.dst_h;
    const bool to_work = !fits || (prefers_work && in.flag());
    check_task(task, band, content, expected, where, [&](Band& record, const Buffer& target) {
        uint8_t* const forbidden = target.data() + (1 << 30);
        record.dst = to_work ? forbidden : target.data();
        record.work = to_work ? target.data() : prefers_work ? nullptr : forbidden;
    });
}

void planar(Input& in, const Sizes& s) {
    const bool in_planes = in.flag();
    const int32_t stride = s.src_w + (in_planes ? in.between(0, 5) : 0);
    auto band = walk<ovrin_yuv_band>(in, s, stride);
    Pixels pixels(in);
    const Flush where = flush(in);
    if (in_planes) {
        const int64_t chroma_w = (s.src_w + 1) >> 1;
        const int64_t chroma_h = (s.src_h + 1) >> 1;
        const Plane y(pixels, s.src_w, s.src_h, stride, where);
        const Plane u(pixels, chroma_w, chroma_h, (stride + 1) >> 1, where);
        const Plane v(pixels, chroma_w, chroma_h, (stride + 1) >> 1, where);
        band.src = y.first();
        band.src_u = u.first();
        band.src_v = v.first();
        check_planes(in, s, pixels, _resize_y_u_v_tp, band, true, where,
                     reference::resize_y_u_v_tp);
    } else {
        const Buffer src = source(
            pixels, s.src_w * s.src_h + 2 * ((s.src_w + 1) >> 1) * ((s.src_h + 1) >> 1), where);
        band.src = src.data();
        band.src_row_bytes = -5;  // the picture is packed
        check_planes(in, s, pixels, _resize_yuv420_tp, band, false, where,
                     reference::resize_yuv420_tp);
    }
}

void semi_planar(Input& in, const Sizes& s) {
    const bool in_planes = in.flag();
    const int32_t stride = s.src_w + (in_planes ? in.between(0, 5) : 0);
    auto band = walk<ovrin_nv21_band>(in, s, stride);
    Pixels pixels(in);
    const Flush where = flush(in);
    const int64_t chroma_row = (s.src_w + 1) & ~1;
    const int64_t chroma_h = (s.src_h + 1) >> 1;
    if (in_planes) {
        const Plane y(pixels, s.src_w, s.src_h, stride, where);
        const Plane vu(pixels, chroma_row, chroma_h, (stride + 1) & ~1, where);
        band.src = y.first();
        band.src_vu = vu.first();
        check_planes(in, s, pixels, _resize_y_nv21_tp, band, true, where,
                     reference::resize_y_nv21_tp);
    } else {
        const Buffer src = source(pixels, s.src_w * s.src_h + chroma_row * chroma_h, where);
        band.src = src.data();
        band.src_row_bytes = -5;
        check_planes(in, s, pixels, _resize_nv21_tp, band, false, where, reference::resize_nv21_tp);
    }
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const uint8_t format = in.byte() % 3;
    Sizes s = sizes(in);
    s.src_h += in.between(0, 40);
    s.dst_h += in.between(0, 20);
    (format == 0 ? rgba : format == 1 ? planar : semi_planar)(in, s);
    return 0;
}
