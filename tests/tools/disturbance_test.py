#!/usr/bin/env python3
# SPDX-License-Identifier: Apache-2.0
"""What tools/disturbance says of a machine, and of one that stands still while it looks."""
import importlib.util
import signal
import subprocess
import sys
import time
import unittest
from importlib.machinery import SourceFileLoader

TOOL = sys.argv.pop(1)
LOADER = SourceFileLoader("disturbance", TOOL)
MODULE = importlib.util.module_from_spec(importlib.util.spec_from_loader(LOADER.name, LOADER))
sys.dont_write_bytecode = True
LOADER.exec_module(MODULE)


class Disturbance(unittest.TestCase):
    def test_limits(self):
        for (taken, passed, pause), said in (
                ((0, 0, 0), ""), ((2, 100, 0.24), ""),
                ((3, 100, 0.24), "others took 3 % of this machine's time"),
                ((2, 100, 0.25), "it stood still for 0.2 s"),
                ((50, 100, 3.44), "others took 50 % of this machine's time and it stood still for 3.4 s")):
            with self.subTest((taken, passed, pause)):
                self.assertEqual(MODULE.description(taken, passed, pause), said)

    def test_machine_that_stands_still(self):
        watcher = subprocess.Popen([TOOL], stdout=subprocess.PIPE, text=True)
        while not self.is_watching(watcher.pid):
            pass
        watcher.send_signal(signal.SIGSTOP)
        time.sleep(0.4)  # is the pause
        watcher.send_signal(signal.SIGCONT)
        watcher.terminate()
        said, _ = watcher.communicate(timeout=10)
        self.assertRegex(said, r"it stood still for \d+\.\d s\n$")
        self.assertEqual(watcher.returncode, 0)

    @staticmethod
    def is_watching(pid):
        """Whether it has come to handle SIGTERM."""
        with open(f"/proc/{pid}/status", encoding="ascii") as status:
            handled = next(line for line in status if line.startswith("SigCgt:")).split()[1]
        return int(handled, 16) & 1 << signal.SIGTERM - 1 != 0


if __name__ == "__main__":
    unittest.main()
