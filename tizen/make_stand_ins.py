#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Puts into a folder what an SDK has of the device's libraries, as far as this library needs them.

For each library of imports.txt: one with the same name and the same functions, which can be linked
with and only ends the program when it is called; its headers; its pkg-config module. A library whose
module is there already, as that of an ordinary distribution, is left alone.
"""
import argparse
import pathlib
import subprocess

from imports import read_libraries

HERE = pathlib.Path(__file__).resolve().parent
HEADERS = (HERE.parent / "port/api", HERE.parent / "port/coreutil/include")

SOURCE = "void {0}(void);\nvoid {0}(void) {{ __builtin_trap(); }}\n"
MODULE = """prefix=${{pcfiledir}}/../..
Name: {module}
Description: stands in for the device's {soname}
Version: 0
Requires: {requires}
Libs: -L${{prefix}}/lib -l{link_name}
Cflags: -I${{prefix}}/{include}
"""


def write_if_changed(path, text):
    """What is as it should be keeps its time, so that nothing is built anew."""
    if path.is_file() and path.read_text() == text:
        return False
    path.parent.mkdir(parents=True, exist_ok=True)
    path.write_text(text)
    return True


def make_library(usr, compiler, library):
    source = usr / f"src/device/{library.module}.c"
    made = usr / f"lib/lib{library.link_name}.so"  # not by the name that a loader would look for
    text = "".join(SOURCE.format(symbol) for symbol in library.all_symbols())
    if not write_if_changed(source, text) and made.is_file():
        return
    made.parent.mkdir(parents=True, exist_ok=True)
    subprocess.run([compiler, "-shared", "-fPIC", "-nostdlib", "-Wl,-soname," + library.soname,
                    "-o", made, source], check=True)


def copy_headers(usr, library):
    for name in library.headers:
        source = next(folder / name for folder in HEADERS if (folder / name).is_file())
        write_if_changed(usr / "include" / library.include / name, source.read_text())


def is_there(usr, library):
    return any(usr.glob(f"lib/*/pkgconfig/{library.module}.pc"))


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("sysroot", type=pathlib.Path)
    parser.add_argument("--compiler", default="arm-linux-gnueabi-gcc")
    arguments = parser.parse_args()
    usr = arguments.sysroot / "usr"
    for library in read_libraries(HERE / "imports.txt"):
        if is_there(usr, library):
            continue
        make_library(usr, arguments.compiler, library)
        copy_headers(usr, library)
        write_if_changed(usr / f"lib/pkgconfig/{library.module}.pc", MODULE.format(
            module=library.module, soname=library.soname, requires=library.requires,
            link_name=library.link_name, include=pathlib.PurePath("include", library.include)))


if __name__ == "__main__":
    main()
