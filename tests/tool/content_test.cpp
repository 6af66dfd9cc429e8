// SPDX-License-Identifier: Apache-2.0
// What the ovrinresize command writes is what the library gives: every format, with and without a
// canvas.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "support/random.h"

using ovrin_test::Random;
using ovrin_test::rounds;

namespace {

using Bytes = std::vector<uint8_t>;

std::string size_text(int32_t width, int32_t height) {
    return std::to_string(width) + "x" + std::to_string(height);
}

// Sends one raw frame through the command and returns what it writes to standard output.
Bytes through_command(const Bytes& frame, const std::string& format, const std::string& input_size,
                      const std::string& options) {
    const std::string path = ::testing::TempDir() + "ovrinresize_frame." + std::to_string(getpid());
    std::ofstream(path, std::ios::binary)
        .write(reinterpret_cast<const char*>(frame.data()),
               static_cast<std::streamsize>(frame.size()));
    const std::string command = OVRINRESIZE_TOOL " '" + path + "' - --format " + format +
                                " --input-size " + input_size + " " + options;
    // The command line holds nothing from outside.
    FILE* const pipe = popen(command.c_str(), "r");  // NOLINT(cert-env33-c)
    Bytes result;
    uint8_t buffer[4096];
    for (size_t got; (got = fread(buffer, 1, sizeof(buffer), pipe)) > 0;) {
        result.insert(result.end(), buffer, buffer + got);
    }
    EXPECT_EQ(pclose(pipe), 0) << command;
    std::filesystem::remove(path);
    return result;
}

size_t packed(int32_t w, int32_t h, size_t bytes) {
    return static_cast<size_t>(w) * static_cast<size_t>(h) * bytes;
}

size_t chroma_420(int32_t w, int32_t h) {
    return packed((w + 1) / 2, (h + 1) / 2, 1);
}

size_t yuv_420(int32_t w, int32_t h) {
    return packed(w, h, 1) + 2 * chroma_420(w, h);
}

// RGBA words as bytes.
Bytes bytes_of(const std::vector<uint32_t>& words) {
    const auto* bytes = reinterpret_cast<const uint8_t*>(words.data());
    return Bytes(bytes, bytes + words.size() * 4);
}

// Source and result sizes of one case; on a canvas, the picture is placed by hand.
struct Case {
    int32_t src_w, src_h, dst_w, dst_h;

    std::string input_size() const { return size_text(src_w, src_h); }
    std::string options() const { return "--size " + size_text(dst_w, dst_h) + "!"; }
};

struct CanvasCase {
    int32_t src_w, src_h;
    int32_t canvas_w, canvas_h;
    int32_t picture_w, picture_h, x, y;

    std::string input_size() const { return size_text(src_w, src_h); }
    std::string options() const { return "--canvas " + size_text(canvas_w, canvas_h); }

    ovrin_resize_target target(void* canvas) const {
        ovrin_resize_target result = {};
        result.src_width = result.src_stride = src_w;
        result.src_height = result.src_buffer_height = src_h;
        result.dst = canvas;
        result.dst_width = picture_w;
        result.dst_height = picture_h;
        result.canvas_width = canvas_w;
        result.canvas_height = canvas_h;
        result.dst_x = x;
        result.dst_y = y;
        return result;
    }
};

Case random_case(Random* random) {
    return {random->awkward_size(), random->awkward_size(), random->awkward_size(),
            random->awkward_size()};
}

// Wide on square, square on wide, exact fit, and enlarged; heights on both sides of the threaded
// path's threshold. Pictures in 4:2:0 have sides divisible by 4 and even positions.
const CanvasCase kCanvases420[] = {
    {64, 32, 40, 40, 40, 20, 0, 10},  {33, 33, 100, 40, 40, 40, 30, 0},
    {50, 30, 100, 60, 100, 60, 0, 0}, {10, 20, 61, 61, 32, 61, 14, 0},
    {70, 1100, 41, 50, 4, 50, 18, 0}, {300, 100, 64, 50, 64, 20, 0, 14},
};
const CanvasCase kCanvasesPacked[] = {
    {64, 32, 40, 40, 40, 20, 0, 10},   {33, 33, 100, 41, 41, 41, 29, 0},
    {10, 20, 61, 61, 31, 61, 15, 0},   {70, 1100, 41, 50, 3, 50, 19, 0},
    {300, 100, 64, 50, 64, 21, 0, 14},
};

}  // namespace

TEST(ToolContent, RgbaIsWhatTheLibraryGives) {
    Random random(1);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(20); ++i) {
        const Case c = random_case(&random);
        const Bytes src = random.bytes(packed(c.src_w, c.src_h, 4));
        std::vector<uint32_t> dst(packed(c.dst_w, c.dst_h, 1));
        ovrin_resize_rgba8888(src.data(), dst.data(), c.src_w, c.src_h, c.dst_w, c.dst_h);
        EXPECT_EQ(through_command(src, "rgba", c.input_size(), c.options()), bytes_of(dst));
    }
}

TEST(ToolContent, RgbIsWhatTheLibraryGives) {
    Random random(2);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(20); ++i) {
        const Case c = random_case(&random);
        const Bytes src = random.bytes(packed(c.src_w, c.src_h, 3));
        Bytes dst(packed(c.dst_w, c.dst_h, 3));
        ovrin_resize_rgb888(src.data(), dst.data(), c.src_w, c.src_h, c.dst_w, c.dst_h);
        EXPECT_EQ(through_command(src, "rgb", c.input_size(), c.options()), dst);
    }
}

TEST(ToolContent, YuvIsWhatTheLibraryGives) {
    Random random(3);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(20); ++i) {
        const Case c = random_case(&random);
        const Bytes src = random.bytes(yuv_420(c.src_w, c.src_h));
        Bytes dst(yuv_420(c.dst_w, c.dst_h));
        ovrin_resize_yuv420(src.data(), dst.data(), c.src_w, c.src_h, c.dst_w, c.dst_h);
        EXPECT_EQ(through_command(src, "i420", c.input_size(), c.options()), dst);
        ovrin_resize_nv21(src.data(), dst.data(), c.src_w, c.src_h, c.dst_w, c.dst_h);
        EXPECT_EQ(through_command(src, "nv21", c.input_size(), c.options()), dst);
    }
}

TEST(ToolContent, NearestIsWhatTheLibraryGives) {
    Random random(4);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(20); ++i) {
        const Case c = random_case(&random);
        std::vector<uint32_t> src(packed(c.src_w, c.src_h, 1));
        for (uint32_t& pixel : src) pixel = static_cast<uint32_t>(random.between(0, INT32_MAX));
        // Pixels that the engine leaves out are 0.
        std::vector<uint32_t> dst(packed(c.dst_w, c.dst_h, 1));
        ovrin_resize_nearest_rgba8888(src.data(), dst.data(), c.src_w, c.src_h, c.dst_w, c.dst_h);
        EXPECT_EQ(through_command(bytes_of(src), "rgba", c.input_size(),
                                  c.options() + " --engine nearest"),
                  bytes_of(dst));
    }
}

TEST(ToolContent, BilinearIsWhatTheLibraryGives) {
    Random random(6);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(20); ++i) {
        const Case c = random_case(&random);
        const std::tuple<const char*, int32_t, size_t, size_t> formats[] = {
            {"rgba", 7, packed(c.src_w, c.src_h, 4), packed(c.dst_w, c.dst_h, 4)},
            {"i420", 2, yuv_420(c.src_w, c.src_h), yuv_420(c.dst_w, c.dst_h)},
            {"nv21", 18, yuv_420(c.src_w, c.src_h), yuv_420(c.dst_w, c.dst_h)}};
        for (const auto& [name, code, src_bytes, dst_bytes] : formats) {
            // Zeros, so that what lies behind the picture counts as little as what the tool puts
            // there.
            Bytes src = random.bytes(src_bytes);
            std::fill(src.end() - std::min<ptrdiff_t>(8, std::distance(src.begin(), src.end())),
                      src.end(), uint8_t{0});
            Bytes padded(src);
            padded.resize(src.size() + packed(c.src_w + 2, 1, 4));
            Bytes dst(dst_bytes);
            ov_bilinear_sg(padded.data(), dst.data(), c.src_w, c.src_h, c.dst_w, c.dst_h, code,
                           nullptr);
            EXPECT_EQ(
                through_command(src, name, c.input_size(), c.options() + " --engine bilinear"),
                dst);
        }
    }
}

TEST(ToolContent, LanczosIsWhatTheLibraryGives) {
    Random random(7);
    SCOPED_TRACE(random.trace());
    for (int i = 0; i < rounds(10); ++i) {
        const Case c = random_case(&random);
        for (const int32_t n : {3, 4}) {
            const Bytes src = random.bytes(packed(c.src_w, c.src_h, static_cast<size_t>(n)));
            Bytes dst(packed(c.dst_w, c.dst_h, static_cast<size_t>(n)));
            ov_lanczos(src.data(), c.src_w, c.src_h, dst.data(), c.dst_w, c.dst_h, n);
            EXPECT_EQ(through_command(src, n == 3 ? "rgb" : "rgba", c.input_size(),
                                      c.options() + " --engine lanczos"),
                      dst);
        }
        // Chroma pairs are a picture of two components and half the size.
        const Bytes src = random.bytes(yuv_420(c.src_w, c.src_h));
        Bytes dst(yuv_420(c.dst_w, c.dst_h));
        const auto half = [](int32_t size) { return (size + 1) / 2; };
        ov_lanczos(src.data(), c.src_w, c.src_h, dst.data(), c.dst_w, c.dst_h, 1);
        ov_lanczos(src.data() + packed(c.src_w, c.src_h, 1), half(c.src_w), half(c.src_h),
                   dst.data() + packed(c.dst_w, c.dst_h, 1), half(c.dst_w), half(c.dst_h), 2);
        EXPECT_EQ(through_command(src, "nv21", c.input_size(), c.options() + " --engine lanczos"),
                  dst);
    }
}

TEST(ToolContent, RgbaAndRgbStandInTheMiddleOfTheCanvas) {
    Random random(5);
    SCOPED_TRACE(random.trace());
    for (const CanvasCase& c : kCanvasesPacked) {
        SCOPED_TRACE(c.input_size() + " on " + size_text(c.canvas_w, c.canvas_h));
        const Bytes src = random.bytes(packed(c.src_w, c.src_h, 4));
        std::vector<uint32_t> canvas(packed(c.canvas_w, c.canvas_h, 1));
        ovrin_resize_target target = c.target(canvas.data());
        ovrin_resize_rgba8888_keep_ratio(src.data(), c.src_w, c.src_h, &target);
        const Bytes expected = bytes_of(canvas);
        EXPECT_EQ(through_command(src, "rgba", c.input_size(), c.options()), expected);

        Bytes rgb_src;
        Bytes rgb_expected;
        for (size_t i = 0; i < src.size(); ++i) {
            if (i % 4 != 3) rgb_src.push_back(src[i]);
        }
        for (size_t i = 0; i < expected.size(); ++i) {
            if (i % 4 != 3) rgb_expected.push_back(expected[i]);
        }
        EXPECT_EQ(through_command(rgb_src, "rgb", c.input_size(), c.options()), rgb_expected);
    }
}

TEST(ToolContent, YuvStandsInTheMiddleOfTheCanvas) {
    Random random(6);
    SCOPED_TRACE(random.trace());
    for (const CanvasCase& c : kCanvases420) {
        SCOPED_TRACE(c.input_size() + " on " + size_text(c.canvas_w, c.canvas_h));
        const Bytes src = random.bytes(yuv_420(c.src_w, c.src_h));
        const uint8_t* const chroma = src.data() + packed(c.src_w, c.src_h, 1);
        Bytes canvas(yuv_420(c.canvas_w, c.canvas_h));
        const ovrin_resize_target target = c.target(canvas.data());
        ovrin_resize_y_u_v_keep_ratio(src.data(), chroma, chroma + chroma_420(c.src_w, c.src_h),
                                      c.src_w, c.src_h, &target);
        EXPECT_EQ(through_command(src, "i420", c.input_size(), c.options()), canvas);
        ovrin_resize_y_nv21_keep_ratio(src.data(), chroma, c.src_w, c.src_h, &target);
        EXPECT_EQ(through_command(src, "nv21", c.input_size(), c.options()), canvas);
    }
}
