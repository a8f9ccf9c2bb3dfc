// SPDX-License-Identifier: BSD-2-Clause
// What operators have configured about alarms.
#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "agent/alarms/AlarmKinds.h"

namespace kvloamd {

/// How the alarms of one kind are treated.
struct AlarmPolicy {
    AlarmSeverity severity = AlarmSeverity::Indeterminate;
    std::chrono::seconds raiseHold{0};
    std::chrono::seconds clearHold{0};
    bool enabled = true; ///< false: such alarms are never raised, only counted

    bool operator==(AlarmPolicy const&) const = default;
};

/// An `AlarmPolicies` gives the policy of each kind: the kind's default, unless it is configured.
/// One fault value of the platform may have a policy of its own. Unsynchronised.
class AlarmPolicies {
  public:
    /// A longer hold time would hide what happens.
    static constexpr std::chrono::seconds kLongestHold{3600};

    /// Reads one entry of the configuration: "dsx1LossOfSignal=major,raise=2,clear=10",
    /// "platformFault.17=critical" or "linkDown=off". Returns a message if it is wrong, and then
    /// changes nothing; empty if it is right.
    std::string configure(std::string_view entry);

    /// `number`: of an alarm of the kind; the fault value of a platform fault.
    AlarmPolicy of(AlarmKind kind, std::uint32_t number) const;

    bool operator==(AlarmPolicies const&) const = default;

  private:
    /// Without a number: of the whole kind.
    std::map<std::pair<AlarmKind, std::optional<std::uint32_t>>, AlarmPolicy> m_configured;
};

} // namespace kvloamd
