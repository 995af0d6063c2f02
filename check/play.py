"""Plays a copy of the appliance in the box."""

import json
import os
import shutil
import signal
import subprocess
import tempfile

import ending

HERE = os.path.dirname(os.path.realpath(__file__))
BOX = os.path.join(os.path.dirname(HERE), "box", "kestrova-panel-box")
KIT = "opt/appliance-check"  # where the box finds these files and the two programs
NO_BOX = 125
MOST_SECONDS = 3600  # after which a box is ended, whatever happens in it


class NoBox(Exception):
    """The box cannot be made, so that nothing can be played."""


class Stage:
    """A copy of the appliance with all that is played in it."""

    def __init__(self, appliance, programs, work):
        self.directory = tempfile.mkdtemp(dir=work)
        self.left_out = appliance.copy_to(self.directory)
        kit = f"{self.directory}/{KIT}"
        ending.run_or_fail("rm", "-rf", kit)  # that of the appliance
        shutil.copytree(HERE, kit, ignore=shutil.ignore_patterns("__pycache__"))
        for program in programs:
            shutil.copy(program, kit)
        os.makedirs(f"{self.directory}/etc", exist_ok=True)

    def write(self, name, text, mode=0o644):
        path = f"{self.directory}/{name}"
        os.makedirs(os.path.dirname(path), exist_ok=True)
        if os.path.lexists(path):
            os.remove(path)
        with open(path, "w", encoding="utf-8", errors="surrogateescape") as file:
            file.write(text)
        os.chmod(path, mode)

    def copy(self, work):
        """Another stage that begins as this one."""
        ending.go_on()
        other = object.__new__(Stage)
        other.directory = tempfile.mkdtemp(dir=work)
        other.left_out = self.left_out
        shutil.copytree(self.directory, other.directory, symlinks=True, dirs_exist_ok=True)
        return other

    def run(self, *command):
        """Runs a command in a new box, and returns what it has printed."""
        try:
            box = ending.run([BOX, "--no-tty", "--appliance", self.directory, "--", *command], MOST_SECONDS)
        except subprocess.TimeoutExpired:
            raise NoBox(f"a box has not ended within {MOST_SECONDS} seconds") from None
        if box.returncode in (NO_BOX, -signal.SIGKILL):
            raise NoBox(box.stderr.strip())
        return box.stdout + (box.stderr if box.returncode != 0 else "")

    def ask(self, question, **details):
        """Has in_box/answer.py answer a question in a new box."""
        said = self.run("/usr/bin/python3", "-BIS", f"/{KIT}/in_box/answer.py", question, json.dumps(details))
        try:
            return json.loads(said.splitlines()[-1])
        except (IndexError, ValueError):
            raise NoBox(f"no answer from the box: {said.strip()[-500:]}") from None
