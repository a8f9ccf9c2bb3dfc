// SPDX-License-Identifier: BSD-2-Clause
// An Ethernet interface of a board, represented by a network device of this host.
#pragma once

#include <cstdint>
#include <mutex>
#include <string>
#include <vector>

#include "HostDevice.h"
#include "Z7SimEthernet.h"
#include "board/EthernetDetails.h"

/// A `HostEthernet` asks the kernel for every answer; what the kernel does not know is not
/// supported. Counters are the kernel's, modulo 2^32.
///
/// The kernel counts the multicast packets that it receives, and broadcast packets together with
/// unicast ones; of the packets that it sends, only all together. So `GetInUcastPkts` includes
/// broadcasts, and `GetOutUcastPkts` returns all packets. It does not distinguish single from
/// multiple collisions, and it counts frames that are too long together with those that are too
/// short.
class HostEthernet final : public Z7SimEthernet, public KVL::EthernetDetails {
  public:
    explicit HostEthernet(HostDevice device);
    ~HostEthernet() override;

    int GetType() override;
    int GetMTU() override;
    /// Returns 2^32 - 1 for a speed of 2^32 bit/s or more.
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
    int GetInternalMacTransmitErrors() override;
    int GetFrameTooLongs() override;
    int GetInternalMacReceiveErrors() override;
    int GetDuplexStatus() override;

    int GetHighSpeed() override;
    int GetPromiscuousMode() override;
    int GetInMulticastPkts() override;
    /// The operating mode is known only if it was not negotiated.
    int GetPauseAdminMode() override;
    int GetPauseOperMode() override;
    int GetMulticastAddresses(std::vector<std::string>& addresses) override;

  private:
    int number(char const* file) const;

    HostDevice const m_device;
    std::mutex m_mutex;             ///< guards what follows
    std::int64_t m_lastPackets = 0; ///< received, at the last query
    std::int64_t m_lastUnicast = 0;
};
