#!/usr/bin/python3
"""The page of panel-emulator (the first argument) in a real browser, with the program (the second
argument) in the box. A third argument is a file for a picture of the page."""

import signal
import subprocess
import sys
import tempfile
import time
import unittest
from pathlib import Path

from selenium import webdriver
from selenium.webdriver.common.action_chains import ActionChains
from selenium.webdriver.common.by import By
from selenium.webdriver.common.keys import Keys

from panel import CHECKOUT, Panel

EMULATOR, PROGRAM, *PICTURE = sys.argv[1:]
IN_BOX = [str(CHECKOUT / "box/kestrova-panel-box"), "--", PROGRAM]
# Opens the panel as a program does that has been restarted, draws, asks for a key and ends.
FAULT = r"""exec 3<>$PANEL_TTY; printf '\376\050%.0s' 1 2 3 4 >&3
printf '\376\001fault\376\006' >&3; sleep 8; exit 150"""
FLAGS = ("--headless=new --no-sandbox --disable-gpu --disable-quic --no-first-run "
         "--disable-background-networking --disable-component-update --disable-sync --hide-scrollbars")
# Sees also what is over before the test asks for it.
WATCH_KEY = """window.isCounted = false;
new MutationObserver((_, observer) => {
  if (!/[1-9] polls?:/.test(held.textContent)) return;
  window.isCounted = true;
  observer.disconnect();
}).observe(held, { childList: true });"""
KEYS = {"up": Keys.ARROW_UP, "down": Keys.ARROW_DOWN, "enter": Keys.ENTER, "escape": Keys.ESCAPE}


class Browser:
    def __init__(self, case, address):
        options = webdriver.ChromeOptions()
        options.binary_location = "/usr/bin/chromium"
        for flag in FLAGS.split():
            options.add_argument(flag)
        options.add_experimental_option("prefs", {"download.default_directory": case.folder})
        self.driver = webdriver.Chrome(
            service=webdriver.chrome.service.Service("/usr/bin/chromedriver"), options=options)
        case.addCleanup(self.driver.quit)
        self.driver.get(address)
        self.file = Path(case.folder, "panel.journey")

    def text(self, name):
        return self.driver.find_element(By.ID, name).get_property("textContent")

    def rows(self):
        return [row.get_property("textContent").rstrip()
                for row in self.driver.find_elements(By.CSS_SELECTOR, "#text p")]

    def wait(self, what, is_so):
        """Fails when this does not become so within 20 seconds."""
        give_up = time.monotonic() + 20
        while not is_so():
            if time.monotonic() > give_up:
                raise AssertionError(f"not {what}: {self.rows()}, {self.text('held')}, "
                                     f"{self.text('notice')}, {self.text('program')}")
            time.sleep(0.02)

    def expect(self, *rows):
        self.wait(rows, lambda: self.rows() == list(rows))

    def expect_text(self, name, part):
        self.wait(part, lambda: part in self.text(name))

    def act(self, action, *arguments):
        getattr(ActionChains(self.driver), action)(*arguments).perform()

    def tap(self, *keys):
        """By the keyboard, each when the program can tell it from the one before."""
        for key in keys:
            self.driver.execute_script(WATCH_KEY)
            ActionChains(self.driver).key_down(KEYS[key]).key_up(KEYS[key]).perform()
            self.wait(f"{key} counted", lambda: self.driver.execute_script("return isCounted"))
            self.expect_text("held", "none is down")

    def tap_until(self, *rows):
        while self.rows() != list(rows):
            self.tap("down")
            time.sleep(0.5)  # a screen is read out when it is whole

    def key(self, name):
        return self.driver.find_element(By.CSS_SELECTOR, f"[data-key={name}]")

    def look(self, width, height, scheme):
        self.driver.execute_cdp_cmd("Emulation.setDeviceMetricsOverride", {
            "width": width, "height": height, "deviceScaleFactor": 1, "mobile": False})
        self.driver.execute_cdp_cmd("Emulation.setEmulatedMedia", {
            "features": [{"name": "prefers-color-scheme", "value": scheme}]})
        time.sleep(0.3)  # for the layout

    def saved(self):
        """The journey that the page saves."""
        self.driver.find_element(By.ID, "save").click()
        # The browser makes the file before it has what belongs into it.
        self.wait("saved", lambda: self.file.exists() and self.file.stat().st_size)
        return self.file.read_text(encoding="ascii")


class InBrowser(unittest.TestCase):
    def start(self, *options, command=IN_BOX):
        self.folder = self.enterContext(tempfile.TemporaryDirectory())
        panel = self.enterContext(Panel(EMULATOR, command, *options))
        return panel, Browser(self, panel.address)

    def test_an_address_is_set_by_holding_a_drawn_key_and_the_saved_journey_plays_it_again(self):
        _, page = self.start()
        page.tap_until("E0 (eth0)", "192.0.2.10")
        page.tap("enter", "enter", "enter", "enter", "enter", "enter")
        page.expect("Enter IP Addr:", "192.  0.  2. 10")
        page.act("click_and_hold", page.key("up"))
        page.wait("running", lambda: "repeat" in page.text("held") and int(page.rows()[1][-3:]) > 16)
        if PICTURE:
            page.look(900, 464, "light")
            page.driver.save_screenshot(PICTURE[0])
        page.act("release")
        page.expect_text("held", "none is down")
        time.sleep(0.5)
        octet = int(page.rows()[1][-3:])
        self.assertEqual((octet - 11) % 3, 0)
        page.tap("enter", "down", "down", "down", "down", "down", "enter")
        page.expect("E0 (eth0)", f"192.0.2.{octet}")
        self.assertTrue(page.saved().endswith(f'expect "E0 (eth0)" "192.0.2.{octet}"\n'))
        again = subprocess.run([EMULATOR, "--journey", page.file, "--", *IN_BOX], check=False,
                               capture_output=True, text=True, timeout=90)
        self.assertEqual(again.returncode, 0, again.stdout + again.stderr)
        self.assertEqual(page.driver.get_log("browser"), [])

    def test_a_finger_that_rests_on_escape_wipes_the_host_name(self):
        _, page = self.start()
        page.tap_until("Hostname:", "rack12-monitor-w")
        page.tap("enter")
        page.expect("Enter Hostname:", "k12-monitor-west")
        at = {side: page.key("escape").rect[side] + 9 for side in ("x", "y")}
        for touch, points, held in (("touchStart", [at], "long"), ("touchEnd", [], "none is down")):
            page.driver.execute_cdp_cmd("Input.dispatchTouchEvent",
                                        {"type": touch, "touchPoints": points})
            page.expect_text("held", held)
        page.expect("Enter Hostname:", "")

    def test_two_browsers_see_one_panel_and_a_key_does_not_outlive_its_browser(self):
        panel, one = self.start()
        one.expect_text("notice", "Connected")
        one.act("key_down", Keys.ARROW_DOWN)
        one.expect_text("held", "Down held")
        other = Browser(self, panel.address)
        other.expect_text("held", "Down held")
        one.driver.quit()
        other.expect_text("held", "none is down")
        other.tap("down")
        time.sleep(0.5)
        journey = other.saved()
        self.assertEqual(journey.splitlines()[2][:8], "expect \"")  # before the key that was down
        self.assertTrue(journey.endswith('expect "{}" "{}"\n'.format(*other.rows())))
        for number, said in ((signal.SIGSTOP, "connection is lost"), (signal.SIGCONT, "Connected")):
            panel.process.send_signal(number)
            other.expect_text("notice", said)
            self.assertEqual(other.key("up").is_enabled(), number == signal.SIGCONT)

    def test_a_lost_connection_comes_back_and_the_end_is_said_with_the_status(self):
        _, page = self.start(command=["sh", "-c", FAULT])
        page.expect_text("notice", "Connected")
        flood = ActionChains(page.driver, duration=0)  # nobody can: it is cut off
        for _ in range(80):
            flood.key_down(Keys.ARROW_UP).key_up(Keys.ARROW_UP)
        flood.perform()
        page.expect_text("notice", "connection is lost")
        page.expect_text("notice", "Connected")
        self.assertEqual(page.text("program"), "restarted")
        page.expect_text("notice", "has ended: the program ended with status 150")
        self.assertIn('expect "fault" ""', page.saved())

    def test_it_fits_phone_and_projector_and_watches_a_journey_until_the_emulator_is_killed(self):
        panel, page = self.start("--journey", CHECKOUT / "journeys/20-static-address.journey")
        page.expect_text("notice", "you can watch")
        self.assertFalse(page.key("up").is_enabled())
        colours = []
        for width, height, scheme in ((320, 568, "light"), (1000, 700, "dark"),
                                      (568, 320, "light"), (1920, 1080, "light")):
            page.look(width, height, scheme)
            measured, colour = page.driver.execute_script(
                "return [document.documentElement.scrollWidth,"
                " getComputedStyle(document.documentElement).backgroundColor]")
            self.assertLessEqual(measured, width)
            key = page.key("escape").rect
            self.assertGreaterEqual(key["height"], 44)
            self.assertLessEqual(key["y"] + key["height"], height)
            colours.append(colour)
        self.assertEqual([colour == colours[0] for colour in colours], [True, False, True, True])
        panel.process.kill()
        page.expect_text("notice", "connection is lost")


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1], warnings="ignore", verbosity=2)
