#!/usr/bin/python3
"""Applies what an operator has set at the front panel.

The integrator's guide describes how the panel program calls a configuration script and what such a
script has to do.

The exit status of this one is 0 if everything has been applied, 1 if something has failed, and 2 if
the arguments were refused. After a failure or a refusal the configuration files are as they were
before, and apply.log beside this file gives the reason.
"""

import argparse
import contextlib
import fcntl
import ipaddress
import logging
import os
import re
import select
import signal
import socket
import subprocess
import sys
import time
from pathlib import Path

INTERFACES = Path("/etc/network/interfaces")
RESOLV_CONF = Path("/etc/resolv.conf")
HOSTNAME = Path("/etc/hostname")
LOG = Path(__file__).resolve().parent / "apply.log"
LOCK = Path("/run/kestrova-apply.lock")

HOST_NAME_MAX = 64  # the kernel's limit
TOOL_TIMEOUT_S = 20
LOCK_TIMEOUT_S = 60
LOCK_LOOK_S = 0.1
DHCP_DISCOVERS = 3
DHCP_DISCOVER_PAUSE_S = 2

STANZA_WORDS = {"iface", "mapping", "auto", "source", "source-directory", "no-auto-down",
                "no-scripts"}


class Refused(Exception):
    """The arguments make no sense, and nothing has been changed."""


class Failed(Exception):
    """The arguments are valid but could not be applied."""


class Parser(argparse.ArgumentParser):
    """Reports errors by an exception, and prints nothing on standard output."""

    def __init__(self, **options):
        super().__init__(allow_abbrev=False, **options)

    def error(self, message):
        raise Refused(message)

    def _print_message(self, message, file=None):
        super()._print_message(message, sys.stderr)


def port_name(text):
    ports = {name for _, name in socket.if_nameindex()}
    if not text.startswith("eth") or text not in ports:
        raise argparse.ArgumentTypeError(f"there is no port '{text}'")
    return text


def host_address(text):
    address = ipaddress.IPv4Address(text)
    if address.is_unspecified or address.is_loopback or address.is_multicast:
        raise argparse.ArgumentTypeError(f"{text} is not the address of a host")
    return address


def netmask(text):
    mask = ipaddress.IPv4Address(text)
    host_bits = ~int(mask) & 0xFFFFFFFF
    if mask.is_unspecified or host_bits & (host_bits + 1):
        raise argparse.ArgumentTypeError(f"{text} is not a netmask")
    return mask


def host_name(text):
    label = r"[A-Za-z0-9]([A-Za-z0-9-]{0,61}[A-Za-z0-9])?"
    if len(text) > HOST_NAME_MAX or not re.fullmatch(rf"{label}(\.{label})*", text):
        raise argparse.ArgumentTypeError(f"'{text}' is not a host name")
    return text


def parse(arguments):
    """Returns the checked arguments, or raises Refused."""
    parser = Parser(description=__doc__, formatter_class=argparse.RawDescriptionHelpFormatter)
    actions = parser.add_subparsers(dest="action", required=True)

    iface = actions.add_parser("iface")
    iface.add_argument("--name", type=port_name, required=True)
    method = iface.add_mutually_exclusive_group(required=True)
    method.add_argument("--dhcp", action="store_true")
    method.add_argument("--ipaddress", type=host_address)
    iface.add_argument("--netmask", type=netmask)
    iface.add_argument("--gateway", type=host_address)
    iface.add_argument("--dns", type=host_address, action="append", default=[])

    hostname = actions.add_parser("hostname")
    hostname.add_argument("--hostname", type=host_name, required=True)

    settings = parser.parse_args(arguments)
    if settings.action == "iface":
        check_together(settings)
    return settings


def check_together(settings):
    """Refuses values that are valid by themselves but not together."""
    if settings.dhcp:
        if settings.netmask or settings.gateway:
            raise Refused("--dhcp cannot be combined with --netmask or --gateway")
        return
    if not settings.netmask:
        raise Refused("--ipaddress needs a --netmask")
    network = ipaddress.IPv4Network(f"{settings.ipaddress}/{settings.netmask}", strict=False)
    # Networks of one and two addresses have neither a network address nor a broadcast address.
    if network.num_addresses > 2 and settings.ipaddress in (network.network_address,
                                                            network.broadcast_address):
        raise Refused(f"{settings.ipaddress} is not a host of {network}")
    if settings.gateway and (settings.gateway not in network
                             or settings.gateway == settings.ipaddress):
        raise Refused(f"the gateway {settings.gateway} cannot be reached from {network}")


def stanza(settings):
    if settings.dhcp:
        return [f"iface {settings.name} inet dhcp"]
    lines = [f"iface {settings.name} inet static",
             f"    address {settings.ipaddress}",
             f"    netmask {settings.netmask}"]
    if settings.gateway:
        lines.append(f"    gateway {settings.gateway}")
    return lines


def with_stanza(text, port, new_stanza):
    """Returns the interfaces file `text` with the port's IPv4 stanza replaced, or added at the end.

    Other stanzas and all comments are kept. An empty line follows every stanza, because the panel
    program takes nothing else for the end of a stanza.
    """
    result = []
    placed = in_stanza = own = automatic = False
    for line in text.splitlines():
        words = line.split()
        comment = line.lstrip().startswith("#")
        if words and (words[0] in STANZA_WORDS or words[0].startswith("allow-")):
            if in_stanza:
                result.append("")
            automatic |= words[0] in ("auto", "allow-hotplug") and port in words
            own = words[:3] == ["iface", port, "inet"]
            in_stanza = words[0] in ("iface", "mapping") and not (own and placed)
            if own and not placed:
                result += new_stanza
                placed = True
        elif not words:
            in_stanza = in_stanza and line != ""
        if not own or comment or not words:
            result.append(line)
    if not placed:
        if result and result[-1]:
            result.append("")
        result += ([] if automatic else [f"auto {port}"]) + new_stanza
    return "\n".join(result) + "\n"


def with_servers(text, servers):
    """Returns the resolver file `text` with its name servers replaced."""
    kept = [line for line in text.splitlines() if line.split()[:1] != ["nameserver"]]
    return "".join(f"{line}\n" for line in kept + [f"nameserver {server}" for server in servers])


def read(path):
    try:
        return path.read_text(encoding="utf-8", errors="surrogateescape")
    except FileNotFoundError:
        return ""


@contextlib.contextmanager
def replacing(path, text):
    """Writes `text` to disk beside `path`. The new file replaces the old one in one step if the block
    succeeds, and is removed if it fails."""
    path = path.resolve()
    ready = path.with_name(f".{path.name}.new")
    try:
        with open(ready, "w", encoding="utf-8", errors="surrogateescape") as file:
            file.write(text)
            file.flush()
            os.fsync(file.fileno())
        yield
        os.rename(ready, path)
    finally:
        ready.unlink(missing_ok=True)
    directory = os.open(path.parent, os.O_DIRECTORY)
    try:
        os.fsync(directory)
    finally:
        os.close(directory)


def run(*command, **environment):
    """Runs a tool. What it prints goes to the log, even from a daemon that it leaves running."""
    logging.info("run: %s", " ".join(command))
    with open(LOG, "ab") as log:
        subprocess.run(command, stdin=subprocess.DEVNULL, stdout=log, stderr=log, check=True,
                       timeout=TOOL_TIMEOUT_S, env={**os.environ, **environment})


@contextlib.contextmanager
def no_other_at_work():
    """Holds the lock during the block. Processes started in the block do not inherit it, because a
    DHCP client would never release it."""
    with open(LOCK, "ab") as lock:
        try:
            fcntl.flock(lock, fcntl.LOCK_EX | fcntl.LOCK_NB)
        except BlockingIOError:
            logging.info("waiting: another change is being applied")
            wait_for_lock(lock)
        yield


def wait_for_lock(lock):
    give_up = time.monotonic() + LOCK_TIMEOUT_S
    while time.monotonic() < give_up:
        time.sleep(LOCK_LOOK_S)
        with contextlib.suppress(BlockingIOError):
            fcntl.flock(lock, fcntl.LOCK_EX | fcntl.LOCK_NB)
            return
    raise Failed("the other change has taken too long")


def stop_dhcp_client(port):
    for process in Path("/proc").glob("[0-9]*"):
        with contextlib.suppress(OSError):  # the process may end in the meantime
            words = (process / "cmdline").read_bytes().split(b"\0")
            if not words[0].endswith(b"udhcpc") or port.encode() not in words:
                continue
            client = os.pidfd_open(int(process.name))
            try:
                signal.pidfd_send_signal(client, signal.SIGTERM)
                if not select.select([client], [], [], TOOL_TIMEOUT_S)[0]:
                    raise Failed(f"the DHCP client of {port} has not ended")
            finally:
                os.close(client)


def bring_up_dhcp(settings):
    run("ip", "link", "set", settings.name, "up")
    run("udhcpc", "-i", settings.name, "-n", "-t", str(DHCP_DISCOVERS),
        "-T", str(DHCP_DISCOVER_PAUSE_S), "-s", "/etc/udhcpc/default.script",
        OPERATOR_DNS="yes" if settings.dns else "no")


def bring_up_static(settings):
    # Otherwise the address of an earlier lease would stay beside the new one.
    run("ip", "-4", "addr", "flush", "dev", settings.name)
    run("ifconfig", settings.name, str(settings.ipaddress), "netmask", str(settings.netmask), "up")
    if settings.gateway:
        run("ip", "-4", "route", "replace", "default", "via", str(settings.gateway),
            "dev", settings.name)


def apply_iface(settings):
    with contextlib.ExitStack() as files:
        files.enter_context(replacing(
            INTERFACES, with_stanza(read(INTERFACES), settings.name, stanza(settings))))
        # If the operator has set no servers, the lease brings its own.
        if settings.dns or not settings.dhcp:
            files.enter_context(replacing(
                RESOLV_CONF, with_servers(read(RESOLV_CONF), settings.dns)))
        stop_dhcp_client(settings.name)
        if settings.dhcp:
            bring_up_dhcp(settings)
        else:
            bring_up_static(settings)


def apply_hostname(settings):
    with replacing(HOSTNAME, f"{settings.hostname}\n"):
        run("hostname", settings.hostname)
    run("reboot")


def main(arguments):
    try:
        logging.basicConfig(filename=LOG, level=logging.INFO,
                            format="%(asctime)s [%(process)d] %(message)s")
    except OSError as error:
        print(f"apply.py: {error}", file=sys.stderr)
        return 1
    logging.info("asked: %s", " ".join(arguments))
    try:
        settings = parse(arguments)
        with no_other_at_work():
            if settings.action == "iface":
                apply_iface(settings)
            else:
                apply_hostname(settings)
    except Refused as error:
        logging.error("refused: %s", error)
        return 2
    except (Failed, OSError, subprocess.SubprocessError) as error:
        logging.error("failed: %s", error)
        return 1
    logging.info("done")
    return 0


if __name__ == "__main__":
    sys.exit(main(sys.argv[1:]))
