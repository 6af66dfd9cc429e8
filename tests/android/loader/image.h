// SPDX-License-Identifier: Apache-2.0
// Loads a shared object for Android on 64-bit Arm into a program for Linux, in the way of Android's
// own loader: the same pages, rights and refusals, but with imports from a table.
#pragma once

#include <elf.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

namespace loader {

// The address of an import, or null.
using FindImport = void*(const char* name);

class Image {
public:
    // Returns whether the file was loaded; if not, refusal() says why.
    bool load(const char* path, size_t page_size, FindImport* find_import);

    const std::string& refusal() const { return refusal_; }

    // The address of an export, or null.
    void* find(const char* name) const;

private:
    bool read_headers(int file);
    bool check_segments();
    bool reserve();
    bool map_segments(int file);
    bool map_segment(int file, const Elf64_Phdr& segment);
    bool read_dynamic();
    bool relocate(uint64_t table, uint64_t bytes, FindImport* find_import);
    bool relocate_one(const Elf64_Rela& relocation, FindImport* find_import);
    bool resolve(uint32_t symbol, FindImport* find_import, uint64_t& address);
    bool protect_relro();

    bool refuse(const std::string& why);
    uint8_t* at(uint64_t address) const { return base_ + address; }
    uint64_t page_start(uint64_t address) const { return address / page_size_ * page_size_; }
    uint64_t page_end(uint64_t address) const { return page_start(address + page_size_ - 1); }

    std::string refusal_;
    size_t page_size_ = 0;
    std::vector<Elf64_Phdr> headers_;
    uint8_t* base_ = nullptr;  // where address 0 of the file lies
    uint64_t dynamic_[DT_NUM] = {};
    const Elf64_Sym* symbols_ = nullptr;
    const char* strings_ = nullptr;
    const uint32_t* hash_ = nullptr;
};

}  // namespace loader
