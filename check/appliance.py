"""The appliance that is checked: what is looked up in it, and the copy of it that is played.

Nothing is written there, and nothing there is opened that could block or has no end.
"""

import os
import re
import stat
import tarfile

import ending
from checks import OWN_ADVICE
from front.copies import Archive, check_host_name, open_regular
from front.first_process import HOST_ETC
from inside.ports import Ports

SCRIPT = "opt/kestrova/scripts/ezio/apply.py"
INTERFACES = "etc/network/interfaces"
RESOLVER = "etc/resolv.conf"
MODEL = "etc/ma-platform"
HOST_NAME = "etc/hostname"
READ_FILES = (MODEL, INTERFACES, RESOLVER, "opt/kestrova/seq.site_conn", "opt/kestrova/config/nis.config")

MOST_LINKS = 40  # that the kernel follows
MOST_FOLDERS = 60  # one in the other
MOST_TEXT_BYTES = 1 << 20
MOST_COPIED_BYTES = 256 << 20

KINDS = {stat.S_IFIFO: "FIFO", stat.S_IFDIR: "directory", stat.S_IFSOCK: "socket",
         stat.S_IFLNK: "link that leads back to itself"}
NOT_READABLE = f"cannot be read by this user{OWN_ADVICE}run the check as root"


class Copy(Archive):
    """A copy that leaves out what is no ordinary file, cannot be read, or no longer fits."""

    def __init__(self):
        super().__init__()
        self.room = MOST_COPIED_BYTES
        self.added = set()
        self.left_out = []

    def add(self, name, kind, *details, **more):
        """Adds a name once. A link gives way to what has been added below its name."""
        below = kind == tarfile.SYMTYPE and any(other.startswith(f"{name}/") for other in self.added)
        if name not in self.added and not below:
            self.added.add(name)
            super().add(name, kind, *details, **more)

    def add_file(self, path, name):
        ending.go_on()
        try:
            size = os.stat(path).st_size
            if size > self.room:
                raise OSError(0, "no room for it", path)
            super().add_file(path, name)
            self.room -= size
        except OSError as fault:
            self.left_out.append(f"{path}: {fault.strerror}")

    def add_tree(self, path, name):
        if name in self.added:
            return
        try:
            if name.count("/") > MOST_FOLDERS:
                raise OSError(0, "nested too deeply", path)
            super().add_tree(path, name)
        except OSError as fault:
            self.left_out.append(f"{path}: {fault.strerror}")

    def unpack(self, directory):
        """Ends the copy and puts it there."""
        archive = self.finish()
        with open(archive, "rb") as file:
            ending.run_or_fail("tar", "-xf", "-", "-C", directory, stdin=file)


class Appliance:
    """What lies below `root`: a directory of the box's form, or the root of an image."""

    def __init__(self, root, links=None):
        self.root = os.path.realpath(root)
        self.is_image = os.path.isdir(f"{self.root}/usr")
        own_links = f"{self.root}/links"
        self.links = links or (own_links if os.path.lexists(own_links) else None)
        self.no_ports = []  # names in the interfaces file of which the box can make no ports, and why

    def place(self, name):
        """Where a path of the appliance lies here, its links followed as the appliance would."""
        ahead, found, links = name.split("/")[::-1], [], 0
        while ahead:
            part = ahead.pop()
            if part == "..":
                found = found[:-1]
            elif part not in ("", "."):
                path = os.path.join(self.root, *found, part)
                if os.path.islink(path) and links < MOST_LINKS:
                    links += 1
                    target = os.readlink(path)
                    found = [] if target.startswith("/") else found
                    ahead += target.split("/")[::-1]
                else:
                    found.append(part)
        return os.path.join(self.root, *found)

    def inner_place(self, name):
        """The same as the appliance names it."""
        return self.place(name)[len(self.root.rstrip("/")):]

    def exists(self, name):
        return os.path.lexists(self.place(name))

    def text(self, name):
        """What is in an ordinary file, up to a mebibyte, or "" if there is none or it cannot be read."""
        ending.go_on()
        try:
            with open_regular(self.place(name)) as file:
                return os.fsdecode(file.read(MOST_TEXT_BYTES))
        except OSError:
            return ""

    def files_below(self, *names):
        """These files, and all files and links below these directories, as the appliance names them."""
        for name in names:
            place = self.place(name)
            if os.path.isdir(place):
                for directory, _, files in os.walk(place):
                    inner = directory[len(place):]
                    yield from (f"{name}{inner}/{file}" for file in files)
            elif os.path.lexists(place):
                yield name

    def drop_ins(self, ending, *folders):
        """The files with this ending in these folders, in the order of their names. Of those that have the
        same name, only that of the first folder counts."""
        found = {}
        for file in self.files_below(*folders):
            found.setdefault(os.path.basename(file), file)
        return [found[name] for name in sorted(found) if name.endswith(ending)]

    def kind_fault(self, name):
        """Why the program would come to grief when it opens this file, or None."""
        place, inner = self.place(name), self.inner_place(name)
        if inner.startswith(("/dev/", "/proc/", "/sys/")):
            return f"leads to {inner}, which may have no end"
        try:
            status = os.lstat(place)
        except PermissionError:
            return NOT_READABLE
        except OSError:
            return None
        if not stat.S_ISREG(status.st_mode):
            return "is a " + KINDS.get(stat.S_IFMT(status.st_mode), "device")
        if status.st_size > MOST_TEXT_BYTES:
            return f"has {status.st_size} bytes"
        if not os.access(place, os.R_OK):
            return NOT_READABLE
        return None

    def host_name_fault(self):
        fault = self.kind_fault(HOST_NAME)
        if fault:
            return fault
        try:
            check_host_name(self.place(HOST_NAME))
        except ValueError:
            return "does not contain a host name"
        return None

    def ports(self):
        """The ports with their addresses or "-", as `links` lists them or, without it, those that the
        interfaces file names and the box can make. Raises ValueError if `links` cannot be used."""
        if self.links:
            if not os.path.isfile(self.links):
                raise ValueError(f"{self.links} is not an ordinary file")
            Ports(self.links)
            with open(self.links, encoding="latin-1") as links:
                words = [line.split() for line in links]
            return {line[0]: line[1] for line in words if line and not line[0].startswith("#")}
        names = []
        for file in self.files_below(INTERFACES, "etc/network/interfaces.d"):
            names += re.findall(r"^\s*iface\s+(\S+)", self.text(file), re.M)
        box, found = Ports(os.devnull), {}
        self.no_ports = []
        for name in sorted(set(names) - {"lo"}):
            try:
                box.add(name, "-", None, None)
                found[name] = "-"
            except ValueError as fault:  # for an alias, for example
                self.no_ports.append(str(fault))
        return found

    def copy_to(self, directory):
        """Copies what the box needs, and returns what has been left out."""
        copy = Copy()
        # What is needed most comes first, in case there is no room for everything. Where a link leads to
        # something that the box does not have, that comes in its place.
        for name in (*READ_FILES, HOST_NAME):
            if not self.inner_place(name).startswith(("/etc/", "/opt/")) and os.path.isfile(self.place(name)):
                copy.add_file(self.place(name), name)
        for part in ("opt/kestrova", "etc", "opt"):
            if os.path.isdir(self.place(part)):
                copy.add_tree(self.place(part), part)
        copy.unpack(directory)
        # The tools in the box are the host's, and look things up in these.
        unwanted = list(HOST_ETC) if self.is_image else []
        unwanted += ["hostname"] if self.host_name_fault() else []
        unwanted += [] if os.path.isdir(self.place("etc/network")) else ["network"]  # which the box makes
        for name in unwanted:
            ending.run_or_fail("rm", "-rf", f"{directory}/etc/{name}")
        return copy.left_out
