#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""Makes an Android archive (AAR) of libraries that an NDK has built for arm64.

C and C++ code finds the library and its header in the archive as the prefab package "ovrinresize".
With the JNI library and the binding's classes, the archive serves Kotlin and Java, too. Beside it come
the sources and their documentation, and what Gradle and Maven want to know, all in the layout of a Maven
repository.

The same input gives the same bytes: entries are sorted, undated and not compressed.
"""

import argparse
import hashlib
import io
import json
import os
import re
import struct
import sys
import zipfile

from elftools.common.exceptions import ELFError
from elftools.elf.elffile import ELFFile

import documentation

MIN_SDK = 21  # the oldest Android for 64-bit processors
ABI = "arm64-v8a"
PAGE = 16384  # the largest page of Android devices
CORE = "libovrinresize.so"
JNI = "libovrinresize_jni.so"
HEADERS = ("ovrinresize.h", "ovrinresize.hpp")
PACKAGE = "ovrin.resize"
HASHES = ("md5", "sha1", "sha256", "sha512")

# What Android gives to apps, and the libraries use.
SYSTEM_LIBRARIES = {"libc.so", "libm.so", "libdl.so", "liblog.so"}
# Bitmaps are the binding's; the core must not need them.
JNI_LIBRARIES = SYSTEM_LIBRARIES | {"libjnigraphics.so"}

MANIFEST = f"""<?xml version="1.0" encoding="utf-8"?>
<manifest xmlns:android="http://schemas.android.com/apk/res/android"
    package="{PACKAGE}">

    <uses-sdk android:minSdkVersion="{MIN_SDK}" />

</manifest>
"""

PROGUARD = f"""# The native library finds these classes and their methods by their names.
-keep class {PACKAGE}.Native {{ *; }}
-keep class {PACKAGE}.NativeBitmaps {{ *; }}
"""


class Refused(Exception):
    """The archive cannot be made of this."""


# ---- Libraries ------------------------------------------------------------------------------------


class Library:
    """What the checks below want to know of a shared library."""

    def __init__(self, name, data):
        try:
            elf = ELFFile(io.BytesIO(data))
            self.machine = elf["e_machine"]
            self.is_shared = elf["e_type"] == "ET_DYN"
            segments = list(elf.iter_segments())
            self.loads = [s.header for s in segments if s["p_type"] == "PT_LOAD"]
            dynamic = next((s for s in segments if s["p_type"] == "PT_DYNAMIC"), None)
            tags = list(dynamic.iter_tags()) if dynamic else []
            self.needed = [t.needed for t in tags if t.entry.d_tag == "DT_NEEDED"]
            self.soname = next((t.soname for t in tags if t.entry.d_tag == "DT_SONAME"), None)
        except ELFError as error:
            raise Refused(f"{name} is not an ELF file, or damaged: {error}") from error
        except Exception as error:  # elftools stumbles over damaged files in many ways
            raise Refused(f"{name} is damaged: {error!r}") from error
        if not self.is_shared or not self.loads or dynamic is None:
            raise Refused(f"{name} is not a shared library")


def check_library(name, data, soname, system, others):
    """Android must load it: on devices with large pages, under this name, without other libraries."""
    elf = Library(name, data)
    if elf.machine != "EM_AARCH64":
        raise Refused(f"{name} is not for AArch64 (its machine is {elf.machine})")
    if elf.soname != soname:
        raise Refused(f"the SONAME of {name} is {elf.soname}, must be {soname}")
    for load in elf.loads:
        shift = load.p_vaddr - load.p_offset
        if load.p_align % PAGE != 0 or load.p_align == 0 or shift % PAGE != 0:
            raise Refused(
                f"{name} is not aligned to pages of 16 KB (a segment has {load.p_align:#x})")
    foreign = [needed for needed in elf.needed if needed not in system | others]
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


def prefab(version, ndk, headers, library):
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
        **{f"{module}/include/{name}": content for name, content in headers.items()},
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
    check_library(options.library, library, CORE, SYSTEM_LIBRARIES, set())
    headers = {name: read(os.path.join(options.include, name)) for name in HEADERS}
    files = prefab(options.version, options.ndk, headers, library)
    files["AndroidManifest.xml"] = MANIFEST.encode()
    files["LICENSE"] = read(options.license)
    files["R.txt"] = b""  # no resources; some tools expect the file
    files[f"jni/{ABI}/{CORE}"] = library
    classes = {}
    if options.jni:
        jni = read(options.jni)
        check_library(options.jni, jni, JNI, JNI_LIBRARIES, {CORE})
        files[f"jni/{ABI}/{JNI}"] = jni
        files["proguard.txt"] = PROGUARD.encode()
        classes = read_tree(options.classes)
        for name in ("Native", "NativeBitmaps"):
            if f"{PACKAGE.replace('.', '/')}/{name}.class" not in classes:
                raise Refused(f"{options.classes} does not hold the binding's classes")
    files["classes.jar"] = archive(classes)
    return files


# ---- The repository -------------------------------------------------------------------------------

GROUP = "ovrin"
MODULE = "ovrinresize"
URL_OF_LICENSE = "https://www.apache.org/licenses/LICENSE-2.0.txt"


def artifact(version, suffix):
    return f"{MODULE}-{version}{suffix}"


def sums(content):
    return {name: hashlib.new(name, content).hexdigest() for name in HASHES}


def pom(version, kotlin):
    """What tools read that do not know Gradle's metadata; the comment tells Gradle of them."""
    dependency = f"""
    <dependency>
      <groupId>org.jetbrains.kotlin</groupId>
      <artifactId>kotlin-stdlib</artifactId>
      <version>{kotlin}</version>
      <scope>compile</scope>
    </dependency>
  """ if kotlin else ""
    return f"""<?xml version="1.0" encoding="UTF-8"?>
<!-- do_not_remove: published-with-gradle-metadata -->
<project xmlns="http://maven.apache.org/POM/4.0.0">
  <modelVersion>4.0.0</modelVersion>
  <groupId>{GROUP}</groupId>
  <artifactId>{MODULE}</artifactId>
  <version>{version}</version>
  <packaging>aar</packaging>
  <name>{MODULE}</name>
  <description>Small, fast resizing of raw pictures in memory</description>
  <licenses>
    <license>
      <name>Apache-2.0</name>
      <url>{URL_OF_LICENSE}</url>
    </license>
  </licenses>
  <dependencies>{dependency}</dependencies>
</project>
""".encode()


def module_metadata(version, kotlin, files):
    """Gradle's module metadata. `files` are the contents of the archives, by their suffixes."""
    def variant(name, suffix, attributes, dependencies):
        content = files[suffix]
        file = artifact(version, suffix)
        return {
            "name": name,
            "attributes": {"org.gradle.dependency.bundling": "external", **attributes},
            **({"dependencies": dependencies} if dependencies else {}),
            "files": [{"name": file, "url": file, "size": len(content), **sums(content)}],
        }

    needs_kotlin = [{"group": "org.jetbrains.kotlin", "module": "kotlin-stdlib",
                     "version": {"requires": kotlin}}] if kotlin else []

    def library(name, usage):
        return variant(name, ".aar", {
            "org.gradle.category": "library",
            "org.gradle.jvm.environment": "android",
            "org.gradle.libraryelements": "aar",
            "org.gradle.usage": usage,
            **({"org.jetbrains.kotlin.platform.type": "androidJvm"} if kotlin else {}),
        }, needs_kotlin)

    def documentation(kind):
        return variant(f"release{kind.capitalize()}Elements", f"-{kind}.jar", {
            "org.gradle.category": "documentation",
            "org.gradle.docstype": kind,
            "org.gradle.usage": "java-runtime",
        }, [])

    return as_json({
        "formatVersion": "1.1",
        "component": {"group": GROUP, "module": MODULE, "version": version,
                      "attributes": {"org.gradle.status": "release"}},
        "variants": [library("releaseApiElements", "java-api"),
                     library("releaseRuntimeElements", "java-runtime"),
                     documentation("sources"), documentation("javadoc")],
    })


def maven_metadata(version):
    return f"""<?xml version="1.0" encoding="UTF-8"?>
<metadata>
  <groupId>{GROUP}</groupId>
  <artifactId>{MODULE}</artifactId>
  <versioning>
    <latest>{version}</latest>
    <release>{version}</release>
    <versions>
      <version>{version}</version>
    </versions>
  </versioning>
</metadata>
""".encode()


def repository(options, aar):
    """All files of the repository, by their paths; each with the sums that clients ask for."""
    sources = {}
    if options.jni:
        for folder in options.sources:
            sources.update(read_tree(folder))
    jars = {
        ".aar": aar,
        "-sources.jar": archive({**sources, "LICENSE": read(options.license)}),
        "-javadoc.jar": archive({**documentation.pages(sources), "LICENSE": read(options.license)}),
    }
    kotlin = options.kotlin if options.jni else None
    version = options.version
    folder = f"{GROUP}/{MODULE}"
    files = {f"{folder}/{version}/{artifact(version, suffix)}": content
             for suffix, content in jars.items()}
    files[f"{folder}/{version}/{artifact(version, '.pom')}"] = pom(version, kotlin)
    files[f"{folder}/{version}/{artifact(version, '.module')}"] = module_metadata(
        version, kotlin, jars)
    files[f"{folder}/maven-metadata.xml"] = maven_metadata(version)
    for path, content in list(files.items()):
        for name, value in sums(content).items():
            files[f"{path}.{name}"] = value.encode()
    return files


def write_tree(root, files):
    for path, content in files.items():
        target = os.path.join(root, path)
        os.makedirs(os.path.dirname(target), exist_ok=True)
        with open(target, "wb") as file:
            file.write(content)


def version_number(text):
    # CMake's form: prefab makes a CMake package of it.
    if not re.fullmatch(r"\d+(\.\d+){0,3}", text):
        raise argparse.ArgumentTypeError("a version is 1 to 4 numbers with points between")
    return text


def kotlin_version(folder):
    with open(os.path.join(folder, "compiler", "package.json"), encoding="utf-8") as file:
        return json.load(file)["dependencies"]["kotlin-compiler"]


def parse_arguments():
    root = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "..")
    parser = argparse.ArgumentParser(description=__doc__.splitlines()[0])
    parser.add_argument("library", help=f"{CORE}, built by an NDK for {ABI}")
    parser.add_argument("jni", nargs="?", help=f"{JNI}, likewise; needs --classes")
    parser.add_argument("--classes", help="the folder with the binding's compiled classes")
    parser.add_argument("--version", required=True, type=version_number)
    parser.add_argument("--ndk", required=True, type=int, help="major version of the NDK")
    parser.add_argument("--output", help="the archive to write")
    parser.add_argument("--repository", help="the folder in which to write a Maven repository")
    kotlin = os.path.join(root, "bindings", "kotlin")
    parser.add_argument("--sources", action="append", metavar="FOLDER",
                        help="a folder with the binding's sources (default: the project's)")
    parser.add_argument("--kotlin", default=kotlin_version(kotlin),
                        help="version of Kotlin's standard library (default: the compiler's)")
    parser.add_argument("--include", default=os.path.join(root, "include"),
                        help="the folder with the headers")
    parser.add_argument("--license", default=os.path.join(root, "LICENSE"))
    options = parser.parse_args()
    if (options.jni is None) != (options.classes is None):
        parser.error("the JNI library and --classes go together")
    if not options.output and not options.repository:
        parser.error("nothing to write: give --output, --repository, or both")
    if not options.sources:
        options.sources = [os.path.join(kotlin, name) for name in ("main", "android")]
    return options


def main():
    options = parse_arguments()
    try:
        aar = archive(aar_files(options))
        if options.repository:
            write_tree(options.repository, repository(options, aar))
        if options.output:
            with open(options.output, "wb") as file:
                file.write(aar)
    except (Refused, OSError) as error:
        sys.exit(f"make_aar.py: {error}")


if __name__ == "__main__":
    main()
