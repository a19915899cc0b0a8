#!/usr/bin/env python3
"""Runs the commands of a transcript and compares what they print with what stands under them.

    $ coresystem get device_name --device devices/dual_sim.toml
    My dual phone

A line that begins with "$ " is a command for bash, with "> " it goes on. Under it stand the lines of standard output,
those of standard error behind "! ", and the exit code in brackets unless it is 0. "%" before a line of output is a
regular expression for the whole line; "\\ no newline" says that the output did not end in one; the number of a line in
a device file may be a "#". Other lines, up to the first command, are comments.

The commands run in an empty directory with links to the device files (devices/) and the tests' tools
(support/), and in an environment that hides this machine's own services. The shell function "filled"
fills lines with what was one value a line, as JSON is; "await N" prints N lines of
descriptor 3, as they come, without their times.
"""
import argparse
import os
import re
import subprocess
import sys
import tempfile
from pathlib import Path

TREE = Path(__file__).resolve().parent.parent.parent
LINE_NUMBER = re.compile(r"(\bline |\.toml:)\d+")
NO_NEWLINE = "\\ no newline"


def parse(text):
    """The comment, and the steps as pairs of command and expected lines."""
    comment, steps = [], []
    for line in text.splitlines():
        if line.startswith("$ "):
            steps.append((line[2:], []))
        elif line.startswith("> ") and steps and not steps[-1][1]:
            steps[-1] = (steps[-1][0] + "\n" + line[2:], [])
        elif steps:
            steps[-1][1].append(line)
        else:
            comment.append(line)
    while steps and steps[-1][1] and not steps[-1][1][-1]:
        steps[-1][1].pop()
    return comment, steps


def environment(command, directory):
    path = [command.parent, Path(sys.executable).parent, "/usr/local/bin", "/usr/bin", "/bin"]
    kept = {name: value for name, value in os.environ.items() if name.endswith("SAN_OPTIONS")}
    return {
        **kept,
        "PATH": ":".join(map(str, path)),
        "HOME": str(directory),
        "LANG": "C",
        "BASH_FUNC_filled%%": """() { tr -s ' \n' ' ' | fold -sw 118 | sed 's/ $//'; echo; }""",
        "BASH_FUNC_await%%": """() { for ((line = 0; line < $1; line++)); do
            read -r -t 30 text <&3 && echo "${text#??:??:??.???  }"; done; }""",
        "DBUS_SYSTEM_BUS_ADDRESS": "unix:path=/nonexistent",
    }


def lines_of(output, mark=""):
    if not output:
        return []
    lines = [mark + line for line in output.decode("utf-8", "backslashreplace").split("\n")]
    return lines[:-1] if output.endswith(b"\n") else lines + [NO_NEWLINE]


def run(shell_command, directory, variables):
    done = subprocess.run(["bash", "-c", shell_command], cwd=directory, env=variables,
                          stdin=subprocess.DEVNULL, capture_output=True, timeout=140, umask=0o077)
    code = [f"[{done.returncode}]"] if done.returncode != 0 else []
    return lines_of(done.stdout) + lines_of(done.stderr, "! ") + code


def same(expected, actual):
    if expected.startswith("%"):
        return re.fullmatch(expected[1:], actual) is not None
    return expected in (actual, LINE_NUMBER.sub(r"\1#", actual))


def matches(expected, actual):
    return len(expected) == len(actual) and all(map(same, expected, actual))


def shown(shell_command, lines):
    return "\n".join(["$ " + shell_command.replace("\n", "\n> "), *lines])


def main():
    arguments = argparse.ArgumentParser(description=__doc__)
    arguments.add_argument("--update", action="store_true", help="write what was printed instead")
    arguments.add_argument("command", type=Path, help="the built command")
    arguments.add_argument("transcript", type=Path)
    options = arguments.parse_args()
    if not os.access(options.command, os.X_OK):
        sys.exit(f"{options.command}: no such command")
    comment, steps = parse(options.transcript.read_text("utf-8"))
    if not steps:
        sys.exit(f"{options.transcript}: no command")

    good, updated = True, list(comment)
    with tempfile.TemporaryDirectory() as directory:
        Path(directory, "devices").symlink_to(TREE / "tests/devices")
        Path(directory, "support").symlink_to(TREE / "tests/support")
        variables = environment(options.command.resolve(), directory)
        for shell_command, expected in steps:
            actual = run(shell_command, directory, variables)
            fits = matches(expected, actual)
            if not fits and any("line #" in line or ".toml:#" in line for line in expected):
                actual = [LINE_NUMBER.sub(r"\1#", line) for line in actual]
            updated.append(shown(shell_command, expected if fits else actual))
            if not fits and not options.update:
                good = False
                print("expected:", shown(shell_command, expected), "",
                      "got:", shown(shell_command, actual), "", sep="\n")
    if options.update:
        options.transcript.write_text("\n".join(updated) + "\n", "utf-8")
    sys.exit(0 if good else 1)


if __name__ == "__main__":
    main()
