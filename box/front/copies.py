"""The host's files that are copied into the box."""

import errno
import io
import os
import re
import stat
import tarfile
import time

from front.ending import NO_COMMAND, NO_RUN, end_with

HOST_NAME_MAX = 64


def open_regular(path):
    """Opens an ordinary file to be read as bytes. Raises OSError for anything else, and never waits."""
    # A device is not even opened, because that may do something.
    if stat.S_ISREG(os.stat(path).st_mode):
        file = open(os.open(path, os.O_RDONLY | os.O_NONBLOCK), "rb")
        if stat.S_ISREG(os.fstat(file.fileno()).st_mode):
            return file
        file.close()
    raise OSError(errno.EINVAL, "not a regular file", path)


class Archive:
    """What is copied into the box, as a tar archive in memory. There may be any number of files."""

    def __init__(self):
        self.descriptor = os.memfd_create("box")
        self.tar = tarfile.open(fileobj=os.fdopen(os.dup(self.descriptor), "wb"), mode="w",
                                format=tarfile.GNU_FORMAT, encoding="utf-8", errors="surrogateescape")

    def finish(self):
        """Returns the descriptor of the archive, which is to be read from its beginning."""
        self.tar.close()
        self.tar.fileobj.close()
        os.lseek(self.descriptor, 0, os.SEEK_SET)
        return self.descriptor

    def add(self, name, kind, mode, size=0, content=None, target=""):
        entry = tarfile.TarInfo(name)
        entry.type, entry.mode, entry.size, entry.linkname = kind, mode, size, target
        entry.mtime = int(time.time())
        self.tar.addfile(entry, content)

    def add_text(self, text, name):
        content = os.fsencode(text)
        self.add(name, tarfile.REGTYPE, 0o644, len(content), io.BytesIO(content))

    def add_file(self, path, name):
        with open_regular(path) as file:
            status = os.fstat(file.fileno())
            # The root of the box copies it again, and may not read a file that nobody may read.
            mode = stat.S_IMODE(status.st_mode) & 0o777 | 0o400
            self.add(name, tarfile.REGTYPE, mode, status.st_size, file)

    def add_tree(self, path, name):
        self.add(name, tarfile.DIRTYPE, 0o755)
        for entry in sorted(os.scandir(path), key=lambda entry: entry.name):
            inside = f"{name}/{entry.name}"
            if entry.is_symlink():
                self.add(inside, tarfile.SYMTYPE, 0o777, target=os.readlink(entry.path))
            elif entry.is_dir():
                self.add_tree(entry.path, inside)
            else:
                self.add_file(entry.path, inside)


def open_command(command):
    """Returns descriptor, path and mode of a command that would not be seen in the box otherwise."""
    seen = ("/usr/", "/bin/", "/sbin/", "/opt/kestrova/", "/run/box/")
    if command == "":
        end_with(NO_COMMAND, "the command is empty")
    if "/" not in command or command.startswith(seen):
        return None
    try:
        descriptor = os.open(command, os.O_RDONLY | os.O_NONBLOCK)
    except (FileNotFoundError, NotADirectoryError):
        end_with(NO_COMMAND, f"{command} does not exist")
    except OSError as fault:
        end_with(NO_RUN, f"{command} cannot be run: {fault.strerror}")
    mode = os.fstat(descriptor).st_mode
    if not stat.S_ISREG(mode):
        end_with(NO_RUN, f"{command} cannot be run: it is not a regular file")
    return descriptor, os.path.abspath(command), stat.S_IMODE(mode) & 0o777


def check_host_name(path):
    """Checks the name by the rules of `hostname -F`, which sets it in the box, and raises ValueError."""
    if not os.path.isfile(path):
        return
    with open(path, encoding="latin-1") as lines:
        names = [line.strip() for line in lines if line.strip() and not line.startswith("#")]
    label = "[A-Za-z0-9]([A-Za-z0-9-]*[A-Za-z0-9])?"
    if not names or len(names[0]) > HOST_NAME_MAX or not re.fullmatch(rf"{label}(\.{label})*", names[0]):
        raise ValueError(f"{path} does not contain a host name")
