"""The host's files that are copied into the box."""

import os
import re
import stat

from front.ending import NO_COMMAND, end_with, no_box

HOST_NAME_MAX = 64


class Copies:
    """Arguments that make bubblewrap copy files into the box from descriptors that are opened here."""

    def __init__(self):
        self.arguments = []

    def add(self, descriptor, destination, mode=0o644):
        os.set_inheritable(descriptor, True)
        self.arguments += ["--perms", f"{mode:04o}", "--file", str(descriptor), destination]

    def add_file(self, path, destination):
        descriptor = os.open(path, os.O_RDONLY | os.O_NONBLOCK)
        mode = os.fstat(descriptor).st_mode
        if not stat.S_ISREG(mode):
            no_box(f"{path} is not a regular file")
        # The root of the box copies it again, and may not read a file that nobody may read.
        self.add(descriptor, destination, stat.S_IMODE(mode) & 0o777 | 0o400)

    def add_text(self, text, destination):
        self.add(memory_file(text), destination)

    def add_tree(self, path, destination):
        self.arguments += ["--dir", destination]
        for entry in sorted(os.scandir(path), key=lambda entry: entry.name):
            inside = f"{destination}/{entry.name}"
            if entry.is_symlink():
                self.arguments += ["--symlink", os.readlink(entry.path), inside]
            elif entry.is_dir():
                self.add_tree(entry.path, inside)
            else:
                self.add_file(entry.path, inside)


def memory_file(text):
    descriptor = os.memfd_create("box")
    with open(os.dup(descriptor), "wb") as writer:
        writer.write(os.fsencode(text))
    os.lseek(descriptor, 0, os.SEEK_SET)
    return descriptor


def open_command(command):
    """Returns descriptor, path and mode of a command that would not be seen in the box otherwise."""
    seen = ("/usr/", "/bin/", "/sbin/", "/opt/kestrova/", "/run/box/")
    if "/" not in command or command.startswith(seen):
        return None
    try:
        descriptor = os.open(command, os.O_RDONLY | os.O_NONBLOCK)
    except (FileNotFoundError, NotADirectoryError):
        end_with(NO_COMMAND, f"{command} does not exist")
    mode = os.fstat(descriptor).st_mode
    if not stat.S_ISREG(mode):
        end_with(NO_COMMAND, f"{command} is not a regular file")
    return descriptor, os.path.abspath(command), stat.S_IMODE(mode) & 0o777


def check_host_name(path):
    """Checks the name by the rules of `hostname -F`, which sets it in the box."""
    if not os.path.isfile(path):
        return
    with open(path, encoding="latin-1") as lines:
        names = [line.strip() for line in lines if line.strip() and not line.startswith("#")]
    label = "[A-Za-z0-9]([A-Za-z0-9-]*[A-Za-z0-9])?"
    if not names or len(names[0]) > HOST_NAME_MAX or not re.fullmatch(rf"{label}(\.{label})*", names[0]):
        no_box(f"{path} does not contain a host name")
