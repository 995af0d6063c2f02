"""Samples as a table for a terminal or for the documentation, and as a drawing of the latencies."""

import os
import platform
import statistics
import subprocess

from figures import FIGURES

PERCENTILE_SAMPLES = 100  # a 99th percentile of fewer says no more than the largest


def number(value):
    if value is None:
        return ""
    digits = 0 if abs(value) >= 100 or value == int(value) else 1 if abs(value) >= 10 else 2
    return f"{value:,.{digits}f}"


def median(values):
    return statistics.median(values) if values else None


def ratio(value, to):
    return f"{value / to:.2f}" if value is not None and to else ""


def spread(values):
    """Smallest, median, 99th percentile where there is one, and largest; nothing of no values."""
    ordered = sorted(values)
    if not ordered:
        return (None,) * 4
    enough = len(ordered) >= PERCENTILE_SAMPLES
    return (ordered[0], median(ordered),
            ordered[len(ordered) * 99 // 100] if enough else None, ordered[-1])


def floor_of(figure, samples):
    return median(samples[figure.floor]) if isinstance(figure.floor, str) else figure.floor


def rows(samples, others):
    """The table's cells; `others` are another program's samples, or None."""
    head = ["figure", "unit", "runs", "min", "median", "99 %", "max", "floor", "ratio"]
    yield head + (["other's median", "this / other"] if others else [])
    for figure in FIGURES:
        values = samples[figure.key]
        least, middle, high, most = spread(values)
        floor = floor_of(figure, samples)
        row = [figure.title, figure.unit, str(len(values)), number(least), number(middle),
               number(high), number(most), number(floor), ratio(middle, floor)]
        if others:
            other = median(others[figure.key])
            row += [number(other), ratio(middle, other)]
        yield row


def as_text(samples, others):
    table = list(rows(samples, others))
    widths = [max(map(len, column)) for column in zip(*table)]
    return "\n".join("  ".join(
        cell.ljust(width) if place < 2 else cell.rjust(width)
        for place, (cell, width) in enumerate(zip(row, widths))).rstrip() for row in table)


def as_markdown_table(samples, others):
    head, *body = rows(samples, others)
    meanings = {figure.title: figure.meaning for figure in FIGURES}
    lines = [head + ["what it means to an operator"], ["---", "---"] + ["--:"] * (len(head) - 2) + ["---"]]
    lines += [row + [meanings[row[0]]] for row in body]
    return "\n".join(f"| {' | '.join(line)} |" for line in lines)


def machine():
    with open("/proc/cpuinfo") as processors:
        model = next((line.partition(":")[2].strip() for line in processors
                      if line.startswith("model name")), platform.machine())
    return f"{os.cpu_count()} processors ({model}), Linux {platform.release()}"


def draw_latencies(samples, others, path):
    """The share of keys that were answered within a time, on a logarithmic scale, by gnuplot."""
    curves = [("kestrova-panel", samples["key to first byte"]),
              ("a program that only answers", samples["key to first byte, floor"])]
    if others:
        curves.append(("the program compared with", others["key to first byte"]))
    script = ["set terminal svg size 720,360 font 'sans-serif,13' background '#ffffff'", f"set output '{path}'",
              "set logscale x", "set xlabel 'time from the key answer to the first byte (ms)'",
              "set ylabel 'share of keys (%)'", "set yrange [0:100]", "set grid", "set key bottom right"]
    for index, (_, values) in enumerate(curves):
        points = (f"{value} {100 * place / len(values)}" for place, value in enumerate(sorted(values), 1))
        script += [f"$curve{index} << END", *points, "END"]
    script.append("plot " + ", ".join(f"$curve{index} with lines linewidth 2 title '{title}'"
                                      for index, (title, _) in enumerate(curves)))
    subprocess.run(["gnuplot"], input="\n".join(script), text=True, check=True)


def as_page(samples, others, picture):
    return f"""\
# What it costs, and how fast it answers

This page was written by `scripts/bench --markdown`, which ran the program in the sandbox on the
emulated panel. The machine had {machine()}.

A floor is what cannot be done with less: the serial line takes 4.58 ms for a byte, and a turn makes
six system calls. For the time from a key's answer to the first byte, the floor is the time that a
program needs which does nothing but answer, on the same machine at the same time. The ratio is that
of the median to the floor. Most figures depend on the machine, so only `scripts/bench --compare
REVISION` tells whether a change has helped: it measures two programs in turn on one machine.

{as_markdown_table(samples, others)}

![How many keys have been answered within what time]({picture})

Where the two curves run together, the time is that of the pseudo-terminal and of the machine. The
kernel hands the bytes over by a worker of its own, which waits for a processor like everybody else:
the slowest answers come from there. The emulated line delivers an answer at once; on a real line its
two bytes take another 9.2 ms.
"""
