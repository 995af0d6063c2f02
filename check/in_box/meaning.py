"""What the interfaces file means to ifupdown, which is asked by its own tools."""

import ipaddress
import re
import shutil
import subprocess

INTERFACES = "/etc/network/interfaces"
IPV4_BITS = 32


def ask(*command):
    return subprocess.run([*command, "--interfaces", INTERFACES], stdin=subprocess.DEVNULL,
                          capture_output=True, text=True, errors="surrogateescape")


def is_ipv6(option, value):
    return ":" in value or option == "netmask" and value.isdigit() and int(value) > IPV4_BITS


def steps_of_ifup(port):
    said = ask("ifup", "--no-act", "--force", "--no-scripts", port)
    return said.stdout + said.stderr


def complaint(port):
    """Why ifupdown cannot bring the port up by its stanza, or "". That there is none is no fault."""
    refused = re.search(r"^ifup: (.*)\nifup: (?:couldn't read|missing required configuration)",
                        steps_of_ifup(port), re.M)
    return refused[1] if refused else ""


def settings_of(port):
    """All that the file says about a port, of whatever kind: its options, and what ifup would do."""
    return set(filter(str.strip, (ask("ifquery", port).stdout + steps_of_ifup(port)).split("\n")))


def brought_up_at_boot():
    listed = (ask("ifquery", "--list", f"--allow={when}").stdout for when in ("auto", "hotplug"))
    return set("".join(listed).split())


def meaning(port):
    """The port's IPv4 settings as words of the configuration script, [] if it has none, or None
    without ifupdown. Others have an ifquery, too, which prints something else."""
    if not shutil.which("ifquery") or not ask("ifquery", "--version").stdout.startswith("ifquery version"):
        return None
    # What is printed for a stanza comes in the order of the file, so that an IPv4 stanza's values are
    # the last that are not those of IPv6.
    values = {}
    for option, value in re.findall(r"^(address|netmask|gateway): (.*)$", ask("ifquery", port).stdout, re.M):
        if not is_ipv6(option, value):
            values[option] = value
    if "address" in values:
        netmask = values.get("netmask", "")
        if netmask.isdigit():
            netmask = str(ipaddress.ip_network(f"0.0.0.0/{netmask}").netmask)
        words = ["--ipaddress", values["address"], "--netmask", netmask]
        return words + (["--gateway", values["gateway"]] if "gateway" in values else [])
    takes_lease = re.search("udhcpc|dhclient|dhcpcd|pump|DHCP client", steps_of_ifup(port))
    return ["--dhcp"] if takes_lease else []
