"""A small desktop inside a room: an X server, a window manager, a panel with a tray, and the client on it."""

import os
import re
import signal
import subprocess
import sys

import roomclient

HERE = os.path.dirname(os.path.abspath(__file__))
CLIENT_CLASS = "zentw-info"
PANEL_WIDTH = 300


class Desktop:
    """Starts and stops the parts of a desktop; a context manager, which ends whatever is still running."""

    def __init__(self, size="1280x800", server="Xvfb"):
        self.size = size
        self.server = server
        self.env = dict(os.environ)
        self.processes = []
        self._corner = 0

    def __enter__(self):
        try:
            self._start_server()
        except BaseException:
            self.__exit__(None, None, None)
            raise
        return self

    def __exit__(self, *_):
        for process in reversed(self.processes):
            if process.poll() is None:
                process.terminate()
                try:
                    process.wait(5)
                except subprocess.TimeoutExpired:
                    process.kill()
                    process.wait()

    def _start_server(self):
        read_end, write_end = os.pipe()
        if self.server == "Xephyr":
            command = ["Xephyr", "-screen", self.size, "-title", "域管平台", "-no-host-grab"]
        else:
            command = ["Xvfb", "-screen", "0", self.size + "x24", "-nolisten", "tcp"]
        # Without -noreset the server starts anew when its last client leaves, and loses those that are just coming.
        self.x = self.spawn(command + ["-noreset", "-displayfd", str(write_end)], pass_fds=[write_end])
        os.close(write_end)
        with os.fdopen(read_end) as display:
            number = display.readline().strip()
        if not number:
            raise RuntimeError(f"{self.server} did not start")
        self.env["DISPLAY"] = ":" + number
        self.env.pop("XAUTHORITY", None)

    def spawn(self, command, **options):
        """A process of this desktop; its output goes to /run/room/desktop.log unless told otherwise."""
        with open(os.path.join(os.environ["ROOM"], "desktop.log"), "ab") as log:
            options.setdefault("stdout", log)
            options.setdefault("stderr", log)
            process = subprocess.Popen(command, env={**self.env, **options.pop("env", {})}, **options)
        self.processes.append(process)
        return process

    def run(self, *command):
        """The output of a command on this desktop; empty when it fails."""
        result = subprocess.run(command, env=self.env, capture_output=True, text=True, check=False)
        return result.stdout if result.returncode == 0 else ""

    def start_window_manager(self):
        # Windows that come while openbox is still starting may be lost, though its properties are on the root already.
        ready = os.path.join(os.environ["ROOM"], "wm" + self.env["DISPLAY"])
        self.spawn(["openbox", "--startup", "touch " + ready])
        self.wait("the window manager", lambda: os.path.exists(ready))
        os.remove(ready)

    def start_tray(self):
        process = self.spawn(["tint2", "-c", os.path.join(HERE, "tint2rc")])
        self.wait("the tray", lambda: self.windows("tint2"))
        return process

    def start_notifications(self):
        """The desktop's notification service; dunstctl speaks to it."""
        self.spawn(["dunst", "-conf", os.path.join(HERE, "dunstrc")])
        self.wait("the notification service", lambda: self.run("dunstctl", "count"))

    def set_background(self, colour):
        self.run("xsetroot", "-solid", colour)

    def wait(self, what, condition, timeout=15):
        return roomclient.wait_for(condition, timeout, what)

    # The client.

    def start_client(self, program, **env):
        """Starts the client; its standard error is kept in /run/room/client.err."""
        with open(os.path.join(os.environ["ROOM"], "client.err"), "ab") as errors:
            return self.spawn([program], stderr=errors, env=env)

    def windows(self, instance=CLIENT_CLASS):
        """The visible windows of a program by its instance name, as (id, (x, y, width, height))."""
        found = []
        for line in self.run("xwininfo", "-root", "-tree").splitlines():
            match = re.match(r'\s+(0x[0-9a-f]+) .*: \("(.*?)" ".*"\)\s', line)
            if match and match.group(2) == instance:
                found.append((match.group(1), self.geometry(match.group(1))))
        return [(window, geometry) for window, geometry in found if geometry]

    def geometry(self, window):
        """(x, y, width, height) of a window on the screen; None while it is not visible."""
        text = self.run("xwininfo", "-id", window)
        found = [re.search(pattern + r":\s+(-?\d+)", text) for pattern in
                 ("Absolute upper-left X", "Absolute upper-left Y", "Width", "Height")]
        if "IsViewable" not in text or not all(found):
            return None
        return tuple(int(match.group(1)) for match in found)

    def icon(self):
        """The client's icon in an XEmbed tray, or None."""
        return next((window for window, (_, _, width, height) in self.windows() if 4 < width <= 64 and 4 < height <= 64),
                    None)

    def panel(self):
        """The client's panel while it is on the screen, or None."""
        return next((window for window, (_, _, width, _) in self.windows() if width == PANEL_WIDTH), None)

    def click(self, x, y, button=1, repeat=1):
        self.run("xdotool", "mousemove", str(x), str(y), "click", "--repeat", str(repeat), str(button))

    def click_icon(self, button=1, repeat=1):
        """Clicks on the tray icon, each time at another corner of it, so that no two calls make a double click."""
        x, y, width, height = self.geometry(self.wait("the tray icon", self.icon))
        self._corner = 1 - self._corner
        part = 1 + 2 * self._corner
        self.click(x + width * part // 4, y + height * part // 4, button, repeat)

    def click_panel(self, x, y):
        """Clicks at a point of the panel."""
        left, top, _, _ = self.geometry(self.panel())
        self.click(left + x, top + y)

    def screenshot(self, path, window="root"):
        subprocess.run(["import", "-window", window, path], env=self.env, check=True)


def stop(process, number=signal.SIGTERM, timeout=10):
    """Sends a signal and returns the exit status."""
    process.send_signal(number)
    return process.wait(timeout)


if __name__ == "__main__":
    sys.exit("a module, not a program")
