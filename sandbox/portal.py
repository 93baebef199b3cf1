# SPDX-License-Identifier: Apache-2.0
"""A stand-in for the desktop portal on the room's session bus. It serves the colour scheme, which the client asks for.

    portal.py [SCHEME]

SCHEME is what the setting is at first: 0 no preference, 1 dark, 2 light. Whoever calls SetColorScheme on the interface
com.vantor.sandbox.Portal changes it, and listeners hear of it as from the real service.
"""

import sys

import dbus
import dbus.mainloop.glib
import dbus.service
from gi.repository import GLib

SERVICE = "org.freedesktop.portal.Desktop"
PATH = "/org/freedesktop/portal/desktop"
SETTINGS = "org.freedesktop.portal.Settings"
CONTROL = "com.vantor.sandbox.Portal"
KEY = ("org.freedesktop.appearance", "color-scheme")


class Portal(dbus.service.Object):
    """The settings object."""

    def __init__(self, bus, scheme):
        super().__init__(bus, PATH)
        self.scheme = dbus.UInt32(scheme)

    @dbus.service.method(SETTINGS, "ss", "v")
    def Read(self, namespace, key):  # pylint: disable=invalid-name
        """The setting's value, in the two wrappings that the portal's Read has."""
        if (namespace, key) != KEY:
            raise dbus.DBusException("no such setting", name="org.freedesktop.portal.Error.NotFound")
        return dbus.UInt32(self.scheme, variant_level=1)

    @dbus.service.signal(SETTINGS, "ssv")
    def SettingChanged(self, namespace, key, value):  # pylint: disable=invalid-name
        """A setting has a new value."""

    @dbus.service.method(CONTROL, "u")
    def SetColorScheme(self, scheme):  # pylint: disable=invalid-name
        """Changes the colour scheme."""
        self.scheme = scheme
        self.SettingChanged(*KEY, scheme)


def main():
    dbus.mainloop.glib.DBusGMainLoop(set_as_default=True)
    bus = dbus.SessionBus()
    Portal(bus, int(sys.argv[1]) if len(sys.argv) > 1 else 0)
    # The name last: whoever waits for it finds the object behind it.
    bus.request_name(SERVICE, dbus.bus.NAME_FLAG_DO_NOT_QUEUE)
    GLib.MainLoop().run()


if __name__ == "__main__":
    main()
