"""The configuration script as the program meets it, and what it has done to the appliance in the box."""

import os
import re
import shlex
import shutil
import subprocess
import threading

from in_box.panel import AS_THE_SERVICE, SCRIPT, wait_until

FILES = ("/etc/network/interfaces", "/etc/resolv.conf", "/etc/hostname")
GATE = "/run/gate"
# Stands in for a command that sets ports, at its place. Commands that only show something pass.
HOLD = f"""#!/bin/sh
case " $* " in
    *" add "* | *" del "* | *" delete "* | *" replace "* | *" change "* | *" flush "* | *" set "* | \\
        *" netmask "* | *batch*)
        if [ -e {GATE}/closed ] && mkdir {GATE}/held 2>{GATE}/none; then
            while [ -e {GATE}/closed ]; do sleep 0.02; done
        fi ;;
esac
exec {GATE}/NAME "$@"
"""
REBOOT_ASKED = "/run/reboot-asked"
# Stands in for each command that can reboot: the first two may be links to the third.
REBOOTERS = ("/usr/sbin/reboot", "/usr/sbin/shutdown", "/usr/bin/systemctl")
REBOOT = f"""#!/bin/sh
case "${{0##*/}} $*" in
    reboot* | shutdown* | *" reboot"*) : >{REBOOT_ASKED} ;;
    *) exit 1 ;; # there is no service manager
esac
"""
HELD_S = 3  # for which somebody may still have the script's output open after its end


def holders_of(pipe):
    """The commands that have this end of a pipe open."""
    holders = []
    for process in filter(str.isdigit, os.listdir("/proc")):
        try:
            folder = f"/proc/{process}/fd"
            if pipe in (os.readlink(f"{folder}/{number}") for number in os.listdir(folder)):
                with open(f"/proc/{process}/cmdline", errors="replace") as words:
                    holders.append(words.read().replace("\0", " ").strip())
        except OSError:
            continue
    return [holder for holder in holders if "answer.py" not in holder]


class Call:
    """The script at work, called as the program calls it for a port."""

    def __init__(self, words):
        self.words = words
        self.shell = subprocess.Popen(
            [*AS_THE_SERVICE, "sh", "-c", f"{shlex.join([SCRIPT, *words])};echo $?"], start_new_session=True,
            stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=subprocess.DEVNULL)
        self.said = []
        self.reader = threading.Thread(target=self.read, daemon=True)
        self.reader.start()

    def read(self):
        while part := os.read(self.shell.stdout.fileno(), 4096):
            self.said.append(part)

    def wait(self, seconds):
        """Returns whether the script has returned in this time. After that, `status`, `printed` and
        `holders` say how: these are the commands that still have its output open after a while."""
        try:
            self.shell.wait(seconds)
        except subprocess.TimeoutExpired:
            return False
        self.reader.join(HELD_S)
        self.holders = holders_of(os.readlink(f"/proc/self/fd/{self.shell.stdout.fileno()}")) \
            if self.reader.is_alive() else []
        lines = b"".join(self.said).decode(errors="replace")
        self.printed, self.status = re.fullmatch(r"(.*?)([0-9]*)\n?", lines, re.S).groups()
        return True


def close_gate():
    """From here on the first command that changes a port waits until the gate is opened, so that whoever
    runs it can be met at work. Those that follow pass."""
    shutil.rmtree(f"{GATE}/held", ignore_errors=True)
    os.makedirs(GATE, exist_ok=True)
    write_command(f"{GATE}/closed", "")
    for name in ("ip", "ifconfig"):
        if os.path.exists(f"{GATE}/{name}"):
            continue
        command = os.path.realpath(shutil.which(name))
        shutil.copy(command, f"{GATE}/{name}")
        write_command(f"{GATE}/{name}-at-the-gate", HOLD.replace("NAME", name))
        subprocess.run(["mount", "--bind", f"{GATE}/{name}-at-the-gate", command], check=True)


def somebody_waits():
    return os.path.exists(f"{GATE}/held")


def open_gate():
    os.remove(f"{GATE}/closed")


def ip(*words):
    return subprocess.run(["ip", "-4", *words], capture_output=True, text=True).stdout


def addresses_of(port):
    return re.findall(r" inet (\S+)", ip("-o", "addr", "show", "dev", port))


def gateways_of(port):
    return re.findall(r"default via (\S+)", ip("route", "show", "default", "dev", port))


def text_of(path):
    try:
        with open(path, encoding="utf-8", errors="surrogateescape") as file:
            return file.read()
    except OSError:
        return ""


def files():
    return {path: text_of(path) for path in FILES}


def servers():
    return re.findall(r"^nameserver (\S+)$", text_of("/etc/resolv.conf"), re.M)


def write_command(path, text):
    with open(path, "w", encoding="ascii") as file:
        file.write(text)
    os.chmod(path, 0o755)


def watch_for_reboot():
    """From here on a reboot is only noted."""
    write_command("/run/reboot", REBOOT)
    for command in REBOOTERS:
        write_command(f"/run/box/inside/bin/{os.path.basename(command)}", REBOOT)
        if os.path.exists(command):
            subprocess.run(["mount", "--bind", "/run/reboot", os.path.realpath(command)], check=True)


def reboot_asked(seconds):
    return wait_until(lambda: os.path.exists(REBOOT_ASKED), seconds)
