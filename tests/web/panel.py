"""An emulated panel that is served as a page, and clients that are no browsers."""

import http.client
import json
import socket
import subprocess
import time
from pathlib import Path
from urllib.parse import urlsplit

import websocket

CHECKOUT = Path(__file__).resolve().parents[2]

# Writes a row and asks for a key, as the program does.
POLLER = ["/usr/bin/python3", "-c", r"""
import os, select, time
line = os.open(os.environ["PANEL_TTY"], os.O_RDWR | os.O_NOCTTY)
while True:
    os.write(line, b"\xfe\x80%16.1f\xfe\x06" % time.monotonic())
    if select.select([line], [], [], 0.5)[0]:
        os.read(line, 255)
    time.sleep(0.1)
"""]


class Panel:
    """panel-emulator beside COMMAND; ends with the `with` statement."""

    def __init__(self, emulator, command, *options):
        self.process = subprocess.Popen([emulator, "--web", "0", *options, "--", *command],
                                        stdout=subprocess.PIPE, text=True)
        self.address = self.process.stdout.readline().strip()
        self.host, self.path = urlsplit(self.address)[1:3]

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.process.terminate()
        self.process.stdout.close()
        status = self.process.wait(timeout=10)
        assert status in (0, 128 + 15, 150, -9), status  # as a sanitizer's complaint is not

    def memory(self):
        """What it has of the machine's memory, in KiB."""
        return int(Path(f"/proc/{self.process.pid}/statm").read_text(encoding="ascii").split()[1]) * 4

    def connect(self):
        return socket.create_connection(self.host.split(":"), 10)

    def ask(self, path, method="GET", **headers):
        """Status, headers and body of the answer."""
        connection = http.client.HTTPConnection(self.host, timeout=10)
        connection.request(method, path, headers=headers)
        with connection.getresponse() as answer:
            return answer.status, dict(answer.headers), answer.read()

    def open(self, **options):
        """The WebSocket of an open page."""
        return websocket.create_connection(f"ws://{self.host}{self.path}panel", timeout=10,
                                           origin=f"http://{self.host}", **options)


def wait_for(page, seconds=20, **wanted):
    """The first state from here on that is so. It has to come within that many seconds."""
    give_up = time.monotonic() + seconds
    while time.monotonic() < give_up:
        state = json.loads(page.recv() or "null")
        if wanted.items() <= state.items():
            return state
    raise AssertionError(f"no state with {wanted}")
