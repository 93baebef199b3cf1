# SPDX-License-Identifier: Apache-2.0
"""The whole client: start and end, its objects on the session bus, children, its window, and impatient users."""

import os
import signal

from gi.repository import Gio, GLib

from clienttest import CLIENT, INFO_FILE, SYSLOG, TREE, ClientTest, read, roomclient, stop, write
from stage import PASSWORD, RELEASE, SERVICE, Stage

NOTIFICATION = "/com/vantor/tarn/Notification"
OBJECTS = {NOTIFICATION: "com.vantor.tarn.Notification", "/com/vantor/tarn/Fullzone": "com.vantor.tarn.Fullzone"}
# Each way of starting a child; the shell with a pipe is like the others, and nothing calls it.
WAYS = {"id": "posix_spawn", "gio": "QProcess", "fenx-cli.bash": "detached", "systemctl": "detached command line"}
# Standard streams, and what a shell keeps of its own.
INHERITED = {"0", "1", "2", "10", "11"}


def interfaces(description):
    """The object's own interfaces, and their members with the arguments' types."""
    def types(arguments):
        return [argument.signature for argument in arguments]

    return [(i.name, sorted((m.name, types(m.in_args), types(m.out_args)) for m in i.methods),
             sorted((s.name, types(s.args)) for s in i.signals), [p.name for p in i.properties])
            for i in Gio.DBusNodeInfo.new_for_xml(description).interfaces if ".freedesktop.DBus." not in i.name]


class Start(ClientTest):
    def test_declined_and_second_starts(self):
        first = self.start()
        self.assertEqual(self.desktop.start_client(CLIENT).wait(20), 0)
        self.assertIn("another instance running!", self.messages())
        self.assertIsNone(first.poll())
        # The lock goes with its holder, however that ends.
        first.kill()
        first.wait(5)
        for content, said in ((b"[true]", ["is not Domain!"]), (self.saved[INFO_FILE], [])):
            write(SYSLOG, b"")
            write(INFO_FILE, content)
            roomclient.set_standin("id", stdout="uid=1(a) gid=1(a) groups=27(sudo)\n")
            self.assertEqual(self.desktop.start_client(CLIENT).wait(20), 0)
            self.assertEqual(self.messages(), said)

    def test_quiet_start_and_end(self):
        # The stand-in for a locale that is not generated.
        self.desktop.env.pop("LOCPATH", None)
        roomclient.add_fault({"dbus": "GetActiveConnectionInfo"},
                             {"value": '[{"IsPrimaryConnection": true, "HwAddress": "网卡"}]'})
        self.start(LANG="xx_XX.UTF-8", LC_CTYPE="C.UTF-8")
        roomclient.wait_syslog("parse config.json file ok.", 15)
        self.assertIn('updateNetInfo array--2@@@--: "网卡"', self.messages())
        # A busy machine may answer a poll late.
        self.assertEqual([line for line in roomclient.syslog_lines()
                          if not line.startswith(("<30>", "<31>")) and "slow to answer" not in line], [])
        self.assertNotIn(b"bearer", read(f"/proc/{self.client.pid}/maps"))
        # Everything is asked once when the server answers.
        self.assertEqual(sorted(entry["path"] for entry in roomclient.record("http")
                                if "/notification/" not in entry["path"]),
                         ["/api/client/area/scenes", "/uim/v3/client/account", "/uim/v3/client/uim_department/id"])
        self.assertEqual(stop(self.client, signal.SIGINT), 0)

    def test_objects_offer_what_their_files_describe_and_nothing_else(self):
        self.start()
        bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        self.desktop.run("gdbus", "wait", "--session", "--timeout", "20", SERVICE)
        other_type = GLib.Variant("(v)", (GLib.Variant("s", "open"),))
        for path, name in OBJECTS.items():
            live = interfaces(self.desktop.run("gdbus", "introspect", "--session", "-d", SERVICE, "-o", path, "--xml"))
            self.assertEqual(live, interfaces(read(os.path.join(TREE, "data", name + ".xml")).decode()))
            for method, *_ in live[0][1]:
                with self.assertRaisesRegex(GLib.Error, "UnknownMethod", msg=method):
                    bus.call_sync(SERVICE, path, name, method, other_type, None, 0, 5000, None)
        # A pushed message goes out to all.
        message, heard = (1, "lisi", "a <b>", "b %1", "c"), []
        bus.signal_subscribe(SERVICE, None, "onMessage", NOTIFICATION, None, 0, lambda *signal: heard.append(signal[5]))
        bus.call_sync(SERVICE, NOTIFICATION, OBJECTS[NOTIFICATION], "Notify", GLib.Variant("(issss)", message), None, 0,
                      5000, None)
        self.until("the signal", lambda: (GLib.MainContext.default().iteration(False), heard)[1])
        self.assertEqual([signal.unpack() for signal in heard], [message])


class Used(ClientTest):
    def setUp(self):
        super().setUp()
        self.stage = Stage(self.desktop)

    def show_panel(self):
        panel = super().show_panel()
        # The list of scenes makes it taller, which moves what is clicked.
        self.until("the scenes", lambda: self.desktop.geometry(panel)[3] == 565)
        return panel

    def push(self, method, *arguments):
        self.stage.call(NOTIFICATION, OBJECTS[NOTIFICATION], method, *arguments)

    def test_children_inherit_an_empty_input_and_nothing_else(self):
        os.makedirs("/run/user/1000/gvfs/mtp:host=Foo_SER1", exist_ok=True)
        kept = {name: os.path.join(roomclient.ROOM, "inherited." + name) for name in WAYS}
        for name, path in kept.items():
            roomclient.set_standin(name, hook="for fd in /proc/$$/fd/*; do printf '%s ' ${fd##*/}; "
                                   f"readlink $fd || echo gone; done > {path}.$$; mv {path}.$$ {path}")
            self.addCleanup(roomclient.set_standin, name)
        # One more than it needs, an open input, and no output.
        read_end, write_end = os.pipe()
        self.addCleanup(os.close, write_end)
        self.client = self.desktop.spawn(["sh", "-c", 'exec "$0" >&-', CLIENT], stdin=read_end, pass_fds=[read_end])
        os.close(read_end)
        roomclient.wait_syslog("renewCurrentScene")
        self.assertEqual(os.readlink(f"/proc/{self.client.pid}/fd/1"), "/dev/null")
        self.push("GioMount", "a", "b", "SER1", "1000")
        # The devices are unmounted before the reply.
        self.assertTrue(os.path.exists(kept["gio"]))
        self.show_panel()
        self.stage.click(RELEASE)
        dialog = self.stage.window(RELEASE)
        self.stage.type(dialog, "Admin@2026")
        self.stage.keys(dialog, "Return")
        for name, way in WAYS.items():
            with self.subTest(way):
                self.until(name, lambda path=kept[name]: os.path.exists(path))
                inherited = dict(line.split(maxsplit=1) for line in read(kept[name]).decode().splitlines())
                self.assertEqual(inherited["0"], "/dev/null")
                self.assertLessEqual({fd for fd, target in inherited.items() if target != "gone"}, INHERITED, inherited)

    def press(self, *keys):
        """Presses the keys where the focus is, within 400 ms."""
        self.desktop.run("xdotool", "key", "--delay", "100", *keys)

    def test_password_is_changed_once(self):
        roomclient.add_fault({"dbus": "ModifyUserPassword"}, {"value": '{"code": -100002}', "delay_ms": 1500})
        self.start_shown()
        self.stage.click(PASSWORD)
        dialog = self.stage.window(PASSWORD)
        self.stage.keys(dialog, *"old", "Tab", *"new", "Tab", *"new")
        confirm = self.stage.place("确认")
        # The last ones go into the repeated password.
        self.press("Return", "Return", "Return", "Return", "x", "Escape")
        self.desktop.click(*confirm)
        roomclient.wait_syslog("modifyConfirm \"{")
        # What is typed after the answer counts again.
        self.press("Escape")
        self.stage.gone(dialog)
        calls = roomclient.record(method="ModifyUserPassword")
        self.assertEqual([call["args"][1:] for call in calls], [["old", "new"]])

    def test_terminal_is_released_and_rebooted_once(self):
        roomclient.add_fault({"path": "*/remove_status"}, {"body": '{"code": 1, "msg": "no"}', "delay_ms": 1200}, 1)
        roomclient.add_fault({"dbus": "Reboot"}, {"error": "com.vantor.Error.Busy", "delay_ms": 1500})
        self.start_shown()
        self.stage.click(RELEASE)
        dialog = self.stage.window(RELEASE)
        self.stage.type(dialog, "Admin@2026")
        box = self.stage.opened_by(lambda: self.press("Return", "Return", "Return", "Return", "Escape"))
        self.stage.keys(box, "Escape")
        self.stage.gone(box)
        self.assertEqual(len(roomclient.record(path="/uim/v3/client/remove_status")), 1)
        self.stage.type(dialog, "Admin@2026")
        self.press("Return")
        spinner = self.stage.window("当前终端已解除管控,重启后生效")
        reboot = self.stage.place("立即重启")
        roomclient.wait_record(lambda entry: entry.get("path") == "/uim/v3/client/remove")
        self.desktop.click(*reboot)
        roomclient.wait_record(lambda entry: entry.get("method") == "Reboot")
        self.desktop.click(*reboot)
        self.press("space", "Return", "Return")
        roomclient.wait_syslog("warning [ spinerwin.cpp")
        self.press("Escape")
        self.stage.gone(spinner)
        self.assertEqual(len(roomclient.record(method="Reboot")), 1)

    def test_panel_as_a_window(self):
        panel = self.start_shown()
        x, y, _, _ = self.desktop.geometry(panel)
        self.desktop.run("xdotool", "mousemove", str(x + 100), str(y + 20), "mousedown", "1",
                         "mousemove_relative", "--sync", "--", "-150", "-60",
                         "mousemove_relative", "--sync", "--", "-50", "-40", "mouseup", "1")
        self.until("the panel to move", lambda: self.desktop.geometry(panel)[:2] == (x - 200, y - 100))
        for state in (True, False):
            self.stage.click("置顶显示")

            def settled(wanted=state):
                window = self.desktop.panel()
                text = self.desktop.run("xprop", "-id", window) if window else ""
                return "_NET_FRAME_EXTENTS(CARDINAL) = 0, 0, 0, 0" in text and ("_NET_WM_STATE_ABOVE" in text) == wanted

            self.until("the window state", settled)
        # Without a notification service a message is a balloon.
        self.stage.opened_by(lambda: self.push("Notify", "1", "zhangsan", "标题", "正文", "管理员"))
        self.assertFalse(any("neither a notification service" in line for line in roomclient.syslog_lines()))
        self.desktop.run("wmctrl", "-i", "-c", self.desktop.panel())
        self.wait_hidden()
        self.desktop.click_icon()
        self.desktop.wait("the panel", self.desktop.panel)
        self.stage.click("关闭")
        self.wait_hidden()
