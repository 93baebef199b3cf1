# SPDX-License-Identifier: Apache-2.0
"""Runs the client through events and faults inside a room and says whether it grew or complained.

    soak.py CLIENT DIRECTORY [MINUTES] [--seed NUMBER]

CLIENT is the client with its driver, DIRECTORY takes what it logged, the samples and the faults. Prints a table; ends
with 1 when a criterion fails.
"""

import argparse
import collections
import csv
import os
import random
import re
import shutil
import statistics
import sys
import threading
import time

TREE = os.path.dirname(os.path.dirname(os.path.dirname(os.path.abspath(__file__))))
sys.path.insert(0, os.path.join(TREE, "sandbox"))

import roomclient  # noqa: E402
from desktop import Desktop, stop  # noqa: E402

from events import Events  # noqa: E402
from faults import FAULTS, NO_NOTIFICATIONS, Faults  # noqa: E402

SAMPLE_S = 1
MOST_GROWTH_KIB = 1024
LINE = re.compile(r"^[\w-]+\[\d+\]: (\d{4}-\d\d-\d\d \d\d:\d\d:\d\d)\.(\d{3}) (debug|info|warning|critical|fata) \[ ")
LEVELS_ABOVE_WARNING = ("critical", "fata")
# Lines of a message that has several.
CONTINUED = re.compile(r"^\s|^$")


class SoakDesktop(Desktop):
    """A desktop whose notification service comes and goes."""

    def __init__(self):
        super().__init__()
        self.parts = {}

    def notifications(self, wanted):
        """Starts the service, or ends it, be it stopped or not."""
        running = self.parts.pop("dunst", None)
        if running:
            running.kill()
            running.wait()
            self.processes.remove(running)
        if wanted:
            try:
                self.start_notifications()
            finally:
                self.parts["dunst"] = self.processes[-1]


# Memory in KiB: the proportional set size; that of the client's own pages; the resident pages of libraries and fonts,
# which others may share; what is in use of the heap.
Sample = collections.namedtuple("Sample", "seconds pss own library heap files sockets threads")


class Sampler(threading.Thread):
    """Samples of the client, as long as it lives."""

    def __init__(self, pid):
        super().__init__(daemon=True)
        self.root = f"/proc/{pid}"
        self.samples = []
        self.ending = threading.Event()
        self.start_time = time.monotonic()

    def run(self):
        while not self.ending.wait(SAMPLE_S):
            try:
                self.samples.append(self._sample())
            except OSError:
                return

    def _sample(self):
        rollup, status = (self._sizes(name) for name in ("smaps_rollup", "status"))
        with open(os.path.join(roomclient.ROOM, "heap"), encoding="ascii") as stream:
            heap = int(stream.read()) / 1024
        kinds = collections.Counter("socket" if self._is_socket(number) else "file"
                                    for number in os.listdir(f"{self.root}/fd"))
        return Sample(time.monotonic() - self.start_time, rollup["Pss"], rollup["Pss_Anon"] + rollup["Pss_Shmem"],
                      status["RssFile"], heap, kinds["file"], kinds["socket"], int(status["Threads"]))

    def _sizes(self, name):
        with open(f"{self.root}/{name}", encoding="utf-8") as stream:
            return {key: int(value) for key, value in re.findall(r"^(\w+):\s+(\d+)(?: kB)?$", stream.read(), re.M)}

    def _is_socket(self, number):
        try:
            return os.readlink(f"{self.root}/fd/{number}").startswith("socket:")
        except FileNotFoundError:
            return False

    def of_minute(self, column, minute, choose):
        """What the function chooses, the median or the least, of a column in a minute, which is counted from 1."""
        return choose(getattr(sample, column) for sample in self.samples
                      if (minute - 1) * 60 <= sample.seconds < minute * 60)


def read_log(path):
    """What the client wrote to standard error, as (time, level, text); what is no line of the log has the level "" ."""
    lines = []
    with open(path, encoding="utf-8", errors="replace") as stream:
        for line in stream:
            head = LINE.match(line)
            if head:
                moment = time.mktime(time.strptime(head.group(1), "%Y-%m-%d %H:%M:%S")) + int(head.group(2)) / 1000
                lines.append((moment, head.group(3), line.rstrip()))
            elif not CONTINUED.match(line) and lines:
                lines.append((lines[-1][0], "", line.rstrip()))
    return lines


class Soak:
    """One run."""

    def __init__(self, options):
        self.options = options
        self.requests = collections.Counter()

    def run(self):
        """The whole run; the client lives to its end or the run fails."""
        seed = self.options.seed
        with SoakDesktop() as desktop:
            desktop.start_window_manager()
            desktop.start_tray()
            desktop.notifications(True)
            desktop.start_portal("light")
            os.makedirs("/run/user/1000/gvfs/mtp:host=Foo_SER1")
            self.faults = Faults(seed, desktop.parts)
            self.events = Events(desktop, self.faults, random.Random(seed + 1))
            self.client = desktop.start_client(self.options.client)
            desktop.wait("the tray icon", desktop.icon, 15)
            self.sampler = Sampler(self.client.pid)
            desktop.click_icon(button=3)
            # Faults begin when the client has what it shows; a scene box that never comes could not be used.
            self.events.shown_panel()
            self.events.reader.control(role="combo box", timeout=30)
            self.sampler.start()
            # Everything once, so that what is made on first use is there when the second minute begins.
            for event in self.events.all:
                self.events.one(event)
            self.faults.warm_up()
            self.faults.start()
            self._go_on()
            self.faults.stop()
            self.sampler.ending.set()
            self.alive = self.client.poll() is None
            self.status = stop(self.client) if self.alive else self.client.returncode
        self._count_requests()

    def _go_on(self):
        end = self.sampler.start_time + self.options.minutes * 60
        counted = time.monotonic()
        while time.monotonic() < end and self.client.poll() is None and not self.faults.error:
            self.events.one()
            if time.monotonic() - counted > 20:
                counted = time.monotonic()
                self._count_requests()

    def _count_requests(self):
        for entry in roomclient.record():
            name = entry.get("path", "") if entry["kind"] == "http" else entry.get("method") or entry.get("name", "")
            self.requests[(entry["kind"], name)] += 1
        roomclient.clear_record()

    def criteria(self):
        """(criterion, measured, limit, kept) of each."""
        last = self.options.minutes
        of_minute = self.sampler.of_minute
        # Pages of files count whole. Their share of the proportional set size leaps by tens of megabytes whenever the
        # notification service, which has the same large font, is killed or started. Counted so the growth is never less
        # than what the client itself adds to its proportional set size.
        growth = sum(of_minute(column, last, statistics.median) - of_minute(column, 2, statistics.median)
                     for column in ("own", "library"))
        # Qt's HTTP thread, which has a file of its own, comes and goes with the connections: a minute may be without it.
        half = (last + 1) // 2
        files, sockets = ([min(of_minute(kind, minute, min) for minute in part)
                           for part in (range(2, half + 1), range(half + 1, last + 1))] for kind in ("files", "sockets"))
        log = read_log(os.path.join(roomclient.ROOM, "client.err"))
        above = [text for _, level, text in log if level in LEVELS_ABOVE_WARNING]
        warnings = [(moment, text) for moment, level, text in log if level in ("warning", "")]
        self.unexplained = above + [text for moment, text in warnings if not self.faults.explain(moment, text)]
        never = [event.__name__ for event in self.events.all if not self.events.done[event.__name__]]
        return [
            ("client alive, ends with 0 when told to", f"{'yes' if self.alive else 'no'}, {self.status}", "yes, 0",
             self.alive and self.status == 0),
            ("memory (Pss with file pages counted whole), growth from minute 2 to the last", f"{growth:+.0f} KiB",
             f"below {MOST_GROWTH_KIB} KiB", growth < MOST_GROWTH_KIB),
            ("open files, fewest in the first half after minute 1 and in the second", f"{files[0]}, {files[1]}", "no growth",
             files[1] <= files[0]),
            ("open sockets, the same", f"{sockets[0]}, {sockets[1]}", "no growth",
             sockets[1] <= sockets[0]),
            ("log lines above warning", str(len(above)), "0", not above),
            ("warnings that no fault explains", f"{len(self.unexplained) - len(above)} of {len(warnings)}", "0",
             len(self.unexplained) == len(above)),
            ("kinds of events that never came to their end", ", ".join(never) or "0", "0", not never),
        ]

    def report(self):
        """Prints the tables; whether all criteria are kept."""
        criteria = self.criteria()
        print("\n| criterion | measured | limit | |\n|---|---|---|---|")
        for name, measured, limit, kept in criteria:
            print(f"| {name} | {measured} | {limit} | {'kept' if kept else '**failed**'} |")
        median = statistics.median
        columns = [("Pss KiB, median", "pss", median), ("own pages KiB, median", "own", median),
                   ("file pages KiB, median", "library", median), ("heap in use KiB, least", "heap", min),
                   ("open files, fewest", "files", min),
                   ("open sockets, fewest", "sockets", min), ("threads, median", "threads", median)]
        print("\n| minute | " + " | ".join(title for title, *_ in columns) + " |\n" + "|---" * (len(columns) + 1) + "|")
        for minute in range(1, self.options.minutes + 1):
            values = (self.sampler.of_minute(column, minute, choose) for _, column, choose in columns)
            print(f"| {minute} | " + " | ".join(f"{value:.0f}" for value in values) + " |")
        kinds = {fault.name for fault in (*FAULTS, NO_NOTIFICATIONS)}
        held = len({fault.name for fault, _, _ in self.faults.history})
        print(f"\n{len(self.faults.history)} faults, {held} of {len(kinds)} kinds; seed {self.options.seed}\n")
        print("| event | done | cut short by a fault |\n|---|---|---|")
        for event in self.events.all:
            print(f"| {event.__doc__.rstrip('.')} | {self.events.done[event.__name__]} "
                  f"| {self.events.missed[event.__name__]} |")
        print("\n| kind | what the platform was asked | times |\n|---|---|---|")
        for (kind, name), count in sorted(self.requests.items()):
            print(f"| {kind} | {name} | {count} |")
        for text in self.unexplained[:20]:
            print("unexplained:", text)
        return all(kept for *_, kept in criteria)

    def save(self):
        """Leaves what was seen in the directory."""
        directory = self.options.directory
        shutil.copy(os.path.join(roomclient.ROOM, "client.err"), os.path.join(directory, "client.log"))
        with open(os.path.join(directory, "samples.csv"), "w", encoding="ascii", newline="") as stream:
            csv.writer(stream).writerows([Sample._fields, *self.sampler.samples])
        with open(os.path.join(directory, "faults.csv"), "w", encoding="utf-8", newline="") as stream:
            csv.writer(stream).writerows((fault.name, start, end) for fault, start, end in self.faults.history)


def main():
    parser = argparse.ArgumentParser()
    parser.add_argument("client")
    parser.add_argument("directory")
    parser.add_argument("minutes", type=int, nargs="?", default=10)
    parser.add_argument("--seed", type=int, default=random.SystemRandom().randrange(1_000_000))
    options = parser.parse_args()
    if options.minutes < 3:
        parser.error("nothing to compare in less than 3 minutes")
    print(f"seed {options.seed}", flush=True)
    soak = Soak(options)
    soak.run()
    soak.save()
    return 0 if soak.report() else 1


if __name__ == "__main__":
    sys.exit(main())
