"""Where things are: this program, and what is found where in the box."""

import os

BOX = os.path.dirname(os.path.dirname(os.path.realpath(__file__)))
CHECKOUT = os.path.dirname(BOX)
# What a service manager would set; `inside/bin` comes first because of the box's own `reboot`.
INSIDE_PATH = "/run/box/inside/bin:/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin"
