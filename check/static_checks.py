"""The checks of what lies there before the appliance has ever been started.

What the program makes of the files is not worked out here: the program itself is played in the box and
shows it, and ifupdown says what the interfaces file means.
"""

import concurrent.futures
import fnmatch
import functools
import ipaddress
import os
import re
import shutil
import subprocess

import ending
from appliance import HOST_NAME, INTERFACES, MODEL, READ_FILES, RESOLVER, SCRIPT
from checks import OWN_ADVICE, Check, Skip
from in_box.panel import OTHER_PAGES, without_servers
from play import Stage

ROW_LENGTH = 16
MOST_LISTED_SERVERS = 10
PORT_ADDRESS = "192.0.2.200"  # by which a port's page is found
KNOWN_MODEL = "q70\n"
IMAGE_PATH = "/usr/local/sbin:/usr/local/bin:/usr/sbin:/usr/bin:/sbin:/bin"
IMAGE_LIMIT_S = 20
BOOT_FILES = ("boot/grub/grub.cfg", "boot/cmdline.txt", "boot/firmware/cmdline.txt",
              "boot/extlinux/extlinux.conf", "boot/loader/entries")
UNIT_FOLDERS = ("usr/lib/systemd/system", "lib/systemd/system", "usr/local/lib/systemd/system")
# A boot loader and the kernel can also be told the usual address of the second serial port. What waits for
# the device, or only gives it a mode, does not use it.
USES_LINE = re.compile(
    r"^(?!\s*([#;]|(Condition|Assert|Description)\w*=)).*((?<!dev-)ttyS1\b|serial .*--unit[= ]1\b|"
    r"(console|earlycon|earlyprintk|serial)\b.*0x0*2f8\b).*", re.M | re.I)
RULE_USES_LINE = re.compile(r"^(?!\s*#|.*kestrova-panel).*ttyS1\b.*(RUN|SYSTEMD_WANTS).*", re.M)
SYSCTL_FILES = ("etc/sysctl.d", "usr/local/lib/sysctl.d", "usr/lib/sysctl.d", "lib/sysctl.d",
                "etc/sysctl.conf")
IPV6_SETTING = re.compile(r"^\s*-?net[./]ipv6[./]conf[./](\S+)[./]disable_ipv6\s*=\s*(\d+)", re.M)
IPV6_OFF = re.compile(r"^(?!\s*[#;]).*(\bipv6\.disable(_ipv6)?=1|\bipv6 .*\bdisable(_ipv6)?=1|"
                      r"sysctl\s.*disable_ipv6=1|addrgenmode\s+none)", re.M)
# By these two together, which systemd brings, a port gets another name than the kernel's.
RENAMING = (("udev/rules.d", "80-net-setup-link.rules", "net_setup_link"),
            ("systemd/network", "99-default.link", r"^\s*NamePolicy\s*=.*(onboard|slot|path|mac)"))
# In an own .link file. One without this leaves its ports the kernel's names, or names them eth0 and so on.
OTHER_NAME = re.compile(r"^\s*(Name\s*=(?!\s*eth)|NamePolicy\s*=.*(onboard|slot|path|mac))", re.M)
NAMES_ETH = re.compile(
    r"^(?!\s*[#;]).*(\bnet\.ifnames=0|\bNAME:?=\"eth|(?<![\w-])name\s+eth\d|\bset-name:\s*eth|"
    r"\brename\s.*=eth)|^\[Link\]\s*\n((?!\[).*\n)*\s*Name\s*=\s*eth", re.M)
NAMED_IN = ("etc", "boot", "efi", "usr/lib/kernel", "usr/lib/udev/rules.d", "usr/lib/systemd/network",
            *UNIT_FOLDERS, "usr/local", "opt")
TOOLS = "stty ifconfig hostname awk sed grep egrep sort tr head cat env /bin/kill"  # kill is built in, too
TRY_SHELL = f"""echo "1\\n2"
for tool in {TOOLS}; do [ -n "$(command -v $tool)" ] || echo "missing $tool"; done"""

STANZA_WORD = r"(?:iface|auto|allow-|mapping|source|no-auto-down|no-scripts)"
# What in a port's stanza makes the program read it otherwise than ifupdown, and how to say so.
CAUSES = [
    (r"\r$", "a line ends with a carriage return: remove it"),
    (r"^iface\s+{port}\s+inet6", "an inet6 stanza comes first: put the inet stanza before it"),
    (r"^[ \t]+iface\s+{port}\s", "there is a blank before iface: begin the line with iface"),
    (r"^iface(?=\s+{port}\s)(?! {port} inet[ \t])", "the iface line has a tab or more than one space"),
    (r"^iface\s+{port}\s.*#", "there is a comment on the iface line: give it a line of its own"),
    (r"^iface\s+{port}\s.*[ \t]$", "there is a blank at the end of the iface line: remove it"),
    (r"^\s*(address|netmask|gateway).*#", "there is a comment behind a value: give it a line of its own"),
    (r"^\s*(address|netmask|gateway)[ ]*\t", "there is a tab before a value: use a space"),
    (r"^\s*(address|netmask|gateway).*[ \t]$", "there is a blank at the end of a line: remove it"),
    (r"^\s*address\s+\S+/[0-9]+", "the address has a prefix length: write a netmask line"),
    (r"^\s*netmask\s+[0-9]+$", "the netmask is a number of bits: write it like 255.255.255.0"),
    (r"^\s*(?!address|netmask|gateway)\S.*(address|netmask|gateway)",
     "another line contains address, netmask or gateway, and is read as that: put it above these"),
    (r"\\$", "a line goes on in the next one: write it as one line"),
    (rf"^iface\s+{{port}}\s.*\n(.*\S.*\n)*[ \t]*{STANZA_WORD}",
     "no empty line follows the stanza: the next one is read as part of it"),
    (r"\A(?s:(?!.*netmask))", "there is no netmask: write a netmask line"),
    (r"^[ \t]+$",
     "a line of blanks follows the stanza instead of an empty one: the next one is read as part of it"),
]


class Subject:
    """The appliance, and what the program showed when it was played in the box."""

    def __init__(self, appliance, programs, work):
        self.appliance = appliance
        self.programs = programs
        self.work = work

    @functools.cached_property
    def ports(self):
        try:
            return self.appliance.ports()
        except ValueError as fault:
            raise Skip(f"the ports cannot be made: {fault}") from None

    @functools.cached_property
    def stage(self):
        stage = Stage(self.appliance, self.programs, self.work)
        # Each port has to have an address, because others get no page.
        stage.write("links", "".join(
            f"{name} {address if address != '-' else f'198.18.{number}.1/24'}\n"
            for number, (name, address) in enumerate(self.ports.items())))
        return stage

    def left_out(self):
        """What is in none of the boxes, each with the reason."""
        return self.appliance.no_ports + (self.stage.left_out if "stage" in vars(self) else [])

    def settings_of(self, port):
        alone = self.stage.copy(self.work)
        alone.write("links", f"{port} {PORT_ADDRESS}/24\n")
        alone.write(MODEL, KNOWN_MODEL)
        return alone.ask("settings", port=port, address=PORT_ADDRESS)

    @functools.cached_property
    def played(self):
        """All pages, and the settings of each port that has some; the boxes are there at the same time."""
        settable = [port for port in self.ports if port.startswith("eth")]
        count = OTHER_PAGES + len(self.ports)
        with concurrent.futures.ThreadPoolExecutor(1 + len(settable)) as pool:
            shown = pool.submit(self.stage.ask, "pages", count=count)
            read = {port: pool.submit(self.settings_of, port) for port in settable}
            pages = shown.result()
            again = next((number for number, page in enumerate(pages) if number and page == pages[0]), count)
            return pages[:again], {port: answer.result() for port, answer in read.items()}

    @property
    def pages(self):
        return self.played[0]

    @property
    def settings(self):
        return self.played[1]


def has_command(appliance, name):
    """Whether the image or, where there is no image, this machine has it."""
    places = [name] if "/" in name else [f"{folder}/{name}" for folder in IMAGE_PATH.split(":")]
    return any(map(appliance.exists if appliance.is_image else os.path.exists, places))


def script(subject):
    appliance, place = subject.appliance, subject.appliance.place(SCRIPT)
    fault = appliance.kind_fault(SCRIPT)
    if fault:
        yield f"/{SCRIPT} {fault}"
        return
    if not os.path.exists(place):
        folder = os.path.dirname(place)
        beside = " ".join(sorted(os.listdir(folder))) if os.path.isdir(folder) else ""
        yield f"/{SCRIPT} is missing" + (f"; beside its place there is: {beside}" if beside else "")
        return
    if not os.stat(place).st_mode & 0o100:
        yield f"/{SCRIPT} is not executable"
    first = appliance.text(SCRIPT).partition("\n")[0]
    interpreter = re.match(r"#!\s*([^ \t]+)", first)
    by_env = re.match(r"#!\s*\S*/env\s+(?:-S\s*)?([^\s=-]+)(?=\s|$)", first)
    if not interpreter and not appliance.text(SCRIPT).startswith("\x7fELF"):
        yield f"/{SCRIPT} does not begin with #! and an interpreter"
    elif interpreter and not has_command(appliance, interpreter[1]):
        yield f"its interpreter {interpreter[1]!r} does not exist"
    elif by_env and not has_command(appliance, by_env[1]):
        yield f"its interpreter {by_env[1]!r} is not in PATH"
    elif first.endswith("\r"):
        yield "its first line ends with a carriage return"


def ordinary_files(subject):
    for name in READ_FILES:
        fault = subject.appliance.kind_fault(name)
        if fault:
            yield f"/{name} {fault}"


def host_name(subject):
    fault = subject.appliance.host_name_fault()
    if fault:
        yield f"/{HOST_NAME} {fault}"


def ports(subject):
    try:
        if not any(port.startswith("eth") for port in subject.appliance.ports()):
            yield "there is no port whose name begins with eth, so that no port can be set at the panel"
    except ValueError as fault:
        yield str(fault)


def model(subject):
    if not any(subject.pages[0]):
        first = subject.appliance.text(MODEL).partition("\n")[0]
        fault = subject.appliance.kind_fault(MODEL)
        yield f"the product page is blank: /{MODEL} {fault or f'begins with {first!r}'}"


def label_of(subject, name):
    """What stands before the port's name on its page, or None if it has no page."""
    for row, _ in subject.pages[1:]:
        label, bracket, rest = row.partition("(")
        cut_off = len(row) == ROW_LENGTH
        if bracket and (rest == f"{name})" or cut_off and f"{name})".startswith(rest)):
            return label.strip()
    return None


def port_pages(subject):
    labels = {name: label_of(subject, name) for name in subject.ports}
    for name, label in labels.items():
        same = [other for other in labels if other != name and labels[other] == label]
        if label is None:
            yield f"{name} has no page of its own, or one that reads only \"undefined\""
        elif not label:
            yield f"the page of {name} has no label"
        elif same or re.fullmatch("eth[0-9]{2,}", name):
            others = " ".join(same) or label.lower()
            yield f"the page of {name} has the label {label}, which is that of {others}"


def likely_cause(text, port):
    """What in the file makes the program read the port otherwise."""
    name = re.escape(port)
    # The stanza, and the line with which the next one begins.
    stanza = re.search(rf"^[ \t]*iface\s+{name}\s.*\n(?:(?!\s*{STANZA_WORD}).*\n)*.*", text, re.M)
    if not stanza:
        if re.search(r"^\s*source", text, re.M):
            return "its stanza is in a file that a source line names: move it into this file"
        return f"there is no stanza \"iface {port} inet ...\""
    for pattern, cause in CAUSES:
        if re.search(pattern.replace("{port}", name), stanza[0], re.M):
            return cause
    return "compare the stanza with the integrator's guide"


def interfaces(subject):
    appliance = subject.appliance
    text = appliance.text(INTERFACES)
    if not text:
        yield f"/{INTERFACES} is missing or empty: every port is shown as a static one without an address"
        return
    for port, answer in subject.settings.items():
        if answer["meaning"] is None:
            raise Skip("there is no ifquery of ifupdown: run apt-get install ifupdown")
        if answer["complaint"]:
            yield f"{port}: ifupdown refuses it: {answer['complaint']}"
            if INTERFACES in answer["complaint"]:
                return  # it refuses the whole file, and so every port
            continue
        read = without_servers(answer["panel"]["words"] or [])
        if read != answer["meaning"]:
            shown = " ".join(read) or answer["panel"]["shown"]
            yield f"{port}: the panel reads {shown!r}, but to ifupdown the file means " \
                  f"{' '.join(answer['meaning']) or 'no address'!r}: {likely_cause(text, port)}"


def resolver(subject):
    appliance = subject.appliance
    inner = appliance.inner_place(RESOLVER)
    if "systemd/resolve" in inner:
        yield f"/{RESOLVER} leads to {inner}: the panel lists the resolver on the appliance itself"
    servers = []
    for line in appliance.text(RESOLVER).split("\n"):
        words = line.split()
        if words[:1] != ["nameserver"]:
            continue
        server = words[1] if len(words) > 1 else ""
        servers.append(server)
        if line != f"nameserver {server}":
            yield f"{line!r} is not \"nameserver\", one space, and an address"
        try:
            address = ipaddress.ip_address(server)
        except ValueError:
            yield f"{server!r} is not an address"
            continue
        if address.version != 4:
            yield f"the server {server} has an IPv6 address"
        elif address.is_loopback:
            yield f"the server {server} is a resolver on the appliance itself"
    if len(servers) > MOST_LISTED_SERVERS:
        yield f"there are {len(servers)} servers, and the panel lists {MOST_LISTED_SERVERS}"
    called = [answer["panel"]["words"] for answer in subject.settings.values() if answer["panel"]["words"]]
    for words in called[:1]:
        handed_on = [word for before, word in zip(words, words[1:]) if before == "--dns"]
        if handed_on != servers:
            yield f"the file names {servers}, and the panel hands on {handed_on}"


def shell(subject):
    """The image's own shell, or, where there is no image, the one that the box has from this machine."""
    if subject.appliance.is_image:
        try:
            done = ending.run(
                ["bwrap", "--ro-bind", subject.appliance.root, "/", "--unshare-all", "--die-with-parent",
                 "--clearenv", "--setenv", "PATH", IMAGE_PATH, "/bin/sh", "-c", TRY_SHELL], IMAGE_LIMIT_S)
        except subprocess.TimeoutExpired:
            yield f"the image's /bin/sh has not ended within {IMAGE_LIMIT_S} seconds"
            return
        if done.returncode != 0:
            raise Skip(f"the image's shell cannot be run here: {done.stderr.strip()}")
        said = done.stdout
    else:
        said = subject.stage.run("/bin/sh", "-c", TRY_SHELL)
    if not said.startswith("1\n2\n"):
        yield "the echo of /bin/sh does not turn \\n into a line feed: three pages are missing"
    for tool in re.findall("^missing (.*)", said, re.M):
        yield f"the command {tool} is missing"


def image_only(subject):
    if not subject.appliance.is_image:
        raise Skip("only the root of an image can tell")


def naming(subject):
    image_only(subject)
    appliance = subject.appliance
    for folder, name, how in RENAMING:
        # With a link to /dev/null in the first folder, nothing is found.
        files = appliance.drop_ins(name, f"etc/{folder}", f"usr/lib/{folder}", f"lib/{folder}")
        if not any(re.search(how, appliance.text(file), re.M) for file in files):
            return
    links = [file for file in appliance.files_below("etc/systemd/network") if ".link" in file]
    named = [port for port in subject.ports if re.fullmatch("eth[^.:]*", port)]
    if named and all(OTHER_NAME.search(appliance.text(file)) for file in links) and \
            not any(NAMES_ETH.search(appliance.text(file)) for file in appliance.files_below(*NAMED_IN)):
        yield f"nothing in the image gives the ports {' '.join(named)} these names: Debian names ports by " \
              "their places, such as enp3s0"


def ipv6_left_on(subject):
    """The ports for which no sysctl file switches IPv6 off."""
    off = dict.fromkeys(["default", *subject.ports])
    for file in subject.appliance.drop_ins(".conf", *SYSCTL_FILES):
        for ports, value in IPV6_SETTING.findall(subject.appliance.text(file)):
            for name in off:
                if ports == "all" or fnmatch.fnmatchcase(name, ports.replace("/", ".")):
                    off[name] = value
    return [name for name in subject.ports or off if (off[name] or off["default"]) != "1"]


def ipv6(subject):
    image_only(subject)
    texts = {file: subject.appliance.text(file)
             for file in subject.appliance.files_below("etc", *BOOT_FILES)}
    left_on = ipv6_left_on(subject)
    if not left_on or any(map(IPV6_OFF.search, texts.values())):
        return
    networks = {file: re.search(r"^\s*LinkLocalAddressing\s*=\s*(no|ipv4)", text, re.M)
                for file, text in texts.items() if file.endswith(".network")}
    if not any(networks.values()):
        yield f"nothing switches IPv6 off for {' '.join(left_on)}: without an IPv4 address, a port would " \
              "show one that begins with fe80"
        return
    for file, is_off in networks.items():
        if not is_off:
            yield f"/{file} leaves IPv6 on: write LinkLocalAddressing=no there, too"


def is_kept_away(appliance, unit):
    """Whether the service manager never starts this unit: it is masked, or the package has seen to it."""
    return any(appliance.exists(f"{folder}/{unit}.d/kestrova-panel.conf") for folder in UNIT_FOLDERS) or \
        appliance.inner_place(f"etc/systemd/system/{unit}") == "/dev/null"


def serial_line(subject):
    image_only(subject)
    appliance = subject.appliance
    seen = set()
    for file in appliance.files_below("etc", *UNIT_FOLDERS, *BOOT_FILES):
        place, unit = appliance.place(file), os.path.basename(file)
        if "kestrova-panel" in file or file == "etc/securetty":
            continue
        if re.fullmatch(r"[\w-]*getty@ttyS1\.service", unit):
            if not is_kept_away(appliance, unit):
                yield f"/{file} starts a login prompt on the line"
        elif place not in seen:
            seen.add(place)
            uses = (RULE_USES_LINE if file.endswith(".rules") else USES_LINE).search(appliance.text(file))
            if uses:
                yield f"/{file} uses the line: {uses[0].strip()}"


def service(subject):
    image_only(subject)
    if not shutil.which("systemctl"):
        raise Skip("systemctl is missing: run apt-get install systemd")
    if not any(subject.appliance.exists(f"{folder}/systemd/systemd") for folder in ("usr/lib", "lib")):
        raise Skip("the image has no systemd")
    done = ending.run(["systemctl", f"--root={subject.appliance.root}", "is-enabled", "kestrova-panel.service"],
                      IMAGE_LIMIT_S)
    state = done.stdout.strip()
    if state == "masked":
        yield f"kestrova-panel.service is masked{OWN_ADVICE}run systemctl --root=IMAGE unmask kestrova-panel"
    elif state != "enabled":
        yield f"kestrova-panel.service is {state}" if state else done.stderr.strip()


CHECKS = [
    Check("the configuration script can be run", script,
          f"install it as /{SCRIPT}, with mode 755, and its interpreter with it"),
    Check("the files that the program reads are ordinary files", ordinary_files,
          "put an ordinary file there: at anything else the program stands still or grows without end"),
    Check("the host name is one", host_name,
          f"write one line with letters, digits, hyphens and dots into /{HOST_NAME}"),
    Check("the ports can be made", ports,
          "name the network ports eth0 to eth7, or list them in links (kestrova-panel-box(1))"),
    Check("the model is known", model, f"begin the first line of /{MODEL} with q70, q75 or zvm"),
    Check("each port has a page with a label of its own", port_pages,
          "name the ports eth0 to eth7, and bridges bridge0 and bridge1 (net.ifnames=0, or .link files)"),
    Check("the settings of the ports are read as they are meant", interfaces,
          f"change /{INTERFACES} so that the panel reads what ifupdown does"),
    Check("the DNS servers are read as they are meant", resolver,
          f"list up to ten servers by their IPv4 addresses in /{RESOLVER}, and none of the appliance itself"),
    Check("the shell and the commands are those that the program needs", shell,
          "make dash the /bin/sh, and install net-tools, hostname, mawk, sed, grep, coreutils and procps"),
    Check("the ports get the names that the files use", naming,
          "put net.ifnames=0 on the kernel's command line, or name the ports by .link files"),
    Check("IPv6 is off", ipv6, "set net.ipv6.conf.all.disable_ipv6 = 1 in a file in /etc/sysctl.d"),
    Check("nothing else uses the serial line", serial_line,
          "give the login prompts, the kernel's console and other programs another line"),
    Check("the service is enabled", service, "run systemctl --root=IMAGE enable kestrova-panel"),
]
