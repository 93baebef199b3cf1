# SPDX-License-Identifier: Apache-2.0
"""The D-Bus services: network daemon, identity service, domain agent and login manager.

They work on whole messages instead of exported objects, because a service must also be able to stay silent, to answer
with too little, or to leave the bus in the middle of a call.
"""

import json
import os
import threading

import dbus
import dbus.bus
import dbus.lowlevel
import dbus.mainloop.glib
from gi.repository import GLib

PROPERTIES = "org.freedesktop.DBus.Properties"
INTROSPECTABLE = "org.freedesktop.DBus.Introspectable"
PEER = "org.freedesktop.DBus.Peer"
ERROR = "org.freedesktop.DBus.Error."
PASSWORD_WRONG = -100002
PASSWORD_WEAK = -500
USER_UNKNOWN = -1
ANSWER_SECONDS = 10


class CallError(Exception):
    """A D-Bus error to answer with."""

    def __init__(self, name, text):
        super().__init__(text)
        self.name = name


def plain(value):
    """A D-Bus value as plain Python, for the record."""
    if isinstance(value, dbus.Boolean):
        return bool(value)
    if isinstance(value, str):
        return str(value)
    if isinstance(value, int):
        return int(value)
    if isinstance(value, float):
        return float(value)
    if isinstance(value, dict):
        return {str(key): plain(entry) for key, entry in value.items()}
    return [plain(entry) for entry in value]


class Service:
    """One name on one bus with one object; methods: name → (input signature, output signature, function)."""

    def __init__(self, bus, name, path, interface, methods, writable=lambda: True, properties=None):
        self.bus, self.name, self.path, self.interface = bus, name, path, interface
        self.methods = methods
        self.properties = properties or {}
        self.writable = writable
        self.connection = None

    def introspect(self):
        """The object's introspection data."""
        parts = []
        for name, (inputs, outputs, _) in self.methods.items():
            arguments = "".join(f'<arg type="{kind}" direction="in"/>' for kind in inputs)
            arguments += "".join(f'<arg type="{kind}" direction="out"/>' for kind in outputs)
            parts.append(f'<method name="{name}">{arguments}</method>')
        access = "readwrite" if self.writable() else "read"
        parts += [f'<property name="{name}" type="b" access="{access}"/>' for name in self.properties]
        return f'<node><interface name="{self.interface}">{"".join(parts)}</interface></node>'


class BusServices:
    """Puts the services on their buses; all D-Bus work happens on a thread of its own."""

    def __init__(self, store, record, faults):
        self._store = store
        self._record = record
        self._faults = faults
        self._loop = GLib.MainLoop()
        prefix = "com.vantor"
        self._services = {
            "network": Service("session", f"{prefix}.daemon.Network", "/com/vantor/daemon/Network",
                               f"{prefix}.daemon.Network", {"GetActiveConnectionInfo": ("", "s", self._connections)}),
            "iam": Service("system", f"{prefix}.zent.iam", "/com/vantor/zent/iam", f"{prefix}.zent.iam",
                           {"ModifyUserPassword": ("sss", "s", self._modify_password)},
                           lambda: not store.state["iam"]["read_only"], {"Enable": "enable"}),
            "zentg": Service("system", f"{prefix}.zent.zentg", "/com/vantor/zent/zentg", f"{prefix}.zent.zentg",
                             {"onDomainConfig": ("s", "i", lambda _: store.state["zentg"]["result"])}),
            "login1": Service("system", "org.freedesktop.login1", "/org/freedesktop/login1",
                              "org.freedesktop.login1.Manager", {"Reboot": ("b", "", lambda _: None)}),
        }

    def start(self, wanted):
        """Starts the thread and puts the wanted services on the bus."""
        dbus.mainloop.glib.DBusGMainLoop(set_as_default=True)
        threading.Thread(target=self._loop.run, daemon=True).start()
        self.apply(wanted)

    def apply(self, wanted):
        """Puts services on the bus or takes them off; returns when that is done."""
        finished, failures = threading.Event(), []

        def work():
            try:
                for key, service in self._services.items():
                    if wanted.get(key) and service.connection is None:
                        self._join(service)
                    elif not wanted.get(key) and service.connection is not None:
                        self._leave(service)
            except Exception as error:  # handed on to whoever asked for the change
                failures.append(error)
            finished.set()
            return GLib.SOURCE_REMOVE

        GLib.idle_add(work, priority=GLib.PRIORITY_DEFAULT)
        if not finished.wait(ANSWER_SECONDS):
            raise TimeoutError("the D-Bus thread does not answer")
        if failures:
            raise failures[0]

    def _join(self, service):
        address = os.environ[f"DBUS_{service.bus.upper()}_BUS_ADDRESS"]
        connection = dbus.bus.BusConnection(address)
        connection.set_exit_on_disconnect(False)
        connection.add_message_filter(lambda _, message: self._on_message(service, connection, message))
        connection.request_name(service.name, dbus.bus.NAME_FLAG_DO_NOT_QUEUE)
        service.connection = connection

    @staticmethod
    def _leave(service):
        connection, service.connection = service.connection, None
        connection.close()

    def _on_message(self, service, connection, message):
        if not isinstance(message, dbus.lowlevel.MethodCallMessage):
            return dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
        interface, member, arguments = message.get_interface(), message.get_member(), message.get_args_list()
        if interface == PEER:
            return dbus.lowlevel.HANDLER_RESULT_NOT_YET_HANDLED
        if interface != INTROSPECTABLE:
            self._record.add("dbus", bus=service.bus, service=service.name, path=message.get_path(),
                             interface=interface, method=member, args=plain(arguments))
        action = self._faults.take(dbus=member, service=service.name) or {}
        if action.get("delay_ms"):
            GLib.timeout_add(action["delay_ms"], self._answer, service, connection, message, action)
        else:
            self._answer(service, connection, message, action)
        return dbus.lowlevel.HANDLER_RESULT_HANDLED

    def _answer(self, service, connection, message, action):
        """Answers one call, as the fault's action says where there is one."""
        if action.get("hang"):
            return GLib.SOURCE_REMOVE
        if action.get("vanish"):
            self._vanish(service)
            return GLib.SOURCE_REMOVE
        try:
            if "error" in action:
                raise CallError(action["error"], "simulated failure")
            signature, value = self._value(service, message, action)
            reply = dbus.lowlevel.MethodReturnMessage(message)
            if signature and not action.get("no_value"):
                reply.append(value, signature=signature)
        except CallError as error:
            reply = dbus.lowlevel.ErrorMessage(message, error.name, str(error))
        except Exception as error:  # a service must answer whatever it was sent
            reply = dbus.lowlevel.ErrorMessage(message, ERROR + "Failed", f"{type(error).__name__}: {error}")
        if connection is service.connection and not message.get_no_reply():
            connection.send_message(reply)
        return GLib.SOURCE_REMOVE

    def _vanish(self, service):
        """Leaves the bus without an answer; the service stays away until the state is set again."""
        key = next(key for key, entry in self._services.items() if entry is service)
        with self._store.lock:
            self._store.state["services"] = {**self._store.state["services"], key: False}
        # A connection must not be closed while its own message is being dispatched.
        GLib.idle_add(lambda: self._leave(service) if service.connection else None, priority=GLib.PRIORITY_HIGH)

    def _value(self, service, message, action):
        """Carries the call out; returns the signature and the value of the answer."""
        interface, member, arguments = message.get_interface(), message.get_member(), message.get_args_list()
        if interface == INTROSPECTABLE and member == "Introspect":
            return "s", service.introspect()
        if message.get_path() != service.path:
            raise CallError(ERROR + "UnknownObject", f"no object {message.get_path()}")
        if interface == PROPERTIES:
            return self._property(service, member, arguments)
        if interface not in (None, service.interface) or member not in service.methods:
            raise CallError(ERROR + "UnknownMethod", f"no method {interface}.{member}")
        inputs, outputs, function = service.methods[member]
        if message.get_signature() != inputs:
            raise CallError(ERROR + "InvalidArgs", f"{member} takes ({inputs})")
        if "value" in action:
            return action.get("signature", outputs), action["value"]
        return outputs, function(*arguments)

    def _property(self, service, member, arguments):
        with self._store.lock:
            values = self._store.state["iam"]
            if member == "GetAll":
                return "a{sv}", {name: dbus.Boolean(values[key]) for name, key in service.properties.items()}
            name = str(arguments[1])
            if name not in service.properties:
                raise CallError(ERROR + "UnknownProperty", f"no property {name}")
            if member == "Get":
                return "v", dbus.Boolean(values[service.properties[name]])
            if not service.writable():
                raise CallError(ERROR + "PropertyReadOnly", f"{name} is read-only")
            self._store.state["iam"] = {**values, service.properties[name]: bool(arguments[2])}
            return "", None

    # What the services do

    def _connections(self):
        value = self._store.state["connections"]
        return value if isinstance(value, str) else json.dumps(value, ensure_ascii=False)

    def _modify_password(self, name, old, new):
        with self._store.lock:
            state = self._store.state
            user = state["users"].get(str(name).replace("@", ""))
            if user is None:
                code, text = USER_UNKNOWN, "用户不存在"
            elif user["password"] != old:
                code, text = PASSWORD_WRONG, "旧密码错误"
            elif len(new) < state["iam"]["min_length"]:
                code, text = PASSWORD_WEAK, f"密码长度不能少于{state['iam']['min_length']}位"
            elif new == old:
                code, text = PASSWORD_WEAK, "新密码不能与旧密码相同"
            else:
                user["password"] = str(new)
                code, text = 0, "修改密码成功"
        return json.dumps({"code": code, "msg": text}, ensure_ascii=False)
