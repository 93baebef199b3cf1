#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""The built package from installation to purge: run outside, this file runs itself in a room that dpkg may write to."""

import configparser
import glob
import os
import shlex
import shutil
import subprocess
import sys

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "../../sandbox"))

from packageroom import (  # noqa: E402
    DATABASE, INSIDE, NAME, built_package, dpkg, room_command, take_database, this_test)

if not INSIDE:
    command = room_command(built_package(), this_test())
    os.execv(command[0], command)

from clienttest import ClientTest, read, roomclient, stop, unittest, write  # noqa: E402

AUTOSTART = f"/etc/xdg/autostart/{NAME}.desktop"


def entries():
    """What lies in the directories that the package shares with others; whole new directories are entries as well."""
    return {f"{path}/{name}" for path in os.environ["WRITABLE"].split(":") for name in os.listdir(path)}


def installed_schemas():
    env = {name: value for name, value in os.environ.items() if name != "GSETTINGS_SCHEMA_DIR"}
    return subprocess.run(["gsettings", "list-schemas"], env=env, capture_output=True, text=True,
                          check=True).stdout.split()


def session_command(path):
    """The command by which a session starts an autostart entry; None where it would pass the entry over."""
    parser = configparser.ConfigParser(interpolation=None, delimiters=("=",))
    parser.optionxform = str
    parser.read(path, encoding="utf-8")
    entry = parser["Desktop Entry"]
    if entry.get("Hidden") == "true" or not shutil.which(entry["TryExec"]):
        return None
    return shlex.split(entry["Exec"])


class Package(ClientTest):
    def start_as_session(self):
        return self.desktop.spawn(session_command(AUTOSTART))

    def test_from_installation_to_purge(self):
        take_database()
        before = entries()
        self.assertNotIn("com.vantor.zent.lockdown", installed_schemas())
        dpkg("-i", os.environ["PACKAGE"])
        self.assertIn("com.vantor.zent.lockdown", installed_schemas())

        self.assertEqual(shutil.which(NAME), f"/usr/bin/{NAME}")
        client = self.start_as_session()
        roomclient.wait_syslog("renewCurrentScene")
        self.desktop.wait("the tray icon", self.desktop.icon)
        self.assertEqual(stop(client), 0)

        # A terminal that is not managed: the session's start ends at once and says nothing to the user.
        info = read("/etc/zent/userinfo.json")
        write("/etc/zent/userinfo.json", b"{}")
        self.assertEqual(self.start_as_session().wait(20), 0)
        write("/etc/zent/userinfo.json", info)

        dpkg("--remove", NAME)
        self.assertTrue(os.path.exists(AUTOSTART))
        self.assertIsNone(session_command(AUTOSTART))
        dpkg("--purge", NAME)
        self.assertEqual(entries() ^ before, set())
        self.assertEqual(glob.glob(f"{DATABASE}/info/{NAME}.*"), [])
        self.assertNotIn("com.vantor.zent.lockdown", installed_schemas())
        self.assertTrue(os.path.exists(os.path.expanduser("~/.cache/vantor/CurrentScene")))


if __name__ == "__main__":
    unittest.main()
