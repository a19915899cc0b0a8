#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Compares what the library exports and imports with the lists beside this file.

Prints what is new or missing by name; the exit code is 1 then.
"""
import argparse
import collections
import fnmatch
import pathlib
import subprocess
import sys

# Applications reach the class through GetInstance() only.
NEVER_EXPORTED = ("CoreSystem::CoreSystem", "CoreSystem::~CoreSystem", "vtable for ",
                  "typeinfo for ", "typeinfo name for ")
SINGLETONS = ("CoreSystem", "SimManager", "ConnectionManager", "DBusManager")
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
    lines = run("nm", "-D", "-C", "--undefined-only", library).splitlines()
    return {line.strip().split(maxsplit=1)[1] for line in lines}


def compare(what, found, listed):
    for name in sorted(found - listed):
        yield f"{what} but not in the list: {name}"
    for name in sorted(listed - found):
        yield f"in the list but not {what}: {name}"


def check_exports(library, listed):
    found = exported(library)
    yield from compare("exported", found, set(listed))
    for name in sorted(found.union(listed)):
        if name.startswith(NEVER_EXPORTED):
            yield f"must never be exported: {name}"


def is_of_runtime(symbol, patterns):
    name = symbol.split("@")[0]
    return any(fnmatch.fnmatchcase(text, pattern) for text in (name, symbol)
               for pattern in patterns)


def check_imports(library, listed, runtime):
    found = {symbol for symbol in imported(library) if not is_of_runtime(symbol, runtime)}
    yield from compare("imported", found, set(listed))


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
    parser.add_argument("--imports", type=pathlib.Path, help="list of all imported names ...")
    parser.add_argument("--runtime", type=pathlib.Path, help="... but those of the C and C++ runtime")
    parser.add_argument("--vtable", type=int, metavar="WORD", help="check them; bytes of a pointer")
    arguments = parser.parse_args()

    problems = []
    if arguments.exports:
        problems += check_exports(arguments.library, read_list(arguments.exports))
    if arguments.imports:
        problems += check_imports(arguments.library, read_list(arguments.imports),
                                  read_list(arguments.runtime))
    if arguments.vtable:
        problems += check_vtable(arguments.library, arguments.vtable)
    for problem in problems:
        print(problem)
    print(f"relocations: {relocations(arguments.library)}")
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
