"""An operator in the box: the real program at the emulated panel.

What the program reads is what it hands to the configuration script, for which a recorder stands in.
"""

import os
import re
import resource
import socket
import subprocess
import time

KIT = os.path.dirname(os.path.dirname(os.path.realpath(__file__)))
SCRIPT = "/opt/kestrova/scripts/ezio/apply.py"
LINE = "/dev/ttyS1"
TTY = "/run/panel-tty"
RECORDED = "/run/recorded"
RECORDER = f"#!/bin/sh\nprintf '%s\\0' \"$@\" >{RECORDED}.new\nmv {RECORDED}.new {RECORDED}.$(date +%s%N)\n"
AS_THE_SERVICE = ("env", "--ignore-signal=USR1,HUP,PIPE", "--unset=HOME", "--unset=TERM", "LC_ALL=C")
STEP_LIMIT_S = 60
OTHER_PAGES = 5  # product, host name, connection, eth4 and eth5
START_LIMIT_S = 20
LOOK_S = 0.05

# From a port's page to its settings as they are, of which the operator applies all. Whether the choice
# stands at DHCP or at Static, the same keys apply it: on the way to "Apply Changes" Down goes further
# than needed, and where DHCP is confirmed Down means nothing.
APPLY_AS_IT_IS = "keys e e d10\nhold enter 1\nwait 0.5\npicture applied\nrelease\n"


def wait_until(condition, seconds):
    """Looks until there is an answer, and returns it, or what it was when the time was over."""
    end = time.monotonic() + seconds
    while not (answer := condition()) and time.monotonic() < end:
        time.sleep(LOOK_S)
    return answer


def no_core():
    resource.setrlimit(resource.RLIMIT_CORE, (0, 0))


class Operator:
    """Plays a journey. The program is no child of the emulated panel, so that it can be ended alone."""

    def __init__(self, journey):
        self.emulator = subprocess.Popen(
            [f"{KIT}/panel-emulator", "--fast", "--limit", str(STEP_LIMIT_S), "--journey", "-", "--",
             "sh", "-c", f'echo "$PANEL_TTY" >{TTY}.new; mv {TTY}.new {TTY}; exec sleep infinity'],
            stdin=subprocess.PIPE, stdout=subprocess.PIPE, stderr=subprocess.STDOUT, text=True)
        self.emulator.stdin.write(journey)
        self.emulator.stdin.close()
        wait_until(lambda: os.path.exists(TTY), START_LIMIT_S)
        with open(TTY, encoding="ascii") as tty:
            os.symlink(tty.read().strip(), LINE)
        self.program = subprocess.Popen(
            [*AS_THE_SERVICE, f"{KIT}/kestrova-panel"],
            stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL,
            start_new_session=True, preexec_fn=no_core)

    def finish(self):
        """Waits until the journey is over. Returns whether it succeeded, what was printed, and the
        pictures that were taken, each as its two rows."""
        said = self.emulator.stdout.read()
        status = self.emulator.wait()
        self.program.kill()
        self.program.wait()
        os.remove(LINE)
        os.remove(TTY)
        rows = re.findall(r"^\|(.{16})\|\n\|(.{16})\|$", said, re.M)
        return status == 0, said, [[row.rstrip() for row in pair] for pair in rows]


def to_page(address):
    """The step to the page that shows this address; there are no more pages than network links and these."""
    return f'tap up {len(socket.if_nameindex()) + OTHER_PAGES} until * "{address}"\n'


def pages(count):
    """The texts of so many status pages, beginning with the product."""
    journey = 'tap down until "Hostname:"\ntap up\npicture page\n' + "tap down\npicture page\n" * (count - 1)
    return Operator(journey).finish()[2]


def record():
    """From here on the configuration script does nothing but record how it is called."""
    os.makedirs(os.path.dirname(SCRIPT), exist_ok=True)
    with open(f"{SCRIPT}.new", "w", encoding="ascii") as recorder:
        recorder.write(RECORDER)
    os.chmod(f"{SCRIPT}.new", 0o755)
    os.rename(f"{SCRIPT}.new", SCRIPT)


def recorded():
    """The words of all calls, in their order."""
    calls = []
    for name in sorted(os.listdir("/run")):
        if re.fullmatch(r"recorded\.[0-9]+", name):
            with open(f"/run/{name}", encoding="utf-8", errors="surrogateescape", newline="") as words:
                calls.append(words.read().split("\0")[:-1])
    return calls


def without_servers(words):
    return words[:words.index("--dns")] if "--dns" in words else words


def settings(ports):
    """What the panel reads of these ports, each given with the address that its page shows: the words
    that the script would be called with, or None and what the panel says instead."""
    record()
    answers = []
    for port, address in ports:
        before = len(recorded())
        _, said, pictures = Operator(to_page(address) + APPLY_AS_IT_IS).finish()
        calls = [words for words in recorded()[before:] if words[:3] == ["iface", "--name", port]]
        answers.append({"words": calls[0][3:] if calls else None,
                        "shown": " ".join(pictures[-1]) if pictures else said})
    return answers
