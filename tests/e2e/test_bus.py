# SPDX-License-Identifier: Apache-2.0
"""What the client offers on the session bus."""

import os
import subprocess
import xml.etree.ElementTree as ElementTree

from gi.repository import Gio, GLib

from clienttest import TREE, ClientTest, read, roomclient, unittest

SERVICE = "com.vantor.tarn"
NOTIFICATION = "/com/vantor/tarn/Notification"
FULLZONE = "/com/vantor/tarn/Fullzone"
OBJECTS = {NOTIFICATION: "com.vantor.tarn.Notification", FULLZONE: "com.vantor.tarn.Fullzone"}


def interfaces(path, text):
    """The object's own interfaces, and their members with the arguments' types and directions."""
    own = [i for i in ElementTree.fromstring(text).findall("interface") if ".freedesktop.DBus." not in i.get("name")]

    def arguments(member):
        return [(a.get("type"), member.tag == "signal" or a.get("direction")) for a in member.findall("arg")]

    # A signal's arguments can only go out, whether that is written or not.
    return path, [(i.get("name"), sorted((m.tag, m.get("name"), arguments(m)) for m in i if m.tag != "annotation"))
                  for i in own]


class Bus(ClientTest):
    def setUp(self):
        super().setUp()
        self.start()
        self.until("the name on the bus", lambda: self.gdbus("introspect", NOTIFICATION))

    def gdbus(self, command, path, *arguments):
        return self.desktop.run("gdbus", command, "--session", "-d", SERVICE, "-o", path, *arguments)

    def push(self, method, *arguments):
        return self.gdbus("call", NOTIFICATION, "-m", f"{OBJECTS[NOTIFICATION]}.{method}", *arguments)

    def test_objects_offer_what_their_files_describe_and_nothing_else(self):
        bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        other_type = GLib.Variant("(v)", (GLib.Variant("s", "open"),))
        for path, name in OBJECTS.items():
            live = interfaces(path, self.gdbus("introspect", path, "--xml"))
            self.assertEqual(live, interfaces(path, read(os.path.join(TREE, "data", name + ".xml"))))
            for method in (member[1] for member in live[1][0][1] if member[0] == "method"):
                with self.assertRaisesRegex(GLib.Error, "UnknownMethod", msg=method):
                    bus.call_sync(SERVICE, path, name, method, other_type, None, 0, 5000, None)
        self.assertEqual(roomclient.record("process", name="gio"), [])

    def test_pushed_message_is_announced_once_and_shown(self):
        # As a balloon, where the desktop's service is missing.
        before = len(self.desktop.windows())
        self.push("Notify", "1", "zhangsan", "标题", "正文", "管理员")
        self.until("the balloon", lambda: len(self.desktop.windows()) > before)
        self.assertNotIn("neither a notification service", "".join(roomclient.syslog_lines()))
        with subprocess.Popen(["gdbus", "monitor", "--session", "-d", SERVICE, "-o", NOTIFICATION],
                              stdout=subprocess.PIPE, text=True) as monitor:
            self.addCleanup(monitor.kill)
            while "is owned by" not in monitor.stdout.readline():
                pass
            self.push("Notify", "1", "lisi", "a <b>", "b %1", "c")
            self.push("AgencyNotify", "a", "b")
            self.push("Notify", "1", "", "", "", "")
            heard = [monitor.stdout.readline().partition("onMessage ")[2].strip() for _ in range(2)]
            monitor.kill()
        self.assertEqual(heard, ["(1, 'lisi', 'a <b>', 'b %1', 'c')", "(1, '', '', '', '')"])

    def test_devices_are_unmounted_before_the_reply(self):
        os.makedirs("/run/user/1000/gvfs/mtp:host=Foo_SER1", exist_ok=True)
        ended = os.path.join(roomclient.ROOM, "gio.ended")
        roomclient.set_standin("gio", hook=f"sleep 0.3; : > {ended}")
        self.addCleanup(roomclient.set_standin, "gio")
        self.assertTrue(self.push("GioMount", "Foo", "Bar", "SER1", "1000"))
        self.assertTrue(os.path.exists(ended))


if __name__ == "__main__":
    unittest.main()
