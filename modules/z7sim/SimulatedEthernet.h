// SPDX-License-Identifier: BSD-2-Clause
// An Ethernet interface that is described by attributes of its board.
#pragma once

#include <optional>

#include "PhysAddress.h"
#include "Z7SimEthernet.h"
#include "board/EthernetDetails.h"

/// A `SimulatedEthernet` keeps what does not change and asks the platform for every counter,
/// because the board's attributes hold the counters. A query without an attribute is not supported.
class SimulatedEthernet final : public Z7SimEthernet, public KVL::EthernetDetails {
  public:
    /// `board`: its handle in the device mapper. `address`: the value of its attribute.
    SimulatedEthernet(long board, std::string const& address);
    ~SimulatedEthernet() override;

    int GetType() override;
    int GetMTU() override { return m_mtu; }
    int GetSpeed() override { return m_speed; }
    int GetPhysAddress(char* buffer, int& length) override;
    int GetOperStatus() override;
    int GetInOctets() override;
    int GetInUcastPkts() override;
    int GetInDiscards() override;
    int GetInErrors() override;
    int GetInUnknownProtos() override;
    int GetOutOctets() override;
    int GetOutUcastPkts() override;
    int GetOutDiscards() override;
    int GetOutErrors() override;
    int GetAlignmentErrors() override;
    int GetFCSErrors() override;
    int GetInternalMacTransmitErrors() override;
    int GetFrameTooLongs() override;
    int GetInternalMacReceiveErrors() override;
    int GetSymbolErrors() override;
    int GetDuplexStatus() override;
    int GetInMulticastPkts() override;
    int GetInBroadcastPkts() override;
    int GetOutMulticastPkts() override;
    int GetOutBroadcastPkts() override;
    /// A simulated interface receives what is addressed to it.
    int GetPromiscuousMode() override { return 2; }

  private:
    int number(char const* attribute) const;

    long const m_board;
    std::optional<PhysAddress> const m_address;
    int const m_mtu;
    int const m_speed;
};
