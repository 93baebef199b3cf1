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
import time
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
    def get(path, method="GET", certificate="/etc/zent/QEL_Zent.pem", body=None, headers=None, timeout=10):
        """Status, body and headers that answer one request over TLS."""
        context = ssl.create_default_context(cafile="/etc/zent/clientapi_ca.crt")
        if certificate:
            context.load_cert_chain(certificate, "/etc/zent/.QEL_Zent.key")
        connection = http.client.HTTPSConnection("server.zent.test", 443, timeout=timeout, context=context)
        with contextlib.closing(connection):
            connection.request(method, path, body and json.dumps(body), headers or {})
            with connection.getresponse() as reply:
                return reply.status, reply.read().decode(), reply.headers

    @staticmethod
    def call(bus, service, interface, method, *arguments, timeout=10):
        """What gdbus prints for a call, or its error text."""
        path = "/" + service.replace(".", "/")
        result = subprocess.run(["gdbus", "call", f"--{bus}", "-d", service, "-o", path, "-t", str(timeout),
                                 "-m", f"{interface}.{method}", *arguments], capture_output=True, text=True,
                                check=False, env={**os.environ, "LC_ALL": "C.UTF-8"})
        return (result.stdout or result.stderr).strip()

    def test_client_certificate(self):
        path, body = "/uim/v3/client/account", {"username": USER.replace("@", "")}
        self.assertEqual(self.get(path, certificate=None, body=body)[0], 403)
        status, text, _ = self.get(path, body=body)
        self.assertEqual((status, json.loads(text)["data"]["user"]["id"]), (200, 10023))
        self.assertEqual([entry["client_certificate"] for entry in roomclient.record("http", path=path)],
                         [None, f"commonName={USER}"])

    def test_certificates(self):
        for name, reason in (("other_ca", "unable to get local issuer"), ("expired", "has expired"),
                             ("wrong_host", "Hostname mismatch")):
            with self.subTest(name):
                roomclient.patch_state({"tls": {"certificate": name}})
                with self.assertRaisesRegex(ssl.SSLCertVerificationError, reason):
                    self.get("/")
        roomclient.patch_state({"tls": {"certificate": "server", "demand_client_certificate": True}})
        with self.assertRaises(OSError):
            self.get("/", certificate=None)
        roomclient.wait_record(lambda entry: entry["kind"] == "tls" and "CERTIFICATE" in entry["error"])
        self.assertEqual(self.get("/")[0], 404)
        roomclient.patch_state({"tls": {"demand_client_certificate": False}, "listening": False})
        with self.assertRaises(ConnectionRefusedError):
            self.get("/")
        roomclient.patch_state({"listening": True})
        self.assertEqual(self.get("/")[0], 404)

    def test_http_faults(self):
        path = "/uim/v3/client/uim_department/id"
        roomclient.add_fault({"path": path}, {"status": 500, "body": "坏"}, times=1)
        self.assertEqual(self.get(f"{path}?id=1")[:2], (500, "坏"))
        self.assertEqual(json.loads(self.get(f"{path}?id=1")[1])["data"]["name"], "示例科技集团有限公司")
        for action, error in (({"drop": "before"}, http.client.RemoteDisconnected),
                              ({"drop": "mid"}, http.client.IncompleteRead), ({"hang": True}, TimeoutError)):
            with self.subTest(action):
                roomclient.add_fault({"path": path, "method": "GET"}, action, times=1)
                with self.assertRaises(error):
                    self.get(f"{path}?id=1", timeout=1 if "hang" in action else 10)
        roomclient.add_fault({"path": path}, {"delay_ms": 200})
        start = time.monotonic()
        self.assertEqual(self.get(f"{path}?id=1")[0], 200)
        self.assertGreaterEqual(time.monotonic() - start, 0.2)

    def test_messages(self):
        headers = {"X-XSRF-TOKEN": roomclient.state()["token"]}
        path = "/notification/v2/list?uid=zhangsan&is_not_read=1&limit=2&offset=0"
        self.assertEqual(self.get(path, certificate=None)[0], 401)
        _, text, reply = self.get(path, certificate=None, headers=headers)
        messages = json.loads(text)
        self.assertEqual((reply["X-Total-Count"], len(messages)), ("3", 2))
        self.assertGreater(messages[0]["created_at"], messages[1]["created_at"])
        steps = (("read", {"uuid": messages[0]["uuid"]}, "2"), ("read_all", {"uid": "zhangsan"}, "0"))
        for name, body, left in steps:
            status, _, _ = self.get(f"/notification/v2/{name}?timestaps=1", "PUT", body=body, headers=headers)
            self.assertEqual(status, 200)
            self.assertEqual(self.get(path, headers=headers)[2]["X-Total-Count"], left)

    def test_bus_services(self):
        network, iam, zentg = "com.vantor.daemon.Network", "com.vantor.zent.iam", "com.vantor.zent.zentg"
        properties = "org.freedesktop.DBus.Properties"
        modify = ("system", iam, iam, "ModifyUserPassword", USER)
        set_enable = ("system", iam, properties, "Set", iam, "Enable", "<false>")
        leave = ("system", zentg, zentg, "onDomainConfig", "remove")
        reboot = ("system", "org.freedesktop.login1", "org.freedesktop.login1.Manager", "Reboot", "true")
        for call, answer in (
                (("session", network, network, "GetActiveConnectionInfo"), "5C:3A:45:1E:7B:90"),
                ((*modify, "wrong", "Neu@2026"), "-100002"), ((*modify, "Zent@2026", "short"), "-500"),
                ((*modify, "Zent@2026", "Neu@2026"), '"code": 0'), ((*modify, "Neu@2026", "Zent@2026"), '"code": 0'),
                (set_enable, "()"), (leave, "(0,)"), (reboot, "()")):
            with self.subTest(call):
                self.assertIn(answer, self.call(*call))
        self.assertFalse(roomclient.state()["iam"]["enable"])
        self.assertEqual(roomclient.record("dbus", method="onDomainConfig")[0]["args"], ["remove"])
        roomclient.patch_state({"iam": {"read_only": True}})
        self.assertIn("PropertyReadOnly", self.call(*set_enable))
        roomclient.patch_state({"iam": {"read_only": False}})
        for action, answer in (({"value": 5}, "(5,)"), ({"error": "com.vantor.Failed"}, "com.vantor.Failed"),
                               ({"no_value": True}, "()"), ({"hang": True}, "Timeout"), ({"vanish": True}, "NoReply")):
            with self.subTest(action):
                roomclient.add_fault({"dbus": "onDomainConfig"}, action, times=1)
                self.assertIn(answer, self.call(*leave, timeout=1 if "hang" in action else 10))
        self.assertIn("ServiceUnknown", self.call(*leave))
        roomclient.patch_state({"services": {"zentg": True}})
        self.assertIn("(0,)", self.call(*leave))

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
        roomclient.set_standin("gio", stdout="a\nb", rc=4, hook='printf %s "$2" > /tmp/hooked')
        result = subprocess.run(["gio", "mount", "-u"], capture_output=True, text=True, check=False)
        self.assertEqual((result.returncode, result.stdout), (4, "a\nb"))
        with open("/tmp/hooked", encoding="utf-8") as stream:
            self.assertEqual(stream.read(), "-u")

    def test_terminal(self):
        subprocess.run(["logger", "一行"], check=True)
        self.assertTrue(roomclient.wait_syslog("一行").startswith("<13>"))
        schema = "com.vantor.oxa.control-center"
        subprocess.run(["gsettings", "set", schema, "auto-login-visable", "false"], check=True)
        self.assertEqual(subprocess.check_output(["gsettings", "get", schema, "auto-login-visable"], text=True),
                         "false\n")
        self.assertEqual(subprocess.check_output(["/usr/bin/id", "-un"], text=True), f"{USER}\n")
        with open("/etc/zent/userinfo.json", encoding="utf-8") as stream:
            self.assertEqual(json.load(stream)["server_port"], 443)


if __name__ == "__main__":
    unittest.main()
