"""Drives vantorel.exe under Wine for the end-to-end tests: a virtual display, a Wine prefix and a Wine
desktop of its own; windows read with vtprobe.exe, pointer clicks by xdotool, settings by `wine reg`."""
import os
import signal
import subprocess
import tempfile
import time

FIXTURE = os.path.join(os.path.dirname(os.path.abspath(__file__)), "..", "win32", "xvfb-fixture")
QUIET = dict(stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)


class Window:
    def __init__(self, line):
        hwnd, self.cls, self.caption, visible, enabled, topmost, rect = line.split("\t")
        self.hwnd, self.visible, self.enabled, self.topmost = int(hwnd), visible == "1", enabled == "1", topmost == "1"
        self.rect = tuple(int(v) for v in rect.split())

    def centre(self):
        left, top, right, bottom = self.rect
        return (left + right) // 2, (top + bottom) // 2

    def size(self):
        return self.rect[2] - self.rect[0], self.rect[3] - self.rect[1]


def run(args, env, timeout=60):
    """(exit code, output) of a Wine command, its output in a file: Wine's services hold pipes open."""
    with tempfile.TemporaryFile() as out:
        code = subprocess.run(args, env=env, stdin=subprocess.DEVNULL, stdout=out, stderr=subprocess.DEVNULL,
                              timeout=timeout).returncode
        out.seek(0)
        return code, out.read().decode("latin-1").replace("\r\n", "\n")


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


class Session:
    def __init__(self, build_dir, prefix=None):
        self.build = os.path.abspath(build_dir)
        self.dir = tempfile.mkdtemp(prefix="e2e-display-", dir=self.build)
        subprocess.run(["sh", FIXTURE, "start", self.dir], check=True, **QUIET)
        with open(os.path.join(self.dir, "xvfb.env")) as f:
            fixture = dict(line.strip().split("=", 1) for line in f if "=" in line)
        self.prefix = prefix or os.path.join(self.build, "e2e-wineprefix")
        os.makedirs(self.prefix, exist_ok=True)
        self.env = dict(os.environ, WINEPREFIX=self.prefix, WINEDEBUG="-all",
                        WINEDLLOVERRIDES="mscoree,mshtml=;winemenubuilder.exe=d", DISPLAY=fixture["DISPLAY"])
        subprocess.run(["wineserver", "-p"], env=self.env, **QUIET)
        subprocess.run(["wine", "wineboot"], env=self.env, **QUIET)
        self.program = None

    def start(self, exe):
        """Starts `exe` inside a Wine desktop of 1024 x 768, its standard output kept."""
        self.output = tempfile.TemporaryFile()
        self.program = subprocess.Popen(["wine", "explorer", "/desktop=vt,1024x768", exe], env=self.env,
                                        stdin=subprocess.DEVNULL, stdout=self.output, stderr=subprocess.DEVNULL)

    def said(self):
        self.output.seek(0)
        return self.output.read().decode("latin-1").replace("\r\n", "\n")

    def run_in_desktop(self, command_line, timeout=120):
        """Runs a Windows command line inside the program's Wine desktop and waits for it: its exit code."""
        return run(["wine", os.path.join(self.build, "vtprobe.exe"), "run", command_line], self.env, timeout)[0]

    def probe(self, *args):
        return run(["wine", os.path.join(self.build, "vtprobe.exe"), *[str(a) for a in args]], self.env)[1]

    def windows(self, parent=None):
        out = self.probe("windows") if parent is None else self.probe("controls", parent.hwnd)
        return [Window(line) for line in out.splitlines() if line.count("\t") == 6]

    def find(self, predicate, timeout=30):
        """The first top-level window for which predicate(window) holds, waiting up to `timeout`."""
        return wait_for(lambda: next((w for w in self.windows() if predicate(w)), None), timeout)

    def post(self, window, message, wparam=0, lparam=0):
        self.probe("post", window.hwnd, message, wparam, lparam)

    def xdotool(self, *args):
        subprocess.run(["xdotool", *[str(a) for a in args]], env=self.env, check=False)

    def click(self, x, y):
        self.xdotool("mousemove", x, y, "click", 1)

    def screenshot(self, path):
        subprocess.run(["import", "-window", "root", path], env=self.env, check=False, **QUIET)

    def reg_query(self, key, value):
        """The data of a value (names without blanks), or None when it is missing."""
        return (self.reg_values(key) or {}).get(value)

    def reg_values(self, key):
        """{name: data} of a key's values (names without blanks; REG_DWORD as int), None when it is missing."""
        code, out = run(["wine", "reg", "query", key], self.env)
        if code != 0:
            return None
        values = {}
        for line in out.splitlines():
            parts = line.strip().split(None, 2)
            if len(parts) >= 2 and parts[1].startswith("REG_"):
                data = parts[2] if len(parts) == 3 else ""
                values[parts[0]] = int(data, 16) if parts[1] == "REG_DWORD" else data
        return values

    def reg(self, *args):
        run(["wine", "reg", *args, "/f"], self.env)

    def reg_add(self, key, value, data):
        self.reg("add", key, "/v", value, "/t", "REG_SZ", "/d", data)

    def close_program(self):
        """Ends the program under test (by its PID) and every Windows process of the prefix."""
        if self.program is not None and self.program.poll() is None:
            self.program.send_signal(signal.SIGTERM)
        run(["wineserver", "-k"], self.env)
        if self.program is not None:
            try:
                self.program.wait(timeout=10)
            except subprocess.TimeoutExpired:
                self.program.kill()
        self.program = None
        subprocess.run(["wineserver", "-p"], env=self.env, **QUIET)

    def close(self):
        self.close_program()
        run(["wineserver", "-k"], self.env)
        subprocess.run(["sh", FIXTURE, "stop", self.dir], **QUIET)
        os.rmdir(self.dir)
