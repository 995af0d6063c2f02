#!/usr/bin/python3
"""Who is let in by the emulator (the first argument), and what those can do who break the rules."""

import os
import random
import sys
import unittest

from panel import POLLER, Page, Panel

EMULATOR = sys.argv.pop(1)
MOST_GROWTH = 8192  # KiB: less than a thousand connections take


class Limits(unittest.TestCase):
    @classmethod
    def setUpClass(cls):
        cls.panel = cls.enterClassContext(Panel(EMULATOR, POLLER))

    def assert_well(self, pressed=None):
        """It serves, and this key is down."""
        self.assertEqual(Page(self.panel).state()["down"], pressed)

    def test_only_who_has_the_token_and_comes_from_its_own_page_is_let_in(self):
        panel, here = self.panel, f"http://{self.panel.host}"
        status, head, body = panel.ask()
        self.assertEqual((status, body[:15]), (200, b"<!DOCTYPE html>"))
        for line in ("default-src 'none'", "Cache-Control: no-store", "nosniff", "no-referrer",
                     "X-Frame-Options: DENY"):
            self.assertIn(line, head)
        self.assertNotIn("Cookie", head)
        almost = panel.path[:-2] + ("0" if panel.path[-2] != "0" else "1") + "/"
        token = panel.path.strip("/")
        refused = {404: [{"path": path} for path in ("/", almost, panel.path[:-1], f"//{token}/",
                                                     f"/{token.upper()}x/", f"{panel.path}none")],
                   403: [{"Host": host} for host in ("panel.example", "127.0.0.1.example", "",
                                                     "localhost:x", "127.0.0.1:1:1")]
                        + [{"Origin": origin} for origin in ("null", "http://panel.example",
                                                             f"http://127.0.0.1:{panel.port + 1}")],
                   405: [{"method": "POST"}, {"method": "HEAD"}]}
        for status, requests in refused.items():
            for request in requests:
                with self.subTest(request=request):
                    status_now, _, body = panel.ask(**request)
                    self.assertEqual((status_now, body), (status, b""))
        for status, wrong in ((403, {}), (403, {"Origin": "http://panel.example"}),
                              (403, {"Origin": here, "Host": f"x{panel.host}"}),
                              (404, {"Origin": here, "path": almost})):
            self.assertEqual(panel.ask("panel", upgrade=True, **wrong)[0], status)
        self.assertEqual(panel.ask(Host=f"localhost:{panel.port}")[0], 200)

    def test_garbage_costs_a_closed_connection_and_nothing_else(self):
        before = self.panel.memory()
        chance = random.Random(1)
        for number in range(1000):
            with self.panel.connect() as connection:
                garbage = chance.randbytes(chance.randrange(1, 400))
                connection.sendall(garbage if number % 2 else self.panel.request()[:number % 90] + garbage)
        idle = [self.panel.connect() for _ in range(100)]  # do not keep others out
        with self.panel.connect() as connection:
            connection.sendall(b"GET / HTTP/1.1\r\nX: " + b"x" * 20_000 + b"\r\n\r\n")
        for frame in (b"\xff\xff" + b"\xff" * 60, b"\x81\x05press", os.urandom(100)):
            page = Page(self.panel)
            page.connection.sendall(frame)
            self.assertTrue(page.is_closed())
        for words in ("press", "press north", "release now", ""):
            page = Page(self.panel)
            page.send(words)
            self.assertTrue(page.is_closed(), words)
        self.assert_well()
        for connection in idle:
            connection.close()
        self.assertLess(self.panel.memory(), before + MOST_GROWTH)

    def test_a_flood_of_messages_or_a_huge_one_ends_the_page_and_lets_its_key_come_up(self):
        before = self.panel.memory()
        for words, times in (("press up", 10_000), ("press up" + " " * 2**20, 1)):
            page = Page(self.panel)
            page.send("press down")
            page.wait_until(lambda state: state["polls"] > 1)
            try:
                page.send(words, times)
            except OSError:
                pass  # closed while it was being sent
            self.assertTrue(page.is_closed())
            self.assert_well()
        page = Page(self.panel)
        page.send("x" * 100, 5_000, opcode=9)  # pings wait for their turn
        self.assert_well()
        self.assertLess(self.panel.memory(), before + MOST_GROWTH)

    def test_a_key_belongs_to_who_pressed_last_and_comes_up_when_he_goes_away(self):
        first, second = Page(self.panel), Page(self.panel)
        first.send("press up")
        second.wait_until(lambda state: (state["counted"], state["polls"]) == ("up", 3))
        second.send("press down")
        first.wait_until(lambda state: (state["down"], state["polls"]) == ("down", 2))
        first.send("release")
        first.wait_until(lambda state: (state["down"], state["polls"]) == ("down", 7))
        second.connection.close()
        first.wait_until(lambda state: state["polls"] == 0)
        self.assert_well()


if __name__ == "__main__":
    unittest.main(warnings="ignore")
