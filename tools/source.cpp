// SPDX-License-Identifier: Apache-2.0
#include "source.h"

#include <algorithm>
#include <utility>

#include "alpha.h"
#include "codecs.h"
#include "error.h"

namespace tool {

namespace {

constexpr char kY4mMagic[] = "YUV4MPEG2 ";
constexpr size_t kY4mMagicBytes = sizeof(kY4mMagic) - 1;
constexpr size_t kPeekBytes = 16;

// An image file: one picture.
class Still : public Source {
public:
    using Decode = std::function<Picture(const uint8_t*, size_t, Metadata*)>;

    Still(Input input, Container container, const Decode& decode)
        : Source(std::move(input), {container, PixelFormat::kRgba}) {
        const std::vector<uint8_t> file = input_.read_all();
        picture_ = decode(file.data(), file.size(), &metadata_);
        picture_->has_alpha = picture_->has_alpha && !is_opaque(*picture_);
        size_ = picture_->size;
    }

    bool next(Picture* frame) override {
        if (!picture_) return false;
        *frame = std::move(*picture_);
        picture_.reset();
        return true;
    }

private:
    std::optional<Picture> picture_;
};

class Jpeg : public Source {
public:
    Jpeg(Input input, Listener listener)
        : Source(std::move(input), {Container::kJpeg, PixelFormat::kRgba}),
          reader_(std::make_unique<JpegReader>(input_.read_all())),
          listener_(std::move(listener)) {
        size_ = reader_->size();
        metadata_ = reader_->metadata();
    }

    std::optional<PixelFormat> planes(int32_t reduction) const override {
        return reader_->planes(reduction);
    }
    bool is_reducible() const override { return true; }
    void decode_as(const Decoding& decoding) override { decoding_ = decoding; }

    bool next(Picture* frame) override {
        if (reader_ == nullptr) return false;
        *frame = reader_->read(decoding_, listener_);
        metadata_.damage = reader_->metadata().damage;
        reader_.reset();
        return true;
    }

private:
    std::unique_ptr<JpegReader> reader_;
    Listener listener_;
    Decoding decoding_;
};

class Raw : public Source {
public:
    Raw(Input input, const RawLayout& layout)
        : Source(std::move(input), {Container::kRaw, layout.format}) {
        size_ = checked_size(layout.size.width, layout.size.height);
    }

    bool next(Picture* frame) override {
        if (frame->words.empty()) *frame = Picture(size_, kind_.format);
        return read_frame(frame->bytes(), frame->byte_count());
    }
};

// Samples of more than 8 bits, rounded to 8. Two bytes each, little end first; what exceeds the
// bits counts as white.
void reduce(const Bytes& samples, int bits, uint8_t* to) {
    const int shift = bits - 8;
    for (size_t i = 0; i < samples.size(); i += 2) {
        const int value = samples[i] | samples[i + 1] << 8;
        *to++ = static_cast<uint8_t>(std::min((value + (1 << shift >> 1)) >> shift, 255));
    }
}

class Y4m : public Source {
public:
    explicit Y4m(Input input) : Source(std::move(input), {Container::kY4m, PixelFormat::kI420}) {
        std::string line;
        if (!input_.read_line(&line, kMaxY4mLine)) throw Error("damaged Y4M: bad header");
        y4m_header_ = parse_y4m_header(line);
        size_ = y4m_header_->size;
        kind_.format = y4m_header_->format;
        if (y4m_header_->bits > 8) {
            remark_ = "samples of " + std::to_string(y4m_header_->bits) + " bits are rounded to 8";
        }
    }

    bool next(Picture* frame) override {
        std::string line;
        const bool is_whole = input_.read_line(&line, kMaxY4mLine);
        if (!is_whole && line.empty()) return false;
        if (!is_whole || line.compare(0, 5, "FRAME") != 0) {
            throw Error("damaged Y4M: a frame was expected");
        }
        if (frame->words.empty()) *frame = Picture(size_, kind_.format);
        if (!read_samples(frame)) throw Error("damaged Y4M: the last frame is empty");
        return true;
    }

private:
    bool read_samples(Picture* frame) {
        const size_t count = frame->byte_count();
        if (y4m_header_->bits == 8) return read_frame(frame->bytes(), count);
        deep_.resize(2 * count);
        if (!read_frame(deep_.data(), deep_.size())) return false;
        reduce(deep_, y4m_header_->bits, frame->bytes());
        return true;
    }

    Bytes deep_;  // samples of more than 8 bits
};

}  // namespace

bool Source::read_frame(uint8_t* to, size_t bytes) {
    const size_t got = input_.read(to, bytes);
    if (got == 0) return false;
    ++frames_read_;
    if (got < bytes) {
        throw Error("frame " + std::to_string(frames_read_) + " is cut short: " +
                    std::to_string(got) + " of " + std::to_string(bytes) + " bytes");
    }
    return true;
}

std::unique_ptr<Source> open_source(const std::string& path, const std::optional<RawLayout>& raw,
                                    const Listener& listener) {
    Input input(path);
    if (raw) return std::make_unique<Raw>(std::move(input), *raw);

    const std::vector<uint8_t> head = input.peek(kPeekBytes);
    const auto is = [&head](auto recognise) { return recognise(head.data(), head.size()); };
    if (is(is_png)) {
        const auto decode = [&](const uint8_t* data, size_t size, Metadata* metadata) {
            return decode_png(data, size, metadata, listener);
        };
        return std::make_unique<Still>(std::move(input), Container::kPng, decode);
    }
    if (is(is_jpeg)) return std::make_unique<Jpeg>(std::move(input), listener);
    if (is(is_pnm)) {
        const Container container = head[1] == '7' ? Container::kPam : Container::kPnm;
        return std::make_unique<Still>(std::move(input), container, decode_pnm);
    }
    if (std::string(head.begin(), head.end()).compare(0, kY4mMagicBytes, kY4mMagic) == 0) {
        return std::make_unique<Y4m>(std::move(input));
    }
    throw Error("neither PNG, JPEG, PNM, PAM nor Y4M; raw frames need --format");
}

}  // namespace tool
