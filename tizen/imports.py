# SPDX-License-Identifier: Apache-2.0
"""Reads imports.txt, which says how it is written."""
import configparser
import dataclasses
import re


@dataclasses.dataclass(frozen=True)
class Library:
    module: str
    soname: str
    include: str
    headers: list
    requires: str
    symbols: dict  # by the layout of std::string that they depend on; "" for none

    @property
    def link_name(self):
        return re.sub(r"^lib|\.so\..*$", "", self.soname)

    def symbols_of(self, strings):
        """With the layout "old" or "new"."""
        return self.symbols[""] + self.symbols[strings]

    def all_symbols(self):
        return [symbol for symbols in self.symbols.values() for symbol in symbols]


def read_libraries(path):
    parser = configparser.ConfigParser(delimiters=("=",), default_section=None)
    with open(path) as file:
        parser.read_file(file)
    return [Library(module=module, soname=section["soname"], include=section.get("include", ""),
                    headers=section.get("headers", "").split(),
                    requires=section.get("requires", ""),
                    symbols={"": section.get("symbols", "").split(),
                             "new": section.get("symbols-new-strings", "").split(),
                             "old": section.get("symbols-old-strings", "").split()})
            for module, section in parser.items() if module]
