// SPDX-License-Identifier: Apache-2.0
// Null, 0, -1, the smallest and the largest number in every argument of every function, alone and
// in pairs. A rule says for each combination what must come of it; what the header leaves undefined
// is not called, and the rule says why.
#include <gtest/gtest.h>
#include <ovrinresize.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <functional>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <vector>

#include "support/bands.h"
#include "support/guarded_buffer.h"
#include "support/pictures.h"

using namespace ovrin_test;

// Memory for the largest numbers is refused, as it is without a sanitizer, which would stop here.
extern "C" const char* __asan_default_options() {
    return "allocator_may_return_null=1";
}
extern "C" const char* __tsan_default_options() {
    return "allocator_may_return_null=1";
}

namespace {

constexpr uint8_t kFill = 0xEE;

// ---- Combinations ----

// An argument, or a field that an argument points to. Pointers are 1 where they are given and 0
// where they are null.
struct Argument {
    const char* name;
    bool is_pointer;
    int32_t usual;
};

// Values by argument's name.
using Values = std::map<std::string, int32_t>;

// What must come of a call. kEmpty: the canvas of a picture without pixels, luma 0 and chroma 128,
// or 0 where the picture lies. kContained: whatever lies in the destination, nothing else is
// touched and the call returns.
enum class Outcome { kUntouched, kZero, kEmpty, kContained, kUndefined };

struct Verdict {
    Outcome outcome;
    const char* reason = "";
};

constexpr Verdict kUntouched = {Outcome::kUntouched};
constexpr Verdict kZero = {Outcome::kZero};
constexpr Verdict kEmpty = {Outcome::kEmpty};
constexpr Verdict kContained = {Outcome::kContained};

constexpr Verdict undefined(const char* reason) {
    return {Outcome::kUndefined, reason};
}
constexpr Verdict kNullPointer = undefined("pointers are not checked for null");
constexpr Verdict kTooLarge = undefined("a buffer must be as large as the sizes say");

std::vector<int32_t> bad_values(const Argument& argument) {
    if (argument.is_pointer) return {0};
    return {0, -1, INT32_MIN, INT32_MAX};
}

// check(values) for each combination of one or two bad values.
void every_pair(const std::vector<Argument>& arguments, const std::function<void(Values)>& check) {
    Values usual;
    for (const Argument& argument : arguments) usual[argument.name] = argument.usual;
    for (size_t i = 0; i < arguments.size(); ++i) {
        for (const int32_t first : bad_values(arguments[i])) {
            Values one = usual;
            one[arguments[i].name] = first;
            check(one);
            for (size_t j = i + 1; j < arguments.size(); ++j) {
                for (const int32_t second : bad_values(arguments[j])) {
                    Values two = one;
                    two[arguments[j].name] = second;
                    check(two);
                }
            }
        }
    }
}

std::string describe(const Values& values) {
    std::string text;
    for (const auto& [name, value] : values) text += name + "=" + std::to_string(value) + " ";
    return text;
}

// A destination and what a call made of it.
struct Destination {
    GuardedBuffer<uint8_t> buffer;
    size_t luma;  // bytes of luma; the rest is chroma

    Destination(size_t size, size_t luma_bytes) : buffer(size), luma(luma_bytes) { reset(); }

    void reset() { memset(buffer.data(), kFill, buffer.size()); }

    ::testing::AssertionResult is(Outcome outcome) const {
        if (!buffer.intact()) return ::testing::AssertionFailure() << "written before the buffer";
        if (outcome == Outcome::kContained) return ::testing::AssertionSuccess();
        for (size_t i = 0; i < buffer.size(); ++i) {
            const int expected = outcome == Outcome::kUntouched ? kFill : 0;
            const bool is_ground = outcome == Outcome::kEmpty && i >= luma && buffer[i] == 128;
            if (buffer[i] != expected && !is_ground) {
                return ::testing::AssertionFailure()
                       << "byte " << i << " is " << int{buffer[i]} << ", not " << expected;
            }
        }
        return ::testing::AssertionSuccess();
    }
};

// Counts what was called and what was left out, and says so.
class Tally {
public:
    explicit Tally(const char* function) : function_(function) {}
    ~Tally() {
        printf("%s: %d calls", function_, called_);
        for (const auto& [reason, count] : left_out_) {
            printf("; %d left out: %s", count, reason.c_str());
        }
        printf("\n");
        EXPECT_GT(called_, 0) << function_;
    }
    Tally(const Tally&) = delete;
    Tally& operator=(const Tally&) = delete;

    bool takes(const Verdict& verdict) {
        const bool defined = verdict.outcome != Outcome::kUndefined;
        if (defined) {
            ++called_;
        } else {
            ++left_out_[verdict.reason];
        }
        return defined;
    }

private:
    const char* function_;
    int called_ = 0;
    std::map<std::string, int> left_out_;
};

using Rule = std::function<Verdict(const Values&)>;
using Call = std::function<void(const Values&, uint8_t* dst)>;

// Calls a function with every combination that its rule defines. `call` gets the destination's
// address, or null where the combination says so.
void check_all(const char* function, const std::vector<Argument>& arguments, Destination& dst,
               const Rule& rule, const Call& call) {
    Tally tally(function);
    every_pair(arguments, [&](const Values& values) {
        const Verdict verdict = rule(values);
        if (!tally.takes(verdict)) return;
        SCOPED_TRACE(std::string(function) + ": " + describe(values));
        dst.reset();
        call(values, values.at("dst") != 0 ? dst.buffer.data() : nullptr);
        EXPECT_TRUE(dst.is(verdict.outcome));
    });
}

// ---- Sources ----

constexpr int32_t kSrcW = 9, kSrcH = 8, kDstW = 6, kDstH = 5;

// Long enough for the usual picture of any format, and what the bilinear engine reads behind it.
constexpr size_t kSourceBytes = kSrcW * kSrcH * 4 + kSrcW * 4 + 4;

const uint8_t* source() {
    static const GuardedBuffer<uint8_t> bytes(kSourceBytes, Flush::kEnd, 0x7B);
    return bytes.data();
}

const uint8_t* given(const Values& values, const char* name) {
    return values.at(name) != 0 ? source() : nullptr;
}

bool larger(const Values& values, const char* name, int32_t usual) {
    return values.at(name) > usual;
}

bool source_is_larger(const Values& v) {
    return larger(v, "src_w", kSrcW) || larger(v, "src_h", kSrcH);
}

bool destination_is_larger(const Values& v) {
    return larger(v, "dst_w", kDstW) || larger(v, "dst_h", kDstH);
}

// ---- Whole destinations of the quarter-point formats ----

std::vector<Argument> plain_arguments(const std::vector<const char*>& sources) {
    std::vector<Argument> arguments;
    for (const char* name : sources) arguments.push_back({name, true, 1});
    arguments.insert(arguments.end(), {{"dst", true, 1},
                                       {"src_w", false, kSrcW},
                                       {"src_h", false, kSrcH},
                                       {"dst_w", false, kDstW},
                                       {"dst_h", false, kDstH}});
    return arguments;
}

// A destination size of 0 or less: nothing is written. A source size of 0 or less: zeros.
Verdict plain_rule(const std::vector<const char*>& sources, const Values& v) {
    if (v.at("dst_w") < 1 || v.at("dst_h") < 1) return kUntouched;
    if (destination_is_larger(v)) return kTooLarge;
    if (v.at("dst") == 0) return kNullPointer;
    if (v.at("src_w") < 1 || v.at("src_h") < 1) return kZero;
    if (source_is_larger(v)) return kTooLarge;
    for (const char* name : sources) {
        if (v.at(name) == 0) return kNullPointer;
    }
    return kContained;
}

void check_plain(const char* function, const std::vector<const char*>& sources, size_t bytes,
                 const Call& call) {
    Destination dst(bytes, 0);
    check_all(
        function, plain_arguments(sources), dst,
        [&](const Values& v) { return plain_rule(sources, v); }, call);
}

void check_contiguous(const char* function, decltype(ovrin_resize_yuv420)* resize, size_t bytes) {
    check_plain(function, {"src"}, bytes, [&](const Values& v, uint8_t* dst) {
        resize(given(v, "src"), dst, v.at("src_w"), v.at("src_h"), v.at("dst_w"), v.at("dst_h"));
    });
}

void check_words(const char* function, decltype(ovrin_resize_rgba8888)* resize) {
    check_plain(function, {"src"}, kDstW * kDstH * 4, [&](const Values& v, uint8_t* dst) {
        resize(given(v, "src"), reinterpret_cast<uint32_t*>(dst), v.at("src_w"), v.at("src_h"),
               v.at("dst_w"), v.at("dst_h"));
    });
}

// ---- Canvases ----

constexpr int32_t kCanvasW = 9, kCanvasH = 8;

std::vector<Argument> canvas_arguments(const std::vector<const char*>& sources) {
    std::vector<Argument> arguments = {{"target", true, 1}};
    for (const char* name : sources) arguments.push_back({name, true, 1});
    arguments.insert(arguments.end(), {{"dst", true, 1},
                                       {"src_w", false, kSrcW},
                                       {"src_h", false, kSrcH},
                                       {"target.src_width", false, kSrcW},
                                       {"target.src_height", false, kSrcH},
                                       {"target.src_stride", false, kSrcW},
                                       {"target.src_buffer_height", false, kSrcH},
                                       {"target.format", false, 7},
                                       {"dst_w", false, kDstW},
                                       {"dst_h", false, kDstH},
                                       {"canvas_w", false, kCanvasW},
                                       {"canvas_h", false, kCanvasH},
                                       {"dst_x", false, 2},
                                       {"dst_y", false, 1}});
    return arguments;
}

ovrin_resize_target target_of(const Values& v, uint8_t* dst) {
    ovrin_resize_target t = {};
    t.src_vu_plane = t.src_u_plane = t.src_v_plane = source();
    t.src_width = v.at("target.src_width");
    t.src_height = v.at("target.src_height");
    t.src_stride = v.at("target.src_stride");
    t.src_buffer_height = v.at("target.src_buffer_height");
    t.format = v.at("target.format");
    t.dst = dst;
    t.dst_width = v.at("dst_w");
    t.dst_height = v.at("dst_h");
    t.canvas_width = v.at("canvas_w");
    t.canvas_height = v.at("canvas_h");
    t.dst_x = v.at("dst_x");
    t.dst_y = v.at("dst_y");
    return t;
}

bool has_no_canvas(const Values& v) {
    return v.at("canvas_w") < 1 || v.at("canvas_h") < 1;
}

bool overhangs(const Values& v) {
    return v.at("canvas_w") < int64_t{v.at("dst_w")} + v.at("dst_x") ||
           v.at("canvas_h") < int64_t{v.at("dst_h")} + v.at("dst_y");
}

// What holds for both kinds of canvas once a placement has been accepted. `background`: what a
// source without pixels leaves.
Verdict canvas_rule(const std::vector<const char*>& sources, const Values& v, Verdict background) {
    if (has_no_canvas(v)) return kContained;
    if (larger(v, "canvas_w", kCanvasW) || larger(v, "canvas_h", kCanvasH)) return kTooLarge;
    if (v.at("dst") == 0) return kNullPointer;
    const bool in_order = v.at("dst_x") >= 0 && v.at("dst_y") >= 0 && v.at("dst_w") > 0 &&
                          v.at("dst_h") > 0 && !overhangs(v);
    if (v.at("src_w") < 1 || v.at("src_h") < 1) return in_order ? background : kContained;
    if (source_is_larger(v)) return kTooLarge;
    const int32_t stride = v.at("target.src_stride");
    if (stride < 0 || stride > kSrcW) {
        return undefined("the source's rows must lie where src_stride says");
    }
    for (const char* name : sources) {
        if (v.at(name) == 0) return kNullPointer;
    }
    return kContained;
}

Verdict rgba_canvas_rule(bool checks_target, const Values& v) {
    if (v.at("target") == 0) return checks_target ? kUntouched : kNullPointer;
    if (v.at("canvas_w") < v.at("dst_x") || v.at("canvas_h") < v.at("dst_h") ||
        v.at("dst_h") == 0) {
        return kUntouched;
    }
    const bool cut_from_more = overhangs(v) && (larger(v, "target.src_width", kSrcW) ||
                                                larger(v, "target.src_height", kSrcH));
    if (cut_from_more && !has_no_canvas(v)) return kTooLarge;
    return canvas_rule({"src"}, v, kZero);
}

void check_rgba_canvas(const char* function, decltype(ovrin_resize_rgba_keep_ratio_sg)* resize,
                       bool checks_target) {
    Destination dst(kCanvasW * kCanvasH * 4, 0);
    check_all(
        function, canvas_arguments({"src"}), dst,
        [&](const Values& v) { return rgba_canvas_rule(checks_target, v); },
        [&](const Values& v, uint8_t* canvas) {
            const bool rejected = rgba_canvas_rule(checks_target, v).outcome == Outcome::kUntouched;
            ovrin_resize_target target = target_of(v, canvas);
            const ovrin_resize_target before = target;
            resize(given(v, "src"), v.at("src_w"), v.at("src_h"),
                   v.at("target") != 0 ? &target : nullptr);
            if (rejected) {
                EXPECT_EQ(memcmp(&target, &before, sizeof target), 0);
            }
        });
}

// From 1024 source rows on another function judges the placement, by dst_x.
Verdict plane_canvas_rule(const std::vector<const char*>& sources, bool is_driver,
                          const Values& v) {
    // Without a target the destination is the argument, which is null and empty here.
    if (v.at("target") == 0) return kUntouched;
    const bool off_single = v.at("canvas_h") < v.at("dst_y");
    const bool off_driver = v.at("canvas_h") < v.at("dst_x");
    if (v.at("canvas_w") < v.at("dst_x") || v.at("dst_h") == 0) return kUntouched;
    if (off_single && off_driver) return kUntouched;
    if (source_is_larger(v) && !has_no_canvas(v)) return kTooLarge;
    if (off_single || (is_driver && off_driver)) return kUntouched;
    return canvas_rule(sources, v, kEmpty);
}

using CanvasCall = std::function<void(const Values&, const ovrin_resize_target* target)>;

void check_plane_canvas(const char* function, const std::vector<const char*>& sources,
                        bool is_driver, const CanvasCall& call) {
    const size_t luma = kCanvasW * kCanvasH;
    Destination dst(bytes_of_i420(kCanvasW, kCanvasH), luma);
    check_all(
        function, canvas_arguments(sources), dst,
        [&](const Values& v) { return plane_canvas_rule(sources, is_driver, v); },
        [&](const Values& v, uint8_t* canvas) {
            const ovrin_resize_target target = target_of(v, canvas);
            ovrin_resize_target passed = target;
            call(v, v.at("target") != 0 ? &passed : nullptr);
            EXPECT_EQ(memcmp(&passed, &target, sizeof target), 0) << "the target was written";
        });
}

// ---- Engines ----

bool is_format(int32_t format) {
    return format == 2 || format == 7 || format == 8 || format == 18 || format == 19;
}

Verdict bilinear_rule(const Values& v) {
    if (v.at("src_w") == 0 || v.at("src_h") == 0) return kUntouched;
    if (v.at("dst_w") < 1 || v.at("dst_h") < 1) return kUntouched;
    if (!is_format(v.at("format"))) return kUntouched;
    // A source must not be negative; that nothing is touched outside the buffers holds all the
    // same.
    if (destination_is_larger(v) || source_is_larger(v)) return kTooLarge;
    if (v.at("src") == 0 || v.at("dst") == 0) return kNullPointer;
    return kContained;
}

// The arguments' source size is only tested for 0; the rest comes from the target.
Verdict bilinear_canvas_rule(const Values& v) {
    if (v.at("src_w") == 0 || v.at("src_h") == 0) return kUntouched;
    if (v.at("dst_w") < 1 || v.at("dst_h") < 1) return kUntouched;
    if (!is_format(v.at("target.format"))) return kUntouched;
    if (v.at("target.src_width") == 0 || v.at("target.src_height") == 0) return kUntouched;
    if (destination_is_larger(v)) return undefined("tables for so many rows take all memory");
    if (v.at("dst_x") < 0 || v.at("dst_y") < 0) {
        return undefined("dst_x and dst_y must not be negative");
    }
    if (larger(v, "canvas_w", kCanvasW) || larger(v, "canvas_h", kCanvasH) ||
        larger(v, "target.src_width", kSrcW) || larger(v, "target.src_height", kSrcH)) {
        return kTooLarge;
    }
    const int32_t stride = v.at("target.src_stride");
    if (stride < 0 || stride > kSrcW) {
        return undefined("the source's rows must lie where src_stride says");
    }
    if (v.at("src") == 0 || v.at("dst") == 0) return kNullPointer;
    return kContained;
}

Verdict lanczos_rule(const Values& v) {
    for (const char* name : {"src", "dst", "src_w", "src_h", "dst_w", "dst_h", "bpp"}) {
        if (v.at(name) < 1) return kUntouched;
    }
    if (int64_t{v.at("src_w")} * v.at("bpp") > INT32_MAX) return kUntouched;
    if (int64_t{v.at("dst_w")} * v.at("bpp") > INT32_MAX) return kUntouched;
    if (source_is_larger(v) || destination_is_larger(v)) return kTooLarge;
    return kContained;
}

std::vector<Argument> lanczos_arguments() {
    auto arguments = plain_arguments({"src"});
    arguments.push_back({"bpp", false, 4});
    return arguments;
}

struct Free {
    void operator()(float* table) const { free(table); }
};

}  // namespace

// ---- Packed pictures ----

TEST(BadArguments, PackedPictures) {
    check_words("ovrin_resize_rgba8888", ovrin_resize_rgba8888);
    check_words("ovrin_resize_rgba8888_sg", ovrin_resize_rgba8888_sg);
    check_words("ovrin_resize_rgba8888_tps", ovrin_resize_rgba8888_tps);
    check_contiguous("ovrin_resize_rgb888", ovrin_resize_rgb888, kDstW * kDstH * 3);
}

TEST(BadArguments, Nearest) {
    Destination dst(kDstW * kDstH * 4, 0);
    check_all(
        "ovrin_resize_nearest_rgba8888", plain_arguments({"src"}), dst,
        [](const Values& v) {
            for (const auto& [name, value] : v) {
                if (value < 1) return kUntouched;
            }
            return destination_is_larger(v) || source_is_larger(v) ? kTooLarge : kContained;
        },
        [](const Values& v, uint8_t* words) {
            ovrin_resize_nearest_rgba8888(reinterpret_cast<const uint32_t*>(given(v, "src")),
                                          reinterpret_cast<uint32_t*>(words), v.at("src_w"),
                                          v.at("src_h"), v.at("dst_w"), v.at("dst_h"));
        });
}

TEST(BadArguments, RgbaCanvases) {
    check_rgba_canvas("ovrin_resize_rgba8888_keep_ratio", ovrin_resize_rgba8888_keep_ratio, false);
    check_rgba_canvas("ovrin_resize_rgba_keep_ratio_sg", ovrin_resize_rgba_keep_ratio_sg, false);
    check_rgba_canvas("ovrin_resize_rgba_keep_ratio_tps", ovrin_resize_rgba_keep_ratio_tps, true);
}

// ---- Planes ----

TEST(BadArguments, ContiguousPlanes) {
    const size_t i420 = bytes_of_i420(kDstW, kDstH);
    check_contiguous("ovrin_resize_yuv420", ovrin_resize_yuv420, i420);
    check_contiguous("ovrin_resize_yuv420_sg", ovrin_resize_yuv420_sg, i420);
    check_contiguous("ovrin_resize_yuv420_tps", ovrin_resize_yuv420_tps, i420);
    const size_t nv21 = bytes_of_nv21(kDstW, kDstH);
    check_contiguous("ovrin_resize_nv21", ovrin_resize_nv21, nv21);
    check_contiguous("ovrin_resize_nv21_sg", ovrin_resize_nv21_sg, nv21);
    check_contiguous("ovrin_resize_nv21_tps", ovrin_resize_nv21_tps, nv21);
}

TEST(BadArguments, SeparatePlanes) {
    const size_t i420 = bytes_of_i420(kDstW, kDstH);
    const std::vector<const char*> three = {"src_y", "src_u", "src_v"};
    check_plain("ovrin_resize_y_u_v", three, i420, [](const Values& v, uint8_t* dst) {
        ovrin_resize_y_u_v(given(v, "src_y"), given(v, "src_u"), given(v, "src_v"), dst,
                           v.at("src_w"), v.at("src_h"), v.at("dst_w"), v.at("dst_h"));
    });
    for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
        check_plain("ovrin_resize_y_u_v_sg, _tps", three, i420, [&](const Values& v, uint8_t* dst) {
            resize(given(v, "src_y"), given(v, "src_u"), given(v, "src_v"), dst, v.at("src_w"),
                   v.at("src_h"), v.at("dst_w"), v.at("dst_h"), nullptr);
        });
    }
    const size_t nv21 = bytes_of_nv21(kDstW, kDstH);
    const std::vector<const char*> two = {"src_y", "src_vu"};
    check_plain("ovrin_resize_y_nv21", two, nv21, [](const Values& v, uint8_t* dst) {
        ovrin_resize_y_nv21(given(v, "src_y"), given(v, "src_vu"), dst, v.at("src_w"),
                            v.at("src_h"), v.at("dst_w"), v.at("dst_h"));
    });
    for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
        check_plain("ovrin_resize_y_nv_sg, _tps", two, nv21, [&](const Values& v, uint8_t* dst) {
            resize(given(v, "src_y"), given(v, "src_vu"), dst, v.at("src_w"), v.at("src_h"),
                   v.at("dst_w"), v.at("dst_h"), nullptr);
        });
    }
}

TEST(BadArguments, PlaneCanvases) {
    const std::vector<const char*> three = {"src_y", "src_u", "src_v"};
    check_plane_canvas("ovrin_resize_y_u_v_keep_ratio", three, false,
                       [](const Values& v, const ovrin_resize_target* target) {
                           ovrin_resize_y_u_v_keep_ratio(given(v, "src_y"), given(v, "src_u"),
                                                         given(v, "src_v"), v.at("src_w"),
                                                         v.at("src_h"), target);
                       });
    for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
        check_plane_canvas("ovrin_resize_y_u_v_sg, _tps in a canvas", three,
                           resize == ovrin_resize_y_u_v_tps,
                           [&](const Values& v, const ovrin_resize_target* target) {
                               resize(given(v, "src_y"), given(v, "src_u"), given(v, "src_v"),
                                      nullptr, v.at("src_w"), v.at("src_h"), 0, 0, target);
                           });
    }
    const std::vector<const char*> two = {"src_y", "src_vu"};
    check_plane_canvas("ovrin_resize_y_nv21_keep_ratio", two, false,
                       [](const Values& v, const ovrin_resize_target* target) {
                           ovrin_resize_y_nv21_keep_ratio(given(v, "src_y"), given(v, "src_vu"),
                                                          v.at("src_w"), v.at("src_h"), target);
                       });
    for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
        check_plane_canvas("ovrin_resize_y_nv_sg, _tps in a canvas", two,
                           resize == ovrin_resize_y_nv_tps,
                           [&](const Values& v, const ovrin_resize_target* target) {
                               resize(given(v, "src_y"), given(v, "src_vu"), nullptr, v.at("src_w"),
                                      v.at("src_h"), 0, 0, target);
                           });
    }
}

// ---- Engines ----

TEST(BadArguments, Bilinear) {
    auto arguments = plain_arguments({"src"});
    arguments.push_back({"format", false, 7});
    Destination dst(kDstW * kDstH * 4, 0);
    for (auto* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
        check_all("ov_bilinear_sg, ov_bilinear, ov_bilinear_ex", arguments, dst, bilinear_rule,
                  [&](const Values& v, uint8_t* pixels) {
                      resize(given(v, "src"), pixels, v.at("src_w"), v.at("src_h"), v.at("dst_w"),
                             v.at("dst_h"), v.at("format"), nullptr);
                  });
    }
}

TEST(BadArguments, BilinearCanvases) {
    auto arguments = canvas_arguments({"src"});
    arguments.erase(arguments.begin());  // a null target: the test above
    Destination dst(kCanvasW * kCanvasH * 4, 0);
    for (auto* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
        check_all("ov_bilinear_sg, ov_bilinear, ov_bilinear_ex in a canvas", arguments, dst,
                  bilinear_canvas_rule, [&](const Values& v, uint8_t* pixels) {
                      const ovrin_resize_target target = target_of(v, nullptr);
                      ovrin_resize_target passed = target;
                      resize(given(v, "src"), pixels, v.at("src_w"), v.at("src_h"), v.at("dst_w"),
                             v.at("dst_h"), -1, &passed);
                      EXPECT_EQ(memcmp(&passed, &target, sizeof target), 0);
                  });
    }
}

TEST(BadArguments, Lanczos) {
    Destination dst(kDstW * kDstH * 4, 0);
    check_all("ov_lanczos", lanczos_arguments(), dst, lanczos_rule,
              [](const Values& v, uint8_t* pixels) {
                  ov_lanczos(given(v, "src"), v.at("src_w"), v.at("src_h"), pixels, v.at("dst_w"),
                             v.at("dst_h"), v.at("bpp"));
              });
    // So few rows are done on the calling thread.
    check_all(
        "ovrin_resize_lanczos", lanczos_arguments(), dst,
        [](const Values& v) {
            const Verdict verdict = lanczos_rule(v);
            const bool many = v.at("bpp") > 4 || larger(v, "dst_h", kDstH);
            return many && v.at("dst") != 0 && v.at("dst_w") > 0 && v.at("dst_h") > 0
                       ? undefined("dst needs room for 4 bytes a pixel, and no more may be passed")
                       : verdict;
        },
        [](const Values& v, uint8_t* pixels) {
            ovrin_resize_lanczos(given(v, "src"), pixels, v.at("src_w"), v.at("src_h"),
                                 v.at("dst_w"), v.at("dst_h"), v.at("bpp"));
        });
    Destination pairs(kDstW * kDstH * 3, 0);
    check_all(
        "ov_lanczos_nv", plain_arguments({"src"}), pairs,
        [](const Values& v) {
            for (const auto& [name, value] : v) {
                if (value < 1) return kUntouched;
            }
            return destination_is_larger(v) || source_is_larger(v) ? kTooLarge : kContained;
        },
        [](const Values& v, uint8_t* pixels) {
            ov_lanczos_nv(given(v, "src"), v.at("src_w"), v.at("src_h"), pixels, v.at("dst_w"),
                          v.at("dst_h"));
        });
}

namespace {

lanczos_image image_of(const Values& v, const std::string& prefix, uint8_t* data) {
    return {v.at(prefix + "width"), v.at(prefix + "height"), v.at(prefix + "stride"),
            v.at(prefix + "bpp"), data};
}

bool is_image(const Values& v, const std::string& prefix) {
    for (const char* field : {"width", "height", "stride", "bpp"}) {
        if (v.at(prefix + field) < 1) return false;
    }
    return true;
}

}  // namespace

TEST(BadArguments, LanczosImages) {
    const std::vector<Argument> arguments = {{"src", true, 1},
                                             {"src.data", true, 1},
                                             {"src.width", false, kSrcW},
                                             {"src.height", false, kSrcH},
                                             {"src.stride", false, 36},
                                             {"src.bpp", false, 4},
                                             {"dst.image", true, 1},
                                             {"dst", true, 1},
                                             {"dst.width", false, kDstW},
                                             {"dst.height", false, kDstH},
                                             {"dst.stride", false, 24},
                                             {"dst.bpp", false, 4}};
    Destination dst(kDstW * kDstH * 4, 0);
    check_all(
        "OvTransformLanczos", arguments, dst,
        [](const Values& v) {
            if (v.at("src") == 0 || v.at("src.data") == 0 || !is_image(v, "src.")) {
                return kUntouched;
            }
            if (v.at("dst.image") == 0 || v.at("dst") == 0 || !is_image(v, "dst.")) {
                return kUntouched;
            }
            if (v.at("src.stride") < int64_t{v.at("src.width")} * v.at("src.bpp")) {
                return kUntouched;
            }
            for (const auto& [name, value] : v) {
                if (value == INT32_MAX) return kTooLarge;
            }
            return kContained;
        },
        [](const Values& v, uint8_t* pixels) {
            const lanczos_image from =
                image_of(v, "src.", const_cast<uint8_t*>(given(v, "src.data")));
            const lanczos_image to = image_of(v, "dst.", pixels);
            EXPECT_EQ(checkOvImage(&to), pixels != nullptr && is_image(v, "dst.") ? 1 : 0);
            OvTransformLanczos(v.at("src") != 0 ? &from : nullptr,
                               v.at("dst.image") != 0 ? &to : nullptr);
        });
    EXPECT_EQ(checkOvImage(nullptr), 0);
}

// ---- Band records ----

namespace {

constexpr Verdict kRecord = undefined("a record must hold what a walk or a driver gives it");

// Walks a record over sizes that no picture has: only the fields that a walker writes may change.
template <class Band, class Walk>
void check_walker(const char* function, const std::vector<int32_t Band::*>& written, Walk walk) {
    const std::vector<Argument> arguments = {{"src_w", false, kSrcW}, {"src_h", false, 64},
                                             {"dst_w", false, kDstW}, {"dst_h", false, 40},
                                             {"canvas_w", false, 9},  {"canvas_h", false, 9},
                                             {"band_rows", false, 32}};
    Tally tally(function);
    every_pair(arguments, [&](const Values& v) {
        const bool steps = v.at("dst_h") == INT32_MAX || v.at("band_rows") == INT32_MAX;
        if (!tally.takes(steps ? undefined("src_h * dst_h and band_rows * dst_h must fit 32 bits")
                               : kContained)) {
            return;
        }
        SCOPED_TRACE(std::string(function) + ": " + describe(v));
        Band band = {};
        band.band_rows = v.at("band_rows");
        Band before = band;
        walk(v, band);
        for (const auto field : written) before.*field = band.*field;
        EXPECT_TRUE(same_record(band, before));
    });
}

}  // namespace

TEST(BadArguments, Walkers) {
    using R = ovrin_rgba_band;
    const std::vector<int32_t R::*> rgba = {&R::start_row,  &R::row_q1,    &R::row_q3, &R::row_acc,
                                            &R::di_11,      &R::di_13,     &R::di_31,  &R::di_33,
                                            &R::src_offset, &R::rows_to_do};
    check_walker<R>("ovrin_resize_rgba8888_get_pos", rgba, [](const Values& v, R& band) {
        ovrin_resize_rgba8888_get_pos(v.at("src_w"), v.at("src_h"), v.at("dst_w"), v.at("dst_h"),
                                      &band);
    });
    check_walker<R>("ovrin_resize_rgba8888_get_pos_keep_ratio", rgba, [](const Values& v, R& band) {
        ovrin_resize_rgba8888_get_pos_keep_ratio(v.at("src_w"), v.at("src_h"), v.at("dst_w"),
                                                 v.at("dst_h"), v.at("canvas_w"), v.at("canvas_h"),
                                                 &band);
    });
    using Y = ovrin_yuv_band;
    check_walker<Y>("ovrin_resize_yuv420_get_pos",
                    {&Y::y_start_row,  &Y::y_top_point,   &Y::y_bottom_point,  &Y::y_row_base,
                     &Y::y_top_left,   &Y::y_top_right,   &Y::y_bottom_left,   &Y::y_bottom_right,
                     &Y::uv_start_row, &Y::uv_top_point,  &Y::uv_bottom_point, &Y::uv_row_base,
                     &Y::uv_top_left,  &Y::uv_top_right,  &Y::uv_bottom_left,  &Y::uv_bottom_right,
                     &Y::src_y_offset, &Y::src_uv_offset, &Y::y_rows,          &Y::uv_rows},
                    [](const Values& v, Y& band) {
                        ovrin_resize_yuv420_get_pos(v.at("src_w"), v.at("src_h"), v.at("dst_w"),
                                                    v.at("dst_h"), &band);
                    });
    using N = ovrin_nv21_band;
    check_walker<N>("ovrin_resize_nv21_get_pos",
                    {&N::y_start_row,  &N::y_top_point,   &N::y_bottom_point,  &N::y_row_base,
                     &N::y_top_left,   &N::y_top_right,   &N::y_bottom_left,   &N::y_bottom_right,
                     &N::vu_start_row, &N::vu_top_point,  &N::vu_bottom_point, &N::vu_row_base,
                     &N::vu_top_left,  &N::vu_top_right,  &N::vu_bottom_left,  &N::vu_bottom_right,
                     &N::src_y_offset, &N::src_vu_offset, &N::y_rows,          &N::vu_rows},
                    [](const Values& v, N& band) {
                        ovrin_resize_nv21_get_pos(v.at("src_w"), v.at("src_h"), v.at("dst_w"),
                                                  v.at("dst_h"), &band);
                    });
}

namespace {

// A band without rows sets `done` and nothing else, whatever any two other fields hold.
template <class Band>
void check_task(const char* function, decltype(_resize_rgba8888_tp)* task,
                const std::vector<int32_t Band::*>& rows) {
    const auto& fields = fields_of(Band());
    std::vector<Argument> arguments;
    for (const auto& field : fields) arguments.push_back({field.name, false, 8});
    Tally tally(function);
    for (const int32_t none : {0, -1, INT32_MIN}) {
        every_pair(arguments, [&](const Values& v) {
            Band band = {};
            for (const auto& field : fields) band.*field.member = v.at(field.name);
            for (const auto row_count : rows) band.*row_count = none;
            tally.takes(kContained);
            Band expected = band;
            expected.done = 1;
            task(&band);
            ASSERT_TRUE(same_record(band, expected)) << function << ": " << describe(v);
        });
    }
    tally.takes(kRecord);  // null, and bands with rows
}

}  // namespace

TEST(BadArguments, TasksWithoutRows) {
    using R = ovrin_rgba_band;
    check_task<R>("_resize_rgba8888_tp", _resize_rgba8888_tp, {&R::rows_to_do});
    check_task<R>("_resize_rgba8888_keep_ratio_tp", _resize_rgba8888_keep_ratio_tp,
                  {&R::rows_to_do});
    using Y = ovrin_yuv_band;
    check_task<Y>("_resize_yuv420_tp", _resize_yuv420_tp, {&Y::y_rows, &Y::uv_rows});
    check_task<Y>("_resize_y_u_v_tp", _resize_y_u_v_tp, {&Y::y_rows, &Y::uv_rows});
    using N = ovrin_nv21_band;
    check_task<N>("_resize_nv21_tp", _resize_nv21_tp, {&N::y_rows, &N::vu_rows});
    check_task<N>("_resize_y_nv21_tp", _resize_y_nv21_tp, {&N::y_rows, &N::vu_rows});
}

// An unknown format, and rows that end before they begin.
TEST(BadArguments, BilinearTask) {
    Destination dst(kDstW * kDstH * 4, 0);
    const std::vector<int32_t> table(64);
    check_all(
        "_ov_bilinear_tp",
        {{"dst", true, 1},
         {"format", false, 7},
         {"first_row", false, 0},
         {"end_row", false, kDstH},
         {"dst_w", false, kDstW}},
        dst,
        [](const Values& v) {
            if (!is_format(v.at("format"))) return kUntouched;
            if (v.at("first_row") >= v.at("end_row")) return kUntouched;
            if (v.at("first_row") < 0 || larger(v, "end_row", kDstH) || larger(v, "dst_w", kDstW)) {
                return kRecord;
            }
            if (v.at("dst_w") < 1) return kUntouched;
            return v.at("dst") == 0 ? kNullPointer : kContained;
        },
        [&](const Values& v, uint8_t* pixels) {
            ovrin_bilinear_band band = {};
            band.src_width = kSrcW;
            band.src_height = kSrcH;
            band.dst_w = v.at("dst_w");
            band.dst_h = kDstH;
            band.src = source();
            band.dst = pixels;
            band.format = v.at("format");
            band.col_weight = band.row_weight = band.col_index = band.row_index = table.data();
            band.first_row = v.at("first_row");
            band.end_row = v.at("end_row");
            band.canvas_width = kDstW;
            band.src_pitch = kSrcW * 4;
            band.bpp = 4;
            _ov_bilinear_tp(&band);
        });
}

TEST(BadArguments, LanczosTask) {
    const std::unique_ptr<float, Free> table(create_lanczos_lookup());
    ASSERT_NE(table, nullptr);
    const std::vector<double> weights(7 * 16, 1.0 / 7);
    Destination dst(kDstW * kDstH * 4, 0);
    auto arguments = lanczos_arguments();
    arguments.push_back({"table", true, 1});
    arguments.push_back({"first_row", false, 0});
    arguments.push_back({"rows", false, kDstH});
    check_all(
        "_resize_lanczos_tp", arguments, dst,
        [](const Values& v) {
            for (const char* name :
                 {"src", "dst", "table", "src_w", "src_h", "dst_w", "dst_h", "bpp", "rows"}) {
                if (v.at(name) < 1) return kUntouched;
            }
            for (const auto& [name, value] : v) {
                if (value < 0 || value == INT32_MAX) return kRecord;
            }
            return kContained;
        },
        [&](const Values& v, uint8_t* pixels) {
            ovrin_lanczos_band band = {};
            band.src_w = v.at("src_w");
            band.src_h = v.at("src_h");
            band.dst_w = v.at("dst_w");
            band.dst_h = v.at("dst_h");
            band.src = given(v, "src");
            band.dst = pixels;
            band.bytes_per_pixel = v.at("bpp");
            band.first_row = v.at("first_row");
            band.rows = v.at("rows");
            band.table = v.at("table") != 0 ? table.get() : nullptr;
            band.column_weights = band.row_weights = weights.data();
            _resize_lanczos_tp(&band);
        });
}

// ---- Thread pool ----

TEST(BadArguments, Pool) {
    for (const int32_t n : {0, -1, INT32_MIN}) {
        ovrin_threadpool* pool = ovrin_threadpool_init(n);
        ASSERT_NE(pool, nullptr);
        EXPECT_EQ(pool->thread_count, 0);
        for (const int32_t wait : {0, -1, INT32_MIN, INT32_MAX}) {
            EXPECT_EQ(ovrin_threadpool_add_task(pool, nullptr, nullptr, wait), 1);
        }
        EXPECT_EQ(ovrin_threadpool_queue_getsize(&pool->pending), 4U);
        EXPECT_NE(ovrin_threadpool_task_get_task(pool), nullptr);
        ovrin_threadpool_free(pool, n == 0 ? INT32_MIN : n);
    }
    for (const int32_t n : {65536, INT32_MAX}) EXPECT_EQ(ovrin_threadpool_init(n), nullptr);
    for (const int32_t wait : {0, 1, -1, INT32_MIN, INT32_MAX}) {
        EXPECT_EQ(ovrin_threadpool_add_task(nullptr, nullptr, nullptr, wait), -1);
    }
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(nullptr), nullptr);
    const auto queue = std::make_unique<ovrin_threadpool_queue>();
    EXPECT_EQ(ovrin_threadpool_queue_is_empty(queue.get()), 1);
    EXPECT_EQ(ovrin_threadpool_queue_enqueue(queue.get(), nullptr), 0);
    EXPECT_EQ(ovrin_threadpool_queue_is_empty(queue.get()), 0);
    EXPECT_EQ(ovrin_threadpool_queue_dequeue(queue.get()), nullptr);
    EXPECT_EQ(ovrin_threadpool_queue_is_empty(queue.get()), 1);
    ovrin_threadpool_task task = {nullptr, &task};
    ovrin_threadpool_task_init(&task);
    EXPECT_EQ(task.argument, nullptr);
    EXPECT_EQ(ov_sleep(0), 0);
    // Left out: other null pointers, which are not checked, and the longest sleep, of 71 minutes.
}

// ---- What the rules above have found ----

// It read before the source and beyond the tables: only the pointers were looked at.
TEST(BadArguments, ALanczosTaskWithoutASourceTouchesNothing) {
    const std::unique_ptr<float, Free> table(create_lanczos_lookup());
    ASSERT_NE(table, nullptr);
    const GuardedBuffer<double> weights(7 * 2);
    const GuardedBuffer<uint8_t> src(1, Flush::kStart);
    GuardedBuffer<uint8_t> dst(2, Flush::kEnd, kFill);
    for (const int32_t none : {0, -1, INT32_MIN}) {
        ovrin_lanczos_band band = {none, 1, 2, 1,           src.data(),     dst.data(),
                                   1,    0, 1, table.get(), weights.data(), weights.data()};
        _resize_lanczos_tp(&band);
        band.src_w = 1;
        band.src_h = none;
        _resize_lanczos_tp(&band);
    }
    EXPECT_EQ(dst.copy(), std::vector<uint8_t>(2, kFill));
}

// It moved its pointers by the product of the sizes before it looked at them.
TEST(BadArguments, LanczosPairsOfNegativeSizesMoveNoPointer) {
    uint8_t byte = kFill;
    ov_lanczos_nv(&byte, INT32_MIN, INT32_MAX, &byte, INT32_MIN, INT32_MAX);
    EXPECT_EQ(byte, kFill);
}

// It found the first row of a canvas that has none.
TEST(BadArguments, ANegativeCanvasHasNoFirstBilinearRow) {
    ovrin_resize_target target = {};
    target.src_width = target.src_stride = kSrcW;
    target.src_height = kSrcH;
    target.format = 7;
    target.canvas_width = INT32_MIN;
    target.canvas_height = kCanvasH;
    target.dst_y = INT32_MAX;
    uint8_t byte = kFill;
    ov_bilinear_sg(source(), &byte, kSrcW, kSrcH, kDstW, kDstH, 7, &target);
    EXPECT_EQ(byte, kFill);
}

// They walked all rows of chroma, one by one, of a source without columns: for seconds.
TEST(BadArguments, DriversDoNotWalkASourceWithoutColumns) {
    std::vector<uint8_t> dst(bytes_of_i420(kDstW, kDstH));
    for (auto* resize : {ovrin_resize_yuv420_tps, ovrin_resize_nv21_tps}) {
        std::fill(dst.begin(), dst.end(), kFill);
        for (int i = 0; i < 1000; ++i) {
            resize(nullptr, dst.data(), 0, INT32_MAX, kDstW, kDstH);
        }
        EXPECT_EQ(dst, std::vector<uint8_t>(dst.size()));
    }
}

// ---- All of them ----

namespace {

constexpr const char* kCalledHere[] = {"ovrin_resize_rgba8888",
                                       "ovrin_resize_rgba8888_sg",
                                       "ovrin_resize_rgba8888_tps",
                                       "ovrin_resize_rgba8888_get_pos",
                                       "_resize_rgba8888_tp",
                                       "ovrin_resize_rgba8888_keep_ratio",
                                       "ovrin_resize_rgba_keep_ratio_sg",
                                       "ovrin_resize_rgba_keep_ratio_tps",
                                       "ovrin_resize_rgba8888_get_pos_keep_ratio",
                                       "_resize_rgba8888_keep_ratio_tp",
                                       "ovrin_resize_rgb888",
                                       "ovrin_resize_nearest_rgba8888",
                                       "ovrin_resize_yuv420",
                                       "ovrin_resize_yuv420_sg",
                                       "ovrin_resize_yuv420_tps",
                                       "ovrin_resize_y_u_v",
                                       "ovrin_resize_y_u_v_keep_ratio",
                                       "ovrin_resize_y_u_v_sg",
                                       "ovrin_resize_y_u_v_tps",
                                       "ovrin_resize_yuv420_get_pos",
                                       "_resize_y_u_v_tp",
                                       "_resize_yuv420_tp",
                                       "ovrin_resize_nv21",
                                       "ovrin_resize_nv21_sg",
                                       "ovrin_resize_nv21_tps",
                                       "ovrin_resize_y_nv21",
                                       "ovrin_resize_y_nv21_keep_ratio",
                                       "ovrin_resize_y_nv_sg",
                                       "ovrin_resize_y_nv_tps",
                                       "ovrin_resize_nv21_get_pos",
                                       "_resize_nv21_tp",
                                       "_resize_y_nv21_tp",
                                       "ov_bilinear_sg",
                                       "ov_bilinear",
                                       "ov_bilinear_ex",
                                       "_ov_bilinear_tp",
                                       "create_lanczos_lookup",
                                       "checkOvImage",
                                       "OvTransformLanczos",
                                       "ov_lanczos",
                                       "ov_lanczos_nv",
                                       "ovrin_resize_lanczos",
                                       "_resize_lanczos_tp",
                                       "ovrin_threadpool_init",
                                       "ovrin_threadpool_add_task",
                                       "ovrin_threadpool_free",
                                       "ovrin_threadpool_task_get_task",
                                       "ovrin_threadpool_task_init",
                                       "ovrin_threadpool_queue_enqueue",
                                       "ovrin_threadpool_queue_dequeue",
                                       "ovrin_threadpool_queue_is_empty",
                                       "ovrin_threadpool_queue_getsize",
                                       "ov_sleep"};

}  // namespace

// A new function must be added here, and to a test above.
TEST(BadArguments, EveryDeclaredFunctionIsCalledHere) {
    std::ifstream header(OVRINRESIZE_HEADER);
    ASSERT_TRUE(header);
    std::set<std::string> declared;
    for (std::string line; std::getline(header, line);) {
        if (line.rfind("OVRIN_API ", 0) != 0) continue;
        const size_t end = line.find('(');
        const size_t start = line.find_last_of(" *", end) + 1;
        declared.insert(line.substr(start, end - start));
    }
    EXPECT_EQ(declared, std::set<std::string>(std::begin(kCalledHere), std::end(kCalledHere)));
}
