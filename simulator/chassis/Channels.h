// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a trunk: its bearer channels and its signalling channel.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

#include "boardplatform/isdn_channels.h"

namespace kvlsim {

inline constexpr std::int32_t kMaxBearers = 31;
inline constexpr std::int32_t kMaxT1Bearers = 24;

/// The states' names as descriptions and commands write them, from state 1 on.
inline constexpr std::array<std::string_view, 4> kBearerStateNames = {"idle", "connecting",
                                                                      "connected", "active"};
inline constexpr std::array<std::string_view, 3> kSignallingStateNames = {"inactive", "l1", "l2"};

/// What a call carries, as commands write it, in the numbers of isdnBearerInfoType from 1 on.
inline constexpr std::array<std::string_view, 9> kInformationNames = {
    "unknown",  "speech",  "digital", "digital-56",     "restricted-digital",
    "audio-31", "audio-7", "video",   "packet-switched"};

/// `CallTerms` say who calls whom, and for what.
struct CallTerms {
    bool incoming = false;
    std::string peer;           ///< at most 31 bytes
    std::string peerSubAddress; ///< at most 23 bytes
    std::int32_t information = 2;
    bool multirate = false;
};

inline std::string_view nameOf(ISDNBearerState state) {
    return kBearerStateNames[static_cast<std::size_t>(state) - 1];
}
inline std::string_view nameOf(ISDNSignallingState state) {
    return kSignallingStateNames[static_cast<std::size_t>(state) - 1];
}

/// `Channels` are the ISDN channels of one trunk, numbered from 1. Unsynchronised: the platform
/// guards them with its lock.
class Channels {
  public:
    /// All bearer channels are idle. Requires: 1 to kMaxBearers of them.
    Channels(std::int32_t bearers, ISDNSignallingState signalling)
        : m_states(static_cast<std::size_t>(bearers), static_cast<char>(ISDNBearerState::idle)),
          m_calls(static_cast<std::size_t>(bearers), kNoCall),
          m_signalling(signalling) {}

    std::int32_t bearers() const { return static_cast<std::int32_t>(m_states.size()); }
    /// One byte per channel, as the platform answers them.
    std::string_view states() const { return m_states; }
    ISDNBearerState state(std::int32_t channel) const {
        return static_cast<ISDNBearerState>(m_states[static_cast<std::size_t>(channel - 1)]);
    }
    /// `now`: seconds since the epoch.
    void setState(std::int32_t channel, ISDNBearerState state, std::uint32_t now);
    /// The terms of the call that is set up next on `channel`.
    void setTerms(std::int32_t channel, CallTerms const& terms);
    /// Charges the call of a channel with more units.
    void charge(std::int32_t channel, std::uint32_t units);
    std::span<ISDNCallRecord const> calls() const { return m_calls; }
    ISDNSignallingCounters const& counters() const { return m_counters; }
    std::optional<std::int32_t> firstIdle() const {
        auto const found = m_states.find(static_cast<char>(ISDNBearerState::idle));
        if (found == std::string::npos) return std::nullopt;
        return static_cast<std::int32_t>(found) + 1;
    }

    ISDNSignallingState signalling() const { return m_signalling; }
    /// The peer establishes the data link that becomes active.
    void setSignalling(ISDNSignallingState state) {
        if (state == ISDNSignallingState::layer2Active && state != m_signalling)
            ++m_counters.peerSabme;
        m_signalling = state;
    }

  private:
    static constexpr ISDNCallRecord kNoCall{{}, {}, 1, 1, 0, 0, 0, 0};

    std::string m_states;
    std::vector<ISDNCallRecord> m_calls;
    ISDNSignallingCounters m_counters{};
    ISDNSignallingState m_signalling;
};

} // namespace kvlsim
