# SPDX-License-Identifier: Apache-2.0
# A Conan 2 recipe of the sources around it: conan create packaging/conan
import os
import re

from conan import ConanFile
from conan.errors import ConanInvalidConfiguration
from conan.tools.cmake import CMake, CMakeToolchain, cmake_layout
from conan.tools.files import copy, load, rmdir


class OvrinresizeConan(ConanFile):
    name = "ovrinresize"
    description = "Small, fast resizing of raw pictures in memory"
    license = "Apache-2.0"
    package_type = "library"
    settings = "os", "arch", "compiler", "build_type"
    options = {"shared": [True, False]}
    default_options = {"shared": True}

    def set_version(self):
        header = load(self, os.path.join(self._sources, "include", "ovrinresize.h"))
        self.version = re.search(r'#define OVRINRESIZE_VERSION "(.*)"', header).group(1)

    def export_sources(self):
        for pattern in ("*.md", "CMakeLists.txt", "LICENSE", "cmake/*", "docs/*", "examples/*",
                        "include/*", "src/*"):
            copy(self, pattern, self._sources, self.export_sources_folder)

    def validate(self):
        if self.settings.os not in ("Linux", "Android"):
            raise ConanInvalidConfiguration("Linux and Android only")
        if self.settings.arch not in ("x86_64", "armv8"):
            raise ConanInvalidConfiguration("64-bit x86 and Arm only")

    def layout(self):
        cmake_layout(self)

    def generate(self):
        # Sets BUILD_SHARED_LIBS after the option: one of the two libraries.
        CMakeToolchain(self).generate()

    def build(self):
        cmake = CMake(self)
        cmake.configure()
        cmake.build()

    def package(self):
        CMake(self).install()
        copy(self, "LICENSE", self.source_folder, os.path.join(self.package_folder, "licenses"))
        # Conan writes files for CMake and pkg-config itself.
        for folder in ("lib/cmake", "lib/pkgconfig", "share"):
            rmdir(self, os.path.join(self.package_folder, folder))

    def package_info(self):
        self.cpp_info.libs = ["ovrinresize"]
        self.cpp_info.set_property("cmake_file_name", "ovrinresize")
        self.cpp_info.set_property("cmake_target_name", "ovrinresize::ovrinresize")
        self.cpp_info.set_property("pkg_config_name", "ovrinresize")
        if not self.options.shared:
            self.cpp_info.system_libs = ["m"]
            if self.settings.os == "Linux":
                self.cpp_info.system_libs.append("pthread")

    @property
    def _sources(self):
        return os.path.join(self.recipe_folder, "..", "..")
