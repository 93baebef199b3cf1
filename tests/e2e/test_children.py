# SPDX-License-Identifier: Apache-2.0
"""What child processes inherit of a client that was started with an open input and a descriptor more than it needs."""

import os

from clienttest import CLIENT, ClientTest, roomclient, unittest
from stage import RELEASE, Stage

# Each way of starting a child; the shell with a pipe is like the others, and nothing calls it.
WAYS = {"id": "posix_spawn", "gio": "QProcess", "fenx-cli.bash": "detached", "systemctl": "detached command line"}
# Standard streams, and what a shell keeps of its own.
EXPECTED = {"0", "1", "2", "10", "11"}


def kept(name):
    return os.path.join(roomclient.ROOM, "inherited." + name)


class Children(ClientTest):
    def start_client(self):
        read_end, self.write_end = os.pipe()
        self.addCleanup(os.close, self.write_end)
        self.client = self.desktop.spawn([CLIENT], stdin=read_end, pass_fds=[read_end])
        os.close(read_end)

    def test_input_is_empty_and_nothing_else_is_inherited(self):
        for name in WAYS:
            roomclient.set_standin(name, hook="for fd in /proc/$$/fd/*; do printf '%s ' ${fd##*/}; "
                                   f"readlink $fd || echo gone; done > {kept(name)}.$$; mv {kept(name)}.$$ {kept(name)}")
            self.addCleanup(roomclient.set_standin, name)
        stage = Stage(self.desktop)
        self.start_client()
        roomclient.wait_syslog("renewCurrentScene")
        os.makedirs("/run/user/1000/gvfs/mtp:host=Foo_SER1", exist_ok=True)
        stage.call("/com/vantor/tarn/Notification", "com.vantor.tarn.Notification", "GioMount", "a", "b", "SER1", "1000")
        self.show_panel()
        stage.click(RELEASE)
        dialog = stage.window(RELEASE)
        stage.type(dialog, "Admin@2026")
        stage.keys(dialog, "Return")
        for name, way in WAYS.items():
            with self.subTest(way):
                self.until(name, lambda path=kept(name): os.path.exists(path))
                with open(kept(name), encoding="utf-8") as stream:
                    inherited = dict(line.split(maxsplit=1) for line in stream.read().splitlines())
                self.assertEqual(inherited["0"], "/dev/null")
                self.assertLessEqual({fd for fd, target in inherited.items() if target != "gone"}, EXPECTED, inherited)


if __name__ == "__main__":
    unittest.main()
