#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""The commands of docs/rollout.md, word by word: a signed archive, a terminal that installs from it, and the way back.

Run outside, this file runs itself in a room that dpkg and apt may write to.
"""

import os
import re
import shutil
import subprocess
import sys
import unittest

sys.path.insert(0, os.path.join(os.path.dirname(os.path.abspath(__file__)), "../../sandbox"))

from packageroom import INSIDE, NAME, TREE, built_package, room_command, take_database, this_test  # noqa: E402

APT = ("/srv", "/etc/apt", "/etc/apt/keyrings", "/etc/apt/sources.list.d")
if not INSIDE:
    command = room_command(built_package(), this_test(), [path for path in APT if os.path.isdir(path)])
    os.execv(command[0], command)

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


def section(heading):
    with open(f"{TREE}/docs/rollout.md", encoding="utf-8") as document:
        return document.read().split(f"\n## {heading}\n")[1].split("\n## ")[0]


def commands(heading, paragraph=0):
    """The lines of one block of commands below a heading of the document."""
    block = re.findall(r"(?:^    .*\n)+", section(heading), re.MULTILINE)[paragraph]
    return [line[4:] for line in block.splitlines()]


def run(lines, place=WORK):
    """Runs commands as the root of a user namespace; returns status and output."""
    result = subprocess.run(["unshare", "-r", "bash", "-euc", "\n".join(lines)], cwd=place, check=False, text=True,
                            stdout=subprocess.PIPE, stderr=subprocess.STDOUT)
    return result.returncode, result.stdout


class Rollout(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        take_database()
        for directory in ("lists/partial", "cache/archives/partial", "gnupg"):
            os.makedirs(f"{WORK}/{directory}", mode=0o700)
        with open(f"{WORK}/apt.conf", "w", encoding="ascii") as file:
            file.write(CONFIGURATION)
        os.environ.update(APT_CONFIG=f"{WORK}/apt.conf", GNUPGHOME=f"{WORK}/gnupg", DEBIAN_FRONTEND="noninteractive",
                          LC_ALL="C.UTF-8")
        shutil.copy(os.environ["PACKAGE"], WORK)

    def done(self, lines, place=WORK):
        status, output = run(lines, place)
        self.assertEqual(status, 0, output)
        return output

    def installed(self):
        return self.done([f"dpkg-query -W -f '${{Version}}' {NAME}"])

    def publish_next(self, again):
        """The package once more, with a later version, in the archive."""
        self.done([f"dpkg-deb -R {os.environ['PACKAGE']} next", "sed -i 's/^Version: .*/&+next/' next/DEBIAN/control",
                   f"dpkg-deb --root-owner-group -b next /srv/zent/pool/{NAME}_next.deb"])
        self.done(again, "/srv/zent")

    def test_a_managed_terminal_has_what_it_needs(self):
        checks = re.findall(r"`((?:grep|test|head) [^`]*)`", section("What a terminal needs first"))
        self.assertEqual(len(checks), 4)
        for check in checks:
            with self.subTest(check=check):
                self.assertEqual(subprocess.run(check, shell=True, check=False, stdout=subprocess.DEVNULL).returncode, 0)

    def test_archive_installation_and_way_back(self):
        archive = commands("A signed package archive")
        self.done(archive)
        shutil.copy("/srv/zent/zent-archive.gpg", WORK)
        self.done([line.replace("https://archive.example/zent", "file:/srv/zent")
                   for line in commands("A signed package archive", 1)])
        version = self.installed()
        self.assertIn("/zh_CN/", self.done([f"man -L zh_CN -w {NAME}"]))

        self.publish_next(archive[-3:])
        self.done(["apt-get update", f"apt-get install -y {NAME}"])
        self.assertEqual(self.installed(), version + "+next")
        self.done([line.replace("=0.1.0", "=" + version) for line in commands("Going back a version")])
        self.assertEqual(self.installed(), version)
        self.assertNotIn(f"Inst {NAME}", self.done(["apt-get -s upgrade"]))

        # What nobody has signed is not taken.
        self.done(["echo >> Packages"], "/srv/zent")
        self.assertNotEqual(run(["rm -r lists; mkdir -p lists/partial; apt-get update"])[0], 0)


if __name__ == "__main__":
    unittest.main()
