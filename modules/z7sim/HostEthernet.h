// SPDX-License-Identifier: BSD-2-Clause
// A network device of this host in the place of a board's Ethernet interface.
#pragma once

#include "HostDevice.h"
#include "Z7SimEthernet.h"

/// Every answer comes from the kernel at the time of the question; what the kernel does not say is
/// not supported. Numbers are those of the kernel modulo 2^32, as the counters of an interface are.
///
/// The kernel counts unicast packets together with all others, so the unicast queries answer all
/// packets. It does not tell single from multiple collisions, and counts frames that are too long
/// together with those that are too short.
class HostEthernet final : public Z7SimEthernet {
  public:
    explicit HostEthernet(HostDevice device);
    ~HostEthernet() override;

    int GetType() override;
    int GetMTU() override;
    /// A speed of 2^32 bit/s or more answers 2^32 - 1.
    int GetSpeed() override;
    int GetPhysAddress(char* buffer, int& length) override;
    int GetAdminStatus() override;
    int GetOperStatus() override;
    int GetInOctets() override;
    int GetInUcastPkts() override;
    int GetInDiscards() override;
    int GetInErrors() override;
    int GetOutOctets() override;
    int GetOutUcastPkts() override;
    int GetOutDiscards() override;
    int GetOutErrors() override;
    int GetAlignmentErrors() override;
    int GetFCSErrors() override;
    int GetSQETestErrors() override;
    int GetLateCollisions() override;
    int GetExcessiveCollisions() override;
    int GetCarrierSenseErrors() override;
    int GetFrameTooLongs() override;
    int GetDuplexStatus() override;

  private:
    int number(char const* file) const;

    HostDevice const m_device;
};
