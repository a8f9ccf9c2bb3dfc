// SPDX-License-Identifier: BSD-2-Clause
// The alarms, and how many boards, lines and alarms there are.

import {
    byId, count, make, patchList, setAttribute, setClass, setHidden, setText, setTime, shown, span, words,
} from "/page/dom.js";
import { Rows } from "/page/rows.js";
import { boardState, makeState, rank, severityState, showState } from "/page/states.js";

const kMostSeen = 4; // alarms that are seen without scrolling

/** The alarms in the order in which they need attention: the worst first, then the newest. */
export function inOrder(alarms) {
    return [...alarms].sort((a, b) => rank(a.severity) - rank(b.severity) ||
        String(b.date).localeCompare(String(a.date)) || b.number - a.number);
}

/** The address of the view of what an alarm or a journal entry is about; null: the agent itself. */
export function subjectOf(row) {
    if (row.ifIndex !== null && row.line) return `#/lines/${row.ifIndex}`;
    const board = row.board || row.boardIndex;
    return board ? `#/boards/${encodeURIComponent(board)}` : null;
}

/** An `Alarms` is the list of active alarms. */
export class Alarms {
    constructor(agent) {
        this.agent = agent;
        this.rows = new Rows(byId("alarms"), {
            height: 44,
            narrow: 66,
            keyOf: (alarm) => alarm.number,
            create: () => {
                const row = make("div", "", "", { role: "row" });
                const severity = make("span", "", "", { role: "gridcell" });
                severity.append(makeState("severity"));
                const since = make("span", "", "", { role: "gridcell" });
                since.append(make("time"), make("span"));
                row.append(severity, make("span", "", "", { role: "gridcell" }), since,
                    make("span", "", "", { role: "gridcell" }), make("span", "", "", { role: "gridcell" }));
                return row;
            },
            update: (row, alarm) => this.update(row, alarm),
            choose: (alarm) => {
                const subject = subjectOf(alarm);
                if (subject) location.hash = subject;
            },
        });
    }

    update(row, alarm) {
        const [severity, resource, since, text, more] = row.children;
        showState(severity.firstElementChild, severityState(alarm.severity), "severity");
        setText(resource, shown(alarm.resource));
        const now = this.agent.now();
        setTime(since.firstElementChild, alarm.date, now);
        const age = (now - new Date(alarm.date)) / 1000;
        setText(since.lastElementChild, Number.isNaN(age) ? "" : ` for ${span(age)}`);
        setClass(since.firstElementChild, "wide-only");
        setText(text, alarm.text || words(alarm.kind));
        setAttribute(text, "title", alarm.text);
        const notes = [];
        if (alarm.times > 1) notes.push(`${shown(alarm.times)} times`);
        if (alarm.state === "ending") notes.push("ending");
        setText(more, notes.join(", "));
        setHidden(more, notes.length === 0);
    }

    render(alarms) {
        setText(byId("alarm-count"), alarms ? count(alarms.length, "active alarm") : "");
        setHidden(byId("no-alarms"), !alarms || alarms.length > 0);
        setHidden(byId("alarms"), !alarms || alarms.length === 0);
        byId("alarms").style.height = `${Math.min(kMostSeen, alarms?.length ?? 0) * this.rows.height + 2}px`;
        this.rows.set(inOrder(alarms ?? []));
    }
}

/** One line of figures: boards by state, lines, alarms by severity. */
export function renderSummary(health, boards, alarms) {
    const tiles = [];
    if (boards) {
        const states = new Map();
        for (const board of boards) {
            const state = boardState(board);
            const tile = states.get(state[2]) ??
                { key: `board ${state[2]}`, number: 0, noun: "board", rest: state[2], state };
            ++tile.number;
            states.set(state[2], tile);
        }
        tiles.push(...states.values());
        if (boards.length === 0) tiles.push({ key: "none", number: 0, noun: "board", state: ["off", "■"] });
    }
    if (health && health.lineCount !== null)
        tiles.push({ key: "lines", number: health.lineCount, noun: "line", state: ["info", "–"] });
    for (const severity of ["critical", "major", "minor", "warning", "indeterminate"]) {
        const number = (alarms ?? []).filter((alarm) => alarm.severity === severity).length;
        if (number > 0)
            tiles.push({ key: severity, number, noun: `${severity} alarm`, state: severityState(severity) });
    }
    if (alarms && alarms.length === 0) tiles.push({ key: "quiet", number: 0, noun: "alarm", state: ["good", "●"] });
    patchList(byId("summary"), tiles, (tile) => tile.key,
        () => {
            const tile = make("li");
            tile.append(make("span", "mark", "", { "aria-hidden": "true" }), " ", make("b"), " ", make("span"));
            return tile;
        },
        (element, tile) => {
            const [mark, number, text] = element.children;
            setClass(mark, `mark ${tile.state[0]}`);
            setText(mark, tile.state[1]);
            setText(number, shown(tile.number));
            setText(text, `${tile.noun}${tile.number === 1 ? "" : "s"} ${tile.rest ?? ""}`);
        });
}
