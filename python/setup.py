"""Builds the photofx extension from the library's own sources and the effect catalogue.

The library is compiled into the extension rather than linked from an installed build, so that
`pip install --no-build-isolation ./python` needs nothing but a compiler, Python's headers and
pybind11. It gets the flags the library's own build gives it: optimised, and without fused
multiply-add, which would change roundings.
"""

import glob
import os
import shutil

from pybind11.setup_helpers import ParallelCompile, Pybind11Extension, build_ext
from pybind11.setup_helpers import naive_recompile, no_recompile
from setuptools import setup
from setuptools.command.build_py import build_py

HERE = os.path.dirname(os.path.abspath(__file__))
ROOT = os.path.dirname(HERE)
FAMILIES = ("frame", "adjust", "blur", "looks", "fixmath", "warp", "auto")


def sources():
    """The library's sources (every family folder), the catalogue's, and the module's."""
    found = []
    for folder in FAMILIES:
        found += sorted(glob.glob(os.path.join(ROOT, folder, "*.cpp")))
    for name in ("effects", "params", "selection", "chain"):
        found.append(os.path.join(ROOT, "catalog", name + ".cpp"))
    found.append(os.path.join(HERE, "src", "module.cpp"))
    return [os.path.relpath(s, HERE) for s in found]


def headers():
    """Every header the sources include: the extension is rebuilt when one of them changes."""
    found = []
    for folder in ("include", "catalog") + FAMILIES:
        found += glob.glob(os.path.join(ROOT, folder, "*.h"))
    return sorted(os.path.relpath(h, HERE) for h in found)


class build_py_with_header(build_py):
    """Ships the C header in the package: `photofx.lib` reads its declarations."""

    def run(self):
        super().run()
        target = os.path.join(self.build_lib, "photofx", "photofx.h")
        shutil.copyfile(os.path.join(ROOT, "include", "photofx.h"), target)


# Two jobs by default: the machines that build this are shared. Everything is compiled afresh
# unless PHOTOFX_INCREMENTAL is set, which recompiles only sources newer than their objects
# (quicker while working on one file, but blind to changed headers).
ParallelCompile(
    "PHOTOFX_BUILD_JOBS",
    default=2,
    needs_recompile=naive_recompile if os.environ.get("PHOTOFX_INCREMENTAL") else no_recompile,
).install()

extension = Pybind11Extension(
    "photofx._photofx",
    sources(),
    depends=headers(),
    include_dirs=[ROOT, os.path.join(ROOT, "include")],
    define_macros=[("PHOTOFX_BUILDING_LIBRARY", None), ("NDEBUG", None)],
    extra_compile_args=["-O3", "-g0", "-ffp-contract=off", "-Wall", "-Wextra", "-Werror"],
    libraries=["m"],
    cxx_std=20,
)

setup(ext_modules=[extension], cmdclass={"build_ext": build_ext, "build_py": build_py_with_header})
