// SPDX-License-Identifier: Apache-2.0
// The C++ layer with any views: a call either says what is wrong and writes nothing, or gives the
// bytes of the C function for packed pictures.
#include <ovrinresize.hpp>

#include <cstring>

#include "support.h"

using namespace fuzz;
using ovrin::Filter;
using ovrin::Format;
using ovrin::detail::Layout;

namespace {

// What is wrong with a call; the layer must notice it.
enum class Fault { kNone, kShort, kNull, kEmpty, kOtherFormat };

// A picture whose planes lie in buffers of their own, or in one.
struct Picture {
    ovrin::View view;
    std::vector<Buffer> buffers;
    std::vector<uint8_t> packed;  // its samples as a C function wants them

    Picture(Input& in, Pixels& pixels, Format format, int32_t w, int32_t h);

    // Puts samples into what the buffers must hold; takes them out of it.
    std::vector<std::vector<uint8_t>> with_samples(const std::vector<uint8_t>& samples) const;

private:
    void add_plane(Input& in, Pixels& pixels, int32_t number);
    size_t place(int32_t plane, int64_t row, int64_t column) const;

    template <class Visit>
    void for_each_sample(Visit visit) const {
        const Layout& layout = ovrin::detail::layout_of(view.format);
        size_t next = 0;
        for (int32_t i = 0; i < layout.planes; ++i) {
            const ovrin::Size size =
                ovrin::detail::plane_size(layout.plane[i], view.width, view.height);
            const auto sample = static_cast<size_t>(layout.plane[i].sample);
            for (int32_t row = 0; row < size.height; ++row) {
                for (int32_t column = 0; column < size.width; ++column) {
                    visit(view.one_buffer ? 0 : static_cast<size_t>(i), next,
                          view.one_buffer ? next : place(i, row, column), sample);
                    next += sample;
                }
            }
        }
    }
};

size_t Picture::place(int32_t plane, int64_t row, int64_t column) const {
    const ovrin::Plane& p = view.planes[plane];
    return static_cast<size_t>(row * p.row_stride + column * p.pixel_stride);
}

void Picture::add_plane(Input& in, Pixels& pixels, int32_t number) {
    const auto& layout = ovrin::detail::layout_of(view.format).plane[number];
    const ovrin::Size size = ovrin::detail::plane_size(layout, view.width, view.height);
    const bool packed_pixels = view.format == Format::kRgba8888 || view.format == Format::kRgb888;
    const int32_t pixel = layout.sample + (packed_pixels ? 0 : in.pick({0, 0, 0, 1, 2}));
    const int32_t row = size.width * pixel + in.pick({0, 0, 0, 1, 3, 16});
    const auto bytes =
        static_cast<size_t>((size.height - 1) * row + (size.width - 1) * pixel + layout.sample);
    buffers.emplace_back(bytes, flush(in));
    pixels.fill(buffers.back().data(), bytes);
    view.planes[number] = {buffers.back().data(), bytes, row, pixel};
}

Picture::Picture(Input& in, Pixels& pixels, Format format, int32_t w, int32_t h) {
    const Layout& layout = ovrin::detail::layout_of(format);
    view.format = format;
    view.width = w;
    view.height = h;
    view.one_buffer = layout.planes > 1 && in.flag();
    packed.resize(ovrin::picture_bytes(format, w, h));
    if (view.one_buffer) {
        buffers.emplace_back(packed.size(), flush(in));
        pixels.fill(buffers[0].data(), packed.size());
        view.planes[0] = {buffers[0].data(), packed.size()};
    } else {
        for (int32_t i = 0; i < layout.planes; ++i) add_plane(in, pixels, i);
    }
    for (Buffer& buffer : buffers) buffer.keep();
    for_each_sample([&](size_t plane, size_t to, size_t from, size_t sample) {
        memcpy(packed.data() + to, buffers[plane].data() + from, sample);
    });
}

std::vector<std::vector<uint8_t>> Picture::with_samples(const std::vector<uint8_t>& samples) const {
    std::vector<std::vector<uint8_t>> result;
    for (const Buffer& buffer : buffers)
        result.emplace_back(buffer.data(), buffer.data() + buffer.size());
    for_each_sample([&](size_t plane, size_t from, size_t to, size_t sample) {
        memcpy(result[plane].data() + to, samples.data() + from, sample);
    });
    return result;
}

// Behind a source the bilinear engine reads a little more: in the layer's copies the last row
// again.
std::vector<uint8_t> with_last_row_again(const Picture& picture) {
    const Layout& layout = ovrin::detail::layout_of(picture.view.format);
    const auto& last = layout.plane[layout.planes - 1];
    const auto row = static_cast<size_t>(
        ovrin::detail::plane_size(last, picture.view.width, 1).width * last.sample);
    std::vector<uint8_t> bytes = picture.packed;
    const size_t end = bytes.size() + 8 * static_cast<size_t>(picture.view.width) + 64;
    while (bytes.size() < end) bytes.push_back(bytes[bytes.size() - row]);
    return bytes;
}

void resize_planes(const uint8_t* src, uint8_t* dst, Format format, const Sizes& s) {
    const Layout& layout = ovrin::detail::layout_of(format);
    for (int32_t i = 0; i < layout.planes; ++i) {
        const auto& plane = layout.plane[i];
        const ovrin::Size from = ovrin::detail::plane_size(plane, s.src_w, s.src_h);
        const ovrin::Size to = ovrin::detail::plane_size(plane, s.dst_w, s.dst_h);
        ov_lanczos(src, from.width, from.height, dst, to.width, to.height, plane.sample);
        src += static_cast<ptrdiff_t>(from.width) * from.height * plane.sample;
        dst += static_cast<ptrdiff_t>(to.width) * to.height * plane.sample;
    }
}

void resize_by_quarters(const uint8_t* src, uint8_t* dst, uint32_t* words, Format format,
                        const Sizes& s) {
    if (format == Format::kRgba8888) {
        ovrin_resize_rgba8888_sg(src, words, s.src_w, s.src_h, s.dst_w, s.dst_h);
    } else if (format == Format::kRgb888) {
        ovrin_resize_rgb888(src, dst, s.src_w, s.src_h, s.dst_w, s.dst_h);
    } else if (format == Format::kI420) {
        ovrin_resize_yuv420_sg(src, dst, s.src_w, s.src_h, s.dst_w, s.dst_h);
    } else {
        ovrin_resize_nv21_sg(src, dst, s.src_w, s.src_h, s.dst_w, s.dst_h);
    }
}

// The C function's result; what it leaves alone stays as it was.
std::vector<uint8_t> definition(const Picture& src, const Picture& dst, Filter filter,
                                const Sizes& s) {
    const Format format = src.view.format;
    const std::vector<uint8_t> from = with_last_row_again(src);
    std::vector<uint32_t> from_words(from.size() / 4 + 1), words(dst.packed.size() / 4 + 1);
    memcpy(from_words.data(), from.data(), from.size());
    memcpy(words.data(), dst.packed.data(), dst.packed.size());
    auto* to = reinterpret_cast<uint8_t*>(words.data());
    const int32_t code = format == Format::kRgba8888 ? OVRIN_FORMAT_PIXELS
                         : format == Format::kI420   ? OVRIN_FORMAT_PLANAR
                                                     : OVRIN_FORMAT_SEMI_PLANAR;
    if (filter == Filter::kQuarter) {
        resize_by_quarters(from.data(), to, words.data(), format, s);
    } else if (filter == Filter::kNearest) {
        ovrin_resize_nearest_rgba8888(from_words.data(), words.data(), s.src_w, s.src_h, s.dst_w,
                                      s.dst_h);
    } else if (filter == Filter::kLanczos) {
        resize_planes(from.data(), to, format, s);
    } else {
        (filter == Filter::kBilinear ? ov_bilinear_sg
         : filter == Filter::kBilinearBands
             ? ov_bilinear
             : ov_bilinear_ex)(from.data(), to, s.src_w, s.src_h, s.dst_w, s.dst_h, code, nullptr);
    }
    return {to, to + dst.packed.size()};
}

bool supports(Filter filter, Format format) {
    if (filter == Filter::kNearest) return format == Format::kRgba8888;
    return !ovrin::detail::is_bilinear(filter) || format != Format::kRgb888;
}

void spoil(Input& in, ovrin::View& view, Fault fault) {
    ovrin::Plane& plane =
        view.planes[view.one_buffer ? 0 : in.byte() % ovrin::detail::layout_of(view.format).planes];
    if (fault == Fault::kShort) plane.bytes -= 1 + in.byte() % plane.bytes;
    if (fault == Fault::kNull) plane.data = nullptr;
    if (fault == Fault::kEmpty) (in.flag() ? view.width : view.height) = in.nothing();
    if (fault == Fault::kOtherFormat) view.format = static_cast<Format>(in.pick({-1, 4, 77}));
}

}  // namespace

int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    begin_run();
    Input in(data, size);
    const auto format = static_cast<Format>(in.byte() % 4);
    const auto filter = static_cast<Filter>(in.byte() % 6);
    const auto threads = static_cast<ovrin::Threads>(in.byte() % 3);
    const uint8_t chance = in.byte();
    const Fault fault = chance < 192 ? Fault::kNone : static_cast<Fault>(1 + chance % 4);
    const Sizes s = short_sizes(in);
    const ovrin::NamedKernels& set = all_sets().sets[in.byte() % all_sets().count];
    ovrin::force_kernels(*set.kernels);
    Pixels pixels(in);
    Picture src(in, pixels, format, s.src_w, s.src_h);
    Picture dst(in, pixels, format, s.dst_w, s.dst_h);
    const bool wanted = fault == Fault::kNone && supports(filter, format);
    const std::vector<uint8_t> samples = wanted ? definition(src, dst, filter, s) : dst.packed;
    const std::vector<std::vector<uint8_t>> expected = dst.with_samples(samples);

    ovrin::View from = src.view;
    ovrin::View to = dst.view;
    spoil(in, in.flag() ? from : to, fault);
    const ovrin::Status status = ovrin::resize(from, to, filter, threads);

    require(status.ok() == wanted, wanted ? status.text : "the layer takes what it should not",
            set.name);
    require(status.ok() == (status.text[0] == '\0'), "a status without its sentence", set.name);
    for (size_t i = 0; i < dst.buffers.size(); ++i)
        dst.buffers[i].check(expected[i].data(), set.name);
    for (const Buffer& buffer : src.buffers) buffer.check_unchanged(set.name);
    return 0;
}
