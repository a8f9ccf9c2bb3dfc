// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardInterfaces.h"

#include <algorithm>
#include <map>
#include <set>
#include <string>
#include <utility>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardFeatures.h"
#include "agent/readers/CallReader.h"
#include "agent/readers/LegalValues.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/StandardNumbers.h"
#include "board/DS1LineFeature.h"
#include "board/DS1LineImpedance.h"
#include "board/EthernetDetails.h"
#include "board/EthernetFeature.h"
#include "board/IPInterface.h"
#include "board/ISDNChannelOnLine.h"
#include "board/ISDNFeature.h"
#include "board/InterfaceFeature.h"

namespace kvloamd {

namespace {

/// The speed of a DS0, in bit/s.
constexpr std::uint32_t kDs0Speed = 64000;

/// The values of dsx1LineType that are E1 lines.
constexpr int kTypesOfE1[] = {4, 5, 6, 7, 9, 12, 13};

/// The time slot of an E1 line that usually carries its signalling.
constexpr int kSignallingSlotOfE1 = 16;

/// dsx1LineImpedance.
constexpr int kImpedanceNotApplicable = 1;

/// The number of a bearer channel among those of its line. An E1 line with `signallingInside` its
/// bearers leaves out one slot. Nothing if ISDN-MIB has no such number.
std::optional<int> bearerNumber(std::optional<int> timeSlot, bool signallingInside) {
    if (!timeSlot) return std::nullopt;
    int const number = *timeSlot - (signallingInside && *timeSlot > kSignallingSlotOfE1 ? 1 : 0);
    return legal(kBearerNumbers, number);
}

/// An address for which every Ethernet interface receives packets.
constexpr char kBroadcastAddress[] = "\xff\xff\xff\xff\xff\xff";

/// The most octets of a receive address; an Ethernet address has 6.
constexpr std::size_t kLongestAddress = 32;

/// The largest number of bearer channels that is believed of one signalling channel.
constexpr int kMostBearers = 1024;

/// A number that uses all 32 bits; one value of them says that it is not supported.
std::optional<std::uint32_t> unsignedNumber(int answer) {
    if (answer == KVL::kNotSupported) return std::nullopt;
    return static_cast<std::uint32_t>(answer);
}

class Reading {
  public:
    Reading(ToTicks const& toTicks, LineHistories& histories)
        : m_toTicks(toTicks), m_histories(histories) {}

    void readLines(DS1LineFeature& feature);
    void readChannels(ISDNFeature& feature);
    void readEthernets(KVL::EthernetFeature& feature);
    void readOthers(KVL::InterfaceFeature& feature);

    BoardInterfaces take() { return std::move(m_found); }

  private:
    /// Enters an interface under a name that no other of its kind has. The row is good until the
    /// next one is entered.
    InterfaceRow& enter(IndexKind kind, std::string const& name);
    /// Enters an interface without a name of its own under its position among those of its kind.
    InterfaceRow& enterNameless(IndexKind kind);
    void readInterface(KVL::Interface& interface, InterfaceRow& row) const;
    void readLine(DS1LineDevice& line);
    /// A signalling channel's number on the board, and its line's, which is 0 if it is not known.
    struct Signalling {
        ReferenceCounter<ISDNDChannel> channel;
        std::uint32_t index = 0;
        std::uint32_t line = 0;
    };
    Signalling readSignalling(ReferenceCounter<ISDNDChannel> handle);
    std::uint32_t readLapd(ISDNDChannel& channel);
    std::uint32_t readBearer(ISDNBChannel& channel);
    bool isE1(std::uint32_t line) const;
    void readEthernet(KVL::Ethernet& ethernet);
    static void readDetails(KVL::EthernetDetails& details, InterfaceRow& interface,
                            EthernetRow& row, std::set<std::string>& addresses);
    /// Makes the row one of an IP interface, which may stand on an Ethernet interface of its board.
    void placeIp(InterfaceRow& row);
    /// The board's only Ethernet interface, or the only one with the address of `ip`; otherwise 0.
    std::uint32_t ethernetBelow(InterfaceRow const& ip) const;
    void stack(std::uint32_t higher, std::uint32_t lower);
    /// The line that is called `name`, or whose circuit is; 0 when there is none.
    std::uint32_t findLine(std::string const& name) const;
    /// The line that `channel` itself says; 0 if it says none of this board. Nothing if the channel
    /// cannot say.
    std::optional<std::uint32_t> ownLine(Object& channel) const;

    ToTicks const& m_toTicks;
    LineHistories& m_histories;
    BoardInterfaces m_found;
    std::set<IndexKey> m_taken;
    std::map<IndexKind, int> m_nameless;
    std::map<std::string, std::uint32_t> m_lines; ///< by name and by circuit
    std::map<DS1LineDevice const*, std::uint32_t> m_lineObjects;
};

InterfaceRow& Reading::enter(IndexKind kind, std::string const& name) {
    IndexKey key{kind, name};
    for (int copy = 2; !m_taken.insert(key).second; ++copy)
        key.name = name + "#" + std::to_string(copy);
    m_found.keys.push_back(std::move(key));
    InterfaceRow& row = m_found.rows.interfaces.emplace_back();
    row.ifIndex = static_cast<std::uint32_t>(m_found.keys.size());
    return row;
}

InterfaceRow& Reading::enterNameless(IndexKind kind) {
    return enter(kind, std::to_string(++m_nameless[kind]));
}

void Reading::readInterface(KVL::Interface& interface, InterfaceRow& row) const {
    std::string description;
    if (interface.GetDescription(description) != KVL::kNotSupported)
        row.description = printable(description);
    row.type = unlessNegative(interface.GetType());
    row.mtu = unlessNegative(interface.GetMTU());
    row.speed = unsignedNumber(interface.GetSpeed());
    char address[kTextCapacity];
    int length = 0;
    if (interface.GetPhysAddress(address, length) == 0 && length > 0)
        row.physAddress.assign(address, std::min(static_cast<std::size_t>(length), kLongestText));
    row.adminStatus = unlessNegative(interface.GetAdminStatus());
    row.operStatus = unlessNegative(interface.GetOperStatus());
    int seconds = 0;
    int microseconds = 0;
    if (interface.GetLastChange(seconds, microseconds) != KVL::kNotSupported)
        row.lastChange = m_toTicks(seconds);
    row.counters = {
        unsignedNumber(interface.GetInOctets()),        unsignedNumber(interface.GetInUcastPkts()),
        unsignedNumber(interface.GetInDiscards()),      unsignedNumber(interface.GetInErrors()),
        unsignedNumber(interface.GetInUnknownProtos()), unsignedNumber(interface.GetOutOctets()),
        unsignedNumber(interface.GetOutUcastPkts()),    unsignedNumber(interface.GetOutDiscards()),
        unsignedNumber(interface.GetOutErrors())};
}

void Reading::readLine(DS1LineDevice& line) {
    std::string const name = askText(line, &DS1LineDevice::GetName);
    LineRow row;
    row.circuitIdentifier = askText(line, &DS1LineDevice::GetCircuitIdentifier);
    InterfaceRow& interface = enter(IndexKind::Line, name);
    readInterface(line, interface);
    interface.name = name;
    interface.connectorPresent = kTrue;
    row.ifIndex = interface.ifIndex;
    m_found.rows.ports.push_back({row.ifIndex, 0, m_found.keys.back()});
    row.lineType = legal(kLineTypes, line.GetLineType());
    row.lineCoding = legal(kLineCodings, line.GetLineCoding());
    row.sendCode = legal(kSendCodes, line.GetSendCode());
    row.loopbackConfig = legal(kLoopbackConfigs, line.GetLoopbackConfig());
    row.lineStatus = legal(kLineStatuses, line.GetLineStatus());
    row.signalMode = legal(kSignalModes, line.GetSignalMode());
    row.transmitClockSource = legal(kTransmitClockSources, line.GetTransmitClockSource());
    row.fdl = legal(kFdls, line.GetFdl());
    row.lineLength = legal(kLineLengths, line.GetLineLength());
    long const change = line.GetLineStatusLastChange();
    m_found.lineChanges.push_back(change < 0 ? std::nullopt : std::optional(change));
    row.statusChangeTrapEnable = legal(kTrapEnables, line.GetLineStatusChangeTrapEnable());
    row.loopbackStatus = legal(kLoopbackStatuses, line.GetLoopbackStatus());
    row.ds1ChannelNumber = legal(kDs1ChannelNumbers, line.GetDs1ChannelNumber());
    row.channelization = legal(kChannelizations, line.GetChannelization());
    row.lineMode = legal(kLineModes, line.GetLineMode());
    row.lineBuildOut = legal(kLineBuildOuts, line.GetLineBuildOut());
    // DS1-MIB has a number for a line whose impedance is not known.
    auto* const impedance = dynamic_cast<DS1LineImpedance*>(&line);
    row.lineImpedance = legal(kLineImpedances, impedance == nullptr ? kImpedanceNotApplicable
                                                                    : impedance->GetLineImpedance())
                            .value_or(kImpedanceNotApplicable);
    auto const history = line.GetIntervalTable();
    if (history.get() != nullptr) m_histories.read(history, row);
    m_lines.emplace(name, row.ifIndex);
    m_lines.emplace(row.circuitIdentifier, row.ifIndex);
    m_lineObjects.emplace(&line, row.ifIndex);
    m_found.rows.lines.push_back(std::move(row));
}

void Reading::readLines(DS1LineFeature& feature) {
    for (auto line = feature.GetFirstDevice(); line.get() != nullptr;
         line = feature.GetNextDevice(line)) {
        readLine(*line.get());
        m_found.lines.push_back(line);
    }
}

Reading::Signalling Reading::readSignalling(ReferenceCounter<ISDNDChannel> handle) {
    ISDNDChannel& channel = *handle.get();
    std::string const name = askText(channel, &ISDNDChannel::GetName);
    InterfaceRow& interface = enter(IndexKind::SignallingChannel, name);
    SignallingRow row;
    row.ifIndex = interface.ifIndex;
    row.protocol = legal(kSignalingProtocols, channel.GetProtocol());
    row.callingAddress = askText(channel, &ISDNDChannel::GetCallingAddress);
    // A channel may name its line in the place of an address.
    std::uint32_t const named = findLine(row.callingAddress);
    if (named != 0) row.callingAddress.clear();
    std::uint32_t const line = ownLine(channel).value_or(named);
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

std::uint32_t Reading::readLapd(ISDNDChannel& channel) {
    std::string const name = askText(channel, &ISDNDChannel::GetName);
    InterfaceRow& interface = enter(IndexKind::Lapd, name);
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

std::uint32_t Reading::readBearer(ISDNBChannel& channel) {
    std::string const name = askText(channel, &ISDNBChannel::GetName);
    InterfaceRow& interface = enter(IndexKind::BearerChannel, name);
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

void Reading::readChannels(ISDNFeature& feature) {
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
        bearers.emplace_back(readBearer(*channel.get()), ownLine(*channel.get()));
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
        stack(index, line);
        lines.push_back(line);
        if (auto const slot = m_found.rows.bearers[firstRow + i].timeSlot; slot && line != 0)
            m_found.rows.ds0Channels.push_back({line, static_cast<std::uint32_t>(*slot), index});
        if (m_found.rows.bearers[firstRow + i].timeSlot == kSignallingSlotOfE1)
            withSlot16.insert(line);
    }
    for (std::size_t i = 0; i < lines.size(); ++i) {
        BearerRow& row = m_found.rows.bearers[firstRow + i];
        row.channelNumber =
            bearerNumber(row.timeSlot, isE1(lines[i]) && !withSlot16.contains(lines[i]));
    }
    for (Signalling& each : signalling) {
        std::uint32_t const lapd = readLapd(*each.channel.get());
        stack(each.index, lapd);
        stack(lapd, each.line);
    }
}

bool Reading::isE1(std::uint32_t line) const {
    auto const found = std::ranges::find(m_found.rows.lines, line, &LineRow::ifIndex);
    return found != m_found.rows.lines.end() && found->lineType &&
           std::ranges::find(kTypesOfE1, *found->lineType) != std::end(kTypesOfE1);
}

void Reading::stack(std::uint32_t higher, std::uint32_t lower) {
    if (lower != 0) m_found.rows.stack.push_back({higher, lower});
}

std::uint32_t Reading::findLine(std::string const& name) const {
    auto const found = m_lines.find(name);
    return name.empty() || found == m_lines.end() ? 0 : found->second;
}

std::optional<std::uint32_t> Reading::ownLine(Object& channel) const {
    auto* const onLine = dynamic_cast<ISDNChannelOnLine*>(&channel);
    if (onLine == nullptr) return std::nullopt;
    ReferenceCounter<DS1LineDevice> const line = onLine->GetLine();
    auto const found = m_lineObjects.find(line.get());
    return found == m_lineObjects.end() ? 0 : found->second;
}

void Reading::readEthernets(KVL::EthernetFeature& feature) {
    for (auto handle = feature.GetFirstEthernet(); handle.get() != nullptr;
         handle = feature.GetNextEthernet(handle))
        readEthernet(*handle.get());
}

void Reading::readEthernet(KVL::Ethernet& ethernet) {
    InterfaceRow& interface = enterNameless(IndexKind::Ethernet);
    readInterface(ethernet, interface);
    interface.connectorPresent = interface.type == kTypeLoopback ? kFalse : kTrue;
    m_found.rows.ports.push_back({interface.ifIndex, 0, m_found.keys.back()});
    EthernetRow row;
    row.ifIndex = interface.ifIndex;
    row.speed = interface.speed;
    row.counters = {unsignedNumber(ethernet.GetAlignmentErrors()),
                    unsignedNumber(ethernet.GetFCSErrors()),
                    unsignedNumber(ethernet.GetSingleCollisionFrames()),
                    unsignedNumber(ethernet.GetMultipleCollisionFrames()),
                    unsignedNumber(ethernet.GetSQETestErrors()),
                    unsignedNumber(ethernet.GetDeferredTransmissions()),
                    unsignedNumber(ethernet.GetLateCollisions()),
                    unsignedNumber(ethernet.GetExcessiveCollisions()),
                    unsignedNumber(ethernet.GetInternalMacTransmitErrors()),
                    unsignedNumber(ethernet.GetCarrierSenseErrors()),
                    unsignedNumber(ethernet.GetFrameTooLongs()),
                    unsignedNumber(ethernet.GetInternalMacReceiveErrors()),
                    unsignedNumber(ethernet.GetSymbolErrors())};
    row.duplexStatus = unlessNegative(ethernet.GetDuplexStatus());
    std::set<std::string> addresses;
    if (auto* const details = dynamic_cast<KVL::EthernetDetails*>(&ethernet))
        readDetails(*details, interface, row, addresses);
    if (interface.type == kTypeEthernet && !interface.physAddress.empty()) {
        addresses.insert({kBroadcastAddress, interface.physAddress});
        for (std::string const& address : addresses)
            m_found.rows.receiveAddresses.push_back(
                {row.ifIndex, address, address == interface.physAddress});
    }
    m_found.rows.ethernets.push_back(row);
}

void Reading::readDetails(KVL::EthernetDetails& details, InterfaceRow& interface, EthernetRow& row,
                          std::set<std::string>& addresses) {
    interface.highSpeed = unsignedNumber(details.GetHighSpeed());
    interface.promiscuousMode = unlessNegative(details.GetPromiscuousMode());
    interface.counters[kInMulticastPkts] = unsignedNumber(details.GetInMulticastPkts());
    interface.counters[kInBroadcastPkts] = unsignedNumber(details.GetInBroadcastPkts());
    interface.counters[kOutMulticastPkts] = unsignedNumber(details.GetOutMulticastPkts());
    interface.counters[kOutBroadcastPkts] = unsignedNumber(details.GetOutBroadcastPkts());
    row.counters[kInPauseFrames] = unsignedNumber(details.GetInPauseFrames());
    row.counters[kOutPauseFrames] = unsignedNumber(details.GetOutPauseFrames());
    row.pauseAdminMode = unlessNegative(details.GetPauseAdminMode());
    row.pauseOperMode = unlessNegative(details.GetPauseOperMode());
    std::vector<std::string> multicast;
    if (details.GetMulticastAddresses(multicast) != 0) return;
    for (std::string const& address : multicast)
        if (!address.empty() && address.size() <= kLongestAddress) addresses.insert(address);
}

void Reading::readOthers(KVL::InterfaceFeature& feature) {
    // Lines are interfaces too, and have been read as lines.
    if (dynamic_cast<DS1LineFeature*>(&feature) != nullptr) return;
    for (auto handle = feature.GetFirstInterface(); handle.get() != nullptr;
         handle = feature.GetNextInterface(handle)) {
        bool const ip = dynamic_cast<KVL::IPInterface*>(handle.get()) != nullptr;
        InterfaceRow& row = enterNameless(ip ? IndexKind::Ip : IndexKind::Other);
        readInterface(*handle.get(), row);
        if (ip) placeIp(row);
    }
}

void Reading::placeIp(InterfaceRow& row) {
    row.type = kTypeVirtual;
    row.connectorPresent = kFalse;
    std::uint32_t const ethernet = ethernetBelow(row);
    if (ethernet == 0) return;
    stack(row.ifIndex, ethernet);
    // They are the Ethernet interface's, and would count twice.
    row.counters = {};
    row.physAddress.clear();
}

std::uint32_t Reading::ethernetBelow(InterfaceRow const& ip) const {
    auto const& ethernets = m_found.rows.ethernets;
    std::uint32_t found = 0;
    for (EthernetRow const& ethernet : ethernets) {
        InterfaceRow const& interface = m_found.rows.interfaces[ethernet.ifIndex - 1];
        if (ethernets.size() > 1 &&
            (ip.physAddress.empty() || interface.physAddress != ip.physAddress))
            continue;
        if (found != 0) return 0;
        found = ethernet.ifIndex;
    }
    return found;
}

} // namespace

BoardInterfaces readInterfaces(Board& board, ToTicks const& toTicks, LineHistories& histories) {
    Reading reading(toTicks, histories);
    forEachFeature<DS1LineFeature>(board, [&](auto& feature) { reading.readLines(feature); });
    forEachFeature<ISDNFeature>(board, [&](auto& feature) { reading.readChannels(feature); });
    forEachFeature<KVL::EthernetFeature>(board,
                                         [&](auto& feature) { reading.readEthernets(feature); });
    forEachFeature<KVL::InterfaceFeature>(board,
                                          [&](auto& feature) { reading.readOthers(feature); });
    return reading.take();
}

} // namespace kvloamd
