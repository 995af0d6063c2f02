"""Measures the programs that are named and prints the table of figures; scripts/bench calls it."""

import signal
import sys
from collections import defaultdict

import measurements
import report

PAGE = "docs/performance.md"
PICTURE = "pictures/latency.svg"
STARTS = 5


def phases():
    """What is run one after the other, each for all programs in turn."""
    yield "keys", measurements.keys
    yield "an idle panel", measurements.idle
    for _ in range(STARTS):
        yield "a start", measurements.start
    yield "5 ports", lambda program: measurements.growth(program, "usual", turns=4)
    yield "100 ports", lambda program: measurements.growth(
        program, "many pages", turns=4, ports=100, ports_with_address=100)
    yield "1,000 ports", lambda program: measurements.growth(
        program, "many ports", turns=2, ports=1000, ports_with_address=100, interfaces_bytes=65536)
    yield "faults", measurements.faults


def main(markdown, *programs):
    samples = [defaultdict(list) for _ in programs]
    for name, measure in phases():
        print(f"measuring {name} ...", file=sys.stderr, flush=True)
        for program, mine in zip(programs, samples):
            for key, values in measure(program).items():
                mine[key] += values
    others = samples[1] if len(samples) > 1 else None
    print(report.as_text(samples[0], others))
    if markdown:
        report.draw_latencies(samples[0], others, f"docs/{PICTURE}")
        with open(PAGE, "w") as page:
            page.write(report.as_page(samples[0], others, PICTURE))


# However it is ended, what it has started ends with it.
for number in (signal.SIGTERM, signal.SIGHUP):
    signal.signal(number, signal.default_int_handler)
try:
    main(sys.argv[1] == "--markdown", *sys.argv[2:])
except RuntimeError as fault:
    sys.exit(f"bench: {fault}")
except KeyboardInterrupt:
    sys.exit(130)
