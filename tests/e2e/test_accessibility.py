"""The windows as a screen reader meets them, through a real accessibility bus, and their use by keyboard alone."""

import re

from gi.repository import Gio, GLib

from clienttest import ClientTest, roomclient, unittest

from stage import Stage

ACCESSIBLE = "org.a11y.atspi.Accessible"
PROPERTIES = "org.freedesktop.DBus.Properties"
PANEL, RELEASE, PASSWORD = "终端域管平台", "解除管控", "修改密码"
CLOSE = "关闭"
LOGIN_ROWS = ["终端别名：研发中心-终端-017", "组织名称：示例科技集团有限公司", "人员姓名：张三", "工号：A10023",
              "部门：研发一部", "登录时间："]
NETWORK_ROWS = ["主机名：terminal-017", "用户名：zhangsan", "MAC：5C:3A:45:1E:7B:90", "IPv4：10.20.30.117",
                "网关：10.20.30.1", "DNS：10.20.1.53", "子网掩码：255.255.255.0", "速率：1000 Mb/s"]
# What cannot be used is not looked at: containers, separators, and labels, which lead nowhere.
INACTIVE = {"dialog", "filler", "frame", "graphic", "label", "list", "panel", "separator"}

STATES = {"ACTIVE": 1, "FOCUSABLE": 11, "FOCUSED": 12, "SHOWING": 25}
LABELLED_BY = 2


class Node:
    """An object on the accessibility bus. Every question goes to the client: nothing is remembered."""

    def __init__(self, bus, owner, path):
        self.bus, self.owner, self.path = bus, owner, path

    def call(self, method, interface=ACCESSIBLE, arguments=None):
        return self.bus.call_sync(self.owner, self.path, interface, method, arguments, None, 0, 5000, None).unpack()[0]

    def text(self, what):
        return self.call("Get", PROPERTIES, GLib.Variant("(ss)", (ACCESSIBLE, what)))

    def role(self):
        return self.call("GetRoleName")

    def has(self, state):
        words = self.call("GetState")
        return bool(words[STATES[state] // 32] >> STATES[state] % 32 & 1)

    def children(self):
        return [Node(self.bus, *child) for child in self.call("GetChildren")]

    def showing(self):
        """The object and what it shows, in reading order."""
        if self.has("SHOWING"):
            yield self
            for child in self.children():
                yield from child.showing()

    def name(self):
        """What a screen reader calls the object: its own name, with that of its caption where it has one."""
        own = self.text("Name").strip()
        for kind, targets in self.call("GetRelationSet"):
            caption = Node(self.bus, *targets[0]).text("Name") if kind == LABELLED_BY else ""
            if not own.startswith(caption):
                return f"{caption}：{own}"
        return own


class Accessibility(ClientTest):
    def setUp(self):
        super().setUp()
        self.desktop.spawn(["/usr/libexec/at-spi-bus-launcher", "--launch-immediately"])
        address = self.until("the accessibility bus", lambda: re.search('"(.*)"', self.desktop.run(
            "xprop", "-root", "AT_SPI_BUS")))
        self.bus = Gio.DBusConnection.new_for_address_sync(
            address[1], Gio.DBusConnectionFlags.AUTHENTICATION_CLIENT | Gio.DBusConnectionFlags.MESSAGE_BUS_CONNECTION)
        self.start(QT_LINUX_ACCESSIBILITY_ALWAYS_ON="1")

    def windows(self):
        """The client's windows on the screen."""
        def process(node):
            return Node(self.bus, "org.freedesktop.DBus", "/").call(
                "GetConnectionUnixProcessID", "org.freedesktop.DBus", GLib.Variant("(s)", (node.owner,)))
        applications = Node(self.bus, "org.a11y.atspi.Registry", "/org/a11y/atspi/accessible/root").children()
        return [window for application in applications if process(application) == self.client.pid
                for window in application.children() if window.has("SHOWING")]

    def look(self, what, question, timeout=10):
        """Waits until question() is true; what vanishes while it is looked at counts as no answer."""
        def answer():
            try:
                return question()
            except GLib.Error:
                return None
        return self.until(what, answer, timeout)

    def window(self, title, role):
        """Waits for the window, and checks that whatever can be used in it has a name."""
        found = self.look(f"the window {title}", lambda: next(
            (w for w in self.windows() if (w.text("Name"), w.role()) == (title, role)), None), 20)
        for node in found.showing():
            if node.has("FOCUSABLE") or node.role() not in INACTIVE:
                self.assertTrue(node.name(), f"a {node.role()} without a name in {title}")
        return found

    def gone(self, title):
        self.look(f"{title} to close", lambda: title not in [w.text("Name") for w in self.windows()])

    def focused(self):
        """The name of what has the focus in the active window, or nothing."""
        return next((node.name() for window in self.windows() if window.has("ACTIVE")
                     for node in window.showing() if node.has("FOCUSED") and node.role() not in INACTIVE), "")

    def key(self, *keys):
        self.desktop.run("xdotool", "key", *keys)

    def await_focus(self, wanted):
        self.look(f"the focus on {wanted}", lambda: self.focused() == wanted)

    def tab_through(self, *names):
        """Each Tab brings the focus to the next of the names."""
        for wanted in names:
            self.key("Tab")
            self.await_focus(wanted)

    def open_panel(self):
        self.desktop.click_icon(button=3)
        self.desktop.click_icon()
        panel = self.window(PANEL, "frame")
        self.look("the scenes", lambda: "combo box" in [node.role() for node in panel.showing()])
        return panel

    def test_panel(self):
        panel = self.open_panel()

        def reads(rows):
            labels = [node.text("Name") for node in panel.showing() if node.role() == "label"]
            values = [label for label in labels if "：" in label]
            return len(values) == len(rows) and all(map(str.startswith, values, rows))

        self.look("the login page", lambda: reads(LOGIN_ROWS))
        self.tab_through(CLOSE, "登录信息")
        self.key("Right", "space")
        self.look("the network page", lambda: reads(NETWORK_ROWS))
        self.tab_through("场所：内网场景")
        self.key("Escape")
        self.wait_hidden()

    def test_dialogs_of_the_panel(self):
        self.open_panel()
        self.tab_through(CLOSE, "登录信息", "场所：内网场景", "置顶显示", RELEASE, PASSWORD)
        self.key("space")
        self.window(PASSWORD, "dialog")
        self.await_focus("请输入旧密码")
        self.tab_through("请输入新密码", "请再次输入新密码", "取消", CLOSE, "请输入旧密码")
        self.key("Escape")
        self.gone(PASSWORD)
        self.key("shift+Tab")
        self.await_focus(RELEASE)
        self.key("Return")
        self.window(RELEASE, "dialog")
        self.await_focus("请输入管理员密码解除管控")
        self.desktop.run("xdotool", "type", "Admin@2026")
        self.key("Return")
        self.window("当前终端已解除管控,重启后生效", "dialog")
        self.await_focus("稍后重启")
        self.tab_through("立即重启")
        self.key("space")
        roomclient.wait_record(lambda entry: entry.get("method") == "Reboot")

    def test_dialogs_that_come_by_themselves(self):
        self.desktop.start_notifications()
        stage = Stage(self.desktop, "")
        stage.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "Notify", "1", "zhangsan", "通知",
                   "正文", "管理员")
        self.until("the notification", lambda: "1" in self.desktop.run("dunstctl", "count", "displayed"))
        self.desktop.run("dunstctl", "action")
        self.window("消息详情", "dialog")
        self.await_focus("消息内容")
        self.key("Escape")
        self.gone("消息详情")
        stage.failed_verification("校验失败")
        dialog = self.window("设备完整性校验失败", "dialog")
        self.assertEqual(dialog.text("Description"), "校验失败")
        self.await_focus("修复方法")
        self.key("Escape")
        self.gone("设备完整性校验失败")


if __name__ == "__main__":
    unittest.main()
