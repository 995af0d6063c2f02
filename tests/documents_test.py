#!/usr/bin/python3
"""Compares what the documents list and promise with the tools, the sources and the folders.

The first argument is the panel-emulator whose --help counts.
"""

import os
import re
import subprocess
import sys
import unittest
from pathlib import Path

EMULATOR = sys.argv.pop(1)
ROOT = Path(__file__).resolve().parents[1]
TOOLS = (EMULATOR, ROOT / "box/kestrova-panel-box", ROOT / "check/kestrova-appliance-check")
PAGES = [ROOT / "README.md", *sorted(ROOT.glob("docs/*.md"))]

# A figure in a document, and the constant that it states.
FIGURES = [
    ("packaging/man/panel-emulator.1", r"more\nthan (\d+) messages or",
     "emulator/web/WebSession.cpp", r"mostMessagesPerSecond = (\d+)"),
    ("packaging/man/panel-emulator.1", r"or (\d+) requests in a second",
     "emulator/web/WebSession.cpp", r"mostRequestsPerSecond = (\d+)"),
    ("packaging/man/panel-emulator.1", r"header of more than (\d+) bytes",
     "emulator/web/WebSession.cpp", r"mostHeaderBytes = (\d+)"),
    ("packaging/man/panel-emulator.1", r"At most (\d+) pages",
     "emulator/web/WebServer.cpp", r"mostPages = (\d+)"),
    ("packaging/man/panel-emulator.1", r"and (\d+) other connections",
     "emulator/web/WebServer.cpp", r"mostRequests = (\d+)"),
    ("packaging/man/panel-emulator.1", r"The default is (\d+) seconds",
     "emulator/Options.h", r"limit\b.*?(\d+)"),
    ("packaging/man/kestrova-journey.5", r"status 0 within (\d+) seconds",
     "emulator/journey/JourneyPlayer.cpp", r"runLimit\{(\d+)\}"),
    ("packaging/man/kestrova-journey.5", r"up to (\d+) characters",
     "emulator/journey/Journey.cpp", r"longestLine = (\d+)"),
    ("packaging/man/kestrova-journey.5", r"from 1 to ([\d,]+) steps",
     "emulator/journey/Journey.cpp", r"mostSteps = ([\d']+)"),
    ("packaging/man/kestrova-panel.8", r"Bl -tag -width \"150\"\n\.It (\d+)",
     "src/runtime/SerialLine.cpp", r"exitLineNotConfigured = (\d+)"),
    ("docs/integration.md", r"again every (\d+) seconds",
     "packaging/kestrova-panel.service.in", r"RestartSec=(\d+)"),
]


def text_of(path):
    return (ROOT / path).read_text(encoding="utf-8")


def said_by(tool, option):
    return subprocess.run([tool, option], capture_output=True, text=True, check=True).stdout


def help_of(tool):
    return said_by(tool, "--help")


def table_under(heading, page):
    """The names in the first column of the table below a line."""
    table = text_of(page).partition(heading)[2].partition("\n\n|")[2].partition("\n\n")[0]
    return set(re.findall(r"^\|? ?`([^`]*)`", table, re.M))


def anchors_of(page):
    """Its headings, as links name them."""
    headings = re.findall("^#+ (.*)", page.read_text(encoding="utf-8"), re.M)
    return {re.sub(r"[^\w -]", "", heading).lower().replace(" ", "-") for heading in headings}


class Documents(unittest.TestCase):
    def test_help_and_the_manual_pages_list_the_same_options(self):
        for tool in TOOLS:
            page = text_of(f"packaging/man/{os.path.basename(tool)}.1")
            listed = page.partition("The options are:")[2].partition(".El")[0]
            described = {f"-{option}" for items in re.findall(r"^\.It (Fl .*)", listed, re.M)
                         for option in re.findall(r"(?:Fl|,) (-[a-z-]+)", items)}
            self.assertGreater(len(described), 5)
            self.assertEqual(set(re.findall(r"^  (?:-h, )?(--[a-z-]+)", help_of(tool), re.M)),
                             described)

    def test_every_tool_tells_the_version_of_the_packages(self):
        release = re.match(r"\S+ \((.*)-\d", text_of("debian/changelog"))[1]
        self.assertIn(f"\n## {release}\n", text_of("CHANGELOG.md"))
        for tool in TOOLS:
            self.assertEqual(said_by(tool, "--version"), f"{os.path.basename(tool)} {release}\n")

    def test_help_and_the_manual_page_list_the_same_steps(self):
        def words(usages):
            return sorted(re.findall(r"[a-z0-9-]+", re.sub(r"\b[A-Z][a-z]\b", "", usage).lower())
                          for usage in usages)

        steps = help_of(EMULATOR).partition("The steps are:")[2]
        listed = re.findall(r"^\.It Ic (.*)", text_of("packaging/man/kestrova-journey.5"), re.M)
        self.assertGreater(len(listed), 20)
        self.assertEqual(words(re.findall(r"^  (\S.*?)(?:  |$)", steps, re.M)), words(listed))

    def test_the_journeys_of_the_documents_are_tested(self):
        for path, pattern in (("docs/operator-guide.md", "\n```\n(expect .*?)```"),
                              ("packaging/man/kestrova-journey.5", r"\.Sh EXAMPLES\n\.Bd -literal\n(.*?)\.Ed")):
            journey = re.search(pattern, text_of(path), re.S)[1]
            self.assertIn(f"\n{journey}", text_of("tests/journeys/documents.journey"))

    def test_the_operators_guide_has_the_text_of_every_screen(self):
        guide = text_of("docs/operator-guide.md")

        def screens(picture):
            titles = re.findall("<title>(.*)</title>", text_of(f"docs/pictures/{picture}"))
            return [[row.strip() for row in title.split("|")] for title in titles]

        for alternative, picture in re.findall(r"!\[(.*)\]\(pictures/(.*\.svg)\)", guide):
            self.assertEqual(alternative, " / ".join(screens(picture)[0]))
        self.assertGreater(len(screens("map.svg")), 20)
        for rows in screens("map.svg"):
            self.assertIn("\n| " + " ".join(f"`{row}`" for row in rows) + " | ", guide)

    def test_the_example_of_the_integrators_guide_is_the_file(self):
        self.assertIn("```sh\n" + text_of("docs/examples/apply.sh") + "```\n", text_of("docs/integration.md"))

    def test_figures_are_those_of_the_sources(self):
        for document, stated, source, constant in FIGURES:
            with self.subTest(stated):
                figures = [re.search(pattern, text_of(path))[1].replace(",", "").replace("'", "")
                           for path, pattern in ((document, stated), (source, constant))]
                self.assertEqual(*figures)

    def test_every_folder_and_every_command_is_listed(self):
        def folders(path):
            return {entry.name for entry in (ROOT / path).iterdir() if entry.is_dir()
                    and not re.match(r"\.|_|build|obj-", entry.name)}

        commands = {f"scripts/{entry.name}" for entry in (ROOT / "scripts").iterdir()
                    if entry.is_file() and os.access(entry, os.X_OK)}
        for page, heading, there in (("README.md", "## All commands", commands),
                                     ("README.md", "## Folders", folders(".")),
                                     ("docs/development.md", "## Folders", folders("src")),
                                     ("docs/development.md", "| `hostname` |", folders("emulator"))):
            with self.subTest(page=page, heading=heading):
                self.assertEqual(table_under(heading, page), there)

    def test_every_link_leads_somewhere(self):
        for page in PAGES:
            for link in re.findall(r"\]\(([^)]+)\)", page.read_text(encoding="utf-8")):
                path, _, anchor = link.partition("#")
                target = (page.parent / path).resolve() if path else page
                with self.subTest(page=page.name, link=link):
                    self.assertTrue(target.exists())
                    self.assertTrue(not anchor or anchor in anchors_of(target))


if __name__ == "__main__":
    unittest.main()
