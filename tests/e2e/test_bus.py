"""What the client offers on the session bus, and how a pushed message reaches the user."""

import json
import os
import re
import subprocess
import xml.etree.ElementTree as ElementTree

from clienttest import INFO_FILE, TREE, ClientTest, read, roomclient, unittest

SERVICE = "com.vantor.tarn"
NOTIFICATION = "/com/vantor/tarn/Notification"
FULLZONE = "/com/vantor/tarn/Fullzone"
NOTICE_SIZE = (428, 450)
INTEGRITY_SIZE = (380, 160)


def gdbus(*arguments):
    return subprocess.run(["gdbus", *arguments], capture_output=True, text=True, check=False)


def push(user, title="标题 <b>%1</b>", text="正文 & <i>斜体</i>", sender="管理员"):
    return gdbus("call", "--session", "-d", SERVICE, "-o", NOTIFICATION, "-m", "com.vantor.tarn.Notification.Notify",
                 "1", user, title, text, sender)


class Bus(ClientTest):
    def setUp(self):
        super().setUp()
        message = {"uuid": "u1", "uid": "zhangsan", "send_uid": "管理员", "title": "通知", "content": "正文",
                   "created_at": "2026-11-24T08:01:00Z", "read_at": ""}
        roomclient.patch_state({"messages": [message]})
        self.start()
        self.until("the name on the bus", lambda: gdbus("introspect", "--session", "-d", SERVICE, "-o",
                                                        NOTIFICATION).returncode == 0)

    def window(self, wanted):
        return next((window for window, (_, _, *size) in self.desktop.windows() if tuple(size) == wanted), None)

    def members(self, introspection, interface):
        """What an object offers beside the bus's own interfaces, which must be this interface alone."""
        own = [i for i in ElementTree.fromstring(introspection).findall("interface")
               if not i.get("name").startswith("org.freedesktop.DBus.")]
        self.assertEqual([i.get("name") for i in own], [interface])
        # A signal's arguments can only go out, whether that is written or not.
        return sorted((m.tag, m.get("name"), [(a.get("type"), m.tag == "signal" or a.get("direction"))
                                              for a in m.findall("arg")]) for m in own[0] if m.tag != "annotation")

    def test_objects_offer_what_their_files_describe_and_nothing_else(self):
        for path, name in {NOTIFICATION: "com.vantor.tarn.Notification", FULLZONE: "com.vantor.tarn.Fullzone"}.items():
            live = gdbus("introspect", "--session", "--xml", "-d", SERVICE, "-o", path).stdout
            described = self.members(read(os.path.join(TREE, "data", name + ".xml")), name)
            self.assertEqual(self.members(live, name), described)

    def test_pushed_message_is_announced_once(self):
        with subprocess.Popen(["gdbus", "monitor", "--session", "-d", SERVICE, "-o", NOTIFICATION],
                              stdout=subprocess.PIPE, text=True) as monitor:
            self.addCleanup(monitor.kill)
            while "is owned by" not in monitor.stdout.readline():
                pass
            push("lisi", "a <b>", "b %1", "c")
            gdbus("call", "--session", "-d", SERVICE, "-o", NOTIFICATION, "-m",
                  "com.vantor.tarn.Notification.AgencyNotify", "a", "b")
            push("", "", "", "")
            heard = [monitor.stdout.readline().partition("onMessage ")[2].strip() for _ in range(2)]
            monitor.kill()
        self.assertEqual(heard, ["(1, 'lisi', 'a <b>', 'b %1', 'c')", "(1, '', '', '', '')"])

    def test_integrity_dialog_follows_the_verification(self):
        def report(errmsg, url):
            reply = gdbus("call", "--session", "-d", SERVICE, "-o", FULLZONE, "-m", "com.vantor.tarn.Fullzone.Notify",
                          errmsg, url)
            self.assertEqual(reply.returncode, 0, reply.stderr)

        report("校验失败", "/fix/page")
        self.until("the integrity dialog", lambda: self.window(INTEGRITY_SIZE))
        host = json.loads(read(INFO_FILE))["server_host"]
        roomclient.wait_syslog(f'fix page url : "http://{host}/api/fix/page"')
        report("success", "false")
        self.until("the dialog to close", lambda: not self.window(INTEGRITY_SIZE))
        self.assertIsNone(self.client.poll())

    def test_message_opens_the_notice_dialog(self):
        self.desktop.start_notifications()
        self.assertEqual(push("zhangsan").returncode, 0)
        self.until("the notification", lambda: "1" in self.desktop.run("dunstctl", "count", "displayed"))
        self.desktop.run("dunstctl", "action")
        notice = self.until("the notice dialog", lambda: self.window(NOTICE_SIZE))
        self.desktop.run("xdotool", "windowfocus", "--sync", notice, "key", "Escape")
        self.until("the dialog to hide", lambda: not self.window(NOTICE_SIZE))
        self.assertIsNone(self.client.poll())

    def test_message_for_somebody_else_is_not_shown(self):
        self.desktop.start_notifications()
        push("lisi")
        roomclient.wait_syslog("message for another user not shown")
        push("")
        self.until("the notification", lambda: "1" in self.desktop.run("dunstctl", "count", "displayed"))

    def test_balloon_where_the_service_is_missing(self):
        before = len(self.desktop.windows())
        push("zhangsan")
        self.until("the balloon", lambda: len(self.desktop.windows()) > before)

    def test_devices_are_unmounted_before_the_reply(self):
        subprocess.run(["mkdir", "-p", "/run/user/1000/gvfs/mtp:host=Foo_SER1"], check=True)
        ended = os.path.join(roomclient.ROOM, "gio.ended")
        roomclient.set_standin("gio", hook=f"sleep 0.3; : > {ended}")
        self.addCleanup(roomclient.set_standin, "gio")
        reply = gdbus("call", "--session", "-d", SERVICE, "-o", NOTIFICATION, "-m",
                      "com.vantor.tarn.Notification.GioMount", "Foo", "Bar", "SER1", "1000")
        self.assertEqual(reply.returncode, 0)
        self.assertTrue(os.path.exists(ended))
        self.assertEqual(roomclient.record("process", name="gio")[0]["args"],
                         ["mount", "-u", "/run/user/1000/gvfs/mtp:host=Foo_SER1"])


class TakenName(ClientTest):
    def test_client_lives_without_its_name(self):
        owner = self.desktop.spawn(["/usr/bin/python3", "-c",
                                    "import dbus; from dbus.mainloop.glib import DBusGMainLoop;"
                                    "from gi.repository import GLib; DBusGMainLoop(set_as_default=True);"
                                    f"dbus.SessionBus().request_name('{SERVICE}'); GLib.MainLoop().run()"])
        self.until("the other owner", lambda: SERVICE in gdbus("call", "--session", "-d", "org.freedesktop.DBus", "-o",
                                                               "/", "-m", "org.freedesktop.DBus.ListNames").stdout)
        self.start()
        self.assertIn("warning ", roomclient.wait_syslog("cannot own"))
        self.assertIsNone(self.client.poll())
        self.assertIsNone(owner.poll())


if __name__ == "__main__":
    unittest.main()
