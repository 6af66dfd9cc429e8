# SPDX-License-Identifier: Apache-2.0
"""Builds the package: CMake compiles the module, setuptools packs it."""

import os
import re
import subprocess
import sys
from pathlib import Path

from setuptools import Extension, setup
from setuptools.command.build_ext import build_ext

ROOT = Path(__file__).resolve().parents[2]
HEADER = (ROOT / "include" / "ovrinresize.h").read_text()
VERSION = re.findall(r'^#define OVRINRESIZE_VERSION "(.*)"', HEADER, re.MULTILINE)[0]


class CMakeBuild(build_ext):
    def build_extension(self, ext: Extension) -> None:
        build = Path(self.build_temp).resolve()
        module = Path(self.get_ext_fullpath(ext.name)).resolve()
        module.parent.mkdir(parents=True, exist_ok=True)
        subprocess.run(
            ["cmake", "-S", ROOT, "-B", build, "-DBUILD_SHARED_LIBS=OFF"]
            + ["-DOVRINRESIZE_BUILD_PYTHON=ON", f"-DPython_EXECUTABLE={sys.executable}"],
            check=True,
        )
        subprocess.run(
            ["cmake", "--build", build, "--target", "ovrinresize_python"],
            env={"CMAKE_BUILD_PARALLEL_LEVEL": str(os.cpu_count() or 1), **os.environ},
            check=True,
        )
        self.copy_file(str(build / module.name), str(module))


setup(
    version=VERSION,
    ext_modules=[Extension("ovrinresize._native", sources=[])],
    cmdclass={"build_ext": CMakeBuild},
)
