# SPDX-License-Identifier: Apache-2.0
"""A StatusNotifier registry by itself, as some desktops start it well before the panel that hosts the icons."""

from gi.repository import Gio, GLib

NAME = "org.kde.StatusNotifierWatcher"
DESCRIPTION = f"""<node><interface name="{NAME}">
  <property name="IsStatusNotifierHostRegistered" type="b" access="read"/>
  <property name="RegisteredStatusNotifierItems" type="as" access="read"/>
  <method name="RegisterStatusNotifierItem"><arg name="service" type="s" direction="in"/></method>
  <method name="RegisterStatusNotifierHost"><arg name="service" type="s" direction="in"/></method>
  <signal name="StatusNotifierHostRegistered"/>
</interface></node>"""


class Registry:
    def __init__(self, bus):
        self.hosts = []
        self.items = []
        interface = Gio.DBusNodeInfo.new_for_xml(DESCRIPTION).interfaces[0]
        bus.register_object("/StatusNotifierWatcher", interface, self.call, self.get, None)
        Gio.bus_own_name_on_connection(bus, NAME, Gio.BusNameOwnerFlags.NONE, None, None)

    def call(self, bus, _sender, path, interface, method, arguments, invocation):
        registered = self.items if method == "RegisterStatusNotifierItem" else self.hosts
        registered.append(arguments[0])
        invocation.return_value(None)
        if registered is self.hosts:
            bus.emit_signal(None, path, interface, "StatusNotifierHostRegistered", None)

    def get(self, _bus, _sender, _path, _interface, name):
        if name == "RegisteredStatusNotifierItems":
            return GLib.Variant("as", self.items)
        return GLib.Variant("b", bool(self.hosts))


registry = Registry(Gio.bus_get_sync(Gio.BusType.SESSION))
GLib.MainLoop().run()
