#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Makes an Android archive (AAR) of libraries that an NDK has built for arm64.

C and C++ code finds the library and its header in the archive as the prefab package "ovrinresize".
With the JNI library and the binding's classes, the archive serves Kotlin and Java, too.

The same input gives the same bytes: entries are sorted, undated and not compressed.
"""

import argparse
import io
import json
import os
import re
import struct
import sys
import zipfile

MIN_SDK = 21  # the oldest Android for 64-bit processors
ABI = "arm64-v8a"
PAGE = 16384  # the largest page of Android devices
CORE = "libovrinresize.so"
JNI = "libovrinresize_jni.so"
PACKAGE = "ovrin.resize"

# What Android gives to apps, and the libraries use.
SYSTEM_LIBRARIES = {"libc.so", "libm.so", "libdl.so", "liblog.so"}

MANIFEST = f"""<?xml version="1.0" encoding="utf-8"?>
<manifest xmlns:android="http://schemas.android.com/apk/res/android"
    package="{PACKAGE}">

    <uses-sdk android:minSdkVersion="{MIN_SDK}" />

</manifest>
"""

PROGUARD = f"""# The native library finds this class and its methods by their names.
-keep class {PACKAGE}.Native {{ *; }}
"""


class Refused(Exception):
    """The archive cannot be made of this."""


# ---- ELF ------------------------------------------------------------------------------------------

ET_DYN = 3
EM_AARCH64 = 183
PT_LOAD = 1
PT_DYNAMIC = 2
DT_NEEDED = 1
DT_STRTAB = 5
DT_SONAME = 14


class Elf:
    """What the checks below want to know of a shared library."""

    def __init__(self, name, data):
        self.name = name
        self.data = data
        try:
            self._read()
        except (struct.error, ValueError) as error:
            raise Refused(f"{name} is damaged: {error}") from error

    def _read(self):
        if self.data[:4] != b"\x7fELF":
            raise Refused(f"{self.name} is not an ELF file")
        if self.data[4:6] != b"\x02\x01":
            raise Refused(f"{self.name} is not a 64-bit, little-endian ELF file")
        kind, self.machine = struct.unpack_from("<HH", self.data, 16)
        if kind != ET_DYN:
            raise Refused(f"{self.name} is not a shared library")
        self.loads = []  # (file offset, address, bytes in the file, alignment)
        self.soname = None
        self.needed = []
        dynamic = None
        table, = struct.unpack_from("<Q", self.data, 32)
        size, count = struct.unpack_from("<HH", self.data, 54)
        for i in range(count):
            kind, _, offset, address, _, file_size, _, alignment = struct.unpack_from(
                "<IIQQQQQQ", self.data, table + i * size)
            if kind == PT_LOAD:
                self.loads.append((offset, address, file_size, alignment))
            elif kind == PT_DYNAMIC:
                dynamic = (offset, file_size)
        if not self.loads or dynamic is None:
            raise Refused(f"{self.name} is not a shared library")
        self._read_dynamic(*dynamic)

    def _read_dynamic(self, offset, size):
        entries = [struct.unpack_from("<qQ", self.data, offset + i) for i in range(0, size, 16)]
        strings = next((value for tag, value in entries if tag == DT_STRTAB), None)
        if strings is None:
            raise ValueError("no string table")
        start = self._offset_of(strings)
        for tag, value in entries:
            if tag == DT_SONAME:
                self.soname = self._string(start + value)
            elif tag == DT_NEEDED:
                self.needed.append(self._string(start + value))

    def _offset_of(self, address):
        for offset, begin, size, _ in self.loads:
            if begin <= address < begin + size:
                return offset + address - begin
        raise ValueError(f"nothing at address {address:#x}")

    def _string(self, offset):
        end = self.data.index(b"\0", offset)
        return self.data[offset:end].decode("ascii")


def check_library(name, data, soname, others):
    """Android must load it: on devices with large pages, under this name, without other libraries."""
    elf = Elf(name, data)
    if elf.machine != EM_AARCH64:
        raise Refused(f"{name} is not for AArch64 (its machine is {elf.machine})")
    if elf.soname != soname:
        raise Refused(f"the SONAME of {name} is {elf.soname}, must be {soname}")
    for offset, address, _, alignment in elf.loads:
        if alignment % PAGE != 0 or alignment == 0 or (address - offset) % PAGE != 0:
            raise Refused(f"{name} is not aligned to pages of 16 KB (a segment has {alignment:#x})")
    foreign = [needed for needed in elf.needed if needed not in SYSTEM_LIBRARIES | others]
    if foreign:
        raise Refused(f"{name} needs {', '.join(foreign)}, which an Android app does not have")
    for other in others:
        if other not in elf.needed:
            raise Refused(f"{name} is not linked to {other}")


# ---- Archives -------------------------------------------------------------------------------------

ALIGNMENT_FIELD = 0xD935  # the extra field by which Android's tools, too, align entries
LOCAL_HEADER = 30  # bytes before the name of an entry


def padding(offset, name, alignment):
    """An extra field with which the data of the entry at this offset is aligned."""
    least = 6
    data = offset + LOCAL_HEADER + len(name.encode()) + least
    zeros = -data % alignment
    return struct.pack("<HHH", ALIGNMENT_FIELD, least - 4 + zeros, alignment) + bytes(zeros)


def archive(files):
    """A zip archive of a dictionary from names to contents."""
    stream = io.BytesIO()
    with zipfile.ZipFile(stream, "w", zipfile.ZIP_STORED) as result:
        for name in sorted(files):
            entry = zipfile.ZipInfo(name, (1980, 1, 1, 0, 0, 0))
            entry.create_system = 3  # Unix, also where this runs elsewhere
            entry.external_attr = 0o100644 << 16
            # Data that is not compressed can be mapped where it lies, when it lies right.
            entry.extra = padding(stream.tell(), name, PAGE if name.endswith(".so") else 4)
            result.writestr(entry, files[name])
    return stream.getvalue()


def read(path):
    with open(path, "rb") as file:
        return file.read()


def read_tree(folder):
    files = {}
    for parent, _, names in os.walk(folder):
        for name in names:
            path = os.path.join(parent, name)
            files[os.path.relpath(path, folder).replace(os.sep, "/")] = read(path)
    return files


def as_json(value):
    return (json.dumps(value, indent=2, sort_keys=True) + "\n").encode()


# ---- The AAR --------------------------------------------------------------------------------------


def prefab(version, ndk, header, library):
    module = "prefab/modules/ovrinresize"
    libs = f"{module}/libs/android.{ABI}"
    return {
        "prefab/prefab.json": as_json({
            "schema_version": 2,
            "name": "ovrinresize",
            "version": version,
            "dependencies": [],
        }),
        f"{module}/module.json": as_json({
            "export_libraries": [],
            "library_name": CORE[:-len(".so")],
        }),
        f"{module}/include/ovrinresize.h": header,
        f"{libs}/abi.json": as_json({
            "abi": ABI,
            "api": MIN_SDK,
            "ndk": ndk,
            "stl": "none",  # neither library uses C++'s run-time library
            "static": False,
        }),
        f"{libs}/{CORE}": library,
    }


def aar_files(options):
    library = read(options.library)
    check_library(options.library, library, CORE, set())
    files = prefab(options.version, options.ndk, read(options.header), library)
    files["AndroidManifest.xml"] = MANIFEST.encode()
    files["LICENSE"] = read(options.license)
    files["R.txt"] = b""  # no resources; some tools expect the file
    files[f"jni/{ABI}/{CORE}"] = library
    classes = {}
    if options.jni:
        jni = read(options.jni)
        check_library(options.jni, jni, JNI, {CORE})
        files[f"jni/{ABI}/{JNI}"] = jni
        files["proguard.txt"] = PROGUARD.encode()
        classes = read_tree(options.classes)
        if PACKAGE.replace(".", "/") + "/Native.class" not in classes:
            raise Refused(f"{options.classes} does not hold the binding's classes")
    files["classes.jar"] = archive(classes)
    return files


def version_number(text):
    # CMake's form: prefab makes a CMake package of it.
    if not re.fullmatch(r"\d+(\.\d+){0,3}", text):
        raise argparse.ArgumentTypeError("a version is 1 to 4 numbers with points between")
    return text


def parse_arguments():
    root = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..")
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("library", help=f"{CORE}, built by an NDK for {ABI}")
    parser.add_argument("jni", nargs="?", help=f"{JNI}, likewise; needs --classes")
    parser.add_argument("--classes", help="the folder with the binding's compiled classes")
    parser.add_argument("--version", required=True, type=version_number)
    parser.add_argument("--ndk", required=True, type=int, help="major version of the NDK")
    parser.add_argument("--output", required=True, help="the archive to write")
    parser.add_argument("--header", default=os.path.join(root, "include", "ovrinresize.h"))
    parser.add_argument("--license", default=os.path.join(root, "LICENSE"))
    options = parser.parse_args()
    if (options.jni is None) != (options.classes is None):
        parser.error("the JNI library and --classes go together")
    return options


def main():
    options = parse_arguments()
    try:
        contents = archive(aar_files(options))
        with open(options.output, "wb") as file:
            file.write(contents)
    except (Refused, OSError) as error:
        sys.exit(f"make_aar.py: {error}")


if __name__ == "__main__":
    main()
