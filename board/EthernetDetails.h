// SPDX-License-Identifier: BSD-2-Clause
// What an Ethernet interface may know beside its statistics.
#pragma once

#include <string>
#include <vector>

#include "board/Interface.h"

namespace KVL {

/// An `EthernetDetails` is an Ethernet interface that knows more of IF-MIB and EtherLike-MIB than
/// `Ethernet` asks for. A class derived from `Ethernet` may derive from this class too; agents find
/// it by a dynamic cast of the interface. It has no interface identifier and no reference count of
/// its own. Every query has a body that returns `kNotSupported`, so that a class overrides only
/// what it knows. The concrete class says which queries are thread-safe.
class KVLOAM_API EthernetDetails {
  public:
    /// Mbit/s, for interfaces whose speed does not fit into `GetSpeed`.
    virtual int GetHighSpeed() { return kNotSupported; }
    /// 1: the interface receives all packets on its medium; 2: only those for its addresses.
    virtual int GetPromiscuousMode() { return kNotSupported; }
    virtual int GetInMulticastPkts() { return kNotSupported; }
    virtual int GetInBroadcastPkts() { return kNotSupported; }
    virtual int GetOutMulticastPkts() { return kNotSupported; }
    virtual int GetOutBroadcastPkts() { return kNotSupported; }
    /// The values of dot3PauseAdminMode and dot3PauseOperMode: 1 disabled, 2 sends pause frames, 3
    /// obeys them, 4 both.
    virtual int GetPauseAdminMode() { return kNotSupported; }
    virtual int GetPauseOperMode() { return kNotSupported; }
    virtual int GetInPauseFrames() { return kNotSupported; }
    virtual int GetOutPauseFrames() { return kNotSupported; }
    /// Appends the octets of each multicast address for which the interface receives packets.
    /// Returns 0.
    virtual int GetMulticastAddresses(std::vector<std::string>& /*addresses*/) {
        return kNotSupported;
    }

  protected:
    EthernetDetails() = default;
    EthernetDetails(EthernetDetails const&) = default;
    EthernetDetails& operator=(EthernetDetails const&) = default;
    ~EthernetDetails() = default;
};

} // namespace KVL
