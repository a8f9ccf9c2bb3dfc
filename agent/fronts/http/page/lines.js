// SPDX-License-Identifier: BSD-2-Clause
// The view of the lines: all of them with a strip of 24 hours each, and one in detail.

import { byId, count, make, setAttribute, setText, shown } from "/page/dom.js";
import { LineDetails } from "/page/line.js";
import { Rows } from "/page/rows.js";
import { hasTrouble, lineState, makeState, showState } from "/page/states.js";
import { Strips, drawStrip, forgetColours, stripText } from "/page/strip.js";

const kList = "lines?fields=name,ifIndex,board,boardIndex,operStatus,lineStatus,timeElapsed,current";
const kMostStrips = 100; // in one request

/** The lines that a filter lets through. */
export function filtered(lines, text, onlyTrouble) {
    const wanted = text.trim().toLowerCase();
    const has = (text) => (text ?? "").toLowerCase().includes(wanted);
    return lines.filter((line) => (!onlyTrouble || hasTrouble(line)) && (has(line.name) || has(line.board)));
}

/** A `LinesView` is the second view. */
export class LinesView {
    constructor(agent) {
        this.agent = agent;
        this.details = new LineDetails(agent);
        this.strips = new Strips();
        this.stripAddress = null;
        this.rows = new Rows(byId("lines"), {
            height: 36,
            narrow: 76,
            header: byId("lines").firstElementChild,
            keyOf: (line) => line.ifIndex,
            create: () => this.create(),
            update: (row, line) => this.update(row, line),
            choose: (line) => { location.hash = `#/lines/${line.ifIndex}`; },
        });
        // Strips of lines that have come into view are asked for at once.
        byId("lines").addEventListener("scrollend", () => this.missing().length > 0 && this.agent.poll());
        byId("line-filter").addEventListener("input", () => this.render());
        byId("line-trouble").addEventListener("change", () => this.render());
    }

    choose(chosen) {
        this.details.choose(chosen || null);
        return this.details.chosen === null ? null : byId("line-heading");
    }

    missing() {
        return this.strips.missing(this.rows.visibleRows(), kMostStrips);
    }

    addresses() {
        const missing = this.missing();
        this.stripAddress = missing.length === 0 ? null
            : `lines?fields=ifIndex,timeElapsed,strip&ifIndex=${missing.join(",")}`;
        return [kList, this.stripAddress, this.details.address()].filter((address) => address !== null);
    }

    themeChanged() {
        forgetColours();
        this.details.clear();
        for (const row of this.rows.pool) row.drawn = null;
        this.render();
    }

    create() {
        const row = make("div", "", "", { role: "row" });
        const cells = Array.from({ length: 5 }, () => make("span", "", "", { role: "gridcell" }));
        cells[1].append(makeState());
        cells[2].append(make("canvas", "strip", "", { role: "img" }));
        row.append(...cells);
        return row;
    }

    update(row, line) {
        const [name, state, strip, now, board] = row.children;
        setText(name, shown(line.name));
        const known = lineState(line);
        showState(state.firstElementChild, known);
        setAttribute(state, "title", known[2]);
        const counts = line.current ? [line.current.es, line.current.ses, line.current.uas] : [null];
        setText(now, counts.map(shown).join(" / "));
        setText(board, shown(line.board));
        const day = this.strips.of(line.ifIndex);
        const canvas = strip.firstElementChild;
        if (row.drawn === day && row.drawnFor === line.ifIndex) return;
        row.drawn = day;
        row.drawnFor = line.ifIndex;
        drawStrip(canvas, day);
        setAttribute(canvas, "aria-label", stripText(day));
    }

    render() {
        if (this.stripAddress !== null) this.strips.enter(this.agent.body(this.stripAddress)?.lines ?? []);
        const lines = this.agent.body(kList)?.lines ?? null;
        if (lines) {
            const shownLines = filtered(lines, byId("line-filter").value, byId("line-trouble").checked);
            const all = count(lines.length, "line");
            setText(byId("line-count"),
                shownLines.length === lines.length ? all : `${shown(shownLines.length)} of ${all}`);
            this.rows.set(shownLines);
        }
        this.details.render();
    }
}
