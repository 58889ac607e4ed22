#!/usr/bin/python3
"""End-to-end tests of vantorel.exe under Wine on a virtual display.

Usage: e2e_tests.py BUILD_DIR [unittest options]

Each test copies the program into a folder of its own (the program reads sw2.def from its folder),
starts it inside a Wine desktop, reads its windows with vtprobe.exe, clicks with xdotool and reads
settings with `wine reg`. One Wine prefix and display serve the whole run.
"""
import os
import shutil
import sys
import tempfile
import unittest

import harness

BUILD = None
SESSION = None


def setUpModule():
    global SESSION
    SESSION = harness.Session(BUILD)


def tearDownModule():
    if SESSION is not None:
        SESSION.close()


class ProgramFolder:
    """A folder holding a copy of vantorel.exe and, optionally, a definitions file."""

    def __init__(self, definitions=None):
        self.path = tempfile.mkdtemp(prefix="vantorel-e2e-", dir=BUILD)
        self.exe = os.path.join(self.path, "vantorel.exe")
        shutil.copy(os.path.join(BUILD, "vantorel.exe"), self.exe)
        if definitions is not None:
            with open(os.path.join(self.path, "sw2.def"), "wb") as f:
                f.write(definitions)

    def remove(self):
        shutil.rmtree(self.path, ignore_errors=True)


class StartUp(unittest.TestCase):
    def tearDown(self):
        SESSION.close_program()

    def click_button(self, window, caption):
        button = next(c for c in SESSION.controls(window) if c.caption == caption)
        SESSION.click(*button.centre())

    def test_missing_definitions_are_reported_and_the_program_carries_on(self):
        folder = ProgramFolder(definitions=None)
        try:
            SESSION.start(folder.exe)
            error = SESSION.find(lambda w: w.caption == "Definitions Error" and w.visible)
            self.assertIsNotNone(error, "the missing file is reported")
            texts = [c.caption for c in SESSION.controls(error)]
            self.assertTrue(any(t.startswith("Reading definitions, installation corrupted re-install at ")
                                for t in texts), texts)
            self.click_button(error, "OK")
            gone = SESSION.find(lambda w: w.caption == "Definitions Error" and w.visible, timeout=3)
            self.assertIsNone(gone)
            self.assertIsNone(SESSION.program.poll(), "the program does not end silently")
        finally:
            folder.remove()


if __name__ == "__main__":
    BUILD = os.path.abspath(sys.argv.pop(1))
    unittest.main(verbosity=2)
