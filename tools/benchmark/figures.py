"""The table of figures: what is measured, its floor, and what it means to an operator."""

from dataclasses import dataclass
from typing import Union

from linetrace import BYTE_TIME

POLL_TIME = 500  # ms, before a program without a key draws
REQUEST_BYTES = 4
PAGE_BYTES = 40


@dataclass(frozen=True)
class Figure:
    key: str  # of its samples
    title: str
    unit: str
    floor: Union[None, float, str]  # what cannot be done with less, or the key of its samples
    meaning: str


GROWN = {"usual": "5 ports", "many pages": "100 ports, 100 pages",
         "many ports": "1,000 ports, 100 pages, 64 kB of interfaces"}


def grown(kind, title, meanings):
    return [Figure(f"{kind}, {name}", f"{title}: {size}", "ms", None, meaning)
            for (name, size), meaning in zip(GROWN.items(), meanings)]


FIGURES = [
    Figure("idle calls", "Idle turn: system calls", "", 6,
           "A turn writes four bytes one by one, waits for a key, and pauses. While nobody is at the "
           "panel, the program does nothing else."),
    Figure("idle wake-ups", "Idle turn: wake-ups", "", 2,
           "The program wakes up when the wait for a key ends and when the pause ends, and leaves the "
           "appliance's processor alone otherwise."),
    Figure("idle bytes", "Idle turn: bytes on the serial line", "", REQUEST_BYTES,
           "Each turn sends one key request, which the panel answers as soon as a key goes down."),
    Figure("idle CPU", "Idle turn: processor time", "µs", None,
           "A turn takes 0.6 s, so the monitoring software does not notice what the panel costs."),
    Figure("resident memory", "Memory: resident", "KiB", None,
           "Most of this is the C and C++ libraries, which the appliance's programs share."),
    Figure("proportional memory", "Memory: proportional", "KiB", None,
           "This counts a shared library in parts, one for each process that uses it."),
    Figure("private memory", "Memory: private", "KiB", None,
           "This is what the appliance would get back if the program ended."),
    Figure("key to first byte", "Key answer to first byte", "ms", "key to first byte, floor",
           "The display begins to change long before a finger has left the key."),
    Figure("key to first byte, floor", "The same of a program that only answers", "ms", None,
           "The pseudo-terminal and the machine need this time, whatever the program does."),
    Figure("key to redraw", "Key answer to finished redraw", "ms", "key to redraw, floor",
           "Nearly all the time until a new octet can be read is the line's."),
    Figure("start to first byte", "Start to first byte", "ms", None,
           "Before the first byte, six runs of stty have set up the line."),
    Figure("start to first page", "Start to first page", "ms",
           POLL_TIME + PAGE_BYTES * BYTE_TIME * 1e3,
           "After a restart the panel shows the product in about a second. The floor is the first "
           "wait for a key and the 40 bytes of the page."),
    *grown("start", "Start to first page", [
        "Before the first page the program asks for each port's address, with one ifconfig each.",
        "Each port more delays the first page by one ifconfig.",
        "A thousand ports keep an operator waiting: each costs one ifconfig, which itself reads "
        "the whole list."]),
    *grown("page", "Down to the next page's first byte", [
        "A port's page runs two or three commands, which is too short to be noticed.",
        "The number of pages does not matter; the commands take longer because they read all ports.",
        "The same is true of a thousand ports."]),
    *grown("port", "Enter to the port's settings", [
        "The settings are read from two files, and the page before this one is computed once.",
        "The page before the first port needs no command, so this is the reading alone.",
        "Reading 64 kB of settings does not keep an operator waiting."]),
    *grown("refresh", "Refresh to the first page", [
        "A refresh lists the ports anew, which an operator does not notice.",
        "It takes one ifconfig for each port, and no key is read meanwhile.",
        "The panel stands still for so long: an appliance with so many ports should not refresh often."]),
    Figure("garbled answers: CPU", "Garbled answers: processor share", "%", None,
           "Noise ends each wait for a key at once, so it costs more than rest does, and still next to nothing."),
    Figure("garbled answers: memory", "Garbled answers: memory gained", "KiB", 0,
           "Noise does not make the program grow."),
    Figure("garbled answers: at work", "Garbled answers: still asks for keys", "", 1,
           "The program goes on asking, so that the next good answer counts."),
    Figure("panel gone: CPU", "Panel gone: processor share", "%", None,
           "Without a line the wait for a key ends at once, and only the pause is left; that is enough "
           "to keep the processor free."),
    Figure("panel gone: memory", "Panel gone: memory gained", "KiB", 0,
           "The program can wait like this for as long as it takes."),
    Figure("panel gone: at work", "Panel gone: still runs", "", 1,
           "The program runs on until the service manager ends it."),
    Figure("signals: CPU", "2,000 refreshes a second: processor share", "%", None,
           "Whoever asks for refreshes without end keeps a processor busy with listings."),
    Figure("signals: memory", "2,000 refreshes a second: memory gained", "KiB", 0,
           "The requests do not pile up."),
    Figure("signals: at work", "2,000 refreshes a second: draws afterwards", "", 1,
           "When the flood ends, the pages go on."),
]
