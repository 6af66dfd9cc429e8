// SPDX-License-Identifier: Apache-2.0
#include "info.h"

#include <iostream>
#include <memory>
#include <sstream>

#include "error.h"
#include "json.h"
#include "message.h"
#include "source.h"

namespace tool {

namespace {

struct Info {
    std::string file;
    FileKind kind;
    Size stored;
    Orientation orientation;
    Metadata metadata;
    std::string channels;
    int64_t frames = 0;

    Size upright() const { return turned(stored, orientation); }
};

const char* name_of(Container container) {
    // In the order of the enumeration.
    constexpr const char* kNames[] = {"PNG", "JPEG", "PNM", "PPM", "PGM", "PAM", "Y4M", "raw"};
    static_assert(sizeof kNames / sizeof *kNames == static_cast<size_t>(Container::kRaw) + 1);
    return kNames[static_cast<size_t>(container)];
}

// Those that differ from pixel to pixel: image files are read as RGBA, whatever they hold.
std::string channels_of(const Picture& frame, FileKind kind) {
    if (!is_image_file(kind)) return name_of(frame.format);
    if (frame.is_gray) return frame.has_alpha ? "gray and alpha" : "gray";
    return frame.has_alpha ? "rgba" : "rgb";
}

Info look_at(const std::string& file, const std::optional<RawLayout>& raw) {
    const auto source = open_source(file, raw);
    Info info = {file, source->kind(), source->size(), orientation_of(source->metadata()), {}, "",
                 0};
    Picture frame;
    for (; source->next(&frame); ++info.frames) info.channels = channels_of(frame, info.kind);
    if (info.frames == 0) throw Error("holds no frame");
    info.metadata = source->metadata();  // now that it knows of damage
    return info;
}

std::string in_words(const Info& info) {
    const Metadata& metadata = info.metadata;
    std::ostringstream words;
    words << info.file << ": " << name_of(info.kind.container) << ", " << to_string(info.upright())
          << ", " << info.channels;
    if (info.frames > 1) words << ", " << info.frames << " frames";
    if (info.orientation != Orientation::kUpright) {
        words << ", stored as " << to_string(info.stored) << " with orientation "
              << static_cast<int>(info.orientation);
    }
    if (metadata.srgb_intent) words << ", sRGB";
    if (!metadata.icc.empty()) words << ", profile of " << metadata.icc.size() << " bytes";
    if (!metadata.exif.empty()) words << ", EXIF";
    if (metadata.density) {
        words << ", " << metadata.density->x << ":" << metadata.density->y
              << (metadata.density->is_absolute ? " pixels per metre" : " pixels per unit");
    }
    if (!metadata.damage.empty()) words << ", damaged: " << metadata.damage;
    words << "\n";
    return words.str();
}

Json json_of(const std::optional<Density>& density) {
    if (!density) return nullptr;
    return {{"x", density->x}, {"y", density->y}, {"per_metre", density->is_absolute}};
}

std::string as_json(const Info& info) {
    const Metadata& metadata = info.metadata;
    return json_line({
        {"file", info.file},
        {"type", name_of(info.kind.container)},
        {"size", json_of(info.upright())},
        {"stored", json_of(info.stored)},
        {"orientation", static_cast<int>(info.orientation)},
        {"channels", info.channels},
        {"frames", info.frames},
        {"srgb", metadata.srgb_intent.has_value()},
        {"profile_bytes", metadata.icc.size()},
        {"exif_bytes", metadata.exif.size()},
        {"density", json_of(metadata.density)},
        {"damage", metadata.damage},
    });
}

}  // namespace

bool say_what_files_are(const Options& options) {
    const std::optional<RawLayout> raw = raw_layout(options);
    bool all_are_read = true;
    for (const std::string& file : options.files) {
        try {
            const Info info = concerning(file, [&] { return look_at(file, raw); });
            std::cout << (options.json ? as_json(info) : in_words(info));
        } catch (const Error& error) {
            say(error.what());
            all_are_read = false;
        }
    }
    return all_are_read;
}

}  // namespace tool
