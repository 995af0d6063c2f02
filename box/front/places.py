"""Where things are: this program with its version, and what is found where in the box."""

import os
import re

BOX = os.path.dirname(os.path.dirname(os.path.realpath(__file__)))
CHECKOUT = os.path.dirname(BOX)
# Where the version stands: an installation has it in a file of its own, a checkout in its changelog.
VERSIONS = ((f"{CHECKOUT}/version", "(.+)"), (f"{CHECKOUT}/debian/changelog", r".*\((.*)-"))
# What a service manager would set; `inside/bin` comes first because of the box's own `reboot`.
INSIDE_PATH = "/run/box/inside/bin:/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin"


def version():
    """Returns "unknown" for a box that somebody has copied without the rest."""
    for path, pattern in VERSIONS:
        if os.path.exists(path):
            with open(path, encoding="utf-8") as file:
                return re.match(pattern, file.read())[1]
    return "unknown"
