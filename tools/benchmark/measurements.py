"""The measurements, each a function from the program to samples by the names in the table of figures.

What is measured on several panels at once is chosen so that the panels do not slow each other
down: a panel at rest needs a thousandth of a processor.
"""

import contextlib
import os
import signal
import sys
import tempfile
import time
from collections import defaultdict

import appliance
import process
from panel import OwnLine, Panel

FIRST_PAGE = "cabinetDevice"  # the second row of the first page that a start shows
PANELS_AT_ONCE = 10
IDLE_TIME = 20  # seconds
TRACED_TIME = 7  # seconds under strace, which slows the program down
FAULT_TIME = 5  # seconds
SIGNALS_PER_SECOND = 2000

IDLE = f'expect "Kestrova (TM)" "{FIRST_PAGE}"\ntap up\ntap down\nexpect "Kestrova (TM)" "{FIRST_PAGE}"'
# Keys that draw without running a command: markers of a list, octets of an address.
TO_THE_PORT_S_PAGE = f'expect "Kestrova (TM)" "{FIRST_PAGE}"\ntap down until "E0 (eth0)"\n'
KEYS = TO_THE_PORT_S_PAGE + "tap enter\ntap enter\n" + "tap down\ntap up\n" * 12 + "tap enter\n" + "tap up 26\n"
KEYS_MEASURED = 50

# A program that does nothing but ask for a key, on the line that is its argument: what it needs to
# answer a key with a byte is what the pseudo-terminal and the machine need.
BARE = """\
import os, select, sys, time
line = os.open(sys.argv[1], os.O_RDWR | os.O_NOCTTY)
while True:
    os.write(line, bytes.fromhex("fe00fe06"))
    if select.select([line], [], [], 0.5)[0] and os.read(line, 30):
        os.write(line, b"x")
    time.sleep(0.1)
"""


@contextlib.contextmanager
def appliance_with(program, **size):
    with tempfile.TemporaryDirectory() as scratch:
        yield appliance.make(f"{scratch}/appliance", "box/appliance", program, **size)


def several_panels(stack, folder, steps, command=None):
    return [stack.enter_context(Panel(folder, steps, command)) for _ in range(PANELS_AT_ONCE)]


def idle(program):
    samples = defaultdict(list)
    with appliance_with(program) as folder, contextlib.ExitStack() as stack:
        panels = several_panels(stack, folder, IDLE)
        for panel in panels:
            panel.trace_when_played()
        begin = time.monotonic()
        before = [(process.cpu_seconds(panel.pid), process.wake_ups(panel.pid)) for panel in panels]
        time.sleep(IDLE_TIME)
        for panel, (cpu, wake_ups) in zip(panels, before):
            turns = panel.trace().requests_since(begin)
            if not turns:
                raise RuntimeError("the idle program asked for no key")
            samples["idle wake-ups"].append((process.wake_ups(panel.pid) - wake_ups) / turns)
            samples["idle CPU"].append((process.cpu_seconds(panel.pid) - cpu) / turns * 1e6)
            samples["idle bytes"].append(len(panel.trace().sent_since(begin)) / turns)
            for kind, size in zip(("resident", "proportional", "private"), process.memory(panel.pid)):
                samples[f"{kind} memory"].append(size)
        # From outside, where the program is found whatever the box shows of the checkout.
        samples["idle calls"] += [process.calls_per_poll(panel.pid, TRACED_TIME) for panel in panels[:3]]
    return samples


def keys(program):
    """Beside panels with the program as many with one that only answers, so that both meet the same
    machine."""
    samples = defaultdict(list)
    bare = [sys.executable, "-ISc", BARE, "{tty}"]
    with appliance_with(program) as folder, contextlib.ExitStack() as stack:
        panels = several_panels(stack, folder, KEYS)
        bare_panels = several_panels(stack, None, f"tap up {KEYS_MEASURED}", bare)
        for panel in panels:
            for drawn in panel.trace_when_played().redraws()[-KEYS_MEASURED:]:
                samples["key to first byte"].append(drawn.to_first_byte * 1e3)
                samples["key to redraw"].append(drawn.to_last_byte * 1e3)
                samples["key to redraw, floor"].append(drawn.floor * 1e3)
        for panel in bare_panels:
            samples["key to first byte, floor"] += [
                drawn.to_first_byte * 1e3 for drawn in panel.trace_when_played().redraws()]
    return samples


def start(program):
    samples = defaultdict(list)
    with appliance_with(program) as folder, Panel(folder) as panel:
        shown = panel.time_of(FIRST_PAGE)
        started = panel.start_time()
        samples["start to first byte"].append((panel.trace().arrived[0] - started) * 1e3)
        samples["start to first page"].append((shown - started) * 1e3)
    return samples


def growth(program, name, turns, **size):
    """Start, entering a port, a page change and a refresh on an appliance that was grown."""
    samples = defaultdict(list)
    steps = TO_THE_PORT_S_PAGE + "tap enter\ntap escape\n" * turns + f"tap down {turns}"
    with appliance_with(program, **size) as folder, Panel(folder, steps) as panel:
        started = panel.start_time()
        samples[f"start, {name}"].append((panel.time_of(FIRST_PAGE) - started) * 1e3)
        redraws = panel.trace_when_played().redraws()
        samples[f"port, {name}"] += [drawn.to_first_byte * 1e3 for drawn in redraws[-3 * turns:-turns:2]]
        samples[f"page, {name}"] += [drawn.to_first_byte * 1e3 for drawn in redraws[-turns:]]
        for _ in range(turns - 1):
            asked = time.monotonic()
            os.kill(panel.pid, signal.SIGUSR1)
            samples[f"refresh, {name}"].append(panel.redraw_since(asked).to_first_byte * 1e3)
    return samples


def under_fault(samples, name, running, fault, is_at_work):
    """What a fault costs while `fault` goes on, and whether the program is at work afterwards; one
    that has ended costs nothing that could be told."""
    try:
        begin = time.monotonic()
        cpu = process.cpu_seconds_with_commands(running.pid)
        resident = process.memory(running.pid)[0]
        fault(begin + FAULT_TIME)
        share = (process.cpu_seconds_with_commands(running.pid) - cpu) / (time.monotonic() - begin)
        gained = process.memory(running.pid)[0] - resident
    except (FileNotFoundError, ProcessLookupError):
        samples[f"{name}: at work"].append(0)
        return
    samples[f"{name}: CPU"].append(share * 100)
    samples[f"{name}: memory"].append(gained)
    samples[f"{name}: at work"].append(int(is_at_work()))


def wait(end):
    time.sleep(end - time.monotonic())


def faults(program):
    samples = defaultdict(list)
    with appliance_with(program) as folder:
        with OwnLine(folder) as line:
            def asks_on():
                before = line.requests
                time.sleep(2)
                return line.requests > before
            under_fault(samples, "garbled answers", line, wait, asks_on)
            line.cut()
            under_fault(samples, "panel gone", line, wait, lambda: process.is_alive(line.pid))
        with Panel(folder) as panel:
            panel.time_of(FIRST_PAGE)

            def signals(end):
                due = time.monotonic()
                while due < end:
                    os.kill(panel.pid, signal.SIGUSR1)
                    due += 1 / SIGNALS_PER_SECOND
                    time.sleep(max(0, due - time.monotonic()))

            def draws():
                try:
                    return bool(panel.redraw_since(time.monotonic()))
                except RuntimeError:
                    return False
            under_fault(samples, "signals", panel, signals, draws)
    return samples
