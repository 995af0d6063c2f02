"""Three browsers, driven alike: two by their WebDriver programs, while Firefox speaks WebDriver BiDi.

Both take the same actions of keys and fingers.
"""

import glob
import itertools
import json
import os
import subprocess
from pathlib import Path

import websocket
from selenium import webdriver
from selenium.webdriver.chrome.service import Service as ChromiumService
from selenium.webdriver.webkitgtk.service import Service as WebKitService

CHROMIUM_FLAGS = ("--headless=new --no-sandbox --disable-gpu --disable-quic --no-first-run "
                  "--disable-background-networking --disable-component-update --disable-sync "
                  "--hide-scrollbars")
FIREFOX_PREFERENCES = {"browser.download.folderList": 2, "browser.download.alwaysOpenPanel": False}


class Chromium:
    def __init__(self, folder):
        """Saves files in the folder."""
        options = webdriver.ChromeOptions()
        options.binary_location = "/usr/bin/chromium"
        for flag in CHROMIUM_FLAGS.split():
            options.add_argument(flag)
        options.add_experimental_option("prefs", {"download.default_directory": folder})
        self.driver = webdriver.Chrome(service=ChromiumService("/usr/bin/chromedriver"), options=options)

    def open(self, address):
        self.driver.get(address)

    def run(self, script):
        """What the script returns."""
        return self.driver.execute_script(script)

    def perform(self, **source):
        """What WebDriver calls the actions of one source, such as a keyboard."""
        self.driver.execute("actions", {"actions": [{"id": source["type"], **source}]})

    def size(self, width, height):
        self.driver.execute_cdp_cmd("Emulation.setDeviceMetricsOverride", {
            "width": width, "height": height, "deviceScaleFactor": 1, "mobile": False})

    def media(self, **features):
        self.driver.execute_cdp_cmd("Emulation.setEmulatedMedia", {
            "features": [{"name": name.replace("_", "-"), "value": value}
                         for name, value in features.items()]})

    def complaints(self):
        return self.driver.get_log("browser")

    def quit(self):
        self.driver.quit()


class WebKit(Chromium):
    def __init__(self, folder):
        Path(folder, "user-dirs.dirs").write_text(f'XDG_DOWNLOAD_DIR="{folder}"\n', encoding="utf-8")
        os.environ["XDG_CONFIG_HOME"] = folder
        options = webdriver.WebKitGTKOptions()
        options.binary_location = glob.glob("/usr/lib/*/webkit2gtk-4.*/MiniBrowser")[0]
        options.add_argument("--automation")
        self.service = WebKitService("/usr/bin/WebKitWebDriver", log_path=os.devnull)
        self.service.start()
        self.driver = webdriver.Remote(self.service.service_url, options=options)

    def size(self, width, height):
        inner, outer = self.run("return [innerHeight, outerHeight]")
        self.driver.set_window_rect(0, 0, width, height + outer - inner)

    def complaints(self):
        return []  # it tells of none

    def quit(self):
        self.driver.quit()
        self.service.stop()


class Firefox:
    def __init__(self, folder):
        preferences = {**FIREFOX_PREFERENCES, "browser.download.dir": folder}
        Path(folder, "user.js").write_text("".join(
            f"user_pref({json.dumps(name)}, {json.dumps(value)});\n"
            for name, value in preferences.items()), encoding="utf-8")
        self.process = subprocess.Popen(
            ["firefox-esr", "--headless", "--no-remote", "--profile", folder,
             "--remote-debugging-port", "0"], stderr=subprocess.PIPE, text=True)
        address = next(line.split()[-1] for line in self.process.stderr if "BiDi listening" in line)
        self.connection = websocket.create_connection(f"{address}/session", timeout=60,
                                                      suppress_origin=True)
        self.numbers = itertools.count(1)
        self.errors = []
        self.ask("session.new", capabilities={})
        self.ask("session.subscribe", events=["log.entryAdded"])
        self.page = {"context": self.ask("browsingContext.getTree")["contexts"][0]["context"]}

    def ask(self, method, **parameters):
        number = next(self.numbers)
        self.connection.send(json.dumps({"id": number, "method": method, "params": parameters}))
        while True:
            answer = json.loads(self.connection.recv())
            if answer.get("method") == "log.entryAdded":
                self.errors.append(answer["params"]["text"])
            if answer.get("id") == number:
                assert answer["type"] == "success", answer
                return answer["result"]

    def open(self, address):
        self.ask("browsingContext.navigate", url=address, wait="complete", **self.page)

    def run(self, script):
        json_of = f"(async () => {{ {script} }})().then(value => JSON.stringify(value ?? null))"
        answer = self.ask("script.evaluate", target=self.page, awaitPromise=True, expression=json_of)
        assert answer["type"] == "success", answer
        return json.loads(answer["result"]["value"])

    def perform(self, **source):
        self.ask("input.performActions", actions=[{"id": source["type"], **source}], **self.page)

    def size(self, width, height):
        self.ask("browsingContext.setViewport", viewport={"width": width, "height": height},
                 **self.page)

    def complaints(self):
        return self.errors

    def quit(self):
        self.connection.close()
        self.process.terminate()
        self.process.stderr.close()
        self.process.wait(timeout=20)


BROWSERS = {"chromium": Chromium, "firefox": Firefox, "webkit": WebKit}
