// SPDX-License-Identifier: BSD-2-Clause
// An Ethernet interface whose answers a test chooses, and the feature that holds some.
#pragma once

#include <string>
#include <utility>
#include <vector>

#include "board/EthernetFeature.h"
#include "core/HandleWalk.h"

/// An Ethernet interface that supports only the values that a test sets.
class FakeEthernet final : public KVL::Ethernet {
  public:
    int type = 6;
    int speed = KVL::kNotSupported;
    int inOctets = KVL::kNotSupported;
    int outErrors = KVL::kNotSupported;
    int lastChange = KVL::kNotSupported; ///< seconds since the epoch
    int operStatus = KVL::kNotSupported;
    int fcsErrors = KVL::kNotSupported;
    std::string address;

    int GetDescription(std::string& description) override {
        description = "fake\nport";
        return 0;
    }
    int GetType() override { return type; }
    int GetMTU() override { return Interface::GetMTU(); }
    int GetSpeed() override { return speed; }
    int GetPhysAddress(char* buffer, int& length) override {
        if (address.empty()) return KVL::kNotSupported;
        address.copy(buffer, address.size());
        length = static_cast<int>(address.size());
        return 0;
    }
    int GetAdminStatus() override { return Interface::GetAdminStatus(); }
    int SetAdminStatus(int status) override { return Interface::SetAdminStatus(status); }
    int GetOperStatus() override { return operStatus; }
    int GetLastChange(int& seconds, int& microseconds) override {
        if (lastChange == KVL::kNotSupported) return KVL::kNotSupported;
        seconds = lastChange;
        microseconds = 0;
        return 0;
    }
    int GetInOctets() override { return inOctets; }
    int GetInUcastPkts() override { return Interface::GetInUcastPkts(); }
    int GetInDiscards() override { return Interface::GetInDiscards(); }
    int GetInErrors() override { return Interface::GetInErrors(); }
    int GetInUnknownProtos() override { return Interface::GetInUnknownProtos(); }
    int GetOutOctets() override { return Interface::GetOutOctets(); }
    int GetOutUcastPkts() override { return Interface::GetOutUcastPkts(); }
    int GetOutDiscards() override { return Interface::GetOutDiscards(); }
    int GetOutErrors() override { return outErrors; }

    int GetAlignmentErrors() override { return KVL::kNotSupported; }
    int GetFCSErrors() override { return fcsErrors; }
    int GetSingleCollisionFrames() override { return KVL::kNotSupported; }
    int GetMultipleCollisionFrames() override { return KVL::kNotSupported; }
    int GetSQETestErrors() override { return KVL::kNotSupported; }
    int GetDeferredTransmissions() override { return KVL::kNotSupported; }
    int GetLateCollisions() override { return KVL::kNotSupported; }
    int GetExcessiveCollisions() override { return KVL::kNotSupported; }
    int GetInternalMacTransmitErrors() override { return KVL::kNotSupported; }
    int GetCarrierSenseErrors() override { return KVL::kNotSupported; }
    int GetFrameTooLongs() override { return KVL::kNotSupported; }
    int GetInternalMacReceiveErrors() override { return KVL::kNotSupported; }
    int GetSymbolErrors() override { return KVL::kNotSupported; }
    int GetDuplexStatus() override { return KVL::kNotSupported; }
};

class FakeEthernetFeature : public KVL::EthernetFeature {
  public:
    explicit FakeEthernetFeature(std::vector<ReferenceCounter<KVL::Ethernet>> ports)
        : m_ports(std::move(ports)) {}

    ReferenceCounter<KVL::Ethernet> GetFirstEthernet() override { return KVL::first_in(m_ports); }
    ReferenceCounter<KVL::Ethernet>
    GetNextEthernet(ReferenceCounter<KVL::Ethernet> previous) override {
        return KVL::next_in(m_ports, previous);
    }

  private:
    std::vector<ReferenceCounter<KVL::Ethernet>> m_ports;
};
