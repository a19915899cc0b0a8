#!/usr/bin/env python3
"""Runs every command line that the documents print.

    commands_test.py [--update] [--prefix FOLDER] COMMAND DOCUMENT...

A block ```console is a transcript, as those of tests/cli; a block ```sh is a script that must succeed.
A block behind "<!-- not run: why -->" is not run, one behind "<!-- run: installed -->" only with
--prefix, the folder of an installed package, which PREFIX stands for; "<!-- file: NAME -->" makes a file of it. A
command line in any other block is a mistake. The blocks of a document run one after the other in a folder with copies
of the sample devices.
"""
import argparse
import re
import shutil
import subprocess
import sys
import tempfile
from pathlib import Path

TREE = Path(__file__).resolve().parent.parent.parent
sys.path.insert(0, str(TREE / "tests/cli"))
import run_transcript  # noqa: E402

BLOCK = re.compile(r"(?:<!-- (?P<mark>not run|run|file): (?P<value>[^>]*) -->\n+)?"
                   r"^(?P<fence>```)(?P<kind>\w*)\n(?P<text>.*?)^```$", re.MULTILINE | re.DOTALL)
INDENTED = re.compile(r"(?:^|\n\n)((?:    [^\n]*\n)+)")
COMMAND_LINE = re.compile(r"^ *(?:\$ |(?:coresystem|cmake|ctest|make|sudo|apt-get|\./|tools/|tests/|"
                          r"packaging/|build/|cp|export|c\+\+) *\S)", re.MULTILINE)
INSTALLED = "/usr/share/coresystem"


class Document:
    def __init__(self, path, program, folder, prefix):
        self.prefix, self.folder = prefix, folder
        self.text = path.read_text("utf-8")
        self.share = str(program.parent.parent / "share/coresystem")
        link = folder / ".installed"  # whose name needs no quotation marks
        if not link.is_symlink():
            link.symlink_to(self.share)
        self.link = str(link)
        self.variables = run_transcript.environment(program, folder)
        self.exports = ""  # of the scripts so far
        self.problems, self.run_lines, self.exempt = [], 0, []

    def transcript(self, text):
        """What the block says after its commands were run."""
        shown = []
        for command, expected in run_transcript.parse(text)[1]:
            self.run_lines += 1
            lines = run_transcript.run(command.replace(INSTALLED, self.link), self.folder, self.variables)
            actual = [re.sub("^! ", "", line).replace(self.share, INSTALLED).replace(self.link, INSTALLED)
                      for line in lines if not re.fullmatch(r"\[\d+\]", line)]
            fits = run_transcript.matches(expected, actual)
            if not fits:
                self.problems.append(run_transcript.shown(command, ["printed:", *actual]))
            shown.append(run_transcript.shown(command, expected if fits else actual))
        return "\n".join(shown) + "\n"

    def script(self, text):
        self.run_lines += len([line for line in text.splitlines() if line.strip() and line[0] != "#"])
        script = self.exports + text
        self.exports += "".join(re.findall(r"^export .*\n", text, re.MULTILINE))
        script = script.replace(INSTALLED, self.link).replace("PREFIX", str(self.prefix))
        done = subprocess.run(["bash", "-ec", script], cwd=self.folder, env=self.variables, stdin=subprocess.DEVNULL,
                              capture_output=True, text=True, timeout=100, check=False)
        if done.returncode != 0:
            self.problems.append(f"{text}ended with {done.returncode}:\n{done.stderr}")

    def take(self, found):
        kind, text = found["kind"], found["text"]
        if found["mark"] == "not run":
            self.exempt.append((len(COMMAND_LINE.findall(text)), found["value"]))
        elif found["mark"] == "file":
            (self.folder / found["value"]).write_text(text, "utf-8")
        elif found["mark"] == "run" and not self.prefix:
            self.exempt.append((len(COMMAND_LINE.findall(text)), "needs an installed package"))
        elif kind == "console":
            return found[0].replace(text, self.transcript(text))
        elif kind == "sh":
            self.script(text)
        elif not kind and COMMAND_LINE.search(text):
            self.problems.append("not run: " + text)
        return found[0]

    def check(self):
        text = BLOCK.sub(self.take, self.text)
        for block in INDENTED.findall(BLOCK.sub("", self.text)):
            if COMMAND_LINE.search(block):
                self.problems.append("not run: " + block)
        return text


def main():
    arguments = argparse.ArgumentParser(description=__doc__)
    arguments.add_argument("--update", action="store_true", help="write what was printed instead")
    arguments.add_argument("--prefix", type=Path)
    arguments.add_argument("command", type=Path)
    arguments.add_argument("documents", type=Path, nargs="+")
    options = arguments.parse_args()
    good = True
    for path in options.documents:
        with tempfile.TemporaryDirectory() as folder:
            if "examples" in path.parts:
                shutil.copytree(path.parent, folder, dirs_exist_ok=True)
            for device in (TREE / "samples").glob("*.toml"):
                shutil.copy(device, folder)
            Path(folder, "samples").symlink_to(TREE / "samples")
            document = Document(path, options.command.resolve(), Path(folder), options.prefix)
            text = document.check()
        left = "".join(f"; {count} not run: {why}" for count, why in document.exempt if count)
        print(f"{path.name}: {document.run_lines} command lines run{left}")
        if options.update:
            path.write_text(text, "utf-8")
        good = good and not document.problems
        print("\n".join(document.problems))
    sys.exit(0 if good or options.update else 1)


main()
