"""The options of kestrova-panel-box and its help."""

import argparse
import os
import re

from front.ending import wrong_usage
from front.places import BOX, version


class Parser(argparse.ArgumentParser):
    def error(self, message):
        wrong_usage(message)


def whole_number(text):
    if not re.fullmatch("[0-9]+", text):
        raise argparse.ArgumentTypeError(f"'{text}' is not a whole number")
    return int(text)


def parse(words):
    """Returns the options before `--` and the command after it."""
    parser = Parser(
        allow_abbrev=False,
        formatter_class=argparse.RawDescriptionHelpFormatter,
        usage="kestrova-panel-box [OPTIONS] -- COMMAND [ARG...]\n"
        "       kestrova-panel-box --enter PID -- COMMAND [ARG...]",
        description="""\
Runs COMMAND in a sandbox that looks like the appliance: it has an appliance's /dev/ttyS1, /etc
and /opt/kestrova, and a host name, processes and network ports of its own. Nothing on the host
is changed, and nothing is left behind. COMMAND starts in / with no other environment than
PATH, HOME and TERM. Of the host it sees, read-only, /usr, six entries of /etc that the host's
tools look things up in and, if this program belongs to a checkout that the box may enter, that
checkout. It also sees a copy of its own file. If the appliance is rebooted from inside, COMMAND
is ended with SIGTERM and started again.""",
        epilog="""\
In a running box, /run/box/script-mode says what the script does (works, fails, chatters, or
hangs SECONDS), and can be changed:
  kestrova-panel-box --enter PID -- sh -c 'echo hangs 5 > /run/box/script-mode'

The exit status is that of COMMAND, or 128 + N if signal N has ended it. It is 2 after wrong
usage, 125 if the box cannot be made or entered, 126 if COMMAND cannot be run, and 127 if
COMMAND does not exist.""")
    parser.add_argument("--tty", metavar="PATH", default=os.environ.get("PANEL_TTY"),
                        help="make this terminal /dev/ttyS1 (default: $PANEL_TTY)")
    parser.add_argument("--no-tty", action="store_true",
                        help="leave the panel away, so that /dev/ttyS1 does not exist")
    parser.add_argument("--appliance", metavar="DIR", default=f"{BOX}/appliance",
                        help="take the appliance's files from this directory (default: appliance/ "
                        "beside this program): etc/ and opt/ are copied into the box, and links "
                        "lists the network ports")
    parser.add_argument("--script-fails", dest="script_mode", action="store_const",
                        const="fails", default="works",
                        help="have the configuration script fail with status 1 and do nothing")
    parser.add_argument("--script-hangs", dest="script_mode", metavar="SECONDS",
                        type=lambda text: f"hangs {whole_number(text)}",
                        help="have it wait for so many whole seconds before it works")
    parser.add_argument("--script-chatters", dest="script_mode", action="store_const",
                        const="chatters", help="have it print on its standard output before it works")
    parser.add_argument("--enter", metavar="PID", type=whole_number,
                        help="run COMMAND in the running box whose kestrova-panel-box is process PID")
    parser.add_argument("--version", action="store_true", help="show the version")
    end = words.index("--") if "--" in words else len(words)
    options, others = parser.parse_known_args(words[:end])
    if options.version:
        print(f"kestrova-panel-box {version()}")
        raise SystemExit
    for other in others:
        wrong_usage(f"unknown option {other}" if other.startswith("-")
                    else "the command must follow after '--'")
    if not words[end + 1:]:
        wrong_usage("there is no command after '--'")
    by_default = {**vars(parser.parse_args([])), "enter": options.enter}
    if options.enter is not None and vars(options) != by_default:
        wrong_usage("--enter cannot be combined with other options")
    return options, words[end + 1:]
