# SPDX-License-Identifier: Apache-2.0
"""What a user does once happens once, whatever they press while the client waits for the answer."""

from clienttest import ClientTest, roomclient, unittest

from stage import PASSWORD, RELEASE, Stage

REFUSED = '{"code": -100002, "msg": "no"}'


class Once(ClientTest):
    def setUp(self):
        super().setUp()
        self.stage = Stage(self.desktop)
        self.start_shown()

    def press(self, *keys):
        """Presses the keys where the focus is, within 400 ms."""
        self.desktop.run("xdotool", "key", "--delay", "100", *keys)

    def answered(self, text, before):
        self.until(text, lambda: sum(text in line for line in roomclient.syslog_lines()) > before)

    def test_password_is_changed_once(self):
        roomclient.add_fault({"dbus": "ModifyUserPassword"}, {"value": REFUSED, "delay_ms": 1500})
        self.stage.click(PASSWORD)
        dialog = self.stage.window(PASSWORD)
        self.stage.keys(dialog, *"old", "Tab", *"new", "Tab", *"new")
        confirm = self.stage.place("确认")
        for round_ in range(2):
            # The last ones go into the repeated password.
            self.press("Return", "Return", "Return", "Return", "x", "Escape")
            self.desktop.click(*confirm)
            self.answered("modifyConfirm \"{", round_)
        roomclient.clear_faults()
        # What is typed after the answer counts again.
        self.press("Escape")
        self.stage.gone(dialog)
        calls = roomclient.record(method="ModifyUserPassword")
        self.assertEqual([call["args"][1:] for call in calls], [["old", "new"]] * 2)

    def test_terminal_is_released_and_rebooted_once(self):
        roomclient.add_fault({"path": "*/remove_status"}, {"body": '{"code": 1, "msg": "no"}', "delay_ms": 1200})
        self.stage.click(RELEASE)
        dialog = self.stage.window(RELEASE)
        self.stage.type(dialog, "Admin@2026")
        others = {window for window, _ in self.desktop.windows()}
        self.press("Return", "Return", "Return", "Return", "Escape")
        self.answered("提示“管理员帐号或密码错误”“确定”:", 0)
        box = self.until("the box", lambda: {window for window, _ in self.desktop.windows()} - others).pop()
        roomclient.clear_faults()
        self.stage.keys(box, "Escape")
        self.stage.gone(box)
        self.assertEqual(len(roomclient.record(path="/uim/v3/client/remove_status")), 1)

        roomclient.add_fault({"dbus": "Reboot"}, {"error": "com.vantor.Error.Busy", "delay_ms": 1500})
        self.stage.type(dialog, "Admin@2026")
        self.press("Return")
        spinner = self.stage.window("当前终端已解除管控,重启后生效")
        reboot = self.stage.place("立即重启")
        roomclient.wait_record(lambda entry: entry.get("path") == "/uim/v3/client/remove")
        for round_ in range(2):
            self.desktop.click(*reboot)
            self.until("the call", lambda wanted=round_ + 1: len(roomclient.record(method="Reboot")) == wanted)
            self.desktop.click(*reboot)
            self.press("space", "Return", "Return")
            self.answered("warning [ spinerwin.cpp", round_)
        self.press("Escape")
        self.stage.gone(spinner)
        self.assertEqual(len(roomclient.record(method="Reboot")), 2)


if __name__ == "__main__":
    unittest.main()
