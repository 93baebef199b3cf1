# SPDX-License-Identifier: Apache-2.0
"""Runs every measurement and writes the tables: run.py DIRECTORY-OF-PROGRAMS DOCUMENT [BEFORE]

BEFORE is a zentw-info of an earlier commit, whose figures stand beside.
"""

import datetime
import json
import os
import platform
import re
import statistics
import subprocess
import sys

TREE = os.path.dirname(os.path.dirname(os.path.abspath(__file__)))
ENTER = os.path.join(TREE, "sandbox", "enter")
DESKTOP = os.path.join(TREE, "bench", "trayprograms.py")
CLIENT = "zentw-info"
STARTS = 21
IDLE_SECONDS = 60
# What the client's timers may do in a minute after the start: one policy run, and up to one poll of messages. A poll is
# a request, its answer and the time of the next. What these make other threads do counts too.
TIMER_SWITCHES = 40
TIMER_CPU_MS = 15
REQUEST_RUNS = 11
REQUESTS = 500
LUNAR_RUNS = 11
SCALE_RUNS = 11
SCALES = (("scenes", "scene list, entries", (1, 1_000, 100_000)),
          ("message", "message body, bytes", (10_000, 1_000_000, 10_000_000)),
          ("connections", "active connections", (1, 50, 5_000)))
CERTIFICATES = ("/etc/zent/clientapi_ca.crt", "/etc/zent/QEL_Zent.pem", "/etc/zent/.QEL_Zent.key")
URL = "https://server.zent.test/uim/v3/client/uim_department/id?id=1"


def output(*command):
    return subprocess.run(command, check=True, stdout=subprocess.PIPE, text=True).stdout


def room(*command):
    return output(ENTER, "--platform", *command)


def numbers(text):
    return [float(word) for word in text.split()]


def medians(rows):
    """The median of each column."""
    return [statistics.median(column) for column in zip(*rows)]


def machine():
    with open("/proc/cpuinfo", encoding="utf-8") as stream:
        model = re.search(r"model name\s*: (.*)", stream.read())
    with open("/proc/meminfo", encoding="utf-8") as stream:
        memory = int(re.search(r"MemTotal:\s+(\d+)", stream.read())[1]) / 1024 / 1024
    with open("/etc/os-release", encoding="utf-8") as stream:
        system = re.search(r'PRETTY_NAME="(.*)"', stream.read())[1]
    return f"{os.cpu_count()} cores ({model[1] if model else platform.machine()}), {memory:.0f} GiB, {system}"


def programs(directory):
    return {CLIENT: os.path.join(directory, "zentw-info"), "limit": os.path.join(directory, "mintray"),
            "nm-tray": "/usr/bin/nm-tray"}


def desktop_room(what, amount, chosen):
    """What trayprograms.py measures of the programs, by name."""
    return json.loads(room("/usr/bin/python3", "-B", DESKTOP, what, str(amount),
                           *(f"{name}={path}" for name, path in chosen.items())))


def memory_of_all(what, seconds, chosen, before):
    """Figures by name; the earlier client has a room of its own, since a session runs one."""
    figures = desktop_room(what, seconds, chosen)
    if before:
        figures["before"] = desktop_room(what, 0, dict({"before": before}, **rest_of(chosen)))["before"]
    return figures


def rest_of(chosen):
    return {name: path for name, path in chosen.items() if name != CLIENT}


def verdict(good):
    return "met" if good else "**missed**"


def measure_start(chosen, before):
    times = desktop_room("start", STARTS, dict(chosen, **({"before": before} if before else {})))
    middle = {name: medians(values) for name, values in times.items() if values}
    ratio, work_ratio = (middle[CLIENT][column] / middle["limit"][column] for column in (0, 1))
    yield f"## Start to tray icon, milliseconds ({STARTS} starts each, in turns)\n"
    yield "| program | median | fastest | slowest | processor time, median |\n|---|---|---|---|---|"
    for name, values in times.items():
        if values:
            passed = [value for value, _ in values]
            yield (f"| {name} | {middle[name][0]:.1f} | {min(passed):.1f} | {max(passed):.1f} "
                   f"| {middle[name][1]:.1f} |")
        else:
            yield f"| {name} | no icon without its service | | | |"
    yield (f"\nThe client takes {ratio:.2f} times the limit, in processor time {work_ratio:.2f} times; at most 1.5: "
           f"{verdict(max(ratio, work_ratio) <= 1.5)}.\n")


def memory_table(figures):
    yield "| program | proportional | private | of it written | resident | libraries |\n|---|---|---|---|---|---|"
    for name, row in figures.items():
        yield (f"| {name} | {row['pss']} | {row['private']} | {row['dirty']} | {row['rss']} | {row['libraries']} |")


def measure_idle(chosen, before):
    figures = memory_of_all("idle", IDLE_SECONDS, chosen, before)
    client, limit = figures[CLIENT], figures["limit"]
    yield "## Memory 20 s after the server has answered, KiB\n"
    yield from memory_table(figures)
    ratio = client["dirty"] / limit["dirty"]
    yield (f"\nProportional set size below nm-tray's: {verdict(client['pss'] < figures['nm-tray']['pss'])}. Written pages "
           f"{ratio:.2f} times the limit's; at most 1.8: {verdict(ratio <= 1.8)}.\n")
    yield f"## {IDLE_SECONDS} idle seconds after that\n"
    yield "| program | context switches | processor time, ms |\n|---|---|---|"
    for name in chosen:
        row = figures[name]
        yield f"| {name} | {row['switches']} | {row['cpu_ms']:.1f} |"
    good = client["switches"] <= limit["switches"] + TIMER_SWITCHES and \
        client["cpu_ms"] <= limit["cpu_ms"] + TIMER_CPU_MS
    yield (f"\nThe client's timers run the policy once and ask for messages at most once in this time; allowed for that: "
           f"{TIMER_SWITCHES} switches and {TIMER_CPU_MS} ms more than the limit: {verdict(good)}.\n")


def measure_beside(chosen, before):
    yield "## Memory with another Qt program and a TLS program beside, KiB\n"
    yield from memory_table(memory_of_all("beside", 0, chosen, before))
    yield ""


def measure_lunar(directory):
    client, icu = medians(numbers(output(os.path.join(directory, "lunarbench"))) for _ in range(LUNAR_RUNS))
    yield f"## Lunar date of every day from 1901 to 2099, nanoseconds per day (median of {LUNAR_RUNS} runs)\n"
    yield "| `GetLunarDay`, six texts | ICU's Chinese calendar, numbers only |\n|---|---|"
    yield f"| {client:.0f} | {icu:.0f} |"
    yield f"\n{icu / client:.0f} times as fast; at least 50: {verdict(icu / client >= 50)}.\n"


def measure_requests(directory):
    program = os.path.join(directory, "requestbench")
    rows = [numbers(room(program, URL, *CERTIFICATES, str(REQUESTS))) for _ in range(REQUEST_RUNS)]
    first, later = medians(rows)
    yield (f"## A management request over TLS with the client certificate, microseconds (median of {REQUEST_RUNS} runs of "
           f"{REQUESTS} requests)\n")
    yield f"The first: {first:.0f}. Later ones on the kept connection: {later:.0f}.\n"


def measure_scales(directory):
    program = os.path.join(directory, "scalebench")
    yield f"## Large replies (median of {SCALE_RUNS} runs)\n"
    yield "| reply | size | µs | µs per unit | peak memory, KiB |\n|---|---|---|---|---|"
    grows = []
    for kind, title, sizes in SCALES:
        per_unit = []
        for size in sizes:
            micros, kib = medians(numbers(output(program, kind, str(size))) for _ in range(SCALE_RUNS))
            per_unit.append(micros / size)
            yield f"| {title} | {size:,} | {micros:,.0f} | {micros / size:.4f} | {kib:,.0f} |"
        # The smallest size is all fixed costs.
        grows.append(per_unit[-1] / per_unit[-2])
    yield (f"\nTime per unit from the middle to the largest size: {', '.join(f'{g:.2f}' for g in grows)} times; linear up to "
           f"1.5: {verdict(max(grows) <= 1.5)}.\n")


def main():
    directory, document = os.path.abspath(sys.argv[1]), sys.argv[2]
    before = sys.argv[3] if len(sys.argv) > 3 else None
    chosen = programs(directory)
    notes = os.path.join(TREE, "bench", "notes.md")
    lines = ["# Performance\n", "Written by `scripts/bench` from one run; each figure stands beside its limit or peer.\n",
             f"Measured on {datetime.date.today()}: {machine()}. The limit is `bench/mintray.cpp`, one icon and no window.\n"]
    for part in (measure_start(chosen, before), measure_idle(chosen, before), measure_beside(chosen, before),
                 measure_lunar(directory), measure_requests(directory), measure_scales(directory)):
        for line in part:
            print(line, flush=True)
            lines.append(line)
    with open(notes, encoding="utf-8") as stream:
        lines.append(stream.read().rstrip())
    with open(document, "w", encoding="utf-8") as stream:
        stream.write("\n".join(lines) + "\n")


if __name__ == "__main__":
    main()
