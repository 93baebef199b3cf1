#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""What a room keeps from the machine outside, and what it passes on to it."""

import os
import signal
import subprocess
import sys
import unittest
import uuid

SANDBOX = os.path.dirname(os.path.abspath(__file__))
sys.dont_write_bytecode = True
sys.path.insert(0, SANDBOX)
import roomclient  # noqa: E402

ENTER = os.path.join(SANDBOX, "enter")
FORBIDDEN = 77


def enter(*arguments):
    """Runs enter to its end."""
    return subprocess.run([ENTER, *arguments], capture_output=True, text=True, timeout=60, check=False)


def alive(marker):
    """Whether a process outside or in any room has the marker in its command line."""
    for entry in os.listdir("/proc"):
        try:
            with open(f"/proc/{entry}/cmdline", "rb") as stream:
                if entry.isdigit() and marker.encode() in stream.read():
                    return True
        except OSError:
            pass
    return False


class Room(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        result = enter("true")
        if result.returncode == FORBIDDEN:
            raise unittest.SkipTest(result.stderr.strip())

    def test_nothing_outside_changes(self):
        marker = f"room-{uuid.uuid4()}"
        places = [f"{place}/{marker}" for place in ("/etc", "/usr/share", "/opt", "/home", "/tmp", "/var/tmp", "/run",
                                                    "/dev/shm")]
        result = enter("bash", "-ec", f"for f in {' '.join(places)}; do echo x > $f; done; "
                       "for d in / /usr/bin /var /root; do [[ ! -w $d ]] || { echo $d; exit 1; }; done")
        self.assertEqual(result.returncode, 0, result.stdout + result.stderr)
        self.assertEqual([place for place in places if os.path.exists(place)], [])

    def test_writable_directories_are_put_back(self):
        places = ("/usr/bin", "/usr/share/doc", "/var/lib/dpkg")
        before = [os.listdir(place) for place in places]
        options = [word for place in places for word in ("--writable", place)]
        result = enter(*options, "bash", "-ec", f"for d in {' '.join(places)}; do echo x > $d/made; done; "
                       "rm /usr/bin/env /var/lib/dpkg/status; ! echo x > /usr/made")
        self.assertEqual(result.returncode, 0, result.stdout + result.stderr)
        self.assertEqual([os.listdir(place) for place in places], before)

    def test_exit_status_and_signals_pass(self):
        for script, status in (("exit 7", 7), ("kill -9 $$", 128 + signal.SIGKILL)):
            self.assertEqual(enter("sh", "-c", script).returncode, status, script)
        for number in (signal.SIGTERM, signal.SIGINT):
            with self.subTest(number), subprocess.Popen(
                    [ENTER, "sh", "-c", f"trap 'exit 9' {number.value}; echo ready; while :; do sleep 0.05; done"],
                    stdout=subprocess.PIPE, text=True) as process:
                self.assertEqual(process.stdout.readline(), "ready\n")
                process.send_signal(number)
                self.assertEqual(process.wait(timeout=20), 9)

    def test_no_process_survives_a_killed_room(self):
        marker = f"3600.{uuid.uuid4().int}"
        with subprocess.Popen([ENTER, "--platform", "sh", "-c", f"setsid sleep {marker} & echo ready; sleep {marker}"],
                              stdout=subprocess.PIPE, text=True) as process:
            self.assertEqual(process.stdout.readline(), "ready\n")
            process.kill()
        roomclient.wait_for(lambda: not alive(marker), what="the end of the background process")


if __name__ == "__main__":
    unittest.main()
