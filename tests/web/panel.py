"""An emulated panel that is served to browsers, and a client that keeps to none of their rules."""

import base64
import json
import os
import socket
import struct
import subprocess
from pathlib import Path
from urllib.parse import urlsplit

CHECKOUT = Path(__file__).resolve().parents[2]

# Writes a row and asks for a key, as the program does, and is answered while a key is down.
POLLER = ["/usr/bin/python3", "-c", r"""
import os, select, time
line = os.open(os.environ["PANEL_TTY"], os.O_RDWR | os.O_NOCTTY)
polls = 0
while True:
    os.write(line, b"\xfe\x80%-16d\xfe\x06" % polls)
    if select.select([line], [], [], 0.5)[0]:
        polls += len(os.read(line, 255)) // 2
    time.sleep(0.1)
"""]


class Panel:
    """panel-emulator with a page, beside COMMAND; ends with the `with` statement."""

    def __init__(self, emulator, command, *options):
        self.process = subprocess.Popen([emulator, "--web", "0", *options, "--", *command],
                                        stdout=subprocess.PIPE, text=True)
        self.address = self.process.stdout.readline().strip()
        parts = urlsplit(self.address)
        self.host, self.port, self.path = parts.netloc, parts.port, parts.path

    def __enter__(self):
        return self

    def __exit__(self, *_):
        self.process.terminate()
        self.process.stdout.close()
        status = self.process.wait(timeout=10)
        assert status in (0, 128 + 15, 150, -9), status  # as a sanitizer's complaint is not

    def memory(self):
        """What it has of the machine's memory, in KiB."""
        status = Path(f"/proc/{self.process.pid}/status").read_text(encoding="ascii")
        return int(status.split("VmRSS:")[1].split()[0])

    def connect(self, receive_buffer=None):
        connection = socket.socket()
        if receive_buffer:
            connection.setsockopt(socket.SOL_SOCKET, socket.SO_RCVBUF, receive_buffer)
        connection.settimeout(10)
        connection.connect(("127.0.0.1", self.port))
        return connection

    def ask(self, name="", **changes):
        """The status of the answer to this request, and the rest of the answer."""
        with self.connect() as connection:
            connection.sendall(self.request(name, **changes))
            answer = b"".join(iter(lambda: connection.recv(65536), b""))
        head, body = answer.split(b"\r\n\r\n", 1)
        return int(head.split()[1]), head.decode(), body

    def request(self, name="", path=None, method="GET", upgrade=False, **headers):
        headers = {"Host": self.host, **headers}
        if upgrade:
            headers.update({"Connection": "Upgrade", "Upgrade": "websocket",
                            "Sec-WebSocket-Version": "13",
                            "Sec-WebSocket-Key": base64.b64encode(os.urandom(16)).decode()})
        lines = [f"{method} {self.path if path is None else path}{name} HTTP/1.1"]
        lines += [f"{field}: {value}" for field, value in headers.items()]
        return "\r\n".join(lines + ["", ""]).encode()


class Page:
    """An open page, of which nobody reads the states unless `state` is called."""

    def __init__(self, panel, receive_buffer=None):
        self.connection = panel.connect(receive_buffer)
        self.connection.sendall(panel.request("panel", upgrade=True, Origin=f"http://{panel.host}"))
        self.received = b""
        while b"\r\n\r\n" not in self.received:
            self.received += self.connection.recv(1)
        assert b" 101 " in self.received, self.received
        self.received = b""

    def send(self, text, times=1, opcode=1):
        data = text.encode()
        size = bytes([0x80 | len(data)]) if len(data) < 126 else b"\xff" + struct.pack(">Q", len(data))
        self.connection.sendall((bytes([0x80 | opcode]) + size + bytes(4) + data) * times)  # masked by 0

    def take(self, count):
        while len(self.received) < count:
            more = self.connection.recv(65536)
            if not more:
                raise ConnectionError("closed")
            self.received += more
        taken, self.received = self.received[:count], self.received[count:]
        return taken

    def state(self):
        """The next state."""
        while True:
            opcode, size = self.take(2)
            if size >= 126:
                size = int.from_bytes(self.take(2 if size == 126 else 8), "big")
            data = self.take(size)
            if opcode == 0x89:
                self.send(data.decode(), opcode=10)  # that it is still there
            if opcode == 0x81:
                return json.loads(data)

    def wait_until(self, is_right):
        while not is_right(state := self.state()):
            pass
        return state

    def is_closed(self):
        """True when the emulator has closed it, or does within ten seconds."""
        try:
            while self.connection.recv(65536):
                pass
        except TimeoutError:
            return False
        except OSError:
            pass
        return True
