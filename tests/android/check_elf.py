#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""check_elf.py LIBRARY IMPORTS DECLARED: what Android's loader and packaging ask of a library.

IMPORTS lists the names that may be imported, each with the library that has it; these are the libraries
that must be needed. DECLARED lists the names that must be exported. Says for each rule whether it
holds; ends with 1 if one does not."""
import os
import re
import sys

from elftools.elf.elffile import ELFFile

SMALL_PAGE = 0x1000
LARGE_PAGE = 0x4000

EXECUTABLE = 1
WRITABLE = 2

# Not all versions of elftools have names for these.
DT_RELR = (36, 0x6FFFE000)
DT_ANDROID_PACKED = (0x6000000F, 0x60000011)
DF_TEXTREL = 4
DF_BIND_NOW = 8
R_AARCH64 = {257: "ABS64", 1025: "GLOB_DAT", 1026: "JUMP_SLOT", 1027: "RELATIVE"}


def round_down(value, page):
    return value // page * page


def round_up(value, page):
    return round_down(value + page - 1, page)


class Library:
    def __init__(self, path):
        self.name = os.path.basename(path)
        self.elf = ELFFile(open(path, "rb"))
        self.segments = [segment.header for segment in self.elf.iter_segments()]
        dynamic = next(s for s in self.elf.iter_segments() if s.header.p_type == "PT_DYNAMIC")
        self.tags = list(dynamic.iter_tags())
        self.symbols = list(dynamic.iter_symbols())
        self.tables = dynamic.get_relocation_tables()

    def of_type(self, name):
        return [segment for segment in self.segments if segment.p_type == name]

    def values(self, tag):
        return [t.entry.d_val for t in self.tags if t.entry.d_tag == tag]

    def has_number(self, numbers):
        """Whether a dynamic tag has one of these numbers; elftools names those that it knows."""
        names = {36: "DT_RELR", 0x6FFFE000: "DT_ANDROID_RELR", 0x6000000F: "DT_ANDROID_REL",
                 0x60000011: "DT_ANDROID_RELA"}
        wanted = list(numbers) + [names[number] for number in numbers]
        return any(t.entry.d_tag in wanted for t in self.tags)

    def needed(self):
        return [t.needed for t in self.tags if t.entry.d_tag == "DT_NEEDED"]

    def soname(self):
        return [t.soname for t in self.tags if t.entry.d_tag == "DT_SONAME"]

    def flag(self, tag, bit):
        return any(value & bit for value in self.values(tag))

    def names(self, defined):
        return {s.name for s in self.symbols
                if s.name and (s.entry.st_shndx != "SHN_UNDEF") == defined}


# Each rule gives a list of complaints.

def rule_platform(lib, _):
    header = lib.elf.header
    if (header.e_machine, header.e_type) != ("EM_AARCH64", "ET_DYN"):
        yield f"{header.e_machine} {header.e_type}"


def rule_file_name(lib, _):
    # Packages are unpacked by this pattern.
    if not re.fullmatch(r"lib[^/]*\.so", lib.name):
        yield lib.name


def rule_soname(lib, _):
    if lib.soname() != [lib.name]:
        yield f"{lib.soname()}, not the file's name"


def rule_needed(lib, lists):
    if sorted(lib.needed()) != sorted(lists["libraries"]):
        yield f"needs {lib.needed()}"
    if lib.values("DT_RPATH") or lib.values("DT_RUNPATH"):
        yield "has a path to search"


def rule_text_relocations(lib, _):
    if lib.values("DT_TEXTREL") or lib.flag("DT_FLAGS", DF_TEXTREL):
        yield "has text relocations"


def rule_section_headers(lib, _):
    header = lib.elf.header
    if header.e_shoff == 0 or header.e_shnum == 0 or header.e_shstrndx >= header.e_shnum:
        yield "stripped, or without names"
        return
    names = [section.name for section in lib.elf.iter_sections()]
    for name in (".dynamic", ".dynsym", ".dynstr", ".text"):
        if name not in names:
            yield f"no {name}"


def rule_rights(lib, _):
    for segment in lib.segments:
        if segment.p_flags & WRITABLE and segment.p_flags & EXECUTABLE:
            yield f"{segment.p_type} at {segment.p_vaddr:#x} is writable and executable"
    if len(lib.of_type("PT_GNU_STACK")) != 1:
        yield "the stack's rights are not stated"


def rule_hash_tables(lib, _):
    # The older one is the only one before API 23.
    for tag in ("DT_HASH", "DT_GNU_HASH"):
        if not lib.values(tag):
            yield f"no {tag}"


def rule_versions(lib, _):
    if lib.values("DT_VERDEF"):
        yield "its functions have versions, which mean nothing before API 23"


def rule_thread_local(lib, _):
    if lib.of_type("PT_TLS"):
        yield "thread-local data, which need API 29"
    for name in lib.names(True) | lib.names(False):
        if name.startswith("__emutls"):
            yield name


def rule_relocations(lib, _):
    if lib.has_number(DT_RELR + DT_ANDROID_PACKED):
        yield "packed relocations, which need API 28 or 30"
    for table in lib.tables.values():
        for relocation in table.iter_relocations():
            kind = relocation.entry.r_info_type
            if kind not in R_AARCH64:
                yield f"type {kind} at {relocation.entry.r_offset:#x}"


def rule_binding(lib, _):
    if not lib.flag("DT_FLAGS", DF_BIND_NOW):
        yield "not bound when it is loaded"


def rule_load_alignment(lib, _):
    loads = lib.of_type("PT_LOAD")
    if not loads:
        yield "nothing to load"
    for load in loads:
        if load.p_align < LARGE_PAGE:
            yield f"LOAD at {load.p_vaddr:#x} is aligned to {load.p_align:#x}"
        elif (load.p_vaddr - load.p_offset) % load.p_align:
            yield f"LOAD at {load.p_vaddr:#x} does not lie so in the file"


def rule_relro(lib, _):
    """RELRO becomes read-only in whole pages, whatever their size: writable data that share one
    would be lost, and pages that nothing reserved make the loader give up.

    Between two segments RELRO may go on: that is reserved and empty."""
    relros = lib.of_type("PT_GNU_RELRO")
    if len(relros) != 1:
        yield f"{len(relros)} of them"
        return
    start, end = relros[0].p_vaddr, relros[0].p_vaddr + relros[0].p_memsz
    loads = lib.of_type("PT_LOAD")
    if not any(load.p_flags & WRITABLE and load.p_vaddr <= start < load.p_vaddr + load.p_memsz
               for load in loads):
        yield "does not start in a writable segment"
    # Apps are refused by the store for this, even where nothing shares the page.
    if any(load.p_flags & WRITABLE and load.p_vaddr + load.p_memsz > end for load in loads) \
            and end % LARGE_PAGE:
        yield f"has writable data behind it, and ends at {end:#x}"
    for page in (SMALL_PAGE, LARGE_PAGE):
        first, last = round_down(start, page), round_up(end, page)
        reserved = max(round_up(load.p_vaddr + load.p_memsz, page) for load in loads)
        if last > reserved:
            yield f"ends at {last:#x}, the library at {reserved:#x}, in pages of {page:#x}"
        for load in loads:
            load_end = load.p_vaddr + load.p_memsz
            before = load.p_vaddr < start and load_end > first
            behind = load_end > end and load.p_vaddr < last
            if load.p_flags & WRITABLE and (before or behind):
                yield f"shares a page of {page:#x} with writable data"


def rule_imports(lib, lists):
    if not lib.names(False):
        yield "imports nothing"
    for name in sorted(lib.names(False) - lists["imports"]):
        yield f"imports {name}"


def rule_exports(lib, lists):
    exported = lib.names(True)
    for name in sorted(lists["declared"] - exported):
        yield f"does not export {name}"
    for name in sorted(exported - lists["declared"]):
        yield f"exports {name}"


RULES = [rule_platform, rule_file_name, rule_soname, rule_needed, rule_text_relocations,
         rule_section_headers, rule_rights, rule_hash_tables, rule_versions, rule_thread_local,
         rule_relocations, rule_binding, rule_load_alignment, rule_relro, rule_imports,
         rule_exports]


def read_lists(imports, declared):
    with open(imports, encoding="utf-8") as file:
        lines = [line.split() for line in file if not line.startswith("#")]
    with open(declared, encoding="utf-8") as file:
        return {"imports": {line[1] for line in lines}, "libraries": {line[0] for line in lines},
                "declared": set(file.read().split())}


def complaints(path, lists):
    """The names of the rules that the library breaks, with what is wrong."""
    lib = Library(path)
    broken = {}
    for rule in RULES:
        found = list(rule(lib, lists))
        if found:
            broken[rule.__name__[len("rule_"):]] = found
    return broken


def main():
    path, imports, declared = sys.argv[1:]
    broken = complaints(path, read_lists(imports, declared))
    for rule in RULES:
        name = rule.__name__[len("rule_"):]
        print(f"{'BROKEN' if name in broken else 'ok':7}{name.replace('_', ' ')}")
        for complaint in broken.get(name, []):
            print(f"       {complaint}")
    sys.exit(1 if broken else 0)


if __name__ == "__main__":
    main()
