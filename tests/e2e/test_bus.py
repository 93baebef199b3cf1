# SPDX-License-Identifier: Apache-2.0
"""What the client offers on the session bus, and what it does where others there stand in its way."""

import os
import subprocess
import xml.etree.ElementTree as ElementTree

from gi.repository import Gio, GLib

from clienttest import TREE, ClientTest, read, roomclient, unittest

SERVICE = "com.vantor.tarn"
NOTIFICATION = "/com/vantor/tarn/Notification"
FULLZONE = "/com/vantor/tarn/Fullzone"
OBJECTS = {NOTIFICATION: "com.vantor.tarn.Notification", FULLZONE: "com.vantor.tarn.Fullzone"}
# A value of every basic type of D-Bus, and of every kind of container.
SAMPLES = {signature: GLib.Variant(signature, value) for signature, value in {
    "y": 7, "b": True, "n": -7, "q": 7, "i": -7, "u": 7, "x": -7, "t": 7, "d": 0.5, "s": "success", "o": "/a", "g": "as",
    "h": 0, "v": GLib.Variant("s", "open"), "as": ["true"], "ay": b"\xff\0", "(si)": ("a", 1), "a{sv}": {},
    "a(ov)": [("/", GLib.Variant("v", GLib.Variant("h", 0)))], "av": [GLib.Variant("d", float("nan"))] * 100}.items()}


def gdbus(*arguments):
    return subprocess.run(["gdbus", *arguments], capture_output=True, text=True, check=False)


def notification(method, *arguments):
    return gdbus("call", "--session", "-d", SERVICE, "-o", NOTIFICATION, "-m",
                 "com.vantor.tarn.Notification." + method, *arguments)


def described_methods(interface):
    """The types of each method's arguments."""
    described = ElementTree.fromstring(read(os.path.join(TREE, "data", interface + ".xml"))).find("interface")
    return {method.get("name"): [argument.get("type") for argument in method.findall("arg")]
            for method in described.findall("method")}


def wrong_signatures(types):
    """Each argument as every other type, all of them as one type, and too few or too many arguments."""
    for index in range(len(types)):
        yield from (types[:index] + [other] + types[index + 1:] for other in SAMPLES if other != types[index])
    yield from ([other] * len(types) for other in SAMPLES if [other] * len(types) != types)
    yield from (types[:count] for count in range(len(types)))
    yield from (types + [more] for more in SAMPLES)
    yield types * 30


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
        for path, name in OBJECTS.items():
            live = gdbus("introspect", "--session", "--xml", "-d", SERVICE, "-o", path).stdout
            described = self.members(read(os.path.join(TREE, "data", name + ".xml")), name)
            self.assertEqual(self.members(live, name), described)

    def test_calls_with_other_types_and_counts_are_refused(self):
        bus = Gio.bus_get_sync(Gio.BusType.SESSION)
        before = self.desktop.windows()
        calls = 0
        for path, interface in OBJECTS.items():
            for method, types in described_methods(interface).items():
                for signature in wrong_signatures(types):
                    calls += 1
                    arguments = GLib.Variant.new_tuple(*map(SAMPLES.get, signature)) if signature else None
                    message = Gio.DBusMessage.new_method_call(SERVICE, path, interface, method)
                    message.set_unix_fd_list(Gio.UnixFDList.new_from_array([os.dup(0)]))
                    message.set_body(arguments or GLib.Variant("()", ()))
                    reply, _ = bus.send_message_with_reply_sync(message, 0, 5000, None)
                    self.assertEqual((reply.get_error_name() or "").rpartition(".")[2], "UnknownMethod",
                                     (method, signature))
        self.assertGreater(calls, 300)
        self.assertEqual(notification("AgencyNotify", "a", "b").stdout, "()\n")
        self.assertEqual(self.desktop.windows(), before)
        self.assertEqual(roomclient.record("process", name="gio"), [])
        self.assertIsNone(self.client.poll())

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
