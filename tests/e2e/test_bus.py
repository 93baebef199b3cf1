"""What the client offers on the session bus, and what it does where others there stand in its way."""

import os
import subprocess
import xml.etree.ElementTree as ElementTree

from clienttest import TREE, ClientTest, read, roomclient, unittest

SERVICE = "com.vantor.tarn"
NOTIFICATION = "/com/vantor/tarn/Notification"
FULLZONE = "/com/vantor/tarn/Fullzone"


def gdbus(*arguments):
    return subprocess.run(["gdbus", *arguments], capture_output=True, text=True, check=False)


def notification(method, *arguments):
    return gdbus("call", "--session", "-d", SERVICE, "-o", NOTIFICATION, "-m",
                 "com.vantor.tarn.Notification." + method, *arguments)


class Bus(ClientTest):
    def setUp(self):
        super().setUp()
        self.start()
        self.until("the name on the bus", lambda: gdbus("introspect", "--session", "-d", SERVICE, "-o",
                                                        NOTIFICATION).returncode == 0)

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
            notification("Notify", "1", "lisi", "a <b>", "b %1", "c")
            notification("AgencyNotify", "a", "b")
            notification("Notify", "1", "", "", "", "")
            heard = [monitor.stdout.readline().partition("onMessage ")[2].strip() for _ in range(2)]
            monitor.kill()
        self.assertEqual(heard, ["(1, 'lisi', 'a <b>', 'b %1', 'c')", "(1, '', '', '', '')"])

    def test_balloon_where_the_service_is_missing(self):
        before = len(self.desktop.windows())
        notification("Notify", "1", "zhangsan", "标题", "正文", "管理员")
        self.until("the balloon", lambda: len(self.desktop.windows()) > before)

    def test_devices_are_unmounted_before_the_reply(self):
        os.makedirs("/run/user/1000/gvfs/mtp:host=Foo_SER1", exist_ok=True)
        ended = os.path.join(roomclient.ROOM, "gio.ended")
        roomclient.set_standin("gio", hook=f"sleep 0.3; : > {ended}")
        self.addCleanup(roomclient.set_standin, "gio")
        self.assertEqual(notification("GioMount", "Foo", "Bar", "SER1", "1000").returncode, 0)
        self.assertTrue(os.path.exists(ended))


class TakenName(ClientTest):
    def test_client_lives_without_its_name(self):
        self.desktop.spawn(["/usr/bin/python3", "-c", "import dbus; from dbus.mainloop.glib import DBusGMainLoop;"
                            "from gi.repository import GLib; DBusGMainLoop(set_as_default=True);"
                            f"dbus.SessionBus().request_name('{SERVICE}'); GLib.MainLoop().run()"])
        self.until("the other owner", lambda: SERVICE in gdbus("call", "--session", "-d", "org.freedesktop.DBus", "-o",
                                                               "/", "-m", "org.freedesktop.DBus.ListNames").stdout)
        self.start()
        self.assertIn("warning ", roomclient.wait_syslog("cannot own"))
        self.assertIsNone(self.client.poll())


if __name__ == "__main__":
    unittest.main()
