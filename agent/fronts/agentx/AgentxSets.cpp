// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxSets.h"

#include <algorithm>
#include <iterator>

namespace kvloamd {

std::string AgentxSets::answer(AgentxHeader const& header, AgentxReader reader, Test const& test) {
    // A former session's SETs will never be ended.
    std::erase_if(m_sets, [&](auto const& set) { return set.first.first != header.session; });
    switch (header.kind) {
    case AgentxKind::TestSet:
        return testSet(header, reader, test);
    case AgentxKind::CommitSet:
        return commitSet(header);
    case AgentxKind::UndoSet:
        undo(header);
        return agentxResponse(header, AgentxFault::None);
    case AgentxKind::CleanupSet:
        m_sets.erase({header.session, header.transaction});
        return {};
    default:
        return agentxResponse(header, AgentxFault::RequestDenied);
    }
}

std::string AgentxSets::testSet(AgentxHeader const& header, AgentxReader reader, Test const& test) {
    std::vector<PendingChange> tested;
    for (std::uint16_t variable = 1; !reader.atEnd(); ++variable) {
        AgentxVariable const asked = reader.variable();
        std::optional<Change> change;
        SetFault const fault = test(asked.name, asked.value, change);
        if (fault != SetFault::None || !change)
            return agentxResponse(header, static_cast<AgentxFault>(errorStatusOf(fault)), variable);
        tested.emplace_back(*std::move(change));
    }
    if (m_sets.size() >= kMost) m_sets.erase(m_sets.begin());
    auto& held = m_sets[{header.session, header.transaction}];
    if (held.size() + tested.size() > kMostChanges)
        return agentxResponse(header, AgentxFault::ResourceUnavailable);
    held.insert(held.end(), std::make_move_iterator(tested.begin()),
                std::make_move_iterator(tested.end()));
    return agentxResponse(header, AgentxFault::None);
}

std::string AgentxSets::commitSet(AgentxHeader const& header) {
    auto const set = m_sets.find({header.session, header.transaction});
    if (set == m_sets.end()) return agentxResponse(header, AgentxFault::CommitFailed, 1);
    for (PendingChange& change : set->second)
        change.commit(m_settings);
    return agentxResponse(header, AgentxFault::None);
}

void AgentxSets::undo(AgentxHeader const& header) {
    auto const set = m_sets.find({header.session, header.transaction});
    if (set == m_sets.end()) return;
    std::for_each(set->second.rbegin(), set->second.rend(),
                  [this](PendingChange& change) { change.undo(m_settings); });
    m_sets.erase(set);
}

} // namespace kvloamd
