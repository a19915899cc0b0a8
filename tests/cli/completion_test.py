#!/usr/bin/env python3
"""Every command and option that the help shows is completed, by a real shell:

    completion_test.py bash|zsh|fish COMMAND

Also that the name of a fact is, and that of a file where one is wanted.
"""
import subprocess
import sys
import tempfile
from pathlib import Path

import command_help

COMPLETIONS = Path(__file__).resolve().parent.parent.parent / "cli/completion"

BASH = f"""
source '{COMPLETIONS}/coresystem.bash'
complete -p coresystem >/dev/null || exit
COMP_WORDS=("$@")
COMP_CWORD=$(($# - 1))
_coresystem
printf '%s\\n' "${{COMPREPLY[@]}}"
"""

# Records the arguments of zsh's completion system; `-d` names the array with the words.
ZSH = f"""
_describe() {{ print -l -- "${{(@P)2}}" | sed 's/:.*//' }}
_files() {{ print -l -- *(N) }}
_command_names() {{ print -l -- ${{(k)commands}} }}
words=("$@")
CURRENT=$#
autoload -Uz compinit
fpath=('{COMPLETIONS}' $fpath)
compinit -u
[[ ${{_comps[coresystem]}} == _coresystem ]] || exit
_coresystem
"""

FISH = f"""
source '{COMPLETIONS}/coresystem.fish'
complete -C (string join ' ' -- $argv)
"""


def command_line(shell, words):
    if shell == "bash":
        return ["bash", "--norc", "-c", BASH, "bash", *words]
    if shell == "zsh":
        return ["zsh", "-f", "-c", ZSH, "zsh", *words]
    return ["fish", "--no-config", "-c", FISH, *words]


class Shell:
    def __init__(self, name, program, directory):
        self.name = name
        self.directory = directory
        self.environment = {"PATH": f"{program.parent}:/usr/bin:/bin", "HOME": directory,
                            "LC_ALL": "C.UTF-8", "TERM": "dumb"}

    def complete(self, *words):
        """What may take the place of the last word."""
        done = subprocess.run(command_line(self.name, ["coresystem", *words]), text=True,
                              cwd=self.directory, env=self.environment, capture_output=True,
                              stdin=subprocess.DEVNULL, timeout=60, check=True)
        assert not done.stderr, done.stderr
        return [line.split("\t")[0] for line in done.stdout.splitlines() if line]

    def expect(self, wanted, *words):
        got = self.complete(*words)
        missing = sorted(set(wanted) - set(got))
        assert not missing, f"{self.name}: {words} offers {got}, without {missing}"


def check(shell, program):
    everywhere = None
    for command, subcommands, options in command_help.walk(program):
        everywhere = everywhere or [option for option in options if option != "--version"]
        shell.expect(subcommands, *command, "")
        shell.expect([*options, *everywhere], *command, "--")
    facts = subprocess.run([program, "get", "--list"], stdout=subprocess.PIPE, text=True, check=True)
    shell.expect(facts.stdout.split(), "get", "")
    shell.expect(["language_code"], "--device", "phone.toml", "get", "lang")
    shell.expect(["phone.toml"], "info", "--device", "")
    shell.expect(["--color=never"], "info", "--color=n")
    shell.expect(["network.wifi=connected"], "device", "set", "network.wifi=con")
    shell.expect(["slot[0].sim=puk"], "device", "set", "slot[0].sim=pu")
    shell.expect(["fault.tel_init=null"], "device", "set", "fault.tel_init=")
    shell.expect(["settings.flight_mode=true"], "device", "set", "settings.flight_mode=t")
    shell.expect(["org.example.clock"], "package", "--device", "phone.toml", "org.")
    shell.expect(["sort"], "device", "run", "phone.toml", "--", "sor")
    shell.expect(["device"], "help", "dev")
    got = shell.complete("get", "device_n")
    assert got == ["device_name"], f"{shell.name}: the beginning of a fact offers {got}"


def main():
    name, program = sys.argv[1], Path(sys.argv[2]).resolve()
    with tempfile.TemporaryDirectory() as directory:
        Path(directory, "phone.toml").write_text(
            "schema = 1\n[packages]\n\"org.example.clock\" = \"1\"\n", "utf-8")
        check(Shell(name, program, directory), program)


main()
