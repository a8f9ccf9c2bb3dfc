// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ChannelReader.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "agent/readers/Answers.h"
#include "agent/readers/CallReader.h"
#include "agent/readers/LegalValues.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// The speed of a DS0, in bit/s.
constexpr std::uint32_t kDs0Speed = 64000;

/// The time slot of an E1 line that usually carries its signalling.
constexpr int kSignallingSlotOfE1 = 16;

/// The number of a bearer channel among those of its line. An E1 line with `signallingInside` its
/// bearers leaves out one slot. Nothing if ISDN-MIB has no such number.
std::optional<int> bearerNumber(std::optional<int> timeSlot, bool signallingInside) {
    if (!timeSlot) return std::nullopt;
    int const number = *timeSlot - (signallingInside && *timeSlot > kSignallingSlotOfE1 ? 1 : 0);
    return legal(kBearerNumbers, number);
}

/// The largest number of bearer channels that is believed of one signalling channel.
constexpr int kMostBearers = 1024;

/// A signalling channel, its number on the board, and that of its line, which is 0 if it is not
/// known.
struct Signalling {
    ReferenceCounter<ISDNDChannel> channel;
    std::uint32_t index = 0;
    std::uint32_t line = 0;
};

/// A `ChannelReading` reads the channels of one board.
class ChannelReading {
  public:
    ChannelReading(ToTicks const& toTicks, InterfaceDraft& draft)
        : m_toTicks(toTicks), m_draft(draft), m_found(draft.found()) {}

    void read(ISDNFeature& feature);

  private:
    Signalling readSignalling(ReferenceCounter<ISDNDChannel> handle);
    std::uint32_t readLapd(ISDNDChannel& channel);
    std::uint32_t readBearer(ISDNBChannel& channel);

    ToTicks const& m_toTicks;
    InterfaceDraft& m_draft;
    BoardInterfaces& m_found;
};

Signalling ChannelReading::readSignalling(ReferenceCounter<ISDNDChannel> handle) {
    ISDNDChannel& channel = *handle.get();
    std::string const name = askText(channel, &ISDNDChannel::GetName);
    InterfaceRow& interface = m_draft.enter(IndexKind::SignallingChannel, name);
    SignallingRow row;
    row.ifIndex = interface.ifIndex;
    row.protocol = legal(kSignalingProtocols, channel.GetProtocol());
    row.callingAddress = askText(channel, &ISDNDChannel::GetCallingAddress);
    // A channel may name its line in the place of an address.
    std::uint32_t const named = m_draft.findLine(row.callingAddress);
    if (named != 0) row.callingAddress.clear();
    std::uint32_t const line = m_draft.lineOf(channel).value_or(named);
    row.bearerCount = legal(kBearerCounts, channel.GetBChannelCount());
    interface.description = "signalling channel " + name;
    interface.name = name;
    interface.type = kTypeIsdn;
    interface.connectorPresent = kFalse;
    interface.speed = kDs0Speed;
    interface.physAddress = row.callingAddress;
    if (auto const status = legal(kLapdStatuses, channel.GetOperStatus()))
        interface.operStatus = status == ISDNDChannelStatusL2Active ? kUp : kDormant;
    readCounts(channel, row);
    Signalling found{std::move(handle), row.ifIndex, line};
    m_found.rows.signalling.push_back(std::move(row));
    return found;
}

std::uint32_t ChannelReading::readLapd(ISDNDChannel& channel) {
    std::string const name = askText(channel, &ISDNDChannel::GetName);
    InterfaceRow& interface = m_draft.enter(IndexKind::Lapd, name);
    LapdRow row;
    row.ifIndex = interface.ifIndex;
    interface.description = "data link of signalling channel " + name;
    interface.name = name + "-lapd";
    interface.type = kTypeLapd;
    interface.connectorPresent = kFalse;
    interface.speed = kDs0Speed;
    row.operStatus = legal(kLapdStatuses, channel.GetOperStatus());
    if (row.operStatus)
        interface.operStatus = row.operStatus == ISDNDChannelStatusL2Active ? kUp : kDormant;
    readCounts(channel, row);
    m_found.rows.lapds.push_back(row);
    return row.ifIndex;
}

std::uint32_t ChannelReading::readBearer(ISDNBChannel& channel) {
    std::string const name = askText(channel, &ISDNBChannel::GetName);
    InterfaceRow& interface = m_draft.enter(IndexKind::BearerChannel, name);
    BearerRow row;
    row.ifIndex = interface.ifIndex;
    row.channelType = legal(kBearerTypes, channel.GetChannelType());
    row.operStatus = legal(kBearerStatuses, channel.GetOperStatus());
    row.timeSlot = legal(kDs0ChannelNumbers, channel.GetChannelNumber());
    interface.description = "bearer channel " + name;
    interface.name = name;
    interface.type = kTypeDs0;
    interface.connectorPresent = kFalse;
    interface.speed = kDs0Speed;
    if (row.operStatus)
        interface.operStatus = *row.operStatus >= ISDNBChannelStatusConnected ? kUp : kDormant;
    readCall(channel, m_toTicks, row);
    m_found.rows.bearers.push_back(std::move(row));
    return m_found.rows.bearers.back().ifIndex;
}

void ChannelReading::read(ISDNFeature& feature) {
    std::vector<Signalling> signalling;
    std::vector<std::size_t> ofBearer; // where its signalling channel is
    for (auto channel = feature.GetFirstDChannel(); channel.get() != nullptr;
         channel = feature.GetNextDChannel(channel)) {
        signalling.push_back(readSignalling(channel));
        SignallingRow const& row = m_found.rows.signalling.back();
        int const bearers = std::min(row.bearerCount.value_or(0), kMostBearers);
        ofBearer.insert(ofBearer.end(), static_cast<std::size_t>(bearers), signalling.size() - 1);
    }
    std::vector<std::pair<std::uint32_t, std::optional<std::uint32_t>>> bearers;
    for (auto channel = feature.GetFirstBChannel(); channel.get() != nullptr;
         channel = feature.GetNextBChannel(channel))
        bearers.emplace_back(readBearer(*channel.get()), m_draft.lineOf(*channel.get()));
    // Bearer channels that cannot say their line come in the order of the signalling channels that
    // they belong to. If the counts do not agree, their lines are not known.
    bool const countsAgree = ofBearer.size() == bearers.size();
    std::size_t const firstRow = m_found.rows.bearers.size() - bearers.size();
    std::vector<std::uint32_t> lines;
    std::set<std::uint32_t> withSlot16;
    for (std::size_t i = 0; i < bearers.size(); ++i) {
        auto const& [index, said] = bearers[i];
        Signalling const* by = countsAgree ? &signalling[ofBearer[i]] : nullptr;
        if (said) {
            auto const found = std::ranges::find(signalling, *said, &Signalling::line);
            by = *said != 0 && found != signalling.end() ? &*found : by;
        }
        std::uint32_t const line = said.value_or(by == nullptr ? 0 : by->line);
        if (by != nullptr) m_found.rows.bearers[firstRow + i].signalling = by->index;
        m_draft.stack(index, line);
        lines.push_back(line);
        if (auto const slot = m_found.rows.bearers[firstRow + i].timeSlot; slot && line != 0)
            m_found.rows.ds0Channels.push_back({line, static_cast<std::uint32_t>(*slot), index});
        if (m_found.rows.bearers[firstRow + i].timeSlot == kSignallingSlotOfE1)
            withSlot16.insert(line);
    }
    for (std::size_t i = 0; i < lines.size(); ++i) {
        BearerRow& row = m_found.rows.bearers[firstRow + i];
        row.channelNumber =
            bearerNumber(row.timeSlot, m_draft.isE1(lines[i]) && !withSlot16.contains(lines[i]));
    }
    for (Signalling& each : signalling) {
        std::uint32_t const lapd = readLapd(*each.channel.get());
        m_draft.stack(each.index, lapd);
        m_draft.stack(lapd, each.line);
    }
}

} // namespace

void readChannels(ISDNFeature& feature, ToTicks const& toTicks, InterfaceDraft& draft) {
    ChannelReading(toTicks, draft).read(feature);
}

} // namespace kvloamd
