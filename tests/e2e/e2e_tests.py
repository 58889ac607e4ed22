#!/usr/bin/python3
"""End-to-end journeys of vantorel.exe under Wine, each on a copy of the program in a folder of its own.
Usage: e2e_tests.py BUILD_DIR [unittest options]"""
import os
import re
import shutil
import socket
import sys
import tempfile
import time
import unittest

import harness
from harness import is_main, wait_for

BUILD = ARTIFACTS = SESSION = None
HKCU_KEY = r"HKEY_CURRENT_USER\SOFTWARE\Vantorel"
HKLM_KEY = r"HKEY_LOCAL_MACHINE\SOFTWARE\Vantorel"
DESKTOP_KEY = r"HKEY_CURRENT_USER\Control Panel\Desktop"
WM_CLOSE, WM_SYSCOMMAND, SC_MINIMIZE, BM_CLICK = 0x10, 0x112, 0xF020, 0xF5
WM_MOUSEMOVE, WM_LBUTTONUP, WM_RBUTTONUP = 0x200, 0x202, 0x205  # the tray icon reports through WM_MOUSEMOVE


def scripted():
    """The scriptable loopback server (tests/servers/http_test_server.py) started by the CTest fixture."""
    with open(os.environ["VANTOREL_HTTP_PORT_FILE"]) as f:
        return "http://127.0.0.1:" + f.read().strip()


def setUpModule():
    global SESSION
    SESSION = harness.Session(BUILD)


def tearDownModule():
    if SESSION is not None:
        SESSION.close()


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

    def connect(self, *hosts):
        """Opens (host, count) loopback connections to listeners of our own, closed after the test."""
        sockets = []
        for host, n in hosts:
            listener = socket.socket()
            listener.bind((host, 0))
            listener.listen(n + 8)
            sockets += [listener] + [socket.create_connection(listener.getsockname()) for _ in range(n)]
        self.addCleanup(lambda: [s.close() for s in sockets])

    def open_updates(self, check=True):
        """Opens the updates window with "&Updates" and starts the check: (main window, updates window)."""
        main = self.main_window()
        SESSION.post(self.control(main, lambda c: c.caption == "&Updates"), BM_CLICK)
        updates = SESSION.find(lambda w: w.cls == "VantorelOptions" and w.visible, timeout=10)
        if check:
            SESSION.post(self.control(updates, lambda c: c.caption == "&Check for Updates"), BM_CLICK)
        return main, updates

    def ended(self):
        """The program has gone: it said it unloaded and its window no longer exists."""
        return wait_for(lambda: "Unloaded" in SESSION.said() and not any(map(is_main, SESSION.windows())), 20)

    def test_first_start_then_two_clicks_on_the_switch_a_second_start_between_then_exit(self):
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
        self.assertEqual(harness.run(["wine", self.exe], SESSION.env), (0, ""), "a second start ends at once, silent")
        self.assertEqual(len([w for w in SESSION.windows() if is_main(w)]), 1, "no second window")
        self.assertEqual(SESSION.reg_query(HKCU_KEY, "State"), "1", "and no setting rewritten")

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
        # 127.0.0.2 is listed; Wine's SetTcpEntry closes nothing, so every sweep counts it again. 1,500
        # more connections make a sweep longer than a tick: "&Options" is nearly always clicked during one.
        self.definitions(b"-939524086\r\n33554559")
        SESSION.reg_add(HKCU_KEY, "State", "1")
        self.connect(("127.0.0.2", 1), ("127.0.0.1", 1500))
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

    def test_hidden_in_the_tray_by_setting_by_minimising_and_by_alt_t_and_back_by_the_icon(self):
        SESSION.reg_add(HKLM_KEY, "Tray", "1")
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
            hidden = self.main_window(visible=False)
            self.assertIsNotNone(hidden, hide)
            SESSION.post(hidden, WM_MOUSEMOVE, 0, WM_RBUTTONUP if hide == "minimise" else WM_LBUTTONUP)
            back = self.main_window()
            self.assertEqual((back.size(), back.topmost), (window.size(), False), "a click on the icon brings it back")
            SESSION.close_program()

    def test_closing_during_a_stalled_update_takes_effect_within_a_second(self):
        """Under Wine each top-level window destroyed and the tray icon's removal cost about 2 s (its shell
        does not answer): the first run, with no check started, gives the time the same steps take."""
        idle = None
        for server, leave in ((None, "close"), ("/do/noanswer/defver", "close"), ("/do/noanswer/sw2.def", "close"),
                              ("/do/trickle/sw2.def", "&Close"), ("/do/endless/sw2.def", "main")):
            SESSION.reg_add(HKLM_KEY, "Server", scripted() + (server or ""))
            self.start()
            main, updates = self.open_updates(check=server is not None)
            time.sleep(1.5)  # the request or the body is under way
            self.assertFalse(SESSION.find(is_main).enabled, "the options window is modal")
            left = time.time()
            if leave == "&Close":
                SESSION.post(self.control(updates, lambda c: c.caption == leave), BM_CLICK)
            else:
                SESSION.post(main if leave == "main" else updates, WM_CLOSE)
            if leave != "main":
                self.assertTrue(wait_for(lambda: SESSION.find(is_main).enabled, 10), "the main window answers again")
                SESSION.post(self.control(main, lambda c: c.caption == "&Exit"), BM_CLICK)
            self.assertTrue(self.ended(), (server, leave))
            idle = idle or time.time() - left
            self.assertLess(time.time() - left, idle + 1, (server, leave))
            with open(os.path.join(self.folder, "sw2.def"), "rb") as f:
                self.assertEqual(f.read(), b"-939524086\r\n67305985")
            self.assertEqual(sorted(os.listdir(self.folder)), ["sw2.def", "vantorel.exe"], "no .part, defver, setup")
            SESSION.close_program()

    def test_a_new_definitions_list_is_in_force_at_once(self):
        """The server's sw2.def lists 127.0.0.2 (key 33554559), the installed one does not."""
        SESSION.reg_add(HKCU_KEY, "State", "1")
        SESSION.reg_add(HKLM_KEY, "Server", scripted())
        self.connect(("127.0.0.2", 1))
        self.start()
        self.assertTrue(wait_for(lambda: "Swept the connection table" in SESSION.said(), 30))
        self.assertNotRegex(SESSION.said(), "Caption: Vantorel - [1-9]", "nothing listed yet")
        main, updates = self.open_updates()
        updated = "Definitions updated: 2 definitions from .* in use"
        self.assertTrue(wait_for(lambda: re.search(updated, SESSION.said())), SESSION.said())
        SESSION.post(updates, WM_CLOSE)
        self.assertTrue(wait_for(lambda: re.search("Caption: Vantorel - [1-9][0-9]* attempts", SESSION.said()), 30),
                        "the guard sweeps with the new list without a restart\n" + SESSION.said())

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
