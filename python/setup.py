"""Builds the package over an installed library.

WAVKIT_PREFIX names the prefix below which `cmake --install` put library and program. The wheel fits
every Python 3 of its platform: nothing in it is compiled against Python.
"""

import os
import re
import shutil
import sys
from pathlib import Path

from setuptools import setup
from setuptools.command.build_py import build_py
from setuptools.dist import Distribution
from wheel.bdist_wheel import bdist_wheel

here = Path(__file__).resolve().parent
sys.path.insert(0, str(here))

import interface  # noqa: E402  (lies beside this file)

version = re.search(r"VERSION (\d+\.\d+\.\d+)", (here.parent / "CMakeLists.txt").read_text())[1]


class BuildPackage(build_py):
    """Adds what is made from the headers, and the native files."""

    def run(self):
        super().run()
        if "WAVKIT_PREFIX" not in os.environ:
            raise SystemExit("setup.py: WAVKIT_PREFIX shall name the prefix of an installed wavkit")
        prefix, package = Path(os.environ["WAVKIT_PREFIX"]), Path(self.build_lib) / "wavkit"
        interface.write(prefix / "include", package)
        (package / "_version.py").write_text(f'version = "{version}"\n')
        shutil.copy(here.parent / "LICENSE", package)
        for name in ("lib/libwavkit.so.2", "bin/wavkit"):
            (package / "_native" / name).parent.mkdir(parents=True, exist_ok=True)
            shutil.copy(prefix / name, package / "_native" / name)


class PlatformWheel(bdist_wheel):
    """One wheel a platform, whatever the Python."""

    def finalize_options(self):
        super().finalize_options()
        self.root_is_pure = False

    def get_tag(self):
        return "py3", "none", super().get_tag()[2]


class WithNativeFiles(Distribution):
    def has_ext_modules(self):
        return True


setup(
    version=version,
    distclass=WithNativeFiles,
    cmdclass={"build_py": BuildPackage, "bdist_wheel": PlatformWheel},
)
