# SPDX-License-Identifier: Apache-2.0
"""A small desktop inside a room: an X server, a window manager, panels with a tray, and the client on it."""

import os
import re
import shutil
import signal
import subprocess
import sys

import roomclient

HERE = os.path.dirname(os.path.abspath(__file__))
CLIENT_CLASS = "zentw-info"
PANEL_WIDTH = 300
PORTAL = "org.freedesktop.portal.Desktop"
SCHEMES = {"none": 0, "dark": 1, "light": 2}
# The settings of the tray host and of the notification service that are lengths.
TINT2_SIZES = "panel_size|panel_padding|systray_padding|systray_icon_size|time1_font|clock_padding"
DUNST_SIZES = "width|offset|font|corner_radius|padding|horizontal_padding"


class Desktop:
    """Starts and stops the parts of a desktop; a context manager, which ends whatever is still running."""

    def __init__(self, size="1280x800", server="Xvfb", scale=1):
        """A desktop of this size, as a client sees it that draws at this scale."""
        self.scale = scale
        self.size = "x".join(str(round(int(extent) * scale)) for extent in size.split("x"))
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
            end(process)

    def _start_server(self):
        read_end, write_end = os.pipe()
        command = {
            "Xephyr": ["Xephyr", "-screen", self.size, "-title", "域管平台", "-no-host-grab"],
            "Xvfb": ["Xvfb", "-screen", "0", self.size + "x24", "-nolisten", "tcp"],
            # The one that can have several monitors; the room's network is its own.
            "Xvnc": ["Xvnc", "-geometry", self.size, "-depth", "24", "-SecurityTypes", "None", "-rfbport", "5900"],
        }[self.server]
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

    def start_tray(self, edge="bottom"):
        """A panel along that edge of the screen, whose tray is of the X display (XEmbed)."""
        place = {"left": "center left vertical", "right": "center right vertical"}.get(edge, f"{edge} center horizontal")
        configuration = self._configuration("tint2rc", TINT2_SIZES, {"panel_position": place})
        process = self.spawn(["tint2", "-c", configuration])
        self.wait("the tray", lambda: self.windows("tint2"))
        return process

    def start_notifier_tray(self):
        """A panel whose tray is of the session bus (StatusNotifierItem); it may be the only such one."""
        # The panel writes its own settings back.
        settings = shutil.copy(os.path.join(HERE, "lxqt-panel.conf"), os.environ["ROOM"])
        process = self.spawn(["lxqt-panel", "-c", settings])
        self.wait("the tray", lambda: "true" in self.registry("IsStatusNotifierHostRegistered"))
        return process

    def registry(self, name):
        """A property of the StatusNotifier registry, as gdbus writes it; empty while there is none."""
        return self.run("gdbus", "call", "--session", "-d", "org.kde.StatusNotifierWatcher", "-o",
                        "/StatusNotifierWatcher", "-m", "org.freedesktop.DBus.Properties.Get",
                        "org.kde.StatusNotifierWatcher", name)

    def start_notifications(self):
        """The desktop's notification service; dunstctl speaks to it."""
        self.spawn(["dunst", "-conf", self._configuration("dunstrc", DUNST_SIZES)])
        self.wait("the notification service", lambda: self.run("dunstctl", "count"))

    def _configuration(self, name, sizes, changes=None):
        """A configuration file of the desktop; the numbers of the settings named are drawn at its scale."""
        with open(os.path.join(HERE, name), encoding="utf-8") as stream:
            lines = stream.readlines()
        path = os.path.join(os.environ["ROOM"], name + self.env["DISPLAY"])
        with open(path, "w", encoding="utf-8") as stream:
            for line in lines:
                key, equals, value = line.partition("=")
                if key.strip() in (changes or {}):
                    value = f" {changes[key.strip()]}\n"
                if re.fullmatch(rf"\s*({sizes})\s*", key):
                    value = re.sub(r"\d+(?![\d%])", lambda number: str(round(int(number[0]) * self.scale)), value)
                stream.write(key + equals + value)
        return path

    def start_portal(self, scheme="none"):
        """The desktop portal, which says that the desktop's colours are "light" or "dark", or "none" of both."""
        self.spawn([sys.executable, "-B", os.path.join(HERE, "portal.py"), str(SCHEMES[scheme])])
        self.wait("the portal", lambda: "true" in self.run(
            "gdbus", "call", "--session", "-d", "org.freedesktop.DBus", "-o", "/org/freedesktop/DBus",
            "-m", "org.freedesktop.DBus.NameHasOwner", PORTAL))

    def set_background(self, colour):
        self.run("xsetroot", "-solid", colour)

    def wait(self, what, condition, timeout=15):
        return roomclient.wait_for(condition, timeout, what)

    # The client.

    def start_client(self, program, **env):
        """Starts the client; its standard error is kept in /run/room/client.err."""
        scaling = {"QT_SCALE_FACTOR": str(self.scale)} if self.scale != 1 else {}
        with open(os.path.join(os.environ["ROOM"], "client.err"), "ab") as errors:
            return self.spawn([program], stderr=errors, env={**scaling, **env})

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
        """Where the client's icon is, as (x, y, width, height); None while no tray shows it."""
        def fits(box):
            return all(4 < side <= 64 * self.scale for side in box[2:])
        return next((box for _, box in self.windows() if fits(box)), None) or \
            next((box for box in map(self._content, self.windows("lxqt-panel")) if fits(box)), None)

    def _content(self, panel):
        """The place of what differs from the background of a panel that shows nothing but its tray."""
        window, (left, top, _, _) = panel
        text = self.run("convert", "x:" + window, "-trim", "-format", "%X %Y %w %h", "info:")
        x, y, width, height = map(int, text.split() or "0000")
        return left + x, top + y, width, height

    def panel(self):
        """The client's panel while it is on the screen, or None."""
        return next((window for window, (_, _, width, _) in self.windows() if width == PANEL_WIDTH * self.scale),
                    None)

    def click(self, x, y, button=1, repeat=1):
        self.run("xdotool", "mousemove", str(x), str(y), "click", "--repeat", str(repeat), str(button))

    def click_icon(self, button=1, repeat=1):
        """Clicks on the tray icon, each time at another corner of it, so that no two calls make a double click."""
        x, y, width, height = self.wait("the tray icon", self.icon)
        self._corner = 1 - self._corner
        part = 1 + 2 * self._corner
        self.click(x + width * part // 4, y + height * part // 4, button, repeat)

    def screenshot(self, path, window="root"):
        subprocess.run(["import", "-window", window, path], env=self.env, check=True)


def end(process):
    """Ends a process, if need be by force."""
    if process.poll() is not None:
        return
    process.terminate()
    try:
        process.wait(5)
    except subprocess.TimeoutExpired:
        process.kill()
        process.wait()


def stop(process, number=signal.SIGTERM, timeout=10):
    """Sends a signal and returns the exit status."""
    process.send_signal(number)
    return process.wait(timeout)


if __name__ == "__main__":
    sys.exit("a module, not a program")
