"""The first process of the box's PID namespace, which becomes bubblewrap."""

import ctypes
import os
import select
import signal

from front.ending import NO_BOX, no_box
from front.namespaces import libc, unshare
from front.places import CHECKOUT, INSIDE_PATH
from front.tools import exec_tool

# The host's tools look things up in these entries of /etc. The appliance's files are added to them.
HOST_ETC = ("alternatives", "ld.so.cache", "passwd", "group", "nsswitch.conf", "localtime")
CAPABILITIES = ("CAP_NET_ADMIN", "CAP_SYS_ADMIN", "CAP_NET_RAW", "CAP_NET_BIND_SERVICE")
ARCHIVE = "/run/box/archive.tar"
UNPACK_AND_BEGIN = f"""\
tar -xf {ARCHIVE} -C /run/box && rm {ARCHIVE} || exit {NO_BOX}
exec /run/box/inside/init "$@"
"""
PR_SET_PDEATHSIG = 1


def bubblewrap_arguments(options, archive, command):
    """Decides what is seen in the box. To be called in the user namespace."""
    arguments = [
        "--unshare-pid", "--cap-drop", "ALL", *(word for name in CAPABILITIES for word in ("--cap-add", name)),
        "--clearenv", "--setenv", "PATH", INSIDE_PATH, "--setenv", "HOME", "/root",
        "--setenv", "TERM", os.environ.get("TERM", "dumb"), "--chdir", "/",
        "--ro-bind", "/usr", "/usr", "--proc", "/proc", "--dev", "/dev",
    ]
    for directory in ("etc", "opt", "run", "tmp", "var", "root"):
        arguments += ["--tmpfs", f"/{directory}"]
    if os.access(CHECKOUT, os.R_OK | os.X_OK) and CHECKOUT != "/":
        arguments += ["--ro-bind", CHECKOUT, CHECKOUT]
        shown = (f"{CHECKOUT}/",)
    else:
        shown = ()
    for directory in ("bin", "sbin", "lib", "lib32", "lib64", "libx32"):
        if os.path.islink(f"/{directory}"):
            arguments += ["--symlink", f"usr/{directory}", f"/{directory}"]
        elif os.path.isdir(f"/{directory}"):
            arguments += ["--ro-bind", f"/{directory}", f"/{directory}"]
    for name in HOST_ETC:
        if not os.path.lexists(f"{options.appliance}/etc/{name}"):
            arguments += ["--ro-bind-try", f"/etc/{name}", f"/etc/{name}"]
    arguments += ["--dir", "/run/box"]
    if options.tty:
        arguments += ["--dev-bind", options.tty, "/dev/ttyS1"]
    copies = [(archive, ARCHIVE, 0o600)]
    if command and not command[1].startswith(shown):
        copies.append(command)
    for descriptor, destination, mode in copies:
        os.set_inheritable(descriptor, True)
        arguments += ["--perms", f"{mode:04o}", "--file", str(descriptor), destination]
    return arguments


def become_first_process(options, archive, command, command_file, asker, front_lives, report):
    """Runs as the first process of the box's PID namespace, and never returns."""
    libc.prctl(PR_SET_PDEATHSIG, signal.SIGKILL)
    # The front may have ended before that took effect.
    end_of_front = select.poll()
    end_of_front.register(front_lives, select.POLLIN)
    if end_of_front.poll(0):
        os._exit(NO_BOX)
    for name in ("mnt", "net", "uts", "ipc"):
        unshare(name, asker)
    # bubblewrap looks up its child by the number that the child has in this PID namespace.
    if libc.mount(b"proc", b"/proc", b"proc", ctypes.c_ulong(0), None) != 0:
        no_box(f"a new /proc is refused here ({os.strerror(ctypes.get_errno())}): "
               "the surrounding container hides parts of its own")
    os.set_inheritable(report, True)
    words = bubblewrap_arguments(options, archive, command_file)
    listing = os.memfd_create("arguments")
    os.write(listing, b"".join(os.fsencode(word) + b"\0" for word in words))
    os.lseek(listing, 0, os.SEEK_SET)
    os.set_inheritable(listing, True)
    if command_file:
        command = [command_file[1], *command[1:]]
    exec_tool("bwrap", "--json-status-fd", str(report), "--args", str(listing), "--",
              "/bin/sh", "-c", UNPACK_AND_BEGIN, "sh", *command)
