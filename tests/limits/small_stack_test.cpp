// SPDX-License-Identifier: Apache-2.0
// Every entry point needs less than 64 KB of stack, as threads of callers' own pools may have: each
// runs on a thread with so much (or with the least that the system allows, where that is more),
// above an inaccessible page, and what it has written there is counted.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <pthread.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <vector>

#include "support/instrumented.h"

namespace {

constexpr size_t kStack = 64 * 1024;

size_t stack_bytes() {
    const int64_t least = sysconf(_SC_THREAD_STACK_MIN);
    return least > int64_t{kStack} ? static_cast<size_t>(least) : kStack;
}

// A stack on top of an inaccessible page. The C library puts what belongs to a thread, and static
// thread-local storage, at its top; the threads of this program hold little there.
class Stack {
public:
    Stack() : page_(static_cast<size_t>(sysconf(_SC_PAGESIZE))), bytes_(stack_bytes()) {
        map_ = mmap(nullptr, page_ + bytes_, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS,
                    -1, 0);
        if (map_ == MAP_FAILED || mprotect(map_, page_, PROT_NONE) != 0) abort();
        memset(first(), kUnused, bytes_);
    }
    ~Stack() { munmap(map_, page_ + bytes_); }
    Stack(const Stack&) = delete;
    Stack& operator=(const Stack&) = delete;

    uint8_t* first() const { return static_cast<uint8_t*>(map_) + page_; }
    size_t bytes() const { return bytes_; }
    // Bytes from the lowest one written to the top.
    size_t used() const {
        size_t unused = 0;
        while (unused < bytes_ && first()[unused] == kUnused) ++unused;
        return bytes_ - unused;
    }

private:
    static constexpr uint8_t kUnused = 0x3C;

    size_t page_;
    size_t bytes_;
    void* map_;
};

void* run(void* function) {
    (*static_cast<std::function<void()>*>(function))();
    return nullptr;
}

// Runs `function` on a small stack; returns the bytes that it used.
size_t stack_of(std::function<void()> function) {
    const Stack stack;
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    EXPECT_EQ(pthread_attr_setstack(&attributes, stack.first(), stack.bytes()), 0);
    pthread_t thread;
    const int created = pthread_create(&thread, &attributes, run, &function);
    pthread_attr_destroy(&attributes);
    EXPECT_EQ(created, 0);
    if (created == 0) pthread_join(thread, nullptr);
    return stack.used();
}

constexpr int32_t kW = 700, kH = 1100;  // wide for several strips, tall for bands
constexpr int32_t kSmallW = 130, kSmallH = 90;
constexpr size_t kBytes = size_t{4} * (kW + 1) * (kH + 2);

class SmallStack : public ::testing::Test {
protected:
    void SetUp() override {
        if (ovrin_test::kInstrumented) {
            GTEST_SKIP() << "skipped: a sanitizer makes frames larger than they are";
        }
    }

    void check(const char* name, const std::function<void()>& function) {
        const size_t used = stack_of(function);
        printf("%-40s %6zu bytes of stack\n", name, used);
        EXPECT_LT(used, kStack) << name;
    }

    // Every pair of sizes: reduced and enlarged, with bands and without.
    template <class Resize>
    void check_sizes(const char* name, Resize resize) {
        check(name, [&] {
            resize(kW, kH, kSmallW, kSmallH);
            resize(kSmallW, kSmallH, kW, kH);
        });
    }

    std::vector<uint8_t> src_ = std::vector<uint8_t>(kBytes, 100);
    std::vector<uint8_t> dst_ = std::vector<uint8_t>(kBytes);
    const uint8_t* src() const { return src_.data(); }
    uint8_t* dst() { return dst_.data(); }
    uint32_t* words() { return reinterpret_cast<uint32_t*>(dst_.data()); }

    ovrin_resize_target target(int32_t src_w, int32_t src_h, int32_t dst_w, int32_t dst_h,
                               int32_t format = 7) {
        ovrin_resize_target t = {};
        t.src_vu_plane = t.src_u_plane = t.src_v_plane = src();
        t.src_width = t.src_stride = src_w;
        t.src_height = t.src_buffer_height = src_h;
        t.format = format;
        t.dst = dst();
        t.dst_width = t.canvas_width = dst_w;
        t.dst_height = t.canvas_height = dst_h;
        return t;
    }
};

}  // namespace

TEST_F(SmallStack, PackedPictures) {
    check_sizes("ovrin_resize_rgba8888", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_rgba8888(src(), words(), a, b, c, d);
    });
    check_sizes("ovrin_resize_rgba8888_sg", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_rgba8888_sg(src(), words(), a, b, c, d);
    });
    check_sizes("ovrin_resize_rgba8888_tps", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_rgba8888_tps(src(), words(), a, b, c, d);
    });
    check_sizes("ovrin_resize_rgb888", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_rgb888(src(), dst(), a, b, c, d);
    });
    check_sizes("ovrin_resize_nearest_rgba8888", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_nearest_rgba8888(reinterpret_cast<const uint32_t*>(src()), words(), a, b, c,
                                      d);
    });
    check_sizes("RGBA8888 in a canvas", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        for (auto* resize : {ovrin_resize_rgba8888_keep_ratio, ovrin_resize_rgba_keep_ratio_sg,
                             ovrin_resize_rgba_keep_ratio_tps}) {
            ovrin_resize_target t = target(a, b, c, d);
            resize(src(), a, b, &t);
        }
    });
}

TEST_F(SmallStack, Planes) {
    check_sizes("I420", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        for (auto* resize :
             {ovrin_resize_yuv420, ovrin_resize_yuv420_sg, ovrin_resize_yuv420_tps}) {
            resize(src(), dst(), a, b, c, d);
        }
    });
    check_sizes("three planes", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_y_u_v(src(), src(), src(), dst(), a, b, c, d);
        for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
            resize(src(), src(), src(), dst(), a, b, c, d, nullptr);
        }
    });
    check_sizes("three planes in a canvas", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        const ovrin_resize_target t = target(a, b, c, d);
        ovrin_resize_y_u_v_keep_ratio(src(), src(), src(), a, b, &t);
        for (auto* resize : {ovrin_resize_y_u_v_sg, ovrin_resize_y_u_v_tps}) {
            resize(src(), src(), src(), nullptr, a, b, 0, 0, &t);
        }
    });
    check_sizes("NV21", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        for (auto* resize : {ovrin_resize_nv21, ovrin_resize_nv21_sg, ovrin_resize_nv21_tps}) {
            resize(src(), dst(), a, b, c, d);
        }
    });
    check_sizes("two planes", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_y_nv21(src(), src(), dst(), a, b, c, d);
        for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
            resize(src(), src(), dst(), a, b, c, d, nullptr);
        }
    });
    check_sizes("two planes in a canvas", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        const ovrin_resize_target t = target(a, b, c, d);
        ovrin_resize_y_nv21_keep_ratio(src(), src(), a, b, &t);
        for (auto* resize : {ovrin_resize_y_nv_sg, ovrin_resize_y_nv_tps}) {
            resize(src(), src(), nullptr, a, b, 0, 0, &t);
        }
    });
}

TEST_F(SmallStack, Engines) {
    for (auto* resize : {ov_bilinear_sg, ov_bilinear, ov_bilinear_ex}) {
        check_sizes("bilinear", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
            for (const int32_t format : {2, 7, 18}) {
                resize(src(), dst(), a, b, c, d, format, nullptr);
                const ovrin_resize_target t = target(a, b, c, d, format);
                resize(src(), dst(), a, b, c, d, format, &t);
            }
        });
    }
    check_sizes("ov_lanczos", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ov_lanczos(src(), a / 10, b / 10, dst(), c / 10, d / 10, 3);
        ov_lanczos_nv(src(), a / 10, b / 10, dst(), c / 10, d / 10);
    });
    check_sizes("ovrin_resize_lanczos", [&](int32_t a, int32_t b, int32_t c, int32_t d) {
        ovrin_resize_lanczos(src(), dst(), a / 10, b / 10, c / 10, d / 10, 4);
    });
    check("create_lanczos_lookup, checkOvImage", [&] {
        free(create_lanczos_lookup());
        const lanczos_image image = {1, 1, 1, 1, dst()};
        EXPECT_EQ(checkOvImage(&image), 1);
        OvTransformLanczos(&image, &image);
    });
}

TEST_F(SmallStack, Bands) {
    check("RGBA8888 bands", [&] {
        ovrin_rgba_band band = {};
        band.src_w = band.src_stride = kW;
        band.src_h = kH;
        band.dst_w = kSmallW;
        band.dst_h = kSmallH;
        band.band_rows = 48;
        band.src = src();
        band.dst = words();
        ovrin_rgba_band in_canvas = band;
        ovrin_resize_rgba8888_get_pos(kW, kH, kSmallW, kSmallH, &band);
        _resize_rgba8888_tp(&band);
        ovrin_resize_rgba8888_get_pos_keep_ratio(kW, kH, kSmallW, kSmallH, kSmallW, kSmallH,
                                                 &in_canvas);
        _resize_rgba8888_keep_ratio_tp(&in_canvas);
        EXPECT_EQ(band.done + in_canvas.done, 2);
    });
    check("planar bands", [&] {
        ovrin_yuv_band band = {};
        band.src_width = band.src_row_bytes = kW;
        band.src_height = kH;
        band.dst_width = kSmallW;
        band.dst_height = kSmallH;
        band.band_rows = 48;
        band.src = band.src_u = band.src_v = src();
        band.dst = band.work = dst();
        ovrin_resize_yuv420_get_pos(kW, kH, kSmallW, kSmallH, &band);
        _resize_yuv420_tp(&band);
        _resize_y_u_v_tp(&band);
        EXPECT_EQ(band.done, 1);
    });
    check("NV21 bands", [&] {
        ovrin_nv21_band band = {};
        band.src_width = band.src_row_bytes = kW;
        band.src_height = kH;
        band.dst_width = kSmallW;
        band.dst_height = kSmallH;
        band.band_rows = 48;
        band.src = band.src_vu = src();
        band.dst = band.work = dst();
        ovrin_resize_nv21_get_pos(kW, kH, kSmallW, kSmallH, &band);
        _resize_nv21_tp(&band);
        _resize_y_nv21_tp(&band);
        EXPECT_EQ(band.done, 1);
    });
    check("bilinear and Lanczos bands", [&] {
        static const int32_t zeros[kSmallW] = {};
        static const double weights[7 * kSmallW] = {};
        static const float table[1] = {};
        ovrin_bilinear_band bilinear = {};
        bilinear.src_width = kW;
        bilinear.src_height = kH;
        bilinear.dst_w = kSmallW;
        bilinear.dst_h = bilinear.end_row = kSmallH;
        bilinear.src = src();
        bilinear.dst = dst();
        bilinear.format = 18;
        bilinear.col_weight = bilinear.row_weight = zeros;
        bilinear.col_index = bilinear.row_index = zeros;
        bilinear.canvas_width = kSmallW;
        bilinear.src_pitch = kW;
        bilinear.bpp = 1;
        _ov_bilinear_tp(&bilinear);
        ovrin_lanczos_band lanczos = {};
        lanczos.src_w = kW;
        lanczos.src_h = kH;
        lanczos.dst_w = kSmallW;
        lanczos.dst_h = kSmallH;
        lanczos.rows = 4;
        lanczos.src = src();
        lanczos.dst = dst();
        lanczos.bytes_per_pixel = 4;
        lanczos.table = table;
        lanczos.column_weights = lanczos.row_weights = weights;
        _resize_lanczos_tp(&lanczos);
    });
}

TEST_F(SmallStack, Pool) {
    check("the pool and its queue", [] {
        ovrin_threadpool* pool = ovrin_threadpool_init(2);
        ASSERT_NE(pool, nullptr);
        static int32_t ran;
        ran = 0;
        const auto count = [](void* counter) {
            __atomic_fetch_add(static_cast<int32_t*>(counter), 1, __ATOMIC_RELAXED);
        };
        for (int i = 0; i < 100; ++i) {
            EXPECT_EQ(ovrin_threadpool_add_task(pool, count, &ran, 1), 1);
        }
        ovrin_threadpool_free(pool, 1);
        EXPECT_EQ(ran, 100);
        ovrin_threadpool* idle = ovrin_threadpool_init(0);
        ASSERT_NE(idle, nullptr);
        EXPECT_EQ(ovrin_threadpool_add_task(idle, count, &ran, 0), 1);
        EXPECT_EQ(ovrin_threadpool_queue_getsize(&idle->pending), 1U);
        EXPECT_EQ(ovrin_threadpool_queue_is_empty(&idle->pending), 0);
        ovrin_threadpool_task* slot = ovrin_threadpool_task_get_task(idle);
        ovrin_threadpool_task_init(slot);
        EXPECT_EQ(ovrin_threadpool_queue_enqueue(&idle->pending, slot), 0);
        EXPECT_EQ(ovrin_threadpool_queue_dequeue(&idle->pending), slot);
        ovrin_threadpool_free(idle, 1);
        EXPECT_EQ(ov_sleep(1), 0);
    });
}
