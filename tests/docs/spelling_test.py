#!/usr/bin/env python3
"""What the command and the port tell people is spelled right.

Texts of several words are looked at, without the names and numbers in them.
"""
import re
import subprocess
import sys
from pathlib import Path

TREE = Path(__file__).resolve().parent.parent.parent
FOLDERS = ["cli", "devicefile", "port"]
# Words of the field, and those that stand for themselves: keys, commands, formats.
KNOWN = set("""Ctrl busconfig Imsi Wi backend bluez coresystem dbus dpkg ethernet hostname iface kr mnc msin ok""".split())

TEXT = re.compile(r'"((?:[^"\\\n]|\\.)*)"')
SEVERAL_WORDS = re.compile(r"^[^<].*[a-z] [a-zA-Z(]")
WORD = re.compile(r"(?<![\w./-])[A-Z]?[a-z']+(?![\w/])")


def texts_of(path):
    """The texts of a source; those that stand in several lines are one."""
    code = re.sub(r"^\s*//.*$", "", path.read_text("utf-8"), flags=re.MULTILINE)
    return filter(SEVERAL_WORDS.search, TEXT.findall(re.sub(r'"\s*\n\s*"', "", code)))


def main():
    places = {}
    for path in (path for folder in FOLDERS for path in TREE.glob(f"{folder}/**/*.*")):
        if path.suffix in (".cpp", ".h", ".def"):
            for text in texts_of(path):
                for word in WORD.findall(re.sub(r"\\.", " ", text)):
                    places.setdefault(word.strip("'"), f"{path.relative_to(TREE)}: {text}")
    unknown = subprocess.run(["aspell", "list", "--lang=en", "--encoding=utf-8"], input="\n".join(places),
                             capture_output=True, text=True, check=True).stdout.split()
    wrong = sorted(set(unknown) - KNOWN)
    print(f"{len(places)} words")
    sys.exit("\n".join(f"{word}: {places[word]}" for word in wrong) or 0)


main()
