// SPDX-License-Identifier: BSD-2-Clause
/* global uPlot */
// Charts of a line's intervals.

import { colours } from "/page/strip.js";

const kInterval = 900; // seconds

/** The hour and minute of a time in seconds. */
function clockText(time) {
    return new Date(time * 1000).toTimeString().slice(0, 5);
}

/**
 * An `IntervalChart` draws counters of each interval as bars. The bars of later counters are narrower, so
 * that all can be seen; intervals without data are hatched.
 */
export class IntervalChart {
    /** @param series [{label, colour}], where `colour` is a name of the palette */
    constructor(box, series, unit) {
        Object.assign(this, { box, series, unit });
        this.plot = null;
        this.shown = "";
        this.gaps = [];
        new ResizeObserver(() => this.resize()).observe(box);
    }

    /** @param times of the beginning of each interval, ascending; @param columns the values of each series */
    show(times, columns, gaps) {
        const data = [times, ...columns];
        const shown = JSON.stringify([data, gaps]);
        if (shown === this.shown) return;
        this.shown = shown;
        this.gaps = gaps;
        if (this.plot === null) this.plot = this.make(data);
        else this.plot.setData(data);
    }

    /** Forgets the chart, whose colours are those of another theme. */
    clear() {
        this.plot?.destroy();
        this.plot = null;
        this.shown = "";
    }

    resize() {
        const width = this.box.clientWidth;
        if (this.plot !== null && width > 0 && width !== this.plot.width)
            this.plot.setSize({ width, height: this.plot.height });
    }

    make(data) {
        const ink = colours();
        const axis = { stroke: ink.dim, grid: { stroke: ink.rule, width: 1 }, ticks: { stroke: ink.rule } };
        return new uPlot({
            width: this.box.clientWidth || 600,
            height: 190,
            scales: { y: { range: (_, low, high) => [0, Math.max(4, high * 1.05)] } },
            series: [
                { label: "Begins", value: (_, time) => (time === null ? "–" : clockText(time)) },
                ...this.series.map((one, place) => this.bars(one, place, ink)),
            ],
            axes: [
                { ...axis, values: (_, times) => times.map(clockText) },
                { ...axis, label: this.unit, labelSize: 20, size: 60 },
            ],
            cursor: { drag: { x: false, y: false } },
            hooks: { drawAxes: [(plot) => this.drawGaps(plot, ink.gap)] },
        }, data, this.box);
    }

    bars({ label, colour }, place, ink) {
        return {
            label,
            stroke: ink[colour],
            fill: ink[colour],
            width: 0,
            points: { show: false },
            value: (_, value, __, interval) => (interval === null ? "–" : value?.toLocaleString("en") ?? "no data"),
            paths: uPlot.paths.bars({ size: [0.9 - 0.3 * place], align: 1 }),
        };
    }

    drawGaps(plot, colour) {
        const { ctx: context, bbox: box } = plot;
        context.save();
        context.beginPath();
        context.rect(box.left, box.top, box.width, box.height);
        context.clip();
        context.strokeStyle = colour;
        context.lineWidth = 1;
        for (const time of this.gaps) {
            const left = plot.valToPos(time, "x", true);
            const right = plot.valToPos(time + kInterval, "x", true);
            context.beginPath();
            for (let y = box.top + 4; y < box.top + box.height; y += 10) {
                context.moveTo(left, y + 4);
                context.lineTo(right, y - 4);
            }
            context.stroke();
        }
        context.restore();
    }
}
