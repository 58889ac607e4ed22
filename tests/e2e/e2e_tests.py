#!/usr/bin/python3
"""End-to-end tests of vantorel.exe under Wine on a virtual display.

Usage: e2e_tests.py BUILD_DIR [unittest options]

Each test copies the program into a folder of its own (the program reads sw2.def from its folder),
starts it inside a Wine desktop, reads its windows with vtprobe.exe, clicks with xdotool and reads
settings with `wine reg`. One Wine prefix and display serve the whole run.
"""
import os
import re
import shutil
import socket
import sys
import tempfile
import time
import unittest

import harness

BUILD = None
ARTIFACTS = None
SESSION = None


def setUpModule():
    global SESSION
    SESSION = harness.Session(BUILD)


def tearDownModule():
    if SESSION is not None:
        SESSION.close()


HKCU_KEY = r"HKEY_CURRENT_USER\SOFTWARE\Vantorel"
HKLM_KEY = r"HKEY_LOCAL_MACHINE\SOFTWARE\Vantorel"


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
    def setUp(self):
        # Settings left by another test ("Tray" = "1") would hide the window.
        SESSION.reg_delete_key(HKCU_KEY)
        SESSION.reg_delete_key(HKLM_KEY)

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
            # Then the updates window, modally; closed with the file still missing, a second message.
            updates = SESSION.find(lambda w: w.caption == "Updates" and w.visible)
            self.assertIsNotNone(updates, "the updates window opens")
            SESSION.post(updates, 0x10)  # WM_CLOSE
            second = SESSION.find(lambda w: w.caption == "Definitions Error" and w.visible)
            self.assertIsNotNone(second, "the program says it carries on without definitions")
            texts = [c.caption for c in SESSION.controls(second)]
            self.assertTrue(any("still missing" in t for t in texts), texts)
            self.click_button(second, "OK")
            main = SESSION.find(lambda w: w.cls == "VantorelFrmMain" and w.visible)
            self.assertIsNotNone(main, "start-up runs to its end")
            self.assertEqual(main.caption.split(" - ")[0], "Vantorel")
            self.assertIn("with 0 definitions", SESSION.program_output())
        finally:
            folder.remove()


DEFINITIONS = b"-939524086\r\n67305985"
WM_CLOSE, WM_SYSCOMMAND, SC_MINIMIZE = 0x10, 0x112, 0xF020


def is_main(w):
    return w.cls == "VantorelFrmMain"


def wait_for(condition, timeout=15):
    deadline = time.time() + timeout
    while time.time() < deadline:
        value = condition()
        if value:
            return value
        time.sleep(0.3)
    return condition()


class MainWindow(unittest.TestCase):
    """The real program on an empty (or prepared) registry, driven with real clicks."""

    def setUp(self):
        SESSION.reg_delete_key(HKCU_KEY)
        SESSION.reg_delete_key(HKLM_KEY)
        self.folder = ProgramFolder(definitions=DEFINITIONS)

    def tearDown(self):
        SESSION.close_program()
        self.folder.remove()

    def start(self):
        SESSION.start(self.folder.exe)
        self.assertTrue(wait_for(lambda: "Started" in SESSION.program_output(), 60), SESSION.program_output())

    def main_window(self, visible=True):
        return SESSION.find(lambda w: is_main(w) and w.visible == visible, timeout=10)

    def control(self, window, predicate):
        return next((c for c in SESSION.controls(window) if predicate(c)), None)

    def ended(self):
        """The program has gone: its window no longer exists and it said it unloaded."""
        return wait_for(lambda: "Unloaded" in SESSION.program_output()
                        and not any(is_main(w) for w in SESSION.windows()), 20)

    def test_first_start_shows_off_and_two_clicks_restore_state_and_registry(self):
        self.start()
        window = self.main_window()
        self.assertIsNotNone(window, "the window is shown on a first start")
        self.assertEqual(window.caption, "Vantorel -  0 attempts intercepted")
        switch = self.control(window, lambda c: c.cls == "KirelXPButton")
        self.assertIsNotNone(switch)
        self.assertEqual(switch.caption, "OFF")
        self.assertEqual(SESSION.reg_query(HKCU_KEY, "State"), "0")
        captions = sorted(c.caption for c in SESSION.controls(window) if c.cls.lower() == "button")
        self.assertEqual(captions, sorted(["&Tray", "&Exit", "&Help", "&Updates", "&Options"]))
        time.sleep(1.2)
        SESSION.screenshot(os.path.join(ARTIFACTS, "main-window-off.png"))

        SESSION.click(*switch.centre())
        self.assertTrue(wait_for(lambda: SESSION.reg_query(HKCU_KEY, "State") == "1"), "one click switches on")
        self.assertEqual(self.control(window, lambda c: c.cls == "KirelXPButton").caption, "ON")
        time.sleep(1.5)  # a status tick puts the padlock up
        self.assertIn("Light: padlock", SESSION.program_output())
        SESSION.move(switch.rect[2] + 200, switch.rect[3] + 100)  # the pointer leaves: no hover look
        time.sleep(0.5)
        SESSION.screenshot(os.path.join(ARTIFACTS, "main-window-on.png"))

        SESSION.click(*switch.centre())
        self.assertTrue(wait_for(lambda: SESSION.reg_query(HKCU_KEY, "State") == "0"), "a second click switches off")
        self.assertEqual(self.control(window, lambda c: c.cls == "KirelXPButton").caption, "OFF")
        self.assertEqual(SESSION.program_output().count("Guard "), 2, SESSION.program_output())

        exit_button = self.control(window, lambda c: c.caption == "&Exit")
        SESSION.click(*exit_button.centre())
        self.assertTrue(self.ended(), "\"&Exit\" ends the program")

    def test_stored_state_on_starts_on(self):
        SESSION.reg_add(HKCU_KEY, "State", "1")
        self.start()
        self.assertIn("guard on", SESSION.program_output())
        window = self.main_window()
        self.assertEqual(self.control(window, lambda c: c.cls == "KirelXPButton").caption, "ON")
        self.assertEqual(SESSION.reg_query(HKCU_KEY, "State"), "1")
        self.assertTrue(wait_for(lambda: "Swept the connection table" in SESSION.program_output()), "it sweeps")

    def test_tray_setting_starts_hidden_and_the_close_button_ends_the_program(self):
        SESSION.reg_add(HKLM_KEY, "Tray", "1")
        self.start()
        hidden = self.main_window(visible=False)
        self.assertIsNotNone(hidden, "the window exists, hidden")
        self.assertIsNone(SESSION.find(lambda w: is_main(w) and w.visible, timeout=2))
        SESSION.post(hidden, WM_CLOSE)
        self.assertTrue(self.ended(), "closing the window ends the program")

    def test_minimising_hides_the_window_in_the_tray(self):
        self.start()
        window = self.main_window()
        SESSION.post(window, WM_SYSCOMMAND, SC_MINIMIZE)
        self.assertIsNotNone(SESSION.find(lambda w: is_main(w) and not w.visible, timeout=10),
                             "minimised, the window goes to the tray")
        self.assertIsNone(SESSION.find(lambda w: is_main(w) and w.visible, timeout=2))
        self.assertIn("Hidden in the tray", SESSION.program_output())


    def test_the_layout_scales_with_the_screen_density(self):
        """At 144 DPI (150 %) the declared DPI awareness gives the design's twips at 10 per pixel."""
        desktop = r"HKEY_CURRENT_USER\Control Panel\Desktop"
        harness._run(["wine", "reg", "add", desktop, "/v", "LogPixels", "/t", "REG_DWORD", "/d", "144", "/f"],
                     SESSION.env)
        SESSION.close_program()  # the density is read when the Wine session starts
        try:
            self.start()
            window = self.main_window()
            self.assertIsNotNone(window)

            def size(c):
                return c.rect[2] - c.rect[0], c.rect[3] - c.rect[1]

            def px(twips):
                return (twips * 144 + 720) // 1440

            switch = self.control(window, lambda c: c.cls == "KirelXPButton")
            self.assertEqual(size(switch), (px(2415), px(4095)))
            controls = SESSION.controls(window)
            row = [c for c in controls if c.caption in ("&Tray", "&Exit", "&Help")]
            self.assertEqual([size(c) for c in row], [(px(2055), px(495))] * 3, controls)
            exit_button = self.control(window, lambda c: c.caption == "&Exit")
            self.assertEqual(exit_button.rect[0] - switch.rect[0], px(4800) - px(120))
            time.sleep(1.2)
            SESSION.screenshot(os.path.join(ARTIFACTS, "main-window-150.png"))
        finally:
            harness._run(["wine", "reg", "delete", desktop, "/v", "LogPixels", "/f"], SESSION.env)
            SESSION.close_program()


    def test_a_second_instance_exits_silently(self):
        self.start()
        SESSION.reg_add(HKCU_KEY, "State", "1")  # a second start that read it would write it back
        code, said = SESSION.run(self.folder.exe)
        self.assertEqual((code, said), (0, ""), "ends at once, saying nothing")
        time.sleep(1)
        self.assertEqual(len([w for w in SESSION.windows() if is_main(w)]), 1, "no second window")
        self.assertEqual(SESSION.reg_query(HKCU_KEY, "State"), "1")

    def test_the_access_key_of_a_button_works(self):
        self.start()
        window = self.main_window()
        SESSION.click(window.rect[0] + 100, window.rect[1] + 10)  # activate it by its title bar
        time.sleep(0.5)
        SESSION.key("alt+t")
        self.assertIsNotNone(SESSION.find(lambda w: is_main(w) and not w.visible, timeout=10),
                             "Alt+T presses \"&Tray\"")

    def listed_connection(self, unlisted=0):
        """Guard on, 127.0.0.2 listed (key 33554559) and one connection to it, plus `unlisted`
        connections to 127.0.0.1 that make every sweep longer. Under Wine SetTcpEntry is a stub that
        answers success and closes nothing, so every sweep counts the listed connection again."""
        self.folder.remove()
        self.folder = ProgramFolder(definitions=b"-939524086\r\n33554559")
        SESSION.reg_add(HKCU_KEY, "State", "1")
        sockets = []
        for host, n in (("127.0.0.2", 1), ("127.0.0.1", unlisted)):
            if n == 0:
                continue
            listener = socket.socket()
            listener.bind((host, 0))
            listener.listen(n + 8)
            sockets.append(listener)
            sockets += [socket.create_connection(listener.getsockname()) for _ in range(n)]
        self.addCleanup(lambda: [s.close() for s in sockets])

    def count(self):
        w = SESSION.find(is_main, timeout=5)
        return int(w.caption.split()[2]) if w is not None else 0

    def test_a_listed_loopback_connection_makes_the_count_grow(self):
        self.listed_connection()
        self.start()
        first = wait_for(self.count, 20)
        self.assertGreater(first, 0, "the connection is counted")
        self.assertTrue(wait_for(lambda: self.count() > first, 20), "and the count keeps growing")
        self.assertGreater(int(SESSION.reg_query(HKCU_KEY, "Attempts")), 0)

    def test_the_guard_keeps_sweeping_while_the_options_window_is_open(self):
        """With 1,500 more connections a sweep takes longer than the 55 ms between ticks, so the
        click on "&Options" is nearly always handled in the middle of one."""
        self.listed_connection(unlisted=1500)
        self.start()
        self.assertTrue(wait_for(lambda: self.count() > 0, 30), "the connection is counted")
        window = self.main_window()
        for attempt in range(3):
            SESSION.click(*self.control(window, lambda c: c.caption == "&Options").centre())
            options = SESSION.find(lambda w: w.caption == "Options" and w.visible, timeout=10)
            self.assertIsNotNone(options, "the options window opens")
            before = self.count()
            self.assertTrue(wait_for(lambda: self.count() > before + 1, 15),
                            "attempt %d: sweeps go on while the options window is open" % attempt)
            SESSION.post(options, WM_CLOSE)
            self.assertTrue(wait_for(lambda: not any(w.caption == "Options" for w in SESSION.windows()), 10))
        examined = re.findall(r"the last sweep examined (\d+) rows", SESSION.program_output())
        self.assertGreater(int(examined[-1]), 1500, "every sweep looked at the many connections")


if __name__ == "__main__":
    BUILD = os.path.abspath(sys.argv.pop(1))
    ARTIFACTS = os.path.dirname(BUILD)
    unittest.main(verbosity=2)
