#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Compares the library's interface with the one that applications were built against.

What was removed, added or changed is printed, and the exit code is 1. The comparison knows types: a
new virtual function of the listener is found as well as a removed method.
"""
import argparse
import pathlib
import re
import subprocess
import sys

# Attributes that depend on where the library was built, or are no part of its interface.
WITHOUT = ("--no-corpus-path", "--no-comp-dir-path", "--no-show-locs", "--no-elf-needed",
           "--no-parameter-names", "--exported-interfaces-only")
HINT = """
The interface of {library} is not the one of {baseline}.
Applications that were built against that one may break. Additions that break nothing, and a break
that is meant, which takes a new SOVERSION in src/CMakeLists.txt, are recorded by
    {program} {library} {baseline} --refresh
"""


def refresh(library, baseline):
    done = subprocess.run(["abidw", *WITHOUT, "--type-id-style", "hash", library],
                          check=True, capture_output=True, text=True)
    baseline.write_text(re.sub(r"path='[^']*/", "path='", done.stdout))


def compare(library, baseline):
    """The differences as a text; empty for none."""
    done = subprocess.run(["abidiff", baseline, library], capture_output=True, text=True)
    if done.returncode == 0:
        return ""
    return done.stdout + done.stderr or f"abidiff ended with {done.returncode}\n"


def knows_types(library):
    sections = subprocess.run(["readelf", "-W", "-S", library], check=True, capture_output=True,
                              text=True).stdout
    return ".debug_info" in sections


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("library")
    parser.add_argument("baseline", type=pathlib.Path)
    parser.add_argument("--refresh", action="store_true", help="write the baseline anew")
    arguments = parser.parse_args()
    if not knows_types(arguments.library):
        sys.exit(f"{arguments.library}: has no debug information")
    if arguments.refresh:
        refresh(arguments.library, arguments.baseline)
        return 0
    differences = compare(arguments.library, arguments.baseline)
    if differences:
        print(differences + HINT.format(program=sys.argv[0], library=arguments.library,
                                        baseline=arguments.baseline))
    return 1 if differences else 0


if __name__ == "__main__":
    sys.exit(main())
