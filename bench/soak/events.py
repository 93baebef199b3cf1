# SPDX-License-Identifier: Apache-2.0
"""What happens to the client in the soak: a user at the screen, programs on the buses, the desktop around it."""

import collections
import subprocess

import roomclient
from faults import LONG, NO_NOTIFICATIONS
from stage import NOTICE, PASSWORD, RELEASE, Stage

NOTIFICATION = ("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification")
FULLZONE = ("/com/vantor/tarn/Fullzone", "com.vantor.tarn.Fullzone")

# The tray icon is a window of the client, too.
LARGEST_ICON = 64


class Missed(Exception):
    """What was waited for did not come about, as it may be with a fault in force."""


class Events(Stage):
    """Each event leaves the screen as it was, or tidy() does."""

    def __init__(self, desktop, faults, random):
        super().__init__(desktop)
        self.faults = faults
        self.random = random
        self.done = collections.Counter()
        self.missed = collections.Counter()
        self.number = 0
        self.earlier = []
        wait = desktop.wait
        desktop.wait = lambda what, condition, timeout=4: wait(what, condition, timeout)
        self.all = [self.panel, self.pages, self.scene, self.password, self.release, self.message,
                    self.long_message, self.balloon, self.integrity, self.calls, self.theme]

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
        panel = self.desktop.panel()
        return [window for window, (*_, height) in self.desktop.windows() if window != panel and height > LARGEST_ICON]

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
        self.shown_panel()
        for button in ("网络信息", "登录信息"):
            self.click(button)

    def scene(self):
        """Another scene is chosen from the list, which the panel has once the server has answered."""
        self.shown_panel()
        box = self.opened_by(lambda: self.click(role="combo box"))
        self.keys(box, self.random.choice(("Down", "Up", "End", "Home")), "Return")
        self.gone(box)

    def password(self):
        """The password dialog: passwords that differ, then an old one that is wrong."""
        self.shown_panel()
        self.click(PASSWORD)
        dialog = self.window(PASSWORD)
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
        self.shown_panel()
        self.click(RELEASE)
        dialog = self.window(RELEASE)
        self.type(dialog, "wrong")
        box = self.opened_by(lambda: self.keys(dialog, "Return"))
        self.keys(box, "Escape")
        self.gone(box)
        self.keys(dialog, "Escape")
        self.gone(dialog)

    def notify(self, user="zhangsan"):
        """A message is pushed; its texts differ in length and letters from those before."""
        self.number += 1
        letters = [chr(first + offset) for first in (0x4e00, 0x41) for offset in range(26)]
        # The first messages hold all of them, so that the second minute begins with their shapes loaded.
        text = "".join(letters if self.number < len(self.all) else
                       self.random.choices(letters, k=self.random.randrange(5, 60)))
        self.call(*NOTIFICATION, "Notify", "1", user, f"通知 {self.number}", text, "管理员")

    def message(self):
        """A message is pushed and clicked; in the notice dialog it is read, and the next one asked for."""
        self.read_messages(self.done["message"] % 2, lambda: "正文 " * self.random.randrange(1, 200))

    def long_message(self):
        """The same with messages of 1 MB without a blank."""
        self.read_messages(self.done["long_message"] % 2, lambda: LONG)

    def read_messages(self, last, content):
        """Pushes a message, and reads the last one of those there or asks for the next."""
        at = "2026-11-24T08:30:00Z"
        # A dialog that a late reply has opened again may still show one of the messages before: the server knows them.
        self.earlier = [dict(message, content="", read_at=at) for message in self.earlier[-6:]]
        messages = [
            {"uuid": f"{self.number}-{index}", "uid": "zhangsan", "send_uid": "管理员", "title": f"标题 {self.number}",
             "content": f"正文 {index} {content()}", "read_at": "", "created_at": at}
            for index in range(1 if last else 3)]
        self.earlier += messages
        roomclient.patch_state({"messages": self.earlier})
        self.desktop.run("dunstctl", "close-all")
        self.notify(self.random.choice(("zhangsan", "")))
        self.desktop.wait("the notification", lambda: "1" in self.desktop.run("timeout", "2", "dunstctl", "count",
                                                                              "displayed"))
        self.desktop.run("dunstctl", "action")
        notice = self.window(NOTICE)
        self.desktop.run("dunstctl", "close-all")
        asked = len(roomclient.record("http", method="PUT"))
        self.click("已读" if last else "下一条")
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
