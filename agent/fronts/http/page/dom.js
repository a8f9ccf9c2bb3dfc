// SPDX-License-Identifier: BSD-2-Clause
// Elements, texts and times. Texts reach the document as text nodes and attribute values only.

/** A new element: its class, its text, and attributes. */
export function make(tag, className = "", text = "", attributes = {}) {
    const element = document.createElement(tag);
    if (className) element.className = className;
    if (text) element.textContent = text;
    for (const [name, value] of Object.entries(attributes)) element.setAttribute(name, value);
    return element;
}

export function byId(id) {
    return document.getElementById(id);
}

/** Changes an element's text, unless it is there already: what has not changed is not painted again. */
export function setText(element, text) {
    const wanted = text === null || text === undefined ? "" : String(text);
    if (element.textContent !== wanted) element.textContent = wanted;
}

export function setClass(element, className) {
    if (element.className !== className) element.className = className;
}

/** Sets an attribute; null removes it. */
export function setAttribute(element, name, value) {
    if (value === null || value === undefined) {
        if (element.hasAttribute(name)) element.removeAttribute(name);
    } else if (element.getAttribute(name) !== String(value)) {
        element.setAttribute(name, String(value));
    }
}

export function setHidden(element, hidden) {
    if (element.hidden !== hidden) element.hidden = hidden;
}

/**
 * Makes `parent`'s children those of `rows`, in their order. A child stays the same element while its
 * row's key stays, so that focus and selection survive.
 * @param keyOf the key of a row, unique among the rows
 * @param create makes the element of a new row
 * @param update brings an element up to its row
 */
export function patchList(parent, rows, keyOf, create, update) {
    const old = parent.patched ?? new Map();
    const now = new Map();
    let place = parent.firstElementChild;
    for (const row of rows) {
        const key = keyOf(row);
        let element = old.get(key);
        if (element === undefined) element = create(row);
        old.delete(key);
        now.set(key, element);
        update(element, row);
        if (element === place) place = place.nextElementSibling;
        else parent.insertBefore(element, place);
    }
    for (const element of old.values()) element.remove();
    parent.patched = now;
}

/** Fills a description list from [term, text] pairs. */
export function patchTerms(list, pairs) {
    patchList(list, pairs, (pair) => pair[0],
        (pair) => {
            const group = make("div");
            group.append(make("dt", "", pair[0]), make("dd"));
            return group;
        },
        (group, pair) => setText(group.lastElementChild, shown(pair[1])));
}

/** A value as it is shown: what is not known is a dash. */
export function shown(value) {
    if (value === null || value === undefined || value === "") return "–";
    if (Array.isArray(value)) return value.map(words).join(", ");
    if (typeof value === "number") return value.toLocaleString("en");
    return String(value);
}

/** The name of an enumeration's value in words: "dsx1LossOfSignal" is "loss of signal". */
export function words(name) {
    if (name === null || name === undefined) return "unknown";
    return String(name).replace(/^(dsx1|kvl)(?=[A-Z])/, "")
        .replace(/([a-z0-9])([A-Z])/g, "$1 $2").replace(/([A-Z])([A-Z][a-z])/g, "$1 $2")
        .split(" ").map((word) => (/^[A-Z0-9]+$/.test(word) && word.length > 1 ? word : word.toLowerCase())).join(" ");
}

/** "3 lines", "1 line". */
export function count(number, noun) {
    return `${shown(number)} ${noun}${number === 1 ? "" : "s"}`;
}

/** A span of time in words, its largest two units: "3 min 20 s". */
export function span(seconds) {
    const whole = Math.max(0, Math.floor(seconds));
    if (whole < 60) return `${whole} s`;
    if (whole < 3600) return `${Math.floor(whole / 60)} min ${whole % 60} s`;
    if (whole < 86400) return `${Math.floor(whole / 3600)} h ${Math.floor(whole / 60) % 60} min`;
    return `${Math.floor(whole / 86400)} d ${Math.floor(whole / 3600) % 24} h`;
}

function two(number) {
    return String(number).padStart(2, "0");
}

/** A time of day as this browser's user reads it; with its date unless that is the day of `now`. */
export function timeText(date, now) {
    const time = `${two(date.getHours())}:${two(date.getMinutes())}:${two(date.getSeconds())}`;
    if (date.toDateString() === now.toDateString()) return time;
    return `${date.getFullYear()}-${two(date.getMonth() + 1)}-${two(date.getDate())} ${time}`;
}

/** The same for an RFC 3339 time; what is no time is null. */
export function dateText(text, now) {
    const date = new Date(text ?? NaN);
    return Number.isNaN(date.getTime()) ? null : timeText(date, now);
}

/** Shows an RFC 3339 time in a <time> element; what is no time is a dash. */
export function setTime(element, text, now) {
    const date = new Date(text ?? NaN);
    if (Number.isNaN(date.getTime())) {
        setText(element, "–");
        setAttribute(element, "datetime", null);
        setAttribute(element, "title", null);
        return;
    }
    setText(element, timeText(date, now));
    setAttribute(element, "datetime", text);
    setAttribute(element, "title", `${text} (UTC)`);
}
