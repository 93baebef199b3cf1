# SPDX-License-Identifier: Apache-2.0
"""Copies of the tree that each see themselves at the tree's own path, so that a build directory can be copied along."""
import os
import shutil
import signal
import subprocess
import threading
from pathlib import Path

TREE = Path(__file__).resolve().parents[2]
WORK = TREE / "build" / "mutate"
BUILD = WORK / "base"
COPIES = WORK / "copies"

# In a mount namespace of its own the copy covers the tree; the second user namespace gives the caller's number back.
# Everything in there ends with the command, and that with this program.
COVER = 'mount --bind "$0" "$1" && cd "$1" && shift && exec unshare --user "$@"'


class Stopped(Exception):
    """The run has been interrupted, or its time is up."""


class Commands:
    """Runs commands of several threads, until all are stopped."""

    def __init__(self):
        self._lock = threading.Lock()
        self._running = set()
        self.stopped = False

    def run(self, command, limit=None):
        """Status (None when the limit in seconds has passed) and output of the command."""
        with self._lock:
            if self.stopped:
                raise Stopped
            process = subprocess.Popen(["setpriv", "--pdeathsig", "KILL", *command], cwd=TREE, text=True,
                                       errors="replace", stdin=subprocess.DEVNULL, stdout=subprocess.PIPE,
                                       stderr=subprocess.STDOUT, start_new_session=True)
            self._running.add(process)
        try:
            output, _ = process.communicate(timeout=limit)
            status = process.returncode
        except subprocess.TimeoutExpired:
            self._kill(process)
            output, _ = process.communicate()
            status = None
        finally:
            with self._lock:
                self._running.discard(process)
        if self.stopped:
            raise Stopped
        return status, output

    def stop(self):
        """Kills what runs; every further run raises Stopped."""
        with self._lock:
            self.stopped = True
            for process in self._running:
                self._kill(process)

    @staticmethod
    def _kill(process):
        try:
            os.killpg(process.pid, signal.SIGKILL)
        except ProcessLookupError:
            pass


class Copy:
    """One copy of the tree with its build directory."""

    def __init__(self, number, commands):
        self.path = COPIES / str(number)
        self._commands = commands
        skipped = {TREE / ".git", TREE / "build"}
        shutil.copytree(TREE, self.path, symlinks=True,
                        ignore=lambda folder, names: [name for name in names if Path(folder) / name in skipped])
        shutil.copytree(BUILD, self._inside(BUILD), symlinks=True)

    def _inside(self, path):
        return self.path / path.relative_to(TREE)

    def run(self, command, limit=None):
        """Runs the command where the copy is the tree."""
        identity = [f"--map-user={os.getuid()}", f"--map-group={os.getgid()}"]
        return self._commands.run(["unshare", "--map-root-user", "--mount", "--pid", "--fork", "--kill-child",
                                   "--mount-proc", "sh", "-c", COVER, str(self.path), str(TREE), *identity, *command],
                                  limit)

    def write(self, name, content):
        """Replaces a file of the copy."""
        self._inside(TREE / name).write_text(content, encoding="utf-8")

    def build(self, targets):
        """Whether the targets could be built."""
        status, output = self.run(["ninja", "-C", str(BUILD), "-j", "1", *targets], 900)
        if status != 0 and "error:" not in output and "ninja: build stopped" not in output:
            raise RuntimeError(output)
        return status == 0

    def restore(self, name):
        """Puts the file, and all that was built since, back as it was."""
        shutil.copy2(TREE / name, self._inside(TREE / name))
        for folder, _, names in os.walk(self._inside(BUILD)):
            for entry in names:
                built = Path(folder) / entry
                original = TREE / built.relative_to(self.path)
                if not original.exists():
                    built.unlink()
                elif built.lstat().st_mtime_ns != original.lstat().st_mtime_ns and not built.is_symlink():
                    shutil.copy2(original, built)


def build_base(commands):
    """Configures and builds what the copies start from: without optimisation, debug information, or errors for
    warnings, which a fault may well cause."""
    for command in (["cmake", "-S", str(TREE), "-B", str(BUILD), "-G", "Ninja", "-DCMAKE_BUILD_TYPE=Debug",
                     "-DCMAKE_CXX_FLAGS_DEBUG=-g0 -w", "-DBUILD_TESTING=ON"],
                    ["cmake", "--build", str(BUILD)]):
        status, output = commands.run(command)
        if status != 0:
            raise RuntimeError(output)
