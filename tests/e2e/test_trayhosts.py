# SPDX-License-Identifier: Apache-2.0
"""When the tray icon appears on desktops of either tray protocol, and where the panel does; see also tests/desktops."""

import os
import signal
import subprocess

from clienttest import TREE, ClientTest, read, roomclient

ICON_SECONDS = 1
# Of the client's main thread in a minute without a tray. The questions to the server make some 25; a timer that looked
# for the tray every second would add 60.
MOST_WAKE_UPS = 70
WATCHER = "org.kde.StatusNotifierWatcher"


class TrayHosts(ClientTest):
    tray = False

    def call(self, name, path, method, *arguments):
        return self.desktop.run("gdbus", "call", "--session", "--timeout", "1", "-d", name, "-o", path, "-m", method,
                                *arguments)

    def wait_item(self, seconds=ICON_SECONDS):
        self.until("the item", lambda: f"StatusNotifierItem-{self.client.pid}-1" in self.desktop.registry(
            "RegisteredStatusNotifierItems"), seconds)

    def lives(self, seconds=0):
        """The client runs on for so long, without an icon, and its objects answer."""
        with self.assertRaises(subprocess.TimeoutExpired):
            self.client.wait(seconds)
        self.assertFalse(any("showSystemTrayIcon" in line for line in roomclient.syslog_lines()))
        self.assertEqual(self.call("com.vantor.tarn", "/com/vantor/tarn/Notification",
                                   "com.vantor.tarn.Notification.Notify", "1", "lisi", "a", "b", "c"), "()\n")
        roomclient.wait_syslog("message for another user not shown")

    def wake_ups(self):
        return int(read(f"/proc/{self.client.pid}/status").split(b"\nvoluntary_ctxt_switches:")[1].split()[0])

    def test_xembed_host_after_a_minute(self):
        self.start()
        before = self.wake_ups()
        self.lives(60)
        self.assertLess(self.wake_ups() - before, MOST_WAKE_UPS)
        host = self.desktop.start_tray("left")
        self.until("the icon", self.desktop.icon, ICON_SECONDS)
        panel = self.show_panel()
        # The host reserves 36 pixels, which the client, as its place is agreed, leaves free at the right.
        self.until("the place", lambda: self.desktop.geometry(panel) == (1280 - 36 - 300, 800 - 565, 300, 565))
        host.kill()
        host.wait(5)
        self.until("the icon to go with its host", lambda: not self.desktop.icon())
        self.desktop.start_tray()
        self.until("the icon", self.desktop.icon, ICON_SECONDS)

    def test_registry_before_its_host(self):
        self.start()
        self.desktop.spawn(["/usr/bin/python3", "-B", os.path.join(TREE, "sandbox/registry.py")])
        self.until("the registry", lambda: "false" in self.desktop.registry("IsStatusNotifierHostRegistered"))
        self.lives()
        self.call(WATCHER, "/StatusNotifierWatcher", WATCHER + ".RegisterStatusNotifierHost", "org.kde.Host-1")
        self.wait_item()

    def test_silent_registry_holds_up_nothing(self):
        host = self.desktop.start_notifier_tray()
        self.desktop.start_tray()
        host.send_signal(signal.SIGSTOP)
        try:
            self.start()
            self.lives()
        finally:
            host.send_signal(signal.SIGCONT)
        self.wait_item(5)
