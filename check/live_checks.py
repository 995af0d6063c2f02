"""The checks of what the configuration script does, each in a box of its own.

Each row is a rule of the integrator's guide. The functions run in the box; `play` has one run there.
"""

import functools
import os
import re
import shutil
import signal
import subprocess

from checks import OWN_ADVICE, Check, Skip
from in_box import script
from in_box.meaning import brought_up_at_boot, meaning, settings_of
from in_box.panel import STEP_LIMIT_S, Operator, settings, to_page, wait_until, without_servers
from in_box.script import Call, addresses_of, files, gateways_of, servers, text_of
from play import BOX

# Of networks for measurements, which an appliance has no use for. The netmask is one that a script which
# passes over its argument would hardly take instead.
OLD, NEW, GATEWAY, MASK, PREFIX = "198.18.5.10", "198.18.5.11", "198.18.5.254", "255.255.240.0", 20
OTHER_NEW = "198.18.22.77"
NEVER_SET, NEVER_SET_NEW = "eth7", "198.18.55.77"  # a port that few appliances have
DHCP_SERVER, LEASE = "198.18.39.1", "198.18.39.100"
SERVERS = ["198.18.5.1", "198.18.5.2"]

SETTLE_S = 10  # for a change that is made after the script has returned
PATIENCE_S = 4  # for which a second script has to be seen waiting
TOUCHED = "/run/touched"
INJECTED = f";touch {TOUCHED}"

SOURCED, SOURCED_PORT = "/etc/network/sourced", "source-by-check"
# What a script could lose, for a file that does not have all of this.
PLANTED = f"""
allow-hotplug added-by-check
iface added-by-check inet static
    address 198.18.64.1
    netmask 255.255.255.0
    mtu 1400
    up true
iface added-by-check inet6 static
    address 2001:db8::1
    netmask 64
source {SOURCED}
"""
LEASE_SCRIPT = "etc/udhcpc/default.script"  # without which udhcpc does not set a port


def dns_words(servers):
    return [word for server in servers for word in ("--dns", server)]


class Trial:
    """What the checks try the script with: two ports, a DHCP server that answers on the first one, and
    how many seconds a change may take."""

    def __init__(self, port, other, limit):
        self.port = port
        self.other = other
        self.limit = limit
        self.statuses = set()
        script.watch_for_reboot()

    def begin(self, *words):
        return Call(list(words))

    def call(self, *words):
        call = self.begin(*words)
        if not call.wait(self.limit):
            raise GivenUp(f"{' '.join(words)}: it has not returned within {self.limit} seconds")
        self.statuses.add(call.status)
        return call

    def static_words(self, address=NEW, port=None, dns=()):
        gateway = [] if port else ["--gateway", GATEWAY]
        return ["iface", "--name", port or self.port, "--ipaddress", address, "--netmask", MASK,
                *gateway, *dns_words(dns)]

    def dhcp_words(self, dns=()):
        return ["iface", "--name", self.port, "--dhcp", *dns_words(dns)]

    def set_static(self, *arguments, **details):
        return self.call(*self.static_words(*arguments, **details))

    def stop_server(self):
        """From here on no DHCP server answers."""
        with open(f"/run/box/udhcpd.{self.port}.pid") as number:
            os.kill(int(number.read()), signal.SIGKILL)


class GivenUp(Exception):
    """What is wrong, after which nothing more can be tried."""


def faults_of(check, trial):
    """The faults that a check finds. That there are none says nothing of a script that refused all changes."""
    faults = []
    try:
        for fault in check.function(trial):
            faults.append(fault)
    except GivenUp as fault:
        faults.append(f"{fault}{OWN_ADVICE}mend this first: the rest of this check has not been made")
    if not faults and trial.statuses and "0" not in trial.statuses:
        raise Skip("the script has made no change")
    return faults


def shown(port):
    return " ".join(addresses_of(port)) or "no address"


def static_faults(trial, address=NEW, gateway=GATEWAY):
    if addresses_of(trial.port) != [f"{address}/{PREFIX}"]:
        yield f"{trial.port} has {shown(trial.port)} instead of {address}/{PREFIX}"
    if gateways_of(trial.port) != [gateway]:
        yield f"the default route of {trial.port} leads to {gateways_of(trial.port)} instead of {gateway}"


def prints_nothing(trial):
    for words in (trial.static_words(), trial.static_words("none"), trial.dhcp_words(),
                  ["hostname", "--hostname", "new-name"]):
        call = trial.call(*words)
        if call.printed:
            yield f"{' '.join(words)}: it has printed {call.printed[:80]!r}"


def holds_nothing(trial):
    for words in (trial.dhcp_words(), trial.static_words()):
        call = trial.call(*words)
        if call.holders:
            yield f"{' '.join(words)}: it has returned, but its output is open in: {'; '.join(call.holders)}"


def sets_address(trial):
    call = trial.set_static()
    if call.status != "0":
        yield call.outcome
    wait_until(lambda: not list(static_faults(trial)), SETTLE_S)
    yield from static_faults(trial)


def returns_when_made(trial):
    trial.set_static()
    at_return = list(static_faults(trial))
    if at_return and wait_until(lambda: not list(static_faults(trial)), SETTLE_S):
        yield f"when it returned, {at_return[0]}, and this was only right some time later"


def dhcp_faults(trial):
    if not re.search(rf"^iface {trial.port} inet dhcp$", text_of("/etc/network/interfaces"), re.M):
        yield f"/etc/network/interfaces has no line \"iface {trial.port} inet dhcp\" for the panel"


def takes_lease(trial):
    call = trial.call(*trial.dhcp_words())
    if call.status != "0":
        yield call.outcome
    before = shown(trial.port)

    def has_lease():
        return addresses_of(trial.port) == [f"{LEASE}/24"]

    if not has_lease() and wait_until(has_lease, SETTLE_S):
        yield f"when it returned, {trial.port} had {before}, and the lease alone only later: wait for it"
    elif not has_lease():
        yield f"{trial.port} has {before} instead of the lease {LEASE}/24"
    yield from dhcp_faults(trial)


def ends_client(trial):
    trial.call(*trial.dhcp_words())
    trial.set_static()
    if not wait_until(lambda: not script.clients_of(trial.port), SETTLE_S):
        clients = "; ".join(script.clients_of(trial.port))
        yield f"{trial.port} is static, and this still renews its lease: {clients}"


def gives_up_without_lease(trial):
    trial.set_static()
    trial.stop_server()
    call = trial.call(*trial.dhcp_words())
    if call.status == "0":
        yield from dhcp_faults(trial)


def takes_servers(trial):
    for words, wanted in ((trial.static_words(dns=SERVERS), SERVERS), (trial.static_words(), []),
                          (trial.dhcp_words(), [DHCP_SERVER]), (trial.dhcp_words(dns=SERVERS), SERVERS)):
        call = trial.call(*words)
        if call.status != "0":
            yield f"{' '.join(words)}: {call.outcome}"
        elif servers() != wanted:
            yield f"after {' '.join(words)} /etc/resolv.conf names {servers()} instead of {wanted}"


def puts_back(trial):
    def unwritable(folder):
        return (lambda: os.chmod(folder, 0o555)), (lambda: os.chmod(folder, 0o755))

    trial.set_static(OLD)
    before = files()
    for what, (hinder, help_again), words in (
            ("/etc/network cannot be written", unwritable("/etc/network"), trial.static_words(dns=SERVERS)),
            ("/etc cannot be written", unwritable("/etc"), trial.static_words(dns=SERVERS)),
            ("no DHCP server answers", (trial.stop_server, lambda: None), trial.dhcp_words(dns=SERVERS))):
        hinder()
        call = trial.call(*words)
        help_again()
        changed = [path for path, text in files().items() if text != before[path]]
        # One that writes in place may well succeed.
        if call.status != "0" and changed:
            yield f"{what}: it has failed with status {call.status} and left {' '.join(changed)} changed"
        if call.status == "0":
            if "--dhcp" not in words and NEW not in text_of("/etc/network/interfaces"):
                yield f"{what}: its status is 0, but nothing has been written"
        before = files()


def met_at_work(trial, words):
    """Begins a change, and returns when the script is about to run its first command that changes a port."""
    script.close_gate()
    call = trial.begin(*words)
    wait_until(lambda: script.somebody_waits() or call.shell.poll() is not None, trial.limit)
    if script.somebody_waits():
        return call
    if not call.wait(0):
        raise GivenUp(f"{' '.join(words)}: it has not returned within {trial.limit} seconds")
    if call.status != "0":
        raise GivenUp(f"{' '.join(words)}: {call.outcome}")
    raise Skip("the script changes ports without ip and ifconfig, so that it cannot be met at work")


def one_at_a_time(trial):
    first = met_at_work(trial, trial.static_words())

    def state():
        return files(), addresses_of(trial.other), second.shell.poll()

    before = files(), addresses_of(trial.other), None
    second = trial.begin(*trial.static_words(OTHER_NEW, trial.other))
    if wait_until(lambda: state() != before, PATIENCE_S):
        yield "a second script has returned or has made changes while the first was at work"
    script.open_gate()
    for call in (first, second):
        if not call.wait(trial.limit):
            yield f"{' '.join(call.words)}: it has not returned within {trial.limit} seconds"
    # With one port only, the second change replaces the first.
    for port, address in {trial.port: NEW, trial.other: OTHER_NEW}.items():
        if addresses_of(port) != [f"{address}/{PREFIX}"] or address not in text_of("/etc/network/interfaces"):
            yield f"when both should have returned, the change of {port} was not made"


# The keys from a port's page to another last octet, which is applied.
SET_NEW = "keys e d e e e e e u e d10\nhold enter 1\nrelease\n"


def goes_on(ending, trial):
    call = met_at_work(trial, trial.static_words(OLD))
    script.open_gate()
    call.wait(trial.limit)
    script.close_gate()
    operator = Operator(f"{to_page(OLD)}{SET_NEW}wait 3600\n")
    if not wait_until(script.somebody_waits, STEP_LIMIT_S):
        raise GivenUp(f"the panel has not called it to set {NEW}")
    ending(operator)
    # With the service its /tmp goes.
    subprocess.run("rm -rf /tmp/* /tmp/.[!.]*", shell=True)
    os.chmod("/tmp", 0o555)
    script.open_gate()

    def faults():
        yield from static_faults(trial)
        if NEW not in text_of("/etc/network/interfaces"):
            yield "/etc/network/interfaces does not have the new address"

    wait_until(lambda: not list(faults()), trial.limit)
    yield from faults()


def by_signal(number):
    def end(operator):
        operator.program.send_signal(number)
        operator.program.wait()
    return functools.partial(goes_on, end)


def unplug(operator):
    operator.emulator.kill()
    operator.emulator.wait()
    # As the service manager does when the device has gone.
    operator.program.terminate()
    operator.program.wait()


def refuses(trial):
    trial.set_static(OLD)
    static = trial.static_words
    refused = [
        [], ["nonsense"], ["iface", "--name", trial.port], ["iface", "--dhcp"], ["hostname"],
        ["iface", "--name", "eth99", "--dhcp"],
        ["iface", "--name", trial.port, "--ipaddress", NEW],
        static("198.18.5.300"), static("198.18.5"), static(NEW + INJECTED), static(f"$(touch {TOUCHED})"),
        static(f"{NEW}\n    up touch {TOUCHED}"), static() + ["--gateway", "none"],
        static() + ["--unknown", "1"],
        ["iface", "--name", trial.port, "--ipaddress", NEW, "--netmask", "255.0.255.0"],
        static(dns=[f"198.18.5.1\noptions {TOUCHED}"]), static(dns=["none" + INJECTED]),
        ["iface", "--name", trial.port + INJECTED, "--dhcp"], ["iface", "--name", "../../run/x", "--dhcp"],
        *(["hostname", "--hostname", name] for name in
          ("", "-a", "two words", "under_score\n", "a" * 65, f"a{INJECTED}", f"$(touch {TOUCHED})")),
    ]
    before = files(), addresses_of(trial.port)
    for words in refused:
        call = trial.call(*words)
        if call.status == "0":
            yield f"it has accepted {words}"
        if (files(), addresses_of(trial.port)) != before:
            yield f"{words} has changed the appliance, although the status is {call.status}"
            return
        if os.path.exists(TOUCHED):
            yield f"it has run the command in {words}"
            return
    if script.reboot_asked(0):
        yield "it has asked for a reboot with a name that is none"


def keeps_others(trial):
    if meaning(trial.port) is None:
        raise Skip("this machine has no ifupdown, which would say what the file means")
    # Without empty lines it means the same, and is harder to change.
    interfaces = re.sub(r"\n\s*\n", "\n", text_of("/etc/network/interfaces")) + PLANTED
    with open("/etc/network/interfaces", "w", encoding="utf-8", errors="surrogateescape") as file:
        file.write(interfaces)
    with open(SOURCED, "w", encoding="ascii") as file:
        file.write(f"iface {SOURCED_PORT} inet manual\n")
    others = {SOURCED_PORT, *re.findall(r"^\s*iface\s+(\S+)", interfaces, re.M)} - {trial.port}
    before = {name: settings_of(name) for name in sorted(others)}
    at_boot = brought_up_at_boot()
    other_before = meaning(trial.other)
    words = trial.static_words(dns=SERVERS)
    call = trial.call(*words)
    if call.status != "0":
        yield f"for a file without empty lines, {call.outcome}"
    # Elsewhere something other than ifupdown may bring the ports up.
    if trial.port in at_boot and NEVER_SET not in others:
        far_end = f"v-{NEVER_SET}"
        subprocess.run(["ip", "link", "add", NEVER_SET, "type", "veth", "peer", "name", far_end], check=False)
        if trial.call(*trial.static_words(NEVER_SET_NEW, NEVER_SET, SERVERS)).status == "0":
            at_boot.add(NEVER_SET)
    for name, settings_before in before.items():
        lost, new = settings_before - settings_of(name), settings_of(name) - settings_before
        if lost or new:
            yield f"{name} has lost {sorted(lost)}, and has got {sorted(new)}"
    for name in sorted(at_boot - brought_up_at_boot()):
        yield f"no line auto or allow-hotplug brings {name} up at boot"
    pages = [(trial.port, NEW)]
    if trial.other in before and other_before:
        subprocess.run(["ip", "addr", "flush", "dev", trial.other], check=False)
        subprocess.run(["ip", "addr", "add", f"{OTHER_NEW}/24", "dev", trial.other], check=False)
        pages.append((trial.other, OTHER_NEW))
    read = settings(pages)
    if read[0]["words"] != words[3:]:
        yield f"the panel reads {read[0]['words'] or read[0]['shown']} instead of what was set"
    if len(read) > 1:
        other = without_servers(read[1]["words"] or [])
        if other != other_before:
            shown_instead = other or read[1]["shown"]
            yield f"{trial.other}: the panel reads {shown_instead} instead of {other_before}"


def replaces_files(trial):
    first = trial.set_static(OLD, dns=SERVERS)
    held = {path: open(path, encoding="utf-8", errors="surrogateescape") for path in
            ("/etc/network/interfaces", "/etc/resolv.conf")}
    before = files()
    os.chmod("/tmp", 0o555)
    call = trial.set_static(NEW, dns=SERVERS[:1])
    if call.status != first.status:
        yield f"without /tmp, from which a file could not be renamed to its place, {call.outcome}"
    for path, file in held.items():
        if text_of(path) != before[path] and file.read() != before[path]:
            yield f"{path} is written in place: the panel may read a part of it"


def page_shows(trial):
    trial.set_static(OLD)
    limit = f"limit {trial.limit}\n"
    succeeded, said, _ = Operator(
        f'{to_page(OLD)}{limit}{SET_NEW}expect * "{NEW}"\n'
        f'keys e u e\nhold enter 1\nrelease\nexpect * "{LEASE}"\n').finish()
    if not succeeded:
        yield f"{trial.port} was to have {NEW} and then the lease {LEASE}, which the panel does not show:\n" \
            + said.strip()


def reboots(trial):
    # As the program calls it.
    command = f"`{script.SCRIPT} hostname --hostname new-name` &"
    subprocess.run([*script.AS_THE_SERVICE, "sh", "-c", command], check=False,
                   stdin=subprocess.DEVNULL, stdout=subprocess.DEVNULL, stderr=subprocess.DEVNULL)
    if not script.reboot_asked(trial.limit):
        yield "it has not asked for a reboot"
    if text_of("/etc/hostname").strip() != "new-name":
        yield f"/etc/hostname contains {text_of('/etc/hostname')!r} instead of the new name"


CHECKS = [
    Check("the script prints nothing", prints_nothing, "redirect its output before it does anything else"),
    Check("what the script leaves running does not hold its output", holds_nothing,
          "start DHCP clients and the like with their output redirected"),
    Check("the script sets a static address", sets_address,
          "set the address and the gateway, take the old ones away, and return 0"),
    Check("the script returns when the change has been made", returns_when_made,
          "wait until the port has its address"),
    Check("the script takes a lease", takes_lease, "start a DHCP client, and write the port's stanza"),
    Check("the script ends the DHCP client of a port that becomes static", ends_client,
          "end the port's DHCP client before anything is set: it would bring the lease back"),
    Check("the script gives up when no DHCP server answers", gives_up_without_lease,
          "give the DHCP client an end, such as udhcpc -n"),
    Check("the script takes the servers as the complete list", takes_servers,
          "replace all lines nameserver; with DHCP and without servers, keep those of the lease"),
    Check("the script puts the files back when it fails", puts_back,
          "keep copies before the first change, and put them back on every way out that is a failure"),
    Check("the script makes one change at a time", one_at_a_time,
          "take a lock before anything is read or changed"),
    *(Check(f"the script goes on when {what}", function,
            "write nothing to the panel, keep nothing in /tmp, and leave SIGHUP ignored")
      for what, function in (
                ("the program is stopped", by_signal(signal.SIGTERM)),
                ("the program is killed", by_signal(signal.SIGKILL)),
                ("the program crashes", by_signal(signal.SIGSEGV)),
                ("the panel is unplugged", functools.partial(goes_on, unplug)))),
    Check("the script refuses bad arguments", refuses,
          "check every argument before the first change, and end with another status than 0"),
    Check("the script keeps the stanzas of other ports", keeps_others,
          "replace only the port's own stanza, even without empty lines, write an empty line after each "
          "stanza, and add a line auto for a port that has none"),
    Check("the script replaces files in one step", replaces_files,
          "write a new file beside the old one, and rename it"),
    Check("the panel shows the new address", page_shows,
          "compare this with what kestrova-panel shows on panel-emulator(1) with this script"),
    Check("the script changes the host name and reboots", reboots,
          "write /etc/hostname, and call reboot, shutdown or systemctl reboot"),
]


def play(check, subject, limit):
    """Has a check run in a box of its own. Returns the faults, or the reason why it is skipped."""
    names = [name for name in subject.ports if name.startswith("eth")] or ["eth0"]
    port, other = names[0], names[:2][-1]
    stage = subject.stage.copy(subject.work)
    # The commands are this machine's, and udhcpc may not be the DHCP client of the image.
    if not os.path.isfile(f"{stage.directory}/{LEASE_SCRIPT}"):
        with open(f"{os.path.dirname(BOX)}/appliance/{LEASE_SCRIPT}", encoding="ascii") as own:
            stage.write(LEASE_SCRIPT, own.read(), 0o755)
    addresses = {**dict.fromkeys((port, other), "-"), **subject.ports}
    stage.write("links", "".join(f"{name} {address}{f' dhcp {DHCP_SERVER}/24' if name == port else ''}\n"
                                 for name, address in addresses.items()))
    answer = stage.ask("live", name=check.name, trial={"port": port, "other": other, "limit": limit})
    shutil.rmtree(stage.directory)
    return answer.get("faults", []), answer.get("skip")
