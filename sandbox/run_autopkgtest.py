#!/usr/bin/python3
# SPDX-License-Identifier: Apache-2.0
"""Runs the package's own tests on the package that was built, in a room: nothing of the machine is a test bed.

Run outside, this file runs itself in a room in which dpkg may write. What the tests depend on is looked for there, not
installed: scripts/setup does that.
"""

import os
import subprocess
import sys

from packageroom import DATABASE, INSIDE, NAME, TREE, built_package, dpkg, room_command, take_database, this_test

if not INSIDE:
    command = room_command(built_package(), this_test())
    os.execv(command[0], command)

# Where it cannot write to dpkg's database, autopkgtest asks dpkg for the dependencies and leaves apt alone.
TEST = f"""mount --bind {DATABASE} {DATABASE}
mount -o remount,bind,ro {DATABASE}
exec autopkgtest --no-built-binaries {TREE}/build/package/{NAME}_*.dsc -- null
"""
SU = """#!/bin/sh
[ "$1 $2 $3 $4" = "-s /bin/bash root -c" ] && exec /bin/bash -c "$5"
"""


def main():
    take_database()
    dpkg("-i", os.environ["PACKAGE"])
    # A test bed is no managed terminal, and has no stand-ins.
    os.remove("/etc/zent/userinfo.json")
    for name in os.listdir("/run/room/bin"):
        os.remove(f"/run/room/bin/{name}")
    # autopkgtest changes to root, who the user is already; a namespace with a single user lets nobody change.
    with open("/run/room/bin/su", "w", encoding="ascii") as su:
        su.write(SU)
    os.chmod("/run/room/bin/su", 0o755)
    return subprocess.run(["unshare", "-rm", "sh", "-ec", TEST], check=False).returncode


sys.exit(main())
