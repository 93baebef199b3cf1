"""Start-up: gates, the single instance, the log of a start, and the ways to end."""

import json
import re
import signal

from clienttest import CLIENT, INFO_FILE, ClientTest, read, roomclient, stop, unittest, write


class Gates(ClientTest):
    tray = False

    def test_terminal_outside_the_domain(self):
        cases = {
            "text": b'{"is_Domain": "true"}',
            "false": b'{"is_Domain": false}',
            "missing key": b"{}",
            "empty": b"",
            "broken": read(INFO_FILE)[:40],
        }
        for name, content in cases.items():
            with self.subTest(name):
                write(INFO_FILE, content)
                write(roomclient.ROOM + "/syslog", b"")
                self.assertEqual(self.status_of_start(), 0)
                self.assertEqual(self.messages(), ["is not Domain!"])

    def test_user_outside_the_platform(self):
        for name, changes in {"other groups": {"stdout": "uid=1(a) gid=1(a) groups=27(sudo)\n"},
                              "failing": {"stdout": "", "rc": 1}}.items():
            with self.subTest(name):
                roomclient.set_standin("id", **changes)
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
        write(roomclient.ROOM + "/syslog", b"")
        self.start()
        self.assertNotIn("another instance running!", self.messages())

    def test_info_file_that_vanishes_behind_the_gate(self):
        roomclient.set_standin("id", stdout="groups=1(zent)\n", hook=f"rm -f {INFO_FILE}")
        client = self.desktop.start_client(CLIENT)
        box = self.until("the message box", lambda: [w for w, g in self.desktop.windows() if g[2] > 150])[0]
        self.assertIn("域管终端提示", self.desktop.run("xprop", "-id", box, "_NET_WM_NAME"))
        self.desktop.run("xdotool", "windowfocus", "--sync", box, "key", "Return")
        self.assertEqual(client.wait(10), 255)
        line = next(m for m in self.messages() if m.startswith("no config.json"))
        self.assertRegex(line, r"^no config.json to use, error code:  5 , error detail:  \"No such file or directory\" ,"
                               r" uid:  1000 , gid:  1000 , euid:  1000 , egid:  1000$")


class Running(ClientTest):
    def test_log_of_a_start(self):
        self.start()
        wanted = [
            ('debug', 'main.cpp', r'int main\(int, char\*\*\)', 'main ----nosversion---: 1020'),
            ('debug', 'mainwindow.cpp', r'void MainWindow::getUserName\(\)', 'getusername: "zhangsan"'),
            ('debug', 'mainwindow.cpp', r'void MainWindow::getUserName\(\)', 'userName: "zhangsan"'),
            ('debug', 'mainwindow.cpp', r'void MainWindow::getUserName\(\)', 'username got : "zhangsan"'),
            ('debug', 'mainwindow_user.cpp', r'bool MainWindow::isScenceUser\(\)', 'ScenceUsername : ""'),
            ('debug', 'mainwindow_tray.cpp', r'void MainWindow::showSystemTrayIcon\(\)',
             'showSystemTrayIcon sysTrayIcon->show()'),
            ('debug', 'mainwindow_network.cpp', r'void MainWindow::updateNetInfo\(\)',
             'updateNetInfo array--2@@@--: "5C:3A:45:1E:7B:90"'),
            ('debug', 'mainwindow_scenes.cpp', r'void MainWindow::renewCurrentScene\(const QString&\)',
             'renewCurrentScene :  "intranet-scene"'),
        ]
        lines = iter(roomclient.syslog_lines())
        for word, file, function, message in wanted:
            # Facility daemon is 24; the time of syslog itself, identity and process id stand before our own format.
            pattern = (rf"^<31>\w+ +\d+ [\d:]+ zentw-info\[\d+\]: \d{{4}}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{{3}} {word} "
                       rf"\[ {file} {function} \d+\]  {re.escape(message)} $")
            self.assertTrue(any(re.match(pattern, line) for line in lines), f"missing or out of order: {message}")

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

    def test_no_warning_in_a_quiet_start(self):
        self.start()
        roomclient.wait_record(lambda entry: entry.get("path") == "/api/client/area/scenes", 15)
        roomclient.wait_syslog("parse config.json file ok.")
        self.assertEqual([line for line in roomclient.syslog_lines() if not re.match(r"<3[01]>", line)], [])

    def test_everything_is_asked_once_when_the_server_answers(self):
        self.start()
        roomclient.wait_record(lambda entry: entry.get("path") == "/api/client/area/scenes", 15)
        paths = [entry["path"] for entry in roomclient.record("http") if "/notification/" not in entry["path"]]
        self.assertEqual(sorted(paths), ["/api/client/area/scenes", "/uim/v3/client/account",
                                         "/uim/v3/client/uim_department/id"])
        account = roomclient.record("http", path="/uim/v3/client/account")[0]
        self.assertEqual(json.loads(account["body"])["username"], "zhangsan")


if __name__ == "__main__":
    unittest.main()
