"""How the check ends early: its commands are killed, and nothing new begins.

No handler of a signal raises an exception. One that came up while a command was being started would leave
the command behind, and it would write on in a folder that is being removed.
"""

import os
import signal
import subprocess
import threading


class Ended(Exception):
    """The check has been ended, so that there are no more results."""


commands = set()  # that run
ended = threading.Event()


def end():
    """Kills the commands that run. Whoever waits for one, or calls one of the others, gets Ended."""
    ended.set()
    for command in set(commands):
        command.kill()


def end_by(numbers, handler):
    """Has these signals end the check, except those that are ignored. The handler is called as well, when
    the main thread gets to it. A thread of its own ends the commands, because the main thread may just
    have begun to wait for one."""
    reader, writer = os.pipe()
    os.set_blocking(writer, False)
    signal.set_wakeup_fd(writer)
    for number in numbers:
        if signal.getsignal(number) != signal.SIG_IGN:
            signal.signal(number, handler)

    def wait():
        os.read(reader, 1)
        end()

    threading.Thread(target=wait, daemon=True).start()


def go_on():
    """Raises Ended if the check has been ended."""
    if ended.is_set():
        raise Ended("the check has been ended")


def run(words, timeout=None, stdin=subprocess.DEVNULL, stderr=subprocess.PIPE):
    """Runs a command, and returns its status with what it has written. Raises subprocess.TimeoutExpired if
    it has not ended after so many seconds."""
    go_on()
    with subprocess.Popen(words, stdin=stdin, stdout=subprocess.PIPE, stderr=stderr,
                          encoding="utf-8", errors="surrogateescape") as command:
        commands.add(command)
        if ended.is_set():
            command.kill()
        try:
            said, complaint = command.communicate(timeout=timeout)
        finally:
            commands.discard(command)
            command.kill()
    go_on()
    return subprocess.CompletedProcess(words, command.returncode, said, complaint)


def run_or_fail(*words, stdin=subprocess.DEVNULL):
    """Runs a command whose complaints go to standard error. Raises subprocess.CalledProcessError if it fails."""
    run(words, stdin=stdin, stderr=None).check_returncode()
