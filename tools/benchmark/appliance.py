"""Appliances for the box: as it stands, or grown; the program lies in each of them."""

import os
import shutil

PROGRAM = "/opt/kestrova/bench/kestrova-panel"  # inside the box
STANZA = "iface {name} inet static\n    address 10.{a}.{b}.1\n    netmask 255.255.255.0\n\n"


def make(folder, usual, program, ports=0, ports_with_address=0, interfaces_bytes=0):
    """A copy of the appliance `usual` with `program`; with `ports` others than its own."""
    shutil.copytree(usual, folder)
    os.mkdir(f"{folder}/{os.path.dirname(PROGRAM)[1:]}")
    shutil.copy(program, f"{folder}{PROGRAM}")
    if not ports:
        return folder
    addresses = [(f"eth{port}", port // 250, port % 250) for port in range(ports)]
    with open(f"{folder}/links", "w") as links:
        for port, (name, a, b) in enumerate(addresses):
            links.write(f"{name} {f'10.{a}.{b}.1/24' if port < ports_with_address else '-'}\n")
    # Backwards, so that the first port's settings are the last that the program finds.
    stanzas = [STANZA.format(name=name, a=a, b=b) for name, a, b in reversed(addresses)]
    comments = "# kept for the next technician\n" * (
        max(0, interfaces_bytes - sum(map(len, stanzas))) // 31)
    with open(f"{folder}/etc/network/interfaces", "w") as interfaces:
        interfaces.write(comments + "".join(stanzas))
    return folder
