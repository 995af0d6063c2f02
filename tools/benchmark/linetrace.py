"""The emulated panel's trace: what came over the serial line, and when the line had carried it."""

import bisect
from dataclasses import dataclass

KEY_REQUEST = bytes.fromhex("fe00fe06")
CLEAR = bytes.fromhex("fe01")
BYTE_TIME = 11 / 2400  # seconds: a start bit, eight data bits and two stop bits at 2400 baud


@dataclass
class Redraw:
    """What the program sent after a key's answer, up to its next key request; times in seconds."""

    to_first_byte: float
    to_last_byte: float  # until the line has carried it
    bytes: int

    @property
    def floor(self):
        return self.bytes * BYTE_TIME


class Trace:
    """Times are seconds of the monotonic clock, as `time.monotonic` tells them."""

    def __init__(self, path):
        self.sent = b""  # by the program
        self.arrived = []  # when each byte of it came out of the pseudo-terminal
        self.carried = []  # when a line at 2400 baud would have delivered it
        self.answers = []  # when a key was answered, and how many bytes had been sent by then
        with open(path) as lines:
            for line in lines.read().rpartition("\n")[0].splitlines():
                nanoseconds, direction, *bytes_ = line.split()
                self.add(int(nanoseconds) / 1e9, direction, bytes.fromhex("".join(bytes_)))

    def add(self, moment, direction, new):
        if direction == ">":
            self.answers.append((moment, len(self.sent)))
            return
        self.sent += new
        for _ in new:
            free = self.carried[-1] if self.carried else moment
            self.arrived.append(moment)
            self.carried.append(max(free, moment) + BYTE_TIME)

    def sent_since(self, moment):
        return self.sent[bisect.bisect_left(self.arrived, moment):]

    def requests_since(self, moment):
        return self.sent_since(moment).count(KEY_REQUEST)

    def shown(self, text):
        """When the line had carried the first row that begins with `text`, if it has."""
        at = self.sent.find(text.encode())
        end = at + 16
        return self.carried[end - 1] if at >= 0 and end <= len(self.carried) else None

    def redraw_after(self, moment, position):
        """What was drawn from byte `position` on; None when the program only asked on."""
        end = self.sent.find(KEY_REQUEST, position)
        if end <= position:
            return None
        return Redraw(self.arrived[position] - moment, self.carried[end - 1] - moment, end - position)

    def redraws(self):
        """One for each answered key that made the program draw."""
        return [drawn for answer in self.answers if (drawn := self.redraw_after(*answer))]

    def redraw_since(self, moment):
        """The first one that begins with a clear display; None when none has ended yet."""
        position = self.sent.find(CLEAR, bisect.bisect_left(self.arrived, moment))
        return None if position < 0 else self.redraw_after(moment, position)
