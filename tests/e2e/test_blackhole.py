# SPDX-License-Identifier: Apache-2.0
"""How fast the panel is while the management server does not answer at all, measured on the screen, and how
soon the client ends while a name server does not."""

import json
import socket
import time

from clienttest import INFO_FILE, ClientTest, read, roomclient, write
from screenwatch import ScreenWatch

ROUNDS = 50
# Less than any time-out of the client, and far more than a busy machine delays a click.
FREEZE_MS = 1400


class Blackhole(ClientTest):
    def test_panel_is_not_held_up(self):
        roomclient.patch_state({"black_hole": True})
        self.addCleanup(roomclient.patch_state, {"black_hole": False})
        watch = ScreenWatch(self.desktop)
        self.addCleanup(watch.close)
        panel = self.start_shown()
        roomclient.wait_syslog("failed: ", 20)
        left, top, _, _ = self.desktop.geometry(panel)
        # The texts of the panel's page; the buttons are beside each other above them.
        watch.area = (left + 10, top + 180, 100, 100)
        x, y, width, height = self.desktop.icon()
        # In the order of the clicks; those on the icon are so far from each other that two are no double click.
        places = {"network page": (left + 220, top + 145), "login page": (left + 80, top + 145),
                  "close": (x + width // 4, y + height // 4), "open": (x + width * 3 // 4, y + height * 3 // 4)}
        pictures = {name: watch.settle(place) for name, place in places.items()}
        self.assertEqual(len(set(pictures.values())), 3, "the pictures do not differ")
        measured = [{name: watch.timed(place, pictures[name]) for name, place in places.items()} for _ in range(ROUNDS)]
        slowest = {name: round(max(times[name] for times in measured)) for name in places}
        self.assertLess(max(slowest.values()), FREEZE_MS, slowest)
        # The polls went on all the time, and none of them reached the server.
        self.assertGreater(sum("not sent: no connection" in line for line in roomclient.syslog_lines()), ROUNDS // 10)
        self.assertEqual(roomclient.record("http"), [])

    def test_end_does_not_wait_for_names(self):
        with socket.socket(socket.AF_INET, socket.SOCK_DGRAM) as silent_name_server:
            silent_name_server.bind(("127.0.0.53", 53))
            info = json.loads(read(INFO_FILE))
            write(INFO_FILE, json.dumps({**info, "server_host": "silent.zent.test"}).encode())
            self.start()
            roomclient.wait_syslog("no connection within", 20)
            begin = time.monotonic()
            self.client.terminate()
            self.assertEqual(self.client.wait(40), 0)
            self.assertLess(time.monotonic() - begin, 2)
