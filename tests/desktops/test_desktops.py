# SPDX-License-Identifier: Apache-2.0
"""The client on the desktops that people have: seen, clicked, in its place, heard.

    test_desktops.py ROOM CLIENT PICTURES [DESKTOP[.TEST]...]

Opens a room for each desktop, one after the other; xfce, lxqt, mate and plasma unless told otherwise.
"""

import contextlib
import os
import subprocess
import sys

if __name__ == "__main__" and "ROOM" not in os.environ:
    enter, client, pictures, *cases = sys.argv[1:]
    os.makedirs(pictures, exist_ok=True)
    cases = cases or ["xfce", "lxqt", "mate", "plasma"]
    sys.exit(max([subprocess.run(
        [enter, "--platform", "--env", "CLIENT=" + client, "--env", "PICTURES=" + pictures, "/usr/bin/python3", "-B",
         __file__, "-v", case[0].upper() + case[1:]], check=False).returncode for case in cases]))

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "../../sandbox"))

import desktops  # noqa: E402
from clienttest import CLIENT, SYSLOG, roomclient, unittest, write  # noqa: E402
from monitors import arrange  # noqa: E402
from stage import NOTICE, Stage  # noqa: E402

EDGES = ("bottom", "top", "left", "right")
MESSAGE = {"uuid": "1", "uid": "zhangsan", "send_uid": "管理员", "title": "密码将于 7 天后到期", "content": "请修改密码。",
           "read_at": "", "created_at": "2026-11-24T08:30:00Z"}


def overlap(one, other):
    return all(one[i] < other[i] + other[i + 2] and other[i] < one[i] + one[i + 2] for i in (0, 1))


class DesktopTest:
    """What holds on every desktop; a picture of each is left."""

    kind = None

    def start(self, edge="bottom", size="1280x800", server="Xvfb", monitors=None, **options):
        """The desktop, and the client with its icon in the desktop's panel."""
        write(SYSLOG, b"")
        self.desktop = self.enterContext(self.kind(size=size, server=server))
        if monitors:
            arrange(self.desktop, *monitors)
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

    def wait_placed(self, panel, fits):
        """Waits for a place that fits: growing and moving are two steps of the window manager's."""
        with contextlib.suppress(TimeoutError):
            self.desktop.wait("the place", lambda: fits(self.desktop.geometry(panel)))
        place = self.desktop.geometry(panel)
        self.assertTrue(fits(place), f"{place} beside {self.desktop.bar_area()}")

    def test_place(self):
        for edge in EDGES:
            with self.subTest(edge):
                self.doCleanups()
                self.start(edge)
                panel = self.desktop.show_panel()
                self.wait_placed(panel, lambda box: not overlap(box, self.desktop.bar_area()) and min(box) >= 0
                                  and box[0] + box[2] <= 1280 and box[1] + box[3] <= 800)
                self.picture(edge)

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

    def test_two_monitors(self):
        for name, primary, screens in (("left", 0, [(0, 0, 1280, 800), (1280, 0, 1024, 1024)]),
                                       ("right", 1, [(0, 0, 1024, 1024), (1024, 0, 1280, 800)])):
            with self.subTest(name):
                self.doCleanups()
                self.start(size="2304x1024", server="Xvnc", monitors=(screens, primary))
                panel = self.desktop.show_panel()
                bar = self.desktop.bar_area()
                self.wait_placed(panel, lambda box, bar=bar: (box[0] + box[2], box[1] + box[3]) ==
                                  (bar[0] + bar[2], bar[1]))
                self.picture(f"primary-{name}")
                # The timer that places the panel has met the work area, and rests.
                self.assertTrue(any(f"{bar[1]} : 800" in line for line in roomclient.syslog_lines()))


class Mate(DesktopTest, unittest.TestCase):
    kind = desktops.Mate


class Plasma(DesktopTest, unittest.TestCase):
    kind = desktops.Plasma


if __name__ == "__main__":
    unittest.main()
