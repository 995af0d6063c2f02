#!/usr/bin/python3
"""Two emulators (the first argument) play the same journey for a minute: one alone, one with a page
that is read, one that is not, and one that sends messages all the time. Compares what they traced."""

import subprocess
import sys
import tempfile
import threading
import time
import unittest
from pathlib import Path

from panel import POLLER, Page, Panel

EMULATOR = sys.argv.pop(1)
POLLS = 270  # a minute
BYTE_TIME = 11 / 2400
ROW_TIME = 20 * BYTE_TIME  # of what the poller writes at once: a row and a request
JOURNEY = f"limit 90\nhold up {POLLS}\nrelease\n"


def delays(trace):
    """How much later than the line allows each answer came, in milliseconds."""
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
    try:
        while True:
            page.send("release")
            time.sleep(1 / 50)
    except OSError:
        pass


class Timing(unittest.TestCase):
    def test_pages_delay_neither_the_line_nor_the_answers(self):
        with tempfile.TemporaryDirectory() as folder:
            journey, alone, watched = (f"{folder}/{name}" for name in ("journey", "alone", "watched"))
            Path(journey).write_text(JOURNEY, encoding="ascii")
            with Panel(EMULATOR, POLLER, "--journey", journey, "--trace", watched) as panel, \
                    subprocess.Popen([EMULATOR, "--journey", journey, "--trace", alone, "--",
                                      *POLLER]) as other:
                page, deaf, flood = Page(panel), Page(panel, receive_buffer=2048), Page(panel)
                memory = panel.memory()
                writers = [threading.Thread(target=send_until_closed, args=(each,), daemon=True)
                           for each in (deaf, flood)]
                for writer in writers:
                    writer.start()
                states = 0
                while not (state := page.state()).get("ending"):
                    states += 1
                    if state["polls"] == POLLS // 2:  # by now the one that does not read is dropped
                        alive = [writer.is_alive() for writer in writers]
                        grown = panel.memory() - memory
                self.assertEqual((panel.process.wait(10), other.wait(10)), (0, 0))
            self.assertEqual(alive, [False, True])
            self.assertLess(grown, 2048)
            self.assertGreater(states, POLLS)
            marks = []
            for name, trace in (("alone", alone), ("with pages", watched)):
                late = delays(trace)
                self.assertEqual(len(late), POLLS)
                marks.append([late[len(late) * share // 100] for share in (50, 95, 99)] + [late[-1]])
                print(f"{name}: answers late by", *(f"{mark:.2f}" for mark in marks[-1]),
                      "ms (50th, 95th, 99th percentile, most)")
            self.assertLess(marks[1][0] - marks[0][0], BYTE_TIME * 1e3 / 4)
            self.assertLess(marks[1][1] - marks[0][1], BYTE_TIME * 1e3)


if __name__ == "__main__":
    unittest.main(warnings="ignore")
