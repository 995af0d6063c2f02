"""The table of figures: what is measured, its floor, and what it means to an operator."""

from dataclasses import dataclass
from typing import Optional, Union

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
           "Two bytes before and two for the request, the wait for a key and the pause: nothing "
           "else is done while nobody is at the panel."),
    Figure("idle wake-ups", "Idle turn: wake-ups", "", 2,
           "The appliance's processor is left alone but for the end of the wait and of the pause."),
    Figure("idle bytes", "Idle turn: bytes on the serial line", "", REQUEST_BYTES,
           "The panel hears one key request a turn, so a key is noticed at once."),
    Figure("idle CPU", "Idle turn: processor time", "µs", None,
           "A turn takes 0.6 s: what the panel costs the monitoring software is not noticeable."),
    Figure("resident memory", "Memory: resident", "KiB", None,
           "Most of it are the C++ and C libraries, which the appliance holds once for all."),
    Figure("proportional memory", "Memory: proportional", "KiB", None,
           "With shared libraries counted by share; few other processes share them in the box."),
    Figure("private memory", "Memory: private", "KiB", None,
           "This is what would come back if the program were ended."),
    Figure("key to first byte", "Key answer to first byte", "ms", "key to first byte, floor",
           "The display begins to change before a finger has left the key."),
    Figure("key to first byte, floor", "The same of a program that only answers", "ms", None,
           "The pseudo-terminal and the machine need this, whatever the program does."),
    Figure("key to redraw", "Key answer to finished redraw", "ms", "key to redraw, floor",
           "A step of an octet is seen after a twentieth of a second, and the line takes nearly "
           "all of it."),
    Figure("start to first byte", "Start to first byte", "ms", None,
           "Six prescribed runs of stty set up the line before the panel may be spoken to."),
    Figure("start to first page", "Start to first page", "ms",
           POLL_TIME + PAGE_BYTES * BYTE_TIME * 1e3,
           "After a restart the panel shows the product in about a second; the floor is the first "
           "wait for a key and the page's 40 bytes."),
    *grown("start", "Start to first page", [
        "The ports are listed, each with one ifconfig, before the first page.",
        "A hundred ports delay the first page by less than a second.",
        "A thousand ports do keep an operator waiting: each costs one ifconfig, which reads them all."]),
    *grown("page", "Down to the next page's first byte", [
        "A port's page runs up to three commands, which are over before a finger leaves the key.",
        "The number of pages does not matter to a page change.",
        "The commands read all ports; the page is still there at once."]),
    *grown("port", "Enter to the port's settings", [
        "The settings are read from two files, and the page before is computed once.",
        "The first port of many opens without any command.",
        "64 kB of settings are read within a millisecond."]),
    *grown("refresh", "Refresh to the first page", [
        "A refresh lists the ports anew and is not noticed.",
        "It takes less than a second.",
        "The panel stands still for it; whoever has so many ports should not refresh often."]),
    Figure("garbled answers: CPU", "Garbled answers: processor share", "%", None,
           "Noise on the serial line costs nothing."),
    Figure("garbled answers: memory", "Garbled answers: memory gained", "KiB", 0,
           "Nor does it make the program grow."),
    Figure("garbled answers: at work", "Garbled answers: still asks for keys", "", 1,
           "The program asks on, and obeys the next good answer."),
    Figure("panel gone: CPU", "Panel gone: processor share", "%", None,
           "Without a line the wait for a key is over at once; the pause keeps the program calm."),
    Figure("panel gone: memory", "Panel gone: memory gained", "KiB", 0,
           "It can stay like that for as long as it takes."),
    Figure("panel gone: at work", "Panel gone: still runs", "", 1,
           "The program runs until the service manager ends it with its device."),
    Figure("signals: CPU", "2,000 refreshes a second: processor share", "%", None,
           "A monitor that reloads without end keeps one processor busy with listings."),
    Figure("signals: memory", "2,000 refreshes a second: memory gained", "KiB", 0,
           "The program does not grow."),
    Figure("signals: at work", "2,000 refreshes a second: draws afterwards", "", 1,
           "When the flood ends, the pages rotate on."),
]
