"""An emulated panel that is served as a page, and clients that are no browsers."""

import contextlib
import http.client
import json
import socket
import subprocess
import threading
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
        self.watch_address = self.process.stdout.readline().split()[-1]
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
        """Takes little of what it is sent before it is read."""
        connection = socket.socket()
        connection.setsockopt(socket.SOL_SOCKET, socket.SO_RCVBUF, 2048)
        connection.connect((self.host.split(":")[0], int(self.host.split(":")[1])))
        return connection

    def ask(self, path, method="GET", **headers):
        """Status, headers and body of the answer."""
        connection = http.client.HTTPConnection(self.host, timeout=10)
        connection.request(method, path, headers=headers)
        with connection.getresponse() as answer:
            return answer.status, dict(answer.headers), answer.read()

    def open(self, address=None, **options):
        """The WebSocket of an open page."""
        return websocket.create_connection(f"ws{(address or self.address)[4:]}panel", timeout=10,
                                           origin=f"http://{self.host}", **options)


class Relay:
    """Stands between a browser and the panel, and may stop forwarding without a word."""

    def __init__(self, host):
        self.far = host.split(":")
        self.server = socket.create_server(("127.0.0.1", 0))
        self.host = "127.0.0.1:{1}".format(*self.server.getsockname())
        self.forwards = threading.Event()
        self.forwards.set()
        self.stall = self.forwards.clear
        threading.Thread(target=self.serve, daemon=True).start()

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.server.close()

    def serve(self):
        with contextlib.suppress(OSError):
            while True:
                ends = self.server.accept()[0], socket.create_connection(self.far)
                for pair in (ends, ends[::-1]):
                    threading.Thread(target=self.forward, args=pair, daemon=True).start()

    def forward(self, source, target):
        with contextlib.suppress(OSError):
            while data := source.recv(65536):
                self.forwards.wait()
                target.sendall(data)
            target.shutdown(socket.SHUT_WR)


def wait_for(page, seconds=20, **wanted):
    """The first state from here on that is so. It has to come within that many seconds."""
    give_up = time.monotonic() + seconds
    while time.monotonic() < give_up:
        state = json.loads(page.recv() or "null")
        if wanted.items() <= state.items():
            return state
    raise AssertionError(f"no state with {wanted}")
