// SPDX-License-Identifier: BSD-2-Clause
// The strip of a line: its last 24 hours, an interval of 15 minutes a column.

const kIntervals = 96;
const kColumn = 2; // pixels
const kHeight = 24;

/** What an interval is by its worst second. The height says it too, so that colour is never alone. */
const kKinds = { clean: 2, errored: 9, severe: 16, unavailable: 24, gap: 10 };

let palette = null;

/** The colours of the theme that is shown now; forgotten when the theme changes. */
export function colours() {
    if (palette === null) {
        const style = getComputedStyle(document.documentElement);
        palette = {};
        for (const name of [...Object.keys(kKinds), "text", "dim", "rule"])
            palette[name] = style.getPropertyValue(`--${name}`).trim();
    }
    return palette;
}

export function forgetColours() {
    palette = null;
}

/** @param interval [ES, SES, UAS], or null for one without data */
export function kindOf(interval) {
    if (!interval) return "gap";
    const [es, ses, uas] = interval;
    if (uas > 0) return "unavailable";
    if (ses > 0) return "severe";
    return es > 0 ? "errored" : "clean";
}

/** The strip in words. */
export function stripText(strip) {
    if (!strip) return "24 hours: not known";
    const sums = [0, 0, 0];
    for (const interval of strip)
        if (interval) interval.forEach((seconds, i) => { sums[i] += seconds ?? 0; });
    const gaps = strip.filter((interval) => !interval).length + kIntervals - Math.min(kIntervals, strip.length);
    return `24 hours: ES ${sums[0]}, SES ${sums[1]}, UAS ${sums[2]}, ${gaps} of 96 intervals without data`;
}

/** Draws a strip whose newest interval is first; it is drawn last, at the right. Null draws nothing. */
export function drawStrip(canvas, strip) {
    const scale = Math.max(1, Math.round(window.devicePixelRatio));
    canvas.width = kIntervals * kColumn * scale;
    canvas.height = kHeight * scale;
    const context = canvas.getContext("2d");
    const ink = colours();
    context.scale(scale, scale);
    if (!strip) return;
    for (let age = 0; age < kIntervals; ++age) {
        const kind = age < strip.length ? kindOf(strip[age]) : "gap";
        const left = (kIntervals - 1 - age) * kColumn;
        context.fillStyle = ink[kind];
        if (kind !== "gap") {
            context.fillRect(left, kHeight - kKinds[kind], kColumn, kKinds[kind]);
        } else if (age % 2 === 0) { // two rows of dashes
            context.fillRect(left, kHeight - 1, kColumn, 1);
            context.fillRect(left, kHeight - kKinds.gap, kColumn, 1);
        }
    }
}

const kPatience = 60000; // milliseconds for which a strip is shown before it is asked for again

/**
 * A `Strips` keeps the strips of the lines that are shown, and says which ones to ask for: those of new
 * lines, those whose running interval has been closed, and old ones.
 */
export class Strips {
    constructor() {
        this.kept = new Map(); // ifIndex -> {strip, time, elapsed}
    }

    of(ifIndex) {
        return this.kept.get(ifIndex)?.strip ?? null;
    }

    /** @returns at most `most` of the lines' indices */
    missing(lines, most) {
        const now = performance.now();
        return lines.filter((line) => {
            const known = this.kept.get(line.ifIndex);
            return !known || now - known.time > kPatience || line.timeElapsed < known.elapsed;
        }).slice(0, most).map((line) => line.ifIndex);
    }

    /** @param lines rows with a `strip` */
    enter(lines) {
        const time = performance.now();
        for (const line of lines)
            this.kept.set(line.ifIndex, { strip: line.strip ?? null, time, elapsed: line.timeElapsed ?? 0 });
        while (this.kept.size > 2000) this.kept.delete(this.kept.keys().next().value);
    }
}
