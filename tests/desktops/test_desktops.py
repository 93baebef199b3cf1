# SPDX-License-Identifier: Apache-2.0
"""The client on the desktops that people have: seen, clicked, in its place, heard."""

import contextlib
import os

import desktops
from clienttest import CLIENT, SYSLOG, roomclient, unittest, write
from stage import NOTICE, Stage

MESSAGE = {"uuid": "1", "uid": "zhangsan", "send_uid": "管理员", "title": "密码将于 7 天后到期", "content": "请修改密码。",
           "read_at": "", "created_at": "2026-11-24T08:30:00Z"}


class DesktopTest:
    """What holds on every desktop; a picture of each is left."""

    kind = None

    def start(self, edge="bottom", **options):
        """The desktop, and the client with its icon in the desktop's panel."""
        write(SYSLOG, b"")
        self.desktop = self.enterContext(self.kind())
        self.desktop.set_background("#3d5a80")
        self.desktop.start(edge, **options)
        self.stage = Stage(self.desktop, os.environ["PICTURES"])
        self.client = self.desktop.start_client(CLIENT)
        # Its panel has grown by the scenes then.
        roomclient.wait_syslog("parse config.json file ok.", 30)
        if self.desktop.bar:
            self.desktop.wait("the icon", self.desktop.icon)

    def picture(self, name):
        self.desktop.screenshot(f"{os.environ['PICTURES']}/{self.kind.__name__.lower()}-{name}.png")

    def test_place(self):
        for edge in ("bottom", "top", "left", "right"):
            with self.subTest(edge):
                self.doCleanups()
                self.start(edge)
                panel = self.desktop.show_panel()
                # Growing and moving are two steps of the window manager's.
                with contextlib.suppress(TimeoutError):
                    self.desktop.wait("the place", lambda window=panel: self.is_clear(self.desktop.geometry(window)))
                self.picture(edge)
                place = self.desktop.geometry(panel)
                self.assertTrue(self.is_clear(place), f"{place} beside {self.desktop.bar_area()}")

    def is_clear(self, place):
        """Whether a place is on the screen and clear of the desktop's panel."""
        bar = self.desktop.bar_area()
        apart = any(one[i] + one[i + 2] <= other[i] for one, other in ((place, bar), (bar, place)) for i in (0, 1))
        return apart and min(place) >= 0 and place[0] + place[2] <= 1280 and place[1] + place[3] <= 800

    def test_restart_of_the_desktop_panel(self):
        self.start(bar=False)
        self.desktop.start_bar()
        self.desktop.wait("the icon", self.desktop.icon)
        self.desktop.stop_bar()
        self.desktop.start_bar()
        self.desktop.wait("the icon", self.desktop.icon)
        panel = self.desktop.show_panel()
        self.desktop.click_once()
        self.stage.gone(panel)

    def test_first_show_over_a_maximized_window(self):
        self.start(**self.first_show)
        self.desktop.open_maximized()
        panel = self.desktop.show_panel()
        self.desktop.wait_active(panel)
        self.picture("first-show")
        self.desktop.run("xdotool", "key", "Escape")
        self.stage.gone(panel)
        self.desktop.click(500, 400)
        dialog = self.stage.failed_verification("关键文件被修改")
        self.desktop.wait_active(dialog)
        self.picture("integrity")
        self.desktop.run("xdotool", "key", "Escape")
        self.stage.gone(dialog)

    first_show = {}

    def test_message(self):
        roomclient.patch_state({"messages": [MESSAGE]})
        self.start()
        self.desktop.open_maximized()
        before = self.desktop.windows(self.desktop.notifier_class)
        self.stage.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "Notify", "1", "zhangsan",
                        MESSAGE["title"], MESSAGE["content"], MESSAGE["send_uid"])
        window = self.desktop.wait("the notification", lambda: [
            window for window, _ in self.desktop.windows(self.desktop.notifier_class)
            if window not in dict(before)])[0]
        self.stage.picture(f"{self.kind.__name__.lower()}-notification")
        self.desktop.click_notification(window)
        notice = self.stage.window(NOTICE)
        self.desktop.wait_active(notice)
        self.picture("notice")

    def test_task_bar(self):
        self.start()
        before = self.desktop.task_bar()
        self.desktop.show_panel()
        self.desktop.wait("the task bar as before", lambda: (self.desktop.task_bar() == before).all())
        self.desktop.open_maximized()
        self.desktop.wait("another window's entry", lambda: (self.desktop.task_bar() != before).any())


class Xfce(DesktopTest, unittest.TestCase):
    kind = desktops.Xfce


class Lxqt(DesktopTest, unittest.TestCase):
    kind = desktops.Lxqt
    first_show = {"compositor": True}


class Mate(DesktopTest, unittest.TestCase):
    kind = desktops.Mate


class Plasma(DesktopTest, unittest.TestCase):
    kind = desktops.Plasma
