#!/usr/bin/python3
"""The room and the simulated platform tested from both sides: run outside, this file also runs itself in a room."""

import contextlib
import hashlib
import http.client
import json
import os
import signal
import ssl
import subprocess
import sys
import tempfile
import unittest
import uuid

SANDBOX = os.path.join(os.path.dirname(os.path.abspath(__file__)), "../../sandbox")
sys.dont_write_bytecode = True
sys.path.insert(0, SANDBOX)
import roomclient  # noqa: E402

ENTER = os.path.join(SANDBOX, "enter")
INSIDE = "ROOM" in os.environ
USER = os.environ.get("USER", "")
FORBIDDEN = 77


def enter(*arguments, **options):
    """Runs enter to its end."""
    return subprocess.run([ENTER, *arguments], capture_output=True, text=True, timeout=60, check=False, **options)


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


@unittest.skipIf(INSIDE, "looks at rooms from outside")
class Outside(unittest.TestCase):
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
        cases = (("exit 0", 0), ("exit 7", 7), ("kill -9 $$", 128 + signal.SIGKILL), ("kill -15 $$", 143))
        for script, status in cases:
            with self.subTest(script):
                self.assertEqual(enter("sh", "-c", script).returncode, status)
        self.assertEqual(enter("no-such-program").returncode, 127)
        for number in (signal.SIGTERM, signal.SIGINT):
            with self.subTest(number), subprocess.Popen(
                    [ENTER, "sh", "-c", f"trap 'exit 9' {number.value}; echo ready; while :; do sleep 0.05; done"],
                    stdout=subprocess.PIPE, text=True) as process:
                self.assertEqual(process.stdout.readline(), "ready\n")
                process.send_signal(number)
                self.assertEqual(process.wait(timeout=20), 9)

    def test_no_process_survives(self):
        for end in ("by itself", "killed"):
            marker = f"3600.{uuid.uuid4().int}"
            script = f"setsid sleep {marker} & echo ready; {'read line' if end == 'by itself' else 'sleep ' + marker}"
            with self.subTest(end), subprocess.Popen([ENTER, "--platform", "bash", "-c", script], text=True,
                                                     stdin=subprocess.PIPE, stdout=subprocess.PIPE) as process:
                self.assertEqual(process.stdout.readline(), "ready\n")
                roomclient.wait_for(lambda: alive(marker), what="the background process")
                if end == "killed":
                    process.kill()
                else:
                    process.stdin.write("\n")
                    process.stdin.flush()
                process.wait(timeout=20)
                roomclient.wait_for(lambda: not alive(marker), what="the end of the background process")

    def test_keep_copies_the_record(self):
        with tempfile.TemporaryDirectory() as directory:
            enter("--keep", directory, "systemctl", "two words", '"\\', "行\n")
            with open(f"{directory}/record.jsonl", encoding="utf-8") as stream:
                entry = json.loads(stream.read())
        self.assertEqual((entry["name"], entry["args"]), ("systemctl", ["two words", '"\\', "行\n"]))

    def test_platform(self):
        result = enter("--platform", "--user", "li@si", "--uid", "4321", "/usr/bin/python3", __file__,
                       env={"PATH": os.environ["PATH"]})
        self.assertEqual(result.returncode, 0, result.stdout + result.stderr)


@unittest.skipUnless(INSIDE, "needs a room with the platform")
class Inside(unittest.TestCase):
    def setUp(self):
        roomclient.clear_faults()
        roomclient.clear_record()

    @staticmethod
    def get(path, method="GET", certificate="/etc/zent/QEL_Zent.pem", body=None, headers=None):
        """Status, body and headers that answer one request over TLS."""
        context = ssl.create_default_context(cafile="/etc/zent/clientapi_ca.crt")
        if certificate:
            context.load_cert_chain(certificate, "/etc/zent/.QEL_Zent.key")
        connection = http.client.HTTPSConnection("server.zent.test", 443, timeout=10, context=context)
        with contextlib.closing(connection):
            connection.request(method, path, body and json.dumps(body), headers or {})
            with connection.getresponse() as reply:
                return reply.status, reply.read().decode(), reply.headers

    def test_client_certificate(self):
        path, body = "/uim/v3/client/account", {"username": USER.replace("@", "")}
        self.assertEqual(self.get(path, certificate=None, body=body)[0], 403)
        status, text, _ = self.get(path, body=body)
        self.assertEqual((status, json.loads(text)["data"]["user"]["id"]), (200, 10023))
        self.assertEqual([entry["client_certificate"] for entry in roomclient.record("http", path=path)],
                         [None, f"commonName={USER}"])

    def test_stand_ins(self):
        def token(script):
            first = hashlib.sha256(f"kobaltrix_20191104{script}pemb_20191104".encode()).hexdigest()
            return hashlib.sha256(first.encode()).hexdigest()
        front_end = ["bash", "/opt/vantor/lumo/fenx/fenx-cli.bash", "--cmd", "thirdscript", "--thirdscript",
                     "/a b.bash", "--args"]
        for script, status in (("/a b.bash", 0), ("/other.bash", 1)):
            self.assertEqual(subprocess.run([*front_end, token(script), "", "行 1"], check=False).returncode, status)
        entries = roomclient.record("process", name="fenx-cli.bash")
        self.assertEqual([entry["token_ok"] for entry in entries], [True, False])
        self.assertEqual(entries[0]["args"], [*front_end[2:], token("/a b.bash"), "", "行 1"])
        self.assertIn("27(sudo),2001(zent-users)", subprocess.check_output(["id"], text=True))
        self.assertEqual(subprocess.check_output(["/usr/bin/id", "-un"], text=True), f"{USER}\n")
        roomclient.set_standin("gio", stdout="a\nb", rc=4)
        result = subprocess.run(["gio", "mount", "-u"], capture_output=True, text=True, check=False)
        self.assertEqual((result.returncode, result.stdout), (4, "a\nb"))


if __name__ == "__main__":
    unittest.main()
