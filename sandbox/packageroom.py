# SPDX-License-Identifier: Apache-2.0
"""What the tests of the built package share: a room that dpkg and apt may write to.

    packageroom.py [--control-group] TEST...     runs modules of tests/package in such a room

In the room the user is root of a namespace of his own (unshare -r) and installs with the machine's dpkg: dependencies
and triggers are those of real packages. With --control-group the room has a control group of its own, below one that
this user may divide: systemd gives such a one to every session, and .ci/run to the tests.
"""

import contextlib
import glob
import os
import shutil
import subprocess
import sys

TREE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
NAME = "zentw-info"
DATABASE = "/var/lib/dpkg"
APT = ("/srv", "/etc/apt", "/etc/apt/keyrings", "/etc/apt/sources.list.d")
INSIDE = "ROOM" in os.environ


def built_package():
    (package,) = glob.glob(f"{TREE}/build/package/{NAME}_*.deb")
    return package


def room_command(package, command):
    """The command that runs another one in a room in which this package can be installed."""
    listing = subprocess.run(["dpkg-deb", "--contents", package], capture_output=True, text=True, check=True).stdout
    shipped = [line.split(maxsplit=5)[5][1:].rstrip("/") for line in listing.splitlines() if line.startswith("d")]
    shared = [path for path in shipped if path not in ("", "/usr") and os.path.isdir(path)]
    system = [DATABASE, f"{DATABASE}/info", f"{DATABASE}/triggers", f"{DATABASE}/updates",
              *filter(os.path.isdir, APT)]
    result = [f"{TREE}/sandbox/enter", "--platform", "--env", f"CLIENT=/usr/bin/{NAME}",
              "--env", f"PACKAGE={package}", "--env", "WRITABLE=" + ":".join(shared),
              "--env", f"PYTHONPATH={TREE}/sandbox:{TREE}/tests/package"]
    for path in [*shared, *system]:
        result += ["--writable", path]
    return [*result, *command]


def this_test(*arguments):
    """The command that runs the calling test program again, inside."""
    return ["/usr/bin/python3", "-B", os.path.abspath(sys.argv[0]), *sys.argv[1:], *arguments]


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


def new_control_group():
    """A control group below this process's own, or None where that is not this user's to divide."""
    with open("/proc/self/mounts", encoding="ascii") as mounts:
        roots = [line.split()[1] for line in mounts if line.split()[2] == "cgroup2"]
    with open("/proc/self/cgroup", encoding="ascii") as groups:
        own = next((line.strip()[3:] for line in groups if line.startswith("0::")), "")
    if not roots or not os.access(roots[0] + own + "/cgroup.procs", os.W_OK):
        return None
    path = f"{roots[0]}{own}/{NAME}-{os.getpid()}"
    os.mkdir(path)
    return path


def run_in_control_group(command):
    """Runs a command in a control group of its own; returns its exit status."""
    group = new_control_group()
    if not group:
        print("skipped: no control group of this user's own")
        return 0

    def move_there():
        with open(f"{group}/cgroup.procs", "w", encoding="ascii") as processes:
            processes.write("0")
    try:
        return subprocess.run(command, preexec_fn=move_there, check=False).returncode
    finally:
        for path, _, _ in os.walk(group, topdown=False):
            os.rmdir(path)


def main(arguments):
    grouped = arguments[:1] == ["--control-group"]
    tests = ["/usr/bin/python3", "-B", "-m", "unittest", "-v", *arguments[grouped:]]
    command = room_command(built_package(), tests)
    return run_in_control_group(command) if grouped else subprocess.run(command, check=False).returncode


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
