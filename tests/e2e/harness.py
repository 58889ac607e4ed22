"""Drives vantorel.exe under Wine for the end-to-end tests.

Each Session has its own virtual display (Xvfb), its own Wine prefix and a Wine desktop in which
the program runs, so windows have title bars and a notification area as on Windows. Windows are
read with vtprobe.exe from inside the same desktop; clicks are real pointer clicks sent with
xdotool at screen coordinates; settings are read and written with `wine reg`. Everything a session
starts is ended by its PID (and the prefix's own wineserver) when it closes.
"""
import os
import signal
import subprocess
import tempfile
import time


class Window:
    def __init__(self, line):
        hwnd, cls, caption, visible, iconic, rect = line.split("\t")
        self.hwnd = int(hwnd)
        self.cls = cls
        self.caption = caption
        self.visible = visible == "1"
        self.iconic = iconic == "1"
        self.rect = tuple(int(v) for v in rect.split())

    def centre(self):
        left, top, right, bottom = self.rect
        return (left + right) // 2, (top + bottom) // 2

    def __repr__(self):
        return f"Window({self.caption!r}, visible={self.visible}, iconic={self.iconic}, rect={self.rect})"


def _run(args, env, timeout=60):
    """Runs a Wine command with its output in a file: Wine's services inherit pipes and hold them
    open, so reading a pipe to its end would wait for them."""
    with tempfile.TemporaryFile() as out:
        code = subprocess.run(args, env=env, stdin=subprocess.DEVNULL, stdout=out, stderr=subprocess.DEVNULL,
                              timeout=timeout).returncode
        out.seek(0)
        return code, out.read().decode("latin-1").replace("\r\n", "\n")


class Session:
    def __init__(self, build_dir, prefix=None, display_base=400):
        self.build = os.path.abspath(build_dir)
        self.prefix = prefix or os.path.join(self.build, "e2e-wineprefix")
        os.makedirs(self.prefix, exist_ok=True)
        self.env = dict(os.environ, WINEPREFIX=self.prefix, WINEDEBUG="-all", WINEDLLOVERRIDES="mscoree,mshtml=;winemenubuilder.exe=d")
        n = display_base
        while os.path.exists(f"/tmp/.X11-unix/X{n}") or os.path.exists(f"/tmp/.X{n}-lock"):
            n += 1
        self.display = f":{n}"
        self.env["DISPLAY"] = self.display
        self.xvfb = subprocess.Popen(["Xvfb", self.display, "-screen", "0", "1024x768x24", "-nolisten", "tcp"],
                                     stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
        for _ in range(100):
            if os.path.exists(f"/tmp/.X11-unix/X{n}"):
                break
            time.sleep(0.05)
        subprocess.run(["wineserver", "-p"], env=self.env, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)
        subprocess.run(["wine", "wineboot"], env=self.env, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)
        self.program = None
        self.desktop = None

    # --- the program ---------------------------------------------------------------------------
    def start(self, exe, desktop="vt"):
        """Starts `exe` inside a Wine desktop of 1024 x 768; returns the Popen."""
        self.output = tempfile.TemporaryFile()
        self.program = subprocess.Popen(["wine", "explorer", f"/desktop={desktop},1024x768", exe], env=self.env,
                                        stdin=subprocess.DEVNULL, stdout=self.output, stderr=subprocess.DEVNULL)
        return self.program

    def program_output(self):
        """What the program has written to its standard output so far."""
        self.output.seek(0)
        return self.output.read().decode("latin-1").replace("\r\n", "\n")

    def run(self, exe, timeout=60):
        """Runs a second program in the same prefix and waits for it: (exit code, output)."""
        return _run(["wine", exe], self.env, timeout)

    def run_in_desktop(self, command_line, timeout=120):
        """Runs a Windows command line inside the program's Wine desktop and waits for it: its exit code."""
        return _run(["wine", os.path.join(self.build, "vtprobe.exe"), "run", command_line], self.env, timeout)[0]

    def probe(self, *args):
        return _run(["wine", os.path.join(self.build, "vtprobe.exe"), *[str(a) for a in args]], self.env)[1]

    def windows(self):
        return [Window(line) for line in self.probe("windows").splitlines() if line.count("\t") == 5]

    def controls(self, window):
        return [Window(line) for line in self.probe("controls", window.hwnd).splitlines() if line.count("\t") == 5]

    def find(self, predicate, timeout=30):
        """The first top-level window for which predicate(window) holds, waiting up to `timeout`."""
        deadline = time.time() + timeout
        while True:
            for w in self.windows():
                if predicate(w):
                    return w
            if time.time() > deadline:
                return None
            time.sleep(0.3)

    def post(self, window, message, wparam=0, lparam=0):
        self.probe("post", window.hwnd, message, wparam, lparam)

    # --- the user ------------------------------------------------------------------------------
    def click(self, x, y):
        """A real left click at screen coordinates of the Wine desktop."""
        subprocess.run(["xdotool", "mousemove", str(x), str(y), "click", "1"], env=self.env, check=False)

    def move(self, x, y):
        """Moves the real pointer to screen coordinates of the Wine desktop."""
        subprocess.run(["xdotool", "mousemove", str(x), str(y)], env=self.env, check=False)

    def key(self, *keys):
        subprocess.run(["xdotool", "key", *keys], env=self.env, check=False)

    def screenshot(self, path):
        subprocess.run(["import", "-window", "root", path], env=self.env, check=False,
                       stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)

    # --- settings ------------------------------------------------------------------------------
    def reg_query(self, key, value):
        """The data of a REG_SZ value, or None when it is missing."""
        code, out = _run(["wine", "reg", "query", key, "/v", value], self.env)
        if code != 0:
            return None
        for line in out.splitlines():
            parts = line.strip().split(None, 2)
            if len(parts) >= 2 and parts[0].lower() == value.lower() and parts[1].startswith("REG_"):
                return parts[2] if len(parts) == 3 else ""
        return None

    def reg_values(self, key):
        """Every value (names without blanks) of a key as {name: data}, REG_DWORD data as an int; None
        when the key is missing."""
        code, out = _run(["wine", "reg", "query", key], self.env)
        if code != 0:
            return None
        values = {}
        for line in out.splitlines():
            parts = line.strip().split(None, 2)
            if len(parts) >= 2 and parts[1].startswith("REG_"):
                data = parts[2] if len(parts) == 3 else ""
                values[parts[0]] = int(data, 16) if parts[1] == "REG_DWORD" else data
        return values

    def reg_add(self, key, value, data):
        _run(["wine", "reg", "add", key, "/v", value, "/t", "REG_SZ", "/d", data, "/f"], self.env)

    def reg_delete_key(self, key):
        _run(["wine", "reg", "delete", key, "/f"], self.env)

    # --- the end -------------------------------------------------------------------------------
    def wait_exit(self, timeout=30):
        if self.program is None:
            return True
        try:
            self.program.wait(timeout=timeout)
            return True
        except subprocess.TimeoutExpired:
            return False

    def close_program(self):
        """Ends the program under test (by its PID) and every Windows process of the prefix."""
        if self.program is not None and self.program.poll() is None:
            self.program.send_signal(signal.SIGTERM)
        _run(["wineserver", "-k"], self.env)
        if self.program is not None:
            try:
                self.program.wait(timeout=10)
            except subprocess.TimeoutExpired:
                self.program.kill()
        self.program = None
        subprocess.run(["wineserver", "-p"], env=self.env, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)

    def close(self):
        if self.program is not None and self.program.poll() is None:
            self.program.send_signal(signal.SIGTERM)
        subprocess.run(["wineserver", "-k"], env=self.env, stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL,
                       stderr=subprocess.DEVNULL)
        if self.program is not None:
            try:
                self.program.wait(timeout=10)
            except subprocess.TimeoutExpired:
                self.program.kill()
        self.xvfb.terminate()
        try:
            self.xvfb.wait(timeout=10)
        except subprocess.TimeoutExpired:
            self.xvfb.kill()
