// SPDX-License-Identifier: BSD-2-Clause
#include "HostEthernet.h"

#include <net/if.h>
#include <net/if_arp.h>

#include <algorithm>
#include <array>
#include <limits>
#include <string_view>
#include <utility>

#include "HostMulticast.h"
#include "HostPause.h"
#include "PhysAddress.h"

namespace {

/// The low 32 bits of a counter.
int low32(std::int64_t number) {
    return static_cast<int>(static_cast<std::uint32_t>(number));
}

struct NamedState {
    std::string_view name;
    int state;
};

constexpr int kOperUp = 1;
constexpr int kOperUnknown = 4;
/// The kernel's names for IF-MIB's ifOperStatus, without "unknown".
constexpr std::array<NamedState, 6> kOperStates = {{{"up", kOperUp},
                                                    {"down", 2},
                                                    {"testing", 3},
                                                    {"dormant", 5},
                                                    {"notpresent", 6},
                                                    {"lowerlayerdown", 7}}};
/// For EtherLike-MIB's dot3StatsDuplexStatus.
constexpr std::array<NamedState, 3> kDuplexStates = {{{"unknown", 1}, {"half", 2}, {"full", 3}}};

template <std::size_t size>
int stateNamed(std::array<NamedState, size> const& states, std::string_view name, int otherwise) {
    auto const found = std::ranges::find(states, name, &NamedState::name);
    return found == states.end() ? otherwise : found->state;
}

} // namespace

HostEthernet::HostEthernet(HostDevice device)
    : Z7SimEthernet("host interface " + device.name()), m_device(std::move(device)) {}

HostEthernet::~HostEthernet() = default;

int HostEthernet::number(char const* file) const {
    auto const value = m_device.number(file);
    return value ? low32(*value) : KVL::kNotSupported;
}

int HostEthernet::GetType() {
    auto const type = m_device.number("type");
    if (!type) return KVL::kNotSupported;
    if (*type == ARPHRD_ETHER) return kTypeEthernet;
    return *type == ARPHRD_LOOPBACK ? kTypeLoopback : kTypeOther;
}

int HostEthernet::GetMTU() {
    return number("mtu");
}

int HostEthernet::GetSpeed() {
    auto const megabits = m_device.number("speed");
    if (!megabits || *megabits < 0) return KVL::kNotSupported; // -1: no link
    std::int64_t const most = std::numeric_limits<std::uint32_t>::max();
    return low32(*megabits > most / 1'000'000 ? most : *megabits * 1'000'000);
}

int HostEthernet::GetPhysAddress(char* buffer, int& length) {
    return answerPhysAddress(parsePhysAddress(m_device.text("address").value_or("")), buffer,
                             length);
}

int HostEthernet::GetAdminStatus() {
    auto const flags = m_device.flags();
    if (!flags) return KVL::kNotSupported;
    return (*flags & IFF_UP) != 0 ? 1 : 2;
}

int HostEthernet::GetOperStatus() {
    auto const state = m_device.text("operstate");
    if (!state) return KVL::kNotSupported;
    // A driver without operational states, such as the loopback's, reports "unknown". Such a device
    // is up while it is enabled and has a carrier.
    bool const runs = GetAdminStatus() == 1 && m_device.number("carrier") == 1;
    return stateNamed(kOperStates, *state, runs ? kOperUp : kOperUnknown);
}

int HostEthernet::GetInOctets() {
    return number("statistics/rx_bytes");
}

int HostEthernet::GetInUcastPkts() {
    // Read first, so that no packet is subtracted that is not in the sum.
    std::int64_t const multicast = m_device.number("statistics/multicast").value_or(0);
    auto const packets = m_device.number("statistics/rx_packets");
    if (!packets) return KVL::kNotSupported;
    std::scoped_lock const guard(m_mutex);
    // The two numbers are not of the same moment, and a counter must not fall for that.
    if (*packets < m_lastPackets) m_lastUnicast = 0;
    m_lastPackets = *packets;
    m_lastUnicast = std::max(m_lastUnicast, *packets - multicast);
    return low32(m_lastUnicast);
}

int HostEthernet::GetInDiscards() {
    return number("statistics/rx_dropped");
}

int HostEthernet::GetInErrors() {
    return number("statistics/rx_errors");
}

int HostEthernet::GetOutOctets() {
    return number("statistics/tx_bytes");
}

int HostEthernet::GetOutUcastPkts() {
    return number("statistics/tx_packets");
}

int HostEthernet::GetOutDiscards() {
    return number("statistics/tx_dropped");
}

int HostEthernet::GetOutErrors() {
    return number("statistics/tx_errors");
}

int HostEthernet::GetAlignmentErrors() {
    return number("statistics/rx_frame_errors");
}

int HostEthernet::GetFCSErrors() {
    return number("statistics/rx_crc_errors");
}

int HostEthernet::GetSQETestErrors() {
    return number("statistics/tx_heartbeat_errors");
}

int HostEthernet::GetLateCollisions() {
    return number("statistics/tx_window_errors");
}

int HostEthernet::GetExcessiveCollisions() {
    return number("statistics/tx_aborted_errors");
}

int HostEthernet::GetCarrierSenseErrors() {
    return number("statistics/tx_carrier_errors");
}

int HostEthernet::GetFrameTooLongs() {
    return number("statistics/rx_length_errors");
}

int HostEthernet::GetDuplexStatus() {
    auto const duplex = m_device.text("duplex");
    return duplex ? stateNamed(kDuplexStates, *duplex, KVL::kNotSupported) : KVL::kNotSupported;
}

int HostEthernet::GetInternalMacTransmitErrors() {
    return number("statistics/tx_fifo_errors");
}

int HostEthernet::GetInternalMacReceiveErrors() {
    auto const fifo = m_device.number("statistics/rx_fifo_errors");
    auto const overrun = m_device.number("statistics/rx_over_errors");
    if (!fifo && !overrun) return KVL::kNotSupported;
    return low32(fifo.value_or(0) + overrun.value_or(0));
}

int HostEthernet::GetHighSpeed() {
    auto const megabits = m_device.number("speed");
    return megabits && *megabits >= 0 ? low32(*megabits) : KVL::kNotSupported;
}

int HostEthernet::GetPromiscuousMode() {
    auto const flags = m_device.flags();
    if (!flags) return KVL::kNotSupported;
    return (*flags & IFF_PROMISC) != 0 ? 1 : 2;
}

int HostEthernet::GetInMulticastPkts() {
    return number("statistics/multicast");
}

int HostEthernet::GetPauseAdminMode() {
    auto const pause = readHostPause(m_device.name());
    return pause ? pauseMode(*pause) : KVL::kNotSupported;
}

int HostEthernet::GetPauseOperMode() {
    auto const pause = readHostPause(m_device.name());
    return pause && !pause->isNegotiated ? pauseMode(*pause) : KVL::kNotSupported;
}

int HostEthernet::GetMulticastAddresses(std::vector<std::string>& addresses) {
    return readHostMulticast(m_device.name(), addresses) ? 0 : KVL::kNotSupported;
}
