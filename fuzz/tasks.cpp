// SPDX-License-Identifier: Apache-2.0
// The six band tasks of the quarter-point formats, on bands that the replayed walkers lead to.
#include "reference/band_tasks.h"

#include "bands_support.h"
#include "support/band_walk.h"

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
    const int32_t x = in_canvas ? in.between(0, 6) : 0;
    const int32_t skip = in_canvas ? in.between(0, 6) : 0;
    const int32_t band_rows = in.between(1, s.src_h);
    const int32_t index = in.between(0, (s.src_h - 1) / band_rows);
    auto band =
        ovrin_test::walk_to(garbage<ovrin_rgba_band>(), s, band_rows, stride, x, skip, index);
    band.rows_to_do = in.between(0, band.rows_to_do);

    Pixels pixels(in);
    const Flush where = flush(in);
    const Plane src(pixels, int64_t{s.src_w} * 4, s.src_h, int64_t{stride} * 4, where);
    band.src = src.first();
    std::vector<uint32_t> words(
        static_cast<size_t>((s.dst_h - 1) * (x + s.dst_w + skip) + x + s.dst_w));
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

// A band of a picture in planes.
template <class Band>
Band any_band(Input& in, const Sizes& s, int32_t stride) {
    const int32_t band_rows = in.between(1, s.src_h);
    const int32_t index = in.between(0, (s.src_h - 1) / band_rows);
    return ovrin_test::walk_to(garbage<Band>(), s, band_rows, stride, index);
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

void set_chroma(ovrin_yuv_band& band, const Yuv420Planes& src) {
    band.src_u = src.chroma[0].first();
    band.src_v = src.chroma[1].first();
}
void set_chroma(ovrin_nv21_band& band, const Yuv420Planes& src) {
    band.src_vu = src.chroma[0].first();
}

// The two tasks of a format of planes.
template <class Band>
struct Tasks {
    using Definition = void(const Band& band, uint8_t* target);
    reference::ChromaLayout layout;
    Task* contiguous;
    Definition* contiguous_definition;
    Task* planes;
    Definition* planes_definition;
};

template <class Band>
void yuv420(Input& in, const Sizes& s, const Tasks<Band>& tasks) {
    const bool in_planes = in.flag();
    const int32_t stride = s.src_w + (in_planes ? in.between(0, 5) : 0);
    auto band = any_band<Band>(in, s, stride);
    Pixels pixels(in);
    const Flush where = flush(in);
    if (in_planes) {
        const Yuv420Planes src(tasks.layout, pixels, s.src_w, s.src_h, stride, where);
        band.src = src.y.first();
        set_chroma(band, src);
        check_planes(in, s, pixels, tasks.planes, band, true, where, tasks.planes_definition);
    } else {
        const Buffer src =
            source(pixels, reference::yuv420_size(tasks.layout, s.src_w, s.src_h), where);
        band.src = src.data();
        band.src_row_bytes = -5;  // the picture is packed
        check_planes(in, s, pixels, tasks.contiguous, band, false, where,
                     tasks.contiguous_definition);
    }
}

constexpr Tasks<ovrin_yuv_band> kI420Tasks = {reference::kI420, _resize_yuv420_tp,
                                              reference::resize_yuv420_tp, _resize_y_u_v_tp,
                                              reference::resize_y_u_v_tp};
constexpr Tasks<ovrin_nv21_band> kNv21Tasks = {reference::kNv21, _resize_nv21_tp,
                                               reference::resize_nv21_tp, _resize_y_nv21_tp,
                                               reference::resize_y_nv21_tp};

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const uint8_t format = in.byte() % 3;
    Sizes s = sizes(in);
    s.src_h += in.between(0, 40);
    s.dst_h += in.between(0, 20);
    if (format == 0) {
        rgba(in, s);
    } else if (format == 1) {
        yuv420(in, s, kI420Tasks);
    } else {
        yuv420(in, s, kNv21Tasks);
    }
    return 0;
}
