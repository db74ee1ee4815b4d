"""Builds the extension module with the project's CMake, so that the module links the same
libraries as the veltmarquist tool: CMake is the one description of how the C++ is built.

The package lives in the project's python/ folder and builds from there (the project's sources
are one folder up). VELTMARQUIST_CMAKE_BUILD_DIR chooses the CMake build folder (by default one
inside setuptools' build folder, kept between builds), CMAKE_BUILD_PARALLEL_LEVEL the jobs (2).
"""
import os
import shutil
import subprocess
import sys
from pathlib import Path

from setuptools import Extension, setup
from setuptools.command.build_ext import build_ext

PROJECT = Path(__file__).resolve().parent.parent
TARGET = "_veltmarquist"


class CMakeBuild(build_ext):
    """Configures the whole project with the Python option on and builds the module's target."""

    def build_extension(self, ext):
        if not (PROJECT / "CMakeLists.txt").is_file():
            sys.exit(f"setup.py: the project's CMakeLists.txt is not in {PROJECT}; build from the project's python/")
        build = Path(os.environ.get("VELTMARQUIST_CMAKE_BUILD_DIR") or Path(self.build_temp).resolve() / "cmake")
        configure = ["cmake", "-S", str(PROJECT), "-B", str(build), "-DCMAKE_BUILD_TYPE=Release",
                     "-DVELTMARQUIST_BUILD_PYTHON=ON", "-DVELTMARQUIST_BUILD_TESTS=OFF",
                     "-DVELTMARQUIST_BUILD_BENCH=OFF", f"-DPython_EXECUTABLE={sys.executable}"]
        subprocess.run(configure, check=True)
        jobs = os.environ.get("CMAKE_BUILD_PARALLEL_LEVEL", "2")
        subprocess.run(["cmake", "--build", str(build), "--target", TARGET, "-j", jobs], check=True)
        built = sorted((build / "python").glob(TARGET + "*.so"))
        if not built:
            sys.exit(f"setup.py: CMake built no {TARGET} module in {build / 'python'}")
        destination = Path(self.get_ext_fullpath(ext.name))
        destination.parent.mkdir(parents=True, exist_ok=True)
        shutil.copyfile(built[0], destination)


setup(ext_modules=[Extension(f"veltmarquist.{TARGET}", sources=[])], cmdclass={"build_ext": CMakeBuild})
