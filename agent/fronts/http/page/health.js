// SPDX-License-Identifier: BSD-2-Clause
// The view of the agent's health.

import { byId, dateText, make, patchList, patchTerms, setText, shown, span, words } from "/page/dom.js";

/** A `HealthView` is the fifth view. */
export class HealthView {
    constructor(agent) {
        this.agent = agent;
    }

    choose() {
        return null;
    }

    addresses() {
        return ["modules", "services", "processes"];
    }

    render() {
        const body = this.agent.body("health");
        if (!body) return;
        const { health } = body;
        const now = this.agent.now();
        const milliseconds = (value) => (value === null ? null : `${shown(value)} ms`);
        patchTerms(byId("health-terms"), [
            ["Host", health.host], ["Agent", health.agentVersion], ["Library", health.libraryVersion],
            ["Started", dateText(health.agentStarted, now)],
            ["Up for", health.agentUpTimeSeconds === null ? null : span(health.agentUpTimeSeconds)],
            ["Boards", health.boardCount], ["Lines", health.lineCount], ["Interfaces", health.interfaceCount],
            ["Status changes of boards", health.boardStatusChanges],
            ["Alarms now", health.alarmCount], ["Alarms raised", health.alarmsRaised],
            ["Alarms suppressed", health.alarmsSuppressed],
            ["Channels", health.channels], ["Channels in use", health.channelsInUse],
            ["Faults now", health.faultCount], ["Faults raised", health.faultsRaised],
            ["SNMP", words(health.agentFront)], ["SNMP master", health.masterState],
            ["Master lost", health.masterLosses],
            ["Indices and settings", words(health.persistence)],
            ["Snapshots", health.snapshots], ["Reading the boards takes", milliseconds(health.refreshTime)],
            ["Longest", milliseconds(health.longestRefreshTime)],
            ["Requests", health.requests], ["Notifications sent", health.notificationsSent],
            ["Notifications waiting", health.notificationsWaiting],
            ["Informs not acknowledged", health.notificationsUnacknowledged],
            ["Notifications dropped", health.notificationsDropped],
            ["Conflicts of interface numbers", health.interfaceConflicts],
        ]);
        this.renderList("modules", this.agent.body("modules")?.modules ?? [], (module) =>
            [module.name, module.version, module.purpose].filter(Boolean).join(", "));
        this.renderList("services", this.agent.body("services")?.services ?? [], (service) =>
            `${shown(service.name)}: status ${shown(service.status)}, ` +
            `since ${shown(dateText(service.changeDate, now))}`);
        this.renderProcesses(this.agent.body("processes")?.processes ?? []);
    }

    renderList(id, rows, textOf) {
        const texts = rows.length > 0 ? rows.map((row) => [row.index, textOf(row)]) : [["none", "none"]];
        patchList(byId(id), texts, (row) => row[0], () => make("li"), (element, row) => setText(element, row[1]));
    }

    renderProcesses(processes) {
        patchList(byId("processes").tBodies[0], processes, (process) => process.id,
            (process) => {
                const row = make("tr");
                row.append(make("th", "", String(process.id), { scope: "row" }));
                row.append(...Array.from({ length: 5 }, () => make("td")));
                return row;
            },
            (row, process) => {
                const cells = [...row.children].slice(1);
                const waiting = `${shown(process.currentEvents)} of ${shown(process.eventQueueSize)}`;
                [process.name, process.opens, process.closes, waiting, process.totalEvents].forEach((value, place) =>
                    setText(cells[place], shown(value)));
            });
    }
}
