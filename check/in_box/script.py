"""The configuration script as the program meets it, and what it has done to the appliance in the box."""

import os
import re
import shlex
import shutil
import subprocess
import threading
import time

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
# Stands in for each command that can reboot: all of them may be links to the same two.
REBOOTERS = ("/usr/sbin/reboot", "/usr/sbin/shutdown", "/usr/sbin/init", "/usr/bin/systemctl")
REBOOT = f"""#!/bin/sh
case "${{0##*/}} $*" in
    reboot* | shutdown*" -r"* | shutdown*" --reboot"* | "init 6" | systemctl*" reboot"*) : >{REBOOT_ASKED} ;;
    *) exit 1 ;; # there is no service manager
esac
"""
COMPLAINTS = "/run/standard-error"  # what the script has written to standard error
LOGS = ("/opt/kestrova", "/var/log", "/run")
STATUS = "status "  # which the shell prints behind all that the script does
# By which a port gets a lease, with the port's name among their words.
CLIENTS = r"(^|/| )(dhclient|udhcpc|dhcpcd)[: ].*\b{port}\b"
HELD_S = 3  # for which somebody may still have the script's output open after its end


def commands():
    """The numbers of the processes in the box, and their commands."""
    for process in filter(str.isdigit, os.listdir("/proc")):
        words = text_of(f"/proc/{process}/cmdline").replace("\0", " ").strip()
        if words:
            yield process, words


def clients_of(port):
    """The DHCP clients of this port."""
    return [words for _, words in commands() if re.search(CLIENTS.format(port=port), words)]


def last_words(since):
    """The last line that the script has written since then to standard error or to a log, if any."""
    logs = (os.path.join(folder, name) for top in LOGS for folder, _, names in os.walk(top)
            for name in names if name.endswith(".log"))
    for place in (COMPLAINTS, *logs):
        if os.path.isfile(place) and os.stat(place).st_mtime >= since and text_of(place).strip():
            return f"; the last line in {place} is: {text_of(place).strip().splitlines()[-1]}"
    return ""


def holders_of(pipe):
    """The commands that have this end of a pipe open."""
    holders = []
    for process, words in commands():
        try:
            folder = f"/proc/{process}/fd"
            if pipe in (os.readlink(f"{folder}/{number}") for number in os.listdir(folder)):
                holders.append(words)
        except OSError:
            continue
    return [holder for holder in holders if "answer.py" not in holder]


class Call:
    """The script at work, called as the program calls it for a port."""

    def __init__(self, words):
        self.words = words
        self.begun = time.time()
        with open(COMPLAINTS, "w") as complaints:
            self.shell = subprocess.Popen(
                [*AS_THE_SERVICE, "sh", "-c", f"{shlex.join([SCRIPT, *words])};printf '{STATUS}%s' $?"],
                start_new_session=True, stdin=subprocess.DEVNULL, stdout=subprocess.PIPE, stderr=complaints)
        self.said = []
        self.reader = threading.Thread(target=self.read, daemon=True)
        self.reader.start()

    def read(self):
        while part := os.read(self.shell.stdout.fileno(), 4096):
            self.said.append(part)

    def wait(self, seconds):
        """Returns whether the script has returned in this time. After that, `status`, `printed` and
        `holders` say how: these are the commands that still have its output open after a while.
        `outcome` is the status with all that tells why."""
        try:
            self.shell.wait(seconds)
        except subprocess.TimeoutExpired:
            return False
        self.reader.join(HELD_S)
        self.holders = holders_of(os.readlink(f"/proc/self/fd/{self.shell.stdout.fileno()}")) \
            if self.reader.is_alive() else []
        self.printed, _, self.status = b"".join(self.said).decode(errors="replace").rpartition(STATUS)
        self.outcome = f"its status is {self.status} after {time.time() - self.begun:.0f} seconds" + \
            last_words(self.begun)
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
