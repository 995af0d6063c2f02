#!/usr/bin/python3
"""Runs the real panel-emulator (the first argument) on small commands, without a terminal and on one.

Other tests cover what it does with the panel's bytes, keys and steps. This one covers the program: its
files and streams, its terminal, and the command that it starts.
"""

import fcntl
import os
import pty
import select
import signal
import struct
import subprocess
import sys
import tempfile
import termios
import time
import unittest
from pathlib import Path

EMULATOR = sys.argv.pop(1)

# Shows the second byte of each answer, and how many polls it has been seen without a pause.
KEYS = r"""
exec 3<>"$PANEL_TTY" && stty min 0 time 5 <&3 && printf '\376\001%-16s' ready >&3
while printf '\376\000\376\006' >&3; do
    key=$(dd bs=255 count=1 <&3 2>/dev/null | od -An -tx1 -N 2)
    held=$((${key:+held + 1} + 0)) && [ -z "$key" ] || printf '\376\002%s %-9s' "$key" $held >&3
done
"""


def play(journey, *options, command=KEYS, **streams):
    """Returns the finished process of the emulator that has played this journey."""
    return subprocess.run([EMULATOR, "--journey", "-", *options, "--", "sh", "-c", command],
                          input=journey, capture_output=not streams, text=True, timeout=30,
                          check=False, **streams)


def descendants(pid):
    children = Path(f"/proc/{pid}/task/{pid}/children").read_text(encoding="ascii").split()
    return {int(child) for child in children}.union(*(descendants(child) for child in children))


class Terminal:
    """The emulator on a terminal of its own, which sends no hang-up signal if it is not controlling."""

    def __init__(self, *arguments, kind="xterm", is_controlling=True, command=KEYS):
        self.end, other_end = pty.openpty()
        self.other_end = os.dup(other_end) if is_controlling else None
        fcntl.ioctl(other_end, termios.TIOCSWINSZ, struct.pack("HHHH", 24, 80, 0, 0))

        def take_terminal():
            os.setsid()
            if is_controlling:
                fcntl.ioctl(0, termios.TIOCSCTTY, 0)

        # Without --fast, a frame could be drawn between two characters of a word that a test waits for.
        self.process = subprocess.Popen(
            [EMULATOR, "--fast", *arguments, "--", "sh", "-c", command], stdin=other_end, stdout=other_end,
            stderr=other_end, env={**os.environ, "TERM": kind}, preexec_fn=take_terminal)
        os.close(other_end)
        self.shown = b""

    def read_until(self, text):
        """Fails when this is not shown within ten seconds."""
        give_up = time.monotonic() + 10
        while text not in self.shown or select.select([self.end], [], [], 0)[0]:
            if not select.select([self.end], [], [], give_up - time.monotonic())[0]:
                raise AssertionError(f"no {text} in {self.shown[-200:]}")
            self.shown += os.read(self.end, 4096)

    def type(self, keys):
        os.write(self.end, keys)

    def status(self):
        """Returns the status of the emulator once it has ended, and keeps what it prints until then."""
        give_up = time.monotonic() + 10
        has_ended = False
        while not has_ended and time.monotonic() < give_up:
            has_ended = self.process.poll() is not None  # so that everything it has printed can be read
            try:
                while select.select([self.end], [], [], 0.05)[0]:
                    self.shown += os.read(self.end, 4096)
            except OSError:
                break
        return self.process.wait(timeout=10)


class WithoutTerminal(unittest.TestCase):
    def test_a_journey_is_played_and_its_pictures_and_trace_are_written(self):
        with tempfile.TemporaryDirectory() as folder:
            done = play("expect 'ready'\ntap up 2\nexpect ' fd be 1'\nhold escape 3\nrelease\n"
                        "picture end\nrun kill -0 $PANEL_COMMAND_PID && stty -F $PANEL_TTY\n"
                        .replace("'", '"'),
                        "--pictures", f"{folder}/new", "--trace", f"{folder}/trace")
            self.assertEqual((done.returncode, done.stderr), (0, ""))
            self.assertIn("| fd b7 3        |", done.stdout)
            self.assertIn("</svg>", Path(folder, "new/end.svg").read_text(encoding="ascii"))
            self.assertIn("> FD BE", Path(folder, "trace").read_text(encoding="ascii"))

    def test_what_goes_wrong_is_said_once_and_told_by_the_status(self):
        for status, said, journey, options, command in (
                (1, "does not show", 'expect other ""', ["--limit", "0.5"], KEYS),
                (1, "cursor is not", "expect-cursor 0 0 on", ["--limit", "0.2"], KEYS),
                (1, "does not ask", "tap up", ["--limit", "0.2"], "sleep 30"),
                (1, "not read the answers", "tap up", ["--limit", "1"],
                 r"exec 3<>$PANEL_TTY; while printf '\376\006' >&3; do sleep 0.1; done"),
                (1, "with status 3", "run exit 3", [], "sleep 30"),
                (1, "status 150 before", "wait 30", [], "exit 150"),
                (1, "139 (Segmentation fault)", "wait 30", [], "kill -SEGV $$"),
                (1, "trace", "tap up", ["--trace", "/dev/full"], KEYS),
                (2, "no step in it", "", [], "true"),
                (2, "too long", "x" * 100_000, [], "true"),
                (2, "control character", "say a\rsay b", [], "true"),
                (2, "'prot' cannot be checked", "appliance has prot eth0 -", [], "true"),
                (1, "needs the box", "appliance refresh", [], "sleep 30"),
                (2, "--record needs a value", "release", ["--record", ""], "true"),
                (2, "names are not looked up", "release", ["--web", "localhost:0"], "true"),
                (2, "no page can be opened", "release", ["--web", "255.255.255.255:0"], "true"),
                (2, "from 0.001 to 86400", "release", ["--limit", "0"], "true"),
                (2, "unknown option -fast", "release", ["-fast"], "true"),
                (2, "not an [ADDRESS:]PORT", "release", ["--web", "::1:80"], "true"),
                (1, "cannot listen on 192.0.2.1:8", "release", ["--web", "192.0.2.1:8"], "true"),
                (2, "terminal", "release", ["--show"], "true")):
            with self.subTest(said):
                done = play(journey, *options, command=command)
                self.assertEqual(done.returncode, status)
                self.assertIn(said, done.stderr)
                self.assertEqual(done.stderr.count("panel-emulator: "), 1)

    def test_no_file_is_lost_by_naming_it_twice_or_by_a_command_that_cannot_be_run(self):
        with tempfile.TemporaryDirectory() as folder:
            journey, link, new = (f"{folder}/{name}" for name in ("journey", "link", "new"))
            Path(journey).write_text("wait 60\n", encoding="ascii")
            os.link(journey, link)
            for options in (("--journey", journey, "--record", link),
                            ("--journey", journey, "--trace", f"{folder}/./journey"),
                            ("--record", new, "--trace", f"{folder}/./new")):
                done = play("wait 60", *options)
                self.assertEqual((done.returncode, done.stderr[-19:]), (2, "name the same file\n"))
            self.assertEqual(play("wait 60", "--record", journey, "--trace", new,
                                  command="exec /no-such-file").returncode, 1)
            self.assertEqual(Path(journey).read_text(encoding="ascii"), "wait 60\n")
            self.assertFalse(Path(new).exists())

    def test_output_that_cannot_be_written_is_a_failure(self):
        with open("/dev/full", "w", encoding="ascii") as full:
            for journey, options in (("say x", []), ("wait 60", ["--web", "0"])):
                self.assertEqual(play(journey, *options, stdout=full,
                                      stderr=subprocess.DEVNULL).returncode, 1)
        # If standard output is closed, its number must not become that of the pseudo-terminal.
        closed = play("say x\nexpect ready", stdout=None, stderr=subprocess.DEVNULL,
                      preexec_fn=lambda: os.close(1))
        self.assertEqual(closed.returncode, 1)

    def test_a_stop_that_is_longer_than_the_limit_is_no_delay_of_the_program(self):
        with subprocess.Popen([EMULATOR, "--limit", "2", "--journey", "-", "--", "sh", "-c", KEYS],
                              stdin=subprocess.PIPE, stdout=subprocess.PIPE, text=True) as emulator:
            emulator.stdin.write("expect ready\nsay holding\nhold down 40\nrelease\n")
            emulator.stdin.close()
            self.assertEqual(emulator.stdout.readline(), "holding\n")
            emulator.send_signal(signal.SIGSTOP)
            time.sleep(2.5)  # the limit has to pass
            emulator.send_signal(signal.SIGCONT)
            self.assertEqual(emulator.wait(timeout=20), 0)

    def test_killed_it_takes_along_what_it_started_even_against_sigterm(self):
        with subprocess.Popen([EMULATOR, "--journey", "-", "--", "sh", "-c",
                               'trap "" TERM; sleep 60; sleep 60'],
                              stdin=subprocess.PIPE) as emulator:
            emulator.stdin.write(b"wait 60\n")
            emulator.stdin.close()
            while len(started := descendants(emulator.pid)) < 3:
                time.sleep(0.05)
            emulator.kill()
        give_up = time.monotonic() + 10
        while any(Path(f"/proc/{pid}").exists() for pid in started):
            self.assertLess(time.monotonic(), give_up)
            time.sleep(0.05)


    def test_a_step_leaves_nothing_running_however_the_emulator_was_started(self):
        def ignore_and_block():
            signal.signal(signal.SIGCHLD, signal.SIG_IGN)
            signal.pthread_sigmask(signal.SIG_BLOCK, {signal.SIGTERM, signal.SIGCHLD})

        done = play('run setsid sleep 54.32 & sleep 0.2\nrun ! ps ax | grep -q "[s]leep 54.32"',
                    preexec_fn=ignore_and_block)
        self.assertEqual(done.returncode, 0)

    def test_the_end_of_a_guard_that_somebody_kills_is_the_end_of_its_command(self):
        with subprocess.Popen([EMULATOR, "--journey", "-", "--", "sleep", "60"], text=True,
                              stdin=subprocess.PIPE, stderr=subprocess.PIPE) as emulator:
            emulator.stdin.write("wait 60\n")
            emulator.stdin.close()
            while len(descendants(emulator.pid)) < 2:
                time.sleep(0.05)
            os.kill(min(descendants(emulator.pid)), signal.SIGKILL)
            said = emulator.stderr.read()
        self.assertIn("status 137", said)
        self.assertNotIn("left running", said)


class OnTerminal(unittest.TestCase):
    def test_it_ends_when_the_operator_quits_and_when_the_terminal_goes_away(self):
        terminal = Terminal()
        terminal.read_until(b"ready")
        terminal.type(b"q")
        self.assertEqual(terminal.status(), 0)
        terminal = Terminal(is_controlling=False)
        terminal.read_until(b"ready")
        os.close(terminal.end)
        self.assertEqual(terminal.process.wait(timeout=10), 0)

    def test_a_terminal_that_cannot_be_drawn_on_is_refused(self):
        for kind in ("dumb", "none-such"):
            terminal = Terminal(kind=kind)
            self.assertEqual(terminal.status(), 1)
            self.assertIn(b"check TERM", terminal.shown)

    def test_unexpected_signals_and_sizes_neither_hold_it_up_nor_leave_the_terminal_changed(self):
        terminal = Terminal()
        terminal.read_until(b"ready")
        terminal.process.send_signal(signal.SIGUSR1)
        terminal.read_until(b"SIGUSR1")
        for lines in (40_000, *range(20, 60)):  # drawn for nobody to read
            fcntl.ioctl(terminal.end, termios.TIOCSWINSZ, struct.pack("HHHH", lines, lines, 0, 0))
            time.sleep(0.05)
        terminal.process.send_signal(signal.SIGALRM)
        self.assertEqual(terminal.process.wait(timeout=3), 128 + signal.SIGALRM)
        self.assertTrue(termios.tcgetattr(terminal.other_end)[3] & termios.ECHO)
        terminal.status()
        for mode in (b"1000", b"2004"):  # reports of the mouse and of pastes
            on, off = (terminal.shown.rfind(b"\033[?" + mode + end) for end in (b"h", b"l"))
            self.assertTrue(0 <= on < off, terminal.shown[-200:])

    def test_a_stopped_terminal_does_not_hold_it_up_and_is_given_back_as_it_was(self):
        terminal = Terminal()
        terminal.read_until(b"ready")
        terminal.type(b"\x13")  # Ctrl-S
        time.sleep(0.5)  # for some frames that cannot be drawn
        terminal.process.terminate()
        self.assertEqual(terminal.status(), 128 + signal.SIGTERM)
        self.assertFalse(fcntl.fcntl(terminal.other_end, fcntl.F_GETFL) & os.O_NONBLOCK)

    def test_the_status_and_the_last_words_of_a_command_that_ends_are_shown(self):
        terminal = Terminal(command="yes noise | head -n 9; seq 2000; echo gone; "
                                    r"printf '\033]0;owned\007\302\2331m\n'; exit 150")
        self.assertEqual(terminal.status(), 150)
        last_words = terminal.shown[terminal.shown.index(b"gone"):]
        self.assertIn(b"ended with status 150", last_words)
        self.assertIn(b"\n?]0;owned??1m\r\n", last_words)
        self.assertNotIn(b"noise", terminal.shown)

    def test_a_command_that_wants_the_terminal_fails_instead_of_waiting_unseen(self):
        terminal = Terminal(command="cat </dev/tty || exit 5")
        self.assertEqual(terminal.status(), 5)

    def test_what_is_done_is_recorded_and_can_be_played_and_watched(self):
        with tempfile.TemporaryDirectory() as folder:
            record, trace = f"{folder}/journey", Path(folder, "trace")
            terminal = Terminal("--record", record, "--trace", str(trace))
            terminal.read_until(b"ready")
            # Held until another key is held; then typed.
            for keys, answer in ((b"u", "FD BE"), (b"d", "FD BD"), (b"d\033[A\r", "FD BB")):
                terminal.type(keys)
                while f"> {answer}" not in trace.read_text(encoding="ascii"):
                    self.assertIsNone(terminal.process.poll())
                    terminal.read_until(b"")
            terminal.type(b"q")
            self.assertEqual(terminal.status(), 0)
            steps = Path(record).read_text(encoding="ascii")
            self.assertRegex(steps, '(?s)expect "ready" ""\n(hold|tap) up .*tap up\n.*tap enter\n')
            again = Terminal("--show", "--journey", record)
            self.assertEqual(again.status(), 0)
            self.assertIn(b"a journey is being played", again.shown)


if __name__ == "__main__":
    unittest.main()
