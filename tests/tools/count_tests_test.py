#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""Gives tools/count-tests what ctest of Debian 12 and of Debian 13 wrote of the same nine entries (one of
each kind, ctest_VERSION.xml), with good and bad reports of the program among them."""
import pathlib
import subprocess
import sys
import tempfile
import unittest

HERE = pathlib.Path(__file__).parent
TOOL = sys.argv.pop(1)
ENTRY = "unit.programs.part0"
REASONS = {"3.25": ("", "", ""), "3.31": ("Failed", "Timeout", "SEGFAULT")}
PASSES = '<testcase classname="S" name="Passes" status="run" result="completed"/>'
FAILS = ('<testcase classname="S" name="Fails" status="run" result="completed">'
         '<failure message="a.cpp:3&#10;no"/></testcase>')
OTHERS = ('<testcase classname="S" name="Skips" status="run" result="skipped">'
          '<skipped message="a.cpp:4&#10;no radio here"/></testcase>'
          '<testcase classname="S" name="DISABLED_Off" status="notrun" result="suppressed"/>')


def report(cases, count):
    return f'<?xml version="1.0"?><testsuites tests="{count}"><testsuite>{cases}</testsuite></testsuites>'


def count(ctest, program, again=None):
    """The lines for ctest's report, the program's and that of a second run; no text, no report."""
    with tempfile.TemporaryDirectory() as folder:
        for name, text in (("ctest", ctest), (ENTRY, program), ("again", again)):
            if text is not None:
                (pathlib.Path(folder) / f"{name}.xml").write_text(text, encoding="utf-8")
        done = subprocess.run([TOOL, folder], stdout=subprocess.PIPE, text=True, check=True)
        return [tuple(line.split("\t")) for line in done.stdout.splitlines()]


class CountTests(unittest.TestCase):
    def test_every_kind_is_told_apart(self):
        for version, (fails, hangs, crashes) in REASONS.items():
            ctest = (HERE / f"ctest_{version}.xml").read_text(encoding="utf-8")
            with self.subTest(version):
                self.assertEqual(count(ctest, report(PASSES + OTHERS, 3)), [
                    ("passed", "passes", ""),
                    ("failed", "fails", fails),
                    ("skipped", "skips", "[ SKIPPED ] because"),
                    ("skipped", "skipsbycode", "SKIP_RETURN_CODE=77"),
                    ("skipped", "disabled", "disabled"),
                    ("failed", "missing", "Unable to find executable"),
                    ("failed", "hangs", hangs),
                    ("failed", "crashes", crashes),
                    ("passed", "unit.S.Passes", ""),
                    ("skipped", "unit.S.Skips", "no radio here"),
                    ("skipped", "unit.S.DISABLED_Off", "disabled"),
                ])

    def test_report_of_a_program_that_cannot_be_right_is_a_failure(self):
        ctest = (HERE / "ctest_3.31.xml").read_text(encoding="utf-8")
        for program in (None, "", "<testsuites", report("", 0), report(PASSES, 2), report(FAILS, 1),
                        "<html/>", report(PASSES.replace("completed", "pondered"), 1)):
            with self.subTest(program):
                self.assertIn(("failed", ENTRY), [line[:2] for line in count(ctest, program)])

    def test_program_that_failed_without_a_failed_test_is_a_failure(self):
        case = f'<testcase name="{ENTRY}" status="%s"/>'
        ctest = f'<testsuite tests="1">{case}</testsuite>'
        self.assertEqual([line[:2] for line in count(ctest % "fail", report(PASSES, 1))],
                         [("passed", "unit.S.Passes"), ("failed", ENTRY)])
        self.assertEqual([line[:2] for line in count(ctest % "fail", report(FAILS, 1))],
                         [("failed", "unit.S.Fails")])

    def test_what_ran_once_more_counts_as_it_did_then(self):
        case = '<testcase name="%s" status="%s"/>'
        first = f'<testsuite tests="2">{case % ("a", "fail")}{case % ("b", "fail")}</testsuite>'
        again = f'<testsuite tests="2">{case % ("a", "run")}{case % ("b", "fail")}</testsuite>'
        self.assertEqual(count(first, None, again), [("passed", "a", ""), ("failed", "b", "")])
        self.assertEqual([("failed", "ctest")], [line[:2] for line in count(first, None, "<testsuite")])

    def test_report_of_ctest_that_cannot_be_right_is_a_failure(self):
        for ctest in (None, "", "<testsuite", '<testsuite tests="0"/>', '<testsuite tests="2"><testcase '
                      'name="a" status="run"/></testsuite>', "<testsuites tests='1'/>"):
            with self.subTest(ctest):
                self.assertEqual([("failed", "ctest")], [line[:2] for line in count(ctest, None)])
        twice = '<testcase name="a" status="run"/>' * 2
        self.assertIn(("failed", "a", "told of twice"),
                      count(f'<testsuite tests="2">{twice}</testsuite>', None))


if __name__ == "__main__":
    unittest.main()
