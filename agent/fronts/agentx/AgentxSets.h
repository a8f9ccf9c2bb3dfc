// SPDX-License-Identifier: BSD-2-Clause
// Takes a master's SETs through their steps.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "agent/fronts/agentx/AgentxPdu.h"
#include "agent/objects/ObjectTree.h"

namespace kvloamd {

/// A SET is tested, committed or undone, and cleaned up, all of its variables or none. A master may
/// send the variables of one in several packets: they are one SET all the same. Used on one thread
/// only.
class AgentxSets {
  public:
    /// Whether an instance, absolute, can be set; as `ObjectTree::test`.
    using Test = std::function<SetFault(OidView name, std::optional<std::int64_t> integer,
                                        std::optional<Change>& change)>;

    /// `settings` outlives the sets.
    explicit AgentxSets(Settings& settings) : m_settings(settings) {}

    /// The response to one of the four steps; empty when there is none to give. Throws AgentxError
    /// when the request can not be read.
    std::string answer(AgentxHeader const& header, AgentxReader reader, Test const& test);

  private:
    struct Held {
        Change change;
        bool made;
        std::optional<int> former;
    };
    /// The session and the transaction.
    using Key = std::pair<std::uint32_t, std::uint32_t>;
    /// A master that never cleans up is forgotten from its first SET on.
    static constexpr std::size_t kMost = 64;

    std::string testSet(AgentxHeader const& header, AgentxReader reader, Test const& test);
    std::string commitSet(AgentxHeader const& header);
    void undo(AgentxHeader const& header);

    Settings& m_settings;
    std::map<Key, std::vector<Held>> m_sets;
};

} // namespace kvloamd
