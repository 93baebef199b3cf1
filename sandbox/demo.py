# SPDX-License-Identifier: Apache-2.0
"""Shows the client on a small desktop inside a room and takes pictures of it.

    demo.py CLIENT PICTURES [--window]

CLIENT is the program, PICTURES the directory for the PNG files. With --window the desktop is a Xephyr window on the
display given by the environment, and stays until that window is closed.
"""

import argparse
import os
import sys

import roomclient
from desktop import Desktop, stop
from stage import NOTICE, PASSWORD, RELEASE, Stage

BACKGROUND = "#3d5a80"


class Demo(Stage):
    """The scenes of the demo; each leaves its pictures and puts the desktop back."""

    def panel(self):
        """The panel's two pages."""
        # The first left click after the start only hides the hidden panel; a right click before it makes it show.
        self.desktop.click_icon(button=3)
        self.desktop.click_icon()
        panel = self.desktop.wait("the panel", self.desktop.panel)
        self.reader.control(role="combo box")
        for name, button in (("login", "登录信息"), ("network", "网络信息")):
            asked = len(roomclient.record("dbus", method="GetActiveConnectionInfo"))
            self.click(button)
            self.desktop.wait("the page", lambda: len(roomclient.record("dbus", method="GetActiveConnectionInfo")) > asked)
            self.desktop.run("xdotool", "mousemove", "400", "300")
            self.picture(f"panel-{name}", panel)
            self.picture(f"desktop-{name}")

    def messages(self):
        """An unread message is pushed, opened, stepped through and marked read."""
        roomclient.patch_state({"messages": [
            {"uuid": "1", "uid": "zhangsan", "send_uid": "信息中心", "title": "关于终端安全检查的通知",
             "content": "各位同事：\n\n本周五将对全部终端进行安全检查，请提前保存文件。", "read_at": "",
             "created_at": "2026-11-20T02:05:00Z"},
            {"uuid": "2", "uid": "zhangsan", "send_uid": "管理员", "title": "密码将于 7 天后到期",
             "content": "请在面板中点击“修改密码”完成修改。", "read_at": "", "created_at": "2026-11-24T08:30:00Z"}]})
        self.desktop.run("dunstctl", "close-all")
        self.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "Notify",
                  "1", "zhangsan", "密码将于 7 天后到期", "请在面板中点击“修改密码”完成修改。", "管理员")
        self.desktop.wait("the notification", lambda: "1" in self.desktop.run("dunstctl", "count", "displayed"))
        self.picture("message-pushed")
        self.desktop.run("dunstctl", "action")
        notice = self.window(NOTICE)
        self.desktop.run("dunstctl", "close-all")
        self.picture("message-several", notice)
        for name, button in (("message-last", "下一条"), ("message-none", "已读")):
            listed = len(roomclient.record("http", path="/notification/v2/list"))
            self.click(button)
            self.desktop.wait("the refresh", lambda: len(roomclient.record("http", path="/notification/v2/list")) > listed)
            self.picture(name, notice)
        self.keys(notice, "Escape")
        self.gone(notice)

    def password(self):
        """A refused password change, then one that succeeds."""
        self.click(PASSWORD)
        dialog = self.window(PASSWORD)
        for old, name in (("wrong", "password-alert"), ("Zent@2026", None)):
            self.keys(dialog, "ctrl+a")
            for text in (old, "New@2026x", "New@2026x"):
                self.type(dialog, text)
                self.keys(dialog, "Tab")
            self.keys(dialog, "shift+Tab")
            asked = len(roomclient.record("dbus", method="ModifyUserPassword"))
            self.keys(dialog, "Return")
            self.desktop.wait("the change", lambda: len(roomclient.record("dbus", method="ModifyUserPassword")) > asked)
            if name:
                self.picture(name)
                self.keys(dialog, "shift+Tab", "shift+Tab")
        self.gone(dialog)
        self.picture("password-changed")

    def integrity(self):
        """A failed device-integrity verification."""
        dialog = self.failed_verification("关键文件被修改：/usr/bin/login")
        self.picture("integrity-failed", dialog)
        self.keys(dialog, "Escape")
        self.gone(dialog)

    def release(self):
        """A refused administrator password, then the release up to the reboot prompt."""
        self.click(RELEASE)
        dialog = self.window(RELEASE)
        self.type(dialog, "wrong")
        self.picture("release-password", dialog)
        box = self.opened_by(lambda: self.keys(dialog, "Return"))
        self.picture("release-refused")
        self.keys(box, "Escape")
        self.gone(box)
        self.type(dialog, "Admin@2026")
        spinner = self.opened_by(lambda: self.keys(dialog, "Return"))
        self.desktop.screenshot(os.path.join(self.directory, "release-running.png"), spinner)
        roomclient.wait_record(lambda entry: entry.get("path") == "/uim/v3/client/remove")
        # The worker's last step; the prompt follows at once.
        roomclient.wait_syslog(".....execute hide-module:")
        self.picture("release-reboot", spinner)


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("client")
    parser.add_argument("pictures")
    parser.add_argument("--window", action="store_true")
    options = parser.parse_args()
    os.makedirs(options.pictures, exist_ok=True)
    with Desktop(server="Xephyr" if options.window else "Xvfb") as desktop:
        desktop.set_background(BACKGROUND)
        desktop.start_window_manager()
        desktop.start_tray()
        desktop.start_notifications()
        demo = Demo(desktop, options.pictures)
        client = desktop.start_client(options.client)
        desktop.wait("the tray icon", desktop.icon)
        for scene in (demo.panel, demo.messages, demo.integrity, demo.password, demo.release):
            scene()
        if options.window:
            print("The desktop is yours: click the tray icon. Close the window to end the demo.", flush=True)
            desktop.x.wait()
            return 0
        status = stop(client)
    print(f"pictures: {options.pictures}")
    return status


if __name__ == "__main__":
    sys.exit(main())
