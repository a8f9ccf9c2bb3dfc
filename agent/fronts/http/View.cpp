// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/View.h"

#include <algorithm>
#include <chrono>
#include <functional>

#include "board/ISDNChannel.h"

namespace kvloamd {

namespace {

/// The row of this index, of rows that ascend by `field`; null when there is none.
template <class Rows, class Field>
auto const* rowOf(Rows const& rows, std::uint32_t index, Field field) {
    auto const found = std::ranges::lower_bound(rows, index, {}, field);
    return found == rows.end() || std::invoke(field, *found) != index ? nullptr : &*found;
}

bool isInUse(BearerRow const& bearer) {
    return bearer.operStatus && *bearer.operStatus != ISDNBChannelStatusIdle;
}

} // namespace

Moment::Moment(Snapshot const& snapshot, Settings const& current) : number(snapshot.number) {
    using std::chrono::milliseconds;
    alarms = snapshot.alarms;
    settings.load(current.all(SettingIndex::Interface));
    settings.load(current.all(SettingIndex::Entity));
    age = std::chrono::duration_cast<milliseconds>(Clock::now() - snapshot.begun).count();
    taken = std::chrono::duration_cast<milliseconds>(
                std::chrono::system_clock::now().time_since_epoch())
                .count() -
            age;
}

BoardRow const* View::board(std::uint32_t boardIndex) const {
    return rowOf(m_snapshot.boards, boardIndex, &BoardRow::boardIndex);
}

InterfaceRow const* View::interface(std::uint32_t ifIndex) const {
    return rowOf(m_snapshot.interfaces.interfaces, ifIndex, &InterfaceRow::ifIndex);
}

Ds0ChannelRow const* View::timeSlot(std::uint32_t ifIndex) const {
    // Ascending by line and time slot: the line is found by the channel's own row of the stack.
    auto const& stack = m_snapshot.interfaces.stack;
    auto const& slots = m_snapshot.interfaces.ds0Channels;
    for (auto above = std::ranges::lower_bound(stack, ifIndex, {}, &StackRow::higher);
         above != stack.end() && above->higher == ifIndex; ++above) {
        for (auto slot = std::ranges::lower_bound(slots, above->lower, {}, &Ds0ChannelRow::line);
             slot != slots.end() && slot->line == above->lower; ++slot)
            if (slot->channel == ifIndex) return &*slot;
    }
    return nullptr;
}

LineRow const* View::line(std::uint32_t ifIndex) const {
    return rowOf(m_snapshot.interfaces.lines, ifIndex, &LineRow::ifIndex);
}

AlarmRow const* View::alarm(std::uint32_t number) const {
    return rowOf(m_snapshot.alarms->alarms, number, &AlarmRow::number);
}

View::Channels View::channelsOf(std::uint32_t lineIfIndex) const {
    Channels found;
    auto const& slots = m_snapshot.interfaces.ds0Channels;
    for (auto slot = std::ranges::lower_bound(slots, lineIfIndex, {}, &Ds0ChannelRow::line);
         slot != slots.end() && slot->line == lineIfIndex; ++slot) {
        auto const* const bearer =
            rowOf(m_snapshot.interfaces.bearers, slot->channel, &BearerRow::ifIndex);
        if (bearer == nullptr) continue;
        ++found.all;
        if (isInUse(*bearer)) ++found.inUse;
    }
    return found;
}

View::Channels View::allChannels() const {
    auto const& bearers = m_snapshot.interfaces.bearers;
    return {static_cast<std::int64_t>(bearers.size()), std::ranges::count_if(bearers, isInUse)};
}

} // namespace kvloamd
