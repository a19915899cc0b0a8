#!/usr/bin/env python3
"""Holds what the command prints with --json to docs/schema: json_forms_test.py COMMAND"""
import json
import subprocess
import sys
import unittest
from pathlib import Path

import jsonschema

TREE = Path(__file__).resolve().parent.parent.parent
SCHEMAS = TREE / "docs/schema"
PROGRAM = Path(sys.argv[1]).resolve()
DEVICES = ["", "dual_sim", "german", "no_number", "no_telephony", "bad_key", "faults", "names"]
FORMS = [
    ("facts", ["info"]), ("facts", ["get", "device_name", "roaming"]), ("facts", ["network"]),
    ("facts", ["serial"]), ("sim", ["sim"]), ("sim", ["sim", "--reveal"]),
    ("country", ["country", "590"]), ("country", ["country", "350"]),
    ("package", ["package", "org.example.clock", "none"]), ("storage", ["storage", "--at-least", "1"]),
    ("doctor", ["doctor"]), ("device-list", ["device", "list"]),
    ("device-show", ["device", "show", str(TREE / "tests/devices/odd_texts.toml")]),
]


def printed(words, device):
    command = [PROGRAM, *words, "--json"]
    if device:
        command += ["--device", f"tests/devices/{device}.toml"]
    return subprocess.run(command, capture_output=True, text=True, timeout=60, check=False, cwd=TREE,
                          stdin=subprocess.DEVNULL,
                          env={"DBUS_SYSTEM_BUS_ADDRESS": "unix:path=/nonexistent"}).stdout


class JsonForms(unittest.TestCase):
    def test_output_has_its_form(self):
        for name, words in FORMS:
            validator = jsonschema.Draft7Validator(json.loads((SCHEMAS / f"{name}.json").read_text()))
            seen = 0
            for device in DEVICES:
                text = printed(words, device)
                with self.subTest(words=words, device=device):
                    for error in validator.iter_errors(json.loads(text)) if text else []:
                        self.fail(error.message)
                seen += bool(text)
            self.assertGreater(seen, 0, words)

    def test_each_line_of_watch_has_its_form(self):
        validator = jsonschema.Draft7Validator(json.loads((SCHEMAS / "watch.json").read_text()))
        with subprocess.Popen([PROGRAM, "watch", "--json", "--device", "tests/devices/dual_sim.toml"],
                              stdout=subprocess.PIPE, text=True, cwd=TREE) as watch:
            validator.validate(json.loads(watch.stdout.readline()))
            watch.terminate()
        time = "2026-11-22T14:03:07.512+01:00"
        validator.validate({"event": "flight_mode", "state": "on", "time": time})
        validator.validate({"fact": "sim_mcc", "old": "310", "new": None, "reason": "no card", "time": time})

    def test_every_form_is_tried_and_named(self):
        names = {path.stem for path in SCHEMAS.glob("*.json")}
        self.assertEqual(names, {name for name, _ in FORMS} | {"watch"})
        page = (TREE / "docs/cli.md").read_text("utf-8")
        for name in names:
            self.assertIn(f"`{name}`", page)


if __name__ == "__main__":
    del sys.argv[1]
    unittest.main()
