// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardInterfaces.h"

#include <algorithm>
#include <set>
#include <string>
#include <utility>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardFeatures.h"
#include "agent/readers/ChannelReader.h"
#include "agent/readers/InterfaceDraft.h"
#include "agent/readers/LegalValues.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/StandardNumbers.h"
#include "board/DS1LineFeature.h"
#include "board/DS1LineImpedance.h"
#include "board/EthernetDetails.h"
#include "board/EthernetFeature.h"
#include "board/IPInterface.h"
#include "board/ISDNFeature.h"
#include "board/InterfaceFeature.h"

namespace kvloamd {

namespace {

/// dsx1LineImpedance.
constexpr int kImpedanceNotApplicable = 1;

/// An address for which every Ethernet interface receives packets.
constexpr char kBroadcastAddress[] = "\xff\xff\xff\xff\xff\xff";

/// The most octets of a receive address; an Ethernet address has 6.
constexpr std::size_t kLongestAddress = 32;

/// A number that uses all 32 bits; one value of them says that it is not supported.
std::optional<std::uint32_t> unsignedNumber(int answer) {
    if (answer == KVL::kNotSupported) return std::nullopt;
    return static_cast<std::uint32_t>(answer);
}

/// A `Reading` reads the lines, Ethernet interfaces and IP interfaces of one board.
class Reading {
  public:
    Reading(ToTicks const& toTicks, LineHistories& histories, InterfaceDraft& draft)
        : m_toTicks(toTicks), m_histories(histories), m_draft(draft), m_found(draft.found()) {}

    void readLines(DS1LineFeature& feature);
    void readEthernets(KVL::EthernetFeature& feature);
    void readOthers(KVL::InterfaceFeature& feature);

  private:
    void readInterface(KVL::Interface& interface, InterfaceRow& row) const;
    void readLine(ReferenceCounter<DS1LineDevice> const& handle);
    void readEthernet(KVL::Ethernet& ethernet);
    static void readDetails(KVL::EthernetDetails& details, InterfaceRow& interface,
                            EthernetRow& row, std::set<std::string>& addresses);
    /// Makes the row one of an IP interface, which may stand on an Ethernet interface of its board.
    void placeIp(InterfaceRow& row);
    /// The board's only Ethernet interface, or the only one with the address of `ip`; otherwise 0.
    std::uint32_t ethernetBelow(InterfaceRow const& ip) const;
    ToTicks const& m_toTicks;
    LineHistories& m_histories;
    InterfaceDraft& m_draft;
    BoardInterfaces& m_found;
};

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

void Reading::readLine(ReferenceCounter<DS1LineDevice> const& handle) {
    DS1LineDevice& line = *handle.get();
    // Before the row: what changes meanwhile is then seen by the next check.
    KnownLine known{handle, line.GetIntervalTable(), checkLine(line)};
    std::string const name = askText(line, &DS1LineDevice::GetName);
    LineRow row;
    row.circuitIdentifier = askText(line, &DS1LineDevice::GetCircuitIdentifier);
    InterfaceRow& interface = m_draft.enter(IndexKind::Line, name);
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
    if (known.history.get() != nullptr) m_histories.read(known.history, row);
    m_draft.addLine(line, name, row.circuitIdentifier, row.ifIndex);
    m_found.rows.lines.push_back(std::move(row));
    m_found.lines.push_back(std::move(known));
}

void Reading::readLines(DS1LineFeature& feature) {
    for (auto line = feature.GetFirstDevice(); line.get() != nullptr;
         line = feature.GetNextDevice(line))
        readLine(line);
}

void Reading::readEthernets(KVL::EthernetFeature& feature) {
    for (auto handle = feature.GetFirstEthernet(); handle.get() != nullptr;
         handle = feature.GetNextEthernet(handle))
        readEthernet(*handle.get());
}

void Reading::readEthernet(KVL::Ethernet& ethernet) {
    InterfaceRow& interface = m_draft.enterNameless(IndexKind::Ethernet);
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
        InterfaceRow& row = m_draft.enterNameless(ip ? IndexKind::Ip : IndexKind::Other);
        readInterface(*handle.get(), row);
        if (ip) placeIp(row);
    }
}

void Reading::placeIp(InterfaceRow& row) {
    row.type = kTypeVirtual;
    row.connectorPresent = kFalse;
    std::uint32_t const ethernet = ethernetBelow(row);
    if (ethernet == 0) return;
    m_draft.stack(row.ifIndex, ethernet);
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

LineCheck checkLine(DS1LineDevice& line) {
    return {line.GetLineStatus(), line.GetOperStatus(), line.GetAdminStatus(),
            line.GetLineStatusChangeTrapEnable(), line.GetLineStatusLastChange()};
}

BoardInterfaces readInterfaces(Board& board, ToTicks const& toTicks, LineHistories& histories) {
    InterfaceDraft draft;
    Reading reading(toTicks, histories, draft);
    forEachFeature<DS1LineFeature>(board, [&](auto& feature) { reading.readLines(feature); });
    forEachFeature<ISDNFeature>(board,
                                [&](auto& feature) { readChannels(feature, toTicks, draft); });
    forEachFeature<KVL::EthernetFeature>(board,
                                         [&](auto& feature) { reading.readEthernets(feature); });
    forEachFeature<KVL::InterfaceFeature>(board,
                                          [&](auto& feature) { reading.readOthers(feature); });
    BoardInterfaces found = draft.take();
    found.hasOnlyLines = found.rows.interfaces.size() == found.lines.size();
    return found;
}

} // namespace kvloamd
