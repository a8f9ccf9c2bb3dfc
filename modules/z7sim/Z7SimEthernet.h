// SPDX-License-Identifier: BSD-2-Clause
// An Ethernet interface that supports nothing yet.
#pragma once

#include <string>

#include "board/Ethernet.h"

/// IF-MIB's numbers of the interface types and states in use here.
inline constexpr int kTypeOther = 1;
inline constexpr int kTypeEthernet = 6;
inline constexpr int kTypeLoopback = 24;

/// A `Z7SimEthernet` is the base of Ethernet interfaces: it knows its description and returns
/// `KVL::kNotSupported` for everything else.
class Z7SimEthernet : public KVL::Ethernet {
  public:
    explicit Z7SimEthernet(std::string description);
    ~Z7SimEthernet() override;

    int GetDescription(std::string& description) override;
    int GetType() override { return Interface::GetType(); }
    int GetMTU() override { return Interface::GetMTU(); }
    int GetSpeed() override { return Interface::GetSpeed(); }
    int GetPhysAddress(char* buffer, int& length) override {
        return Interface::GetPhysAddress(buffer, length);
    }
    int GetAdminStatus() override { return Interface::GetAdminStatus(); }
    int SetAdminStatus(int status) override { return Interface::SetAdminStatus(status); }
    int GetOperStatus() override { return Interface::GetOperStatus(); }
    int GetLastChange(int& seconds, int& microseconds) override {
        return Interface::GetLastChange(seconds, microseconds);
    }
    int GetInOctets() override { return Interface::GetInOctets(); }
    int GetInUcastPkts() override { return Interface::GetInUcastPkts(); }
    int GetInDiscards() override { return Interface::GetInDiscards(); }
    int GetInErrors() override { return Interface::GetInErrors(); }
    int GetInUnknownProtos() override { return Interface::GetInUnknownProtos(); }
    int GetOutOctets() override { return Interface::GetOutOctets(); }
    int GetOutUcastPkts() override { return Interface::GetOutUcastPkts(); }
    int GetOutDiscards() override { return Interface::GetOutDiscards(); }
    int GetOutErrors() override { return Interface::GetOutErrors(); }

    int GetAlignmentErrors() override { return KVL::kNotSupported; }
    int GetFCSErrors() override { return KVL::kNotSupported; }
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

  private:
    std::string const m_description;
};
