// SPDX-License-Identifier: BSD-2-Clause
// One line in detail: its running interval, its 24 hours, and how it is configured.

import { IntervalChart } from "/page/chart.js";
import { byId, make, patchList, patchTerms, setHidden, setText, setTime, shown, span, words } from "/page/dom.js";
import { lineState, makeState, showState } from "/page/states.js";

/** A counter that is known: a running or closed interval may lack it. */
function known(value) {
    return value === undefined ? null : value;
}

function sum(intervals, key) {
    return intervals.reduce((total, interval) => total + (interval[key] ?? 0), 0);
}

/**
 * The intervals from the oldest to the running one, for charts.
 * @returns {times, gaps, column(key)}
 */
export function asSeries(line, now) {
    const closed = [...(line.intervals ?? [])].reverse();
    const points = closed.map((interval) => ({
        time: new Date(interval.start).getTime() / 1000,
        counts: interval.validData === false ? null : interval,
    })).filter((point) => !Number.isNaN(point.time));
    if (line.current)
        points.push({ time: Math.round(now.getTime() / 1000) - (line.timeElapsed ?? 0), counts: line.current });
    // The running interval's beginning follows from two clocks; it never lies before a closed one's end.
    const count = points.length;
    if (line.current && count > 1) points[count - 1].time = points[count - 2].time + 900;
    return {
        times: points.map((point) => point.time),
        gaps: points.filter((point) => point.counts === null).map((point) => point.time),
        column: (key) => points.map((point) => (point.counts === null ? null : known(point.counts[key]))),
    };
}

/** A `LineDetails` is the part of the lines' view that shows one line. */
export class LineDetails {
    constructor(agent) {
        this.agent = agent;
        this.chosen = null;
        byId("line-state").append(...makeState().childNodes);
        this.seconds = new IntervalChart(byId("seconds-chart"), [
            { label: "ES", colour: "errored" }, { label: "SES", colour: "severe" },
            { label: "UAS", colour: "unavailable" }], "seconds");
        this.violations = new IntervalChart(byId("violations-chart"), [
            { label: "PCV, path", colour: "errored" }, { label: "LCV, line", colour: "text" }], "violations");
        byId("intervals-details").addEventListener("toggle", () => this.render());
    }

    address() {
        return this.chosen === null ? null : `lines/${encodeURIComponent(this.chosen)}`;
    }

    choose(chosen) {
        if (chosen === this.chosen) return;
        this.chosen = chosen;
        this.clear();
    }

    clear() {
        this.seconds.clear();
        this.violations.clear();
    }

    render() {
        setHidden(byId("line"), this.chosen === null);
        if (this.chosen === null) return;
        const line = this.agent.body(this.address())?.line ?? null;
        const refusal = this.agent.error(this.address());
        setHidden(byId("line-gone"), refusal === null);
        setText(byId("line-gone"), refusal === null ? "" : `The agent says: ${refusal}.`);
        setHidden(byId("line-known"), line === null);
        if (line === null) {
            if (refusal !== null || byId("line-heading").textContent === "")
                setText(byId("line-heading"), `Line ${this.chosen}`);
            return;
        }
        setText(byId("line-heading"), `Line ${line.name}, board ${line.board ?? "not known"}`);
        showState(byId("line-state"), lineState(line));
        this.renderNow(line);
        this.renderCharts(line);
        if (byId("intervals-details").open) this.renderTable(line);
        patchTerms(byId("line-terms"), [
            ["Circuit", line.circuitIdentifier], ["Alias", line.alias], ["Interface index", line.ifIndex],
            ["Interface", line.operStatus], ["Type", words(line.lineType)], ["Coding", words(line.lineCoding)],
            ["Signalling", words(line.signalMode)], ["Transmit clock", words(line.transmitClockSource)],
            ["Facility data link", line.fdl], ["Length", line.lineLength === null ? null : `${line.lineLength} m`],
            ["Build-out", words(line.lineBuildOut)], ["Impedance", words(line.lineImpedance)],
            ["Loopback", words(line.loopbackConfig)], ["Status change traps", line.lineStatusChangeTrapEnable],
        ]);
    }

    renderNow(line) {
        const now = line.current;
        const keepsHistory = now !== null && (now.es !== null || line.intervals.length > 0);
        patchTerms(byId("line-now"), !keepsHistory ? [["History", "the line keeps none"]] : [
            ["Began", line.timeElapsed === null ? null : `${span(line.timeElapsed)} ago`],
            ["ES, errored", now.es], ["SES, severely errored", now.ses], ["UAS, unavailable", now.uas],
            ["SEFS, severe framing", now.sefs], ["CSS, slips", now.css], ["LES, line errored", now.les],
            ["BES, bursty", now.bes], ["DM, degraded minutes", now.dm],
            ["PCV, path violations", now.pcv], ["LCV, line violations", now.lcv],
        ]);
    }

    renderCharts(line) {
        const { times, gaps, column } = asSeries(line, this.agent.now());
        this.seconds.show(times, ["es", "ses", "uas"].map(column), gaps);
        this.violations.show(times, ["pcv", "lcv"].map(column), gaps);
        const closed = line.intervals ?? [];
        const invalid = closed.filter((interval) => interval.validData === false).length;
        setText(byId("seconds-text"),
            `${closed.length} closed intervals, ${invalid} of them without valid data (hatched): ` +
            `ES ${shown(sum(closed, "es"))}, SES ${shown(sum(closed, "ses"))}, UAS ${shown(sum(closed, "uas"))}.`);
        setText(byId("violations-text"), `PCV ${shown(sum(closed, "pcv"))}, LCV ${shown(sum(closed, "lcv"))}.`);
    }

    renderTable(line) {
        const now = this.agent.now();
        patchList(byId("intervals").tBodies[0], line.intervals ?? [], (interval) => interval.number,
            () => {
                const row = make("tr");
                const end = make("th", "", "", { scope: "row" });
                end.append(make("time"));
                row.append(end, ...Array.from({ length: 7 }, () => make("td")));
                return row;
            },
            (row, interval) => {
                const [end, ...cells] = row.children;
                const ended = new Date(new Date(interval.start).getTime() + 900000);
                setTime(end.firstElementChild, Number.isNaN(ended.getTime()) ? null : ended.toISOString(), now);
                ["es", "ses", "uas", "pcv", "lcv", "css"].forEach((key, place) =>
                    setText(cells[place], shown(interval[key])));
                setText(cells[6], interval.validData === false ? "incomplete" : "complete");
            });
    }
}
