# SPDX-License-Identifier: Apache-2.0
"""The built package from a signed archive to purge, by the commands of docs/rollout.md, word by word."""

import configparser
import glob
import os
import re
import shlex
import shutil
import subprocess

from clienttest import TREE, ClientTest, roomclient, stop, write
from packageroom import DATABASE, NAME, dpkg, take_database

AUTOSTART = f"/etc/xdg/autostart/{NAME}.desktop"
WORK = "/tmp/rollout"
# The room has no network and a single user: only the archive is asked, and nobody else's rights are taken.
CONFIGURATION = f"""APT::Sandbox::User "root";
Dir::Etc::SourceList "/etc/apt/sources.list.d/zent.list";
Dir::Etc::SourceParts "/dev/null";
Dir::State::Lists "{WORK}/lists/";
Dir::State::extended_states "{WORK}/extended_states";
Dir::Cache "{WORK}/cache/";
Dir::Log "{WORK}";
DPkg::Pre-Install-Pkgs {{}};
DPkg::Options {{ "--log={WORK}/dpkg.log"; }};
"""


def entries():
    """What lies in the directories that the package shares with others; whole new directories are entries as well."""
    return {f"{path}/{name}" for path in os.environ["WRITABLE"].split(":") for name in os.listdir(path)}


def section(heading):
    with open(f"{TREE}/docs/rollout.md", encoding="utf-8") as document:
        return document.read().split(f"\n## {heading}\n")[1].split("\n## ")[0]


def commands(heading, paragraph=0):
    """The lines of one block of commands below a heading of the document."""
    return re.findall(r"(?:^    .*\n)+", section(heading), re.MULTILINE)[paragraph].replace("\n    ", "\n").strip()


def session_command():
    """The command by which a session starts the autostart entry; None where it would pass the entry over."""
    parser = configparser.ConfigParser(interpolation=None, delimiters=("=",))
    parser.optionxform = str
    parser.read(AUTOSTART, encoding="utf-8")
    entry = parser["Desktop Entry"]
    return shlex.split(entry["Exec"]) if entry.get("Hidden") != "true" and shutil.which(entry["TryExec"]) else None


class Package(ClientTest):
    def run_lines(self, lines, place=WORK, succeeds=True):
        """Runs commands as the root of a user namespace; returns their output."""
        result = subprocess.run(["unshare", "-r", "bash", "-euc", lines], cwd=place, check=False, text=True,
                                stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
        self.assertEqual(result.returncode == 0, succeeds, result.stdout)
        return result.stdout

    def installed(self):
        return self.run_lines(f"dpkg-query -W -f '${{Version}}' {NAME}")

    def has_schema(self):
        return "com.vantor.zent.lockdown" in self.run_lines("env -u GSETTINGS_SCHEMA_DIR gsettings list-schemas")

    def prepare(self):
        take_database()
        for directory in ("lists/partial", "cache/archives/partial", "gnupg"):
            os.makedirs(f"{WORK}/{directory}", mode=0o700)
        write(f"{WORK}/apt.conf", CONFIGURATION.encode())
        os.environ.update(APT_CONFIG=f"{WORK}/apt.conf", GNUPGHOME=f"{WORK}/gnupg", DEBIAN_FRONTEND="noninteractive",
                          LC_ALL="C.UTF-8")
        shutil.copy(os.environ["PACKAGE"], WORK)

    def publish_next(self, again):
        """The package once more, with a later version, in the archive."""
        self.run_lines(f"dpkg-deb -R {os.environ['PACKAGE']} next\n"
                       "sed -i 's/^Version: .*/&+next/' next/DEBIAN/control\n"
                       f"dpkg-deb --root-owner-group -b next /srv/zent/pool/{NAME}_next.deb")
        self.run_lines("\n".join(again), "/srv/zent")

    def test_from_archive_to_purge(self):
        self.prepare()
        before = entries()
        self.assertFalse(self.has_schema())
        archive = commands("A signed package archive")
        self.run_lines(archive)
        shutil.copy("/srv/zent/zent-archive.gpg", WORK)
        terminal = commands("A signed package archive", 1)
        self.run_lines(terminal.replace("https://archive.example/zent", "file:/srv/zent"))
        version = self.installed()
        self.assertTrue(self.has_schema())
        self.assertIn("/zh_CN/", self.run_lines(f"man -L zh_CN -w {NAME}"))
        self.check_sessions()

        self.publish_next(archive.splitlines()[-3:])
        self.run_lines(f"apt-get update\napt-get install -y {NAME}")
        self.assertEqual(self.installed(), version + "+next")
        self.run_lines(commands("Going back a version").replace("=0.1.0", "=" + version))
        self.assertEqual(self.installed(), version)
        self.assertNotIn(f"Inst {NAME}", self.run_lines("apt-get -s upgrade"))
        # What nobody has signed is not taken.
        self.run_lines("echo >> Packages", "/srv/zent")
        self.run_lines("rm -r lists; mkdir -p lists/partial; apt-get update", succeeds=False)

        self.run_lines(f"apt-mark unhold {NAME}")
        dpkg("--remove", NAME)
        self.assertTrue(os.path.exists(AUTOSTART))
        self.assertIsNone(session_command())
        dpkg("--purge", NAME)
        self.assertEqual(entries() ^ before, set())
        self.assertEqual(glob.glob(f"{DATABASE}/info/{NAME}.*"), [])
        self.assertFalse(self.has_schema())
        self.assertTrue(os.path.exists(os.path.expanduser("~/.cache/vantor/CurrentScene")))

    def check_sessions(self):
        """A session of a managed terminal has the client; one of another is left alone."""
        checks = re.findall(r"`((?:grep|test|head) [^`]*)`", section("What a terminal needs first"))
        self.assertEqual(len(checks), 4)
        self.run_lines("\n".join(checks))
        client = self.desktop.spawn(session_command())
        roomclient.wait_syslog("renewCurrentScene")
        self.desktop.wait("the tray icon", self.desktop.icon)
        self.assertEqual(stop(client), 0)
        write("/etc/zent/userinfo.json", b"{}")
        self.assertEqual(self.desktop.spawn(session_command()).wait(20), 0)
