#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Holds docs/device-file.schema.json to the rows that the reader of device files goes by, and to the
reader's own judgement: of every device file of the tree, and of one mistake of each kind.

Its descriptions are the sentences of docs/device-file.md. With --write it puts the schema of the rows
in its place.
"""
import argparse
import json
import re
import subprocess
import sys
import tempfile
import tomllib
import unittest
from pathlib import Path

import jsonschema

TREE = Path(__file__).resolve().parent.parent.parent
SCHEMA = TREE / "docs" / "device-file.schema.json"

# Each after "schema = 1" and the line of its section.
GOOD = {
    "": [""],
    "[device]": ["telephony = false"],
    "[settings]": ["font_size = 7\nutc_offset = -3600", "font_size = 'huge'"],
    "[[slot]]": ["mcc = '001'\nmnc = '01'\nnumber = 'null'", "access_technology = '5gnr'",
                 "iccid = '899990000000000001'\nsignal = 0\npin_retries = 10"],
    "[network]": ["ssid = '" + 32 * "a" + "'"],
    "[subscriptions]": ["data = 1\nvoice = 'ask_always'"],
    "[packages]": ["'org.example.app' = ''"],
    "[fault]": ["telephony_init = 'empty'", "telephony_init = { delay_ms = 60000 }",
                "vconf_get_str = { error = 'null', call = 3 }", "g_bus_get_sync = 'no_bus'",
                "GetSerial = 'org.example.Error'", "GetSerial = { error = 'not_a_string', delay_ms = 1 }"],
}
BAD = {
    "": ["colour = 1", "device = 1", "[slot]", "slot = [1]"],
    "[device]": ["colour = 1", "serial = 1", 'serial = "\\u0000"', "telephony = 'false'"],
    "[settings]": ["font_size = 4", "font_size = 'tiny'", "utc_offset = 86400"],
    "[[slot]]": ["mcc = '01'", "mnc = '0001'", "number = '+'", "cp_name = ''", "signal = 101",
                 "iccid = '89999000000000001'", "pin_retries = 11", "access_technology = '5G'"],
    "[network]": ["ssid = ''", "ssid = '" + 33 * "a" + "'"],
    "[subscriptions]": ["data = 2"],
    "[storage]": ["blocks = -1"],
    "[packages]": ["app = 1"],
    "[fault]": ["telephony_inti = 'null'", "telephony_init = 'WIFI_ERROR_OPERATION_FAILED'",
                "telephony_init = -13", "telephony_init = { call = 1 }",
                "telephony_init = { delay_ms = 60001 }", "telephony_init = { delay_ms = 1, colour = 1 }",
                "GetSerial = 'word'", "g_bus_get_sync = { error = 'no_bus' }"],
}


def printed(*arguments):
    return subprocess.run([PROGRAM, *map(str, arguments)], stdout=subprocess.PIPE, check=True,
                          text=True).stdout


def manual():
    """What the manual says of each section, under "", and of each of its keys."""
    parts = re.split(r"^### `\[+(\w+)\]+`\n", (TREE / "docs/device-file.md").read_text("utf-8"),
                     flags=re.MULTILINE)
    said = {}
    for name, text in zip(parts[1::2], parts[2::2]):
        text = re.split(r"^## ", text, flags=re.MULTILINE)[0].strip()
        said[name] = {"": " ".join(text.split("\n\n")[0].split())}
        for key, meaning in re.findall(r"^\| `(\w+)` \| ([A-Za-z`].*) \|$", text, re.MULTILINE):
            said[name][key] = meaning
    return {name: {key: re.sub(r"\[(.*?)\]\(.*?\)|`", r"\1", text) for key, text in keys.items()}
            for name, keys in said.items()}


def described():
    """The schema of the rows with the manual's sentences."""
    rows = json.loads(printed())
    sentences = manual()
    for name, section in rows["properties"].items():
        if name == "schema":
            continue
        keys = section.get("items", section).get("properties", {})
        section["description"] = sentences[name][""]
        for key in keys:
            if name == "fault":
                keys[key] = {"description": f"How {key} fails.", **keys[key]}
            else:
                keys[key] = {"description": sentences[name][key], **keys[key]}
    return json.dumps(rows, indent=1) + "\n"


def schema():
    return json.loads(SCHEMA.read_text())


def device_files():
    for folder in "tests/devices", "samples", "examples":
        for path in sorted((TREE / folder).rglob("*.toml")):
            yield path


class DeviceSchema(unittest.TestCase):
    def setUp(self):
        self.validator = jsonschema.Draft7Validator(schema())

    def judge(self, path):
        """What the schema and the reader say of a file: whether it is good."""
        by_schema = self.validator.is_valid(tomllib.loads(path.read_text()))
        return by_schema, printed(path) == "\n"

    def test_schema_is_that_of_the_rows(self):
        self.assertEqual(SCHEMA.read_text(), described(),
                         "docs/device-file.schema.json is out of date: run tools/refresh")

    def test_schema_is_one(self):
        jsonschema.Draft7Validator.check_schema(schema())

    def test_device_files_of_the_tree(self):
        paths = list(device_files())
        self.assertGreater(len(paths), 5)
        for path in paths:
            with self.subTest(path=str(path)):
                by_schema, by_reader = self.judge(path)
                self.assertEqual(by_reader, by_schema)

    def test_good_and_bad(self):
        with tempfile.TemporaryDirectory() as folder:
            path = Path(folder) / "device.toml"
            for verdict, sections in (True, GOOD), (False, BAD):
                for section, text in ((name, text) for name in sections for text in sections[name]):
                    with self.subTest(section=section, text=text):
                        path.write_text(f"schema = 1\n{section}\n{text}\n")
                        self.assertEqual((verdict, verdict), self.judge(path))

    def test_errors_are_all_those_of_the_platforms_headers(self):
        declared = set()
        for header in (TREE / "port" / "api").glob("*.h"):
            declared |= set(re.findall(r"^ +((?!TIZEN)[A-Z]+[A-Z_]*_ERROR_\w+|TAPI_(?:API|SIM_ACCESS)_\w+) =",
                                       header.read_text(), re.MULTILINE))
        offered = set(re.findall(r'"((?:[A-Z_]+_ERROR|TAPI_[A-Z]+)_\w+)"', SCHEMA.read_text()))
        none = {name for name in declared if name.endswith(("_NONE", "_SUCCESS"))}
        self.assertGreater(len(offered), 60)
        self.assertEqual(declared - none, offered)

    def test_schema_is_asked_for(self):
        self.assertFalse(self.validator.is_valid({}))
        self.assertFalse(self.validator.is_valid({"schema": 2}))


if __name__ == "__main__":
    parser = argparse.ArgumentParser(description=__doc__)
    parser.add_argument("program", help="prints the schema of the rows")
    parser.add_argument("--write", action="store_true")
    arguments = parser.parse_args()
    PROGRAM = arguments.program
    if arguments.write:
        SCHEMA.write_text(described())
    else:
        unittest.main(argv=sys.argv[:1])
