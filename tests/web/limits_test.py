#!/usr/bin/python3
"""Who is let in by the emulator (the first argument), and what those can do who break the rules.

Its memory may grow by as many KiB as the second argument says."""

import contextlib
import http.client
import json
import os
import random
import sys
import time
import unittest

import websocket

from panel import POLLER, Panel, wait_for

EMULATOR = sys.argv.pop(1)
MOST_GROWTH = int(sys.argv.pop(1))
UPGRADE = {"Connection": "Upgrade", "Upgrade": "websocket", "Sec-WebSocket-Version": "13",
           "Sec-WebSocket-Key": "AAAAAAAAAAAAAAAAAAAAAA=="}
CLOSED = (websocket.WebSocketConnectionClosedException, ConnectionError)


class Limits(unittest.TestCase):
    def setUp(self):
        self.panel = self.enterContext(Panel(EMULATOR, POLLER))
        self.assert_well()
        self.memory = self.panel.memory()

    def assert_well(self):
        """It serves, and no key is down."""
        self.assertIsNone(json.loads(self.panel.open().recv())["down"])

    def assert_closed(self, page):
        with self.assertRaises(CLOSED):
            while True:
                page.recv()

    def test_only_who_has_the_token_and_comes_from_its_own_page_is_let_in(self):
        host, path = self.panel.host, self.panel.path
        status, headers, body = self.panel.ask(path)
        self.assertEqual((status, body[:15]), (200, b"<!DOCTYPE html>"))
        for line in ("default-src 'none'", "no-store", "nosniff", "no-referrer", "DENY"):
            self.assertIn(line, str(headers))
        for host_or_origin in ({"Host": "localhost:1"}, {"Origin": f"https://{host}"}):
            self.assertEqual(self.panel.ask(path, **host_or_origin)[0], 200)
        almost = path[:-2] + ("0" if path[-2] != "0" else "1") + "/"
        for status, refused in (
                (404, [{"path": wrong} for wrong in ("/", almost, path[:-1], "/" + path, path + "x")]),
                (403, [{"Host": wrong} for wrong in ("", "panel.example", "127.0.0.1.example",
                                                     "localhost:x", "[127.0.0.1]", "[::1")]),
                (403, [{"Origin": wrong} for wrong in ("null", "http://panel.example",
                                                       f"ws://{host}", f"http://{host}0")]),
                (405, [{"method": "POST"}]),
                (403, [{"path": path + "panel", **UPGRADE}]),
                (404, [{"path": almost + "panel", **UPGRADE, "Origin": f"http://{host}"}])):
            for request in refused:
                with self.subTest(request):
                    answer = self.panel.ask(**{"path": path, **request})
                    self.assertEqual((answer[0], answer[2]), (status, b""))

    def test_garbage_costs_a_closed_connection_and_nothing_else(self):
        chance = random.Random(1)
        begin = f"GET {self.panel.path} HTTP/1.1\r\nHost: ".encode()
        for number in range(1000):
            with self.panel.connect() as connection:
                connection.sendall(begin[:number % 90] + chance.randbytes(chance.randrange(1, 400)))
        idle = [self.panel.connect() for _ in range(100)]
        idle[-1].sendall(begin + b"x" * 20_000)
        self.assert_well()  # so all of them have been accepted
        self.assertLess(len(os.listdir(f"/proc/{self.panel.process.pid}/fd")), 100)
        words = ("press", "press north", "release now", "", "press up" + " " * 2**20)
        status, _, body = self.panel.ask(self.panel.path, Cookie="x" * 30_000)
        self.assertEqual((status, b"Cookies" in body), (431, True))
        for bad in (b"\xff" * 62, b"\x81\x05press", chance.randbytes(100),
                    *(websocket.ABNF.create_frame(text, 1).format() for text in words)):
            page = self.panel.open()
            with contextlib.suppress(OSError):  # closed while it is being sent
                page.sock.sendall(bad)
            self.assert_closed(page)
        self.assert_well()
        self.assertLess(self.panel.memory(), self.memory + MOST_GROWTH)

    def test_one_page_or_request_too_many_is_told_so_until_another_has_ended(self):
        load = http.client.HTTPConnection(self.panel.host, timeout=10)
        for name in ("", "page.css", "page.js", "glass.json"):  # one connection is enough
            load.request("GET", self.panel.path + name)
            self.assertEqual(load.getresponse().read()[:1] != b"", load.sock is not None)
        pages = [self.panel.open() for _ in range(64)]
        for name, wanted in (("", 200), ("glass.json", 503), ("panel", 503)):
            status, _, body = self.panel.ask(self.panel.path + name)
            self.assertEqual((status, b"64 browsers" in body), (wanted, wanted == 503))
        with self.assertRaises(websocket.WebSocketBadStatusException):
            self.panel.open()
        self.assertEqual(self.panel.ask(self.panel.path + "journey")[0], 200)
        pages.pop().close()
        self.assert_well()
        request = f"GET {self.panel.path}page.js HTTP/1.1\r\nHost: {self.panel.host}\r\n\r\n".encode()
        with self.panel.connect() as hasty:  # 20 in a second, and the next one ends the connection
            # No more than that: what it has not read would reset it, and lose answers on their way.
            hasty.sendall(request * 21)
            self.assertEqual(hasty.makefile("rb").read().count(b"HTTP/1.1 200"), 20)
        # Those that only wait for their next request make room, and those that read no answer do not.
        quick = [self.panel.connect() for _ in range(64)]
        for connection in quick:
            connection.sendall(request)
            self.assertEqual(connection.recv(1), b"H")
        self.assertEqual(self.panel.ask(self.panel.path + "journey")[0], 200)
        greedy = [self.panel.connect() for _ in range(64)]
        for connection in greedy:
            connection.sendall(request * 9)
            self.assertEqual(connection.recv(1), b"H")
        answer = self.panel.ask(self.panel.path + "journey")
        self.assertEqual((answer[0], b"64 requests" in answer[2]), (503, True))

    def test_an_address_to_watch_shows_and_presses_nothing(self):
        page = self.panel.open(self.panel.watch_address)
        self.assertEqual(json.loads(page.recv())["watch"], "address")
        page.send("press up")
        self.assert_closed(page)
        self.assert_well()

    def test_a_flood_ends_its_page_and_lets_its_key_come_up(self):
        page = self.panel.open()
        page.send("press down")
        wait_for(page, polls=3)
        with contextlib.suppress(OSError):
            for _ in range(10_000):
                page.send("press up")
        self.assert_closed(page)
        self.assert_well()
        page = self.panel.open()
        page.sock.sendall((b"\x89\xfd" + bytes(4 + 125)) * 5000)  # pings wait for their turn
        self.assert_well()
        self.assertLess(self.panel.memory(), self.memory + MOST_GROWTH)

    def test_a_key_belongs_to_who_pressed_last_and_comes_up_when_its_page_goes(self):
        first, second = self.panel.open(), self.panel.open()
        first.send("press up")
        wait_for(second, down="up", polls=3)
        second.send("press down")
        wait_for(first, down="down", counted="down", polls=2)
        first.send("release")
        first.send("hold")
        for polls in range(5, 20, 3):
            second.send("hold")
            wait_for(first, down="down", counted="down", polls=polls)
        second.sock.close()
        wait_for(first, down=None, polls=0)

    def test_a_key_comes_up_soon_after_the_last_word_of_its_page(self):
        page, other = self.panel.open(), self.panel.open()
        page.send("press up")
        wait_for(other, down="up", polls=4)
        page.send("hold")
        last_word = time.monotonic()
        wait_for(other, down=None)
        self.assertTrue(1.4 < time.monotonic() - last_word < 2)
        page.send("hold")  # too late: the key stays up
        with self.assertRaises(AssertionError):
            wait_for(other, 0.5, down="up")


if __name__ == "__main__":
    unittest.main(warnings="ignore")
