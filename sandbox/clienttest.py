# SPDX-License-Identifier: Apache-2.0
"""What the end-to-end tests share: a room with the platform, a desktop on it, and the client under test."""

import os
import re
import unittest

import roomclient
from desktop import Desktop, stop

TREE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
CLIENT = os.environ["CLIENT"]
INFO_FILE = "/etc/zent/userinfo.json"
SYSLOG = os.path.join(roomclient.ROOM, "syslog")


def read(path):
    with open(path, "rb") as stream:
        return stream.read()


def write(path, content):
    with open(path, "wb") as stream:
        stream.write(content)


class ClientTest(unittest.TestCase):
    """Each test has a fresh log, record and desktop; the platform and the terminal's files are put back."""

    tray = True
    scale = 1

    def setUp(self):
        self.saved = {path: read(path) for path in (INFO_FILE, "/usr/share/zent/machine.txt")}
        write(SYSLOG, b"")
        roomclient.clear_record()
        roomclient.clear_faults()
        self.desktop = Desktop(scale=self.scale)
        self.addCleanup(self._end)
        self.desktop.__enter__()
        self.desktop.start_window_manager()
        if self.tray:
            self.desktop.start_tray()

    def _end(self):
        self.desktop.__exit__(None, None, None)
        for path, content in self.saved.items():
            write(path, content)
        for name in ("id", "oxa-shutdown"):
            roomclient.set_standin(name)

    def start(self, **env):
        """Starts the client and waits for its tray icon, if there is a tray."""
        self.client = self.desktop.start_client(CLIENT, **env)
        roomclient.wait_syslog("renewCurrentScene")
        if self.tray:
            self.desktop.wait("the tray icon", self.desktop.icon)
        return self.client

    def start_shown(self):
        """Starts the client and opens its panel; returns the panel's window."""
        self.start()
        return self.show_panel()

    def show_panel(self):
        """Opens the panel from a tray whose icon may still be finding its place; returns the panel's window."""
        def clicks():
            return sum("reason : 1" in line for line in roomclient.syslog_lines())

        def click_arrives(before=clicks()):
            self.desktop.click_icon(button=3)
            return clicks() > before

        self.until("the right click", click_arrives)
        self.desktop.click_icon()
        return self.desktop.wait("the panel", self.desktop.panel)

    def messages(self):
        """The logged messages, without their heads."""
        return [re.sub(r"^.*?\]  (.*) $", r"\1", line) for line in roomclient.syslog_lines()]

    def until(self, what, condition, timeout=10):
        return roomclient.wait_for(condition, timeout, what)

    def wait_hidden(self):
        self.until("the panel to hide", lambda: not self.desktop.panel())


__all__ = ["CLIENT", "ClientTest", "INFO_FILE", "SYSLOG", "TREE", "read", "roomclient", "stop", "unittest", "write"]
