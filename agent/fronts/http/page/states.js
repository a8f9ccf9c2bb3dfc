// SPDX-License-Identifier: BSD-2-Clause
// States as people see them: a class for the colour, a mark for the shape, and a word.

import { make, setClass, setText, words } from "/page/dom.js";

const kBoardStates = {
    started: ["good", "●", "started"],
    stopped: ["off", "■", "stopped"],
    startPending: ["info", "◐", "starting"],
    stopPending: ["info", "◐", "stopping"],
    failed: ["bad", "✖", "failed"],
};

export function boardState(board) {
    const status = board.secondaryStatus === "failed" ? "failed" : board.status;
    return kBoardStates[status] ?? ["info", "?", words(status)];
}

// What the names of a line's failures do not say plainly.
const kFailures = {
    dsx1RcvFarEndLOF: "receiving RAI", dsx1XmtFarEndLOF: "sending RAI", dsx1RcvAIS: "receiving AIS",
    dsx1XmtAIS: "sending AIS", dsx1LoopbackState: "in loopback", dsx1UnavailSigState: "unavailable",
    dsx1RcvTestCode: "receiving a test code", dsx1NetEquipOOS: "carrier out of service",
};
// What is named first, because it explains the rest.
const kFirst = ["dsx1LossOfSignal", "dsx1LossOfFrame", "dsx1RcvAIS", "dsx1RcvFarEndLOF", "dsx1UnavailSigState"];
// What a line reports that is no trouble.
const kHarmless = new Set(["dsx1NoAlarm", "dsx1LoopbackState", "dsx1RcvTestCode"]);

export function hasTrouble(line) {
    const status = line.lineStatus ?? [];
    return (line.operStatus !== "up" && line.operStatus !== null) || status.some((name) => !kHarmless.has(name));
}

export function lineState(line) {
    const status = line.lineStatus;
    if (status === null || status === undefined) return ["off", "?", words(line.operStatus)];
    if (status.length === 0 || (status.length === 1 && status[0] === "dsx1NoAlarm"))
        return line.operStatus === "down" ? ["bad", "✖", "down"] : ["good", "●", "no alarm"];
    const weight = (name) => (kFirst.includes(name) ? kFirst.indexOf(name) : kFirst.length);
    const text = status.filter((name) => name !== "dsx1NoAlarm").sort((a, b) => weight(a) - weight(b))
        .map((name) => kFailures[name] ?? words(name)).join(", ");
    if (line.operStatus === "down" || status.includes("dsx1UnavailSigState")) return ["bad", "✖", text];
    return hasTrouble(line) ? ["major", "▲", text] : ["info", "◆", text];
}

const kSeverities = {
    critical: ["critical", "✖", 0],
    major: ["major", "▲", 1],
    minor: ["minor", "◆", 2],
    warning: ["warning", "●", 3],
    indeterminate: ["indeterminate", "?", 4],
    cleared: ["cleared", "○", 5],
};

export function severityState(severity) {
    const [colour, mark] = kSeverities[severity] ?? ["off", "·"];
    return [colour, mark, severity ?? ""];
}

/** The order of severities: the worst is the lowest. */
export function rank(severity) {
    return kSeverities[severity]?.[2] ?? 6;
}

/** An element for a state: a mark that is not read out, and a word. */
export function makeState(className = "state") {
    const element = make("span", className);
    element.append(make("span", "mark", "", { "aria-hidden": "true" }), " ", make("span"));
    return element;
}

export function showState(element, [colour, mark, word], className = "state") {
    setClass(element, `${className} ${colour}`);
    setText(element.firstElementChild, mark);
    setText(element.lastElementChild, word);
}
