"""What happens to the client in the soak: a user at the screen, programs on the buses, the desktop around it."""

import collections
import subprocess

import gallery
import roomclient
from faults import NO_NOTIFICATIONS
from stage import (LOGIN_BUTTON, NETWORK_BUTTON, NOTICE_SIZE, PASSWORD_LINK, PASSWORD_SIZE,
                   RELEASE_LINK, RELEASE_SIZE, Stage)

NOTIFICATION = ("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification")
FULLZONE = ("/com/vantor/tarn/Fullzone", "com.vantor.tarn.Fullzone")


class Missed(Exception):
    """What was waited for did not come about, as it may be with a fault in force."""


class Events(Stage):
    """Each event leaves the screen as it was, or tidy() does."""

    def __init__(self, desktop, faults, random):
        super().__init__(desktop, None)
        self.faults = faults
        self.random = random
        self.done = collections.Counter()
        self.missed = collections.Counter()
        self.number = 0
        wait = desktop.wait
        desktop.wait = lambda what, condition, timeout=4: wait(what, condition, timeout)
        self.all = [self.panel, self.pages, self.scene, self.password, self.release, self.message, self.balloon,
                    self.integrity, self.calls, self.theme]

    def one(self, event=None):
        """One event, chosen at random unless told."""
        event = event or self.random.choice(self.all)
        try:
            event()
            self.done[event.__name__] += 1
        except (TimeoutError, Missed, subprocess.SubprocessError, TypeError):
            # A window that goes while it is asked for its place has none.
            self.missed[event.__name__] += 1
        self.tidy()

    def opened(self):
        """The client's windows that can be closed, without the panel."""
        return [window for window, (_, _, width, height) in self.desktop.windows()
                if width not in (0, 300) and height > 64]

    def tidy(self):
        """Closes what is open but the panel; balloons go by themselves."""
        for _ in range(6):
            windows = self.opened()
            if not windows:
                return
            for window in reversed(windows):
                self.desktop.run("timeout", "2", "xdotool", "windowfocus", "--sync", window, "key", "Escape")

    def shown_panel(self):
        """The panel, after as many clicks on the icon as it takes."""
        for _ in range(3):
            panel = self.desktop.panel()
            if panel:
                return panel
            self.desktop.click_icon()
            try:
                return self.desktop.wait("the panel", self.desktop.panel, 1)
            except TimeoutError:
                continue
        raise Missed("the panel")

    def panel(self):
        """The panel is hidden and shown again."""
        self.shown_panel()
        self.desktop.click_icon()
        self.desktop.wait("the panel to hide", lambda: not self.desktop.panel())
        self.shown_panel()

    def pages(self):
        """The panel's pages are turned."""
        panel = self.shown_panel()
        for button in (NETWORK_BUTTON, LOGIN_BUTTON):
            self.desktop.click_in(panel, *button)

    def scene(self):
        """Another scene is chosen from the list, which the panel has once the server has answered."""
        panel = self.shown_panel()
        if self.desktop.geometry(panel)[3] < 520:
            raise Missed("the scene box")
        before = {window for window, _ in self.desktop.windows()}
        self.desktop.click_in(panel, *gallery.SCENE_BOX)
        box = self.desktop.wait("the scenes", lambda: next(
            (window for window, _ in self.desktop.windows() if window not in before), None))
        self.keys(box, self.random.choice(("Down", "Up", "End", "Home")), "Return")
        self.gone(box)

    def password(self):
        """The password dialog: passwords that differ, then an old one that is wrong."""
        panel = self.shown_panel()
        self.desktop.click_in(panel, *PASSWORD_LINK)
        dialog = self.dialog(PASSWORD_SIZE)
        self.desktop.run("xdotool", "windowfocus", "--sync", dialog, "type", "wrong\tNew@2026x\tNew@2026y\t")
        self.keys(dialog, "shift+Tab", "ctrl+a")
        self.type(dialog, "New@2026x")
        asked = len(roomclient.record("dbus", method="ModifyUserPassword"))
        self.keys(dialog, "Return")
        # A bubble or a box then tells the user.
        self.desktop.wait("the refusal", lambda: len(roomclient.record("dbus", method="ModifyUserPassword")) > asked)
        self.tidy()
        self.gone(dialog)

    def release(self):
        """The release dialog with a wrong password, and the box after it."""
        panel = self.shown_panel()
        self.desktop.click_in(panel, *RELEASE_LINK)
        dialog = self.dialog(RELEASE_SIZE)
        before = {window for window, _ in self.desktop.windows()}
        self.type(dialog, "wrong")
        self.keys(dialog, "Return")
        box = self.desktop.wait("the message", lambda: next(
            (window for window, _ in self.desktop.windows() if window not in before), None))
        self.keys(box, "Escape")
        self.gone(box)
        self.keys(dialog, "Escape")
        self.gone(dialog)

    def notify(self, user="zhangsan"):
        """A message is pushed; its texts differ in length and letters from those before."""
        self.number += 1
        text = "".join(chr(self.random.choice((0x4e00, 0x41)) + self.random.randrange(26)) for _ in range(
            self.random.randrange(5, 60)))
        self.call(*NOTIFICATION, "Notify", "1", user, f"通知 {self.number}", text, "管理员")

    def message(self):
        """A message is pushed and clicked; in the notice dialog it is read, and the next one asked for."""
        at = "2026-11-24T08:30:00Z"
        last = self.done["message"] % 2
        roomclient.patch_state({"messages": [
            {"uuid": f"{self.number}-{index}", "uid": "zhangsan", "send_uid": "管理员", "title": f"标题 {self.number}",
             "content": f"正文 {index} " * self.random.randrange(1, 200), "read_at": "", "created_at": at}
            for index in range(1 if last else 3)]})
        self.desktop.run("dunstctl", "close-all")
        self.notify(self.random.choice(("zhangsan", "")))
        self.desktop.wait("the notification", lambda: "1" in self.desktop.run("timeout", "2", "dunstctl", "count",
                                                                              "displayed"))
        self.desktop.run("dunstctl", "action")
        notice = self.dialog(NOTICE_SIZE)
        self.desktop.run("dunstctl", "close-all")
        asked = len(roomclient.record("http", method="PUT"))
        self.desktop.click_in(notice, *(gallery.WIDE_BUTTON if last else gallery.NEXT_BUTTON))
        self.desktop.wait("the message to be read", lambda: len(roomclient.record("http", method="PUT")) > asked)
        self.keys(notice, "Escape")
        self.gone(notice)

    def balloon(self):
        """A message is pushed where no service shows it."""
        with self.faults.noted(NO_NOTIFICATIONS):
            self.desktop.notifications(False)
            try:
                before = len(self.desktop.windows())
                self.notify()
                self.desktop.wait("the balloon", lambda: len(self.desktop.windows()) > before)
            finally:
                self.desktop.notifications(True)

    def integrity(self):
        """A verification fails; then it succeeds, or the user closes the dialog."""
        dialog = self.failed_verification(f"校验失败 {self.number}")
        self.call(*FULLZONE, "Notify", "success", "false")
        self.gone(dialog)

    def calls(self):
        """What other programs ask for."""
        self.call(*NOTIFICATION, "GioMount", "Foo", "Bar", "SER1", "1000")
        self.call(*NOTIFICATION, "AgencyNotify", "a", "b")
        self.notify("lisi")

    def theme(self):
        """The desktop's colours change."""
        self.desktop.set_colour_scheme(self.random.choice(("dark", "light", "none")))
