// SPDX-License-Identifier: BSD-2-Clause
// Carries out the steps of a master's SETs.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "agent/fronts/PendingChange.h"
#include "agent/fronts/agentx/AgentxPdu.h"
#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// `AgentxSets` are the SETs that a master has begun and not yet ended. The master tests a SET,
/// commits it, undoes it if another subagent fails, and cleans it up. It may send the variables of
/// one SET in several packets; they belong together by their transaction. Unsynchronised.
class AgentxSets {
  public:
    /// As `ObjectTree::test`, with an absolute name.
    using Test =
        std::function<SetFault(OidView name, Value const& asked, std::optional<Change>& change)>;

    /// `settings` outlives the sets.
    explicit AgentxSets(Settings& settings) : m_settings(settings) {}

    /// Carries out one of the four steps. Returns the response, empty if the step has none. Throws
    /// AgentxError when the request is malformed.
    std::string answer(AgentxHeader const& header, AgentxReader reader, Test const& test);

  private:
    /// The session and the transaction.
    using Key = std::pair<std::uint32_t, std::uint32_t>;
    /// If a master never cleans up, the SET of the lowest transaction is forgotten.
    static constexpr std::size_t kMost = 64;
    /// The most changes of one SET; no SNMP message has room for more.
    static constexpr std::size_t kMostChanges = 4096;

    std::string testSet(AgentxHeader const& header, AgentxReader reader, Test const& test);
    std::string commitSet(AgentxHeader const& header);
    void undo(AgentxHeader const& header);

    Settings& m_settings;
    std::map<Key, std::vector<PendingChange>> m_sets;
};

} // namespace kvloamd
