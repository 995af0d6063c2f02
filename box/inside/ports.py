#!/usr/bin/python3 -BIS
"""The appliance's network ports: what is checked of them, and how one is made.

As a command: prints what `ip -batch` makes the port NAME of.
"""

import ipaddress
import re
import sys

INTERFACE_NAME_MAX = 15


def far_end(name):
    """The name of the veth's far end. It contains a "v", so that the program leaves it out of its list."""
    return None if name.startswith("bridge") else f"v-{name}"


def check_name(name):
    if not re.fullmatch("[A-Za-z0-9][A-Za-z0-9_.-]*", name):
        raise ValueError(f"'{name}' is not a name for a port")
    if len(name) > INTERFACE_NAME_MAX:
        raise ValueError(f"the name '{name}' has more than {INTERFACE_NAME_MAX} characters")


def commands_to_make(name):
    """Lines for `ip -batch` that make a port without an address."""
    far = far_end(name)
    commands = [f"link add {name} type veth peer name {far}" if far else f"link add {name} type bridge"]
    for link in (far, name) if far else (name,):
        # Otherwise each link that is up would give itself an IPv6 address.
        commands += [f"link set {link} addrgenmode none", f"link set {link} up"]
    return commands


class Ports:
    """The ports that a file `links` lists, turned into input for `ip -batch` and udhcpd.

    Raises ValueError with the file, the line and what is wrong there."""

    def __init__(self, path):
        self.batch = ["link set lo up"]
        self.servers = {}  # port: configuration of its DHCP server
        self.names = {"lo"}
        with open(path, encoding="latin-1") as links:
            for number, line in enumerate(links, 1):
                words = line.split()
                if words and not words[0].startswith("#"):
                    try:
                        self.add(*self.fields(words))
                    except ValueError as fault:
                        raise ValueError(f"{path}, line {number}: {fault}") from None

    def fields(self, words):
        if len(words) not in (2, 4):
            raise ValueError("this is neither NAME ADDRESS/PREFIX (or -) nor the same with dhcp SERVER/24")
        return words + [None] * (4 - len(words))

    def add(self, name, address, service, server):
        far = far_end(name)
        self.claim(name)
        if far:
            self.claim(far)
        self.batch += commands_to_make(name)
        if address != "-":
            self.batch.append(f"addr add {checked_interface(address)} broadcast + dev {name}")
        if service is None:
            return
        if service != "dhcp":
            raise ValueError(f"the service '{service}' of port {name} is not known")
        if not far:
            raise ValueError(f"the bridge {name} has no far end for a DHCP server")
        self.serve(name, far, server)

    def claim(self, name):
        check_name(name)
        if name in self.names:
            raise ValueError(f"there already is a port {name}")
        self.names.add(name)

    def serve(self, name, far, server):
        """Serves a /24 network, and leases nothing but .100, so that a journey can name the lease."""
        address = checked_interface(server)
        lease = address.network.network_address + 100
        if address.network.prefixlen != 24 or address.ip == lease:
            raise ValueError(f"'{server}' is not a DHCP server's address: it needs /24, and leases .100 itself")
        self.batch.append(f"addr add {address} dev {far}")
        self.servers[name] = f"""\
interface {far}
start {lease}
end {lease}
lease_file /run/box/udhcpd.{name}.leases
pidfile /run/box/udhcpd.{name}.pid
option subnet 255.255.255.0
option router {address.ip}
option dns {address.ip}
option lease 3600
"""


def checked_interface(text):
    if not re.fullmatch(r"[0-9.]+/[0-9]+", text):
        raise ValueError(f"'{text}' is not an ADDRESS/PREFIX")
    try:
        interface = ipaddress.IPv4Interface(text)
    except ValueError:
        raise ValueError(f"'{text}' is not an ADDRESS/PREFIX") from None
    if interface.ip.is_unspecified or interface.ip.is_multicast:
        raise ValueError(f"{interface.ip} cannot be the address of a port")
    return interface


if __name__ == "__main__":
    try:
        for each in filter(None, (sys.argv[1], far_end(sys.argv[1]))):
            check_name(each)
    except ValueError as fault:
        sys.exit(f"appliance: {fault}")
    print(*commands_to_make(sys.argv[1]), sep="\n")
