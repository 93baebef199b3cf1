# SPDX-License-Identifier: Apache-2.0
"""When the tray icon appears on desktops of either tray protocol.

    test_trayhosts.py ROOM CLIENT

Opens three rooms side by side, so that what must wait for a minute does so in no more: a room has one client.
"""

import os
import signal
import subprocess
import sys

if __name__ == "__main__" and "ROOM" not in os.environ:
    enter, client = sys.argv[1:]
    command = [enter, "--platform", "--env", "CLIENT=" + client, "--env", "PYTHONPATH=" + os.path.dirname(enter),
               "/usr/bin/python3", "-B", __file__, "-v"]
    rooms = [subprocess.Popen(command + cases) for cases in (["LateXembed"], ["LateNotifier"],
                                                             ["Xembed", "Notifier", "Registry"])]
    sys.exit(max([room.wait() for room in rooms]))

from clienttest import CLIENT, TREE, ClientTest, roomclient, unittest  # noqa: E402

ICON_SECONDS = 1
# Of the client's main thread in a minute without a tray. The questions to the server make some 25; a timer that looked
# for the tray every second would add 60.
MOST_WAKE_UPS = 70
REGISTRY = os.path.join(TREE, "sandbox/registry.py")


class HostTest(ClientTest):
    tray = False
    host = "start_notifier_tray"

    def start_host(self):
        return getattr(self.desktop, self.host)()

    def call(self, name, path, method, *arguments):
        return self.desktop.run("gdbus", "call", "--session", "--timeout", "1", "-d", name, "-o", path, "-m", method,
                                *arguments)

    def wait_icon(self, seconds=ICON_SECONDS):
        self.until("the icon", self.desktop.icon, seconds)

    def lives(self, seconds=0):
        """The client runs on for so long, without an icon, and its objects answer."""
        with self.assertRaises(subprocess.TimeoutExpired):
            self.client.wait(seconds)
        self.assertFalse(any("showSystemTrayIcon" in line for line in roomclient.syslog_lines()))
        self.assertEqual(self.call("com.vantor.tarn", "/com/vantor/tarn/Notification",
                                   "com.vantor.tarn.Notification.Notify", "1", "lisi", "a", "b", "c"), "()\n")
        roomclient.wait_syslog("message for another user not shown")


class Notifier(HostTest):
    def test_host_that_starts_beside_the_client_and_restarts(self):
        self.client = self.desktop.start_client(CLIENT)
        host = self.start_host()
        roomclient.wait_syslog("renewCurrentScene")
        self.wait_icon()
        host.kill()
        host.wait(5)
        self.until("the icon to go with its host", lambda: not self.desktop.icon())
        self.start_host()
        self.wait_icon()
        self.assertIsNone(self.client.poll())


class Xembed(Notifier):
    host = "start_tray"


class LateNotifier(HostTest):
    def wake_ups(self):
        with open(f"/proc/{self.client.pid}/status", encoding="ascii") as stream:
            return int(next(line for line in stream if line.startswith("voluntary")).split()[1])

    def test_host_after_a_minute(self):
        self.start()
        before = self.wake_ups()
        self.lives(60)
        self.assertLess(self.wake_ups() - before, MOST_WAKE_UPS)
        self.start_host()
        self.wait_icon()


class LateXembed(LateNotifier):
    host = "start_tray"


class Registry(HostTest):
    def has_item(self):
        return f"StatusNotifierItem-{self.client.pid}-1" in self.desktop.registry("RegisteredStatusNotifierItems")

    def test_before_its_host(self):
        self.start()
        self.desktop.spawn(["/usr/bin/python3", "-B", REGISTRY])
        self.until("the registry", lambda: "false" in self.desktop.registry("IsStatusNotifierHostRegistered"))
        self.lives()
        self.call("org.kde.StatusNotifierWatcher", "/StatusNotifierWatcher",
                  "org.kde.StatusNotifierWatcher.RegisterStatusNotifierHost", "org.kde.StatusNotifierHost-1")
        self.until("the item", self.has_item, ICON_SECONDS)

    def test_silence_holds_up_nothing(self):
        host = self.start_host()
        self.desktop.start_tray()
        host.send_signal(signal.SIGSTOP)
        try:
            self.start()
            self.lives()
        finally:
            host.send_signal(signal.SIGCONT)
        self.wait_icon(5)
        self.assertTrue(self.has_item())


if __name__ == "__main__":
    unittest.main()
