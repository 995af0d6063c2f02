"""The host's tools that make the box and work in it."""

import os
import signal

from front.ending import no_box
from front.places import INSIDE_PATH

TOOLS = {
    "bwrap": "bubblewrap", "ip": "iproute2", "ifconfig": "net-tools", "hostname": "hostname",
    "udhcpc": "udhcpc", "udhcpd": "udhcpd", "nsenter": "util-linux", "tar": "tar",
}


def tool(name):
    """Returns the path of a tool, in a place that is visible in the box too."""
    for directory in INSIDE_PATH.split(":")[1:] + ["/sbin", "/bin"]:
        if os.access(f"{directory}/{name}", os.X_OK):
            return f"{directory}/{name}"
    no_box(f"{name} is missing: run apt-get install {TOOLS[name]} or scripts/bootstrap")


def exec_tool(name, *arguments):
    # Python ignores these signals, and the started program would inherit that.
    for number in (signal.SIGPIPE, signal.SIGXFSZ):
        signal.signal(number, signal.SIG_DFL)
    os.execv(tool(name), [name, *arguments])
