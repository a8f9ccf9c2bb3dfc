// SPDX-License-Identifier: BSD-2-Clause
// Answers a master's requests from an object tree and a snapshot.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "agent/AgentxPdu.h"

namespace kvloamd {

/// Knows nothing of access: the master asks only for what its client may see. May be called from
/// any thread.
class AgentxAnswers {
  public:
    using TakeSnapshot = std::function<std::shared_ptr<Snapshot const>()>;

    /// `tree` and `counters` outlive the answers. `enterprise` is the arc above all names.
    AgentxAnswers(ObjectTree const& tree, Counters const& counters, Oid enterprise,
                  TakeSnapshot takeSnapshot);

    /// The response to a request; empty when there is none to give. Throws AgentxError when the
    /// request can not be read. All of one response comes from one snapshot.
    std::string answer(AgentxHeader const& header, std::string_view payload) const;

  private:
    struct Range {
        AgentxName start;
        Oid end; ///< exclusive; empty: no end
    };

    static Range readRange(AgentxReader& reader);
    Oid relative(OidView name, bool& orEqual) const;
    std::string get(AgentxHeader const& header, AgentxReader reader) const;
    std::string getNext(AgentxHeader const& header, AgentxReader reader) const;
    std::string getBulk(AgentxHeader const& header, AgentxReader reader) const;
    /// Writes the first instance in the range, or its end. Moves the range's start to it.
    void writeNext(AgentxWriter& response, Facts const& facts, Range& range) const;

    ObjectTree const& m_tree;
    Counters const& m_counters;
    Oid m_enterprise;
    TakeSnapshot m_takeSnapshot;
};

} // namespace kvloamd
