# SPDX-License-Identifier: Apache-2.0
"""The faults of the soak: each is in force for some seconds.

It explains certain warnings for as long, and a little more.
"""

import contextlib
import dataclasses
import json
import random
import re
import signal
import threading
import time

import roomclient

# How long after its end a fault may still show: the longest time that polls are held back, and some for a busy machine.
AFTERMATH_S = 65
# Long enough for polls to pile up, each on a connection of its own.
WARM_UP_S = 2.5
HTTP = r"(GET|PUT) .*(failed|not sent):|POST .*failed:|the message list holds no message"
SLOW = r"GET .*not sent: .*is slow to answer"
DAEMON = r"GetActiveConnectionInfo (failed:|gave no list)"
IDENTITY = r"pam模块返回数据错误"
NOTIFIER = r"DesktopNotifier .*(GetCapabilities|Notify) "
LONG = "长" * 350_000
GARBAGE = '{"code": 0, "data": [{]}\x00ÿ'


@dataclasses.dataclass
class Fault:
    """What goes wrong: an answer of the platform, a change of its state, or a process that is stopped."""
    name: str
    explains: str = "(?!)"
    match: dict = None
    action: dict = None
    state: dict = None
    process: str = ""


def http_faults():
    """Every path of the client's with everything a server or the network may do to it."""
    actions = {
        "refused": ({"status": 403, "body": "{}"}, HTTP),
        "error 500": ({"status": 500, "body": "<html>oops</html>"}, HTTP),
        "garbage": ({"status": 200, "body": GARBAGE}, HTTP),
        "large": ({"status": 200, "body_bytes": 2_000_000}, HTTP),
        "slow": ({"delay_ms": 700}, SLOW),
        "slow and failing": ({"delay_ms": 1000, "status": 503, "body": "{}"}, HTTP),
        "byte by byte": ({"drip_ms": 100}, HTTP),
        "without an end": ({"endless": True}, HTTP),
        "compressed bomb": ({"gzip_mib": 500}, HTTP),
        "dropped before the answer": ({"drop": "before"}, HTTP),
        "dropped in the answer": ({"drop": "mid"}, HTTP),
        "silent": ({"hang": True}, HTTP),
    }
    for path, service in (("/notification/*", "messages"), ("/uim/*", "management"), ("*", "all")):
        for what, (action, explains) in actions.items():
            yield Fault(f"{service}: {what}", explains, {"path": path}, action)


def bus_faults():
    """The same of the services on the buses."""
    for method, explains in (("GetActiveConnectionInfo", DAEMON), ("ModifyUserPassword", IDENTITY)):
        for what, action in (("error", {"error": "com.vantor.Error.Busy"}), ("garbage", {"value": GARBAGE[:-2]}),
                             ("empty", {"no_value": True}), ("slow", {"delay_ms": 300}),
                             ("vanishes", {"vanish": True})):
            yield Fault(f"{method}: {what}", explains, {"dbus": method}, action)


# A user's and an organisation's reply in one: good, but each name is 1 MB without a blank.
LONG_NAMES = {"code": 0, "data": {"name": LONG, "user": {
    "gecos": f"{LONG},,,{LONG}", "client_name": LONG, "supplementtary_groups": [{"name": LONG}]}}}

FAULTS = [
    *http_faults(), *bus_faults(),
    Fault("long names", HTTP, {"path": "/uim/*", "method": "GET"},
          {"body": json.dumps(LONG_NAMES, ensure_ascii=False)}),
    Fault("servers not listening", HTTP, state={"listening": False}),
    Fault("certificate expired", HTTP, state={"tls": {"certificate": "expired"}}),
    Fault("certificate of another authority", HTTP, state={"tls": {"certificate": "other_ca"}}),
    Fault("network daemon missing", DAEMON, state={"services": {"network": False}}),
    Fault("identity service missing", IDENTITY, state={"services": {"iam": False}}),
    Fault("notification service hangs", NOTIFIER, process="dunst"),
]
NO_NOTIFICATIONS = Fault("notification service missing", NOTIFIER)
SOUND = {"listening": True, "tls": {"certificate": "server"}, "services": {"network": True, "iam": True}}


class Faults(threading.Thread):
    """Puts the faults in force, one after the other in a random order, with pauses between them."""

    def __init__(self, seed, processes):
        super().__init__(daemon=True)
        self.random = random.Random(seed)
        self.processes = processes
        self.history = []
        self._round = []
        self.ending = threading.Event()
        self.error = None

    def run(self):
        try:
            while not self.ending.wait(self.random.uniform(0.5, 3)):
                # A round holds every fault, so that a long enough run has had them all.
                if not self._round:
                    self._round = self.random.sample(FAULTS, len(FAULTS))
                self._hold(self._round.pop(), self.random.uniform(2, 7))
        except Exception as error:  # pylint: disable=broad-except
            self.error = error

    def warm_up(self):
        """Each thing that can befall a request once, so that what its first time needs is there."""
        for fault in FAULTS:
            if fault.name.startswith(("all: ", "long names")):
                self._hold(fault, WARM_UP_S)

    @contextlib.contextmanager
    def noted(self, fault):
        """Notes that a fault is in force for as long as the context lasts."""
        entry = [fault, time.time(), None]
        self.history.append(entry)
        try:
            yield
        finally:
            entry[2] = time.time()

    def _hold(self, fault, seconds):
        with self.noted(fault):
            if fault.match:
                roomclient.add_fault(fault.match, fault.action)
            elif fault.state:
                roomclient.patch_state(fault.state)
            else:
                self._send(fault.process, signal.SIGSTOP)
            self.ending.wait(seconds)
            roomclient.clear_faults()
            roomclient.patch_state(SOUND)
            if fault.process:
                self._send(fault.process, signal.SIGCONT)

    def _send(self, name, number):
        process = self.processes.get(name)
        if process:
            process.send_signal(number)

    def stop(self):
        """Ends the fault in force, and all faults."""
        self.ending.set()
        self.join()
        if self.error:
            raise self.error

    def explain(self, moment, text):
        """The fault that explains a warning of that time, or None."""
        for fault, start, end in reversed(self.history):
            if start <= moment <= (end or moment) + AFTERMATH_S and re.search(fault.explains, text):
                return fault
        return None
