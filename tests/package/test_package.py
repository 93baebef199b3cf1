#!/usr/bin/python3
"""The built package from installation to purge: run outside, this file runs itself in a room that dpkg may write to.

In the room the user is root of a namespace of his own (unshare -r) and installs with the machine's dpkg: dependencies
and triggers are those of real packages.
"""

import configparser
import contextlib
import glob
import os
import shlex
import shutil
import subprocess
import sys

TREE = os.path.dirname(os.path.dirname(os.path.dirname(os.path.abspath(__file__))))
NAME = "zentw-info"
AUTOSTART = f"/etc/xdg/autostart/{NAME}.desktop"
DATABASE = "/var/lib/dpkg"
INSIDE = "ROOM" in os.environ

if INSIDE:
    sys.path.insert(0, os.path.join(TREE, "tests/e2e"))
    from clienttest import ClientTest, read, roomclient, stop, unittest, write
else:
    import unittest
    ClientTest = unittest.TestCase


def enter_room(package):
    """Becomes this test in a room in which the directories that the package and dpkg need are writable."""
    listing = subprocess.run(["dpkg-deb", "--contents", package], capture_output=True, text=True, check=True).stdout
    shipped = [line.split(maxsplit=5)[5][1:].rstrip("/") for line in listing.splitlines() if line.startswith("d")]
    writable = [path for path in shipped if path not in ("", "/usr") and os.path.isdir(path)]
    system = [DATABASE, f"{DATABASE}/info", f"{DATABASE}/triggers", f"{DATABASE}/updates"]
    command = [f"{TREE}/sandbox/enter", "--platform", "--env", f"CLIENT=/usr/bin/{NAME}",
               "--env", f"PACKAGE={package}", "--env", "WRITABLE=" + ":".join(writable)]
    for path in writable + system:
        command += ["--writable", path]
    os.execv(command[0], [*command, "/usr/bin/python3", "-B", os.path.abspath(__file__), *sys.argv[1:]])


def take_database():
    """Makes those files of dpkg's database this user's own that dpkg opens for writing or links."""
    for name in ("lock", "lock-frontend", "triggers/Lock"):
        with contextlib.suppress(FileNotFoundError):
            os.unlink(f"{DATABASE}/{name}")
    shutil.copy(f"{DATABASE}/status", "/tmp/status")
    os.unlink(f"{DATABASE}/status")
    shutil.copy("/tmp/status", f"{DATABASE}/status")


def dpkg(*arguments):
    """Runs dpkg as the root of a user namespace."""
    result = subprocess.run(["unshare", "-r", "dpkg", "--log=/tmp/dpkg.log", *arguments], stdout=subprocess.PIPE,
                            stderr=subprocess.STDOUT, text=True, check=False)
    if result.returncode:
        raise AssertionError(f"dpkg {arguments}: {result.stdout}")


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
    if not INSIDE:
        (built,) = glob.glob(f"{TREE}/build/package/{NAME}_*.deb")
        enter_room(built)
    unittest.main()
