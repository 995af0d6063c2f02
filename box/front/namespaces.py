"""The namespaces that separate the box from the host."""

import ctypes
import errno
import os

from front.ending import no_box

# The kernel's flags (linux/sched.h), by the names of its limits in /proc/sys/user.
NAMESPACES = {
    "user": 0x10000000, "pid": 0x20000000, "mnt": 0x00020000, "net": 0x40000000,
    "uts": 0x04000000, "ipc": 0x08000000,
}

libc = ctypes.CDLL(None, use_errno=True)


def unshare(name, asker):
    """Enters a new namespace, or says what keeps this user from it."""
    try:
        if libc.unshare(NAMESPACES[name]) != 0:
            raise OSError(ctypes.get_errno(), os.strerror(ctypes.get_errno()))
        if name == "user":
            for file, text in (("setgroups", "deny"), ("uid_map", f"0 {asker[0]} 1"),
                               ("gid_map", f"0 {asker[1]} 1")):
                with open(f"/proc/self/{file}", "w") as map_file:
                    map_file.write(text)
    except OSError as fault:
        no_box(f"{name} namespaces are refused here ({fault.strerror}): "
               f"{advice(name, fault.errno, asker[0])}")


def advice(name, error, user):
    if error == errno.ENOSPC:
        return f"allow more of them with 'sysctl user.max_{name}_namespaces=10000'"
    if os.path.exists("/run/box/ready"):
        return "a box cannot be made inside a box"
    switches = [switch for switch in ("kernel.unprivileged_userns_clone=1",
                                      "kernel.apparmor_restrict_unprivileged_userns=0")
                if os.path.exists("/proc/sys/" + switch.split("=")[0].replace(".", "/"))]
    if user != 0 and switches:
        return f"allow them with 'sysctl {' '.join(switches)}' or run as root"
    return "the surrounding chroot, container or security policy has to allow them"
