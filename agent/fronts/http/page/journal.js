// SPDX-License-Identifier: BSD-2-Clause
// The view of the journal, live.

import { byId, make, setAttribute, setText, setTime, shown, words } from "/page/dom.js";
import { Rows } from "/page/rows.js";
import { makeState, severityState, showState } from "/page/states.js";
import { subjectOf } from "/page/summary.js";

const kLimit = 1000; // entries in one answer
const kMost = 20000; // entries kept

// What the entry is about, as the alarms' list shows it.
const kEvents = {
    alarmRaised: ["bad", "▲", "raised"],
    alarmCleared: ["good", "○", "cleared"],
    alarmChanged: ["info", "◆", "changed"],
    boardStatus: ["info", "■", "board"],
    agentStarted: ["info", "●", "started"],
    agentStopped: ["off", "■", "stopped"],
};

/** What an entry says beside its text: "raised, critical". */
function eventState(entry) {
    const [colour, mark, word] = kEvents[entry.event] ?? ["info", "·", words(entry.event)];
    if (entry.event !== "alarmRaised" || !entry.severity) return [colour, mark, word];
    const [severityColour, severityMark] = severityState(entry.severity);
    return [severityColour, severityMark, entry.severity];
}

/** A `JournalView` is the fourth view. It keeps the entries that it has got, and asks for those after them. */
export class JournalView {
    constructor(agent) {
        this.agent = agent;
        this.entries = []; // the newest first
        this.after = null;
        this.began = null; // when the agent that wrote the entries was started
        this.rows = new Rows(byId("journal"), {
            height: 44,
            narrow: 66,
            keyOf: (entry) => entry.number,
            create: () => {
                const row = make("div", "", "", { role: "row" });
                const cells = Array.from({ length: 4 }, () => make("span", "", "", { role: "gridcell" }));
                cells[0].append(makeState("severity"));
                cells[2].append(make("time"));
                row.append(...cells);
                return row;
            },
            update: (row, entry) => {
                const [event, resource, time, text] = row.children;
                showState(event.firstElementChild, eventState(entry), "severity");
                const place = [entry.board, entry.line].filter(Boolean).join(", ");
                setText(resource, place || words(entry.event));
                setTime(time.firstElementChild, entry.date, this.agent.now());
                setText(text, shown(entry.text));
                setAttribute(text, "title", entry.text);
            },
            choose: (entry) => {
                const subject = subjectOf(entry);
                if (subject) location.hash = subject;
            },
        });
        byId("journal-filter").addEventListener("input", () => this.show());
    }

    choose() {
        return null;
    }

    address() {
        return this.after === null ? `journal?limit=${kLimit}` : `journal?limit=${kLimit}&after=${this.after}`;
    }

    addresses() {
        return [this.address()];
    }

    render() {
        this.forgetOtherAgent();
        const fresh = this.agent.body(this.address())?.entries ?? [];
        if (fresh.length > 0) {
            this.entries = [...fresh].reverse().concat(this.entries).slice(0, kMost);
            this.after = fresh[fresh.length - 1].number;
            if (fresh.length === kLimit) this.agent.poll();
        } else if (this.after === null && this.agent.body(this.address())) {
            this.after = 0;
        }
        this.show();
    }

    /** An agent that was started anew may number its entries from the beginning. */
    forgetOtherAgent() {
        const began = this.agent.body("health")?.health.agentStarted ?? null;
        if (began === null || began === this.began) return;
        if (this.began !== null) {
            this.entries = [];
            this.after = null;
        }
        this.began = began;
    }

    show() {
        const wanted = byId("journal-filter").value.trim().toLowerCase();
        const has = (text) => (text ?? "").toLowerCase().includes(wanted);
        const entries = wanted === "" ? this.entries : this.entries.filter((entry) =>
            [entry.text, entry.board, entry.line].some(has));
        const all = `${shown(this.entries.length)} ${this.entries.length === 1 ? "entry" : "entries"}`;
        setText(byId("journal-count"),
            entries.length === this.entries.length ? all : `${shown(entries.length)} of ${all}`);
        this.rows.set(entries);
    }
}
