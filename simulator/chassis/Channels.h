// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a trunk: its bearer channels and its signalling channel.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "boardplatform/isdn_channels.h"

namespace kvlsim {

inline constexpr std::int32_t kMaxBearers = 31;
inline constexpr std::int32_t kMaxT1Bearers = 24;

/// The states' names as descriptions and commands write them, from state 1 on.
inline constexpr std::array<std::string_view, 4> kBearerStateNames = {"idle", "connecting",
                                                                      "connected", "active"};
inline constexpr std::array<std::string_view, 3> kSignallingStateNames = {"inactive", "l1", "l2"};

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
          m_signalling(signalling) {}

    std::int32_t bearers() const { return static_cast<std::int32_t>(m_states.size()); }
    /// One byte per channel, as the platform answers them.
    std::string_view states() const { return m_states; }
    ISDNBearerState state(std::int32_t channel) const {
        return static_cast<ISDNBearerState>(m_states[static_cast<std::size_t>(channel - 1)]);
    }
    void setState(std::int32_t channel, ISDNBearerState state) {
        m_states[static_cast<std::size_t>(channel - 1)] = static_cast<char>(state);
    }
    std::optional<std::int32_t> firstIdle() const {
        auto const found = m_states.find(static_cast<char>(ISDNBearerState::idle));
        if (found == std::string::npos) return std::nullopt;
        return static_cast<std::int32_t>(found) + 1;
    }

    ISDNSignallingState signalling() const { return m_signalling; }
    void setSignalling(ISDNSignallingState state) { m_signalling = state; }

  private:
    std::string m_states;
    ISDNSignallingState m_signalling;
};

} // namespace kvlsim
