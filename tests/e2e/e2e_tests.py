#!/usr/bin/python3
"""End-to-end journeys of vantorel.exe under Wine on a virtual display.

Usage: e2e_tests.py BUILD_DIR [unittest options]

Each test copies the program into a folder of its own (it reads sw2.def from its folder), starts it
inside a Wine desktop on an empty (or prepared) registry, reads its windows with vtprobe.exe,
clicks with xdotool and reads settings with `wine reg`. One Wine prefix and display serve the run.
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
from harness import wait_for

BUILD = ARTIFACTS = SESSION = None
HKCU_KEY = r"HKEY_CURRENT_USER\SOFTWARE\Vantorel"
HKLM_KEY = r"HKEY_LOCAL_MACHINE\SOFTWARE\Vantorel"
DESKTOP_KEY = r"HKEY_CURRENT_USER\Control Panel\Desktop"
WM_CLOSE, WM_SYSCOMMAND, SC_MINIMIZE = 0x10, 0x112, 0xF020


def setUpModule():
    global SESSION
    SESSION = harness.Session(BUILD)


def tearDownModule():
    if SESSION is not None:
        SESSION.close()


def is_main(w):
    return w.cls == "VantorelFrmMain"


class Journeys(unittest.TestCase):
    def setUp(self):
        SESSION.reg("delete", HKCU_KEY)
        SESSION.reg("delete", HKLM_KEY)
        self.folder = tempfile.mkdtemp(prefix="vantorel-e2e-", dir=BUILD)
        self.exe = os.path.join(self.folder, "vantorel.exe")
        shutil.copy(os.path.join(BUILD, "vantorel.exe"), self.exe)
        self.definitions(b"-939524086\r\n67305985")

    def tearDown(self):
        SESSION.close_program()
        shutil.rmtree(self.folder, ignore_errors=True)

    def definitions(self, content):
        path = os.path.join(self.folder, "sw2.def")
        if content is None:
            os.remove(path)
        else:
            with open(path, "wb") as f:
                f.write(content)

    def start(self, started=True):
        SESSION.start(self.exe)
        if started:
            self.assertTrue(wait_for(lambda: "Started" in SESSION.said(), 60), SESSION.said())

    def main_window(self, visible=True, timeout=10):
        return SESSION.find(lambda w: is_main(w) and w.visible == visible, timeout)

    def control(self, window, predicate):
        return next((c for c in SESSION.windows(window) if predicate(c)), None)

    def switch(self, window):
        return self.control(window, lambda c: c.cls == "KirelXPButton")

    def ended(self):
        """The program has gone: it said it unloaded and its window no longer exists."""
        return wait_for(lambda: "Unloaded" in SESSION.said() and not any(map(is_main, SESSION.windows())), 20)

    def test_first_start_then_two_clicks_on_the_switch_then_exit(self):
        self.start()
        window = self.main_window()
        self.assertIsNotNone(window, "the window is shown on a first start")
        self.assertEqual(window.caption, "Vantorel -  0 attempts intercepted")
        self.assertEqual(self.switch(window).caption, "OFF")
        self.assertEqual(SESSION.reg_query(HKCU_KEY, "State"), "0")
        captions = sorted(c.caption for c in SESSION.windows(window) if c.cls.lower() == "button")
        self.assertEqual(captions, sorted(["&Tray", "&Exit", "&Help", "&Updates", "&Options"]))
        time.sleep(1.2)
        SESSION.screenshot(os.path.join(ARTIFACTS, "main-window-off.png"))

        switch = self.switch(window)
        SESSION.click(*switch.centre())
        self.assertTrue(wait_for(lambda: SESSION.reg_query(HKCU_KEY, "State") == "1"), "one click switches on")
        self.assertEqual(self.switch(window).caption, "ON")
        self.assertTrue(wait_for(lambda: "Light: padlock" in SESSION.said()), "a status tick puts the padlock up")
        SESSION.xdotool("mousemove", switch.rect[2] + 200, switch.rect[3] + 100)  # no hover look on the shot
        time.sleep(0.5)
        SESSION.screenshot(os.path.join(ARTIFACTS, "main-window-on.png"))

        SESSION.click(*switch.centre())
        self.assertTrue(wait_for(lambda: SESSION.reg_query(HKCU_KEY, "State") == "0"), "a second click switches off")
        self.assertEqual(self.switch(window).caption, "OFF")
        self.assertEqual(SESSION.said().count("Guard "), 2, SESSION.said())
        SESSION.click(*self.control(window, lambda c: c.caption == "&Exit").centre())
        self.assertTrue(self.ended(), "\"&Exit\" ends the program")

    def test_missing_definitions_are_reported_and_the_program_carries_on(self):
        self.definitions(None)
        self.start(started=False)
        for expected in ("Reading definitions, installation corrupted re-install at ", "still missing"):
            box = SESSION.find(lambda w: w.caption == "Definitions Error" and w.visible)
            self.assertIsNotNone(box, expected)
            texts = [c.caption for c in SESSION.windows(box)]
            self.assertTrue(any(expected in t for t in texts), texts)
            SESSION.click(*self.control(box, lambda c: c.caption == "OK").centre())
            self.assertIsNone(SESSION.program.poll(), "the program does not end silently")
            if expected.startswith("Reading"):  # then the updates window, closed with the file still missing
                updates = SESSION.find(lambda w: w.caption == "Updates" and w.visible)
                self.assertIsNotNone(updates, "the updates window opens")
                SESSION.post(updates, WM_CLOSE)
        self.assertIsNotNone(self.main_window(), "start-up runs to its end")
        self.assertIn("with 0 definitions", SESSION.said())

    def test_a_listed_loopback_connection_is_counted_also_while_the_options_window_is_open(self):
        """127.0.0.2 is listed (key 33554559). Under Wine SetTcpEntry is a stub that answers success
        and closes nothing, so every sweep counts the connection again. 1,500 more connections to
        127.0.0.1 make a sweep longer than the 55 ms between ticks, so a click on "&Options" is
        nearly always handled in the middle of one."""
        self.definitions(b"-939524086\r\n33554559")
        SESSION.reg("add", HKCU_KEY, "/v", "State", "/t", "REG_SZ", "/d", "1")
        sockets = []
        for host, n in (("127.0.0.2", 1), ("127.0.0.1", 1500)):
            listener = socket.socket()
            listener.bind((host, 0))
            listener.listen(n + 8)
            sockets += [listener] + [socket.create_connection(listener.getsockname()) for _ in range(n)]
        self.addCleanup(lambda: [s.close() for s in sockets])
        self.start()
        window = self.main_window()
        self.assertEqual(self.switch(window).caption, "ON")

        def count():
            w = SESSION.find(is_main, timeout=5)
            return int(w.caption.split()[2]) if w is not None else 0

        first = wait_for(count, 30)
        self.assertGreater(first, 0, "the connection is counted")
        self.assertTrue(wait_for(lambda: count() > first, 20), "and counted again by later sweeps")
        self.assertGreater(int(SESSION.reg_query(HKCU_KEY, "Attempts")), 0)
        for attempt in range(3):
            SESSION.click(*self.control(window, lambda c: c.caption == "&Options").centre())
            options = SESSION.find(lambda w: w.caption == "Options" and w.visible, timeout=10)
            self.assertIsNotNone(options, "the options window opens")
            before = count()
            self.assertTrue(wait_for(lambda: count() > before + 1, 15),
                            "attempt %d: sweeps go on while the options window is open" % attempt)
            SESSION.post(options, WM_CLOSE)
            self.assertTrue(wait_for(lambda: not any(w.caption == "Options" for w in SESSION.windows()), 10))
        examined = re.findall(r"the last sweep examined (\d+) rows", SESSION.said())
        self.assertGreater(int(examined[-1]), 1500, "every sweep looked at the many connections")

    def test_a_second_instance_exits_silently(self):
        self.start()
        SESSION.reg("add", HKCU_KEY, "/v", "State", "/t", "REG_SZ", "/d", "1")  # a second start would rewrite it
        self.assertEqual(harness.run(["wine", self.exe], SESSION.env), (0, ""), "ends at once, saying nothing")
        time.sleep(1)
        self.assertEqual(len([w for w in SESSION.windows() if is_main(w)]), 1, "no second window")
        self.assertEqual(SESSION.reg_query(HKCU_KEY, "State"), "1")

    def test_hidden_in_the_tray_by_setting_by_minimising_and_by_alt_t(self):
        SESSION.reg("add", HKLM_KEY, "/v", "Tray", "/t", "REG_SZ", "/d", "1")
        self.start()
        hidden = self.main_window(visible=False)
        self.assertIsNotNone(hidden, "\"Tray\" = \"1\" starts hidden")
        self.assertIsNone(self.main_window(timeout=2))
        SESSION.post(hidden, WM_CLOSE)
        self.assertTrue(self.ended(), "closing the window ends the program")

        SESSION.reg("delete", HKLM_KEY)
        for hide in ("minimise", "alt+t"):
            self.start()
            window = self.main_window()
            if hide == "minimise":
                SESSION.post(window, WM_SYSCOMMAND, SC_MINIMIZE)
            else:
                SESSION.click(window.rect[0] + 100, window.rect[1] + 10)  # activate it by its title bar
                time.sleep(0.5)
                SESSION.xdotool("key", "alt+t")  # presses "&Tray"
            self.assertIsNotNone(self.main_window(visible=False), hide)
            self.assertIsNone(self.main_window(timeout=2), hide)
            SESSION.close_program()

    def test_the_layout_scales_with_the_screen_density(self):
        """At 144 DPI (150 %) the declared DPI awareness gives the design's twips at 10 per pixel."""
        SESSION.reg("add", DESKTOP_KEY, "/v", "LogPixels", "/t", "REG_DWORD", "/d", "144")
        SESSION.close_program()  # the density is read when the Wine session starts
        try:
            self.start()
            window = self.main_window()

            def px(twips):
                return (twips * 144 + 720) // 1440

            switch = self.switch(window)
            self.assertEqual(switch.size(), (px(2415), px(4095)))
            row = [c for c in SESSION.windows(window) if c.caption in ("&Tray", "&Exit", "&Help")]
            self.assertEqual([c.size() for c in row], [(px(2055), px(495))] * 3)
            exit_button = self.control(window, lambda c: c.caption == "&Exit")
            self.assertEqual(exit_button.rect[0] - switch.rect[0], px(4800) - px(120))
            time.sleep(1.2)
            SESSION.screenshot(os.path.join(ARTIFACTS, "main-window-150.png"))
        finally:
            SESSION.reg("delete", DESKTOP_KEY, "/v", "LogPixels")
            SESSION.close_program()


if __name__ == "__main__":
    BUILD = os.path.abspath(sys.argv.pop(1))
    ARTIFACTS = os.path.dirname(BUILD)
    unittest.main(verbosity=2)
