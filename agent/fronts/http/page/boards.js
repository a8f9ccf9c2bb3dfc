// SPDX-License-Identifier: BSD-2-Clause
// The view of the chassis: its shelves and slots with their boards, and one board in detail.

import { Alarms, renderSummary } from "/page/summary.js";
import {
    byId, count, dateText, make, patchList, patchTerms, setAttribute, setClass, setHidden, setText,
} from "/page/dom.js";
import { Rows } from "/page/rows.js";
import { boardState, lineState, makeState, rank, showState } from "/page/states.js";

const kList = "boards?fields=boardIndex,status,secondaryStatus,name,model,serialNumber,errorMessage,shelfId," +
    "pciSlotNumber";
const kCellWidth = 150; // of a slot, in pixels, at least
const kMostSlots = 64; // of a shelf that is drawn with the slots between its boards

/** What the agent finds a board by. A serial number goes before an index of the same digits. */
function nameOf(board) {
    return board.serialNumber || String(board.boardIndex);
}

/** A board's name for people. */
function title(board) {
    return board.model || board.name || `board ${board.boardIndex}`;
}

function compare(a, b) {
    if (a === null || b === null) return (a === null) - (b === null);
    return a - b;
}

/**
 * The slots of each shelf in their order, with the slots between them that have no board.
 * @param gone boards that were there and have gone, of slots that are still empty
 * @returns [{shelf, slots: [{slot, board, gone}]}]
 */
export function arrange(boards, gone = []) {
    const shelves = new Map();
    const enter = (place, content) => {
        const shelf = place.shelfId ?? null;
        if (!shelves.has(shelf)) shelves.set(shelf, []);
        shelves.get(shelf).push({ slot: place.pciSlotNumber ?? null, board: null, gone: null, ...content });
    };
    for (const board of boards) enter(board, { board });
    for (const place of gone) enter(place, { gone: place });
    const result = [];
    for (const [shelf, taken] of [...shelves].sort((a, b) => compare(a[0], b[0]))) {
        taken.sort((a, b) => compare(a.slot, b.slot) || (a.board?.boardIndex ?? 0) - (b.board?.boardIndex ?? 0));
        const numbers = taken.map((one) => one.slot).filter((slot) => slot !== null);
        const first = numbers[0];
        const last = numbers[numbers.length - 1];
        const slots = [];
        let next = first;
        for (const one of taken) {
            if (one.slot !== null && last - first < kMostSlots)
                for (; next < one.slot; ++next) slots.push({ slot: next, board: null, gone: null });
            slots.push(one);
            if (one.slot !== null) next = one.slot + 1;
        }
        result.push({ shelf, slots });
    }
    return result;
}

/** The shelves as rows of at most `width` slots. */
export function asRows(shelves, width) {
    const rows = [];
    for (const { shelf, slots } of shelves)
        for (let from = 0; from < slots.length; from += width)
            rows.push({ shelf, first: from === 0, from, slots: slots.slice(from, from + width) });
    return rows;
}

/** A `BoardsView` is the first view: summary, alarms, chassis, and the chosen board. */
export class BoardsView {
    constructor(agent) {
        this.agent = agent;
        this.alarms = new Alarms(agent);
        this.chosen = null;
        this.seen = new Map(); // place -> the board that was seen there last
        this.width = 4;
        this.worst = new Map();
        this.rows = new Rows(byId("chassis"), {
            height: 96,
            wraps: true,
            keyOf: (row) => `${row.shelf} ${row.from}`,
            create: () => this.create(),
            update: (element, row) => this.update(element, row),
            choose: (row, column) => {
                const board = row.slots[column]?.board;
                if (board) location.hash = `#/boards/${encodeURIComponent(nameOf(board))}`;
            },
        });
        new ResizeObserver(() => this.measure()).observe(byId("chassis"));
    }

    addresses() {
        return [kList, ...(this.chosen === null ? [] : [`boards/${encodeURIComponent(this.chosen)}`])];
    }

    /** @param chosen the serial number or index of the board to show in detail */
    choose(chosen) {
        this.chosen = chosen || null;
        return this.chosen === null ? null : byId("board-heading");
    }

    measure() {
        const width = Math.max(2, Math.min(16, Math.floor((byId("chassis").clientWidth - 60) / kCellWidth)));
        if (width === this.width) return;
        this.width = width;
        // Cells are made for a width.
        for (const element of this.rows.pool.splice(0)) element.remove();
        this.render();
    }

    create() {
        const row = make("div", "", "", { role: "row" });
        row.append(make("span", "", "", { role: "rowheader" }));
        for (let i = 0; i < this.width; ++i) {
            const cell = make("div", "", "", { role: "gridcell" });
            cell.append(make("span", "slot"), make("span", "model"), make("span", "serial"), makeState(), make("span"));
            row.append(cell);
        }
        return row;
    }

    update(element, row) {
        const [header, ...cells] = element.children;
        setText(header, row.first ? (row.shelf === null ? "no shelf" : `Shelf ${row.shelf}`) : "");
        cells.forEach((cell, column) => {
            const place = row.slots[column];
            if (place) this.updateCell(cell, place);
            else setClass(cell, "filler");
            setAttribute(cell, "aria-hidden", place ? null : "true");
        });
    }

    updateCell(cell, place) {
        const [slot, model, serial, state, wrong] = cell.children;
        const { board } = place;
        const alarms = board && this.worst.get(board.boardIndex);
        setText(slot, place.slot === null ? "slot not known" : `Slot ${place.slot}`);
        setText(wrong, alarms ? `${count(alarms.number, "alarm")}, ${alarms.severity}` : "");
        setClass(wrong, alarms ? `wrong ${alarms.severity}` : "");
        if (!board) {
            setClass(cell, "board-none");
            setText(model, "no board");
            setText(serial, place.gone ? `was ${place.gone.serialNumber || title(place.gone)}` : "");
            showState(state, place.gone ? ["off", "○", "removed"] : ["off", "", ""]);
            setAttribute(cell, "aria-selected", null);
            setAttribute(cell, "title", null);
            return;
        }
        const known = boardState(board);
        setClass(cell, `board-${known[0]}`);
        setText(model, title(board));
        setText(serial, board.serialNumber);
        showState(state, known);
        setAttribute(cell, "aria-selected", String(nameOf(board) === this.chosen));
        setAttribute(cell, "title", board.errorMessage || null);
    }

    /** Boards that were in slots which have none now. */
    gone(boards) {
        const place = (board) => `${board.shelfId}/${board.pciSlotNumber}`;
        const taken = new Set(boards.map(place));
        for (const board of boards) this.seen.set(place(board), board);
        return [...this.seen].filter(([key, board]) => !taken.has(key) && board.pciSlotNumber !== null)
            .map(([, board]) => board);
    }

    render() {
        const boards = this.agent.body(kList)?.boards ?? null;
        const alarms = this.agent.body("alarms")?.alarms ?? null;
        renderSummary(this.agent.body("health")?.health ?? null, boards, alarms);
        this.alarms.render(alarms);
        if (!boards) return;
        this.worst = new Map();
        for (const alarm of alarms ?? []) {
            const known = this.worst.get(alarm.boardIndex) ?? { number: 0, severity: alarm.severity };
            ++known.number;
            if (rank(alarm.severity) < rank(known.severity)) known.severity = alarm.severity;
            this.worst.set(alarm.boardIndex, known);
        }
        setText(byId("board-count"), count(boards.length, "board"));
        this.rows.set(asRows(arrange(boards, this.gone(boards)), this.width));
        this.renderBoard();
    }

    renderBoard() {
        setHidden(byId("board"), this.chosen === null);
        if (this.chosen === null) return;
        const address = `boards/${encodeURIComponent(this.chosen)}`;
        const body = this.agent.body(address);
        const refusal = this.agent.error(address);
        setHidden(byId("board-gone"), refusal === null);
        setText(byId("board-gone"), refusal === null ? "" : `The agent says: ${refusal}.`);
        setHidden(byId("board-terms"), !body);
        if (!body) {
            setText(byId("board-heading"), `Board ${this.chosen}`);
            patchList(byId("board-lines"), [], () => 0, () => null, () => {});
            return;
        }
        const { board, lines } = body;
        setText(byId("board-heading"), `${title(board)}, ${board.serialNumber || `board ${board.boardIndex}`}`);
        patchTerms(byId("board-terms"), [
            ["State", boardState(board)[2]], ["Error", board.errorMessage],
            ["Changed", dateText(board.changeDate, this.agent.now())],
            ["Name", board.name], ["Purpose", board.functionalDescription],
            ["Firmware", [board.firmwareName, board.firmwareVersion].filter(Boolean).join(" ")],
            ["Shelf", board.shelfId], ["PCI bus", board.busNumber], ["PCI slot", board.pciSlotNumber],
            ["Logical identifier", board.logicalId], ["Board index", board.boardIndex],
        ]);
        patchList(byId("board-lines"), lines, (line) => line.ifIndex,
            (line) => {
                const element = make("li");
                element.append(make("a", "", "", { href: `#/lines/${line.ifIndex}` }), ": ", makeState());
                return element;
            },
            (element, line) => {
                setText(element.firstElementChild, line.name);
                showState(element.lastElementChild, lineState(line));
            });
    }
}
