"""What the help of the command `coresystem` shows: its commands, and the options of each."""
import re
import subprocess


def _text(program, command):
    done = subprocess.run([program, *command, "--help"], capture_output=True, text=True,
                          stdin=subprocess.DEVNULL, timeout=60, check=True)
    return done.stdout


def _section(text, title):
    """The lines under a title, up to the next line that is not indented."""
    found = re.search(rf"^{title}:\n((?:[ \t].*\n|\n)*)", text, re.MULTILINE)
    return found.group(1) if found else ""


def _words_at_line_starts(text, pattern):
    return re.findall(rf"^  ({pattern})", text, re.MULTILINE)


def walk(program, command=()):
    """Yields each command as a tuple of words, () first, with its subcommands and its options."""
    text = _text(program, command)
    subcommands = _words_at_line_starts(_section(text, "Commands"), "[a-z-]+")
    options = re.findall(r"^  (?:-\w, )?(--[a-z-]+)", _section(text, "Options"), re.MULTILINE)
    assert options, f"no options in the help of {command}:\n{text}"
    yield command, subcommands, options
    for name in subcommands:
        yield from walk(program, (*command, name))
