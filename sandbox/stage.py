# SPDX-License-Identifier: Apache-2.0
"""What the programs share that show the client on a desktop: they find windows and controls by their names."""

import os
import subprocess

from accessible import Reader

PANEL, NOTICE, PASSWORD, RELEASE = "终端域管平台", "消息详情", "修改密码", "解除管控"
INTEGRITY = "设备完整性校验失败"
SERVICE = "com.vantor.tarn"


class Stage:
    """A desktop for the client, and the directory for the pictures. Made before the client starts."""

    def __init__(self, desktop, directory=None):
        self.desktop = desktop
        self.directory = directory
        self.reader = Reader(desktop)

    def picture(self, name, window="root"):
        """A picture of a window, or of the whole screen, once it has stopped changing."""
        last = [None]

        def unchanged():
            content = self.desktop.run("sh", "-c", f"import -window {window} rgb:- | sha256sum")
            same, last[0] = content == last[0], content
            return same

        self.desktop.wait("a steady picture", unchanged)
        self.desktop.screenshot(os.path.join(self.directory, name + ".png"), window)

    def window(self, name):
        """Waits for the client's window of this name; returns its X window."""
        def found():
            named = [node for node in self.reader.windows() if node.property("Name") == name]
            return named and self.on_screen(named[0])
        return self.reader.wait(f"the window {name}", found)[0]

    def on_screen(self, window):
        """The X window of one of the client's windows, and its place there; None while it is not there."""
        place = self.scaled(window.extents())
        # The client may not know where a window has been put, but how large it is.
        return max((found for found in self.desktop.windows() if found[1][2:] == place[2:]),
                   key=lambda found: found[1] == place, default=None)

    def scaled(self, extents):
        """Extents in the screen's pixels, rounded as Qt rounds."""
        return tuple(int(extent * self.desktop.scale + 0.5) for extent in extents)

    def click(self, name="", **options):
        """Clicks on a control when it is there; the options are those of Reader.find()."""
        self.desktop.click(*self.place(name, **options))

    def place(self, name="", **options):
        """Where to click on a control, once it is there: for clicks while the client answers nobody."""
        def centre():
            control = self.reader.find(name, **options)
            window = control and control.window()
            found = window and self.on_screen(window)
            if not found:
                return None
            # From the window's corner, since only the screen knows where that is.
            x, y, width, height = self.scaled(control.extents())
            left, top, *_ = self.scaled(window.extents())
            return found[1][0] + x - left + width // 2, found[1][1] + y - top + height // 2

        return self.reader.wait(f"the place of the control {name}", centre)

    def opened_by(self, action):
        """The X window of the client that an action opens."""
        before = {window for window, _ in self.desktop.windows()}
        action()
        return self.desktop.wait("the new window", lambda: next(
            (window for window, _ in self.desktop.windows() if window not in before), None))

    def gone(self, window):
        self.desktop.wait("the window to close", lambda: not self.desktop.geometry(window))

    def keys(self, window, *keys):
        self.desktop.run("xdotool", "windowfocus", "--sync", window, "key", *keys)

    def type(self, window, text):
        self.desktop.run("xdotool", "windowfocus", "--sync", window, "type", text)

    def call(self, path, interface, method, *arguments):
        # The name comes after the first log lines, for which the tests wait.
        subprocess.run(["gdbus", "wait", "--session", "--timeout", "20", SERVICE], check=True)
        subprocess.run(["gdbus", "call", "--session", "-d", SERVICE, "-o", path, "-m", f"{interface}.{method}",
                        *arguments], check=True, capture_output=True)

    def failed_verification(self, text):
        """The integrity dialog, after a verification has failed with this text."""
        self.call("/com/vantor/tarn/Fullzone", "com.vantor.tarn.Fullzone", "Notify", text, "/fix/page")
        return self.window(INTEGRITY)
