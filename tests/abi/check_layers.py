#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Fails when a source file includes, or asks the preprocessor for, what lies beyond its layer."""
import argparse
import pathlib
import re
import sys

INCLUDE = re.compile(r'^[ \t]*#[ \t]*include[ \t]*([<"])([^>"]+)[>"]', re.MULTILINE)
CONDITION = re.compile(r"^[ \t]*#[ \t]*(?:if|ifdef|ifndef|elif)\b(.*)$", re.MULTILINE)
MACRO = re.compile(r"\b[A-Za-z_]\w*")

# Where an include may be found, besides beside the file that includes it.
INCLUDE_FOLDERS = ("", "include", "src", "port/api", "port/coreutil/include", "port/include")

# The standard headers of C++11 that the library may use; none of a platform, none of a later C++.
LIBRARY_MAY_USE = frozenset("""
    algorithm array atomic cctype climits cstdarg cstddef cstdint cstdio cstdlib cstring ctime
    exception functional initializer_list iterator limits list map memory new numeric set
    stdexcept string tuple type_traits unordered_map unordered_set utility vector
""".split())
# The bus library, which a device has too; for the one class that asks the bus.
GIO = "gio/gio.h"
MAY_USE_GIO = "src/DBusManager.cpp"
# Conditions that do not ask for a platform.
LIBRARY_MAY_TEST = re.compile(r"defined|CORESYSTEM_\w+_H|CORESYSTEM_DEFAULT_TAG|__GNUC__|__cplusplus")

LIBRARY = ("src/", "include/")
OF_THE_PORT = ("port/api/", "port/coreutil/include/")
# Folders, what of this tree they may include, and why no more.
MAY_INCLUDE = (
    ("port/api", ("port/api/",), ", which no device has"),
    ("devicefile", ("devicefile/", "port/api/", "port/common/", "port/backend/", "port/facts/"),
     "; device files know none of the backends"),
    ("cli", ("cli/", "devicefile/", "include/", *OF_THE_PORT, "port/facts/", "port/include/"),
     "; the command asks as any application does"),
)
THIRD_PARTY = re.compile(r"(glib|gio|gobject|gmodule|toml\+\+|openssl|systemd)([/.-].*)?")


class Tree:
    def __init__(self, root):
        self.root = root

    def files(self, *folders):
        for folder in folders:
            for path in sorted((self.root / folder).rglob("*")):
                if path.suffix in (".h", ".cpp"):
                    yield path.relative_to(self.root).as_posix()

    def text(self, file):
        return (self.root / file).read_text()

    def resolve(self, file, name):
        """The file of this tree that an include means, or None when it is none of it."""
        for folder in (pathlib.PurePath(file).parent.as_posix(), *INCLUDE_FOLDERS):
            path = (self.root / folder / name).resolve()
            if path.is_file() and self.root in path.parents:
                return path.relative_to(self.root).as_posix()
        return None

    def includes(self, file):
        """Pairs of the name that is included and the file that it means, if it is of this tree."""
        for _, name in INCLUDE.findall(self.text(file)):
            yield name, self.resolve(file, name)

    def all_includes(self, file, seen=None):
        """The same, and what those files include."""
        seen = set() if seen is None else seen
        for name, target in self.includes(file):
            yield name, target
            if target and target not in seen:
                seen.add(target)
                yield from self.all_includes(target, seen)


def check_library(tree):
    for file in tree.files(*LIBRARY):
        for name, target in tree.includes(file):
            if name == GIO and file == MAY_USE_GIO:
                continue
            if target is None and name not in LIBRARY_MAY_USE:
                yield f"{file}: <{name}> is not for the library"
            if target is not None and not target.startswith(LIBRARY + OF_THE_PORT):
                yield f"{file}: {target} lies below the platform line"


def check_conditions(tree):
    for file in tree.files(*LIBRARY):
        for condition in CONDITION.findall(tree.text(file)):
            for macro in MACRO.findall(condition.split("//")[0]):
                if not LIBRARY_MAY_TEST.fullmatch(macro):
                    yield f"{file}: asks the preprocessor for {macro}"


def check_shims(tree):
    for file in tree.files("port/shim"):
        for name, target in tree.all_includes(file):
            if target is None and THIRD_PARTY.fullmatch(name):
                yield f"{file}: a shim reaches <{name}>"
            if target is not None and target.startswith(("port/linux/", "port/simulator/")):
                yield f"{file}: a shim reaches {target}; it knows port/backend/ only"


def check_backends(tree):
    for mine, other in (("linux", "simulator"), ("simulator", "linux")):
        for file in tree.files(f"port/{mine}"):
            for _, target in tree.all_includes(file):
                if target is not None and target.startswith(f"port/{other}/"):
                    yield f"{file}: reaches {target} of the other backend"


def check_reach(tree):
    for folder, allowed, why in MAY_INCLUDE:
        for file in tree.files(folder):
            for _, target in tree.includes(file):
                if target is not None and not target.startswith(allowed):
                    yield f"{file}: includes {target}{why}"


def main():
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("root", type=pathlib.Path, help="top folder of the tree")
    tree = Tree(parser.parse_args().root.resolve())
    if not any(tree.files(*LIBRARY)):
        sys.exit(f"{tree.root}: no source file of the library is here")
    problems = [problem
                for check in (check_library, check_conditions, check_shims, check_backends, check_reach)
                for problem in check(tree)]
    for problem in problems:
        print(problem)
    return 1 if problems else 0


if __name__ == "__main__":
    sys.exit(main())
