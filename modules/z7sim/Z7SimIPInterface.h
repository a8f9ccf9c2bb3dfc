// SPDX-License-Identifier: BSD-2-Clause
// The IP interface of a board.
#pragma once

#include <vector>

#include "board/EthernetFeature.h"
#include "board/IPInterface.h"

/// A `Z7SimIPInterface` knows its addresses and forwards all other queries to the Ethernet
/// interface below it. Without one, it supports only the description and the addresses.
class Z7SimIPInterface final : public KVL::IPInterface {
  public:
    using Addresses = std::vector<ReferenceCounter<KVL::IPAddressConfig>>;

    /// `ethernet`: may be empty.
    Z7SimIPInterface(Addresses addresses, ReferenceCounter<KVL::Ethernet> ethernet);
    ~Z7SimIPInterface() override;

    /// Returns the same objects at every call.
    ReferenceCounter<KVL::IPAddressConfig> GetFirstIPAddressConfig() override;
    ReferenceCounter<KVL::IPAddressConfig>
    GetNextIPAddressConfig(ReferenceCounter<KVL::IPAddressConfig> previous) override;

    int GetDescription(std::string& description) override;
    int GetType() override;
    int GetMTU() override;
    int GetSpeed() override;
    int GetPhysAddress(char* buffer, int& length) override;
    int GetAdminStatus() override;
    int SetAdminStatus(int status) override;
    int GetOperStatus() override;
    int GetLastChange(int& seconds, int& microseconds) override;
    int GetInOctets() override;
    int GetInUcastPkts() override;
    int GetInDiscards() override;
    int GetInErrors() override;
    int GetInUnknownProtos() override;
    int GetOutOctets() override;
    int GetOutUcastPkts() override;
    int GetOutDiscards() override;
    int GetOutErrors() override;

  private:
    Addresses const m_addresses;
    ReferenceCounter<KVL::Ethernet> const m_ethernet;
};
