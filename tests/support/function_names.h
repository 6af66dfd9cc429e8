// SPDX-License-Identifier: Apache-2.0
// Names of functions by address, also of those with internal linkage: from the running program's
// own table of symbols.
#pragma once

#include <cxxabi.h>
#include <elf.h>
#include <link.h>

#include <cstdint>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace ovrin_test {

class FunctionNames {
public:
    FunctionNames() {
        std::ifstream file("/proc/self/exe", std::ios::binary);
        image_.assign(std::istreambuf_iterator<char>(file), {});
        const auto* header = at<Elf64_Ehdr>(0);
        const auto* sections = at<Elf64_Shdr>(header->e_shoff);
        for (int i = 0; i < header->e_shnum; ++i) {
            if (sections[i].sh_type == SHT_SYMTAB) {
                read_symbols(sections[i], sections[sections[i].sh_link].sh_offset);
            }
        }
    }

    // "file.cpp name<arguments>", without namespaces and parameters; a function with external
    // linkage has no file.
    template <class Result, class... Parameters>
    std::string of(Result (*function)(Parameters...)) const {
        const auto found = names_.find(reinterpret_cast<uintptr_t>(function));
        return found == names_.end() ? "unknown" : found->second;
    }

private:
    template <class T>
    const T* at(uint64_t offset) const {
        return reinterpret_cast<const T*>(image_.data() + offset);
    }

    // Local symbols follow the name of their file.
    void read_symbols(const Elf64_Shdr& table, uint64_t strings) {
        std::string file;
        const auto* symbols = at<Elf64_Sym>(table.sh_offset);
        for (uint64_t i = 0; i < table.sh_size / sizeof(Elf64_Sym); ++i) {
            const char* name = at<char>(strings + symbols[i].st_name);
            const auto type = ELF64_ST_TYPE(symbols[i].st_info);
            const bool local = ELF64_ST_BIND(symbols[i].st_info) == STB_LOCAL;
            if (type == STT_FILE) file = std::string(name) + ' ';
            if (type == STT_FUNC) {
                names_[load_address() + symbols[i].st_value] = (local ? file : "") + plain(name);
            }
        }
    }

    static uintptr_t load_address() {
        uintptr_t address = 0;
        dl_iterate_phdr(
            [](dl_phdr_info* info, size_t, void* result) {
                *static_cast<uintptr_t*>(result) = info->dlpi_addr;
                return 1;  // the program is the first of the loaded objects
            },
            &address);
        return address;
    }

    static std::string plain(const char* symbol) {
        int status = 0;
        const std::unique_ptr<char, void (*)(void*)> demangled(
            abi::__cxa_demangle(symbol, nullptr, nullptr, &status), std::free);
        std::string name = demangled != nullptr ? demangled.get() : symbol;
        for (const char* noise : {"(anonymous namespace)::", "ovrin::", "void "}) {
            const std::string text = noise;
            for (size_t i; (i = name.find(text)) != std::string::npos;) name.erase(i, text.size());
        }
        // Template arguments may have parentheses too.
        size_t end = 0;
        for (int depth = 0; end < name.size() && (depth > 0 || name[end] != '('); ++end) {
            depth += name[end] == '<' ? 1 : name[end] == '>' ? -1 : 0;
        }
        return name.substr(0, end);
    }

    std::vector<char> image_;
    std::map<uintptr_t, std::string> names_;
};

}  // namespace ovrin_test
