// SPDX-License-Identifier: Apache-2.0
// Every function of the public header while each thing that it asks of the system is refused: each
// request alone, and each together with all that follow, until a call gets through. The outcome is
// the one that the header states, nothing leaks, no thread stays behind, nothing hangs.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <unistd.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <iostream>
#include <set>
#include <string>
#include <vector>

#include "declared_functions.h"
#include "reference/yuv420.h"
#include "support/entries.h"
#include "support/faults.h"
#include "support/letterbox.h"
#include "support/random.h"

using faults::Kind;
using namespace ovrin_test;

namespace {

using Bytes = std::vector<uint8_t>;
using Names = std::set<std::string>;

constexpr uint8_t kOld = 0xEE;
constexpr int32_t kSrcW = 9;
constexpr int32_t kTall = 1100;  // rows: in bands
constexpr int32_t kLow = 60;     // rows: on the calling thread

// What a call may leave behind, by name. "whole" is what it gives when nothing is refused.
struct Outcome {
    std::string name;
    std::function<bool(const Bytes&)> matches;
};

Outcome exactly(const char* name, const Bytes& bytes) {
    return {name, [bytes](const Bytes& result) { return result == bytes; }};
}

// The outcomes that must come up, and no others: empty where nothing of that kind is asked for.
struct Promise {
    Names memory_once;
    Names memory_for_good;
    Names threads_once;  // threads, mutexes and conditions
    Names threads_for_good;
    // A pool stays when there is no thread to end it in the background.
    bool pool_stays = false;
};

const Promise kAsksForNothing = {};
// Workers help, and the calling thread can do without.
const Promise kAlwaysWhole = {{"whole"}, {"whole"}, {"whole"}, {"whole"}};
const Promise kWholeWithMemory = {{"whole"}, {"untouched"}, {"whole"}, {"whole"}};
const Promise kUntouchedWithoutMemory = {{"untouched"}, {"untouched"}, {}, {}};
const Promise kNullWithoutMemory = {{"null"}, {"null"}, {}, {}};
const Promise kNull = {{"null"}, {"null"}, {"null"}, {"null"}, true};

// One way to call a function.
struct Way {
    const char* function;
    const char* what;
    Promise promise;
    std::function<Bytes()> run;
    std::vector<Outcome> outcomes = {};  // besides "whole" and "untouched"
    std::function<void()> prepare = [] {};
    // Without a thread for it the pool stays, by its own promise.
    bool ends_in_background = false;
};

// ---- Calls ----------------------------------------------------------------------------------

size_t bytes_of(int64_t count) {
    return static_cast<size_t>(count);
}

// Larger than any call needs: how much is read is other tests' business.
const Bytes& source() {
    static const Bytes bytes = Random(151).bytes(2000000);
    return bytes;
}

const uint8_t* src() {
    return source().data();
}

// Runs draw(destination) on a destination of `size` bytes that can hold pixels.
Bytes drawn(int64_t size, const std::function<void(uint8_t*)>& draw) {
    std::vector<uint32_t> words(bytes_of(size + 3) / 4);
    auto* bytes = reinterpret_cast<uint8_t*>(words.data());
    memset(bytes, kOld, words.size() * 4);
    draw(bytes);
    return Bytes(bytes, bytes + size);
}

uint32_t* words(uint8_t* bytes) {
    return reinterpret_cast<uint32_t*>(bytes);
}

template <class Function>
std::function<Bytes()> rgba(Function* resize, int32_t src_h) {
    return [=] {
        return drawn(7 * 333 * 4,
                     [=](uint8_t* dst) { resize(src(), words(dst), kSrcW, src_h, 7, 333); });
    };
}

ovrin_resize_target canvas_for(int32_t h, uint8_t* dst, int32_t src_h) {
    ovrin_resize_target target = letterbox(11, h + 5, 8, h, 2, 1);
    target.src_width = kSrcW;
    target.src_height = src_h;
    target.src_stride = kSrcW;
    target.dst = dst;
    return target;
}

template <class Function>
std::function<Bytes()> rgba_on_canvas(Function* resize, int32_t src_h) {
    return [=] {
        return drawn(11 * 338 * 4, [=](uint8_t* dst) {
            ovrin_resize_target target = canvas_for(333, dst, src_h);
            resize(src(), kSrcW, src_h, &target);
        });
    };
}

// The planes of 4:2:0 sources.
const uint8_t* plane(int index) {
    return src() + 100000 * index;
}

template <class Function>
std::function<Bytes()> contiguous(Function* resize, int32_t src_h, int32_t w, int32_t h) {
    return [=] {
        return drawn(reference::i420_size(w, h),
                     [=](uint8_t* dst) { resize(src(), dst, kSrcW, src_h, w, h); });
    };
}

template <class Function>
std::function<Bytes()> planar(Function* resize, int32_t src_h, int32_t w, int32_t h) {
    return [=] {
        return drawn(reference::i420_size(w, h), [=](uint8_t* dst) {
            resize(plane(0), plane(1), plane(2), dst, kSrcW, src_h, w, h, nullptr);
        });
    };
}

template <class Function>
std::function<Bytes()> semi_planar(Function* resize, int32_t src_h, int32_t w, int32_t h) {
    return [=] {
        return drawn(reference::nv21_size(w, h), [=](uint8_t* dst) {
            resize(plane(0), plane(1), dst, kSrcW, src_h, w, h, nullptr);
        });
    };
}

using PlanarTarget = void(int32_t src_h, const ovrin_resize_target* target);

// `resize` gets a 4:2:0 canvas, in either layout.
std::function<Bytes()> on_canvas(PlanarTarget* resize, int32_t src_h) {
    return [=] {
        return drawn(reference::nv21_size(11, 337), [=](uint8_t* dst) {
            const ovrin_resize_target target = canvas_for(332, dst, src_h);
            resize(src_h, &target);
        });
    };
}

void y_u_v_sg_on(int32_t src_h, const ovrin_resize_target* target) {
    ovrin_resize_y_u_v_sg(plane(0), plane(1), plane(2), nullptr, kSrcW, src_h, 0, 0, target);
}
void y_u_v_tps_on(int32_t src_h, const ovrin_resize_target* target) {
    ovrin_resize_y_u_v_tps(plane(0), plane(1), plane(2), nullptr, kSrcW, src_h, 0, 0, target);
}
void y_u_v_keep_ratio(int32_t src_h, const ovrin_resize_target* target) {
    ovrin_resize_y_u_v_keep_ratio(plane(0), plane(1), plane(2), kSrcW, src_h, target);
}
void y_nv_sg_on(int32_t src_h, const ovrin_resize_target* target) {
    ovrin_resize_y_nv_sg(plane(0), plane(1), nullptr, kSrcW, src_h, 0, 0, target);
}
void y_nv_tps_on(int32_t src_h, const ovrin_resize_target* target) {
    ovrin_resize_y_nv_tps(plane(0), plane(1), nullptr, kSrcW, src_h, 0, 0, target);
}
void y_nv_keep_ratio(int32_t src_h, const ovrin_resize_target* target) {
    ovrin_resize_y_nv21_keep_ratio(plane(0), plane(1), kSrcW, src_h, target);
}

// The wrappers lack the target that the functions behind them take.
void y_u_v(const uint8_t* y, const uint8_t* u, const uint8_t* v, uint8_t* dst, int32_t src_w,
           int32_t src_h, int32_t w, int32_t h, const ovrin_resize_target* /*target*/) {
    ovrin_resize_y_u_v(y, u, v, dst, src_w, src_h, w, h);
}
void y_nv(const uint8_t* y, const uint8_t* vu, uint8_t* dst, int32_t src_w, int32_t src_h,
          int32_t w, int32_t h, const ovrin_resize_target* /*target*/) {
    ovrin_resize_y_nv21(y, vu, dst, src_w, src_h, w, h);
}

// ---- Bands ----------------------------------------------------------------------------------

ovrin_rgba_band rgba_band(uint8_t* dst) {
    ovrin_rgba_band band = {};
    band.src_w = band.src_stride = kSrcW;
    band.src_h = band.src_rows = band.rows_to_do = kLow;
    band.dst_w = 7;
    band.dst_h = 33;
    band.band_rows = 32;
    band.src = src();
    band.dst = words(dst);
    return band;
}

// The fields that both kinds of 4:2:0 bands have.
template <class Band>
Band yuv_band(uint8_t* dst) {
    Band band = {};
    band.src_width = band.src_row_bytes = kSrcW;
    band.src_height = band.src_rows = band.y_rows = kLow;
    band.dst_width = 8;
    band.dst_height = 32;
    band.band_rows = 32;
    band.src = src();
    band.dst = dst;
    return band;
}

ovrin_yuv_band planar_band(uint8_t* dst) {
    auto band = yuv_band<ovrin_yuv_band>(dst);
    band.src_u = plane(1);
    band.src_v = plane(2);
    band.uv_rows = kLow / 2;
    return band;
}

ovrin_nv21_band pairs_band(uint8_t* dst) {
    auto band = yuv_band<ovrin_nv21_band>(dst);
    band.src_vu = plane(1);
    band.vu_rows = kLow / 2;
    return band;
}

// A band task on a band that is the whole of a small picture.
template <class Band>
std::function<Bytes()> band_task(void (*task)(void*), Band (*make)(uint8_t*), int64_t size) {
    return [=] {
        return drawn(size, [=](uint8_t* dst) {
            Band band = make(dst);
            task(&band);
            EXPECT_EQ(band.done, 1);
        });
    };
}

// A walker moves a record on; the result is the record's bytes.
template <class Band>
std::function<Bytes()> walker(Band (*make)(uint8_t*), const std::function<void(Band*)>& advance) {
    return [=] {
        Band band = make(nullptr);
        const Band before = band;
        advance(&band);
        EXPECT_NE(memcmp(&band, &before, sizeof band), 0);
        Bytes record(sizeof band);
        memcpy(record.data(), &band, sizeof band);
        return record;
    };
}

Bytes bilinear_band_task() {
    std::vector<int32_t> index(kLow);
    for (int32_t i = 0; i < kLow; ++i) index[bytes_of(i)] = i % kSrcW;
    const std::vector<int32_t> weight(kLow, 1024);
    return drawn(7 * 33 * 4, [&](uint8_t* dst) {
        ovrin_bilinear_band band = {};
        band.src_width = band.src_height = kSrcW;
        band.dst_w = band.canvas_width = 7;
        band.dst_h = band.end_row = 33;
        band.src = src();
        band.dst = dst;
        band.format = 7;
        band.col_weight = band.row_weight = weight.data();
        band.col_index = band.row_index = index.data();
        band.src_pitch = kSrcW * 4;
        band.bpp = 4;
        _ov_bilinear_tp(&band);
    });
}

Bytes lanczos_band_task() {
    const std::vector<double> weights(kLow * 7, 1.0 / 7);
    const float table = 1;
    return drawn(7 * 33 * 4, [&](uint8_t* dst) {
        ovrin_lanczos_band band = {kSrcW, kLow, 7,  33,     src(),          dst,
                                   4,     0,    33, &table, weights.data(), weights.data()};
        _resize_lanczos_tp(&band);
    });
}

// ---- Engines --------------------------------------------------------------------------------

using Bilinear = decltype(ov_bilinear_sg);

std::function<Bytes()> bilinear(Bilinear* resize, int32_t format, int32_t src_h, int32_t h) {
    return [=] {
        return drawn(7 * h * 4, [=](uint8_t* dst) {
            resize(src(), dst, kSrcW, src_h, 7, h, format, nullptr);
        });
    };
}

// In bands samples are copied; without a pool or records they are blended.
Way banded_bilinear(const char* what, int32_t format) {
    return {"ov_bilinear",
            what,
            {{"blended", "untouched"}, {"blended", "untouched"}, {"blended"}, {"blended"}},
            bilinear(ov_bilinear, format, kTall, kTall),
            {exactly("blended", bilinear(ov_bilinear_sg, format, kTall, kTall)())}};
}

// One pass of a large reduction; without its tables it draws nothing.
enum class Pass { kAsCalled, kBlended, kLost };

void run_pass(Pass pass, const uint8_t* from, uint8_t* to, int32_t w, int32_t h, int32_t to_w,
              int32_t to_h, int32_t format) {
    if (pass == Pass::kLost) return;
    (pass == Pass::kBlended ? ov_bilinear_sg : ov_bilinear)(from, to, w, h, to_w, to_h, format,
                                                            nullptr);
}

struct Reduction {
    int32_t src_w, src_h, dst_w, dst_h, format;

    Bytes run() const {
        return drawn(dst_w * dst_h * 4, [this](uint8_t* dst) {
            ov_bilinear_ex(src(), dst, src_w, src_h, dst_w, dst_h, format, nullptr);
        });
    }

    Bytes in_one_pass(Pass pass) const {
        return drawn(dst_w * dst_h * 4, [=](uint8_t* dst) {
            run_pass(pass, src(), dst, src_w, src_h, dst_w, dst_h, format);
        });
    }

    // The last entry is the pass into the destination, those before it halve.
    Bytes by_hand(const std::vector<Pass>& passes) const {
        return drawn(dst_w * dst_h * 4, [=](uint8_t* dst) {
            Bytes from = source();
            int32_t w = src_w, h = src_h;
            for (size_t i = 0; i + 1 < passes.size(); ++i) {
                Bytes half(bytes_of(src_w * src_h));
                run_pass(passes[i], from.data(), half.data(), w, h, w / 2, h / 2, format);
                from = half;
                w /= 2;
                h /= 2;
            }
            run_pass(passes.back(), from.data(), dst, w, h, dst_w, dst_h, format);
        });
    }
};

Way low_reduction(const char* what, int32_t format) {
    const Reduction to_an_eighth = {44, 48, 5, 6, format};
    const auto lost = [&](const std::vector<Pass>& passes) {
        return exactly("a halving lost", to_an_eighth.by_hand(passes));
    };
    return {"ov_bilinear_ex",
            what,
            {{"one pass", "a halving lost", "untouched"}, {"one pass", "untouched"}, {}, {}},
            [=] { return to_an_eighth.run(); },
            {exactly("one pass", to_an_eighth.in_one_pass(Pass::kAsCalled)),
             lost({Pass::kLost, Pass::kAsCalled, Pass::kAsCalled}),
             lost({Pass::kAsCalled, Pass::kLost, Pass::kAsCalled})}};
}

Way tall_reduction() {
    // No whole ratio: or copying twice would be copying once.
    const Reduction to_a_quarter = {50, 4950, 11, kTall, 7};
    const auto by_hand = [&](const char* name, Pass halving, Pass last) {
        return exactly(name, to_a_quarter.by_hand({halving, last}));
    };
    return {"ov_bilinear_ex",
            "tall",
            {{"one pass", "a halving lost", "first blended", "last blended", "untouched"},
             {"one pass blended", "both blended", "last blended", "untouched"},
             {"first blended", "last blended"},
             {"both blended", "last blended"}},
            [=] { return to_a_quarter.run(); },
            {exactly("one pass", to_a_quarter.in_one_pass(Pass::kAsCalled)),
             exactly("one pass blended", to_a_quarter.in_one_pass(Pass::kBlended)),
             by_hand("a halving lost", Pass::kLost, Pass::kAsCalled),
             by_hand("first blended", Pass::kBlended, Pass::kAsCalled),
             by_hand("last blended", Pass::kAsCalled, Pass::kBlended),
             by_hand("both blended", Pass::kBlended, Pass::kBlended)}};
}

Bytes lanczos_table() {
    float* table = create_lanczos_lookup();
    Bytes bytes(table == nullptr ? 0 : 16000 * sizeof(float));
    if (table != nullptr) memcpy(bytes.data(), table, bytes.size());
    free(table);
    return bytes;
}

Bytes lanczos_transform() {
    return drawn(11 * 17 * 3, [](uint8_t* dst) {
        const lanczos_image from = {19, 13, 19 * 3, 3, const_cast<uint8_t*>(src())};
        const lanczos_image to = {11, 17, 11 * 3, 3, dst};
        OvTransformLanczos(&from, &to);
    });
}

Bytes lanczos_packed() {
    return drawn(11 * 17 * 3, [](uint8_t* dst) { ov_lanczos(src(), 19, 13, dst, 11, 17, 3); });
}

constexpr size_t kNvLuma = 11 * 17;

Bytes lanczos_nv() {
    return drawn(kNvLuma * 3, [](uint8_t* dst) { ov_lanczos_nv(src(), 19, 13, dst, 11, 17); });
}

// Two transforms, each of which is whole or writes nothing.
Way lanczos_planes() {
    const Bytes whole = lanczos_nv();
    const auto middle = static_cast<Bytes::difference_type>(kNvLuma);
    Bytes only_luma = whole, only_chroma = whole;
    std::fill(only_luma.begin() + middle, only_luma.end(), kOld);
    std::fill(only_chroma.begin(), only_chroma.begin() + middle, kOld);
    return {"ov_lanczos_nv",
            "",
            {{"only luma", "only chroma"}, {"only luma", "untouched"}, {}, {}},
            lanczos_nv,
            {exactly("only luma", only_luma), exactly("only chroma", only_chroma)}};
}

constexpr int32_t kBandedRows = 100;  // three bands: rows 0 to 31, 32 to 63 and 64 to 99

Bytes lanczos_bands() {
    return drawn(6 * kBandedRows * 4, [](uint8_t* dst) {
        ovrin_resize_lanczos(src(), dst, kSrcW, kBandedRows, 6, kBandedRows, 4);
    });
}

// The number of bands that are black while the others are drawn; -1 for anything else.
int black_bands(const Bytes& result, const Bytes& whole) {
    int black = 0;
    for (const auto& [first, end] :
         {std::pair<int, int>{0, 32}, std::pair<int, int>{32, 64}, {64, kBandedRows}}) {
        const auto bytes_at = [](const Bytes& bytes, int row) { return bytes.begin() + row * 24; };
        const Bytes band(bytes_at(result, first), bytes_at(result, end));
        if (band == Bytes(band.size(), 0)) {
            ++black;
        } else if (!std::equal(band.begin(), band.end(), bytes_at(whole, first))) {
            return -1;
        }
    }
    return black;
}

// A band that finds no memory stays black, and so do those for which it is missing as well.
Way lanczos_in_bands() {
    const Bytes whole = lanczos_bands();
    const auto black = [whole](int least, int most) {
        return [=](const Bytes& result) {
            const int count = black_bands(result, whole);
            return least <= count && count <= most;
        };
    };
    return {"ovrin_resize_lanczos",
            "three bands",
            {{"whole", "one band black", "untouched"},
             {"one band black", "bands black", "untouched"},
             {"whole"},
             {"whole"}},
            lanczos_bands,
            {{"one band black", black(1, 1)}, {"bands black", black(2, 3)}}};
}

// ---- Pool -----------------------------------------------------------------------------------

ovrin_threadpool* prepared = nullptr;

void make_idle_pool() {
    prepared = ovrin_threadpool_init(0);
}

void make_busy_pool() {
    prepared = ovrin_threadpool_init(2);
}

Bytes start_and_end_pool() {
    ovrin_threadpool* pool = ovrin_threadpool_init(4);
    if (pool == nullptr) return {};
    ovrin_threadpool_free(pool, 1);
    return {1};
}

void set_flag(void* flag) {
    *static_cast<uint8_t*>(flag) = 1;
}

// Adds a task, takes it out again and runs it.
Bytes pass_a_task() {
    uint8_t flag = kOld;
    EXPECT_EQ(ovrin_threadpool_add_task(prepared, set_flag, &flag, 1), 1);
    ovrin_threadpool_task* task = ovrin_threadpool_task_get_task(prepared);
    task->function(task->argument);
    ovrin_threadpool_task_init(task);
    ovrin_threadpool_free(prepared, 1);
    return {flag};
}

Bytes pass_through_queue() {
    static ovrin_threadpool_queue queue;
    memset(&queue, 0, sizeof queue);
    uint8_t entry = 0;
    EXPECT_EQ(ovrin_threadpool_queue_enqueue(&queue, &entry), 0);
    EXPECT_EQ(ovrin_threadpool_queue_getsize(&queue), 1U);
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(&queue), &entry);
    return {static_cast<uint8_t>(ovrin_threadpool_queue_is_empty(&queue))};
}

// ---- The table ------------------------------------------------------------------------------

void add_rgba(std::vector<Way>& ways) {
    ways.insert(
        ways.end(),
        {{"ovrin_resize_rgba8888", "low", kAsksForNothing, rgba(ovrin_resize_rgba8888, kLow)},
         {"ovrin_resize_rgba8888", "tall", kAlwaysWhole, rgba(ovrin_resize_rgba8888, kTall)},
         {"ovrin_resize_rgba8888_sg", "", kAsksForNothing, rgba(ovrin_resize_rgba8888_sg, kTall)},
         {"ovrin_resize_rgba8888_tps", "", kAlwaysWhole, rgba(ovrin_resize_rgba8888_tps, kTall)},
         {"ovrin_resize_rgba8888_keep_ratio", "low", kAsksForNothing,
          rgba_on_canvas(ovrin_resize_rgba8888_keep_ratio, kLow)},
         {"ovrin_resize_rgba8888_keep_ratio", "tall", kAlwaysWhole,
          rgba_on_canvas(ovrin_resize_rgba8888_keep_ratio, kTall)},
         {"ovrin_resize_rgba_keep_ratio_sg", "", kAsksForNothing,
          rgba_on_canvas(ovrin_resize_rgba_keep_ratio_sg, kTall)},
         {"ovrin_resize_rgba_keep_ratio_tps", "", kAlwaysWhole,
          rgba_on_canvas(ovrin_resize_rgba_keep_ratio_tps, kTall)},
         {"ovrin_resize_rgba8888_get_pos", "", kAsksForNothing,
          walker<ovrin_rgba_band>(rgba_band,
                                  [](ovrin_rgba_band* band) {
                                      ovrin_resize_rgba8888_get_pos(kSrcW, kLow, 7, 33, band);
                                  })},
         {"ovrin_resize_rgba8888_get_pos_keep_ratio", "", kAsksForNothing,
          walker<ovrin_rgba_band>(rgba_band,
                                  [](ovrin_rgba_band* band) {
                                      ovrin_resize_rgba8888_get_pos_keep_ratio(kSrcW, kLow, 7, 33,
                                                                               7, 33, band);
                                  })},
         {"_resize_rgba8888_tp", "", kAsksForNothing,
          band_task(_resize_rgba8888_tp, rgba_band, 7 * 33 * 4)},
         {"_resize_rgba8888_keep_ratio_tp", "", kAsksForNothing,
          band_task(_resize_rgba8888_keep_ratio_tp, rgba_band, 7 * 33 * 4)},
         {"ovrin_resize_rgb888", "", kAsksForNothing,
          [] {
              return drawn(7 * 333 * 3, [](uint8_t* dst) {
                  ovrin_resize_rgb888(src(), dst, kSrcW, kTall, 7, 333);
              });
          }},
         {"ovrin_resize_nearest_rgba8888", "", kAsksForNothing, [] {
              std::vector<uint32_t> pixels(kSrcW * kTall);
              memcpy(pixels.data(), src(), pixels.size() * 4);
              return drawn(7 * 333 * 4, [&](uint8_t* dst) {
                  ovrin_resize_nearest_rgba8888(pixels.data(), words(dst), kSrcW, kTall, 7, 333);
              });
          }}});
}

// 8 x 332 lies on the grid of multiples of 4, 6 x 333 does not and takes a work buffer.
void add_planar(std::vector<Way>& ways) {
    const Promise& buffer = kUntouchedWithoutMemory;
    ways.insert(
        ways.end(),
        {{"ovrin_resize_yuv420", "low", kAsksForNothing,
          contiguous(ovrin_resize_yuv420, kLow, 8, 332)},
         {"ovrin_resize_yuv420", "low, off the grid", buffer,
          contiguous(ovrin_resize_yuv420, kLow, 6, 333)},
         {"ovrin_resize_yuv420", "tall", kAlwaysWhole,
          contiguous(ovrin_resize_yuv420, kTall, 8, 332)},
         {"ovrin_resize_yuv420", "tall, off the grid", kWholeWithMemory,
          contiguous(ovrin_resize_yuv420, kTall, 6, 333)},
         {"ovrin_resize_yuv420_sg", "", kAsksForNothing,
          contiguous(ovrin_resize_yuv420_sg, kTall, 8, 332)},
         {"ovrin_resize_yuv420_sg", "off the grid", buffer,
          contiguous(ovrin_resize_yuv420_sg, kTall, 6, 333)},
         {"ovrin_resize_yuv420_tps", "", kAlwaysWhole,
          contiguous(ovrin_resize_yuv420_tps, kTall, 8, 332)},
         {"ovrin_resize_yuv420_tps", "off the grid", kWholeWithMemory,
          contiguous(ovrin_resize_yuv420_tps, kTall, 6, 333)},
         {"ovrin_resize_y_u_v", "low", kAsksForNothing, planar(y_u_v, kLow, 8, 332)},
         {"ovrin_resize_y_u_v", "tall", kAlwaysWhole, planar(y_u_v, kTall, 8, 332)},
         {"ovrin_resize_y_u_v", "tall, off the grid", kWholeWithMemory,
          planar(y_u_v, kTall, 6, 333)},
         {"ovrin_resize_y_u_v_keep_ratio", "low", buffer, on_canvas(y_u_v_keep_ratio, kLow)},
         {"ovrin_resize_y_u_v_keep_ratio", "tall", kWholeWithMemory,
          on_canvas(y_u_v_keep_ratio, kTall)},
         {"ovrin_resize_y_u_v_sg", "", kAsksForNothing,
          planar(ovrin_resize_y_u_v_sg, kTall, 8, 332)},
         {"ovrin_resize_y_u_v_sg", "off the grid", buffer,
          planar(ovrin_resize_y_u_v_sg, kTall, 6, 333)},
         {"ovrin_resize_y_u_v_sg", "on a canvas", buffer, on_canvas(y_u_v_sg_on, kTall)},
         {"ovrin_resize_y_u_v_tps", "", kAlwaysWhole,
          planar(ovrin_resize_y_u_v_tps, kTall, 8, 332)},
         {"ovrin_resize_y_u_v_tps", "off the grid", kWholeWithMemory,
          planar(ovrin_resize_y_u_v_tps, kTall, 6, 333)},
         {"ovrin_resize_y_u_v_tps", "on a canvas", kWholeWithMemory,
          on_canvas(y_u_v_tps_on, kTall)},
         {"ovrin_resize_yuv420_get_pos", "", kAsksForNothing,
          walker<ovrin_yuv_band>(
              planar_band,
              [](ovrin_yuv_band* band) { ovrin_resize_yuv420_get_pos(kSrcW, kLow, 8, 32, band); })},
         {"_resize_y_u_v_tp", "", kAsksForNothing,
          band_task(_resize_y_u_v_tp, planar_band, reference::i420_size(8, 32))},
         {"_resize_yuv420_tp", "", kAsksForNothing,
          band_task(_resize_yuv420_tp, planar_band, reference::i420_size(8, 32))}});
}

void add_nv21(std::vector<Way>& ways) {
    const Promise& buffer = kUntouchedWithoutMemory;
    ways.insert(
        ways.end(),
        {{"ovrin_resize_nv21", "low", kAsksForNothing, contiguous(ovrin_resize_nv21, kLow, 8, 332)},
         {"ovrin_resize_nv21", "low, off the grid", buffer,
          contiguous(ovrin_resize_nv21, kLow, 6, 333)},
         {"ovrin_resize_nv21", "tall", kAlwaysWhole, contiguous(ovrin_resize_nv21, kTall, 8, 332)},
         {"ovrin_resize_nv21", "tall, off the grid", kWholeWithMemory,
          contiguous(ovrin_resize_nv21, kTall, 6, 333)},
         {"ovrin_resize_nv21_sg", "", kAsksForNothing,
          contiguous(ovrin_resize_nv21_sg, kTall, 8, 332)},
         {"ovrin_resize_nv21_sg", "off the grid", buffer,
          contiguous(ovrin_resize_nv21_sg, kTall, 6, 333)},
         {"ovrin_resize_nv21_tps", "", kAlwaysWhole,
          contiguous(ovrin_resize_nv21_tps, kTall, 8, 332)},
         {"ovrin_resize_nv21_tps", "off the grid", kWholeWithMemory,
          contiguous(ovrin_resize_nv21_tps, kTall, 6, 333)},
         {"ovrin_resize_nv21_tps", "more bands than slots", kWholeWithMemory,
          [] {
              return drawn(reference::nv21_size(1, 32100), [](uint8_t* dst) {
                  ovrin_resize_nv21_tps(src(), dst, 1, 64100, 1, 32100);
              });
          }},
         {"ovrin_resize_y_nv21", "low", kAsksForNothing, semi_planar(y_nv, kLow, 8, 332)},
         {"ovrin_resize_y_nv21", "tall", kAlwaysWhole, semi_planar(y_nv, kTall, 8, 332)},
         {"ovrin_resize_y_nv21", "tall, off the grid", kWholeWithMemory,
          semi_planar(y_nv, kTall, 6, 333)},
         {"ovrin_resize_y_nv21_keep_ratio", "low", buffer, on_canvas(y_nv_keep_ratio, kLow)},
         {"ovrin_resize_y_nv21_keep_ratio", "tall", kWholeWithMemory,
          on_canvas(y_nv_keep_ratio, kTall)},
         {"ovrin_resize_y_nv_sg", "", kAsksForNothing,
          semi_planar(ovrin_resize_y_nv_sg, kTall, 8, 332)},
         {"ovrin_resize_y_nv_sg", "off the grid", buffer,
          semi_planar(ovrin_resize_y_nv_sg, kTall, 6, 333)},
         {"ovrin_resize_y_nv_sg", "on a canvas", buffer, on_canvas(y_nv_sg_on, kTall)},
         {"ovrin_resize_y_nv_tps", "", kAlwaysWhole,
          semi_planar(ovrin_resize_y_nv_tps, kTall, 8, 332)},
         {"ovrin_resize_y_nv_tps", "off the grid", kWholeWithMemory,
          semi_planar(ovrin_resize_y_nv_tps, kTall, 6, 333)},
         {"ovrin_resize_y_nv_tps", "on a canvas", kWholeWithMemory, on_canvas(y_nv_tps_on, kTall)},
         {"ovrin_resize_nv21_get_pos", "", kAsksForNothing,
          walker<ovrin_nv21_band>(
              pairs_band,
              [](ovrin_nv21_band* band) { ovrin_resize_nv21_get_pos(kSrcW, kLow, 8, 32, band); })},
         {"_resize_nv21_tp", "", kAsksForNothing,
          band_task(_resize_nv21_tp, pairs_band, reference::nv21_size(8, 32))},
         {"_resize_y_nv21_tp", "", kAsksForNothing,
          band_task(_resize_y_nv21_tp, pairs_band, reference::nv21_size(8, 32))}});
}

void add_engines(std::vector<Way>& ways) {
    const Promise& buffer = kUntouchedWithoutMemory;
    ways.insert(
        ways.end(),
        {{"ov_bilinear_sg", "planar", buffer, bilinear(ov_bilinear_sg, 2, kTall, kTall)},
         {"ov_bilinear_sg", "pixels", buffer, bilinear(ov_bilinear_sg, 7, kTall, kTall)},
         {"ov_bilinear_sg", "semi-planar", buffer, bilinear(ov_bilinear_sg, 18, kTall, kTall)},
         {"ov_bilinear", "low", buffer, bilinear(ov_bilinear, 7, kTall, kLow)},
         banded_bilinear("planar, tall", 2),
         banded_bilinear("pixels, tall", 7),
         banded_bilinear("semi-planar, tall", 18),
         low_reduction("planar", 2),
         low_reduction("pixels", 7),
         low_reduction("semi-planar", 18),
         tall_reduction(),
         {"_ov_bilinear_tp", "", kAsksForNothing, bilinear_band_task},
         {"create_lanczos_lookup", "", kNullWithoutMemory, lanczos_table, {exactly("null", {})}},
         {"checkOvImage", "", kAsksForNothing,
          [] {
              const lanczos_image image = {1, 1, 1, 1, const_cast<uint8_t*>(src())};
              return Bytes{static_cast<uint8_t>(checkOvImage(&image))};
          }},
         {"OvTransformLanczos", "", buffer, lanczos_transform},
         {"ov_lanczos", "", buffer, lanczos_packed},
         lanczos_planes(),
         lanczos_in_bands(),
         {"_resize_lanczos_tp", "", buffer, lanczos_band_task}});
}

void add_pool(std::vector<Way>& ways) {
    const auto end_in_background = [] {
        ovrin_threadpool_free(prepared, 0);
        return Bytes{1};
    };
    const Way passes[] = {
        {"ovrin_threadpool_add_task", "", kAsksForNothing, pass_a_task, {}, make_idle_pool},
        {"ovrin_threadpool_task_get_task", "", kAsksForNothing, pass_a_task, {}, make_idle_pool},
        {"ovrin_threadpool_task_init", "", kAsksForNothing, pass_a_task, {}, make_idle_pool},
        {"ovrin_threadpool_free", "synchronous", kAsksForNothing, pass_a_task, {}, make_idle_pool},
        {"ovrin_threadpool_free",
         "in the background",
         {{}, {}, {"whole"}, {"whole"}, true},
         end_in_background,
         {},
         make_busy_pool,
         true},
        {"ovrin_threadpool_init", "", kNull, start_and_end_pool, {exactly("null", {})}},
        {"ovrin_threadpool_queue_enqueue", "", kAsksForNothing, pass_through_queue},
        {"ovrin_threadpool_queue_dequeue", "", kAsksForNothing, pass_through_queue},
        {"ovrin_threadpool_queue_is_empty", "", kAsksForNothing, pass_through_queue},
        {"ovrin_threadpool_queue_getsize", "", kAsksForNothing, pass_through_queue},
        {"ov_sleep", "", kAsksForNothing, [] { return Bytes{static_cast<uint8_t>(ov_sleep(1))}; }}};
    ways.insert(ways.end(), std::begin(passes), std::end(passes));
}

std::vector<Way> every_way() {
    std::vector<Way> ways;
    add_rgba(ways);
    add_planar(ways);
    add_nv21(ways);
    add_engines(ways);
    add_pool(ways);
    return ways;
}

// ---- The harness ----------------------------------------------------------------------------

constexpr unsigned kHangSeconds = 300;
char running[200];

void give_up(int /*signal*/) {
    const char text[] = " hangs\n";
    if (write(2, running, strlen(running)) < 0 || write(2, text, sizeof text - 1) < 0) _exit(3);
    _exit(2);
}

// Pools that could start neither a worker nor the thread that would end them stay behind, flagged:
// that is their promise. They are whole, so that they can be ended here.
int end_stranded_pools() {
    int ended = 0;
    for (void* block : faults::live_blocks_of(sizeof(ovrin_threadpool))) {
        auto* pool = static_cast<ovrin_threadpool*>(block);
        EXPECT_EQ(pool->stop, 1);
        ovrin_threadpool_free(pool, 1);
        ++ended;
    }
    return ended;
}

bool is_memory(Kind kind) {
    return kind == Kind::kMalloc || kind == Kind::kCalloc;
}

class Refusals {
public:
    explicit Refusals(const Way& way) : way_(way) {
        whole_ = call();
        outcomes_ = way.outcomes;
        outcomes_.insert(outcomes_.begin(), {exactly("whole", whole_),
                                             exactly("untouched", Bytes(whole_.size(), kOld))});
    }

    // Returns the number of refusals.
    int run() {
        EXPECT_NE(whole_, Bytes(whole_.size(), kOld));
        check_set(once(is_memory), way_.promise.memory_once, "memory, once");
        check_set(for_good(is_memory), way_.promise.memory_for_good, "memory, for good");
        const auto is_thread = [](Kind kind) { return !is_memory(kind); };
        check_set(once(is_thread), way_.promise.threads_once, "threads, once");
        check_set(for_good(is_thread), way_.promise.threads_for_good, "threads, for good");
        return refusals_;
    }

private:
    Bytes call() {
        way_.prepare();
        faults::reset();
        return way_.run();
    }

    Names once(bool (*chosen)(Kind)) { return refuse_each(chosen, false); }
    Names for_good(bool (*chosen)(Kind)) { return refuse_each(chosen, true); }

    // The outcomes that came up.
    Names refuse_each(bool (*chosen)(Kind), bool and_all_later) {
        Names seen;
        for (const Kind kind : faults::kAllKinds) {
            for (int nth = 1; chosen(kind) && refuse(kind, nth, and_all_later, seen); ++nth) {
                ++refusals_;
            }
        }
        return seen;
    }

    // False when the call got by without an nth request.
    bool refuse(Kind kind, int nth, bool and_all_later, Names& seen) {
        snprintf(running, sizeof running, "%s (%s), %s call %d%s", way_.function, way_.what,
                 faults::name(kind), nth, and_all_later ? " and all later ones" : "");
        SCOPED_TRACE(static_cast<const char*>(running));
        way_.prepare();
        alarm(kHangSeconds);
        faults::fail(kind, nth, and_all_later);
        const Bytes result = way_.run();
        const bool failed = faults::has_failed();
        if (failed) {
            seen.insert(name_of(result));
        } else {
            EXPECT_EQ(name_of(result), "whole");
        }
        if (failed && kind == Kind::kThread && (and_all_later || way_.ends_in_background)) {
            faults::reset();
            EXPECT_EQ(end_stranded_pools() > 0, way_.promise.pool_stays);
        }
        EXPECT_EQ(faults::live_blocks(), 0);
        faults::reset();
        EXPECT_TRUE(only_this_thread());
        alarm(0);
        return failed;
    }

    std::string name_of(const Bytes& result) const {
        for (const Outcome& outcome : outcomes_) {
            if (outcome.matches(result)) return outcome.name;
        }
        return "none of the stated outcomes";
    }

    static void check_set(const Names& seen, const Names& expected, const char* what) {
        EXPECT_EQ(seen, expected) << what;
    }

    const Way& way_;
    Bytes whole_;
    std::vector<Outcome> outcomes_;
    int refusals_ = 0;
};

}  // namespace

TEST(EveryEntryPoint, TheTableNamesEachFunctionOfTheHeader) {
    Names declared, in_table;
    for (const char* function : kDeclaredFunctions) declared.insert(function);
    for (const Way& way : every_way()) in_table.insert(way.function);
    EXPECT_GE(declared.size(), 50U);
    EXPECT_EQ(in_table, declared);
}

TEST(EveryEntryPoint, HasItsStatedOutcomeWhateverIsRefused) {
    signal(SIGALRM, give_up);
    int total = 0;
    for (const Way& way : every_way()) {
        SCOPED_TRACE(::testing::Message() << way.function << " " << way.what);
        const int refusals = Refusals(way).run();
        std::cout << way.function << (*way.what == 0 ? "" : ", ") << way.what << ": " << refusals
                  << " refusals\n";
        total += refusals;
    }
    std::cout << "refusals in all: " << total << "\n";
    RecordProperty("refusals", total);
}
