// SPDX-License-Identifier: BSD-2-Clause
// The view of the channels: how many of each line's are in use, and one line's time slots.

import { byId, count, make, patchList, setAttribute, setClass, setHidden, setText, shown, words } from "/page/dom.js";
import { Rows } from "/page/rows.js";

const kList = "lines?fields=name,ifIndex,board,boardIndex,channels,channelsInUse";

/** What a channel carries, in words. */
function callText(channel) {
    if (channel.operStatus === "idle") return "idle";
    const peer = channel.peerAddress ? ` with ${channel.peerAddress}` : "";
    return `${words(channel.operStatus)}${peer}`;
}

/** A `ChannelsView` is the third view. */
export class ChannelsView {
    constructor(agent) {
        this.agent = agent;
        this.chosen = null;
        this.rows = new Rows(byId("channels"), {
            height: 36,
            header: byId("channels").firstElementChild,
            keyOf: (line) => line.ifIndex,
            create: () => {
                const row = make("div", "", "", { role: "row" });
                const cells = Array.from({ length: 4 }, () => make("span", "", "", { role: "gridcell" }));
                cells[2].append(make("meter", "", "", { min: 0 }));
                row.append(...cells);
                return row;
            },
            update: (row, line) => {
                const [name, used, share, board] = row.children;
                setText(name, shown(line.name));
                setText(used, `${shown(line.channelsInUse)} of ${shown(line.channels)}`);
                const meter = share.firstElementChild;
                setAttribute(meter, "max", Math.max(1, line.channels ?? 0));
                setAttribute(meter, "value", line.channelsInUse ?? 0);
                setAttribute(meter, "aria-label", `channels in use on ${line.name}`);
                setText(board, shown(line.board));
            },
            choose: (line) => { location.hash = `#/channels/${line.ifIndex}`; },
        });
    }

    choose(chosen) {
        this.chosen = chosen || null;
        return this.chosen === null ? null : byId("slots-heading");
    }

    slotsAddress() {
        return `channels?line=${encodeURIComponent(this.chosen)}`;
    }

    addresses() {
        return this.chosen === null ? [kList] : [kList, this.slotsAddress()];
    }

    render() {
        const lines = (this.agent.body(kList)?.lines ?? null)?.filter((line) => line.channels !== 0) ?? null;
        if (lines) {
            const used = lines.reduce((sum, line) => sum + (line.channelsInUse ?? 0), 0);
            const all = lines.reduce((sum, line) => sum + (line.channels ?? 0), 0);
            setText(byId("channel-count"), `${shown(used)} of ${count(all, "channel")}`);
            this.rows.set(lines);
        }
        this.renderSlots();
    }

    /** The line's channels, by time slot. */
    renderSlots() {
        setHidden(byId("slots"), this.chosen === null);
        if (this.chosen === null) return;
        const body = this.agent.body(this.slotsAddress());
        const channels = body?.channels ?? [];
        const refusal = this.agent.error(this.slotsAddress());
        const known = this.agent.body(kList)?.lines.find((line) => String(line.ifIndex) === this.chosen);
        const line = known?.name ?? this.chosen;
        setText(byId("slots-heading"),
            refusal === null ? `Channels of line ${line}` : `The agent says: ${refusal}`);
        setHidden(byId("no-slots"), body === null || channels.length > 0);
        patchList(byId("slot-list"), channels, (channel) => channel.ifIndex,
            () => {
                const slot = make("li");
                slot.append(make("b"), " ", make("span"));
                return slot;
            },
            (slot, channel) => {
                setClass(slot, channel.operStatus === "idle" ? "" : "busy");
                setText(slot.firstElementChild, channel.timeSlot ?? channel.name);
                setText(slot.lastElementChild, callText(channel));
            });
    }
}
