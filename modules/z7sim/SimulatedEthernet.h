// SPDX-License-Identifier: BSD-2-Clause
// An Ethernet interface that is described by attributes of its board.
#pragma once

#include <optional>

#include "PhysAddress.h"
#include "Z7SimEthernet.h"

/// A `SimulatedEthernet` keeps what does not change and asks the platform for every counter,
/// because the board's attributes hold the counters. A query without an attribute is not supported.
class SimulatedEthernet final : public Z7SimEthernet {
  public:
    /// `board`: its handle in the device mapper. `address`: the value of its attribute.
    SimulatedEthernet(long board, std::string const& address);
    ~SimulatedEthernet() override;

    int GetType() override;
    int GetMTU() override { return m_mtu; }
    int GetSpeed() override { return m_speed; }
    int GetPhysAddress(char* buffer, int& length) override;
    int GetInOctets() override;
    int GetOutOctets() override;
    int GetFCSErrors() override;

  private:
    int number(char const* attribute) const;

    long const m_board;
    std::optional<PhysAddress> const m_address;
    int const m_mtu;
    int const m_speed;
};
