# SPDX-License-Identifier: Apache-2.0
"""Start-up: gates, the single instance, the requests and the log of a start, and the ways to end."""

import signal

from clienttest import CLIENT, INFO_FILE, SYSLOG, ClientTest, roomclient, stop, unittest, write


class Start(ClientTest):
    def status(self):
        """The exit status of a start that declines to run."""
        return self.desktop.start_client(CLIENT).wait(20)

    def test_gates(self):
        for content in (b'{"is_Domain": "true"}', b'{"is_Domain": true', b"[true]"):
            write(SYSLOG, b"")
            write(INFO_FILE, content)
            self.assertEqual(self.status(), 0)
            self.assertEqual(self.messages(), ["is not Domain!"], content)
        write(INFO_FILE, self.saved[INFO_FILE])
        write(SYSLOG, b"")
        roomclient.set_standin("id", stdout="uid=1(a) gid=1(a) groups=27(sudo)\n")
        self.assertEqual(self.status(), 0)
        self.assertEqual(self.messages(), [])

    def test_second_instance_leaves_the_first_alone(self):
        first = self.start()
        self.assertEqual(self.status(), 0)
        self.assertIn("another instance running!", self.messages())
        self.assertIsNone(first.poll())
        # The lock goes with its holder, however that ends.
        first.kill()
        first.wait(5)
        write(SYSLOG, b"")
        self.start()

    def test_quiet_start_and_end(self):
        for number in (signal.SIGTERM, signal.SIGINT):
            roomclient.clear_record()
            self.start()
            roomclient.wait_syslog("parse config.json file ok.", 15)
            self.assertEqual([line for line in roomclient.syslog_lines() if not line.startswith(("<30>", "<31>"))], [])
            with open(f"/proc/{self.client.pid}/maps", encoding="utf-8") as stream:
                self.assertNotIn("bearer", stream.read())
            # Everything is asked once when the server answers.
            self.assertEqual(sorted(entry["path"] for entry in roomclient.record("http")
                                    if "/notification/" not in entry["path"]),
                             ["/api/client/area/scenes", "/uim/v3/client/account", "/uim/v3/client/uim_department/id"])
            self.assertEqual(stop(self.client, number), 0)
            write(SYSLOG, b"")

    def test_log_keeps_its_characters_where_the_locale_is_not_generated(self):
        answer = '[{"IsPrimaryConnection": true, "HwAddress": "网卡"}]'
        roomclient.add_fault({"dbus": "GetActiveConnectionInfo"}, {"value": answer})
        self.desktop.env.pop("LOCPATH", None)
        self.start(LANG="xx_XX.UTF-8", LC_CTYPE="C.UTF-8")
        self.assertIn('updateNetInfo array--2@@@--: "网卡"', self.messages())


if __name__ == "__main__":
    unittest.main()
