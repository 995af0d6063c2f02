"""Runs a command in a box that is already running."""

import os
import time

from front.ending import no_box
from front.places import INSIDE_PATH
from front.tools import exec_tool


def only_child(pid):
    with open(f"/proc/{pid}/task/{pid}/children") as children:
        return int(children.read().split()[0])


def enter(front, command):
    # A box that has just been started gets time to come up.
    for _ in range(50):
        try:
            inside = only_child(only_child(front))
            os.stat(f"/proc/{inside}/root/run/box/ready")
            break
        except (OSError, IndexError):
            if not os.path.exists(f"/proc/{front}"):
                no_box(f"process {front} is not a running box")
        time.sleep(0.1)
    else:
        no_box(f"process {front} is not a running box")
    # Root enters even another user's box as the root of that box. Nobody else may switch users.
    credentials = ["--preserve-credentials"] if os.geteuid() != 0 else []
    exec_tool("nsenter", *credentials, "--target", str(inside),
              "--user", "--mount", "--uts", "--ipc", "--net", "--pid", "--",
              "/usr/bin/env", "-i", f"PATH={INSIDE_PATH}", "HOME=/root",
              f"TERM={os.environ.get('TERM', 'dumb')}", *command)
