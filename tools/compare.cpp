// SPDX-License-Identifier: Apache-2.0
#include "compare.h"

#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <iomanip>
#include <iostream>
#include <memory>
#include <sstream>

#include "convert.h"
#include "error.h"
#include "json.h"
#include "source.h"

namespace tool {

namespace {

struct Difference {
    int largest = 0;
    uint64_t squares = 0;  // their sum
    uint64_t samples = 0;
    int64_t frames = 0;

    void add(const uint8_t* a, const uint8_t* b, size_t count) {
        for (size_t i = 0; i < count; ++i) {
            const int apart = abs(a[i] - b[i]);
            largest = std::max(largest, apart);
            squares += static_cast<uint64_t>(apart * apart);
        }
        samples += count;
    }

    // Infinite where nothing differs.
    double psnr() const {
        constexpr double kWhite = 255;
        return 10 * std::log10(kWhite * kWhite * static_cast<double>(samples) /
                               static_cast<double>(squares));
    }
};

// The pictures of a file, as people see them.
class Pictures {
public:
    Pictures(const Options& options, size_t number)
        : name_(options.files[number]),
          source_(concerning(name_, [&] { return open_source(name_, raw_layout(options)); })),
          orientation_(options.rotate ? orientation_of(source_->metadata())
                                      : Orientation::kUpright) {}

    const std::string& name() const { return name_; }
    Size size() const { return turned(source_->size(), orientation_); }
    bool next(Picture* picture) {
        if (!concerning(name_, [&] { return source_->next(picture); })) return false;
        if (orientation_ != Orientation::kUpright) *picture = turned(*picture, orientation_);
        return true;
    }

private:
    std::string name_;
    std::unique_ptr<Source> source_;
    Orientation orientation_;
};

// In the format that both have, or in one that both can be converted to.
void add(const Picture& a, const Picture& b, Difference* difference) {
    ++difference->frames;
    const bool are_rgba = a.format == PixelFormat::kRgba && b.format == PixelFormat::kRgba;
    if (a.format == b.format && !are_rgba) {
        return difference->add(a.bytes(), b.bytes(), a.byte_count());
    }
    const bool has_alpha = a.has_alpha || b.has_alpha;
    const PixelFormat common = has_alpha ? PixelFormat::kRgba : PixelFormat::kRgb;
    const Picture of_a = converted(a, common);
    const Picture of_b = converted(b, common);
    difference->add(of_a.bytes(), of_b.bytes(), of_a.byte_count());
}

Difference difference_of(Pictures* a, Pictures* b) {
    Difference difference;
    Picture picture_a;
    Picture picture_b;
    for (;;) {
        const bool has_a = a->next(&picture_a);
        const bool has_b = b->next(&picture_b);
        if (has_a != has_b) {
            throw Error((has_a ? b : a)->name() + ": ends after " +
                        std::to_string(difference.frames) + " frames, the other does not");
        }
        if (!has_a) return difference;
        add(picture_a, picture_b, &difference);
    }
}

std::string in_words(const Difference& difference) {
    std::ostringstream words;
    words << "largest difference " << difference.largest;
    if (difference.largest > 0) {
        words << ", PSNR " << std::fixed << std::setprecision(2) << difference.psnr() << " dB";
    }
    if (difference.frames > 1) words << ", " << difference.frames << " frames";
    words << "\n";
    return words.str();
}

std::string as_json(const Options& options, Size size, const Difference& difference) {
    const Json psnr = difference.largest > 0 ? Json(difference.psnr()) : Json(nullptr);
    return json_line({
        {"a", options.files[0]},
        {"b", options.files[1]},
        {"size", json_of(size)},
        {"frames", difference.frames},
        {"largest_difference", difference.largest},
        {"psnr_db", psnr},
        {"equal", difference.largest <= options.largest_difference},
    });
}

}  // namespace

bool compare(const Options& options) {
    Pictures a(options, 0);
    Pictures b(options, 1);
    const Size size = a.size();
    if (size.width != b.size().width || size.height != b.size().height) {
        throw Error(a.name() + " is " + to_string(size) + ", " + b.name() + " is " +
                    to_string(b.size()));
    }
    const Difference difference = difference_of(&a, &b);
    if (difference.frames == 0) throw Error(a.name() + ": holds no frame");
    if (options.json) {
        std::cout << as_json(options, size, difference);
    } else if (!options.quiet) {
        std::cout << in_words(difference);
    }
    return difference.largest <= options.largest_difference;
}

}  // namespace tool
