#!/usr/bin/env python3
# SPDX-License-Identifier: BSD-2-Clause
"""page_test.py <build folder> [<test case>]: the page of a real agent, on a simulated chassis."""

import sys

sys.dont_write_bytecode = True

import pathlib
import time
import unittest

sys.path.insert(0, str(pathlib.Path(__file__).resolve().parents[2] / "agent/fronts/http/page"))

import accessibility
import browser
from agent import Agent
from case import scroll_through

BUILD = None


class AgentCase(unittest.TestCase):
    boards = None
    expected_errors = ()

    @classmethod
    def setUpClass(cls):
        cls.browser = browser.Browser()
        cls.addClassCleanup(cls.browser.close)

    def setUp(self):
        self.agent = Agent(BUILD, self.boards)
        self.addCleanup(self.agent.close)
        self.tab = self.browser.open(self.agent.address)
        self.addCleanup(self.tab.close)
        self.tab.wait_for_text("#connection", "live")

    def tearDown(self):
        errors = [error for error in self.tab.errors if not any(one in error for one in self.expected_errors)]
        self.assertEqual(errors, [])

    def show(self, view):
        self.tab.run(f"location.hash = '#/{view}'")
        self.tab.wait_for(f"!document.getElementById('view-{view.split('/')[0]}').hidden")

    def wait_for_text(self, selector, text, since):
        """Returns the seconds from `since` to the text's being shown."""
        self.tab.wait_for_text(selector, text)
        return time.monotonic() - since


class EventsTest(AgentCase):
    def test_pulled_board_is_shown(self):
        self.tab.wait_for_text("#chassis", "NX50001")
        began = time.monotonic()
        self.agent.kvlsim("remove", "NX50001")
        took = self.wait_for_text("#chassis", "was NX50001", began)
        print(f"pulled board: shown after {took:.2f} s", flush=True)
        self.tab.wait_for_text("#board-count", "2 boards")
        self.tab.wait_for_text("#alarms", "NX50001")

    def test_broken_line_is_shown(self):
        self.show("lines")
        self.tab.wait_for_text("#lines", "nx5-trunk-1")
        began = time.monotonic()
        self.agent.kvlsim("line", "alarm", "nx5-trunk-1", "los")
        declared = self.agent.wait_for_log("dsx1LossOfSignal")
        took = self.wait_for_text("#lines", "loss of signal", declared)
        print(f"broken line: a failure after {declared - began:.2f} s, shown {took:.2f} s later", flush=True)
        self.show("boards")
        self.tab.wait_for_text("#alarms", "nx5-trunk-1")
        self.tab.wait_for_text("#chassis", "critical")

    def test_inserted_board_is_shown_with_its_state(self):
        self.tab.wait_for_text("#chassis", "NX50001")
        began = time.monotonic()
        self.agent.kvlsim("insert", "--serial", "NEW0001", "--name", "Z7-T1", "--family", "Z7")
        print(f"inserted board: shown after {self.wait_for_text('#chassis', 'NEW0001', began):.2f} s", flush=True)

    def test_agent_that_ends_and_comes_back_is_followed(self):
        self.agent.stop()
        self.tab.wait_for_text("#notice", "does not answer")
        self.agent.start()
        self.tab.wait_for_text("#connection", "live")
        self.tab.wait_for_text("#chassis", "NX50001")

    expected_errors = ("ERR_CONNECTION_REFUSED", "ERR_EMPTY_RESPONSE", "ERR_CONNECTION_RESET")


class ViewsTest(AgentCase):
    def test_show_what_the_agent_knows_without_faults_for_all_people(self):
        self.agent.kvlsim("line", "alarm", "nx5-trunk-1", "los")
        self.tab.wait_for_text("#alarms", "nx5-trunk-1")
        number = self.tab.run("""fetch("/api/v1/lines/nx5-trunk-1").then((answer) => answer.json())
            .then((body) => body.line.ifIndex)""")
        shown = {"boards/NX50001": ("#board-terms", "T1"), "lines": ("#lines", "nx5-trunk-1"),
                 f"lines/{number}": ("#line-now", "UAS"), "channels": ("#channel-count", "channels"),
                 f"channels/{number}": ("#slots-heading", "trunk"), "journal": ("#journal", "nx5-trunk-1"),
                 "health": ("#modules", "z7sim"), "boards": ("#chassis", "NX50001")}
        for view, (selector, text) in shown.items():
            self.show(view)
            self.tab.wait_for_text(selector, text)
            self.assertEqual(accessibility.faults(self.tab), [], view)

    def test_strip_shows_the_line_s_last_day(self):
        self.show("lines")
        label, _ = self.tab.wait_for("""[...document.querySelectorAll("#lines .rows-row")]
            .find((row) => row.innerText.includes("nx5-trunk-1"))?.querySelector("canvas")
            .getAttribute("aria-label")?.match(/ES [0-9,]+, SES [0-9,]+, UAS [1-9][0-9,]*/)?.[0]""")
        self.assertRegex(label, r"^ES [1-9]")


class LargeTest(AgentCase):
    boards = 1000

    def test_scrolls_without_a_long_task(self):
        for view, box, last in (("boards", "#chassis", 60), ("lines", "#lines", 3900)):
            self.show(view)
            self.tab.wait_for(f"document.querySelector('{box}').getAttribute('aria-rowcount') > {last}")
            longest = scroll_through(self.tab, box)
            print(f"{view}: the longest task while scrolling took {longest} ms", flush=True)
            self.assertLessEqual(longest, 200)
        sizes = self.tab.run("""performance.getEntriesByType("resource").filter((one) => one.name.includes("/api/"))
            .map((one) => [one.name.replace(/.*v1./, "").slice(0, 40), one.encodedBodySize, Math.round(one.duration)])""")
        largest = {}
        for name, size, duration in sizes:
            largest[name] = max(largest.get(name, (0, 0)), (size, duration))
        print(f"largest answers (octets, ms): {largest}", flush=True)


if __name__ == "__main__":
    BUILD = pathlib.Path(sys.argv.pop(1)).resolve()
    unittest.main(verbosity=2)
