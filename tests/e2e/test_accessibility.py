# SPDX-License-Identifier: Apache-2.0
"""The windows as a screen reader meets them, through a real accessibility bus, and their use by keyboard alone."""

import contextlib

from clienttest import ClientTest, roomclient
from gi.repository import GLib

from accessible import ACCESSIBLE, INACTIVE, PROPERTIES
from stage import INTEGRITY, NOTICE, PANEL, PASSWORD, RELEASE, Stage

CLOSE = "关闭"


class Accessibility(ClientTest):
    def setUp(self):
        super().setUp()
        self.stage = Stage(self.desktop)
        self.reader = self.stage.reader
        self.start()

    def window(self, title, role):
        """Waits for the window, and checks that whatever can be used in it has a name."""
        found = self.reader.wait(f"the window {title}", lambda: next(
            (w for w in self.reader.windows() if (w.property("Name"), w.role()) == (title, role)), None), timeout=20)
        for node in found.showing():
            if node.has("FOCUSABLE") or node.role() not in INACTIVE:
                self.assertTrue(node.name(), f"a {node.role()} without a name in {title}")
        return found

    def open_panel(self):
        self.desktop.click_icon(button=3)
        self.desktop.click_icon()
        panel = self.window(PANEL, "frame")
        self.reader.wait("the scenes", lambda: "combo box" in [node.role() for node in panel.showing()])
        return panel

    def test_panel_and_its_dialogs(self):
        panel = self.open_panel()

        def await_row(row):
            self.reader.wait(row, lambda: row in [node.property("Name") for node in panel.showing()])

        await_row("终端别名：研发中心-终端-017")
        self.reader.tab_through(CLOSE, "登录信息")
        self.reader.key("Right", "space")
        await_row("IPv4：10.20.30.117")
        self.reader.tab_through("场所：内网场景", "置顶显示", RELEASE, PASSWORD)
        self.reader.key("space")
        self.window(PASSWORD, "dialog")
        self.reader.await_focus("请输入旧密码")
        self.reader.tab_through("请输入新密码", "请再次输入新密码", "取消", CLOSE, "请输入旧密码")
        self.reader.key("Escape")
        self.reader.gone(PASSWORD)
        self.reader.await_focus(PASSWORD)
        self.reader.key("shift+Tab")
        self.reader.await_focus(RELEASE)
        self.reader.key("Return")
        self.window(RELEASE, "dialog")
        self.reader.await_focus("请输入管理员密码解除管控")
        self.desktop.run("xdotool", "type", "Admin@2026")
        self.reader.key("Return")
        self.window("当前终端已解除管控,重启后生效", "dialog")
        self.reader.await_focus("稍后重启")
        self.reader.tab_through("立即重启")
        self.reader.key("space")
        roomclient.wait_record(lambda entry: entry.get("method") == "Reboot")

    def test_hidden_passwords_are_not_told(self):
        told = []
        # Qt misses a listener that registers while the client connects to the accessibility bus.
        self.open_panel()
        for event in ("text-changed:insert", "text-changed:delete"):
            self.reader.bus.call_sync(
                "org.a11y.atspi.Registry", "/org/a11y/atspi/registry", "org.a11y.atspi.Registry", "RegisterEvent",
                GLib.Variant("(sass)", ("object:" + event, [], "")), None, 0, 5000, None)
        self.reader.bus.signal_subscribe(None, "org.a11y.atspi.Event.Object", "TextChanged", None, None, 0,
                                         lambda *signal: told.append(signal[5].unpack()))

        def hear(count):
            def heard():
                GLib.MainContext.default().iteration(False)
                return len(told) >= count
            self.until("the events", heard)
            return [(kind, text) for kind, _, _, text, *_ in told]

        self.reader.key("shift+Tab", "space")
        dialog = self.window(PASSWORD, "dialog")
        self.reader.await_focus("请输入旧密码")
        self.reader.key("Q", "z")
        self.assertEqual(hear(2), [("insert", "*")] * 2)
        field = next(node for node in dialog.showing() if node.has("FOCUSED") and node.name() == "请输入旧密码")
        for method, arguments in {"GetText": GLib.Variant("(ii)", (0, -1)),
                                  "GetTextAtOffset": GLib.Variant("(iu)", (1, 0))}.items():
            self.assertEqual(field.call(method, "org.a11y.atspi.Text", arguments), "")
        # Shown, and still so when it closes.
        self.reader.key("ctrl+r", "7", "Escape")
        self.assertEqual(hear(4)[2:], [("insert", "7"), ("delete", "***")])

    def test_properties_can_be_asked_for_in_every_way(self):
        panel = self.open_panel()
        for arguments in ((), (ACCESSIBLE,), (ACCESSIBLE, "Name"), ("", "", "")):
            with contextlib.suppress(GLib.Error):
                panel.call("GetAll", PROPERTIES, GLib.Variant.new_tuple(*map(GLib.Variant.new_string, arguments)))
        self.window(PANEL, "frame")

    def test_dialogs_that_come_by_themselves(self):
        self.desktop.start_notifications()
        self.stage.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "Notify", "1", "zhangsan", "通知",
                   "正文", "管理员")
        self.until("the notification", lambda: "1" in self.desktop.run("dunstctl", "count", "displayed"))
        self.desktop.run("dunstctl", "action")
        self.window(NOTICE, "dialog")
        self.reader.await_focus("消息内容")
        self.reader.key("Escape")
        self.reader.gone(NOTICE)
        self.stage.failed_verification("校验失败")
        dialog = self.window(INTEGRITY, "dialog")
        self.assertEqual(dialog.property("Description"), "校验失败")
        self.reader.await_focus("修复方法")
        self.reader.key("Escape")
        self.reader.gone(INTEGRITY)
