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

/// `AgentxAnswers` are the agent's responses to a master. They check no access rights: the master
/// asks only for what its client may see and set. Unsynchronised.
class AgentxAnswers {
  public:
    using TakeSnapshot = std::function<std::shared_ptr<Snapshot const>()>;

    /// The trees, `counters` and `settings` outlive the answers.
    AgentxAnswers(std::vector<ServedTree> const& trees, Counters const& counters,
                  TakeSnapshot takeSnapshot, Settings& settings);

    /// Returns the response to a request, empty if the request has none. Throws AgentxError when
    /// the request is malformed. All values of one response come from one snapshot.
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
    /// As `ObjectTree::find` and `next`, with absolute names.
    Lookup find(Facts const& facts, OidView name, Instance& found) const;
    bool next(Facts const& facts, AgentxName const& start, Instance& found) const;
    /// The tree that contains `name`, which becomes relative to the tree's arc; null if none does.
    ObjectTree const* treeOf(OidView& name) const;
    std::string set(AgentxHeader const& header, AgentxReader reader);
    std::string get(AgentxHeader const& header, AgentxReader reader) const;
    std::string getNext(AgentxHeader const& header, AgentxReader reader) const;
    std::string getBulk(AgentxHeader const& header, AgentxReader reader) const;
    /// Writes the first instance of the range and moves the range's start to it, or writes
    /// endOfMibView.
    void writeNext(AgentxWriter& response, Facts const& facts, Range& range) const;

    std::vector<Tree> m_trees; ///< ascending
    Counters const& m_counters;
    TakeSnapshot m_takeSnapshot;
    Settings& m_settings;
    AgentxSets m_sets{m_settings};
};

} // namespace kvloamd
