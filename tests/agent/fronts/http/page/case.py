# SPDX-License-Identifier: BSD-2-Clause
"""What tests of the page have in common."""

import pathlib
import time
import unittest

import browser
import fakeagent as fake

SOURCES = pathlib.Path(__file__).resolve().parents[5]
PAGE = SOURCES / "agent/fronts/http/page"
VIEWS = ("boards", "lines", "channels", "journal", "health")


PASSES = 30  # a busy machine may stop any of them; a task that is too long is in all
LONGEST_TASK = 200  # milliseconds


def scroll_through(tab, box):
    """Scrolls through a list, again if there was a long task. Returns the longest task in milliseconds."""
    best = None
    for _ in range(PASSES):
        longest = tab.run(f"""(async () => {{
            const tasks = [];
            const observer = new PerformanceObserver((list) => tasks.push(...list.getEntries()));
            observer.observe({{ entryTypes: ["longtask"] }});
            const box = document.querySelector("{box}");
            const painted = () => new Promise((resolve) => requestAnimationFrame(() => setTimeout(resolve)));
            box.scrollTop = 0;
            const step = (box.scrollHeight - box.clientHeight) / 120;
            for (let i = 1; i <= 120; ++i) {{
                box.scrollTop = i * step;
                await painted();
            }}
            tasks.push(...observer.takeRecords());
            observer.disconnect();
            return Math.max(0, ...tasks.map((task) => task.duration));
        }})()""")
        best = longest if best is None else min(best, longest)
        if best <= LONGEST_TASK:
            break
    return best


class PageCase(unittest.TestCase):
    """A page of 20 boards with four lines each, in a tab of its own. Any error in the browser is a failure."""

    boards, lines_each = 20, 4
    expected_errors = ()

    @classmethod
    def setUpClass(cls):
        cls.browser = browser.Browser()
        cls.addClassCleanup(cls.browser.close)

    def setUp(self):
        self.agent = fake.FakeAgent(PAGE, *fake.chassis(self.boards, self.lines_each))
        self.addCleanup(self.agent.stop)
        self.tab = self.browser.open(self.agent.address)
        self.addCleanup(self.tab.close)
        self.tab.wait_for_text("#connection", "live")

    def tearDown(self):
        errors = [error for error in self.tab.errors if not any(one in error for one in self.expected_errors)]
        self.assertEqual(errors, [])
        for method, address in self.tab.requests:
            self.assertEqual(method, "GET")
            self.assertTrue(address.startswith(self.agent.address + "/"), address)

    def show(self, view):
        self.tab.run(f"location.hash = '#/{view}'")
        name = view.split("/")[0]
        self.tab.wait_for(f"!document.getElementById('view-{name}').hidden")

    def wait_for_rounds(self, rounds):
        """Waits until the page has asked for its resources so many times more."""
        def asked():
            with self.agent.lock:
                return sum(path == "/api/v1/health" for path, _ in self.agent.asked)
        limit = asked() + rounds
        deadline = time.monotonic() + browser.PATIENCE
        while asked() < limit:
            self.assertLess(time.monotonic(), deadline, "the page has stopped asking")
            time.sleep(0.02)
