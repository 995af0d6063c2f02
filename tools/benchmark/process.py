"""What the kernel tells of a running process: its time, its wake-ups, its memory, its calls."""

import os
import re
import signal
import subprocess
import time

TICKS_PER_SECOND = os.sysconf("SC_CLK_TCK")


def descendants(pid):
    """All processes below `pid`; one that ends meanwhile is left out."""
    found = []
    try:
        with open(f"/proc/{pid}/task/{pid}/children") as children:
            for child in children.read().split():
                found += [int(child), *descendants(int(child))]
    except OSError:
        pass
    return found


def name_of(pid):
    try:
        with open(f"/proc/{pid}/comm") as name:
            return name.read().strip()
    except OSError:
        return ""


def is_alive(pid):
    return name_of(pid) != ""


def environment(pid):
    with open(f"/proc/{pid}/environ", "rb") as variables:
        pairs = (entry.partition(b"=") for entry in variables.read().split(b"\0") if entry)
        return {name.decode(): value.decode() for name, _, value in pairs}


def cpu_seconds(pid):
    """Of the process alone, to the nanosecond."""
    with open(f"/proc/{pid}/schedstat") as statistics:
        return int(statistics.read().split()[0]) / 1e9


def cpu_seconds_with_commands(pid):
    """Of the process, and to the kernel's tick of the commands that it has waited for."""
    with open(f"/proc/{pid}/stat") as statistics:
        fields = statistics.read().rpartition(")")[2].split()
    return cpu_seconds(pid) + sum(map(int, fields[13:15])) / TICKS_PER_SECOND


def wake_ups(pid):
    with open(f"/proc/{pid}/status") as status:
        return int(re.search(r"^voluntary_ctxt_switches:\s*(\d+)", status.read(), re.M)[1])


def memory(pid):
    """Resident, proportional and private memory in KiB."""
    with open(f"/proc/{pid}/smaps_rollup") as rollup:
        sizes = {name: int(size) for name, size in re.findall(r"^(\w+):\s+(\d+) kB", rollup.read(), re.M)}
    return sizes["Rss"], sizes["Pss"], sizes["Private_Clean"] + sizes["Private_Dirty"]


def calls_per_poll(pid, seconds):
    """System calls from one poll to the next, on average over `seconds`."""
    strace = subprocess.Popen(["strace", "-qq", "-o", "/dev/stdout", "-p", str(pid)],
                              stdout=subprocess.PIPE, text=True)
    time.sleep(seconds)
    strace.send_signal(signal.SIGINT)
    calls = re.findall(r"^(\w+)\(", strace.communicate()[0], re.M)
    polls = [number for number, call in enumerate(calls) if call == "poll"]
    if len(polls) < 2:
        raise RuntimeError("strace saw no turn of the program; is it allowed to attach?")
    return (polls[-1] - polls[0]) / (len(polls) - 1)
