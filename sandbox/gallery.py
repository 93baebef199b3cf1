# SPDX-License-Identifier: Apache-2.0
"""Takes a picture of every window of the client, in one colour scheme and at one scale, inside a room.

    gallery.py CLIENT PICTURES [--theme light|dark] [--scale FACTOR]

The pictures are PICTURES/WINDOW-THEME-SCALE.png.
"""

import argparse
import filecmp
import os
import subprocess
import sys

import roomclient
from desktop import Desktop, stop
from stage import NOTICE, PASSWORD, RELEASE, Stage

BACKGROUNDS = {"light": "#8fa3b8", "dark": "#16202c"}
BUBBLE = "#B3261E"
WARNING = "#C62828"
USERINFO = "/etc/zent/userinfo.json"
PLAIN_USER = "uid=1000(zhangsan) gid=1000(zhangsan) groups=1000(zhangsan),1002(zent-users)"


def alerting(colours):
    """Whether the colours of a picture are those of a window with an alert on it."""
    return BUBBLE in colours


class Gallery(Stage):
    """The scenes of the gallery, in the order in which they can follow each other."""

    def __init__(self, desktop, directory, client, theme):
        super().__init__(desktop, directory)
        self.client = client
        self.suffix = f"-{theme}-{desktop.scale:g}"
        self.taken = []

    def shoot(self, name, window, until=None, most=sys.maxsize):
        """A picture of the part of the screen where a window is, cut to a width, once it is steady.

        Or, with until, once until(colours) is true for the text that lists the picture's colours.
        """
        path = os.path.join(self.directory, name + self.suffix + ".png")
        seen = []

        def shot():
            geometry = self.desktop.geometry(window)
            if not geometry:
                return False
            x, y, width, height = geometry
            # Without the time, so that equal pictures are equal files.
            subprocess.run(["import", "-window", "root", "-crop", f"{min(width, most)}x{height}+{x}+{y}", "+repage",
                            "-strip", "-define", "png:exclude-chunk=date,time", path], env=self.desktop.env, check=True)
            if until:
                return until(self.colours_of(path))
            with open(path, "rb") as stream:
                seen.append(stream.read())
            # A blinking cursor makes two pictures that alternate.
            return seen[-1] in seen[-4:-1]

        self.desktop.wait(f"the picture {name}", shot)
        self.taken.append(path)

    def colours_of(self, path):
        """The colours of a picture, as text."""
        return self.desktop.run("convert", path, "-unique-colors", "-depth", "8", "txt:-")

    def colours(self, window):
        """The colours of a window on the screen, as text."""
        return self.desktop.run("sh", "-c", f"import -window {window} png:- | convert png:- -unique-colors -depth 8 txt:-")

    def start(self):
        """Starts the client and opens its panel."""
        process = self.desktop.start_client(self.client)
        self.desktop.wait("the tray icon", self.desktop.icon)
        self.desktop.click_icon(button=3)
        self.desktop.click_icon()
        return process, self.desktop.wait("the panel", self.desktop.panel)

    def rest_pointer(self):
        """Takes the pointer to where nothing lights up below it."""
        self.desktop.run("xdotool", "mousemove", "2", "2")

    def asking(self, method, action):
        """Does something and waits until a method has been called once more."""
        asked = len(roomclient.record("dbus", method=method))
        action()
        self.desktop.wait("the call of " + method, lambda: len(roomclient.record("dbus", method=method)) > asked)

    def start_up_box(self):
        """The box of a terminal whose info file goes away during the start."""
        roomclient.set_standin("id", hook=f"mv {USERINFO} {USERINFO}.away")
        box = self.opened_by(lambda: self.desktop.start_client(self.client))
        self.rest_pointer()
        self.shoot("start-up", box)
        self.keys(box, "Return")
        self.gone(box)
        roomclient.set_standin("id")
        os.rename(USERINFO + ".away", USERINFO)

    def plain_panel(self):
        """The panel of somebody who may not release the terminal and has one place to work in."""
        scenes = roomclient.state()["scenes"]
        roomclient.set_standin("id", stdout=PLAIN_USER + "\n")
        roomclient.patch_state({"scenes": [], "organisation": {"name": "示例科技集团有限公司华东区域信息化建设与运维中心"}})
        process, panel = self.start()
        self.desktop.wait("the scenes", lambda: roomclient.record("http", path="/api/client/area/scenes"))
        self.rest_pointer()
        self.shoot("panel-plain", panel)
        stop(process)
        roomclient.set_standin("id")
        roomclient.patch_state({"scenes": scenes, "organisation": {"name": "示例科技集团有限公司"}})

    def panel(self):
        """The panel's two pages, and the list of scenes."""
        _, panel = self.start()
        self.reader.control(role="combo box")
        for name, button in (("network", "网络信息"), ("login", "登录信息")):
            self.asking("GetActiveConnectionInfo", lambda button=button: self.click(button))
            self.rest_pointer()
            self.shoot("panel-" + name, panel)
        scenes = self.opened_by(lambda: self.click(role="combo box"))
        self.shoot("panel-scenes", scenes)
        self.keys(scenes, "Escape")
        self.gone(scenes)
        tint2, _ = self.desktop.windows("tint2")[0]
        self.shoot("tray", tint2, most=round(200 * self.desktop.scale))

    def messages(self):
        """The desktop notification, the notice dialog's forms and the box after a failed call."""
        self.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "Notify",
                  "1", "zhangsan", "密码将于 7 天后到期", "请在面板中点击“修改密码”完成修改。", "管理员")
        popup, _ = self.desktop.wait("the notification", lambda: self.desktop.windows("Dunst"))[0]
        self.shoot("notification", popup)
        self.desktop.run("dunstctl", "action")
        notice = self.window(NOTICE)
        self.desktop.run("dunstctl", "close-all")
        self.shoot("notice-several", notice)
        roomclient.add_fault({"path": "/notification/v2/read*"}, {"status": 500, "body": "{}"}, 1)
        box = self.opened_by(lambda: self.click("下一条"))
        self.rest_pointer()
        self.shoot("notice-failed", box)
        self.keys(box, "Return")
        self.gone(box)
        messages = roomclient.state()["messages"]
        for count, name in ((1, "notice-one"), (0, "notice-none")):
            kept = [dict(message, read_at="" if at < count else "2026-11-24T09:00:00Z")
                    for at, message in enumerate(messages)]
            roomclient.patch_state({"messages": kept})
            listed = len(roomclient.record("http", path="/notification/v2/list"))
            self.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "Notify",
                      "1", "zhangsan", "系统维护通知", "请查看。", "管理员")
            self.desktop.wait("the notification", lambda: "1" in self.desktop.run("dunstctl", "count", "displayed"))
            self.desktop.run("dunstctl", "action")
            self.desktop.wait("the refresh",
                              lambda: len(roomclient.record("http", path="/notification/v2/list")) > listed)
            self.desktop.run("dunstctl", "close-all")
            self.rest_pointer()
            self.shoot(name, notice)
        self.keys(notice, "Escape")
        self.gone(notice)

    def integrity(self):
        """A failed device-integrity verification."""
        dialog = self.failed_verification("关键文件被修改：/usr/bin/login")
        self.shoot("integrity", dialog)
        self.keys(dialog, "Escape")
        self.gone(dialog)

    def fill_password(self, dialog, *texts):
        """Types into the password dialog's three fields, from the first one on; the focus stays in the last."""
        for at, text in enumerate(texts):
            if at:
                self.keys(dialog, "Tab")
            self.keys(dialog, "ctrl+a")
            self.type(dialog, text)

    def password(self):
        """The password dialog and what it says."""
        self.click(PASSWORD)
        dialog = self.window(PASSWORD)
        self.rest_pointer()
        self.shoot("password-empty", dialog)
        self.keys(dialog, "Caps_Lock")
        self.shoot("password-caps-lock", dialog)
        self.keys(dialog, "Caps_Lock")
        self.fill_password(dialog, "Zent@2026", "New@2026x", "New@2026y")
        self.keys(dialog, "Tab")
        self.shoot("password-mismatch", dialog, until=alerting)
        self.keys(dialog, "shift+Tab", "ctrl+a")
        self.type(dialog, "New@2026x")
        self.click("显示密码", within="请输入旧密码")
        self.rest_pointer()
        self.shoot("password-filled", dialog)
        for code, name in ((-100002, "old-alert"), (-500, "new-alert"), (-1, "failed")):
            answer = f'{{"code": {code}, "msg": "密码不符合要求：长度至少 8 位"}}'
            roomclient.add_fault({"dbus": "ModifyUserPassword"}, {"value": answer}, 1)
            self.desktop.wait("no alert", lambda: BUBBLE not in self.colours(dialog))
            if code == -1:
                box = self.opened_by(lambda: self.keys(dialog, "Return"))
                self.shoot("password-" + name, box)
                self.keys(box, "Return")
                self.gone(box)
            else:
                self.keys(dialog, "Return")
                self.shoot("password-" + name, dialog, until=alerting)
        self.keys(dialog, "Escape")
        self.gone(dialog)

    def release(self):
        """The release dialog up to the reboot prompt."""
        self.click(RELEASE)
        dialog = self.window(RELEASE)
        self.rest_pointer()
        self.shoot("release-empty", dialog)
        for name, password in (("release-refused", "wrong"), ("release-offline", "Admin@2026")):
            if name == "release-offline":
                roomclient.add_fault({"path": "/uim/*"}, {"status": 500, "body": "{}"}, 1)
            self.type(dialog, password)
            if name == "release-refused":
                self.shoot("release-filled", dialog)
            box = self.opened_by(lambda: self.keys(dialog, "Return"))
            self.shoot(name, box)
            self.keys(box, "Escape")
            self.gone(box)
        # The worker takes a second. The delays let the window draw itself and then keep it on the screen.
        roomclient.add_fault({"dbus": "onDomainConfig"}, {"delay_ms": 500}, 1)
        roomclient.add_fault({"dbus": "Set", "service": "com.vantor.zent.iam"}, {"delay_ms": 4000}, 1)
        self.type(dialog, "Admin@2026")
        spinner = self.opened_by(lambda: self.keys(dialog, "Return"))
        # Until the window has drawn itself, the picture shows the red button of the dialog behind it.
        self.shoot("release-running", spinner, until=lambda colours: WARNING not in colours)
        self.reader.control("立即重启")
        self.shoot("release-reboot", spinner)
        running, prompt = self.taken[-2:]
        if filecmp.cmp(running, prompt, shallow=False):
            print("release-running: the worker was faster than the camera", file=sys.stderr)
            os.remove(running)
            self.taken.remove(running)

    def all(self):
        """Every scene; returns the pictures' files."""
        for scene in (self.start_up_box, self.plain_panel, self.panel, self.messages, self.integrity, self.password,
                      self.release):
            scene()
        return self.taken


def take(client, directory, theme, scale):
    """Takes all pictures on a desktop of their own; returns their files."""
    os.makedirs(directory, exist_ok=True)
    with Desktop(scale=scale) as desktop:
        desktop.set_background(BACKGROUNDS[theme])
        desktop.start_window_manager()
        desktop.start_tray()
        desktop.start_notifications()
        desktop.start_portal(theme)
        return Gallery(desktop, directory, client, theme).all()


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("client")
    parser.add_argument("pictures")
    parser.add_argument("--theme", choices=BACKGROUNDS, default="light")
    parser.add_argument("--scale", type=float, default=1)
    options = parser.parse_args()
    taken = take(options.client, options.pictures, options.theme, options.scale)
    print(f"{len(taken)} pictures, {options.theme}, scale {options.scale:g}: {options.pictures}")


if __name__ == "__main__":
    sys.exit(main())
