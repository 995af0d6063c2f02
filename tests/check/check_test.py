#!/usr/bin/python3
"""Plants one fault after the other in an appliance, or in the script of one, and wants each to be found by
the check that is for it. The first argument is the folder of kestrova-panel and panel-emulator; without
it, what is installed is tested.
"""

import concurrent.futures
import os
import re
import shutil
import signal
import subprocess
import sys
import tempfile
import unittest
from pathlib import Path
from subprocess import PIPE, Popen

ROOT = Path(__file__).resolve().parents[2]
CHECK = ["kestrova-appliance-check"]
if sys.argv[1:] and Path(sys.argv[1]).is_dir():
    CHECK = [ROOT / "check" / CHECK[0], "--programs", sys.argv.pop(1)]
SCRIPT = "opt/kestrova/scripts/ezio/apply.py"

# An image is an appliance with these. The commands need not work, because the check only looks for them.
IMAGE = r"""
mkdir -p usr/bin usr/lib/systemd/system etc/sysctl.d etc/systemd/system/dev-ttyS1.device.wants tmp \
    usr/lib/systemd/network usr/lib/udev/rules.d etc/udev/rules.d etc/default boot/grub
ln -s usr/bin bin; ln -s usr/lib lib; touch usr/lib/systemd/systemd
for tool in stty ifconfig hostname awk sed grep egrep sort tr head cat env kill; do
    printf '#!/bin/sh\n' >bin/$tool; chmod +x bin/$tool; done
cp --parents -L $(ldd /bin/bash /bin/dash | grep -oE '/[^ :]+' | sort -u) /bin/dash . 2>/dev/null
cp /usr/bin/python3 bin/python3; cp /bin/dash bin/sh
printf '[Install]\nWantedBy=dev-ttyS1.device\n' >lib/systemd/system/kestrova-panel.service
ln -s /usr/lib/systemd/system/kestrova-panel.service etc/systemd/system/dev-ttyS1.device.wants/
for port in eth0 eth1 eth2 eth5 bridge0; do
    echo net.ipv6.conf.$port.disable_ipv6 = 1; done >etc/sysctl.d/6.conf
echo NamePolicy=keep kernel path >usr/lib/systemd/network/99-default.link
echo 'IMPORT{builtin}="net_setup_link"' >usr/lib/udev/rules.d/80-net-setup-link.rules
echo 'GRUB_CMDLINE_LINUX="quiet net.ifnames=0"' >etc/default/grub
echo 'KERNEL=="ttyS1", GROUP="dialout"' >etc/udev/rules.d/line.rules
echo After=dev-ttyS1.device >etc/systemd/system/helper.service
ln -s /dev/null etc/systemd/system/serial-getty@ttyS1.service
"""
# Stanzas of the ports eth0, eth1 and so on, one directly behind the other, and what is wrong with each.
GOOD = "iface PORT inet static\n  address ADDRESS\n  netmask 255.255.255.0\n\n"
STANZAS = [
    (GOOD.replace("\n\n", "\n"), "no empty line follows"),
    (GOOD, None),
    ("iface PORT inet6 auto\n\n" + GOOD, "inet6 stanza comes first"),
    (" " + GOOD, "blank before iface"),
    (GOOD.replace("iface ", "iface\t"), "a tab or more"),
    ("iface PORT inet dhcp # here\n\n", "comment on the iface line"),
    ("iface PORT inet dhcp \n\n", "blank at the end of the iface line"),
    (GOOD.replace("ADDRESS", "ADDRESS # here"), "comment behind a value"),
    (GOOD.replace("  address ", "\taddress\t"), "tab before a value"),
    (GOOD.replace("ADDRESS", "ADDRESS "), "blank at the end of a line"),
    (GOOD.replace("ADDRESS", "ADDRESS/24"), "prefix length"),
    ("iface PORT inet static\n  address ADDRESS\n\n", "no netmask"),
    (GOOD.replace("\n\n", "\n  hwaddress ether 02:00:00:00:00:01\n\n"), "another line"),
    (GOOD.replace("\n\n", "\n  up route add 10.1.1.1 netmask 255.255.255.255 lo\n\n"), "another line"),
    (GOOD.replace("255.255.255.0", "24"), "number of bits"),
    (GOOD.replace("\n", "\r\n"), "carriage return"),
    (GOOD.replace("ADDRESS", "\\\n  ADDRESS"), "goes on in the next"),
    (GOOD.replace("\n\n", "\n \niface lo inet static\n  address 127.0.0.2\n\n"), "line of blanks"),
    ("source /etc/network/interfaces.d/*\n", "source line"),
]
SERVERS = r"""{ printf 'nameserver\t9.9.9.9\nnameserver 2001:db8::1\n'
printf 'nameserver 127.0.0.53\nnameserver 9.9.9.9 \n'
seq -f 'nameserver 9.9.9.%g' 8; } >etc/resolv.conf"""

# How an appliance is broken, by which check this is found, and what the check says, each in a line.
APPLIANCES = [
    (f"mv {SCRIPT} {SCRIPT}.sh", "configuration script", ["is missing; beside .*: apply.py.sh"]),
    (f"chmod -x {SCRIPT}; sed -i '1s/$/\\r/' {SCRIPT}", "configuration script",
     ["not executable", r"python3\\r' does not"]),
    (f"rm {SCRIPT}; mkdir {SCRIPT}", "configuration script", ["is a directory"]),
    (f"echo '#!/usr/bin/env python9' >{SCRIPT}", "configuration script", ["'python9' is not in PATH"]),
    ("rm etc/ma-platform; mkfifo etc/ma-platform; ln -sf /dev/zero etc/resolv.conf; cd opt/kestrova; rm seq*; "
     "mkdir seq.site_conn; truncate -s 9G config/nis.config; ln -sf interfaces ../../etc/network", "ordinary",
     ["ma-platform is a FIFO", "interfaces is a link that leads back",
      "resolv.conf leads to /dev/zero", "_conn is a directory", "9663676416 bytes"]),
    ("echo two words >etc/hostname", "host name is", ["does not contain a host name"]),
    ("echo enp3s0 192.0.2.1/24 >links", "ports can", ["no port whose name begins with eth"]),
    ("rm links; mkfifo links", "ports can", ["links is not an ordinary file"]),
    ("echo Q75 >etc/ma-platform", "model", ["begins with 'Q75'"]),
    ("for name in enp3s0 bridge2 eth10 eth9 eth0 eth0.7 evil0; do echo $name -; done >links", "label",
     ["enp3s0 has no page", "bridge2 has no label", "eth10 has the label E1", "eth9 has no label",
      "eth0 has the label E0", "eth0.7 has the label E0", "evil0 has no page"]),
    ("cp ../stanzas etc/network/interfaces; cp -R ../interfaces.d etc/network; cp ../links .", "settings",
     [f"eth{number}: the panel .*{cause}" for number, (_, cause) in enumerate(STANZAS) if cause]),
    ("rm -r etc/network; ln -s nowhere etc/network; mkdir opt/appliance-check", "settings",
     ["is missing or empty"]),
    ("echo address 192.0.2.1 >etc/network/interfaces", "settings", ["ifupdown refuses it: .*misplaced"]),
    ("printf 'iface eth1 inet static\\n' >etc/network/interfaces", "settings", ["eth1: .*variable: address"]),
    (SERVERS, "servers are", [r"nameserver\\t9.9.9.9' is not", "2001:db8::1 has an IPv6", "53 is a resolver",
                              "9.9.9.9 ' is not", "there are 12 servers", "the panel hands on"]),
    ("ln -sf ../run/systemd/resolve/stub-resolv.conf etc/resolv.conf", "servers are",
     ["resolver on the appliance"]),
    (IMAGE + "cp /bin/bash bin/sh; rm bin/ifconfig bin/kill", "shell",
     ["does not turn", "ifconfig is missing", "kill is missing"]),
    (IMAGE + "printf '#!/bin/dash\nwhile :; do :; done' >bin/sh", "shell", ["not ended within"]),
    (IMAGE + "sed -i 's/^/#/' etc/default/grub", "get the names", ["ports eth0 eth1 eth2 eth5 these names"]),
    (IMAGE + "echo net.ipv6.conf.eth1.disable_ipv6=0 >etc/sysctl.d/z.conf; touch etc/sysctl.d/z.conf.off;"
     "echo '#ipv6.disable=1' >etc/default/grub", "IPv6", ["nothing switches IPv6 off for eth1:"]),
    (IMAGE + "mkdir etc/systemd/network; cd etc/systemd/network; touch 1.network; rm ../../sysctl.d/6.conf;"
     "echo LinkLocalAddressing=no >2.network", "IPv6", ["1.network leaves IPv6 on"]),
    (IMAGE + "mkdir etc/systemd/system/getty.target.wants; echo console=ttyS1 >etc/default/grub;"
     "echo serial --port=0x2f8 >boot/grub/grub.cfg; sed -i 's/GROUP/RUN+/' etc/udev/rules.d/line.rules;"
     "ln -s /dev/null etc/systemd/system/getty.target.wants/getty@ttyS1.service", "serial",
     ["default/grub uses the line", "grub.cfg uses", "line.rules uses", "starts a login prompt"]),
    (IMAGE + "rm -r etc/systemd/system/dev*", "service", ["kestrova-panel.service is disabled"]),
]

# A line of the stand-in's script, what stands there instead, and what finds it.
SCRIPTS = [
    ('logging.info("done")', 'if "--dhcp" in arguments: sys.stdout.write("0")', "prints nothing"),
    ("        if settings.dhcp:\n", '        subprocess.Popen(["sleep", "300"])\n        if settings.dhcp:\n',
     "hold its output"),
    ("    if settings.gateway:\n        run(", "    if False:\n        run(", "sets a static"),
    ('str(settings.netmask), "up")', '"255.255.255.0", "up")', "sets a static"),
    ("    try:\n        logging", '    os.environ["HOME"]\n    try:\n        logging', "sets a static"),
    ("def main(arguments):\n",
     "def main(arguments):\n    if os.fork():\n        return 0\n    os.close(1)\n    time.sleep(1)\n",
     "returns when"),
    ("            bring_up_dhcp(settings)", "            pass", "takes a lease"),
    ("            bring_up_dhcp(settings)", '            bring_up_dhcp(settings)\n'
     '            run("ip", "addr", "add", "192.0.2.7/24", "dev", settings.name)', "takes a lease"),
    ('"done")\n    return 0', '"done")\n    return int("--dhcp" in arguments)', "takes a lease"),
    ("        stop_dhcp_client(settings.name)\n        if", "        if", "ends the DHCP client"),
    ("str(DHCP_DISCOVERS)", '"99"', "gives up"),
    ('"failed: %s", error)\n        return 1', '"")\n        return 0', "gives up"),
    ('"failed: %s", error)\n        return 1', '"")\n        return 0', "puts the files back"),
    ('if line.split()[:1] != ["nameserver"]]', "]", "complete list"),
    ("        yield\n        os.rename(ready, path)", "        os.rename(ready, path)\n        yield",
     "puts the files back"),
    ("with no_other_at_work():", "if True:", "one change at a time"),
    ("    try:\n        logging", "    signal.signal(signal.SIGHUP, signal.SIG_DFL)\n    try:\n        logging",
     "goes on"),
    ('    run("ifconfig"', '    open("/tmp/x", "w")\n    run("ifconfig"', "is killed"),
    ('    run("ifconfig"', '    print("up", flush=True)\n    run("ifconfig"', "crashes"),
    ("        return 2\n", "        return 0\n", "refuses"),
    ('own = words[:3] == ["iface", port, "inet"]', 'own = words[:1] == ["iface"]', "other ports"),
    ('                result.append("")', "                pass", "other ports"),
    ("        if not own or", '        if words[:1] != ["mtu"] and not own or', "other ports"),
    ("        if not own or", '        if words[:1] != ["source"] and not own or', "other ports"),
    ('[f"auto {port}"]', "[]", "other ports"),
    ("os.rename(ready, path)", "path.write_text(ready.read_text())", "one step"),
    ('str(settings.netmask), "up")', 'str(settings.netmask), "down")', "panel shows"),
    ('run("reboot")', 'run("shutdown", "-h", "now")', "reboots"),
]


class Checked(unittest.TestCase):
    def setUp(self):
        self.work = Path(tempfile.mkdtemp())
        self.addCleanup(shutil.rmtree, self.work)

    def appliance(self, name, change):
        """The project's own appliance, after a shell has changed it."""
        appliance = self.work / name
        shutil.copytree(ROOT / "box/appliance", appliance)
        subprocess.run(["sh", "-ec", change], cwd=appliance, check=True)
        return appliance

    def check(self, name, change, *options):
        """The status and the output for a changed appliance."""
        done = subprocess.run([*CHECK, *options, self.appliance(name, change)], capture_output=True, text=True)
        return done.returncode, done.stdout + done.stderr

    def at_once(self, cases):
        """Plays the checks side by side, because they mostly wait."""
        with concurrent.futures.ThreadPoolExecutor(len(cases)) as pool:
            return pool.map(lambda case: self.check(*case), cases)

    def test_faults_of_appliances(self):
        stanzas = [stanza.replace("PORT", f"eth{number}").replace("ADDRESS", f"10.0.{number}.1")
                   for number, (stanza, _) in enumerate(STANZAS)]
        (self.work / "stanzas").write_text("".join(stanzas), encoding="utf-8")
        (self.work / "links").write_text("".join(f"eth{number} -\n" for number in range(len(STANZAS))))
        (self.work / "interfaces.d").mkdir()
        (self.work / "interfaces.d/more").write_text(GOOD.replace("PORT", f"eth{len(STANZAS) - 1}"))
        cases = [(f"{number}", change, "--only", name) for number, (change, name, _) in enumerate(APPLIANCES)]
        for (_, name, said), (status, output) in zip(APPLIANCES, self.at_once(cases)):
            with self.subTest(name):
                self.assertRegex(output, rf"^TAP version 13\n1..1\nnot ok 1 - .*{name}.*\n")
                found = re.findall("^# (?!->).*", output, re.M)
                self.assertEqual((status, len(found)), (1, len(said)), output)
                for each in said:
                    self.assertRegex(output, each)

    def test_faults_of_scripts(self):
        text = (ROOT / "box/appliance" / SCRIPT).read_text(encoding="utf-8")
        cases = []
        for number, (old, new, name) in enumerate(SCRIPTS):
            self.assertIn(old, text)
            (self.work / f"{number}.py").write_text(text.replace(old, new, 1), encoding="utf-8")
            change = f"cp ../{number}.py {SCRIPT}"
            cases.append((f"{number}", change, "--live", "--limit", "12", "--only", name))
        for (old, _, name), (status, output) in zip(SCRIPTS, self.at_once(cases)):
            with self.subTest(old=old):
                self.assertRegex(output, f"(?m)^not ok .*{name}")
                self.assertNotRegex(output, "(?m)^ok")
                self.assertEqual(status, 1)

    def test_appliances_without_faults(self):
        example = f"cp '{ROOT}/docs/examples/apply.sh' {SCRIPT}"
        alias = "rm links; printf '\\niface eth0:1 inet manual\\n' >>etc/network/interfaces"
        cases = [("stand-in", "true", "--live"), ("alias", alias),
                 ("image", IMAGE + "rm -r links etc/udhcpc\n" + example, "--live")]
        for (status, output), wanted in zip(self.at_once(cases), ((32, 4, 0), (13, 4, 1), (32, 0, 0))):
            counts = tuple(len(re.findall(each, output, re.M)) for each in ("^ok", "# SKIP", "^# not played"))
            self.assertEqual((status, counts), (0, wanted), output)

    def test_ends_cleanly(self):
        """Whoever ends the check early, it leaves nothing behind and does not wait for the script."""
        appliance = self.appliance("slow", f"printf '#!/bin/sh\nsleep 200\n' >{SCRIPT}")
        left = self.work / "left"
        left.mkdir()
        for ending, status, complaints in ((Popen.terminate, 128 + signal.SIGTERM, 0),
                                           (lambda check: check.stdout.close(), 1, 1)):
            with self.subTest(status=status), \
                    Popen([*CHECK, "--live", "--limit", "200", appliance], stdout=PIPE, stderr=PIPE,
                          env={**os.environ, "TMPDIR": str(left)}) as check:
                check.stdout.readline()
                ending(check)
                self.assertEqual((check.wait(100), check.stderr.read().count(b"\n")), (status, complaints))
                self.assertEqual(list(left.iterdir()), [])

    def test_wrong_usage(self):
        appliance = ROOT / "box/appliance"
        for arguments in ([], ["/nonexistent"], ["--unknown", appliance], ["--only", "no such", appliance],
                          ["--limit", "0", appliance], ["--programs", "/nonexistent", appliance]):
            done = subprocess.run([*CHECK, *arguments], capture_output=True, text=True)
            self.assertEqual((done.returncode, done.stdout, done.stderr.count("\n")), (2, "", 1))


if __name__ == "__main__":
    unittest.main()
