// SPDX-License-Identifier: Apache-2.0
#include "template.h"

#include <algorithm>
#include <filesystem>
#include <map>

#include "error.h"
#include "file_kind.h"

namespace tool {

namespace {

namespace fs = std::filesystem;

bool has_image_name(const fs::path& path) {
    try {
        return is_image_file(kind_of_name(path));
    } catch (const Error&) {
        return false;
    }
}

// In the order of their names, so that runs are alike.
std::vector<fs::path> images_below(const fs::path& folder) {
    std::vector<fs::path> images;
    try {
        for (const fs::directory_entry& entry : fs::recursive_directory_iterator(folder)) {
            if (entry.is_regular_file() && has_image_name(entry.path()))
                images.push_back(entry.path());
        }
    } catch (const fs::filesystem_error& error) {
        throw Error(folder.string() + ": " + error.code().message());
    }
    std::sort(images.begin(), images.end());
    return images;
}

}  // namespace

std::string filled_template(const std::string& text, const std::string& name) {
    std::string filled;
    for (size_t i = 0; i < text.size(); ++i) {
        if (text[i] != '%') {
            filled += text[i];
            continue;
        }
        const char next = ++i < text.size() ? text[i] : '\0';
        if (next != 's' && next != '%')
            throw Error("'" + text + "': after % comes s, or another %");
        filled += next == 's' ? name : "%";
    }
    return filled;
}

std::vector<InAndOut> in_and_out(const std::vector<std::string>& inputs, const std::string& text,
                                 bool is_recursive) {
    std::vector<InAndOut> files;
    for (const std::string& input : inputs) {
        std::error_code ignored;  // opening the file will tell
        if (!fs::is_directory(input, ignored)) {
            files.push_back({input, filled_template(text, fs::path(input).stem())});
            continue;
        }
        if (!is_recursive) throw Error(input + ": is a folder; --recursive takes what lies in it");
        for (const fs::path& image : images_below(input)) {
            const fs::path below = image.lexically_relative(input);
            files.push_back({image, filled_template(text, below.parent_path() / below.stem())});
        }
    }
    std::map<std::string, std::string> owners;
    for (const InAndOut& file : files) {
        const auto [owner, is_new] = owners.emplace(file.out, file.in);
        if (!is_new) {
            throw Error(file.out + " would be the result of " + owner->second + " and of " +
                        file.in);
        }
    }
    return files;
}

}  // namespace tool
