#!/usr/bin/env python3
"""The man pages name what is there, and nothing else.

    man_pages_test.py COMMAND [unittest arguments]
"""
import json
import re
import shutil
import subprocess
import sys
import unittest
from pathlib import Path
from urllib.parse import unquote

TREE = Path(__file__).resolve().parent.parent.parent
PAGES = sorted((TREE / "docs/man").iterdir())
sys.path.insert(0, str(TREE / "tests/cli"))
import command_help  # noqa: E402

PROGRAM = Path(sys.argv[1]).resolve()


def page(name):
    return (TREE / "docs/man" / name).read_text("utf-8")


def document(name):
    return (TREE / "docs" / name).read_text("utf-8")


def output_of(*command):
    done = subprocess.run(command, capture_output=True, text=True, timeout=60, check=False,
                          env={"PATH": "/usr/local/bin:/usr/bin:/bin", "LC_ALL": "C.UTF-8"})
    return done.stdout + done.stderr


class EveryPage(unittest.TestCase):
    def test_is_clean_for_mandoc(self):
        for path in PAGES:
            self.assertEqual(output_of("mandoc", "-T", "lint", "-W", "warning", str(path)), "")

    @unittest.skipUnless(shutil.which("man"), "man is not installed")
    def test_is_clean_for_man(self):
        for path in PAGES:
            self.assertEqual(output_of("sh", "-c", 'man --warnings -E UTF-8 -l -Tutf8 -Z "$1" '
                                       ">/dev/null", "sh", str(path)), "")

    def test_is_fresh(self):
        self.assertEqual(output_of(sys.executable, str(TREE / "tools/refresh"), "--check"), "")

    def test_refers_to_pages_that_are_there(self):
        ours = {(path.stem, path.suffix[1:]) for path in PAGES} | {("statvfs", "3")}
        for path in PAGES:
            for name, number in re.findall(r"\.Xr (\S+) (\d)", path.read_text("utf-8")):
                self.assertIn((name, number), ours, path)


class TheCommandsPage(unittest.TestCase):
    def setUp(self):
        self.help = {command: options
                     for command, subcommands, options in command_help.walk(PROGRAM)
                     if not (command and subcommands)}  # a group is no command by itself

    def test_names_every_command(self):
        headings = re.findall(r"^### `([a-z ]*[a-z]).*`$", document("cli.md"), re.MULTILINE)
        self.assertEqual({tuple(heading.split()) for heading in headings}, set(self.help) - {()})

    def test_names_every_option(self):
        there = {option for options in self.help.values() for option in options}
        named = set(re.findall(r"--[a-z][a-z-]+", re.sub(r"```.*?```", "", document("cli.md"),
                                                         flags=re.DOTALL)))
        self.assertEqual(named - {"--list"}, there - {"--list"})


def names_in(schema, definitions):
    """The names that a schema knows, without the types."""
    if isinstance(schema, dict):
        for key, value in schema.items():
            if key == "enum":
                yield from value
            elif key == "$ref":
                yield from names_in(definitions[unquote(value.split("/")[-1])], definitions)
            else:
                yield from names_in(value, definitions)
    elif isinstance(schema, list):
        for value in schema:
            yield from names_in(value, definitions)


class TheDeviceFilesPage(unittest.TestCase):
    def setUp(self):
        schema = json.loads((TREE / "docs/device-file.schema.json").read_text("utf-8"))
        self.definitions = schema["definitions"]
        self.schema = {name: section.get("items", section)
                       for name, section in schema["properties"].items() if name != "schema"}
        parts = re.split(r"^### `\[+(\w+)\]+`\n", document("device-file.md"), flags=re.MULTILINE)
        self.page = {name: text.split("\n## ")[0] for name, text in zip(parts[1::2], parts[2::2])}

    def keys_of(self, section):
        return set(re.findall(r"^\| `(\w+)` \| [A-Zft`]", self.page[section], re.MULTILINE))

    def test_names_every_section(self):
        self.assertEqual(set(self.page), set(self.schema))

    def test_names_every_key(self):
        for section, schema in self.schema.items():
            if section != "fault":
                self.assertEqual(self.keys_of(section), set(schema.get("properties", {})), section)

    def test_names_every_name(self):
        for section in set(self.schema) - {"fault", "step"}:
            names = set(re.findall(r'`"([\w-]+)"`', self.page[section]))
            known = set(names_in(self.schema[section], self.definitions))
            self.assertEqual(names - {"null", "cp0", "cp1"}, known, section)

    def test_names_every_family_of_calls(self):
        table = self.page["fault"].split("| function | errors |")[1].split("\n\n")[0]
        named = [word.replace("...", r"\w+") for row in re.findall(r"^\| (.*?) \|", table, re.MULTILINE)
                 for word in re.findall(r"`([\w.]+)`", row)]
        calls = self.schema["fault"]["properties"]
        for call in calls:
            self.assertRegex(call, f"^({'|'.join(named)})$")
        tables = [way for way in calls["telephony_init"]["anyOf"] if "properties" in way]
        keys = self.page["fault"].split("| key | value |")[1].split("\n\n")[0]
        self.assertEqual(set(re.findall(r"^\| `(\w+)`", keys, re.MULTILINE)),
                         set(tables[0]["properties"]))


class TheLibrarysPage(unittest.TestCase):
    def test_names_every_exported_method(self):
        exported = re.findall(r"^CoreSystem::(\w+)\(",
                              (TREE / "tests/abi/exports.txt").read_text("utf-8"), re.MULTILINE)
        methods, listeners = page("CoreSystem.3").split(".Ss The listener")
        self.assertEqual(sorted(re.findall(r'^\.It Li "[^"(]*?(\w+)\(', methods, re.MULTILINE)),
                         sorted(exported))
        self.assertEqual(len(re.findall(r'^\.It Li "', listeners, re.MULTILINE)), 5)


class ThePortsPage(unittest.TestCase):
    def test_names_every_header_of_the_platform(self):
        named = re.findall(r"`(?:api/)?([\w*]+\.h)`", (TREE / "port/README.md").read_text("utf-8"))
        for header in (TREE / "port/api").glob("*.h"):
            self.assertTrue(any(header.match(name) for name in named), header.name)


class TheOverview(unittest.TestCase):
    def test_names_every_environment_variable_of_the_readme(self):
        table = (TREE / "README.md").read_text("utf-8").split("## Environment variables")[1]
        rows = re.findall(r"^\| (`.*?) \|", table.split("\n## ")[0], re.MULTILINE)
        there = {name for row in rows for name in re.findall(r"`(\w+)`", row)}
        named = re.findall(r"^\.It Ev (.*)", page("coresystem.7"), re.MULTILINE)
        self.assertEqual({name for line in named for name in re.findall(r"[A-Z][A-Z_]+", line)}, there)


if __name__ == "__main__":
    del sys.argv[1]
    unittest.main()
