"""How the box ends when it cannot run the command: with one line and a status of its own."""

import os
import sys

WRONG_USAGE, NO_BOX, NO_RUN, NO_COMMAND = 2, 125, 126, 127


def end_with(status, message):
    print(f"kestrova-panel-box: {message}", file=sys.stderr, flush=True)
    os._exit(status)


def wrong_usage(message):
    end_with(WRONG_USAGE, f"{message} (see --help)")


def no_box(message):
    end_with(NO_BOX, message)
