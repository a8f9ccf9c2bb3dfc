// SPDX-License-Identifier: BSD-2-Clause
// Long lists: only the rows that can be seen are in the document.

import { make, setAttribute, setHidden } from "/page/dom.js";

const kMargin = 3; // rows beyond each edge, so that slow painting does not show

/**
 * A `Rows` is a list of any number of rows of one height in a scrolling element, which has the role "grid".
 * It keeps as many elements as fit, and brings each of them up to the row at its place.
 *
 * One cell is the current one, and alone takes the focus. Arrow keys, Page Up, Page Down, Home and End move
 * it; with Ctrl, Home and End go to the first and the last row. Enter, Space and a click choose its row.
 */
export class Rows {
    /**
     * @param box the scrolling element
     * @param height of a row in pixels; @param narrow the same where the window is narrow
     * @param create makes a row's element; its children with the role "gridcell" are the cells
     * @param update brings an element up to a row
     * @param choose (row, column) what happens to a chosen row
     * @param keyOf what a row is known by when the list changes
     * @param header a row of column headers, the first child of `box`, which stays in sight
     * @param wraps whether Right goes on from the last cell of a row to the next row, as Left goes back
     */
    constructor(box, {
        height, narrow = height, create, update, keyOf, choose = () => {}, header = null, wraps = false,
    }) {
        Object.assign(this, { box, create, update, keyOf, choose, header, wraps });
        this.rows = [];
        this.pool = [];
        this.current = { row: 0, column: 0 };
        this.currentKey = null;
        const isNarrow = matchMedia("(max-width: 48rem)");
        const setHeight = () => { this.height = isNarrow.matches ? narrow : height; };
        setHeight();
        isNarrow.addEventListener("change", () => {
            setHeight();
            this.set(this.rows);
        });
        this.space = make("div", "rows-space", "", { role: "presentation" });
        box.append(this.space);
        box.addEventListener("scroll", () => this.show(), { passive: true });
        box.addEventListener("keydown", (event) => this.key(event));
        box.addEventListener("click", (event) => this.click(event));
        new ResizeObserver(() => this.show()).observe(box);
    }

    set(rows) {
        this.rows = rows;
        this.followCurrent();
        setAttribute(this.box, "aria-rowcount", rows.length + (this.header ? 1 : 0));
        const height = `${rows.length * this.height}px`;
        if (this.space.style.height !== height) this.space.style.height = height;
        this.show();
    }

    /** The current cell stays with its row while rows come and go before it. */
    followCurrent() {
        const isSame = (row) => row !== undefined && this.keyOf(row) === this.currentKey;
        if (this.currentKey !== null && !isSame(this.rows[this.current.row])) {
            const place = this.rows.findIndex(isSame);
            if (place >= 0) this.current.row = place;
        }
        this.current.row = Math.min(this.current.row, Math.max(0, this.rows.length - 1));
    }

    /** The height in which rows can be seen. */
    room() {
        return this.box.clientHeight - (this.header ? this.header.offsetHeight : 0);
    }

    /** The places of the rows that can be seen. */
    visible() {
        const first = Math.max(0, Math.floor(this.box.scrollTop / this.height) - kMargin);
        const fit = Math.ceil(this.room() / this.height) + 2 * kMargin;
        return { first, end: Math.min(this.rows.length, first + fit) };
    }

    visibleRows() {
        const { first, end } = this.visible();
        return this.rows.slice(first, Math.max(first, end));
    }

    show() {
        if (this.box.clientHeight === 0) return; // of a view that is not shown
        const { first, end } = this.visible();
        const hadFocus = this.space.contains(document.activeElement);
        this.grow(end - first);
        // A row's element follows from its place, so that scrolling by one row changes one element.
        const used = new Set();
        for (let place = first; place < end; ++place) {
            const element = this.pool[place % this.pool.length];
            used.add(element);
            this.put(element, place);
        }
        for (const element of this.pool) setHidden(element, !used.has(element));
        if (first < end) this.rotate(this.pool[first % this.pool.length]);
        const isSeen = this.current.row >= first && this.current.row < end;
        // While the current cell is out of sight, the list takes the focus in its place.
        setAttribute(this.box, "tabindex", isSeen ? "-1" : "0");
        if (hadFocus) this.keepFocus(isSeen);
    }

    grow(size) {
        if (this.pool.length >= size) return;
        while (this.pool.length < size) {
            const element = this.create();
            element.classList.add("rows-row");
            this.pool.push(element);
        }
        this.space.append(...this.pool);
    }

    /** Brings the elements into the order of their rows, in which they are read out: `first` is the first one. */
    rotate(first) {
        const elements = [...this.space.children];
        const place = elements.indexOf(first);
        if (place === 0) return;
        if (place <= elements.length / 2) this.space.append(...elements.slice(0, place));
        else this.space.prepend(...elements.slice(place));
    }

    /** The focus stays with the current cell while rows move to other elements. */
    keepFocus(isSeen) {
        const target = isSeen ? this.cells(this.current.row)[this.current.column] ?? this.box : this.box;
        if (document.activeElement !== target) target.focus({ preventScroll: true });
    }

    put(element, place) {
        const transform = `translateY(${place * this.height}px)`;
        if (element.style.transform !== transform) element.style.transform = transform;
        element.place = place;
        setAttribute(element, "aria-rowindex", place + (this.header ? 2 : 1));
        this.update(element, this.rows[place]);
        const cells = this.cellsOf(element);
        const column = Math.min(this.current.column, cells.length - 1);
        for (const child of element.children)
            if (child.getAttribute("role") === "gridcell")
                setAttribute(child, "tabindex", place === this.current.row && child === cells[column] ? "0" : "-1");
    }

    cellsOf(element) {
        return [...element.children].filter((child) =>
            child.getAttribute("role") === "gridcell" && !child.hidden && child.getAttribute("aria-hidden") !== "true");
    }

    cells(place) {
        const element = this.pool.find((one) => !one.hidden && one.place === place);
        return element ? this.cellsOf(element) : [];
    }

    /** Makes a cell the current one and gives it the focus. */
    goTo(row, column) {
        if (this.rows.length === 0) return;
        const place = Math.min(Math.max(row, 0), this.rows.length - 1);
        this.current = { row: place, column: Math.max(0, column) };
        this.currentKey = this.keyOf(this.rows[place]);
        const top = place * this.height;
        if (top < this.box.scrollTop) this.box.scrollTop = top;
        else if (top + this.height > this.box.scrollTop + this.room())
            this.box.scrollTop = top + this.height - this.room();
        this.show();
        const cells = this.cells(place);
        this.current.column = Math.min(this.current.column, Math.max(0, cells.length - 1));
        cells[this.current.column]?.focus({ preventScroll: true });
    }

    /** Where a key moves to: [row, column]; undefined for other keys. */
    target(event) {
        const { row, column } = this.current;
        const last = this.rows.length - 1;
        const page = Math.max(1, Math.floor(this.room() / this.height) - 1);
        switch (event.key) {
        case "ArrowDown": return [row + 1, column];
        case "ArrowUp": return [row - 1, column];
        case "ArrowLeft":
            return this.wraps && column === 0 && row > 0 ? [row - 1, Infinity] : [row, column - 1];
        case "ArrowRight":
            return this.wraps && column >= this.cells(row).length - 1 && row < last ? [row + 1, 0] : [row, column + 1];
        case "PageDown": return [row + page, column];
        case "PageUp": return [row - page, column];
        case "Home": return [event.ctrlKey ? 0 : row, 0];
        case "End": return [event.ctrlKey ? last : row, Infinity];
        default: return undefined;
        }
    }

    key(event) {
        if (event.altKey || event.metaKey || this.rows.length === 0) return;
        const target = this.target(event);
        if (target) this.goTo(...target);
        else if (event.key === "Enter" || event.key === " ")
            this.choose(this.rows[this.current.row], this.current.column);
        else return;
        event.preventDefault();
    }

    click(event) {
        const cell = event.target.closest("[role=gridcell]");
        const element = event.target.closest(".rows-row");
        if (!cell || !element) return;
        this.goTo(element.place, this.cellsOf(element).indexOf(cell));
        this.choose(this.rows[this.current.row], this.current.column);
    }
}
