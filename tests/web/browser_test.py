#!/usr/bin/python3
"""The page of panel-emulator in a real browser, with the program in the box.

The arguments are the browser, the emulator, the program, a file with axe-core and, if there is to be
one, the file for a picture of the page.
"""

import re
import signal
import subprocess
import sys
import tempfile
import time
import unittest
from pathlib import Path

from browser import BROWSERS
from panel import CHECKOUT, Panel, Relay, wait_for

BROWSER, EMULATOR, PROGRAM, AXE, *PICTURE = sys.argv[1:]
IN_BOX = [str(CHECKOUT / "box/kestrova-panel-box"), "--", PROGRAM]
# Opens the panel as a program does that has been restarted, draws, and ends at the second key.
FAULT = r"""exec 3<>$PANEL_TTY; printf '\376\050%.0s' 1 2 3 4 >&3
printf '\376\001fault\376\006' >&3; head -c 2 <&3
sleep 2; printf '\376\006' >&3; head -c 2 <&3; exit 150"""
# What is told of the keys from here on, also if it is over before the test asks for it.
WATCH_KEYS = """window.told = [];
new MutationObserver(() => told.push(held.textContent)).observe(held, { childList: true });"""
# All rules but the contrast that only level AAA asks for.
AUDIT = """return axe.run({ rules: Object.fromEntries(axe.getRules().map(
  ({ ruleId }) => [ruleId, { enabled: ruleId !== "color-contrast-enhanced" }])) })
  .then(({ violations }) => violations.map(({ id, nodes }) => [id, nodes.map(node => node.html)]));"""
KEYS = {"up": "\ue013", "down": "\ue015", "enter": "\ue007", "escape": "\ue00c"}


class Page:
    """The page in the browser, and what an operator does there."""

    def __init__(self, case, address):
        self.folder = case.enterContext(tempfile.TemporaryDirectory(ignore_cleanup_errors=True))
        self.browser = BROWSERS[BROWSER](self.folder)
        case.addCleanup(self.browser.quit)
        self.run = self.browser.run
        self.browser.open(address)
        self.wait("connected", lambda: self.text("held"))

    def text(self, name):
        return self.run(f"return document.getElementById('{name}').textContent")

    def rows(self):
        """What is read out: the two rows, and where the cursor is."""
        return self.run("return [...document.querySelectorAll('#text p')]"
                        ".map(row => row.textContent.trimEnd())")

    def wait(self, what, is_so):
        """Fails when this does not become so within 20 seconds."""
        give_up = time.monotonic() + 20
        while not is_so():
            if time.monotonic() > give_up:
                texts = [self.text(name) for name in ("held", "notice", "trouble", "program", "saved")]
                raise AssertionError(f"not {what}: {self.rows()}, {texts}")
            time.sleep(0.02)

    def expect(self, *rows):
        self.wait(rows, lambda: self.rows()[:len(rows)] == list(rows))

    def expect_text(self, name, part):
        self.wait(part, lambda: part in self.text(name))

    def keyboard(self, *actions):
        self.browser.perform(type="key", actions=[
            {"type": f"key{action}", "value": KEYS[key]} for action, key in actions])

    def place(self, selector):
        """Left, top, width, height."""
        return self.run(f"const at = document.querySelector('{selector}').getBoundingClientRect();"
                        "return [at.x, at.y, at.width, at.height]")

    def point(self, kind, key, *actions):
        left, top, *_ = self.place(f"[data-key={key}]")
        self.browser.perform(type="pointer", parameters={"pointerType": kind}, actions=[
            {"type": "pointerMove", "x": int(left) + 9, "y": int(top) + 9}, *actions])

    def tap(self, *keys):
        """By the keyboard, each until it is counted, and when the program can tell it from the last."""
        for key in keys:
            self.run(WATCH_KEYS)
            self.keyboard(("Down", key))
            self.wait(f"{key} counted", lambda: re.search(r"[1-9] poll", str(self.run("return told"))))
            self.keyboard(("Up", key))
            self.expect_text("held", "No key is down")

    def tap_until(self, *rows):
        while self.rows()[:2] != list(rows):
            self.tap("down")
            time.sleep(0.5)  # a screen is read out when it is whole

    def saved(self):
        """The journey that the page saves."""
        self.run("document.getElementById('save').click()")
        file = Path(self.folder, "panel.journey")
        # The browser makes the file before it has what belongs into it.
        self.wait("saved", lambda: file.exists() and file.stat().st_size)
        return file.read_text(encoding="ascii")


class InBrowser(unittest.TestCase):
    def start(self, *options, command=IN_BOX):
        panel = self.enterContext(Panel(EMULATOR, command, *options))
        return panel, Page(self, panel.address)

    def test_an_address_is_set_by_holding_a_drawn_key_and_the_saved_journey_plays_it_again(self):
        _, page = self.start()
        page.tap_until("E0 (eth0)", "192.0.2.10")
        page.tap("enter", "enter", "enter", "enter", "enter", "enter")
        page.expect("Enter IP Addr:", "192.  0.  2. 10", "Cursor on octet 4: 10")
        if PICTURE:
            page.browser.size(900, 464)
        page.point("mouse", "up", {"type": "pointerDown", "button": 0})
        page.wait("resting", lambda: "3 polls: rest" in page.text("held"))
        if PICTURE:
            Path(PICTURE[0]).write_bytes(page.browser.driver.get_screenshot_as_png())
        page.wait("running", lambda: "10 polls: repeat" in page.text("held"))
        self.assertEqual(page.rows()[1], "192.  0.  2. 10")  # it is read out when it has come to rest
        page.point("mouse", "up", {"type": "pointerUp", "button": 0})
        page.wait("another octet", lambda: page.rows()[1] != "192.  0.  2. 10")
        octet = int(page.rows()[1][-3:])
        self.assertEqual((octet - 11) % 3, 0)
        self.assertEqual(page.rows()[2], f"Cursor on octet 4: {octet}")
        page.tap("enter", "down", "down", "down", "down", "down", "enter")
        page.expect("E0 (eth0)", f"192.0.2.{octet}", "")
        self.assertTrue(page.saved().endswith(f'expect "E0 (eth0)" "192.0.2.{octet}"\n'))
        self.assertEqual(page.text("saved"), "Saved.")
        again = subprocess.run([EMULATOR, "--journey", f"{page.folder}/panel.journey", "--", *IN_BOX],
                               check=False, capture_output=True, text=True, timeout=90)
        self.assertEqual(again.returncode, 0, again.stdout + again.stderr)
        self.assertEqual(page.browser.complaints(), [])

    def test_a_finger_wipes_the_host_name_and_a_fresh_appliance_has_it_again(self):
        panel, page = self.start()
        page.tap_until("Hostname:", "rack12-monitor-w")
        page.tap("enter")
        page.expect("Enter Hostname:", "k12-monitor-west", "Cursor on position 16: t")
        page.run(WATCH_KEYS)
        page.point("touch", "escape", {"type": "pointerDown", "button": 0},
                   {"type": "pause", "duration": 2500}, {"type": "pointerUp", "button": 0})
        page.wait("long", lambda: "long" in str(page.run("return told")))
        page.expect("Enter Hostname:", "", "Cursor on position 1: blank")
        late = Page(self, panel.address)
        late.expect("Enter Hostname:", "")
        late.saved()
        self.assertIn("cannot be played", late.text("saved"))
        page.run("window.confirm = () => true; document.getElementById('anew').click()")
        page.expect("Kestrova (TM)", "cabinetDevice", "")
        page.tap_until("Hostname:", "rack12-monitor-w")
        journey = page.saved()
        self.assertEqual((journey.count("limit"), journey.count("enter")), (1, 0))

    def test_browsers_share_a_panel_and_a_key_outlives_neither_its_browser_nor_a_stalled_line(self):
        panel = self.enterContext(Panel(EMULATOR, IN_BOX))
        relay = self.enterContext(Relay(panel.host))
        one = Page(self, panel.address.replace(panel.host, relay.host))
        one.expect_text("notice", "Connected")
        other, watcher = Page(self, panel.address), Page(self, panel.watch_address)
        one.keyboard(("Down", "down"))
        one.expect_text("held", "Down held, ")
        for page in (other, watcher):
            page.expect_text("held", "Down held in another browser")
        ear = panel.open()
        wait_for(ear, down="down")
        relay.stall()
        stalled = time.monotonic()
        wait_for(ear, down=None)
        self.assertLess(time.monotonic() - stalled, 2)
        one.expect_text("trouble", "connection is lost")
        self.assertEqual(one.text("held"), "")
        watcher.expect_text("notice", "presses no keys")
        self.assertTrue(watcher.run("return document.querySelector('[data-key=up]').disabled"))
        watcher.keyboard(("Down", "up"), ("Up", "up"))
        other.tap("down")
        time.sleep(0.5)
        journey = other.saved()
        self.assertEqual(journey.splitlines()[2][:8], "expect \"")  # before the key that was down
        self.assertTrue(journey.endswith('expect "{}" "{}"\n'.format(*other.rows())))
        for number, field, said in ((signal.SIGSTOP, "trouble", "connection is lost"),
                                    (signal.SIGCONT, "notice", "Connected")):
            panel.process.send_signal(number)
            other.expect_text(field, said)
            self.assertEqual(other.run("return document.querySelector('[data-key=up]').disabled"),
                             number == signal.SIGSTOP)

    def test_a_lost_connection_comes_back_and_the_end_is_said_with_the_status(self):
        _, page = self.start(command=["sh", "-c", FAULT])
        page.expect_text("notice", "Connected")
        page.keyboard(*[("Down", "up"), ("Up", "up")] * 80)  # nobody can: it is cut off
        page.expect_text("trouble", "connection is lost")
        page.expect_text("notice", "Connected")
        self.assertEqual(page.text("program"), "restarted")
        page.keyboard(("Down", "enter"))
        page.expect_text("trouble", "has ended: the program ended with status 150")
        self.assertIn('expect "fault" ""', page.saved())

    def test_it_fits_phone_and_projector_and_watches_a_journey_until_the_emulator_is_killed(self):
        panel, page = self.start("--journey", CHECKOUT / "journeys/20-static-address.journey")
        page.expect_text("notice", "you can watch")
        page.run(Path(AXE).read_text(encoding="utf-8") + "; window.axe = axe;")
        looks = [{}] if BROWSER != "chromium" else [
            {"prefers_color_scheme": "light"}, {"prefers_color_scheme": "dark"},
            {"prefers_color_scheme": "dark", "forced_colors": "active"}]
        for look in looks:
            if look:
                page.browser.media(**look)
            for width, height in ((320, 568), (568, 320), (768, 1024), (1920, 1000)):
                page.browser.size(width, height)
                with self.subTest(look=look, width=width):
                    page.wait("as wide", lambda: page.run("return innerWidth") <= max(width, 450))
                    wide = page.run("return innerWidth")
                    self.assertLessEqual(page.run("return document.documentElement.scrollWidth"), wide)
                    for selector in ("[data-key=escape]", "#save"):
                        *_, top, _, side = page.place(selector)
                        self.assertGreaterEqual(side, 44)
                        self.assertLessEqual(top + side, height)
                    shown = page.run("return dots.getBoundingClientRect().width * devicePixelRatio")
                    self.assertAlmostEqual(page.run("return dots.width"), shown, places=2)
                    self.assertEqual(page.run(AUDIT), [])
        panel.process.kill()
        page.expect_text("trouble", "connection is lost")


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1], warnings="ignore", verbosity=2)
