#!/usr/bin/env python3
# SPDX-License-Identifier: BSD-2-Clause
"""manner_test.py [<test case>]: how the page behaves, in a real browser, with a stand-in for the agent."""

import sys

sys.dont_write_bytecode = True

import datetime
import json
import re
import unittest

import accessibility
import fakeagent as fake
from case import PAGE, SOURCES, VIEWS, PageCase, scroll_through


class FilesTest(unittest.TestCase):
    def test_are_smaller_than_150_kB_in_all(self):
        self.assertLess(sum(path.stat().st_size for path in PAGE.iterdir()), 150_000)

    def test_never_make_elements_of_texts(self):
        sinks = re.compile(r"innerHTML|outerHTML|insertAdjacentHTML|document\.write|\beval\(|new Function|srcdoc")
        for path in PAGE.glob("*.js"):
            if path.name != "uplot.js":
                self.assertIsNone(sinks.search(path.read_text()), path)

    def test_have_no_script_or_style_inline_and_name_no_other_place(self):
        html = (PAGE / "index.html").read_text()
        self.assertIsNone(re.search(r"<script(?![^>]*\bsrc=)|<style|\bstyle=|\bon[a-z]+=|https?://", html))
        for name in re.findall(r'(?:src|href)="(/page/[^"]*)"', html):
            self.assertTrue((PAGE / name.removeprefix("/page/")).is_file(), name)

    def test_of_others_come_with_their_licence(self):
        self.assertIn("MIT License", (PAGE / "uplot-licence.txt").read_text())
        for path in PAGE.iterdir():
            if not path.name.startswith("uplot"):
                self.assertIn("SPDX-License-Identifier: BSD-2-Clause", path.read_text(), path)


class StandInTest(unittest.TestCase):
    """The stand-in invents nothing: the document of the API knows what it answers, and the agent is tested
    against that document."""

    @classmethod
    def setUpClass(cls):
        cls.schemas = json.loads((SOURCES / "docs/openapi.json").read_text())["components"]["schemas"]

    def test_rows_have_no_keys_that_the_agent_s_rows_have_not(self):
        boards, lines = fake.chassis(1, 1)
        agent = fake.FakeAgent(PAGE, boards, lines)
        self.addCleanup(agent.stop)
        rows = {"Board": boards[0], "Line": lines[0], "LineCounts": lines[0]["current"],
                "Interval": fake.intervals()[0], "Channel": fake.channel(lines[0], 1),
                "Alarm": fake.alarm(1, "major", "board", "text"), "JournalEntry": fake.entry(1, "setting", "text"),
                "Health": agent.health(), "Process": fake.process(1), "Module": fake.module(1),
                "Service": fake.service(1)}
        for name, row in rows.items():
            self.assertEqual(set(row) - set(self.schemas[name]["properties"]), set(), name)

    def test_fields_that_the_page_asks_for_are_in_the_rows(self):
        found = 0
        for path in PAGE.glob("*.js"):
            text = path.read_text().replace('" +\n    "', "")
            for name, fields in re.findall(r"(boards|lines)\?fields=([A-Za-z,]+)", text):
                known = self.schemas[name.removesuffix("s").capitalize()]["properties"]
                self.assertEqual(set(fields.split(",")) - set(known), set(), path.name)
                found += 1
        self.assertGreaterEqual(found, 4)


class PollingTest(PageCase):
    def test_gets_no_body_again_while_nothing_has_changed(self):
        self.wait_for_rounds(4)
        with self.agent.lock:
            statuses = [status for path, status in self.agent.asked if path.startswith("/api/")]
        self.assertEqual(statuses.count(200), 3)  # health, alarms and boards once each
        self.assertGreater(statuses.count(304), 5)

    def mutations_while_the_values_stay(self, view):
        self.tab.run("""(() => {
            window.observer?.disconnect();
            window.mutations = [];
            window.observer = new MutationObserver((all) => window.mutations.push(...all.map(({ type, attributeName, target }) =>
                `${type} ${attributeName} ${target.id} ${target.className} ${target.textContent}`)));
            window.observer.observe(document, { subtree: true, childList: true, characterData: true, attributes: true });
        })()""")
        for _ in range(2):
            with self.agent.change():
                pass  # a new snapshot with the same values
            self.wait_for_rounds(2)
        mutations = self.tab.run("window.mutations")
        if view == "health":
            mutations = [one for one in mutations if "Snapshots" not in one and not re.search(r" \d+$", one)]
        return mutations

    def test_changes_nothing_in_the_document_while_the_values_stay(self):
        for view in VIEWS:
            self.show(view)
            # A slow browser may still draw what it has just got; what is drawn at every poll never ends.
            for _ in range(5):
                self.wait_for_rounds(2)
                mutations = self.mutations_while_the_values_stay(view)
                if not mutations:
                    break
            self.assertEqual(mutations, [], view)
            self.tab.run("window.location.reload()")
            self.tab.wait_for("window.mutations === undefined && document.readyState === 'complete'")
            self.tab.wait_for_text("#connection", "live")

    def test_changes_one_value_in_the_element_that_shows_it(self):
        self.tab.wait_for_text("#chassis", "NX50002")
        self.tab.run("window.cells = [...document.querySelectorAll('#chassis [role=gridcell]')]")
        with self.agent.change():
            self.agent.boards[1]["status"] = "stopped"
        self.tab.wait_for("window.cells[1].innerText.includes('stopped')")
        self.assertTrue(self.tab.run("window.cells.every((cell) => cell.isConnected)"))


class AwayTest(PageCase):
    expected_errors = ("ERR_CONNECTION_REFUSED", "ERR_EMPTY_RESPONSE", "ERR_CONNECTION_RESET", "status of 503")

    def test_agent_is_said_to_be_away_and_the_picture_to_be_old(self):
        self.tab.wait_for_text("#chassis", "NX50002")
        self.agent.stop()
        self.tab.wait_for_text("#notice", "The agent does not answer. What is shown is what it said last, at ")
        self.tab.wait_for("/\\b([6-9]|\\d\\d+) s old/.test(document.querySelector('#connection').innerText)")
        self.assertIn("NX50002", self.tab.text("#chassis"))
        self.agent.restart()
        with self.agent.change():
            self.agent.boards[1]["status"] = "stopped"
        self.tab.wait_for_text("#chassis", "stopped")
        self.tab.wait_for_text("#connection", "live")
        self.assertEqual(self.tab.text("#notice"), "")
        announced = self.tab.run("document.getElementById('announcement').textContent")
        self.assertIn("can be reached again", announced)

    def test_agent_that_refuses_is_quoted(self):
        self.agent.broken = 503
        self.tab.wait_for_text("#notice", "The agent refuses: the agent is broken.")

    def test_boards_that_are_not_read_any_more_are_said_to_be_old(self):
        with self.agent.change():
            self.agent.frozen = fake.now() - datetime.timedelta(minutes=2)
        self.tab.wait_for_text("#connection", "boards read 2 min")


class TokenTest(PageCase):
    expected_errors = ("status of 401",)

    def test_is_asked_for_and_sent(self):
        with self.agent.change():
            self.agent.token = "open sesame"
        self.tab.wait_for_text("#token-form", "asks for a token")
        self.tab.run("document.getElementById('token').focus()")
        self.tab.type("wrong")
        self.tab.press("Enter")
        self.wait_for_rounds(2)
        self.assertIn("asks for a token", self.tab.text("#token-form"))
        self.tab.run("document.getElementById('token').focus()")
        self.tab.type("open sesame")
        self.tab.press("Enter")
        self.tab.wait_for_text("#connection", "live")
        self.assertEqual(self.tab.text("#token-form"), "")


class HostileTest(PageCase):
    def test_texts_are_shown_and_never_become_elements(self):
        evil = "<img src=x onerror='window.hacked=1'><script>window.hacked=1</script>\"'`&lt;\u202e" + "x" * 180
        with self.agent.change() as agent:
            for row in [agent.boards[0], agent.lines[0]]:
                row.update({key: evil for key, value in row.items() if isinstance(value, str)})
            agent.boards[0].update(boardIndex=1)
            agent.lines[0].update(boardIndex=1, lineStatus=[evil])
            agent.alarms = [fake.alarm(1, evil, evil, evil, boardIndex=1, kind=evil, state=evil, date=evil)]
            agent.journal = [fake.entry(1, evil, evil, board=evil, line=evil, severity=evil)]
            agent.channels = [fake.channel(agent.lines[0], 1, operStatus=evil, peerAddress=evil, name=evil)]
            agent.modules = [fake.module(1, name=evil, purpose=evil, version=evil, date=evil)]
            agent.services = [fake.service(1, name=evil, scmName=evil, changeDate=evil)]
            agent.processes = [fake.process(1, name=evil)]
            agent.hostname = evil
        shown_in = {"boards": "#alarms", "boards/1": "#board", "lines": "#lines", "lines/1011": "#line",
                    "channels": "#channels", "channels/1011": "#slots", "journal": "#journal", "health": "#processes"}
        for view, selector in shown_in.items():
            self.show(view)
            self.tab.wait_for_text(selector, "<img src=x onerror='window.hacked=1'>")
            self.assertEqual(self.tab.run("document.querySelectorAll('img, body script, iframe, object').length"), 0)
        self.assertIn("<img", self.tab.text("h1"))
        self.assertIsNone(self.tab.run("window.hacked"))


class KeyboardTest(PageCase):
    def test_skips_to_the_contents(self):
        self.tab.press("Tab")
        self.assertEqual(self.tab.focus(), "Skip to the contents")
        self.tab.press("Enter")
        self.tab.wait_for("document.activeElement.id === 'content'")

    def test_moves_in_the_chassis(self):
        self.tab.wait_for_text("#chassis", "NX50020")
        self.tab.run("document.querySelector('#chassis [tabindex=\"0\"]').focus()")
        width = self.tab.run("document.querySelector('#chassis .rows-row').querySelectorAll('[role=gridcell]').length")
        for key, expected in (("ArrowRight", 2), ("ArrowDown", 2 + width), ("ArrowLeft", 1 + width), ("ArrowUp", 1)):
            self.tab.press(key)
            self.assertIn(f"NX5{expected:04}", self.tab.focus(), key)
        self.tab.press("End", control=True)
        self.assertIn("NX50020", self.tab.focus())
        self.tab.press("Enter")
        self.tab.wait_for_text("#board-heading", "NX50020")
        self.assertIn("NX50020", self.tab.focus())

    def test_moves_in_long_lists(self):
        self.show("lines")
        self.tab.wait_for_text("#lines", "trunk-11")
        self.tab.run("document.querySelector('#lines [tabindex=\"0\"]').focus()")
        self.tab.press("End", control=True)
        self.assertEqual(self.tab.run("document.activeElement.parentElement.firstElementChild.innerText"), "trunk-204")
        self.tab.press("PageUp")
        self.tab.press("Home", control=True)
        self.assertEqual(self.tab.focus(), "trunk-11")
        self.tab.press("ArrowDown")
        self.tab.press("Enter")
        self.tab.wait_for_text("#line-heading", "trunk-12")

    def test_rows_are_in_their_order_in_the_document_wherever_the_list_is(self):
        self.show("lines")
        self.tab.wait_for_text("#lines", "trunk-11")
        for top in (0, 36, 700, 100000, 650, 0):
            self.tab.run(f"document.querySelector('#lines').scrollTop = {top}")
            self.tab.wait_for("new Promise((resolve) => requestAnimationFrame(() => setTimeout(resolve, 0, true)))")
            places = self.tab.run("""[...document.querySelectorAll("#lines .rows-row:not([hidden])")]
                .map((row) => Number(row.getAttribute("aria-rowindex")))""")
            self.assertEqual(places, list(range(places[0], places[0] + len(places))), top)
        self.tab.run("document.querySelector('#lines [tabindex=\"0\"]').focus()")
        for _ in range(40):
            self.tab.press("ArrowDown")
        self.assertEqual(self.tab.focus(), "trunk-111")

    def test_keeps_the_focus_with_its_row_while_rows_go(self):
        self.show("lines")
        self.tab.wait_for_text("#lines", "trunk-11")
        self.tab.run("document.querySelector('#lines [tabindex=\"0\"]').focus()")
        for _ in range(5):
            self.tab.press("ArrowDown")
        self.assertEqual(self.tab.focus(), "trunk-22")
        with self.agent.change():
            del self.agent.lines[:4]
        self.tab.wait_for_text("#line-count", "76 lines")
        self.assertEqual(self.tab.focus(), "trunk-22")


class AccessibilityTest(PageCase):
    def test_has_no_faults(self):
        with self.agent.change() as agent:
            agent.boards[1]["status"] = "stopped"
            agent.boards[2]["secondaryStatus"] = "failed"
            agent.boards[3]["status"] = "startPending"
            del agent.boards[4]
            agent.lines[0].update(lineStatus=["dsx1LossOfSignal"], operStatus="down", channelsInUse=3)
            agent.lines[1].update(lineStatus=["dsx1RcvFarEndLOF"])
            agent.channels = [fake.channel(agent.lines[0], slot, operStatus="active") for slot in range(1, 25)]
            severities = ("critical", "major", "minor", "warning", "indeterminate")
            agent.alarms = [fake.alarm(number, severity, f"board NX5{number:04}", "text", boardIndex=number,
                                       times=number)
                            for number, severity in enumerate(severities, 1)]
            agent.journal = [fake.entry(1, "alarmRaised", "raised", severity="minor"),
                             fake.entry(2, "alarmCleared", "cleared"),
                             fake.entry(3, "agentStarted", "started"), fake.entry(4, "setting", "set")]
        for view in ("boards", "boards/1", "lines", "lines/1011", "channels", "channels/1011", "journal", "health"):
            self.show(view)
            self.wait_for_rounds(2)
            for scheme in ("light", "dark"):
                self.tab.scheme(scheme)
                self.assertEqual(accessibility.faults(self.tab), [], f"{view}, {scheme}")

    def test_of_an_agent_that_is_away_has_no_faults(self):
        self.agent.broken = 503
        self.tab.wait_for_text("#notice", "refuses")
        self.assertEqual(accessibility.faults(self.tab), [])

    expected_errors = ("status of 503",)

    def test_check_finds_faults(self):
        self.tab.run("""(() => {
            const grid = document.createElement("div");
            grid.append(document.createElement("button"), document.createElement("h4"));
            grid.lastElementChild.textContent = "pale";
            grid.lastElementChild.style.color = "#999999";
            grid.lastElementChild.id = "summary";
            const state = document.createElement("span");
            state.className = "state";
            state.textContent = "*";
            grid.append(state);
            document.querySelector("main").prepend(grid);
        })()""")
        found = "\n".join(accessibility.faults(self.tab))
        for fault in ("a button has no name", "of 'pale'", "the id summary is there twice", "a state without a word",
                      "skips a level"):
            self.assertIn(fault, found)


class AppearanceTest(PageCase):
    GROUND = "getComputedStyle(document.body).backgroundColor"

    def test_follows_the_system_and_the_switch_which_is_kept(self):
        self.tab.scheme("light")
        light = self.tab.run(self.GROUND)
        self.tab.scheme("dark")
        dark = self.tab.run(self.GROUND)
        self.assertNotEqual(light, dark)
        for choice, ground in (("light", light), ("dark", dark)):
            self.tab.run(f"""(() => {{
                const theme = document.getElementById("theme");
                theme.value = {choice!r};
                theme.dispatchEvent(new Event("change"));
            }})()""")
            self.assertEqual(self.tab.run(self.GROUND), ground)
        self.tab.scheme("light")
        self.tab.go(self.agent.address)
        self.assertEqual(self.tab.run(self.GROUND), dark)

    def test_fits_a_phone(self):
        with self.agent.change():
            self.agent.alarms = [fake.alarm(1, "indeterminate", "board NX50001, T1 line with a long name", "x" * 200)]
        self.tab.resize(360, 740, mobile=True)
        for view in (*VIEWS, "boards/1", "lines/1011", "channels/1011"):
            self.show(view)
            self.wait_for_rounds(2)
            width = self.tab.run("document.documentElement.scrollWidth")
            self.assertLessEqual(width, 360, view)
            cut = self.tab.run("""[...document.querySelectorAll(".rows-row [role=gridcell]")]
                .filter((cell) => cell.checkVisibility() && cell.getBoundingClientRect().right > 360)
                .map((cell) => cell.innerText || cell.innerHTML)""")
            self.assertEqual(cut, [], view)


class LargeTest(PageCase):
    boards, lines_each = 1000, 4
    def scroll(self, view, box, last):
        self.show(view)
        self.tab.wait_for(f"document.querySelector('{box}').getAttribute('aria-rowcount') > 50")
        longest = scroll_through(self.tab, box)
        self.tab.wait_for_text(box, last)
        # Only what can be seen is in the document.
        self.assertLess(self.tab.run(f"document.querySelectorAll('{box} .rows-row').length"), 60)
        return longest

    def test_scrolls_without_a_long_task(self):
        chassis = self.scroll("boards", "#chassis", "NX51000")
        lines = self.scroll("lines", "#lines", "trunk-10004")
        print(f"longest task while scrolling: chassis {chassis} ms, lines {lines} ms", flush=True)
        self.assertLessEqual(chassis, 200)
        self.assertLessEqual(lines, 200)

    def test_asks_for_the_strips_of_the_lines_in_sight_only(self):
        self.show("lines")
        self.tab.wait_for("document.querySelector('#lines canvas')?.getAttribute('aria-label')?.includes('UAS 0')")
        with self.agent.lock:
            strips = [path for path, _ in self.agent.asked if "strip" in path]
        self.assertLess(max(path.count(",") for path in strips), 103)


if __name__ == "__main__":
    unittest.main(verbosity=2)
