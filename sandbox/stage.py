"""What the programs share that show the client on a desktop and take pictures of it."""

import os
import subprocess

# Where things lie in the panel, from its top left, and the links from its bottom left.
LOGIN_BUTTON = (85, 145)
NETWORK_BUTTON = (215, 145)
RELEASE_LINK = (190, -32)
PASSWORD_LINK = (262, -32)
NOTICE_SIZE = (428, 450)
RELEASE_SIZE = (400, 200)
SPINNER_SIZE = (380, 160)
PASSWORD_SIZE = (400, 280)
INTEGRITY_SIZE = (380, 160)
SERVICE = "com.vantor.tarn"


class Stage:
    """A desktop with the client on it, and the directory for the pictures."""

    def __init__(self, desktop, directory):
        self.desktop = desktop
        self.directory = directory

    def picture(self, name, window="root"):
        """A picture of a window, or of the whole screen, once it has stopped changing."""
        last = [None]

        def unchanged():
            content = self.desktop.run("sh", "-c", f"import -window {window} rgb:- | sha256sum")
            same, last[0] = content == last[0], content
            return same

        self.desktop.wait("a steady picture", unchanged)
        self.desktop.screenshot(os.path.join(self.directory, name + ".png"), window)

    def dialog(self, size):
        """Waits for the client's window of this size."""
        size = tuple(round(extent * self.desktop.scale) for extent in size)
        return self.desktop.wait(f"the {size} window", lambda: next(
            (window for window, (_, _, *wh) in self.desktop.windows() if tuple(wh) == size), None))

    def gone(self, window):
        self.desktop.wait("the window to close", lambda: not self.desktop.geometry(window))

    def keys(self, window, *keys):
        self.desktop.run("xdotool", "windowfocus", "--sync", window, "key", *keys)

    def type(self, window, text):
        self.desktop.run("xdotool", "windowfocus", "--sync", window, "type", text)

    def call(self, path, interface, method, *arguments):
        subprocess.run(["gdbus", "call", "--session", "-d", SERVICE, "-o", path, "-m", f"{interface}.{method}",
                        *arguments], check=True, capture_output=True)

    def failed_verification(self, text):
        """The integrity dialog, after a verification has failed with this text."""
        self.call("/com/vantor/tarn/Fullzone", "com.vantor.tarn.Fullzone", "Notify", text, "/fix/page")
        return self.dialog(INTEGRITY_SIZE)
