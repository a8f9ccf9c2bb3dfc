// SPDX-License-Identifier: BSD-2-Clause
// The page: which view is shown, how fresh it is, and its colours.

import { Agent, Refusal } from "/page/agent.js";
import { BoardsView } from "/page/boards.js";
import { ChannelsView } from "/page/channels.js";
import { byId, setAttribute, setClass, setHidden, setText, span } from "/page/dom.js";
import { HealthView } from "/page/health.js";
import { JournalView } from "/page/journal.js";
import { LinesView } from "/page/lines.js";

const kOldSilence = 3; // seconds without an answer after which the page says so
const kOldSnapshot = 20; // seconds since the boards were read
const kThemeName = "kvloam-theme";

const agent = new Agent(() => ["health", "alarms", ...view().addresses()], render);
const views = {
    boards: new BoardsView(agent),
    lines: new LinesView(agent),
    channels: new ChannelsView(agent),
    journal: new JournalView(agent),
    health: new HealthView(agent),
};
let shownName = "boards";
let wasAway = false;

function view() {
    return views[shownName];
}

/** Shows the view that the address names: "#/lines/101". */
function follow() {
    const [, name, chosen = ""] = location.hash.split("/");
    const before = shownName;
    shownName = Object.hasOwn(views, name) ? name : "boards";
    for (const one of Object.keys(views)) setHidden(byId(`view-${one}`), one !== shownName);
    for (const link of document.querySelectorAll("nav a"))
        setAttribute(link, "aria-current", link.hash === `#/${shownName}` ? "page" : null);
    const heading = view().choose(decode(chosen));
    view().render();
    agent.poll();
    if (heading) heading.focus();
    else if (before !== shownName && document.activeElement === document.body)
        byId("content").focus({ preventScroll: true });
}

function decode(text) {
    try {
        return decodeURIComponent(text);
    } catch {
        return text;
    }
}

function render(changed) {
    const health = agent.body("health")?.health;
    if (health) {
        setText(document.querySelector("h1"), `KVL OAM ${health.host ?? ""}`);
        const title = `${agent.body("alarms")?.alarms.length || "no"} alarms · ${health.host ?? "KVL OAM"}`;
        if (document.title !== title) document.title = title;
    }
    setHidden(byId("token-form"), !agent.needsToken);
    renderFreshness();
    if (changed || agent.lastAnswer !== null) view().render();
}

/** Says when the agent does not answer or does not read the boards, and how old what is shown is. */
function renderFreshness() {
    const silence = agent.silence();
    const age = agent.age();
    const isAway = agent.failure !== null && !agent.needsToken && (silence === null || silence >= kOldSilence);
    let state = ["", "◐", "connecting"];
    if (agent.needsToken) state = ["lost", "✖", "no token"];
    else if (isAway) state = ["lost", "✖", silence === null ? "no answer yet" : `${span(silence)} old`];
    else if (age !== null && age > kOldSnapshot) state = ["stale", "▲", `boards read ${span(age)} ago`];
    else if (age !== null) state = ["live", "●", "live"];
    setClass(byId("connection"), `connection ${state[0]}`);
    setText(byId("connection-mark"), state[1]);
    setText(byId("connection-text"), state[2]);
    document.body.classList.toggle("away", isAway);
    setHidden(byId("notice"), !isAway);
    setText(byId("notice"), isAway ? awayText(silence) : "");
    if (isAway !== wasAway) setText(byId("announcement"), isAway ? "" : "The agent can be reached again.");
    wasAway = isAway;
}

/** The text stays the same while the agent is away, so that it is read out once; the header counts. */
function awayText(silence) {
    const reason = agent.failure instanceof Refusal
        ? `The agent refuses: ${agent.failure.message}.` : "The agent does not answer.";
    if (silence === null) return reason;
    return `${reason} What is shown is what it said last, at ${agent.lastTime.toTimeString().slice(0, 8)}.`;
}

function startTheme() {
    const choice = byId("theme");
    const apply = () => {
        setAttribute(document.documentElement, "data-theme", choice.value === "auto" ? null : choice.value);
        views.lines.themeChanged();
    };
    choice.value = localStorage.getItem(kThemeName) ?? "auto";
    if (choice.selectedIndex < 0) choice.value = "auto";
    choice.addEventListener("change", () => {
        localStorage.setItem(kThemeName, choice.value);
        apply();
    });
    matchMedia("(prefers-color-scheme: dark)").addEventListener("change", apply);
    apply();
}

byId("token-form").addEventListener("submit", (event) => {
    event.preventDefault();
    agent.setToken(byId("token").value);
    byId("token").value = "";
});
document.querySelector(".skip").addEventListener("click", (event) => {
    event.preventDefault(); // the address names a view
    byId("content").focus();
});
window.addEventListener("hashchange", follow);
setInterval(renderFreshness, 1000);
startTheme();
follow();
agent.start();
