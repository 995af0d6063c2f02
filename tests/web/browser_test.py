#!/usr/bin/python3
"""The page of panel-emulator (the first argument) in a real browser, with the program (the second
argument) in the box. A third argument is a file for a picture of the page."""

import re
import select
import socket
import subprocess
import sys
import tempfile
import threading
import time
import unittest
from pathlib import Path

from selenium import webdriver
from selenium.webdriver.common.action_chains import ActionChains
from selenium.webdriver.common.by import By
from selenium.webdriver.common.keys import Keys

from panel import CHECKOUT, Panel

EMULATOR, PROGRAM = sys.argv[1:3]
PICTURE = sys.argv[3] if len(sys.argv) > 3 else None
IN_BOX = [str(CHECKOUT / "box/kestrova-panel-box"), "--", PROGRAM]
FLAGS = ("--headless=new --no-sandbox --disable-gpu --disable-quic --no-first-run "
         "--disable-background-networking --disable-component-update --disable-sync --hide-scrollbars")
KEYS = {"up": Keys.ARROW_UP, "down": Keys.ARROW_DOWN, "enter": Keys.ENTER, "escape": Keys.ESCAPE}

# Opens the panel as a program does that has been restarted, draws, asks for a key and ends.
FAULT = r"""exec 3<>$PANEL_TTY; printf '\376\050%.0s' 1 2 3 4 >&3
printf '\376\001fault\376\006' >&3; sleep 12; exit 150"""


class Browser:
    def __init__(self, case, address, downloads):
        options = webdriver.ChromeOptions()
        options.binary_location = "/usr/bin/chromium"
        for flag in FLAGS.split():
            options.add_argument(flag)
        options.add_experimental_option("prefs", {"download.default_directory": downloads})
        options.set_capability("goog:loggingPrefs", {"browser": "ALL"})
        service = webdriver.chrome.service.Service("/usr/bin/chromedriver")
        self.driver = webdriver.Chrome(service=service, options=options)
        case.addCleanup(self.driver.quit)
        self.driver.get(address)

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

    def tap(self, *keys):
        """By the keyboard, each as soon as the program can tell it from the one before."""
        for key in keys:
            self.expect_text("held", "none is down")
            ActionChains(self.driver).key_down(KEYS[key]).key_up(KEYS[key]).perform()
            self.expect_text("held", "1 poll:")
        self.expect_text("held", "none is down")

    def tap_until(self, key, *rows):
        while self.rows() != list(rows):
            self.tap(key)
            time.sleep(0.5)  # the page says what it shows when the screen is whole

    def key(self, name):
        return self.driver.find_element(By.CSS_SELECTOR, f"[data-key={name}]")

    def touch(self, kind, key=None):
        box = key.rect if key else None
        points = [{"x": box["x"] + 9, "y": box["y"] + 9}] if key else []
        self.driver.execute_cdp_cmd("Input.dispatchTouchEvent", {"type": kind, "touchPoints": points})

    def look(self, width, height, scheme):
        self.driver.execute_cdp_cmd("Emulation.setDeviceMetricsOverride", {
            "width": width, "height": height, "deviceScaleFactor": 1, "mobile": False})
        self.driver.execute_cdp_cmd("Emulation.setEmulatedMedia", {
            "features": [{"name": "prefers-color-scheme", "value": scheme}]})

    def saved(self, folder):
        """The journey that the page saves."""
        file = Path(folder, "panel.journey")
        file.unlink(missing_ok=True)
        self.driver.find_element(By.ID, "save").click()
        self.wait("saved", file.exists)
        return file


class Cable:
    """A way to the panel that can be cut."""

    def __init__(self, port):
        self.far_end = ("127.0.0.1", port)
        self.listener = socket.create_server(("127.0.0.1", 0))
        self.port = self.listener.getsockname()[1]
        self.is_cut = False
        threading.Thread(target=self.accept, daemon=True).start()

    def accept(self):
        while True:
            near = self.listener.accept()[0]
            if self.is_cut:
                near.close()
            else:
                threading.Thread(target=self.carry, args=(near,), daemon=True).start()

    def carry(self, near):
        with near, socket.create_connection(self.far_end) as far:
            while not self.is_cut:
                for end in select.select([near, far], [], [], 0.1)[0]:
                    data = end.recv(65536)
                    if not data:
                        return
                    (far if end is near else near).sendall(data)


class InBrowser(unittest.TestCase):
    def setUp(self):
        self.folder = self.enterContext(tempfile.TemporaryDirectory())

    def start(self, *options):
        panel = self.enterContext(Panel(EMULATOR, IN_BOX, *options))
        return panel, Browser(self, panel.address, self.folder)

    def test_an_address_is_set_by_holding_a_drawn_key_and_the_saved_journey_plays_it_again(self):
        _, page = self.start()
        page.tap_until("down", "E0 (eth0)", "192.0.2.10")
        page.tap("enter", "enter", "enter", "enter", "enter", "enter")
        page.expect("Enter IP Addr:", "192.  0.  2. 10")
        ActionChains(page.driver).click_and_hold(page.key("up")).perform()
        page.expect_text("held", "rest")
        page.expect_text("held", "repeat")
        page.wait("running", lambda: int(page.rows()[1][-3:] or 0) > 16)
        if PICTURE:
            page.look(900, 464, "light")
            time.sleep(0.3)  # for the layout
            page.driver.save_screenshot(PICTURE)
        ActionChains(page.driver).release().perform()
        page.expect_text("held", "none is down")
        time.sleep(0.5)
        octet = int(page.rows()[1][-3:])
        self.assertEqual((octet - 11) % 3, 0)
        page.tap("enter", "down", "down", "down", "down", "down", "enter")
        page.expect("E0 (eth0)", f"192.0.2.{octet}")
        journey = page.saved(self.folder)
        self.assertIn(f'expect "E0 (eth0)" "192.0.2.{octet}"',
                      journey.read_text(encoding="ascii").splitlines()[-1])
        again = subprocess.run([EMULATOR, "--journey", journey, "--", *IN_BOX], check=False,
                               capture_output=True, text=True, timeout=90)
        self.assertEqual(again.returncode, 0, again.stdout)
        self.assertEqual(page.driver.get_log("browser"), [])

    def test_a_finger_that_rests_on_escape_wipes_the_host_name(self):
        _, page = self.start()
        page.tap_until("down", "Hostname:", "rack12-monitor-w")
        page.tap("enter")
        page.expect("Enter Hostname:", "k12-monitor-west")
        page.touch("touchStart", page.key("escape"))
        page.expect_text("held", "long")
        page.touch("touchEnd")
        page.expect("Enter Hostname:", "")
        page.expect_text("held", "none is down")

    def test_two_browsers_see_one_panel_and_a_key_does_not_outlive_its_browser(self):
        panel, one = self.start()
        other = Browser(self, panel.address, self.folder)
        ActionChains(one.driver).key_down(Keys.ARROW_DOWN).perform()
        other.expect_text("held", "Down held, 3 polls")
        self.assertIn("down", other.key("down").get_attribute("class"))
        one.driver.quit()
        other.expect_text("held", "none is down")
        other.tap("down")
        time.sleep(0.5)
        last = re.findall('expect "(.*)" "(.*)"', other.saved(self.folder).read_text(encoding="ascii"))[-1]
        self.assertEqual([*last], other.rows())

    def test_a_cut_connection_is_said_and_comes_back_and_the_end_is_said_with_the_status(self):
        panel = self.enterContext(Panel(EMULATOR, ["sh", "-c", FAULT]))
        cable = Cable(panel.port)
        page = Browser(self, panel.address.replace(str(panel.port), str(cable.port)),
                       self.folder)
        page.expect_text("notice", "Connected")
        cable.is_cut = True
        page.expect_text("notice", "connection is lost")
        cable.is_cut = False
        page.expect_text("notice", "Connected")
        self.assertEqual(page.text("program"), "restarted")
        page.expect_text("notice", "has ended: the program ended with status 150")
        self.assertIn('expect "fault" ""', page.saved(self.folder).read_text(encoding="ascii"))

    def test_a_killed_emulator_is_a_lost_connection_and_a_journey_is_only_watched(self):
        journey = Path(self.folder, "journey")
        journey.write_text('expect "Kestrova (TM)"\nwait 60\n', encoding="ascii")
        panel, page = self.start("--journey", str(journey))
        page.expect_text("notice", "you can watch")
        self.assertFalse(page.key("up").is_enabled())
        panel.process.kill()
        page.expect_text("notice", "connection is lost")

    def test_it_fits_a_phone_and_a_projector_and_follows_the_scheme(self):
        _, page = self.start()
        seen = set()
        for width, height in ((320, 640), (1000, 700), (1920, 1080)):
            for scheme in ("light", "dark"):
                page.look(width, height, scheme)
                measured, colour = page.driver.execute_script(
                    "return [document.documentElement.scrollWidth,"
                    " getComputedStyle(document.documentElement).backgroundColor]")
                self.assertLessEqual(measured, width)
                self.assertGreaterEqual(page.key("escape").rect["height"], 44)
                self.assertLessEqual(page.key("escape").rect["y"], height)
                seen.add((scheme, colour))
        self.assertEqual(len(seen), 2)
        self.assertEqual(len({colour for _, colour in seen}), 2)


if __name__ == "__main__":
    unittest.main(argv=sys.argv[:1], warnings="ignore", verbosity=2)
