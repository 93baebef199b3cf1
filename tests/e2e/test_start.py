"""Start-up: gates, the single instance, the log of a start, and the ways to end."""

import json
import re
import signal

from clienttest import CLIENT, INFO_FILE, SYSLOG, ClientTest, roomclient, stop, unittest, write


class Gates(ClientTest):
    tray = False

    def test_gates(self):
        # What each gate makes of other content is told by the unit tests.
        write(INFO_FILE, b'{"is_Domain": "true"}')
        self.assertEqual(self.status_of_start(), 0)
        self.assertEqual(self.messages(), ["is not Domain!"])
        write(INFO_FILE, self.saved[INFO_FILE])
        write(SYSLOG, b"")
        roomclient.set_standin("id", stdout="uid=1(a) gid=1(a) groups=27(sudo)\n")
        self.assertEqual(self.status_of_start(), 0)
        self.assertEqual(self.messages(), [])

    def test_second_instance_leaves_the_first_alone(self):
        first = self.start()
        self.assertEqual(self.status_of_start(), 0)
        self.assertIn("another instance running!", self.messages())
        self.assertIsNone(first.poll())
        # The lock goes with its holder, however that ends.
        first.kill()
        first.wait(5)
        write(SYSLOG, b"")
        self.start()
        self.assertNotIn("another instance running!", self.messages())

    def test_info_file_that_vanishes_behind_the_gate(self):
        roomclient.set_standin("id", stdout="groups=1(zent)\n", hook=f"rm -f {INFO_FILE}")
        client = self.desktop.start_client(CLIENT)
        box = self.until("the message box", lambda: [w for w, g in self.desktop.windows() if g[2] > 150])[0]
        self.assertIn("域管终端提示", self.desktop.run("xprop", "-id", box, "_NET_WM_NAME"))
        self.desktop.run("xdotool", "windowfocus", "--sync", box, "key", "Return")
        self.assertEqual(client.wait(10), 255)
        self.assertRegex("\n".join(self.messages()), r"(?m)^no config.json to use, error code:  5 , error detail:  "
                         r"\"No such file or directory\" , uid:  1000 , gid:  1000 , euid:  1000 , egid:  1000$")


class Running(ClientTest):
    def test_quiet_start(self):
        self.start()
        roomclient.wait_record(lambda entry: entry.get("path") == "/api/client/area/scenes", 15)
        wanted = ("main ----nosversion---: 1020", 'username got : "zhangsan"', 'ScenceUsername : ""',
                  "showSystemTrayIcon sysTrayIcon->show()", 'updateNetInfo array--2@@@--: "5C:3A:45:1E:7B:90"',
                  'renewCurrentScene :  "intranet-scene"')
        lines = iter(roomclient.syslog_lines())
        for message in wanted:
            # Facility daemon is 24; the time of syslog itself, identity and process id stand before our own format.
            pattern = (r"^<31>\w+ +\d+ [\d:]+ zentw-info\[\d+\]: \d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3} debug "
                       rf"\[ \w+\.cpp [^\]]+\(.*\) \d+\]  {re.escape(message)} $")
            self.assertTrue(any(re.match(pattern, line) for line in lines), f"missing or out of order: {message}")
        roomclient.wait_syslog("parse config.json file ok.")
        self.assertEqual([line for line in roomclient.syslog_lines() if not re.match(r"<3[01]>", line)], [])
        # Everything is asked once when the server answers.
        asked = [entry for entry in roomclient.record("http") if "/notification/" not in entry["path"]]
        self.assertEqual(sorted(entry["path"] for entry in asked),
                         ["/api/client/area/scenes", "/uim/v3/client/account", "/uim/v3/client/uim_department/id"])
        account = roomclient.record("http", path="/uim/v3/client/account")[0]
        self.assertEqual(json.loads(account["body"])["username"], "zhangsan")

    def test_log_keeps_its_characters_where_the_locale_is_not_generated(self):
        answer = '[{"IsPrimaryConnection": true, "HwAddress": "网卡"}]'
        roomclient.add_fault({"dbus": "GetActiveConnectionInfo"}, {"value": answer})
        self.desktop.env.pop("LOCPATH", None)
        self.start(LANG="xx_XX.UTF-8", LC_CTYPE="C.UTF-8")
        self.assertIn('updateNetInfo array--2@@@--: "网卡"', self.messages())

    def test_termination_is_clean(self):
        for number in (signal.SIGTERM, signal.SIGINT):
            with self.subTest(number):
                self.assertEqual(stop(self.start(), number), 0)


if __name__ == "__main__":
    unittest.main()
