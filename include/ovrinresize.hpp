// SPDX-License-Identifier: Apache-2.0
//
// libovrinresize for C++17: the C interface behind views that know how long their buffers are.
// Every function checks what the C interface takes on trust, and answers with a Status: a code, and
// a sentence with the numbers. Header only, and usable without exceptions and run-time type
// information; with exceptions, require(...) and the functions that end in _or_throw throw instead.
// No byte of a result differs from what the C functions give.
//
//     ovrin::Status status = ovrin::resize(ovrin::nv21_view(frame, frame_bytes, 4000, 3000),
//                                          ovrin::nv21_view(small, small_bytes, 1000, 750));
//     if (!status.ok()) puts(status.text);
//
// Views own nothing. Nothing here has global state; threads may call anything at once on different
// buffers.
#ifndef OVRINRESIZE_HPP
#define OVRINRESIZE_HPP

#include <ovrinresize.h>

// C's headers only: where an app has no C++ library, its headers are missing too.
#include <stddef.h>
#include <stdint.h>
#include <stdlib.h>
#include <string.h>
#if defined(__cpp_exceptions)
#include <stdexcept>
#endif

namespace ovrin {

// The library's own objects have names in ovrin too. The inline namespace gives those below other
// symbols, so that a program that links the objects statically, or a test that includes internal
// headers, can never be given one in place of the other; callers need not write it.
inline namespace v1 {

// The version of the header that was compiled.
constexpr const char* version() {
    return OVRINRESIZE_VERSION;
}

// ---- What can be wrong --------------------------------------------------------------------------

enum class ErrorCode {
    kOk,
    kNull,              // a pointer
    kEmpty,             // a width or height below 1
    kTooLarge,          // a width or height above kLargestSide
    kBufferTooSmall,    // fewer bytes than the picture has
    kStrideTooSmall,    // rows or samples that would overlap
    kStrideUnsuitable,  // rows that a target record cannot describe, or a canvas with gaps
    kMisaligned,        // a canvas of 32-bit pixels at an odd address
    kOddOffset,         // 4:2:0 chroma cannot begin at an odd pixel
    kOutside,           // a rectangle that is not inside its picture, a number out of its range
    kOverlap,           // source and destination share bytes
    kUnknownFormat,
    kDifferentFormats,
    kDifferentSizes,  // of two pictures that are to be equal
    kUnsupported,     // a filter or a placement that the format has no function for
    kNoMemory
};

// The outcome of a call. Nothing has been written unless it is ok().
struct [[nodiscard]] Status {
    ErrorCode code = ErrorCode::kOk;
    char text[160] = "";  // one sentence, such as "dst: NV21 2x2 needs 6 bytes, has 5"

    bool ok() const { return code == ErrorCode::kOk; }
};

// ---- Pictures -----------------------------------------------------------------------------------

enum class Format { kRgba8888, kRgb888, kI420, kNv21 };

// The largest width and height. Up to here every product of two sides fits 32 bits, and single
// precision, in which the bilinear engine computes positions, keeps them inside the picture.
constexpr int32_t kLargestSide = 32767;

struct Size {
    int32_t width;
    int32_t height;
};

struct Rect {
    int32_t x;
    int32_t y;
    int32_t width;
    int32_t height;
};

namespace detail {

// The type exists for bytes that may be written.
template <class Byte>
struct Writable {
    using Type = void;
};
template <class Byte>
struct Writable<const Byte> {};

}  // namespace detail

// Where the samples of one plane lie: pixels of RGBA and RGB, bytes of Y, U and V, pairs of VU.
template <class Byte>
struct BasicPlane {
    Byte* data = nullptr;
    size_t bytes = 0;          // how many may be read or written from data on
    int32_t row_stride = 0;    // bytes from one row to the next; 0: none between them
    int32_t pixel_stride = 0;  // bytes from one sample to the next; 0: none between them

    BasicPlane() = default;
    BasicPlane(Byte* first, size_t length, int32_t row = 0, int32_t pixel = 0)
        : data(first), bytes(length), row_stride(row), pixel_stride(pixel) {}

    template <class Other, class = typename detail::Writable<Other>::Type>
    BasicPlane(const BasicPlane<Other>& other)
        : BasicPlane(other.data, other.bytes, other.row_stride, other.pixel_stride) {}
};

using Plane = BasicPlane<uint8_t>;
using ConstPlane = BasicPlane<const uint8_t>;

// A picture in somebody else's memory. Make one with the functions below; what they are given is
// checked where the view is used.
template <class Byte>
struct BasicView {
    Format format = Format::kRgba8888;
    int32_t width = 0;
    int32_t height = 0;
    bool one_buffer = false;  // planes[0] is a buffer that holds all planes, packed
    BasicPlane<Byte> planes[3];

    BasicView() = default;
    BasicView(Format f, int32_t w, int32_t h, bool one, BasicPlane<Byte> first,
              BasicPlane<Byte> second = {}, BasicPlane<Byte> third = {})
        : format(f), width(w), height(h), one_buffer(one), planes{first, second, third} {}

    template <class Other, class = typename detail::Writable<Other>::Type>
    BasicView(const BasicView<Other>& other)
        : BasicView(other.format, other.width, other.height, other.one_buffer, other.planes[0],
                    other.planes[1], other.planes[2]) {}
};

using View = BasicView<uint8_t>;             // may be written
using ConstView = BasicView<const uint8_t>;  // may be read; every View is one

// `bytes` is the length of the buffer, which may be longer than the picture.
template <class Byte>
BasicView<Byte> rgba_view(Byte* data, size_t bytes, int32_t width, int32_t height,
                          int32_t row_stride = 0) {
    return {Format::kRgba8888, width, height, false, {data, bytes, row_stride}};
}

template <class Byte>
BasicView<Byte> rgb_view(Byte* data, size_t bytes, int32_t width, int32_t height,
                         int32_t row_stride = 0) {
    return {Format::kRgb888, width, height, false, {data, bytes, row_stride}};
}

// Y, U and V in one buffer, packed.
template <class Byte>
BasicView<Byte> i420_view(Byte* data, size_t bytes, int32_t width, int32_t height) {
    return {Format::kI420, width, height, true, {data, bytes}};
}

// Three planes, with rows and samples as far apart as each says.
template <class Byte>
BasicView<Byte> i420_view(BasicPlane<Byte> y, BasicPlane<Byte> u, BasicPlane<Byte> v, int32_t width,
                          int32_t height) {
    return {Format::kI420, width, height, false, y, u, v};
}

// Y and pairs of V and U in one buffer, packed.
template <class Byte>
BasicView<Byte> nv21_view(Byte* data, size_t bytes, int32_t width, int32_t height) {
    return {Format::kNv21, width, height, true, {data, bytes}};
}

template <class Byte>
BasicView<Byte> nv21_view(BasicPlane<Byte> y, BasicPlane<Byte> vu, int32_t width, int32_t height) {
    return {Format::kNv21, width, height, false, y, vu};
}

// An NV21 buffer as three planes: what takes I420 then reads or writes NV21. A buffer that is too
// short is noticed where the view is used, as one of its planes.
template <class Byte>
BasicView<Byte> nv21_as_i420_view(Byte* data, size_t bytes, int32_t width, int32_t height);

namespace detail {

struct PlaneLayout {
    const char* name;
    int32_t sample;       // bytes
    int32_t subsampling;  // pixels of the picture to a sample, in either direction
};

struct Layout {
    const char* name;
    int planes;
    PlaneLayout plane[3];
};

inline constexpr Layout kLayouts[] = {
    {"RGBA8888", 1, {{"RGBA", 4, 1}}},
    {"RGB888", 1, {{"RGB", 3, 1}}},
    {"I420", 3, {{"Y", 1, 1}, {"U", 1, 2}, {"V", 1, 2}}},
    {"NV21", 2, {{"Y", 1, 1}, {"VU", 2, 2}}},
};

// Only for formats that is_known() accepts.
constexpr const Layout& layout_of(Format format) {
    return kLayouts[static_cast<int>(format)];
}

constexpr bool is_known(Format format) {
    return static_cast<int>(format) >= 0 && static_cast<int>(format) < 4;
}

constexpr int32_t half_rounded_up(int32_t size) {
    return (size + 1) / 2;
}

// Samples in a plane of a picture.
constexpr Size plane_size(const PlaneLayout& plane, int32_t width, int32_t height) {
    if (plane.subsampling == 1) return {width, height};
    return {half_rounded_up(width), half_rounded_up(height)};
}

constexpr int64_t packed_bytes(const PlaneLayout& plane, int32_t width, int32_t height) {
    const Size size = plane_size(plane, width, height);
    return int64_t{size.width} * size.height * plane.sample;
}

constexpr int64_t packed_bytes(const Layout& layout, int32_t width, int32_t height) {
    int64_t bytes = 0;
    for (int i = 0; i < layout.planes; ++i) bytes += packed_bytes(layout.plane[i], width, height);
    return bytes;
}

constexpr bool is_side(int32_t size) {
    return size >= 1 && size <= kLargestSide;
}

}  // namespace detail

// Bytes of a packed picture; 0 for sizes and formats that there are none of.
constexpr size_t picture_bytes(Format format, int32_t width, int32_t height) {
    if (!detail::is_known(format) || !detail::is_side(width) || !detail::is_side(height)) return 0;
    return static_cast<size_t>(detail::packed_bytes(detail::layout_of(format), width, height));
}

// Chroma samples in a row, or chroma rows, of a 4:2:0 picture.
constexpr int32_t chroma_side(int32_t luma_side) {
    return detail::half_rounded_up(luma_side);
}

template <class Byte>
BasicView<Byte> nv21_as_i420_view(Byte* data, size_t bytes, int32_t width, int32_t height) {
    const size_t needed = picture_bytes(Format::kNv21, width, height);
    if (data == nullptr || needed == 0 || bytes < needed) {
        return {Format::kI420, width, height, false, {data, bytes}};
    }
    const auto luma = static_cast<size_t>(int64_t{width} * height);
    const size_t chroma = needed - luma;
    const int32_t row = 2 * chroma_side(width);
    return {Format::kI420,
            width,
            height,
            false,
            {data, luma},
            {data + luma + 1, chroma - 1, row, 2},
            {data + luma, chroma - 1, row, 2}};
}

// ---- Checks -------------------------------------------------------------------------------------

namespace detail {

inline void append(Status& status, const char* text) {
    size_t end = strlen(status.text);
    while (*text != '\0' && end + 1 < sizeof status.text) status.text[end++] = *text++;
    status.text[end] = '\0';
}

inline void append(Status& status, int64_t number) {
    char digits[24];
    char* first = digits + sizeof digits;
    *--first = '\0';
    uint64_t rest = number < 0 ? 0 - static_cast<uint64_t>(number) : static_cast<uint64_t>(number);
    do {
        *--first = static_cast<char>('0' + rest % 10);
        rest /= 10;
    } while (rest > 0);
    if (number < 0) *--first = '-';
    append(status, first);
}

inline void append(Status& status, Size size) {
    append(status, int64_t{size.width});
    append(status, "x");
    append(status, int64_t{size.height});
}

template <class... Parts>
Status fail(ErrorCode code, Parts... parts) {
    Status status;
    status.code = code;
    (append(status, parts), ...);
    return status;
}

constexpr int64_t count(size_t bytes) {
    return static_cast<int64_t>(bytes < INT64_MAX ? bytes : INT64_MAX);
}

// A view's planes with their strides and lengths filled in. Of a view in one buffer the planes are
// cut from it; that one is long enough must be known before.
template <class Byte>
struct Planes {
    BasicPlane<Byte> at[3];

    explicit Planes(const BasicView<Byte>& view) {
        const Layout& layout = layout_of(view.format);
        Byte* next = view.planes[0].data;
        for (int i = 0; i < layout.planes; ++i) {
            const PlaneLayout& plane = layout.plane[i];
            const auto packed = static_cast<size_t>(packed_bytes(plane, view.width, view.height));
            at[i] = view.one_buffer ? BasicPlane<Byte>(next, packed) : view.planes[i];
            if (view.one_buffer) next += packed;
            if (at[i].pixel_stride == 0) at[i].pixel_stride = plane.sample;
            if (at[i].row_stride == 0) at[i].row_stride = row_bytes(plane, view.width, at[i]);
        }
    }

    static int32_t row_bytes(const PlaneLayout& plane, int32_t width, BasicPlane<Byte> p) {
        return plane_size(plane, width, 1).width * p.pixel_stride;
    }
};

inline Status check_format(Format format, const char* name) {
    if (is_known(format)) return {};
    return fail(ErrorCode::kUnknownFormat, name, ": format ",
                static_cast<int64_t>(static_cast<int>(format)), " is unknown");
}

inline Status check_size(Format format, Size size, const char* name) {
    if (size.width < 1 || size.height < 1) {
        return fail(ErrorCode::kEmpty, name, ": ", layout_of(format).name, " ", size, " is empty");
    }
    if (!is_side(size.width) || !is_side(size.height)) {
        return fail(ErrorCode::kTooLarge, name, ": ", layout_of(format).name, " ", size,
                    " is too large, sides go up to ", int64_t{kLargestSide});
    }
    return {};
}

template <class Byte>
Status check_one_buffer(const BasicView<Byte>& view, const char* name) {
    const Layout& layout = layout_of(view.format);
    const Size size = {view.width, view.height};
    const int64_t needed = packed_bytes(layout, view.width, view.height);
    if (view.planes[0].data == nullptr) {
        return fail(ErrorCode::kNull, name, ": ", layout.name, " ", size, " is at null");
    }
    if (count(view.planes[0].bytes) < needed) {
        return fail(ErrorCode::kBufferTooSmall, name, ": ", layout.name, " ", size, " needs ",
                    needed, " bytes, has ", count(view.planes[0].bytes));
    }
    return {};
}

// The sentence begins "src: U plane of I420 8x6", without a plane where the format has only one.
template <class Byte, class... Parts>
Status fail_plane(ErrorCode code, const BasicView<Byte>& view, int i, const char* name,
                  Parts... parts) {
    const Layout& layout = layout_of(view.format);
    const bool only_one = layout.planes == 1;
    return fail(code, name, ": ", only_one ? "" : layout.plane[i].name,
                only_one ? "" : " plane of ", layout.name, " ", Size{view.width, view.height},
                parts...);
}

template <class Byte>
Status check_plane(const BasicView<Byte>& view, int i, const char* name) {
    const BasicPlane<Byte> plane = view.planes[i];
    const PlaneLayout& layout = layout_of(view.format).plane[i];
    if (plane.data == nullptr) {
        return fail_plane(ErrorCode::kNull, view, i, name, " is at null");
    }
    const int64_t sample = layout.sample;
    const int64_t pixel = plane.pixel_stride == 0 ? sample : plane.pixel_stride;
    if (pixel < sample) {
        return fail_plane(ErrorCode::kStrideTooSmall, view, i, name, " needs a pixel stride of ",
                          sample, " bytes, has ", pixel);
    }
    const Size size = plane_size(layout, view.width, view.height);
    const int64_t row = (size.width - 1) * pixel + sample;
    const int64_t stride = plane.row_stride == 0 ? size.width * pixel : plane.row_stride;
    if (stride < row) {
        return fail_plane(ErrorCode::kStrideTooSmall, view, i, name, " needs a row stride of ", row,
                          " bytes, has ", stride);
    }
    if (stride > INT32_MAX) {
        return fail_plane(ErrorCode::kTooLarge, view, i, name, " has rows of ", stride,
                          " bytes, limit ", int64_t{INT32_MAX});
    }
    const int64_t needed = (size.height - 1) * stride + row;
    if (count(plane.bytes) < needed) {
        return fail_plane(ErrorCode::kBufferTooSmall, view, i, name, " needs ", needed,
                          " bytes, has ", count(plane.bytes));
    }
    return {};
}

}  // namespace detail

// Whether the view's size, strides and buffers fit each other. `name` begins the sentence.
template <class Byte>
Status check(const BasicView<Byte>& view, const char* name = "picture") {
    Status status = detail::check_format(view.format, name);
    if (status.ok()) status = detail::check_size(view.format, {view.width, view.height}, name);
    if (!status.ok()) return status;
    if (view.one_buffer) return detail::check_one_buffer(view, name);
    for (int i = 0; i < detail::layout_of(view.format).planes && status.ok(); ++i) {
        status = detail::check_plane(view, i, name);
    }
    return status;
}

namespace detail {

// The bytes from the first sample of a plane to its last.
struct Span {
    uintptr_t begin;
    uintptr_t end;
};

template <class Byte>
Span span_of(const BasicPlane<Byte>& plane, const PlaneLayout& layout, Size picture) {
    const Size size = plane_size(layout, picture.width, picture.height);
    const int64_t bytes = (size.height - 1) * int64_t{plane.row_stride} +
                          (size.width - 1) * int64_t{plane.pixel_stride} + layout.sample;
    const auto begin = reinterpret_cast<uintptr_t>(plane.data);
    return {begin, begin + static_cast<uintptr_t>(bytes)};
}

inline bool meet(Span a, Span b) {
    return a.begin < b.end && b.begin < a.end;
}

// Gaps between rows and samples count as part of their plane.
inline Status check_overlap(const ConstView& src, const View& dst, const char* dst_name) {
    const Layout& layout = layout_of(src.format);
    const Planes<const uint8_t> from(src);
    const Planes<uint8_t> to(dst);
    for (int i = 0; i < layout.planes; ++i) {
        const Span read = span_of(from.at[i], layout.plane[i], {src.width, src.height});
        for (int k = 0; k < layout.planes; ++k) {
            const Span written = span_of(to.at[k], layout.plane[k], {dst.width, dst.height});
            if (!meet(read, written)) continue;
            const uintptr_t begin = read.begin > written.begin ? read.begin : written.begin;
            const uintptr_t end = read.end < written.end ? read.end : written.end;
            return fail(ErrorCode::kOverlap, "src and ", dst_name, ": ", layout.plane[i].name,
                        " and ", layout.plane[k].name, " overlap in ",
                        static_cast<int64_t>(end - begin), " bytes");
        }
    }
    return {};
}

// Planes whose samples take turns, as U and V of a camera do, share bytes but no sample.
inline bool interleave(const Plane& a, int32_t sample_a, const Plane& b, int32_t sample_b) {
    if (a.pixel_stride != b.pixel_stride || a.row_stride != b.row_stride ||
        a.row_stride % a.pixel_stride != 0) {
        return false;
    }
    const auto turn = static_cast<uintptr_t>(a.pixel_stride);
    const uintptr_t first_a = reinterpret_cast<uintptr_t>(a.data) % turn;
    const uintptr_t first_b = reinterpret_cast<uintptr_t>(b.data) % turn;
    const uintptr_t offset = (first_a + turn - first_b) % turn;
    return offset >= static_cast<uintptr_t>(sample_b) &&
           turn - offset >= static_cast<uintptr_t>(sample_a);
}

inline Status check_shared_planes(const View& dst, const char* name) {
    const Layout& layout = layout_of(dst.format);
    const Planes<uint8_t> planes(dst);
    const Size size = {dst.width, dst.height};
    for (int i = 0; i < layout.planes; ++i) {
        for (int k = 0; k < i; ++k) {
            const bool interleaved = interleave(planes.at[i], layout.plane[i].sample, planes.at[k],
                                                layout.plane[k].sample);
            if (interleaved || !meet(span_of(planes.at[i], layout.plane[i], size),
                                     span_of(planes.at[k], layout.plane[k], size))) {
                continue;
            }
            return fail(ErrorCode::kOverlap, name, ": ", layout.plane[k].name, " and ",
                        layout.plane[i].name, " plane of ", layout.name, " ", size, " overlap");
        }
    }
    return {};
}

inline Status check_pair(const ConstView& src, const View& dst, const char* dst_name) {
    Status status = check(src, "src");
    if (status.ok()) status = check(dst, dst_name);
    if (!status.ok()) return status;
    if (src.format != dst.format) {
        return fail(ErrorCode::kDifferentFormats, "src is ", layout_of(src.format).name, ", ",
                    dst_name, " is ", layout_of(dst.format).name);
    }
    status = check_shared_planes(dst, dst_name);
    return status.ok() ? check_overlap(src, dst, dst_name) : status;
}

// ---- Memory -------------------------------------------------------------------------------------

// What malloc gave, until it goes.
class Memory {
public:
    Memory() = default;
    ~Memory() { free(bytes_); }
    Memory(Memory&& other) noexcept : bytes_(other.bytes_) { other.bytes_ = nullptr; }
    Memory& operator=(Memory&& other) noexcept {
        uint8_t* const taken = other.bytes_;
        other.bytes_ = nullptr;
        reset(taken);
        return *this;
    }

    uint8_t* get() const { return bytes_; }
    bool is_empty() const { return bytes_ == nullptr; }
    void reset(void* bytes) {
        free(bytes_);
        bytes_ = static_cast<uint8_t*>(bytes);
    }

private:
    uint8_t* bytes_ = nullptr;
};

inline Status no_memory(const char* name, int64_t bytes) {
    return fail(ErrorCode::kNoMemory, name, ": no memory for ", bytes, " bytes");
}

inline Status no_memory_in_library() {
    return fail(ErrorCode::kNoMemory, "the library has no memory for its work");
}

}  // namespace detail

// Runs write(), which calls C functions that store every byte of dst, and tells whether they did.
// Those report no lack of memory but leave dst alone then: a mark in its first bytes is still
// there. When it is, write() runs again on another mark, as the picture itself may begin like the
// first one. False leaves dst as it was.
template <class Write>
bool has_written(uint8_t* dst, size_t bytes, const Write& write) {
    constexpr size_t kMarked = 16;
    const size_t marked = bytes < kMarked ? bytes : kMarked;
    uint8_t before[kMarked];
    memcpy(before, dst, marked);
    constexpr uint8_t kSeeds[] = {0x5A, 0xA5};
    for (const uint8_t seed : kSeeds) {
        uint8_t mark[kMarked];
        for (size_t i = 0; i < marked; ++i) mark[i] = static_cast<uint8_t>(seed + 29 * i);
        memcpy(dst, mark, marked);
        write();
        if (memcmp(dst, mark, marked) != 0) return true;
    }
    memcpy(dst, before, marked);
    return false;
}

// A packed picture that owns its memory.
class Picture {
public:
    Picture() = default;

    // Gives up what it held. A new picture is all 0.
    Status allocate(Format format, int32_t width, int32_t height) {
        *this = Picture();
        Status status = detail::check_format(format, "picture");
        if (status.ok()) status = detail::check_size(format, {width, height}, "picture");
        if (!status.ok()) return status;
        const size_t bytes = picture_bytes(format, width, height);
        memory_.reset(calloc(bytes, 1));
        if (memory_.is_empty()) return detail::no_memory("picture", detail::count(bytes));
        format_ = format;
        size_ = {width, height};
        return status;
    }

    View view() { return {format_, size_.width, size_.height, true, {data(), bytes()}}; }
    ConstView view() const { return {format_, size_.width, size_.height, true, {data(), bytes()}}; }

    uint8_t* data() { return memory_.get(); }
    const uint8_t* data() const { return memory_.get(); }
    size_t bytes() const { return picture_bytes(format_, size_.width, size_.height); }
    Format format() const { return format_; }
    Size size() const { return size_; }

private:
    Format format_ = Format::kRgba8888;
    Size size_ = {0, 0};
    detail::Memory memory_;
};

// ---- Resizing -----------------------------------------------------------------------------------

enum class Filter {
    kQuarter,          // four samples a pixel; white becomes 252. Every format
    kNearest,          // ovrin_resize_nearest_rgba8888, with its whole-number steps. RGBA8888
    kBilinear,         // ov_bilinear_sg: interpolated whatever the height. Not RGB888
    kBilinearBands,    // ov_bilinear: not interpolated from 1024 destination rows on. Not RGB888
    kBilinearHalving,  // ov_bilinear_ex: large reductions by halves first. Not RGB888
    kLanczos           // each plane by itself. Every format
};

// Never changes a byte of the result. What a filter has no threads for stays on the calling thread.
enum class Threads {
    kAuto,  // as the library decides, by the height
    kOne,   // the calling thread only, except for kBilinearBands and kBilinearHalving
    kMany   // threads even for small pictures, where the library has a function for that
};

namespace detail {

inline bool is_bilinear(Filter filter) {
    return filter == Filter::kBilinear || filter == Filter::kBilinearBands ||
           filter == Filter::kBilinearHalving;
}

inline Status check_threads(Threads threads) {
    const int code = static_cast<int>(threads);
    if (code >= 0 && code <= static_cast<int>(Threads::kMany)) return {};
    return fail(ErrorCode::kUnsupported, "threads ", int64_t{code}, " is unknown");
}

inline Status check_filter(Filter filter, Format format) {
    const int code = static_cast<int>(filter);
    if (code < 0 || code > static_cast<int>(Filter::kLanczos)) {
        return fail(ErrorCode::kUnsupported, "filter ", int64_t{code}, " is unknown");
    }
    if (filter == Filter::kNearest && format != Format::kRgba8888) {
        return fail(ErrorCode::kUnsupported, "the nearest filter takes RGBA8888, not ",
                    layout_of(format).name);
    }
    if (is_bilinear(filter) && format == Format::kRgb888) {
        return fail(ErrorCode::kUnsupported, "the bilinear filter does not take RGB888");
    }
    return {};
}

template <class Byte>
bool is_packed(const BasicPlane<Byte>& plane, const PlaneLayout& layout, int32_t width) {
    return plane.pixel_stride == layout.sample &&
           plane.row_stride == plane_size(layout, width, 1).width * layout.sample;
}

template <class Byte>
bool is_packed(const Planes<Byte>& planes, const BasicView<Byte>& view) {
    const Layout& layout = layout_of(view.format);
    for (int i = 0; i < layout.planes; ++i) {
        if (!is_packed(planes.at[i], layout.plane[i], view.width)) return false;
    }
    return true;
}

template <class Byte>
bool lies_in_one_buffer(const BasicView<Byte>& view) {
    return view.one_buffer || layout_of(view.format).planes == 1;
}

inline bool is_aligned(const uint8_t* pixels) {
    return reinterpret_cast<uintptr_t>(pixels) % alignof(uint32_t) == 0;
}

// With distances that the compiler knows, it moves many bytes at once.
template <int kPut, int kTake>
void copy_bytes(uint8_t* put, const uint8_t* take, int32_t count) {
    for (int64_t i = 0; i < count; ++i) put[i * kPut] = take[i * kTake];
}

template <class Byte>
void copy_plane(const Plane& to, const BasicPlane<Byte>& from, Size size, int32_t sample) {
    const int32_t put_step = to.pixel_stride;
    const int32_t take_step = from.pixel_stride;
    const bool bytes = sample == 1 && put_step <= 2 && take_step <= 2;
    for (int64_t row = 0; row < size.height; ++row) {
        uint8_t* put = to.data + row * to.row_stride;
        const uint8_t* take = from.data + row * from.row_stride;
        if (put_step == sample && take_step == sample) {
            memcpy(put, take, static_cast<size_t>(int64_t{size.width} * sample));
        } else if (bytes) {
            const auto copy = put_step == 1    ? copy_bytes<1, 2>
                              : take_step == 1 ? copy_bytes<2, 1>
                                               : copy_bytes<2, 2>;
            copy(put, take, size.width);
        } else {
            for (int64_t i = 0; i < size.width; ++i) {
                memcpy(put + i * put_step, take + i * take_step, static_cast<size_t>(sample));
            }
        }
    }
}

// Both have the same format and size.
template <class Byte>
void copy_picture(const View& to, const BasicView<Byte>& from) {
    const Layout& layout = layout_of(to.format);
    const Planes<uint8_t> put(to);
    const Planes<Byte> take(from);
    for (int i = 0; i < layout.planes; ++i) {
        copy_plane(put.at[i], take.at[i], plane_size(layout.plane[i], to.width, to.height),
                   layout.plane[i].sample);
    }
}

// The left or upper source sample of the bilinear engine's last output sample, or the one after it:
// the engine computes in single precision, which up to kLargestSide is less than 1/128 off.
constexpr int64_t last_position(int64_t src, int64_t dst) {
    return ((dst - 1) * src * 128 + dst) / (dst * 128);
}

// Bytes of a packed source from which one pass of the bilinear engine makes a picture of size dst.
// It blends with the sample to the right and the row below, in U and V two rows below.
inline int64_t bilinear_pass_bytes(Format format, Size src, Size dst) {
    const int64_t column = last_position(src.width, dst.width);
    const int64_t row = last_position(src.height, dst.height);
    const int64_t first_plane = (row + 1) * src.width + column + 2;
    if (format == Format::kRgba8888) return 4 * first_plane;
    const int64_t luma = int64_t{src.width} * src.height;
    const int64_t chroma_width = half_rounded_up(src.width);
    int64_t end = 0;
    if (format == Format::kNv21) {
        end = luma + 2 * ((row / 2 + 1) * chroma_width + column / 2 + 2);
    } else {
        const int64_t u = chroma_width * half_rounded_up(src.height);
        end = luma + u + row / 2 * chroma_width + src.width + (column + 1) / 2 + 2;
    }
    return end > first_plane ? end : first_plane;
}

inline int64_t source_bytes(Filter filter, Format format, Size src, Size dst) {
    int64_t bytes = packed_bytes(layout_of(format), src.width, src.height);
    if (!is_bilinear(filter)) return bytes;
    const auto reach = [&](Size size) {
        const int64_t read = bilinear_pass_bytes(format, src, size);
        if (read > bytes) bytes = read;
    };
    reach(dst);
    // The first of several passes.
    if (filter == Filter::kBilinearHalving && src.width / dst.width >= 4 &&
        src.height / dst.height >= 4) {
        reach({src.width / 2, src.height / 2});
    }
    return bytes;
}

// What the C functions read: planes that are packed, in one buffer for the engines that want that,
// and as long as they read. The view's own memory where it is like that, otherwise a copy.
struct Source {
    const uint8_t* planes[3] = {};
    bool one_buffer = true;
    Memory memory;

    // False when there is no memory.
    bool prepare(const ConstView& view, Filter filter, int64_t needed) {
        const Planes<const uint8_t> own(view);
        if (serves(view, own, filter, needed)) {
            point_to(own, lies_in_one_buffer(view));
            return true;
        }
        memory.reset(malloc(static_cast<size_t>(needed)));
        if (memory.is_empty()) return false;
        const View copy = {view.format,
                           view.width,
                           view.height,
                           true,
                           {memory.get(), static_cast<size_t>(needed)}};
        copy_picture(copy, view);
        repeat_last_row(copy, needed);
        point_to(Planes<const uint8_t>(copy), true);
        return true;
    }

private:
    static bool serves(const ConstView& view, const Planes<const uint8_t>& own, Filter filter,
                       int64_t needed) {
        if (!is_packed(own, view)) return false;
        if (filter == Filter::kNearest) return is_aligned(own.at[0].data);
        if (!is_bilinear(filter)) return true;
        return lies_in_one_buffer(view) && count(view.planes[0].bytes) >= needed;
    }

    void point_to(const Planes<const uint8_t>& from, bool one) {
        for (int i = 0; i < 3; ++i) planes[i] = from.at[i].data;
        one_buffer = one;
    }

    // Behind the picture, where the bilinear engine looks for one more row.
    static void repeat_last_row(const View& copy, int64_t end) {
        const Layout& layout = layout_of(copy.format);
        const PlaneLayout& last = layout.plane[layout.planes - 1];
        const int64_t row = int64_t{plane_size(last, copy.width, 1).width} * last.sample;
        uint8_t* bytes = copy.planes[0].data;
        for (int64_t i = packed_bytes(layout, copy.width, copy.height); i < end; ++i) {
            bytes[i] = bytes[i - row];
        }
    }
};

// What the C functions write: one packed buffer. The view's own memory, or a copy that is put back.
struct Destination {
    View view;
    uint8_t* data = nullptr;
    Memory memory;

    bool prepare(const View& dst) {
        view = dst;
        const bool aligned = dst.format != Format::kRgba8888 || is_aligned(dst.planes[0].data);
        if (lies_in_one_buffer(dst) && is_packed(Planes<uint8_t>(dst), dst) && aligned) {
            data = dst.planes[0].data;
            return true;
        }
        memory.reset(malloc(picture_bytes(dst.format, dst.width, dst.height)));
        data = memory.get();
        if (data == nullptr) return false;
        // The nearest filter, and a call that finds no memory, leave what was there.
        copy_picture(copy(), dst);
        return true;
    }

    void finish() {
        if (!memory.is_empty()) copy_picture(view, copy());
    }

private:
    View copy() {
        return {view.format,
                view.width,
                view.height,
                true,
                {data, picture_bytes(view.format, view.width, view.height)}};
    }
};

// ---- Calls of the C functions -------------------------------------------------------------------

struct Call {
    Format format;
    Filter filter;
    Threads threads;
    Size src;
    Size dst;
};

template <class Function>
Function* choose(Threads threads, Function* automatic, Function* one, Function* many) {
    if (threads == Threads::kAuto) return automatic;
    return threads == Threads::kOne ? one : many;
}

inline uint32_t* words(uint8_t* pixels) {
    return static_cast<uint32_t*>(static_cast<void*>(pixels));
}

inline const uint32_t* words(const uint8_t* pixels) {
    return static_cast<const uint32_t*>(static_cast<const void*>(pixels));
}

// A target record is for rows that lie apart.
inline void quarter_planes(const Call& call, const uint8_t* const* src, uint8_t* dst,
                           const ovrin_resize_target* target = nullptr) {
    const Size from = call.src;
    const Size to = call.dst;
    if (call.format == Format::kI420) {
        const auto in_threads =
            call.threads == Threads::kOne ? ovrin_resize_y_u_v_sg : ovrin_resize_y_u_v_tps;
        in_threads(src[0], src[1], src[2], dst, from.width, from.height, to.width, to.height,
                   target);
    } else {
        const auto in_threads =
            call.threads == Threads::kOne ? ovrin_resize_y_nv_sg : ovrin_resize_y_nv_tps;
        in_threads(src[0], src[1], dst, from.width, from.height, to.width, to.height, target);
    }
}

inline void quarter(const Call& call, const Source& src, uint8_t* dst) {
    const Size from = call.src;
    const Size to = call.dst;
    if (call.format == Format::kRgba8888) {
        choose(call.threads, ovrin_resize_rgba8888, ovrin_resize_rgba8888_sg,
               ovrin_resize_rgba8888_tps)(src.planes[0], words(dst), from.width, from.height,
                                          to.width, to.height);
    } else if (call.format == Format::kRgb888) {
        ovrin_resize_rgb888(src.planes[0], dst, from.width, from.height, to.width, to.height);
    } else if (!src.one_buffer) {
        quarter_planes(call, src.planes, dst);
    } else {
        const auto resize_420 = call.format == Format::kI420
                                    ? choose(call.threads, ovrin_resize_yuv420,
                                             ovrin_resize_yuv420_sg, ovrin_resize_yuv420_tps)
                                    : choose(call.threads, ovrin_resize_nv21, ovrin_resize_nv21_sg,
                                             ovrin_resize_nv21_tps);
        resize_420(src.planes[0], dst, from.width, from.height, to.width, to.height);
    }
}

constexpr int32_t format_code(Format format) {
    if (format == Format::kI420) return OVRIN_FORMAT_PLANAR;
    return format == Format::kNv21 ? OVRIN_FORMAT_SEMI_PLANAR : OVRIN_FORMAT_PIXELS;
}

inline void bilinear(const Call& call, const uint8_t* src, uint8_t* dst) {
    const auto engine = call.filter == Filter::kBilinear        ? ov_bilinear_sg
                        : call.filter == Filter::kBilinearBands ? ov_bilinear
                                                                : ov_bilinear_ex;
    engine(src, dst, call.src.width, call.src.height, call.dst.width, call.dst.height,
           format_code(call.format), nullptr);
}

inline void lanczos(const Call& call, const Source& src, uint8_t* dst) {
    if (call.format == Format::kRgba8888 && call.threads != Threads::kOne) {
        ovrin_resize_lanczos(src.planes[0], dst, call.src.width, call.src.height, call.dst.width,
                             call.dst.height, 4);
        return;
    }
    const Layout& layout = layout_of(call.format);
    for (int i = 0; i < layout.planes; ++i) {
        const PlaneLayout& plane = layout.plane[i];
        const Size from = plane_size(plane, call.src.width, call.src.height);
        const Size to = plane_size(plane, call.dst.width, call.dst.height);
        ov_lanczos(src.planes[i], from.width, from.height, dst, to.width, to.height, plane.sample);
        dst += packed_bytes(plane, call.dst.width, call.dst.height);
    }
}

inline void run(const Call& call, const Source& src, uint8_t* dst) {
    if (call.filter == Filter::kQuarter) {
        quarter(call, src, dst);
    } else if (call.filter == Filter::kNearest) {
        ovrin_resize_nearest_rgba8888(words(src.planes[0]), words(dst), call.src.width,
                                      call.src.height, call.dst.width, call.dst.height);
    } else if (call.filter == Filter::kLanczos) {
        lanczos(call, src, dst);
    } else {
        bilinear(call, src.planes[0], dst);
    }
}

// ---- 4:2:0 pictures whose rows or samples lie apart ---------------------------------------------

// How U and V lie to each other.
enum class Chroma {
    kPlanes,  // each by itself, byte after byte
    kUv,      // bytes take turns, U first
    kVu,      // V first, as in NV21
    kOther
};

inline bool takes_turns(Chroma chroma) {
    return chroma == Chroma::kUv || chroma == Chroma::kVu;
}

// Rows so far apart that a band record cannot say it count as kOther.
template <class Byte>
Chroma chroma_of(const BasicPlane<Byte>& u, const BasicPlane<Byte>& v) {
    const bool alike = u.row_stride == v.row_stride && u.pixel_stride == v.pixel_stride;
    if (!alike || u.row_stride > INT32_MAX / 2) return Chroma::kOther;
    if (u.pixel_stride == 1) return Chroma::kPlanes;
    if (u.pixel_stride != 2 || u.row_stride % 2 != 0) return Chroma::kOther;
    const auto at_u = reinterpret_cast<uintptr_t>(u.data);
    const auto at_v = reinterpret_cast<uintptr_t>(v.data);
    if (at_v == at_u + 1) return Chroma::kUv;
    return at_u == at_v + 1 ? Chroma::kVu : Chroma::kOther;
}

// A picture in I420 or NV21 as three planes. Of U and V that take turns in one memory, a row ends
// with the last byte of either: neither plane's own length tells how far the pairs go.
template <class Byte>
struct Yuv {
    BasicPlane<Byte> y;
    BasicPlane<Byte> u;
    BasicPlane<Byte> v;
    Chroma chroma;

    explicit Yuv(const BasicView<Byte>& view) {
        const Planes<Byte> planes(view);
        y = planes.at[0];
        u = planes.at[1];
        v = planes.at[view.format == Format::kNv21 ? 1 : 2];
        if (view.format == Format::kNv21) ++u.data;
        chroma = chroma_of(u, v);
    }

    Byte* first_chroma() const { return chroma == Chroma::kVu ? v.data : u.data; }
};

inline void copy_yuv(const Yuv<uint8_t>& to, const Yuv<const uint8_t>& from, Size size) {
    const Size chroma = {half_rounded_up(size.width), half_rounded_up(size.height)};
    copy_plane(to.y, from.y, size, 1);
    copy_plane(to.u, from.u, chroma, 1);
    copy_plane(to.v, from.v, chroma, 1);
}

// A packed picture whose chroma lies as said; for kUv, too, V is named first. Its sides may be 1
// above kLargestSide, where those of a result are rounded up.
inline View packed_yuv(Chroma chroma, uint8_t* data, Size size) {
    const Format format = chroma == Chroma::kPlanes ? Format::kI420 : Format::kNv21;
    const int64_t bytes = packed_bytes(layout_of(format), size.width, size.height);
    return {format, size.width, size.height, true, {data, static_cast<size_t>(bytes)}};
}

// Whether this is a packed picture whose chroma lies so, but for the order of U and V in a pair.
inline bool is_packed_as(const Yuv<uint8_t>& yuv, Size size, Chroma chroma) {
    if (takes_turns(yuv.chroma) != takes_turns(chroma) || yuv.chroma == Chroma::kOther) {
        return false;
    }
    const Yuv<uint8_t> packed(packed_yuv(chroma, yuv.y.data, size));
    return yuv.y.pixel_stride == 1 && yuv.y.row_stride == packed.y.row_stride &&
           yuv.u.row_stride == packed.u.row_stride && yuv.first_chroma() == packed.first_chroma() &&
           (takes_turns(chroma) || yuv.v.data == packed.v.data);
}

inline void swap_pairs(uint8_t* pairs, int64_t count) {
    for (int64_t i = 0; i < count; ++i) {
        const uint8_t first = pairs[2 * i];
        pairs[2 * i] = pairs[2 * i + 1];
        pairs[2 * i + 1] = first;
    }
}

// One resize whose rows the quarter filter reads where they lie.
struct RowCall {
    Call call;
    Yuv<const uint8_t> src;

    bool has_pairs() const { return takes_turns(src.chroma); }

    // A target record has one row length, which that of chroma follows from.
    bool fits_record() const {
        const int64_t row = (int64_t{src.y.row_stride} + 1) / 2;
        return src.u.row_stride == (has_pairs() ? 2 * row : row);
    }

    // The picture that the samples make: bands make one whose sides are multiples of 4.
    View result(uint8_t* data) const {
        const auto side = [&](int32_t length) {
            return fits_record() ? length : (length + 3) / 4 * 4;
        };
        return packed_yuv(src.chroma, data, {side(call.dst.width), side(call.dst.height)});
    }
};

// By a target record: on threads, where there are many rows.
inline void quarter_by_record(const RowCall& rows, uint8_t* dst) {
    Call call = rows.call;
    call.format = rows.has_pairs() ? Format::kNv21 : Format::kI420;
    ovrin_resize_target target = {};
    target.src_width = call.src.width;
    target.src_height = call.src.height;
    target.src_stride = rows.src.y.row_stride;
    target.src_buffer_height = call.src.height;
    target.dst = dst;
    target.dst_width = target.canvas_width = call.dst.width;
    target.dst_height = target.canvas_height = call.dst.height;
    const uint8_t* const planes[] = {rows.src.y.data, rows.src.first_chroma(), rows.src.v.data};
    quarter_planes(call, planes, nullptr, &target);
}

// Luma and chroma as a band each, of which either can have any row length. The samples are added to
// what dst holds.
template <class Band>
void quarter_by_bands(const RowCall& rows, uint8_t* dst, Band& band, int32_t& chroma_rows,
                      int32_t chroma_stride, void (*task)(void*)) {
    const Size from = rows.call.src;
    band.src_width = from.width;
    band.src_height = band.band_rows = from.height;
    band.dst_width = rows.call.dst.width;
    band.dst_height = rows.call.dst.height;
    band.src = rows.src.y.data;
    band.work = dst;
    band.src_row_bytes = rows.src.y.row_stride;
    band.y_rows = from.height;
    task(&band);
    band.src_row_bytes = chroma_stride;
    band.y_rows = 0;
    chroma_rows = half_rounded_up(from.height);
    task(&band);
}

inline void quarter_by_bands(const RowCall& rows, uint8_t* dst) {
    const int32_t stride = rows.src.u.row_stride;
    if (rows.has_pairs()) {
        ovrin_nv21_band band = {};
        band.src_vu = rows.src.first_chroma();
        quarter_by_bands(rows, dst, band, band.vu_rows, stride, _resize_y_nv21_tp);
    } else {
        ovrin_yuv_band band = {};
        band.src_u = rows.src.u.data;
        band.src_v = rows.src.v.data;
        quarter_by_bands(rows, dst, band, band.uv_rows, 2 * stride, _resize_y_u_v_tp);
    }
}

// False when the library found no memory.
inline bool sample_rows(const RowCall& rows, const View& result) {
    const Plane all = result.planes[0];
    return has_written(all.data, all.bytes, [&] {
        if (rows.fits_record()) {
            quarter_by_record(rows, all.data);
        } else {
            memset(all.data, 0, all.bytes);
            quarter_by_bands(rows, all.data);
        }
    });
}

// Into memory of the result's size, and from there into dst.
inline Status sample_rows_and_copy(const RowCall& rows, const Yuv<uint8_t>& dst) {
    const size_t bytes = rows.result(nullptr).planes[0].bytes;
    Memory memory;
    memory.reset(malloc(bytes));
    if (memory.is_empty()) return no_memory("dst", count(bytes));
    const View result = rows.result(memory.get());
    if (!sample_rows(rows, result)) return no_memory_in_library();
    Yuv<const uint8_t> samples{ConstView(result)};
    if (rows.src.chroma == Chroma::kUv) {
        const ConstPlane first = samples.v;
        samples.v = samples.u;
        samples.u = first;
    }
    copy_yuv(dst, samples, rows.call.dst);
    return {};
}

inline Status quarter_rows(const RowCall& rows, const View& dst) {
    const Yuv<uint8_t> to(dst);
    const Size size = rows.call.dst;
    const View result = rows.result(to.y.data);
    const bool same_size = result.width == size.width && result.height == size.height;
    if (!same_size || !is_packed_as(to, size, rows.src.chroma)) {
        return sample_rows_and_copy(rows, to);
    }
    if (!sample_rows(rows, result)) return no_memory_in_library();
    if (to.chroma != rows.src.chroma) {
        swap_pairs(to.first_chroma(),
                   int64_t{half_rounded_up(size.width)} * half_rounded_up(size.height));
    }
    return {};
}

// U and V that lie in no way the C functions can read are copied, each into a plane of its own.
struct ChromaCopy {
    Memory memory;

    Status make(Yuv<const uint8_t>& yuv, Size size) {
        const Size chroma = {half_rounded_up(size.width), half_rounded_up(size.height)};
        const size_t plane = static_cast<size_t>(int64_t{chroma.width} * chroma.height);
        memory.reset(malloc(2 * plane));
        if (memory.is_empty()) return no_memory("src", count(2 * plane));
        const Plane u(memory.get(), plane, chroma.width, 1);
        const Plane v(memory.get() + plane, plane, chroma.width, 1);
        copy_plane(u, yuv.u, chroma, 1);
        copy_plane(v, yuv.v, chroma, 1);
        yuv.u = u;
        yuv.v = v;
        yuv.chroma = Chroma::kPlanes;
        return {};
    }
};

// Packed pictures have functions of their own.
inline bool has_rows_apart(const Call& call, const ConstView& src) {
    return call.filter == Filter::kQuarter && layout_of(call.format).planes > 1 &&
           !is_packed(Planes<const uint8_t>(src), src) &&
           Planes<const uint8_t>(src).at[0].pixel_stride == 1;
}

inline Status resize_rows_apart(const Call& call, const ConstView& src, const View& dst) {
    RowCall rows = {call, Yuv<const uint8_t>(src)};
    ChromaCopy copy;
    if (rows.src.chroma == Chroma::kOther) {
        const Status status = copy.make(rows.src, call.src);
        if (!status.ok()) return status;
    }
    return quarter_rows(rows, dst);
}

}  // namespace detail

// Resizes src into dst. Both have the same format, and share no bytes.
//
// Packed pictures go to the C function as they are. So do, for the quarter filter, the rows of
// 4:2:0 pictures however far apart they lie, of U and V also where their bytes take turns in one
// memory. Other strides, and planes apart where the filter wants them in one buffer, are copied
// first, and so is a destination. The bilinear filters read past the last plane: where the view's
// buffer is longer than the picture, they read what is there, as in C; where it is not long enough
// they read a copy, in which the last row is repeated.
//
// When the library itself finds no memory for its work, the status says so, and nothing is written.
// One case does not show: of a large Lanczos result on threads, rows for which a thread found no
// memory are 0.
inline Status resize(const ConstView& src, const View& dst, Filter filter = Filter::kQuarter,
                     Threads threads = Threads::kAuto) {
    Status status = detail::check_pair(src, dst, "dst");
    if (status.ok()) status = detail::check_filter(filter, src.format);
    if (status.ok()) status = detail::check_threads(threads);
    if (!status.ok()) return status;
    const detail::Call call = {
        src.format, filter, threads, {src.width, src.height}, {dst.width, dst.height}};
    if (detail::has_rows_apart(call, src)) return detail::resize_rows_apart(call, src, dst);
    const int64_t needed = detail::source_bytes(filter, src.format, call.src, call.dst);
    detail::Source from;
    if (!from.prepare(src, filter, needed)) return detail::no_memory("src", needed);
    detail::Destination to;
    if (!to.prepare(dst)) {
        const size_t bytes = picture_bytes(dst.format, dst.width, dst.height);
        return detail::no_memory("dst", detail::count(bytes));
    }
    const auto run = [&] { detail::run(call, from, to.data); };
    if (filter == Filter::kNearest) {
        run();  // needs no memory, and does not store every byte
    } else if (!has_written(to.data, picture_bytes(dst.format, dst.width, dst.height), run)) {
        return detail::no_memory_in_library();
    }
    to.finish();
    return status;
}

// Copies src into dst, which has the same format and size but may have other strides. Together with
// nv21_as_i420_view that makes NV21 of I420, or the reverse.
inline Status copy(const ConstView& src, const View& dst) {
    Status status = detail::check_pair(src, dst, "dst");
    if (!status.ok()) return status;
    if (src.width != dst.width || src.height != dst.height) {
        return detail::fail(ErrorCode::kDifferentSizes, "src is ", Size{src.width, src.height},
                            ", dst is ", Size{dst.width, dst.height});
    }
    detail::copy_picture(dst, src);
    return status;
}

// ---- Placing a picture on a canvas --------------------------------------------------------------

enum class Fit {
    kContain,  // the whole picture, with bars at two sides
    kCover,    // the whole canvas, with two sides of the picture cut off
    kFill      // both whole; the picture's shape gives way
};

// Where the picture goes when there is room, and which part stays when some is cut off.
enum class Gravity {
    kNorthWest,
    kNorth,
    kNorthEast,
    kWest,
    kCenter,
    kEast,
    kSouthWest,
    kSouth,
    kSouthEast
};

// Which part of a picture is shown, and where on the canvas.
struct Placement {
    Rect part;
    Rect rect;
};

namespace detail {

constexpr int32_t scaled(int32_t size, int32_t to, int32_t from) {
    const int64_t rounded = (int64_t{size} * to + from / 2) / from;
    return rounded < 1 ? 1 : static_cast<int32_t>(rounded);
}

// share: 0 for the start, 1 for the middle, 2 for the end.
constexpr int32_t offset(int32_t room, int share, int32_t grid) {
    return room * share / 2 / grid * grid;
}

// The largest rectangle of a shape that a room takes.
constexpr Rect largest_inside(Size room, Size shape, Gravity gravity, int32_t grid) {
    const bool wide = int64_t{shape.width} * room.height > int64_t{shape.height} * room.width;
    const int32_t width = wide ? room.width : scaled(shape.width, room.height, shape.height);
    const int32_t height = wide ? scaled(shape.height, room.width, shape.width) : room.height;
    const int place = static_cast<int>(gravity);
    return {offset(room.width - width, place % 3, grid),
            offset(room.height - height, place / 3, grid), width, height};
}

constexpr Rect whole(Size size) {
    return {0, 0, size.width, size.height};
}

}  // namespace detail

// Sizes must be 1 to kLargestSide. Offsets are multiples of grid: 2 for 4:2:0 pictures, whose
// chroma cannot begin at an odd pixel.
constexpr Placement placement(Size src, Size canvas, Fit fit, Gravity gravity = Gravity::kCenter,
                              int32_t grid = 1) {
    if (fit == Fit::kContain) {
        return {detail::whole(src), detail::largest_inside(canvas, src, gravity, grid)};
    }
    if (fit == Fit::kCover) {
        return {detail::largest_inside(src, canvas, gravity, grid), detail::whole(canvas)};
    }
    return {detail::whole(src), detail::whole(canvas)};
}

// A picture on its way to a canvas: what the functions whose names end in keep_ratio take. Unless
// the status is ok, the rest means nothing.
struct Fitted {
    Status status;
    Format format = Format::kRgba8888;
    Rect part = {};                 // of the source
    Rect rect = {};                 // of the canvas
    const uint8_t* planes[3] = {};  // the part's first samples: pixels; Y, U, V; or Y, VU
    ovrin_resize_target target = {};
};

namespace detail {

inline int32_t grid_of(Format format) {
    return layout_of(format).planes > 1 ? 2 : 1;
}

inline Status check_rect(Rect rect, Size room, int32_t grid, const char* name) {
    if (rect.width < 1 || rect.height < 1) {
        return fail(ErrorCode::kEmpty, name, ": a rectangle of ", Size{rect.width, rect.height},
                    " is empty");
    }
    if (rect.x < 0 || rect.y < 0 || int64_t{rect.x} + rect.width > room.width ||
        int64_t{rect.y} + rect.height > room.height) {
        return fail(ErrorCode::kOutside, name, ": ", Size{rect.width, rect.height}, " at (",
                    int64_t{rect.x}, ", ", int64_t{rect.y}, ") is not inside ", room);
    }
    if (rect.x % grid != 0 || rect.y % grid != 0) {
        return fail(ErrorCode::kOddOffset, name, ": (", int64_t{rect.x}, ", ", int64_t{rect.y},
                    ") is odd, chroma needs even offsets");
    }
    return {};
}

// A record has one row length, which those of chroma follow from.
inline Status check_record_strides(const ConstView& src) {
    const Layout& layout = layout_of(src.format);
    const Planes<const uint8_t> planes(src);
    const int64_t first = planes.at[0].row_stride;
    for (int i = 0; i < layout.planes; ++i) {
        const int64_t sample = layout.plane[i].sample;
        const int64_t row = i == 0 ? first / sample * sample : (first + 1) / 2 * sample;
        const ConstPlane& plane = planes.at[i];
        if (plane.pixel_stride == sample && plane.row_stride == row) continue;
        return fail(ErrorCode::kStrideUnsuitable, "src: rows and samples of ", layout.plane[i].name,
                    " lie ", int64_t{plane.row_stride}, " and ", int64_t{plane.pixel_stride},
                    " bytes apart, a target record needs ", row, " and ", sample);
    }
    return {};
}

inline Status check_canvas(const View& canvas) {
    if (!lies_in_one_buffer(canvas) || !is_packed(Planes<uint8_t>(canvas), canvas)) {
        return fail(ErrorCode::kStrideUnsuitable, "canvas: ", layout_of(canvas.format).name, " ",
                    Size{canvas.width, canvas.height}, " must be packed in one buffer");
    }
    if (canvas.format == Format::kRgba8888 && !is_aligned(canvas.planes[0].data)) {
        return fail(ErrorCode::kMisaligned, "canvas: RGBA8888 must lie at a multiple of 4 bytes");
    }
    return {};
}

inline Status check_placed(const ConstView& src, const View& canvas, const Placement& where) {
    const int32_t grid = grid_of(src.format);
    Status status = check_rect(where.part, {src.width, src.height}, grid, "src");
    if (status.ok()) {
        status = check_rect(where.rect, {canvas.width, canvas.height}, grid, "canvas");
    }
    if (status.ok()) status = check_record_strides(src);
    return status.ok() ? check_canvas(canvas) : status;
}

inline Status check_for_canvas(const ConstView& src, const View& canvas) {
    Status status = check_pair(src, canvas, "canvas");
    if (status.ok() && src.format == Format::kRgb888) {
        status = fail(ErrorCode::kUnsupported, "a canvas takes RGBA8888, I420 or NV21, not RGB888");
    }
    return status;
}

inline void point_to_part(Fitted& fitted, const ConstView& src) {
    const Layout& layout = layout_of(src.format);
    const Planes<const uint8_t> planes(src);
    for (int i = 0; i < layout.planes; ++i) {
        const PlaneLayout& plane = layout.plane[i];
        const int64_t x = fitted.part.x / plane.subsampling;
        const int64_t y = fitted.part.y / plane.subsampling;
        fitted.planes[i] =
            planes.at[i].data + y * planes.at[i].row_stride + x * planes.at[i].pixel_stride;
    }
}

inline void fill_target(Fitted& fitted, const ConstView& src, const View& canvas) {
    ovrin_resize_target& target = fitted.target;
    const Planes<const uint8_t> planes(src);
    target.src_vu_plane = src.format == Format::kNv21 ? fitted.planes[1] : nullptr;
    target.src_u_plane = src.format == Format::kI420 ? fitted.planes[1] : nullptr;
    target.src_v_plane = src.format == Format::kI420 ? fitted.planes[2] : nullptr;
    target.src_width = fitted.part.width;
    target.src_height = fitted.part.height;
    target.src_stride = planes.at[0].row_stride / planes.at[0].pixel_stride;
    target.src_buffer_height = fitted.part.height;
    target.format = format_code(src.format);
    target.dst = canvas.planes[0].data;
    target.dst_width = fitted.rect.width;
    target.dst_height = fitted.rect.height;
    target.canvas_width = canvas.width;
    target.canvas_height = canvas.height;
    target.dst_x = fitted.rect.x;
    target.dst_y = fitted.rect.y;
}

}  // namespace detail

// The part of src at the rectangle of canvas, as given.
inline Fitted place(const ConstView& src, const View& canvas, const Placement& where) {
    Fitted fitted;
    fitted.status = detail::check_for_canvas(src, canvas);
    if (fitted.status.ok()) fitted.status = detail::check_placed(src, canvas, where);
    if (!fitted.status.ok()) return fitted;
    fitted.format = src.format;
    fitted.part = where.part;
    fitted.rect = where.rect;
    detail::point_to_part(fitted, src);
    detail::fill_target(fitted, src, canvas);
    return fitted;
}

// src on the canvas, as placement() puts it.
inline Fitted fit(const ConstView& src, const View& canvas, Fit how,
                  Gravity gravity = Gravity::kCenter) {
    Fitted fitted;
    fitted.status = detail::check_for_canvas(src, canvas);
    const int how_code = static_cast<int>(how);
    const int gravity_code = static_cast<int>(gravity);
    if (fitted.status.ok() && (how_code < 0 || how_code > static_cast<int>(Fit::kFill))) {
        fitted.status =
            detail::fail(ErrorCode::kUnsupported, "fit ", int64_t{how_code}, " is unknown");
    }
    if (fitted.status.ok() &&
        (gravity_code < 0 || gravity_code > static_cast<int>(Gravity::kSouthEast))) {
        fitted.status =
            detail::fail(ErrorCode::kUnsupported, "gravity ", int64_t{gravity_code}, " is unknown");
    }
    if (!fitted.status.ok()) return fitted;
    return place(src, canvas,
                 placement({src.width, src.height}, {canvas.width, canvas.height}, how, gravity,
                           detail::grid_of(src.format)));
}

// Paints the canvas black and resizes the picture into its rectangle, by the quarter filter.
inline Status draw(const Fitted& fitted, Threads threads = Threads::kAuto) {
    Status status = fitted.status;
    if (status.ok()) status = detail::check_threads(threads);
    if (!status.ok()) return status;
    const int32_t w = fitted.part.width;
    const int32_t h = fitted.part.height;
    // The threaded functions for planes compare dst_x with the canvas's height, and would draw
    // nothing.
    const bool one = threads == Threads::kOne || fitted.target.canvas_height < fitted.target.dst_x;
    const uint8_t* const* planes = fitted.planes;
    const auto run = [&] {
        ovrin_resize_target target = fitted.target;
        if (fitted.format == Format::kRgba8888) {
            detail::choose(threads, ovrin_resize_rgba8888_keep_ratio,
                           ovrin_resize_rgba_keep_ratio_sg,
                           ovrin_resize_rgba_keep_ratio_tps)(planes[0], w, h, &target);
        } else if (fitted.format == Format::kI420) {
            const auto function = one ? ovrin_resize_y_u_v_sg : ovrin_resize_y_u_v_tps;
            function(planes[0], planes[1], planes[2], nullptr, w, h, 0, 0, &target);
        } else {
            const auto function = one ? ovrin_resize_y_nv_sg : ovrin_resize_y_nv_tps;
            function(planes[0], planes[1], nullptr, w, h, 0, 0, &target);
        }
    };
    const int32_t canvas_w = fitted.target.canvas_width;
    const size_t bytes = picture_bytes(fitted.format, canvas_w, fitted.target.canvas_height);
    if (!has_written(static_cast<uint8_t*>(fitted.target.dst), bytes, run)) {
        return detail::no_memory_in_library();
    }
    return status;
}

// ---- Alpha --------------------------------------------------------------------------------------

// What a filter makes of 255 everywhere: of white, and of full alpha.
constexpr int white_after(Filter filter) {
    return filter == Filter::kQuarter ? 252 : 255;
}

namespace detail {

template <class Change>
Status for_each_pixel(const View& rgba, Change change) {
    Status status = check(rgba, "picture");
    if (!status.ok()) return status;
    if (rgba.format != Format::kRgba8888) {
        return fail(ErrorCode::kUnsupported, "picture: ", layout_of(rgba.format).name,
                    " has no alpha");
    }
    const Plane plane = Planes<uint8_t>(rgba).at[0];
    for (int64_t y = 0; y < rgba.height; ++y) {
        for (int64_t x = 0; x < rgba.width; ++x) {
            change(plane.data + y * plane.row_stride + x * plane.pixel_stride);
        }
    }
    return status;
}

constexpr uint8_t limited(int value) {
    return static_cast<uint8_t>(value < 255 ? value : 255);
}

}  // namespace detail

// Multiplies colours by alpha, the last byte of each pixel, so that resizing does not mix in those
// of transparent pixels.
inline Status premultiply(const View& rgba) {
    return detail::for_each_pixel(rgba, [](uint8_t* pixel) {
        for (int c = 0; c < 3; ++c) pixel[c] = detail::limited((pixel[c] * pixel[3] + 127) / 255);
    });
}

// Undoes it after resizing. opaque is the alpha that has become of 255, white_after(filter); it
// becomes 255 again.
inline Status unpremultiply(const View& rgba, int opaque = 255) {
    if (opaque < 1 || opaque > 255) {
        return detail::fail(ErrorCode::kOutside, "opaque is ", int64_t{opaque}, ", not 1 to 255");
    }
    return detail::for_each_pixel(rgba, [opaque](uint8_t* pixel) {
        const int alpha = detail::limited((pixel[3] * 255 + opaque / 2) / opaque);
        pixel[3] = static_cast<uint8_t>(alpha);
        if (alpha == 0 || alpha == 255) return;
        for (int c = 0; c < 3; ++c) {
            pixel[c] = detail::limited((pixel[c] * 255 + alpha / 2) / alpha);
        }
    });
}

// ---- For those who want exceptions --------------------------------------------------------------

#if defined(__cpp_exceptions)

class Failure : public std::runtime_error {
public:
    explicit Failure(const Status& status) : std::runtime_error(status.text), code_(status.code) {}
    ErrorCode code() const { return code_; }

private:
    ErrorCode code_;
};

inline void require(const Status& status) {
    if (!status.ok()) throw Failure(status);
}

inline void resize_or_throw(const ConstView& src, const View& dst, Filter filter = Filter::kQuarter,
                            Threads threads = Threads::kAuto) {
    require(resize(src, dst, filter, threads));
}

inline Fitted fit_or_throw(const ConstView& src, const View& canvas, Fit how,
                           Gravity gravity = Gravity::kCenter) {
    Fitted fitted = fit(src, canvas, how, gravity);
    require(fitted.status);
    return fitted;
}

inline Picture picture_or_throw(Format format, int32_t width, int32_t height) {
    Picture picture;
    require(picture.allocate(format, width, height));
    return picture;
}

#endif

}  // namespace v1
}  // namespace ovrin

#endif
