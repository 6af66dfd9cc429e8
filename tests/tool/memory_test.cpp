// SPDX-License-Identifier: Apache-2.0
// Whatever block of memory is refused: the tool says so, and a result is whole or not there.
#include <gtest/gtest.h>
#include <libexif/exif-data.h>
#include <ovrinresize.h>
#include <png.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <new>
#include <string>
#include <vector>

#include "batch.h"
#include "codecs.h"
#include "engine.h"
#include "exif.h"

namespace {

// How many requests are granted before one is refused; negative: all are.
long granted = -1;
bool was_refused = false;

bool is_refused() {
    if (granted < 0 || granted-- > 0) return false;
    was_refused = true;
    return true;
}

}  // namespace

// Not inlined: where g++ sees only one of a pair it takes malloc() and free() for a mismatch.
#define OVRIN_WHOLE __attribute__((noinline))

OVRIN_WHOLE void* operator new(size_t size) {
    void* const block = is_refused() ? nullptr : malloc(size);
    if (block == nullptr) throw std::bad_alloc();
    return block;
}

OVRIN_WHOLE void operator delete(void* block) noexcept {
    free(block);
}

OVRIN_WHOLE void operator delete(void* block, size_t) noexcept {
    free(block);
}

#undef OVRIN_WHOLE

// What libraries ask for; linked with --wrap.
extern "C" {
png_structp __real_png_create_read_struct(png_const_charp, png_voidp, png_error_ptr, png_error_ptr);
png_structp __real_png_create_write_struct(png_const_charp, png_voidp, png_error_ptr,
                                           png_error_ptr);
png_infop __real_png_create_info_struct(png_const_structrp);
ExifData* __real_exif_data_new();
float* __real_create_lanczos_lookup();

png_structp __wrap_png_create_read_struct(png_const_charp version, png_voidp data,
                                          png_error_ptr on_error, png_error_ptr on_warning) {
    if (is_refused()) return nullptr;
    return __real_png_create_read_struct(version, data, on_error, on_warning);
}

png_structp __wrap_png_create_write_struct(png_const_charp version, png_voidp data,
                                           png_error_ptr on_error, png_error_ptr on_warning) {
    if (is_refused()) return nullptr;
    return __real_png_create_write_struct(version, data, on_error, on_warning);
}

png_infop __wrap_png_create_info_struct(png_const_structrp png) {
    return is_refused() ? nullptr : __real_png_create_info_struct(png);
}

ExifData* __wrap_exif_data_new() {
    return is_refused() ? nullptr : __real_exif_data_new();
}

float* __wrap_create_lanczos_lookup() {
    return is_refused() ? nullptr : __real_create_lanczos_lookup();
}
}

namespace {

namespace fs = std::filesystem;

std::string content_of(const std::string& path) {
    std::ifstream file(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(file), {});
}

class Memory : public ::testing::Test {
protected:
    Memory() {
        char name[] = "/tmp/ovrinresize_memory_XXXXXX";
        folder_ = mkdtemp(name);
        in_ = folder_ + "/in.png";
        out_ = folder_ + "/results/in.png";
        write_picture();
        options_.files = {in_};
        options_.output = folder_ + "/results/%s.png";
        options_.wish.size = tool::parse_geometry("30x20!");
        options_.quiet = true;
        // Threads of the library's own ask for memory when they come to it.
        tool::keep_to_calling_thread();
    }
    ~Memory() override { fs::remove_all(folder_); }

    // A photograph that lies on its side, of another shape than the result.
    void write_picture() const {
        tool::Picture picture({70, 100});
        for (uint32_t& pixel : picture.words) pixel = 0x80402010U;
        picture.has_alpha = true;
        tool::Metadata metadata;
        // A directory with nothing but an orientation.
        const char tiff[] = "II*\0\10\0\0\0\1\0\x12\1\3\0\1\0\0\0\6\0\0\0\0\0\0\0";
        metadata.exif = tool::Bytes(tool::kExifHead, tool::kExifHead + tool::kExifHeadBytes);
        metadata.exif.insert(metadata.exif.end(), tiff, tiff + sizeof tiff - 1);
        FILE* const file = fopen(in_.c_str(), "wb");
        tool::encode_png(picture, metadata, file);
        static_cast<void>(fclose(file));
    }

    // Refuses the request after so many; false when there are not as many.
    bool run(long requests) {
        fs::remove_all(folder_ + "/results");
        ::testing::internal::CaptureStderr();
        was_refused = false;
        granted = requests;
        try {
            failures_ = tool::run_batch(options_);
        } catch (const std::bad_alloc&) {
            failures_ = -1;  // of no picture: main() says so
        }
        granted = -1;
        said_ = ::testing::internal::GetCapturedStderr();
        return was_refused;
    }

    std::string folder_;
    std::string in_;
    std::string out_;
    tool::Options options_;
    int64_t failures_ = 0;
    std::string said_;
};

}  // namespace

TEST_F(Memory, ThatIsRefusedLeavesAWholeResultOrNone) {
    // What is asked for only once in the life of the program comes with the first of these runs.
    long requests = 0;
    int failed = 0;
    std::vector<std::string> results;
    for (; run(requests); ++requests) {
        SCOPED_TRACE(requests);
        if (failures_ == 1) {
            ++failed;
            EXPECT_TRUE(said_ == "ovrinresize: " + in_ + ": not enough memory\n" ||
                        said_ == "ovrinresize: " + out_ + ": not enough memory\n")
                << said_;
        }
        if (fs::exists(out_)) {
            results.push_back(content_of(out_));
        } else {
            EXPECT_NE(failures_, 0);
            EXPECT_TRUE(!fs::exists(folder_ + "/results") || fs::is_empty(folder_ + "/results"));
        }
        ASSERT_LT(requests, 10000);
    }
    EXPECT_EQ(failures_, 0);
    EXPECT_GT(failed, 20);
    const std::string expected = content_of(out_);
    EXPECT_FALSE(expected.empty());
    for (const std::string& result : results) EXPECT_EQ(result, expected);
}
