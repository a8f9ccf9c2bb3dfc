#!/usr/bin/env python3
# SPDX-License-Identifier: BSD-2-Clause
"""contents_test.py [<test case>]: what the page shows, in a real browser, with a stand-in for the agent."""

import sys

sys.dont_write_bytecode = True

import datetime
import unittest

import fakeagent as fake
from case import PageCase


class BoardsTest(PageCase):
    def cell(self, text):
        """The text of the slot in which `text` is."""
        self.tab.wait_for_text("#chassis", text)
        return self.tab.run(f"""[...document.querySelectorAll("#chassis [role=gridcell]")]
            .map((cell) => cell.innerText).find((shown) => shown.includes({text!r}))""")

    def test_are_shown_in_their_slots_with_a_word_for_their_state(self):
        with self.agent.change():
            self.agent.boards[1]["status"] = "stopped"
            self.agent.boards[2]["secondaryStatus"] = "failed"
        self.tab.wait_for_text("#chassis", "failed")
        self.assertRegex(self.cell("NX50001"), r"(?s)Slot 1\b.*NX5-T1.*started")
        self.assertRegex(self.cell("NX50002"), r"(?s)Slot 2\b.*stopped")
        self.assertRegex(self.cell("NX50003"), r"(?s)Slot 3\b.*failed")
        self.assertIn("Shelf 2", self.tab.text("#chassis"))
        self.tab.wait_for_text("#summary", "18 boards started")

    def test_that_are_pulled_leave_a_slot_without_a_board(self):
        with self.agent.change():
            del self.agent.boards[4]
        self.assertRegex(self.cell("was NX50005"), r"(?s)Slot 5\b.*no board.*removed")
        self.tab.wait_for_text("#board-count", "19 boards")

    def test_show_how_many_alarms_they_have_and_the_worst(self):
        with self.agent.change():
            self.agent.alarms += [
                fake.alarm(1, "minor", "board NX50006, T1 line trunk-61", "far end", boardIndex=6, ifIndex=1061),
                fake.alarm(2, "critical", "board NX50006, T1 line trunk-62", "no signal", boardIndex=6, ifIndex=1062)]
        self.tab.wait_for_text("#chassis", "2 alarms, critical")
        self.assertIn("2 alarms, critical", self.cell("NX50006"))

    def test_are_shown_in_detail_when_chosen(self):
        with self.agent.change():
            self.agent.boards[0]["errorMessage"] = "no answer from processor 2"
            self.agent.lines[1].update(lineStatus=["dsx1LossOfSignal"], operStatus="down")
        self.tab.wait_for("document.querySelector('#chassis [role=gridcell]') !== null")
        self.tab.click("#chassis [role=gridcell]")
        self.tab.wait_for_text("#board", "no answer from processor 2")
        self.tab.wait_for_text("#board-lines", "loss of signal")
        self.tab.click("#board-lines li:nth-child(2) a")
        self.tab.wait_for_text("#line-heading", "trunk-12")

    def test_of_which_one_s_serial_number_is_another_s_index_are_told_apart(self):
        with self.agent.change():
            self.agent.boards[0].update(serialNumber="3", board="3")
        self.tab.wait_for_text("#chassis", "NX50003")
        self.tab.run("[...document.querySelectorAll('#chassis [role=gridcell]')]"
                     ".find((cell) => cell.innerText.includes('NX50003')).click()")
        self.tab.wait_for_text("#board-heading", "NX50003")
        slot = self.tab.run("document.querySelector('#chassis [aria-selected=true]').innerText.match(/Slot \\d+/)[0]")
        self.assertEqual(slot, "Slot 3")

    def test_that_have_gone_while_they_are_shown_in_detail_are_said_to_have_gone(self):
        self.show("boards/3")
        self.tab.wait_for_text("#board-heading", "NX50003")
        with self.agent.change():
            del self.agent.boards[2]
        self.tab.wait_for_text("#board-gone", "there is no")

    expected_errors = ("status of 404",)  # the browser logs them all


class AlarmsTest(PageCase):
    def test_are_listed_with_the_worst_first(self):
        since = fake.rfc3339(fake.now() - datetime.timedelta(minutes=3, seconds=5))
        with self.agent.change():
            self.agent.alarms += [
                fake.alarm(1, "minor", "board NX50001", "the far end receives no frames"),
                fake.alarm(2, "critical", "board NX50002, T1 line trunk-21", "the line receives no signal", date=since,
                           times=4)]
        self.tab.wait_for_text("#alarms", "no signal")
        self.tab.wait_for_text("#alarm-count", "2 active alarms")
        rows = self.tab.run("[...document.querySelectorAll('#alarms .rows-row:not([hidden])')]"
                            ".map((row) => row.innerText)")
        self.assertEqual(len(rows), 2)
        self.assertRegex(rows[0], r"(?s)critical.*trunk-21.*for 3 min.*the line receives no signal.*4 times")
        self.assertRegex(rows[1], r"(?s)minor.*NX50001")
        self.tab.wait_for("document.title.startsWith('2 alarms')")

    def test_that_end_are_listed_no_more(self):
        with self.agent.change():
            self.agent.alarms.append(fake.alarm(1, "major", "board NX50001", "the board has stopped"))
        self.tab.wait_for_text("#alarms", "has stopped")
        with self.agent.change():
            self.agent.alarms.clear()
        self.tab.wait_for_text("#no-alarms", "No alarm is active.")
        self.tab.wait_for("document.querySelector('#alarms').hidden")

    def test_lead_to_the_line_that_has_them(self):
        with self.agent.change():
            self.agent.alarms.append(fake.alarm(1, "critical", "board NX50001, T1 line trunk-11", "no signal",
                                                boardIndex=1, ifIndex=1011, line="trunk-11"))
        self.tab.wait_for_text("#alarms", "no signal")
        self.tab.click("#alarms [role=gridcell]")
        self.tab.wait_for_text("#line-heading", "trunk-11")


class LinesTest(PageCase):
    expected_errors = ("status of 404",)

    def row(self, name):
        return self.tab.run(f"""[...document.querySelectorAll("#lines .rows-row:not([hidden])")]
            .find((row) => row.firstElementChild.innerText === {name!r})?.innerText ?? ''""")

    def strip(self, name):
        return f"""[...document.querySelectorAll("#lines .rows-row:not([hidden])")]
            .find((row) => row.firstElementChild.innerText === {name!r})?.querySelector("canvas")"""

    def test_that_break_are_shown_with_what_they_report(self):
        self.show("lines")
        self.tab.wait_for_text("#lines", "trunk-11")
        self.assertIn("no alarm", self.row("trunk-12"))
        with self.agent.change():
            self.agent.lines[1].update(lineStatus=["dsx1LossOfSignal", "dsx1UnavailSigState"], operStatus="down",
                                       current=fake.counts(uas=12))
        self.tab.wait_for_text("#lines", "loss of signal, unavailable")
        self.assertIn("0 / 0 / 12", self.row("trunk-12"))

    def test_have_a_strip_of_24_hours(self):
        self.agent.intervals[1011] = fake.intervals(i1={"uas": 400}, i2={"es": 20, "ses": 5}, i3={"es": 3}, i4=None)
        self.show("lines")
        self.tab.wait_for(f"{self.strip('trunk-11')}?.getAttribute('aria-label')?.includes('UAS 400')")
        label = self.tab.run(f"{self.strip('trunk-11')}.getAttribute('aria-label')")
        self.assertEqual(label, "24 hours: ES 23, SES 5, UAS 400, 1 of 96 intervals without data")
        # How high the newest five columns are drawn: unavailable, severe, errored, a gap's dashes, clean.
        heights = self.tab.run(f"""(() => {{
            const canvas = {self.strip('trunk-11')};
            return [1, 2, 3, 4, 5].map((age) => {{
                const {{ data }} = canvas.getContext("2d").getImageData(192 - 2 * age, 0, 1, 24);
                return Array.from({{ length: 24 }}, (_, y) => data[4 * y + 3]).filter((ink) => ink > 0).length;
            }});
        }})()""")
        self.assertEqual(heights[:3] + heights[4:], [24, 16, 9, 2])
        self.assertLess(heights[3], 3)

    def test_get_a_new_strip_when_an_interval_has_been_closed(self):
        with self.agent.change():
            self.agent.lines[0]["timeElapsed"] = 899
        self.show("lines")
        self.tab.wait_for(f"{self.strip('trunk-11')}?.getAttribute('aria-label')?.includes('UAS 0')")
        self.agent.intervals[1011] = fake.intervals(i1={"uas": 7})
        with self.agent.change():
            self.agent.lines[0]["timeElapsed"] = 1
        self.tab.wait_for(f"{self.strip('trunk-11')}?.getAttribute('aria-label')?.includes('UAS 7')")

    def test_can_be_searched_and_reduced_to_those_with_trouble(self):
        with self.agent.change():
            self.agent.lines[5].update(lineStatus=["dsx1RcvAIS"], operStatus="down")
        self.show("lines")
        self.tab.click("#line-trouble")
        self.tab.wait_for_text("#line-count", "1 of 80 lines")
        self.tab.click("#line-trouble")
        self.tab.run("document.getElementById('line-filter').focus()")
        self.tab.type("nx50007")
        self.tab.wait_for_text("#line-count", "4 of 80 lines")

    def test_are_shown_in_detail_with_their_intervals_and_now(self):
        self.agent.intervals[1011] = fake.intervals(i1={"es": 20, "ses": 5, "pcv": 8000}, i2=None, i96={"uas": 900})
        with self.agent.change():
            self.agent.lines[0].update(current=fake.counts(es=7, pcv=1234), circuitIdentifier="T1-4711")
        self.show("lines/1011")
        self.tab.wait_for_text("#line-now", "1,234")
        self.assertRegex(self.tab.text("#line-now"), r"ES, errored\s+7\b")
        self.assertEqual(self.tab.text("#seconds-text"), "96 closed intervals, 1 of them without valid data (hatched): "
                                                         "ES 20, SES 5, UAS 900.")
        self.assertIn("T1-4711", self.tab.text("#line-terms"))
        self.assertEqual(self.tab.run("document.querySelectorAll('#line .chart canvas').length"), 2)
        self.tab.click("#intervals-details summary")
        self.tab.wait_for("document.querySelectorAll('#intervals tbody tr').length === 96")
        first, second = self.tab.run("[...document.querySelectorAll('#intervals tbody tr')].slice(0, 2)"
                                     ".map((row) => [...row.cells].slice(1).map((cell) => cell.innerText))")
        self.assertEqual(first, ["20", "5", "0", "8,000", "0", "0", "complete"])
        self.assertEqual(second[-1], "incomplete")
        with self.agent.change():
            self.agent.lines[0]["current"]["es"] = 8
        self.tab.wait_for("/ES, errored\\s+8/.test(document.querySelector('#line-now').innerText)")

    def test_that_keep_no_history_are_shown_without_one(self):
        with self.agent.change():
            self.agent.lines[0].update(current=None, total=None, timeElapsed=None)
        self.show("lines/1011")
        self.tab.wait_for_text("#line-now", "the line keeps none")

    def test_that_are_not_there_are_said_to_be_missing(self):
        self.show("lines/99999")
        self.tab.wait_for_text("#line-gone", "there is no")
        self.tab.wait_for_text("#connection", "live")


class OtherViewsTest(PageCase):
    def test_channels_show_how_many_are_in_use_and_by_whom(self):
        with self.agent.change():
            on = self.agent.lines[0]
            on["channelsInUse"] = 2
            self.agent.channels = [fake.channel(on, slot) for slot in range(1, 25)]
            self.agent.channels[4].update(operStatus="active", peerAddress="+49 30 12345")
        self.show("channels")
        self.tab.wait_for_text("#channel-count", "2 of 1,920 channels")
        self.tab.wait_for_text("#channels", "2 of 24")
        self.tab.click("#channels [role=gridcell]")
        self.tab.wait_for_text("#slot-list", "active with +49 30 12345")
        self.assertEqual(self.tab.run("document.querySelectorAll('#slot-list .busy').length"), 1)

    def test_journal_shows_new_entries_first_and_live(self):
        with self.agent.change():
            self.agent.journal += [fake.entry(number, "boardStatus", f"board status {number}")
                                   for number in range(1, 2301)]
        self.show("journal")
        self.tab.wait_for_text("#journal", "board status 2300")
        with self.agent.change():
            self.agent.journal.append(fake.entry(2301, "alarmRaised", "the line receives no signal",
                                                 severity="critical", board="NX50001", line="trunk-11"))
        self.tab.wait_for_text("#journal .rows-row:not([hidden])", "no signal")
        first = self.tab.text("#journal [aria-rowindex='1']")
        self.assertRegex(first, r"(?s)critical.*trunk-11.*no signal")
        self.tab.wait_for_text("#journal-count", "1,001 entries")
        self.tab.run("document.getElementById('journal-filter').focus()")
        self.tab.type("status 2299")
        self.tab.wait_for_text("#journal-count", "1 of 1,001 entries")

    def test_journal_of_an_agent_that_was_started_anew_is_shown_from_its_beginning(self):
        with self.agent.change():
            self.agent.journal = [fake.entry(50, "boardStatus", "before")]
        self.show("journal")
        self.tab.wait_for_text("#journal", "before")
        with self.agent.change():
            self.agent.journal = [fake.entry(1, "agentStarted", "the agent has started")]
            self.agent.started = fake.rfc3339(fake.now())
        self.tab.wait_for_text("#journal", "the agent has started")
        self.assertNotIn("before", self.tab.text("#journal"))

    def test_health_shows_the_agent_its_modules_and_processes(self):
        with self.agent.change():
            self.agent.modules = [fake.module(1, name="z7sim", purpose="boards", version="1.2")]
            self.agent.processes = [fake.process(4711, name="callserver")]
        self.show("health")
        self.tab.wait_for_text("#health-terms", "4,711")
        self.tab.wait_for_text("#modules", "z7sim, 1.2, boards")
        self.tab.wait_for_text("#processes", "callserver")
        self.assertIn("none", self.tab.text("#services"))


if __name__ == "__main__":
    unittest.main(verbosity=2)
