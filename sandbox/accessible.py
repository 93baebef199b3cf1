# SPDX-License-Identifier: Apache-2.0
"""The client's windows and controls as a screen reader finds them, through a real accessibility bus."""

import re

from gi.repository import Gio, GLib

ACCESSIBLE = "org.a11y.atspi.Accessible"
COMPONENT = "org.a11y.atspi.Component"
PROPERTIES = "org.freedesktop.DBus.Properties"
CLIENT = "域管平台"
STATES = {"ACTIVE": 1, "FOCUSABLE": 11, "FOCUSED": 12, "SHOWING": 25}
LABELLED_BY = 2
ON_SCREEN = 0
# The roles of what cannot be used: containers, separators and labels.
INACTIVE = {"dialog", "filler", "frame", "graphic", "label", "list", "panel", "separator"}


class Node:
    """An object on the accessibility bus. Every question goes to the client: nothing is remembered."""

    def __init__(self, bus, owner, path):
        self.bus, self.owner, self.path = bus, owner, path

    def call(self, method, interface=ACCESSIBLE, arguments=None):
        return self.bus.call_sync(self.owner, self.path, interface, method, arguments, None, 0, 5000, None).unpack()[0]

    def property(self, what):
        return self.call("Get", PROPERTIES, GLib.Variant("(ss)", (ACCESSIBLE, what)))

    def role(self):
        return self.call("GetRoleName")

    def has(self, state):
        words = self.call("GetState")
        return bool(words[STATES[state] // 32] >> STATES[state] % 32 & 1)

    def children(self):
        return [Node(self.bus, *child) for child in self.call("GetChildren")]

    def showing(self):
        """The object and what it shows, in reading order."""
        if self.has("SHOWING"):
            yield self
            for child in self.children():
                yield from child.showing()

    def name(self):
        """What a screen reader calls the object: its own name, with that of its caption where it has one."""
        own = self.property("Name").strip()
        for kind, targets in self.call("GetRelationSet"):
            caption = Node(self.bus, *targets[0]).property("Name") if kind == LABELLED_BY else ""
            if not own.startswith(caption):
                return f"{caption}：{own}"
        return own

    def window(self):
        """The window that the object is in."""
        parent = Node(self.bus, *self.property("Parent"))
        return self if parent.role() == "application" else parent.window()

    def extents(self):
        """(x, y, width, height) on the screen, as far as the client knows its place, in its own pixels."""
        return self.call("GetExtents", COMPONENT, GLib.Variant("(u)", (ON_SCREEN,)))


class Reader:
    """Reads a desktop's accessibility bus. Made before the client starts, which then speaks to the bus."""

    def __init__(self, desktop):
        self.desktop = desktop
        desktop.env["QT_LINUX_ACCESSIBILITY_ALWAYS_ON"] = "1"
        desktop.spawn(["/usr/libexec/at-spi-bus-launcher", "--launch-immediately"])
        address = desktop.wait("the accessibility bus", lambda: re.search('"(.*)"', desktop.run(
            "xprop", "-root", "AT_SPI_BUS")))
        self.bus = Gio.DBusConnection.new_for_address_sync(
            address[1], Gio.DBusConnectionFlags.AUTHENTICATION_CLIENT | Gio.DBusConnectionFlags.MESSAGE_BUS_CONNECTION)

    def wait(self, what, question, **options):
        """Waits until question() is true; what vanishes while it is looked at counts as no answer."""
        def answer():
            try:
                return question()
            except GLib.Error:
                return None
        return self.desktop.wait(what, answer, **options)

    def windows(self):
        """The client's windows on the screen."""
        applications = Node(self.bus, "org.a11y.atspi.Registry", "/org/a11y/atspi/accessible/root").children()
        return [window for application in applications if application.property("Name") == CLIENT
                for window in application.children() if window.has("SHOWING")]

    def gone(self, title):
        """Waits until no window has that title."""
        self.wait(f"{title} to close", lambda: title not in [w.property("Name") for w in self.windows()])

    def focused(self):
        """The name of what has the focus in the active window, or nothing."""
        return next((node.name() for window in self.windows() if window.has("ACTIVE")
                     for node in window.showing() if node.has("FOCUSED") and node.role() not in INACTIVE), "")

    def key(self, *keys):
        self.desktop.run("xdotool", "key", *keys)

    def await_focus(self, wanted):
        self.wait(f"the focus on {wanted}", lambda: self.focused() == wanted)

    def tab_through(self, *names):
        """Each Tab brings the focus to the next of the names."""
        for wanted in names:
            self.key("Tab")
            self.await_focus(wanted)

    def shown(self):
        """All that the client shows."""
        return (node for window in self.windows() for node in window.showing())

    def find(self, name="", role=None, within=None):
        """A control on the screen whose name begins so, of a role if one is given; None while there is none.

        With within, it is one of the window or the control whose name begins so.
        """
        def fits(node):
            if node.role() != role if role else node.role() in INACTIVE:
                return False
            return node.property("Name").startswith(name)

        places = self.windows()
        if within:
            places = [node for node in self.shown() if node.property("Name").startswith(within)][:1]
        return next((node for place in places for node in place.showing() if fits(node)), None)

    def control(self, name="", role=None, **options):
        """Waits for a control; the options are those of wait()."""
        return self.wait(f"the control {name or role}", lambda: self.find(name, role), **options)
