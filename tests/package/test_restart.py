# SPDX-License-Identifier: Apache-2.0
"""The installed client under a user's systemd: the unit made of the autostart entry, and its return after a fall."""

import glob
import os
import signal
import subprocess

from clienttest import ClientTest, read, roomclient, write
from packageroom import dpkg, take_database
from stage import SERVICE

GENERATOR = "/usr/lib/systemd/user-generators/systemd-xdg-autostart-generator"
CONTROL = os.path.expandvars("$XDG_RUNTIME_DIR/systemd/user.control")
GENERATED = [f"/tmp/generated/{priority}" for priority in ("normal", "early", "late")]
MANAGER = """mount -t cgroup2 cgroup2 /sys/fs/cgroup
exec setpriv --ambient-caps=-all --inh-caps=-all --bounding-set=-all /usr/lib/systemd/systemd --user --unit=app.slice
"""


def setUpModule():
    take_database()
    dpkg("-i", os.environ["PACKAGE"])
    # Without this no user manager starts: the system would not have been booted with systemd.
    os.makedirs("/run/systemd/system")
    # The machine's sockets: among them is a session bus, which would take the place of the room's.
    os.makedirs(CONTROL)
    os.symlink("/dev/null", f"{CONTROL}/sockets.target")
    for folder in GENERATED:
        os.makedirs(folder)
    subprocess.run([GENERATOR, *GENERATED], check=True)


class Restart(ClientTest):
    def setUp(self):
        super().setUp()
        (unit,) = glob.glob(f"{GENERATED[2]}/app-zentw*.service")
        self.unit = os.path.basename(unit)
        # A manager may mount and move in the room's control group only where it is root of both.
        self.desktop.spawn(["unshare", "--map-current-user", "--keep-caps", "--mount", "--cgroup", "sh", "-ec",
                            MANAGER], env={"SYSTEMD_LOG_TARGET": "console"})
        self.until("the user manager", lambda: self.systemctl("show-environment"))
        # Its own may be that of /etc/environment, where the stand-ins are not found.
        self.systemctl("import-environment", "PATH")

    def systemctl(self, *arguments):
        # In the room another one comes first in PATH.
        return self.desktop.run("/usr/bin/systemctl", "--user", *arguments)

    def show(self, name):
        return self.systemctl("show", "--value", "-p", name, self.unit).strip()

    def new_client(self, than="0"):
        """Waits for another client of the unit than the given process, with its icon; returns its process number."""
        pid = self.until("the client", lambda: next((p for p in [self.show("MainPID")] if p not in ("0", than)), None),
                         20)
        self.until("its log", lambda: any(f"[{pid}]" in line and "renewCurrentScene" in line
                                          for line in roomclient.syslog_lines()), 20)
        self.desktop.wait("the tray icon", self.desktop.icon)
        return int(pid)

    def test_nothing_of_the_unit_is_passed_over(self):
        verified = subprocess.run(["systemd-analyze", "--user", "verify", self.unit], capture_output=True, text=True,
                                  env={**os.environ, "SYSTEMD_UNIT_PATH": GENERATED[2] + ":"}, check=False)
        self.assertEqual((verified.returncode, verified.stdout + verified.stderr), (0, ""))

    def test_killed_client_comes_back_beside_its_child(self):
        os.makedirs("/run/user/1000/gvfs/mtp:host=Foo_SER1")
        waiting = "touch /tmp/begun; until test -e /tmp/go; do sleep 0.05; done; touch /tmp/done"
        roomclient.set_standin("gio", hook=waiting)
        self.addCleanup(roomclient.set_standin, "gio")
        self.systemctl("start", self.unit)
        first = self.new_client()
        self.desktop.run("gdbus", "wait", "--session", "--timeout", "20", SERVICE)
        self.desktop.spawn(["gdbus", "call", "--session", "-d", SERVICE, "-o", "/com/vantor/tarn/Notification", "-m",
                            SERVICE + ".Notification.GioMount", "Foo", "Bar", "SER1", "1000"])
        self.until("the child", lambda: os.path.exists("/tmp/begun"))
        os.kill(first, signal.SIGSEGV)
        self.new_client(than=str(first))
        write("/tmp/go", b"")
        self.until("the end of the child that outlived the client", lambda: os.path.exists("/tmp/done"))

    def test_which_ends_bring_it_back(self):
        place = f"{CONTROL}/{self.unit}.d"
        os.makedirs(place)
        write(f"{place}/end.conf", b"[Service]\nExecStart=\nExecStart=/bin/sh /tmp/client\n")
        self.systemctl("daemon-reload")
        for end, after in {"exit 0": "inactive/dead", "exit 1": "failed/failed", "exit 255": "failed/failed",
                           "kill -TERM $$": "inactive/dead", "exit 134": "failed/failed"}.items():
            with self.subTest(end):
                write("/tmp/starts", b"")
                write("/tmp/client", f"echo start >> /tmp/starts; {end}\n".encode())
                self.systemctl("reset-failed", self.unit)
                self.systemctl("start", "--no-block", self.unit)
                self.until("the last start", lambda state=after: os.path.getsize("/tmp/starts") and state == "/".join(
                    self.show(name) for name in ("ActiveState", "SubState")), 20)
                self.assertEqual(read("/tmp/starts"), b"start\n" * (5 if end == "exit 134" else 1))
