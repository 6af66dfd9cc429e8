// SPDX-License-Identifier: Apache-2.0
#include "image.h"

#include <fcntl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>

namespace loader {

namespace {

int protection(uint32_t flags) {
    return ((flags & PF_R) != 0 ? PROT_READ : 0) | ((flags & PF_W) != 0 ? PROT_WRITE : 0) |
           ((flags & PF_X) != 0 ? PROT_EXEC : 0);
}

// The hash function of DT_HASH.
uint32_t hash_of(const char* name) {
    uint32_t hash = 0;
    for (; *name != '\0'; ++name) {
        hash = (hash << 4) + static_cast<uint8_t>(*name);
        hash ^= (hash >> 24) & 0xF0;
        hash &= 0x0FFFFFFF;
    }
    return hash;
}

}  // namespace

bool Image::load(const char* path, size_t page_size, FindImport* find_import) {
    page_size_ = page_size;
    const int file = open(path, O_RDONLY | O_CLOEXEC);
    if (file < 0) return refuse("cannot be opened");
    const bool mapped = read_headers(file) && check_segments() && reserve() && map_segments(file);
    close(file);
    return mapped && read_dynamic() &&
           relocate(dynamic_[DT_RELA], dynamic_[DT_RELASZ], find_import) &&
           relocate(dynamic_[DT_JMPREL], dynamic_[DT_PLTRELSZ], find_import) && protect_relro();
}

bool Image::refuse(const std::string& why) {
    refusal_ = why;
    return false;
}

bool Image::read_headers(int file) {
    Elf64_Ehdr header;
    if (pread(file, &header, sizeof header, 0) != sizeof header ||
        memcmp(header.e_ident, ELFMAG, SELFMAG) != 0 || header.e_type != ET_DYN ||
        header.e_machine != EM_AARCH64 || header.e_phentsize != sizeof(Elf64_Phdr)) {
        return refuse("is no shared object for 64-bit Arm");
    }
    headers_.resize(header.e_phnum);
    const size_t bytes = headers_.size() * sizeof(Elf64_Phdr);
    if (pread(file, headers_.data(), bytes, static_cast<off_t>(header.e_phoff)) !=
        static_cast<ssize_t>(bytes)) {
        return refuse("has no program headers");
    }
    return true;
}

bool Image::check_segments() {
    for (const Elf64_Phdr& segment : headers_) {
        if (segment.p_type != PT_LOAD) continue;
        if (segment.p_align < page_size_) {
            return refuse("program alignment (" + std::to_string(segment.p_align) +
                          ") cannot be smaller than system page size (" +
                          std::to_string(page_size_) + ")");
        }
        if ((segment.p_vaddr - segment.p_offset) % page_size_ != 0) {
            return refuse("a segment cannot be mapped where it should lie");
        }
        if ((segment.p_flags & PF_W) != 0 && (segment.p_flags & PF_X) != 0) {
            return refuse("a segment is writable and executable");
        }
    }
    return true;
}

// Takes the room for all segments, inaccessible until they are mapped.
bool Image::reserve() {
    uint64_t first = UINT64_MAX;
    uint64_t last = 0;
    for (const Elf64_Phdr& segment : headers_) {
        if (segment.p_type != PT_LOAD) continue;
        first = std::min(first, page_start(segment.p_vaddr));
        last = std::max(last, page_end(segment.p_vaddr + segment.p_memsz));
    }
    if (first >= last) return refuse("has nothing to load");
    void* room = mmap(nullptr, last - first, PROT_NONE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
    if (room == MAP_FAILED) return refuse("does not fit into memory");
    base_ = static_cast<uint8_t*>(room) - first;
    return true;
}

bool Image::map_segments(int file) {
    for (const Elf64_Phdr& segment : headers_) {
        if (segment.p_type == PT_LOAD && !map_segment(file, segment)) {
            return refuse("a segment cannot be mapped");
        }
    }
    return true;
}

bool Image::map_segment(int file, const Elf64_Phdr& segment) {
    const int rights = protection(segment.p_flags);
    const uint64_t start = page_start(segment.p_vaddr);
    const uint64_t file_end = segment.p_vaddr + segment.p_filesz;
    const uint64_t end = segment.p_vaddr + segment.p_memsz;
    if (file_end > start && mmap(at(start), file_end - start, rights, MAP_PRIVATE | MAP_FIXED, file,
                                 static_cast<off_t>(page_start(segment.p_offset))) == MAP_FAILED) {
        return false;
    }
    // The file goes on behind the segment, but memory holds zeros there.
    const uint64_t mapped_end = page_end(file_end);
    if ((segment.p_flags & PF_W) != 0) memset(at(file_end), 0, mapped_end - file_end);
    return page_end(end) <= mapped_end ||
           mmap(at(mapped_end), page_end(end) - mapped_end, rights,
                MAP_PRIVATE | MAP_ANONYMOUS | MAP_FIXED, -1, 0) != MAP_FAILED;
}

bool Image::read_dynamic() {
    const Elf64_Dyn* entry = nullptr;
    for (const Elf64_Phdr& segment : headers_) {
        if (segment.p_type == PT_DYNAMIC) {
            entry = reinterpret_cast<const Elf64_Dyn*>(at(segment.p_vaddr));
        }
    }
    if (entry == nullptr) return refuse("has no dynamic section");
    for (; entry->d_tag != DT_NULL; ++entry) {
        if (entry->d_tag < DT_NUM) dynamic_[entry->d_tag] = entry->d_un.d_val;
    }
    if (dynamic_[DT_SYMTAB] == 0 || dynamic_[DT_STRTAB] == 0 || dynamic_[DT_HASH] == 0) {
        return refuse("has no symbols, or no table to find them");
    }
    if (dynamic_[DT_TEXTREL] != 0 || (dynamic_[DT_FLAGS] & DF_TEXTREL) != 0) {
        return refuse("has text relocations");
    }
    if (dynamic_[DT_INIT] != 0 || dynamic_[DT_INIT_ARRAYSZ] != 0) {
        return refuse("runs code when it is loaded");
    }
    symbols_ = reinterpret_cast<const Elf64_Sym*>(at(dynamic_[DT_SYMTAB]));
    strings_ = reinterpret_cast<const char*>(at(dynamic_[DT_STRTAB]));
    hash_ = reinterpret_cast<const uint32_t*>(at(dynamic_[DT_HASH]));
    return true;
}

void* Image::find(const char* name) const {
    const uint32_t buckets = hash_[0];
    const uint32_t* first = hash_ + 2;
    const uint32_t* next = first + buckets;
    for (uint32_t i = first[hash_of(name) % buckets]; i != STN_UNDEF; i = next[i]) {
        const Elf64_Sym& symbol = symbols_[i];
        if (symbol.st_shndx != SHN_UNDEF && strcmp(strings_ + symbol.st_name, name) == 0) {
            return at(symbol.st_value);
        }
    }
    return nullptr;
}

bool Image::relocate(uint64_t table, uint64_t bytes, FindImport* find_import) {
    const auto* relocation = reinterpret_cast<const Elf64_Rela*>(at(table));
    for (uint64_t i = 0; i < bytes / sizeof *relocation; ++i) {
        if (!relocate_one(relocation[i], find_import)) return false;
    }
    return true;
}

bool Image::relocate_one(const Elf64_Rela& relocation, FindImport* find_import) {
    const auto type = ELF64_R_TYPE(relocation.r_info);
    const auto symbol = static_cast<uint32_t>(ELF64_R_SYM(relocation.r_info));
    const auto addend = static_cast<uint64_t>(relocation.r_addend);
    uint64_t address = reinterpret_cast<uint64_t>(base_);
    if (type == R_AARCH64_ABS64 || type == R_AARCH64_GLOB_DAT || type == R_AARCH64_JUMP_SLOT) {
        if (!resolve(symbol, find_import, address)) return false;
    } else if (type != R_AARCH64_RELATIVE) {
        return refuse("has a relocation of type " + std::to_string(type));
    }
    address += addend;
    memcpy(at(relocation.r_offset), &address, sizeof address);
    return true;
}

bool Image::resolve(uint32_t index, FindImport* find_import, uint64_t& address) {
    const Elf64_Sym& symbol = symbols_[index];
    if (symbol.st_shndx != SHN_UNDEF) {
        address = reinterpret_cast<uint64_t>(at(symbol.st_value));
        return true;
    }
    const char* name = strings_ + symbol.st_name;
    address = reinterpret_cast<uint64_t>(find_import(name));
    return address != 0 || refuse(std::string("cannot locate symbol ") + name);
}

// In whole pages, as Android does it.
bool Image::protect_relro() {
    for (const Elf64_Phdr& segment : headers_) {
        if (segment.p_type != PT_GNU_RELRO) continue;
        const uint64_t start = page_start(segment.p_vaddr);
        const uint64_t end = page_end(segment.p_vaddr + segment.p_memsz);
        if (mprotect(at(start), end - start, PROT_READ) != 0) {
            return refuse("RELRO cannot be made read-only");
        }
    }
    return true;
}

}  // namespace loader
