// SPDX-License-Identifier: BSD-2-Clause
// Answers a master's requests from the served trees and a snapshot.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "agent/fronts/agentx/AgentxPdu.h"
#include "agent/fronts/agentx/AgentxSets.h"
#include "agent/objects/ServedTree.h"

namespace kvloamd {

/// Knows nothing of access: the master asks only for what its client may see and set. Used on one
/// thread only.
class AgentxAnswers {
  public:
    using TakeSnapshot = std::function<std::shared_ptr<Snapshot const>()>;

    /// The trees, `counters` and `settings` outlive the answers.
    AgentxAnswers(std::vector<ServedTree> const& trees, Counters const& counters,
                  TakeSnapshot takeSnapshot, Settings& settings);

    /// The response to a request; empty when there is none to give. Throws AgentxError when the
    /// request can not be read. All of one response comes from one snapshot.
    std::string answer(AgentxHeader const& header, std::string_view payload);

  private:
    struct Range {
        AgentxName start;
        Oid end; ///< exclusive; empty: no end
    };

    struct Tree {
        Oid arc;
        ObjectTree const* tree;
    };

    static Range readRange(AgentxReader& reader);
    /// `ObjectTree`'s, of absolute names.
    Lookup find(Facts const& facts, OidView name, Instance& found) const;
    bool next(Facts const& facts, AgentxName const& start, Instance& found) const;
    /// The tree that a name is in, and the rest of it; null when it is in none.
    ObjectTree const* treeOf(OidView& name) const;
    std::string set(AgentxHeader const& header, AgentxReader reader);
    std::string get(AgentxHeader const& header, AgentxReader reader) const;
    std::string getNext(AgentxHeader const& header, AgentxReader reader) const;
    std::string getBulk(AgentxHeader const& header, AgentxReader reader) const;
    /// Writes the first instance in the range, or its end. Moves the range's start to it.
    void writeNext(AgentxWriter& response, Facts const& facts, Range& range) const;

    std::vector<Tree> m_trees; ///< ascending
    Counters const& m_counters;
    TakeSnapshot m_takeSnapshot;
    Settings& m_settings;
    AgentxSets m_sets{m_settings};
};

} // namespace kvloamd
