"""The build step behind pyproject.toml: compiles the extension module with the
project's CMake build and packs it with the stub package Dexmor-stubs.

The version is the CMake project's. DEXMOR_CMAKE_BUILD_DIR names an existing
build folder to take the module from (it is brought up to date first);
otherwise the release preset's settings build it in build/wheel/cmake."""
import os
import pathlib
import re
import shutil
import subprocess
import sys

from setuptools import Extension, setup
from setuptools.command.build_ext import build_ext

ROOT = pathlib.Path(__file__).resolve().parent
WORK = pathlib.Path(os.environ.get("DEXMOR_WHEEL_WORK_DIR", ROOT / "build" / "wheel"))
WORK.mkdir(parents=True, exist_ok=True)


def project_version():
    text = (ROOT / "CMakeLists.txt").read_text(encoding="utf-8")
    return re.search(r"project\(Dexmor VERSION ([0-9.]+)", text).group(1)


class BuildWithCMake(build_ext):
    def build_extension(self, ext):
        given = os.environ.get("DEXMOR_CMAKE_BUILD_DIR")
        build_dir = pathlib.Path(given) if given else WORK / "cmake"
        if not given:
            subprocess.run(["cmake", "-S", str(ROOT), "-B", str(build_dir), "-G", "Ninja",
                            "-DCMAKE_BUILD_TYPE=Release", "-DDEXMOR_BUILD_TESTS=OFF",
                            f"-DPython3_EXECUTABLE={sys.executable}"], check=True)
        subprocess.run(["cmake", "--build", str(build_dir), "--target", "Dexmor"], check=True)
        built = sorted((build_dir / "python").glob("Dexmor.*.so"))
        if not built:
            raise RuntimeError(f"the CMake build in {build_dir} made no module")
        target = pathlib.Path(self.get_ext_fullpath(ext.name))
        target.parent.mkdir(parents=True, exist_ok=True)
        shutil.copyfile(built[-1], target)


def stub_package():
    """The stub package's folder (relative, as setuptools wants it), made from the
    stub: type checkers skip a stub beside an extension module."""
    folder = pathlib.Path("build") / "wheel" / "stubs" / "Dexmor-stubs"
    (ROOT / folder).mkdir(parents=True, exist_ok=True)
    shutil.copyfile(ROOT / "module" / "Dexmor.pyi", ROOT / folder / "__init__.pyi")
    return str(folder)


setup(
    version=project_version(),
    ext_modules=[Extension("Dexmor", sources=[])],
    cmdclass={"build_ext": BuildWithCMake},
    packages=["Dexmor-stubs"],
    package_dir={"Dexmor-stubs": stub_package()},
    package_data={"Dexmor-stubs": ["__init__.pyi"]},
    options={"egg_info": {"egg_base": str(WORK)}, "build": {"build_base": str(WORK / "setuptools")}},
)
