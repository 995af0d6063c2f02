#!/usr/bin/python3
"""Two emulators (the first argument) play the same journey for a minute: one alone, and one with as
many pages as there may be, of which one is not read and one sends messages all the time, beside
connections that ask for as much as they can. Compares what they traced."""

import contextlib
import selectors
import socket
import subprocess
import sys
import tempfile
import threading
import time
import unittest
from pathlib import Path

from panel import POLLER, Panel, wait_for

EMULATOR = sys.argv.pop(1)
POLLS = 270  # a minute
BYTE_TIME = 11 / 2400
ROW_TIME = 20 * BYTE_TIME  # of what the poller writes at once: a row and a request


def delays(trace):
    """How much later than the line allows each answer came, in milliseconds: sorted."""
    late, begin = [], None
    for line in Path(trace).read_text(encoding="ascii").splitlines():
        time_ns, direction = line.split()[:2]
        if direction == "<":
            begin = begin or int(time_ns)
        elif begin:
            late.append((int(time_ns) - begin) / 1e6 - ROW_TIME * 1e3)
            begin = None
    return sorted(late)


def send_until_closed(page):
    with contextlib.suppress(OSError):
        while True:
            page.send("release")
            time.sleep(1 / 50)


def ask_until(panel, is_over):
    """Asks on a connection without waiting for answers, and on the next when that one is closed."""
    request = f"GET {panel.path}page.js HTTP/1.1\r\nHost: {panel.host}\r\n\r\n".encode()
    while not is_over.is_set():
        with contextlib.suppress(OSError), panel.connect() as connection:
            connection.sendall(request * 50)
            while connection.recv(65536):
                pass


def read_until_closed(pages):
    with selectors.DefaultSelector() as selector:
        for page in pages:
            selector.register(page.sock, selectors.EVENT_READ)
        while selector.get_map():
            for key, _ in selector.select():
                if not key.fileobj.recv(65536):
                    selector.unregister(key.fileobj)


class Timing(unittest.TestCase):
    def test_pages_delay_neither_the_line_nor_the_answers(self):
        folder = self.enterContext(tempfile.TemporaryDirectory())
        journey, *traces = (f"{folder}/{name}" for name in ("journey", "alone", "with pages"))
        Path(journey).write_text(f"limit 90\nhold up {POLLS}\nrelease\n", encoding="ascii")
        with Panel(EMULATOR, POLLER, "--journey", journey, "--trace", traces[1]) as panel, \
                subprocess.Popen([EMULATOR, "--journey", journey, "--trace", traces[0], "--",
                                  *POLLER]) as alone:
            seen, flood, *crowd = (panel.open() for _ in range(63))
            deaf = panel.open(sockopt=[(socket.SOL_SOCKET, socket.SO_RCVBUF, 2048)])
            memory = panel.memory()
            writers = [threading.Thread(target=send_until_closed, args=[page])
                       for page in (deaf, flood)]
            for writer in writers:
                writer.start()
            threading.Thread(target=read_until_closed, args=[crowd]).start()
            is_over = threading.Event()
            self.addCleanup(is_over.set)
            for _ in range(16):
                threading.Thread(target=ask_until, args=[panel, is_over]).start()
            wait_for(seen, 60, polls=POLLS // 2)
            # By now the one that does not read has been dropped, and the one that sends has not.
            self.assertEqual([writer.is_alive() for writer in writers], [False, True])
            self.assertLess(panel.memory(), memory + 2048)
            wait_for(seen, 60, ending="the journey was played to its end")
            is_over.set()
            self.assertEqual((panel.process.wait(10), alone.wait(10)), (0, 0))
        marks = []
        for trace in traces:
            late = delays(trace)
            self.assertEqual(len(late), POLLS)
            marks.append([late[len(late) * share // 100] for share in (50, 95, 99)] + [late[-1]])
            print(f"{Path(trace).name}: answers late by", *(f"{mark:.2f}" for mark in marks[-1]),
                  "ms (50th, 95th, 99th percentile, most)")
        self.assertLess(marks[1][0] - marks[0][0], BYTE_TIME * 1e3 / 4)
        self.assertLess(marks[1][1] - marks[0][1], BYTE_TIME * 1e3)


if __name__ == "__main__":
    unittest.main(warnings="ignore")
