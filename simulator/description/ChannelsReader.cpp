// SPDX-License-Identifier: BSD-2-Clause
// Reads the ISDN channels of a device from their description.
#include <algorithm>
#include <array>

#include "simulator/chassis/Channels.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChannelsReader.h"
#include "simulator/description/Description.h"
#include "simulator/description/DescriptionChecks.h"

namespace kvlsim {

namespace {

constexpr std::array<std::string_view, 2> kChannelsKeys = {"bearers", "signalling"};

} // namespace

ISDNSignallingState signallingStateNamed(Description const& name) {
    auto const* const found = name.isScalar()
                                  ? std::ranges::find(kSignallingStateNames, name.scalar)
                                  : kSignallingStateNames.end();
    if (found == kSignallingStateNames.end())
        throw ChassisError(name.line,
                           "signalling cannot be " + name.words() + "; choose inactive, l1 or l2");
    return static_cast<ISDNSignallingState>(found - kSignallingStateNames.begin() + 1);
}

Channels readChannels(Description const& channels, std::string const& of) {
    std::string const what = "the part channels of " + of;
    requireMap(channels, what, "bearers:");
    refuseUnknownKeys(channels, what, kChannelsKeys);
    Description const* const bearers = channels.find("bearers");
    if (bearers == nullptr)
        throw ChassisError(channels.line, what + " has no bearers; give it \"bearers:\", 1 to " +
                                              std::to_string(kMaxBearers));
    auto const number = bearers->integer();
    if (!number || *number < 1 || *number > kMaxBearers)
        throw ChassisError(bearers->line, "bearers cannot be " + bearers->words() +
                                              "; write a whole number from 1 to " +
                                              std::to_string(kMaxBearers));
    Description const* const signalling = channels.find("signalling");
    return {static_cast<std::int32_t>(*number), signalling == nullptr
                                                    ? ISDNSignallingState::layer2Active
                                                    : signallingStateNamed(*signalling)};
}

} // namespace kvlsim
