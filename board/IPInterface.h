// SPDX-License-Identifier: BSD-2-Clause
// The abstract IP interface and its addresses.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "board/Interface.h"
#include "core/ReferenceCounter.h"

namespace KVL {

/// An `IPAddress` is an IPv4 address: four octets, the most significant first. Unsynchronised.
class KVLOAM_API IPAddress {
  public:
    /// The octets of `address` from its most significant byte down.
    IPAddress(int address);
    /// Dotted decimal; the text is only read. A missing octet is 0. Deliberate: octets are taken as
    /// they are written (300 stays 300), and anything after the fourth is ignored.
    IPAddress(char* text);
    IPAddress& operator=(int address);
    IPAddress& operator=(char* text);

    /// By octets, from the first.
    bool operator<(IPAddress const& other) const { return m_octets < other.m_octets; }
    bool operator==(IPAddress const& other) const = default;

    /// `i` from 0, the most significant, to 3.
    std::uint32_t octet(int i) const { return m_octets[static_cast<std::size_t>(i)]; }

  private:
    void parse(char const* text);

    std::array<std::uint32_t, 4> m_octets{};
};

/// An `IPAddressConfig` is an address with its mask and broadcast address. It never changes, so it
/// is thread-safe.
class KVLOAM_API IPAddressConfig : public Object {
  public:
    /// All three addresses are 0.0.0.0.
    IPAddressConfig();
    IPAddressConfig(int address, int mask, int broadcast);
    /// The address in dotted decimal; the mask and the broadcast address are 0.0.0.0.
    IPAddressConfig(char* text);
    ~IPAddressConfig() override;

    IPAddress GetAddress() const { return m_address; }
    IPAddress GetMask() const { return m_mask; }
    IPAddress GetBroadcast() const { return m_broadcast; }

  private:
    IPAddress m_address;
    IPAddress m_mask;
    IPAddress m_broadcast;
};

/// An `IPInterface` is an IP interface: the interface queries and its address configurations.
class KVLOAM_API IPInterface : public Interface {
  public:
    IPInterface();
    ~IPInterface() override;

    /// The first configuration, and the one after `previous` or an empty handle. Concrete
    /// interfaces override both. Here the only configuration is 127.1.1.1, created anew by every
    /// call.
    virtual ReferenceCounter<IPAddressConfig> GetFirstIPAddressConfig();
    virtual ReferenceCounter<IPAddressConfig>
    GetNextIPAddressConfig(ReferenceCounter<IPAddressConfig> previous);

    static IID iid() { return IID("N3KVL11IPInterfaceE"); }
};

} // namespace KVL
