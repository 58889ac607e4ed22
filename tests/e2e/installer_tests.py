#!/usr/bin/python3
"""VTSetup.exe under Wine in a fresh prefix, in order: a silent install, an upgrade over the running program,
a silent uninstall that leaves nothing of ours; then publishing a release. Usage: installer_tests.py BUILD_DIR"""
import os
import re
import shutil
import subprocess
import sys
import tempfile
import unittest

import harness
from harness import is_main, wait_for

BUILD = None
SESSION = None
ROOT = os.path.dirname(os.path.dirname(os.path.dirname(os.path.abspath(__file__))))

PROGRAM_FILES = r"C:\Program Files\Vantorel"
UNINSTALL_KEY = r"HKLM\Software\Microsoft\Windows\CurrentVersion\Uninstall\Vantorel"
RUN = r"SOFTWARE\Microsoft\Windows\CurrentVersion\Run"
HKCU_KEY, HKLM_KEY = r"HKCU\SOFTWARE\Vantorel", r"HKLM\SOFTWARE\Vantorel"
TASK = """<?xml version="1.0"?>
<Task version="1.2" xmlns="http://schemas.microsoft.com/windows/2004/02/mit/task">
  <Actions><Exec><Command>"C:\\Program Files\\Vantorel\\vantorel.exe"</Command></Exec></Actions>
</Task>
"""


def unix(windows_path):
    return os.path.join(SESSION.prefix, "drive_c", *windows_path[3:].split("\\"))


def setup_exe():
    return "Z:" + os.path.join(BUILD, "release", "VTSetup.exe").replace("/", "\\")


def version():
    text = read(os.path.join(BUILD, "generated", "version.h")).decode()
    return ".".join(re.search(rf"kVersion{part} = (\d+)", text).group(1) for part in ("Major", "Minor"))


def read(path):
    with open(path, "rb") as f:
        return f.read()


def write(path, data):
    with open(path, "wb") as f:
        f.write(data)


def setUpModule():
    global SESSION
    prefix = os.path.join(BUILD, "installer-wineprefix")
    shutil.rmtree(prefix, ignore_errors=True)
    SESSION = harness.Session(BUILD, prefix=prefix)


def tearDownModule():
    SESSION.close()


class Setup(unittest.TestCase):
    folder = property(lambda self: unix(PROGRAM_FILES))

    def test_1_silent_install(self):
        self.assertIn(b'level="requireAdministrator"', read(os.path.join(BUILD, "release", "VTSetup.exe")))
        # A program still running (its named mutex held) without a window: the setup waits for its end.
        with tempfile.TemporaryFile() as said:
            holder = subprocess.Popen(["wine", os.path.join(BUILD, "vtprobe.exe"), "hold", "Vantorel", "3000"],
                                      env=SESSION.env, stdin=subprocess.DEVNULL, stdout=said, stderr=subprocess.DEVNULL)
            self.assertTrue(wait_for(lambda: said.seek(0) == 0 and b"held" in said.read()))
            self.assertEqual(SESSION.run_in_desktop(setup_exe() + " /S"), 0)
            self.assertIsNotNone(holder.poll(), "the setup returned after the program had ended")
        self.assertEqual(sorted(os.listdir(self.folder)), ["defver", "sw2.def", "uninstall.exe", "vantorel.exe"])
        self.assertEqual(read(os.path.join(self.folder, "vantorel.exe")), read(os.path.join(BUILD, "vantorel.exe")))
        self.assertEqual(read(os.path.join(self.folder, "sw2.def")), read(os.path.join(ROOT, "data", "sw2.def")))
        shortcut = read(unix(r"C:\ProgramData\Microsoft\Windows\Start Menu\Programs\Vantorel.lnk"))
        self.assertIn((PROGRAM_FILES + r"\vantorel.exe").encode("utf-16-le"), shortcut)
        entry = SESSION.reg_values(UNINSTALL_KEY)
        size = sum(os.path.getsize(os.path.join(self.folder, f)) for f in os.listdir(self.folder))
        self.assertEqual(entry.pop("EstimatedSize"), size // 1024, "in KB")
        self.assertEqual(entry, {
            "DisplayName": "Vantorel", "DisplayVersion": version(), "Publisher": "Vantorel",
            "VersionMajor": int(version().split(".")[0]), "VersionMinor": int(version().split(".")[1]),
            "DisplayIcon": PROGRAM_FILES + r"\vantorel.exe,0", "InstallLocation": PROGRAM_FILES,
            "UninstallString": f'"{PROGRAM_FILES}\\uninstall.exe"',
            "QuietUninstallString": f'"{PROGRAM_FILES}\\uninstall.exe" /S', "NoModify": 1, "NoRepair": 1})
        self.assertEqual(SESSION.reg_values(r"HKLM\SOFTWARE\Vantorel"), None, "no settings written")

    def test_2_upgrade_over_the_running_program(self):
        SESSION.start(PROGRAM_FILES + r"\vantorel.exe")
        self.assertTrue(wait_for(lambda: "Started" in SESSION.said(), 60), SESSION.said())
        self.assertIn(f"definitions from {PROGRAM_FILES}\\sw2.def", SESSION.said())
        SESSION.reg_add(HKCU_KEY, "Attempts", "42")
        SESSION.reg_add(HKLM_KEY, "Tray", "0")
        newer = b"16777343\r\n"
        # The second time with the updates window open, as after the update check fetched VTSetup.exe.
        for defver, kept, updates_open in ((b"99\r\n", True, False), (b" 0.5\r\n", False, True)):
            with self.subTest(installed_defver=defver):
                write(os.path.join(self.folder, "defver"), defver)
                write(os.path.join(self.folder, "sw2.def"), newer)
                first = SESSION.find(is_main, timeout=30)
                self.assertIsNotNone(first, "the program runs")
                if updates_open:
                    button = next(c for c in SESSION.windows(first) if c.caption == "&Updates")
                    SESSION.post(button, 0xF5)  # BM_CLICK
                    self.assertIsNotNone(SESSION.find(lambda w: w.caption == "Updates" and w.visible))
                self.assertEqual(SESSION.run_in_desktop(setup_exe() + " /S"), 0)
                self.assertFalse(any(w.hwnd == first.hwnd for w in SESSION.windows()), "it was closed")
                self.assertIsNotNone(SESSION.find(is_main, timeout=30), "and started again")
                self.assertEqual(read(os.path.join(self.folder, "defver")),
                                 defver if kept else read(os.path.join(ROOT, "data", "defver")))
                self.assertEqual(read(os.path.join(self.folder, "sw2.def")) == newer, kept)
        self.assertIn("Unloaded", SESSION.said(), "the first one ended by its own exit path")
        self.assertEqual((SESSION.reg_query(HKCU_KEY, "Attempts"), SESSION.reg_query(HKLM_KEY, "Tray")), ("42", "0"))

    def test_3_silent_uninstall_leaves_nothing_of_ours(self):
        self.assertIsNotNone(SESSION.find(is_main, timeout=30), "the program runs")
        task = os.path.join(BUILD, "installer-task.xml")
        write(task, TASK.encode())
        harness.run(["wine", "schtasks", "/create", "/xml", "Z:" + task.replace("/", "\\"), "/tn", "Vantorel", "/f"],
                     SESSION.env)
        self.assertTrue(os.path.exists(unix(r"C:\windows\system32\tasks\Vantorel")))
        for root in ("HKLM", "HKCU"):
            SESSION.reg_add(root + "\\" + RUN, "Vantorel", f'"{PROGRAM_FILES}\\vantorel.exe"')
        SESSION.reg_add("HKLM\\" + RUN, "Other", "other.exe")
        write(os.path.join(self.folder, "VTSetup.exe"), b"left by the update check")
        self.assertEqual(SESSION.run_in_desktop(f'"{PROGRAM_FILES}\\uninstall.exe" /S'), 0)
        self.assertTrue(wait_for(lambda: not os.path.exists(self.folder), 60), "the folder goes")
        self.assertFalse(any(is_main(w) for w in SESSION.windows()))
        self.assertFalse(os.path.exists(unix(r"C:\windows\system32\tasks\Vantorel")))
        for key in (UNINSTALL_KEY, HKCU_KEY, HKLM_KEY):
            self.assertIsNone(SESSION.reg_values(key), key)
        self.assertEqual(SESSION.reg_values("HKLM\\" + RUN), {"Other": "other.exe"})
        self.assertNotIn("Vantorel", SESSION.reg_values("HKCU\\" + RUN) or {})
        found = subprocess.run(["find", os.path.join(SESSION.prefix, "drive_c"), "-iname", "*vantorel*"],
                               capture_output=True, text=True).stdout
        self.assertEqual(found, "")


class Publish(unittest.TestCase):
    def test_a_release_goes_to_the_update_server_without_downgrades(self):
        release = os.path.join(BUILD, "release")
        with tempfile.TemporaryDirectory() as root:
            vt = os.path.join(root, "vt")

            def publish():
                return subprocess.run([os.path.join(ROOT, "deploy", "publish-release"), release, root],
                                      capture_output=True).returncode

            self.assertEqual(publish(), 0)
            names = ["VTSetup.exe", "defver", "mainver", "sw2.def"]
            self.assertEqual(sorted(os.listdir(vt)), names)
            for n in names:
                self.assertEqual(read(os.path.join(vt, n)), read(os.path.join(release, n)), n)
            self.assertEqual(read(os.path.join(vt, "mainver")).strip().decode(), version())
            write(os.path.join(vt, "defver"), b"25")  # definitions updated on the server since
            write(os.path.join(vt, "sw2.def"), b"newer")
            write(os.path.join(vt, "VTSetup.exe"), b"")
            self.assertEqual(publish(), 0)
            self.assertEqual(read(os.path.join(vt, "sw2.def")), b"newer")
            self.assertEqual(os.path.getsize(os.path.join(vt, "VTSetup.exe")),
                             os.path.getsize(os.path.join(release, "VTSetup.exe")))
            write(os.path.join(vt, "mainver"), b"99.0")  # a newer program on the server
            write(os.path.join(vt, "VTSetup.exe"), b"")
            self.assertEqual(publish(), 1)
            self.assertEqual(read(os.path.join(vt, "VTSetup.exe")), b"")


if __name__ == "__main__":
    BUILD = os.path.abspath(sys.argv.pop(1))
    unittest.main(verbosity=2)
