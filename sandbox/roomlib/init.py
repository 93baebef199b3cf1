# SPDX-License-Identifier: Apache-2.0
"""The room's first process: starts the services and the command, reaps, receives syslog, and ends it all."""

import os
import selectors
import signal
import socket
import sys

from roomlib import linux, material, terminal

ROOM = "/run/room"
SEARCH_PATH = f"{ROOM}/bin:/usr/local/bin:/usr/bin:/bin:/usr/local/sbin:/usr/sbin:/sbin"
SETUP_FAILED = 70
DEFAULT_SIGNALS = (signal.SIGINT, signal.SIGQUIT, signal.SIGTERM, signal.SIGHUP, signal.SIGPIPE, signal.SIGCHLD,
                   signal.SIGXFSZ)


class SetupError(Exception):
    """Something that the room needs could not be started; the text says what."""


def environment(options):
    """The environment of everything in the room."""
    result = {name: os.environ[name] for name in ("TERM", "COLORTERM", "TZ") if name in os.environ}
    result.update((name, value) for name, value in os.environ.items() if name.endswith("SAN_OPTIONS"))
    runtime = f"/run/user/{options.uid}"
    result.update({
        "PATH": SEARCH_PATH, "HOME": f"/home/{options.user}", "USER": options.user, "LOGNAME": options.user,
        "SHELL": "/bin/bash", "XDG_RUNTIME_DIR": runtime, "LANG": "zh_CN.UTF-8", "ROOM": ROOM,
        "DBUS_SESSION_BUS_ADDRESS": f"unix:path={runtime}/bus",
        "DBUS_SYSTEM_BUS_ADDRESS": "unix:path=/run/dbus/system_bus_socket",
        "GSETTINGS_SCHEMA_DIR": f"{ROOM}/schemas", "GSETTINGS_BACKEND": "keyfile",
    })
    if not options.chinese_locale:
        # With LC_CTYPE alone programs would have the C locale: setlocale(LC_ALL, "") fails when that of LANG is missing.
        result.update({"LC_CTYPE": "C.UTF-8", "LOCPATH": f"{ROOM}/locale"})
    if options.x11:
        result["DISPLAY"] = options.display
        result["XAUTHORITY"] = f"{ROOM}/Xauthority"
    result.update(options.env)
    return result


def spawn(command, env, files=None):
    """Starts a process with default signals; files maps its descriptors to ours. Returns the process id."""
    # Not fork: copying this process costs several times what starting a small program does.
    actions = [(os.POSIX_SPAWN_DUP2, source, target) for target, source in (files or {}).items()]
    return os.posix_spawnp(command[0], command, env, file_actions=actions, setsigmask=[], setsigdef=DEFAULT_SIGNALS)


class Init:
    """Runs as process 1 of the room."""

    def __init__(self, options, control):
        self.options = options
        self.control = control
        self.env = environment(options)
        self.command = None
        self.firewall = None
        self.log = os.open(f"{ROOM}/room.log", os.O_WRONLY | os.O_CREAT | os.O_APPEND, 0o644)

    def run(self):
        """Opens the room, runs the command and returns its exit status (128 + signal when one ended it)."""
        self._enter_namespaces()
        syslog = self._bind_syslog()
        try:
            self._start_services()
        except SetupError as error:
            sys.stderr.write(f"enter: {error}\n")
            return SETUP_FAILED
        os.chdir(self.options.directory if os.path.isdir(self.options.directory) else self.env["HOME"])
        os.environ["PATH"] = self.env["PATH"]  # where spawn looks
        try:
            self.command = spawn(self.options.command, self.env)
        except OSError as error:
            sys.stderr.write(f"enter: cannot run {self.options.command[0]}: {error.strerror}\n")
            return 127 if isinstance(error, FileNotFoundError) else 126
        return self._serve(syslog)

    def _enter_namespaces(self):
        try:
            linux.mount("proc", "/proc", "proc", linux.MS_NOSUID | linux.MS_NODEV | linux.MS_NOEXEC)
        except OSError:
            # Where parts of the outside /proc are masked, the kernel refuses a new one. The outside one still
            # shows each process, under its number outside.
            linux.set_read_only("/proc", False)
        linux.bring_loopback_up()
        socket.sethostname(terminal.HOST_NAME)
        with open("/proc/sys/net/ipv4/ip_unprivileged_port_start", "w", encoding="ascii") as stream:
            stream.write("0")
        if self.options.platform:
            self._start_firewall()
        linux.unshare(linux.CLONE_NEWUSER)
        linux.map_ids(self.options.uid, 0, self.options.uid, 0)
        linux.drop_capabilities()

    def _start_firewall(self):
        """Leaves a shell behind that keeps the rights over the room's network: it hands each line to nft."""
        self.firewall, served = socket.socketpair()
        with served:
            spawn(["sh", "-c", 'while read -r rules; do nft "$rules"; echo $?; done'], self.env,
                  {0: served.fileno(), 1: served.fileno(), 2: self.log})

    @staticmethod
    def _bind_syslog():
        receiver = socket.socket(socket.AF_UNIX, socket.SOCK_DGRAM)
        receiver.bind("/dev/log")
        os.chmod("/dev/log", 0o666)
        return receiver

    def _start_services(self):
        """Starts independent services at the same time; returns when all are ready."""
        quiet = {1: self.log, 2: self.log}
        buses = [self._start_bus("session", f"{self.env['XDG_RUNTIME_DIR']}/bus"),
                 self._start_bus("system", "/run/dbus/system_bus_socket")]
        steps = material.tls_steps(f"{ROOM}/tls", self.options.user)
        steps[0].append(material.schema_command(f"{ROOM}/schemas", self.options.tree))
        for step in steps:
            running = [(spawn(command, self.env, quiet), command[0]) for command in step]
            for pid, name in running:
                if os.waitpid(pid, 0)[1] != 0:
                    raise SetupError(f"{name} failed:\n" + self._log_text("room.log"))
        material.install_client_material(f"{ROOM}/tls", "/etc/zent")
        for kind, ready in buses:
            if not self._wait_ready(ready):
                raise SetupError(f"the {kind} bus did not start:\n" + self._log_text("room.log"))
        if self.options.platform:
            self._start_platform()

    def _start_bus(self, kind, socket_path):
        reader, writer = os.pipe()
        spawn(material.bus_command(ROOM, kind, socket_path), self.env, {1: self.log, 2: self.log, 3: writer})
        os.close(writer)
        return kind, reader

    def _start_platform(self):
        log = os.open(f"{ROOM}/platform.log", os.O_WRONLY | os.O_CREAT | os.O_APPEND, 0o644)
        reader, writer = os.pipe()
        spawn([f"{self.options.tree}/sandbox/platform", "--firewall-fd", "0", "--ready-fd", "3"], self.env,
              {0: self.firewall.fileno(), 1: log, 2: log, 3: writer})
        self.firewall.close()
        os.close(writer)
        os.close(log)
        if not self._wait_ready(reader):
            raise SetupError("the platform did not start:\n" + self._log_text("platform.log"))

    @staticmethod
    def _wait_ready(reader):
        """Waits for a line on a pipe; false when it was closed without one."""
        text = b""
        while not text.endswith(b"\n"):
            piece = os.read(reader, 4096)
            if not piece:
                break
            text += piece
        os.close(reader)
        return text.endswith(b"\n")

    @staticmethod
    def _log_text(name):
        with open(f"{ROOM}/{name}", encoding="utf-8", errors="replace") as stream:
            return stream.read()

    def _serve(self, syslog):
        """Receives syslog, forwards signals and reaps until the command has ended."""
        wake_reader, wake_writer = os.pipe()
        for descriptor in (wake_reader, wake_writer):
            os.set_blocking(descriptor, False)
        signal.set_wakeup_fd(wake_writer, warn_on_full_buffer=False)
        signal.signal(signal.SIGCHLD, lambda *_: None)
        signal.pthread_sigmask(signal.SIG_UNBLOCK, [signal.SIGCHLD])
        journal = os.open(f"{ROOM}/syslog", os.O_WRONLY | os.O_CREAT | os.O_APPEND, 0o644)
        poller = selectors.DefaultSelector()
        for source in (syslog, self.control, wake_reader):
            poller.register(source, selectors.EVENT_READ)
        status = self._reap()
        while status is None:
            for key, _ in poller.select():
                if key.fileobj is syslog:
                    self._store(journal, syslog.recv(65536))
                elif key.fileobj is self.control:
                    self._forward()
                else:
                    os.read(wake_reader, 4096)
            status = self._reap()
        self._drain(journal, syslog)
        return status

    @staticmethod
    def _store(journal, datagram):
        os.write(journal, datagram if datagram.endswith(b"\n") else datagram + b"\n")

    def _drain(self, journal, syslog):
        """Writes what the command logged just before its end."""
        syslog.setblocking(False)
        try:
            while True:
                self._store(journal, syslog.recv(65536))
        except BlockingIOError:
            pass

    def _forward(self):
        """Passes on the signals that the process outside was sent; its end is the room's end."""
        numbers = self.control.recv(64)
        if not numbers:
            os._exit(128 + signal.SIGKILL)
        for number in numbers:
            os.kill(self.command, number)

    def _reap(self):
        """Collects ended processes; returns the command's exit status once it is among them."""
        status = None
        while True:
            try:
                pid, result = os.waitpid(-1, os.WNOHANG)
            except ChildProcessError:
                return status
            if pid == 0:
                return status
            if pid == self.command:
                code = os.waitstatus_to_exitcode(result)
                status = code if code >= 0 else 128 - code
