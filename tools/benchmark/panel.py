"""The program at work in the box, on the emulated panel or on a serial line of the bench's own."""

import os
import pty
import random
import select
import signal
import subprocess
import tempfile
import termios
import threading
import time
import tty

import appliance
import process
from linetrace import KEY_REQUEST, Trace

BOX = "box/kestrova-panel-box"
EMULATOR = "build/bin/panel-emulator"
LONGEST_WAIT = 120  # seconds, for anything that has to happen

# The unit's command; the variable tells the bench when it was given.
START = f"""\
import os, time
os.execve("/usr/bin/env", ["env", "--ignore-signal=USR1,HUP", "{appliance.PROGRAM}"],
          {{**os.environ, "LC_ALL": "C", "STARTED": str(time.monotonic())}})
"""


def wait_until(happened, what):
    end = time.monotonic() + LONGEST_WAIT
    while not (result := happened()):
        if time.monotonic() > end:
            raise RuntimeError(f"{what} did not happen within {LONGEST_WAIT} s")
        time.sleep(0.02)
    return result


class Running:
    """A process of the bench's own, with what it started; ended and waited for at the end, also when
    it does not begin its work."""

    def __init__(self, command, **options):
        self.said = tempfile.TemporaryFile()
        self.process = subprocess.Popen(command, stdin=subprocess.DEVNULL, stdout=self.said,
                                        stderr=subprocess.STDOUT, **options)

    def __enter__(self):
        try:
            self.wait_for_begin()
        except BaseException:
            self.__exit__()
            raise
        return self

    def __exit__(self, *_):
        self.process.send_signal(signal.SIGTERM)
        self.process.wait()

    def check_life(self):
        if self.process.poll() is not None:
            self.said.seek(0)
            raise RuntimeError(f"'{self.process.args[0]}' ended: {self.said.read().decode()}")

    def find_program(self):
        def look():
            self.check_life()
            return [pid for pid in process.descendants(self.process.pid)
                    if process.name_of(pid) == "kestrova-panel"]
        return wait_until(look, "the program's start")[0]


class Panel(Running):
    """The emulated panel, on which a journey is played before the panel is left alone.

    `command` is run in the place of the program in the box, where given."""

    def __init__(self, folder, steps="", command=None):
        self.scratch = tempfile.TemporaryDirectory()
        journey, self.trace_path, self.played = (
            f"{self.scratch.name}/{name}" for name in ("journey", "trace", "played"))
        with open(journey, "w") as text:
            text.write(f"{steps}\nrun touch {self.played}\nwait 86400\n")
        super().__init__([
            EMULATOR, "--journey", journey, "--trace", self.trace_path, "--limit", str(LONGEST_WAIT),
            "--", *(command or [BOX, "--appliance", folder, "--", "/usr/bin/python3", "-ISc", START])])
        self.is_in_box = not command

    def wait_for_begin(self):
        self.pid = self.find_program() if self.is_in_box else None

    def start_time(self):
        """When the unit's command was given; the program has its name a moment before its variables."""
        return float(wait_until(lambda: process.environment(self.pid).get("STARTED"), "the start"))

    def trace(self):
        return Trace(self.trace_path)

    def trace_when_played(self):
        def look():
            self.check_life()
            return os.path.exists(self.played)
        wait_until(look, "the end of the journey")
        return self.trace()

    def time_of(self, text):
        """When a row that begins with `text` was first seen on the panel."""
        return wait_until(lambda: self.trace().shown(text), f"the row '{text}'")

    def redraw_since(self, moment):
        return wait_until(lambda: self.trace().redraw_since(moment), "a new page")


class OwnLine(Running):
    """A pseudo-terminal whose far end answers key requests with random bytes, until it is cut."""

    def __init__(self, folder):
        self.near, self.far = pty.openpty()
        tty.setraw(self.far)
        settings = termios.tcgetattr(self.far)
        settings[4] = settings[5] = termios.B2400
        termios.tcsetattr(self.far, termios.TCSANOW, settings)
        self.requests = 0
        self.is_cut = threading.Event()
        super().__init__([BOX, "--appliance", folder, "--tty", os.ttyname(self.far), "--",
                          "/usr/bin/python3", "-ISc", START])
        self.answering = threading.Thread(target=self.answer)
        self.answering.start()

    def wait_for_begin(self):
        self.pid = self.find_program()
        wait_until(lambda: self.requests > 0, "the first key request")

    def answer(self):
        chance = random.Random(1)
        seen = b""
        while not self.is_cut.is_set():
            if select.select([self.near], [], [], 0.1)[0]:
                seen += os.read(self.near, 4096)
                if KEY_REQUEST in seen:
                    self.requests += 1
                    seen = seen.rpartition(KEY_REQUEST)[2]
                    os.write(self.near, chance.randbytes(chance.randint(1, 40)))

    def cut(self):
        self.is_cut.set()
        self.answering.join()
        os.close(self.near)
        os.close(self.far)

    def __exit__(self, *error):
        if not self.is_cut.is_set():
            self.cut()
        super().__exit__(*error)
