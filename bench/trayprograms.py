# SPDX-License-Identifier: Apache-2.0
"""Measures tray programs in a room with the simulated platform, and prints the figures as JSON.

    trayprograms.py start RUNS NAME=PROGRAM...      milliseconds from the start of a program to its icon's request, and
                                                    of processor time until then
    trayprograms.py idle SECONDS NAME=PROGRAM...    memory after 20 s, then the switches and processor time of idle seconds
    trayprograms.py beside SECONDS NAME=PROGRAM...  the same with a TLS program and another nm-tray beside
"""

import glob
import json
import os
import re
import sys
import time

HERE = os.path.dirname(os.path.abspath(__file__))
sys.path.insert(0, os.path.join(HERE, "..", "sandbox"))

import roomclient  # noqa: E402
from desktop import Desktop, end  # noqa: E402
from trayprobe import TrayProbe  # noqa: E402

SETTLING_S = 20
# A run of the real one costs about as much; the room's stand-in is a Python program.
QUICK_ID = "#!/bin/sh\necho 'uid=1000(zhangsan) gid=1000(zhangsan) groups=1000(zhangsan),27(sudo),2001(zent-users)'\n"


def quicken_id():
    path = os.path.join(roomclient.ROOM, "bin", "id")
    os.remove(path)
    with open(path, "w", encoding="utf-8") as stream:
        stream.write(QUICK_ID)
    os.chmod(path, 0o755)


def measure_start(desktop, probe, runs, programs):
    """Lists by name of milliseconds that passed and that the processor worked; the programs take turns, so that what else
    the machine does meets all of them."""
    times = {name: [] for name in programs}
    for run in range(runs + 1):
        for name, program in programs.items():
            begin = time.perf_counter()
            process = desktop.spawn([program])
            moment = probe.wait_icon(20)
            work = sum(milliseconds for _, milliseconds in work_of(process.pid).values())
            end(process)
            # The first round fills the caches.
            if run > 0 and moment is not None:
                times[name].append(((moment - begin) * 1000, work))
    return times


def memory_of(pid):
    """Proportional and private size in KiB."""
    with open(f"/proc/{pid}/smaps_rollup", encoding="ascii") as stream:
        sizes = {name: int(size) for name, size in re.findall(r"^(\w+):\s+(\d+) kB", stream.read(), re.M)}
    with open(f"/proc/{pid}/maps", encoding="utf-8") as stream:
        libraries = set(re.findall(r" r-xp .* (/\S+\.so[.\d]*)$", stream.read(), re.M))
    return {"pss": sizes["Pss"], "private": sizes["Private_Clean"] + sizes["Private_Dirty"],
            "dirty": sizes["Private_Dirty"], "rss": sizes["Rss"], "libraries": len(libraries)}


def work_of(pid):
    """Context switches so far, and processor time in milliseconds, of each thread."""
    work = {}
    for task in glob.glob(f"/proc/{pid}/task/*"):
        with open(task + "/status", encoding="utf-8") as stream:
            switches = sum(int(number) for number in re.findall(r"ctxt_switches:\s+(\d+)", stream.read()))
        with open(task + "/schedstat", encoding="ascii") as stream:
            work[task] = (switches, int(stream.read().split()[0]) / 1e6)
    return work


def work_between(before, after):
    """What the threads did that live at the end; what one did that has ended meanwhile is not known."""
    pairs = [(work, before.get(task, (0, 0))) for task, work in after.items()]
    return {"switches": sum(now[0] - then[0] for now, then in pairs),
            "cpu_ms": sum(now[1] - then[1] for now, then in pairs)}


def wait_answered():
    """Until the server has answered everything that the client asks for at its start."""
    roomclient.wait_record(lambda entry: entry.get("path") == "/api/client/area/scenes", 30)


def measure_beside(desktop, probe, seconds, programs):
    """On a desktop other programs have the same libraries loaded, so that their pages count as shared."""
    desktop.spawn(["openssl", "s_client", "-quiet", "-connect", "server.zent.test:443"])
    desktop.spawn([programs["nm-tray"]])
    probe.wait_icon(20)
    return measure_idle(desktop, probe, seconds, programs)


def measure_idle(desktop, probe, seconds, programs):
    # Pages of a program that was built just now would count as written until they are on the disk.
    os.sync()
    processes = {}
    for name, program in programs.items():
        processes[name] = desktop.spawn([program])
        probe.wait_icon(20)
    wait_answered()
    time.sleep(SETTLING_S)
    figures = {name: memory_of(process.pid) for name, process in processes.items()}
    before = {name: work_of(process.pid) for name, process in processes.items()}
    time.sleep(seconds)
    for name, process in processes.items():
        figures[name].update(work_between(before[name], work_of(process.pid)))
        end(process)
    return figures


def main():
    kind, amount = sys.argv[1], int(sys.argv[2])
    programs = dict(argument.split("=", 1) for argument in sys.argv[3:])
    quicken_id()
    with Desktop() as desktop:
        desktop.start_window_manager()
        probe = TrayProbe(desktop.env["DISPLAY"])
        measure = {"start": measure_start, "idle": measure_idle, "beside": measure_beside}[kind]
        print(json.dumps(measure(desktop, probe, amount, programs)))
        probe.close()


if __name__ == "__main__":
    main()
