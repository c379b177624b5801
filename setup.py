"""Builds the package vorel_rnsap with CMake: the extension, the decoder module
and the host libraries it loads, put together in the build tree's python/
folder, which is then installed as it is.

    pip install --no-build-isolation .

The build tree is build/python-package; RNSAP_CMAKE_ARGS adds CMake options.
"""

import os
import shlex
import subprocess
import sys
from pathlib import Path

from setuptools import setup
from setuptools.command.build_py import build_py
from setuptools.dist import Distribution

SOURCE = Path(__file__).resolve().parent
BUILD = SOURCE / "build" / "python-package"


class BuildWithCMake(build_py):
    def run(self):
        configure = [
            "cmake", "-S", str(SOURCE), "-B", str(BUILD), "-DCMAKE_BUILD_TYPE=Release",
            "-DRNSAP_BUILD_TESTS=OFF", f"-DRNSAP_PYTHON={sys.executable}",
            *shlex.split(os.environ.get("RNSAP_CMAKE_ARGS", "")),
        ]
        subprocess.run(configure, check=True)
        subprocess.run(["cmake", "--build", str(BUILD), "-j", str(os.cpu_count() or 1),
                        "--target", "vorel_rnsap_native"], check=True)
        self.copy_tree(str(BUILD / "python" / "vorel_rnsap"),
                       os.path.join(self.build_lib, "vorel_rnsap"))


class NativeDistribution(Distribution):
    def has_ext_modules(self):
        return True


setup(
    packages=["vorel_rnsap"],
    package_dir={"": "python"},
    cmdclass={"build_py": BuildWithCMake},
    distclass=NativeDistribution,
)
