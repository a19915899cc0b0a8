#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Compares what the library exports and imports, and which libraries it asks for, with lists.

Prints what is new or missing by name; the exit code is 1 then.
"""
import argparse
import collections
import fnmatch
import pathlib
import subprocess
import sys

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[2] / "tizen"))
from imports import read_libraries

# Applications reach the class through GetInstance() only.
NEVER_EXPORTED = ("CoreSystem::CoreSystem", "CoreSystem::~CoreSystem", "vtable for ",
                  "typeinfo for ", "typeinfo name for ")
SINGLETONS = ("CoreSystem", "SimManager", "ConnectionManager", "DBusManager")
RUNTIME_LIBRARIES = {"libstdc++.so.6", "libgcc_s.so.1", "libc.so.6"}
# The newest that the library needs of each: images with the old layout of std::string are old.
RUNTIME_VERSIONS = {"GLIBC": (2, 4), "GLIBCXX": (3, 4, 5), "CXXABI": (1, 3), "GCC": (3, 5)}
NEW_STRING = "std::__cxx11::basic_string<char, std::char_traits<char>, std::allocator<char> >"
# Offset to top, type information, and the two entries of the destructor.
VTABLE_WORDS = 4


def run(*command):
    return subprocess.run(command, check=True, capture_output=True, text=True).stdout


def read_list(path):
    lines = (line.strip() for line in path.read_text().splitlines())
    return [line for line in lines if line and not line.startswith("#")]


def exported(library):
    lines = run("nm", "-D", "-C", "--defined-only", library).splitlines()
    return {line.split(maxsplit=2)[2] for line in lines}


def imported(library):
    """As the linker sees them, with their versions."""
    lines = run("nm", "-D", "--undefined-only", library).splitlines()
    return {line.split()[-1] for line in lines}


def readable(symbol):
    name = run("c++filt", symbol.split("@")[0]).strip()
    return symbol if name == symbol else f"{symbol} {name}"


def compare(what, found, listed, shown=str):
    for name in sorted(found - listed):
        yield f"{what} but not in the list: {shown(name)}"
    for name in sorted(listed - found):
        yield f"in the list but not {what}: {shown(name)}"


def check_exports(library, listed, strings):
    if strings == "new":
        listed = [name.replace("std::string", NEW_STRING) for name in listed]
    found = exported(library)
    yield from compare("exported", found, set(listed))
    for name in sorted(found.union(listed)):
        if name.startswith(NEVER_EXPORTED):
            yield f"must never be exported: {name}"


def defined(library):
    return {line.split()[2] for line in run("nm", "-D", "--defined-only", library).splitlines()}


def check_debian(library, symbols_file):
    listed = {line.split("@")[0].strip() for line in symbols_file.read_text().splitlines()
              if line.startswith(" ")}
    for problem in compare("exported", defined(library), listed, readable):
        yield f"{problem} ({symbols_file.name})"


def refresh_debian(library, symbols_file, version):
    """Adds what the library exports and the file lacks; a name that is gone is left to the check."""
    text = symbols_file.read_text()
    new = sorted(name for name in defined(library) if f"\n {name}@" not in text)
    symbols_file.write_text(text + "".join(f" {name}@Base {version}\n" for name in new))


def refresh_exports(library, exports_file):
    """The same for the list of exports, which is sorted below its comment."""
    listed = set(read_list(exports_file))
    new = {name.replace(NEW_STRING, "std::string") for name in exported(library)} - listed
    comment = [line for line in exports_file.read_text().splitlines() if line.startswith("#")]
    exports_file.write_text("\n".join([*comment, *sorted(listed | new)]) + "\n")


def is_of_runtime(symbol, patterns):
    name = symbol.split("@")[0]
    return any(fnmatch.fnmatchcase(text, pattern) for text in (name, symbol)
               for pattern in patterns)


def check_imports(library, libraries, strings, runtime):
    listed = {symbol for one in libraries for symbol in one.symbols_of(strings)}
    found = {symbol for symbol in imported(library) if not is_of_runtime(symbol, runtime)}
    yield from compare("imported", found, listed, readable)


def dynamic_section(library, tag):
    lines = run("readelf", "-W", "-d", library).splitlines()
    return {line.rsplit("[")[1].rstrip("]") for line in lines if f"({tag})" in line}


def check_start(library):
    for path in dynamic_section(library, "RPATH") | dynamic_section(library, "RUNPATH"):
        yield f"looks for libraries in a place of its own: {path}"
    section = run("readelf", "-W", "-d", library)
    if "TEXTREL" in section:
        yield "its code is changed at start"
    if "BIND_NOW" not in section:
        yield "not everything is bound at start"
    if "GNU_RELRO" not in run("readelf", "-W", "-l", library):
        yield "its table of addresses stays writable"


def check_versions(library):
    for symbol in sorted(imported(library)):
        name, _, version = symbol.partition("@")
        kind, _, number = version.partition("_")
        if version and tuple(map(int, number.split("."))) > RUNTIME_VERSIONS[kind]:
            yield f"too new for a device: {symbol}"


def check_device(library, libraries, strings):
    """What holds for a library that a device loads."""
    sonames = {one.soname for one in libraries if one.symbols_of(strings)}
    yield from compare("asked of the loader", dynamic_section(library, "NEEDED"), sonames | RUNTIME_LIBRARIES)
    yield from check_start(library)
    if strings == "old":
        yield from check_versions(library)


def check_vtable(library, word):
    symbols = run("nm", "-C", "-S", library).splitlines()
    for name in SINGLETONS:
        sizes = [int(line.split()[1], 16) for line in symbols
                 if line.endswith(f" vtable for {name}")]
        if len(sizes) != 1:
            yield f"the virtual table of {name} was not found; is the library stripped?"
        for size in sizes:
            if size != VTABLE_WORDS * word:
                yield f"the virtual table of {name} holds {size // word} words, " \
                      f"not the {VTABLE_WORDS} of a lone destructor"


def relocations(library):
    """How many the loader works through at each start, by kind."""
    lines = run("readelf", "-W", "-r", library).splitlines()
    kinds = collections.Counter(line.split()[2] for line in lines if " R_" in line)
    return ", ".join(f"{count} {kind}" for kind, count in kinds.most_common()) or "none"


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("library")
    parser.add_argument("--exports", type=pathlib.Path, help="list of all exported names")
    parser.add_argument("--debian", type=pathlib.Path, help="the symbols file of its Debian package")
    parser.add_argument("--refresh", metavar="VERSION",
                        help="add to these two files what they lack, as new in VERSION")
    parser.add_argument("--imports", type=pathlib.Path, help="libraries and all imported names ...")
    parser.add_argument("--runtime", type=pathlib.Path, help="... but those of the C and C++ runtime")
    parser.add_argument("--strings", choices=("new", "old"), default="new",
                        help="the layout of std::string")
    parser.add_argument("--device", action="store_true",
                        help="it asks for those of the imports, and suits a device")
    parser.add_argument("--vtable", type=int, metavar="WORD", help="check them; bytes of a pointer")
    arguments = parser.parse_args()

    library = arguments.library
    libraries = read_libraries(arguments.imports) if arguments.imports else []
    problems = []
    if arguments.refresh and arguments.exports:
        refresh_exports(library, arguments.exports)
    if arguments.exports:
        problems += check_exports(library, read_list(arguments.exports), arguments.strings)
    if arguments.refresh and arguments.debian:
        refresh_debian(library, arguments.debian, arguments.refresh)
    if arguments.debian:
        problems += check_debian(library, arguments.debian)
    if arguments.runtime:
        problems += check_imports(library, libraries, arguments.strings,
                                  read_list(arguments.runtime))
    if arguments.device:
        problems += check_device(library, libraries, arguments.strings)
    if arguments.vtable:
        problems += check_vtable(library, arguments.vtable)
    for problem in problems:
        print(problem)
    print(f"relocations: {relocations(arguments.library)}")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
