#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""The errata are what the distribution's data says, and a row less or more is noticed.

usage: country_data_test.py TOOL DATA CALLING_CODES_PROGRAM
"""
import os
import shutil
import subprocess
import sys
import tempfile

NEEDED = ["iso-codes/json/iso_3166-1.json", "mobile-broadband-provider-info/serviceproviders.xml",
          "i18n/locales/en_GB"]


def check(tool, data, program):
    return subprocess.run([tool, "--data", data, "--calling-codes", program], text=True,
                          capture_output=True)


def main():
    tool, data, program = sys.argv[1:]
    if not all(os.path.exists(f"/usr/share/{path}") for path in NEEDED):
        print("skipped: a package with the data is not installed")
        return 77
    done = check(tool, data, program)
    assert done.returncode == 0, done.stdout + done.stderr
    for name in ["errata.tsv", "area-codes.tsv", "disagreements.tsv"]:
        with open(f"{data}/{name}", encoding="utf-8") as file:
            lines = file.readlines()
        changed = [lines[:-1]]
        if name == "errata.tsv":
            changed.append(lines + ["CallingCodeTable\t262\tcalling_code\t49\t48\tnobody\t2026-11-22\n"])
            changed.append([line.replace("\t359\t", "\t358\t") for line in lines])
        for each in changed:
            with tempfile.TemporaryDirectory() as folder:
                copy = shutil.copytree(data, f"{folder}/data")
                with open(f"{copy}/{name}", "w", encoding="utf-8") as file:
                    file.writelines(each)
                assert check(tool, copy, program).returncode == 1, (name, each[-1])
    return 0


if __name__ == "__main__":
    sys.exit(main())
