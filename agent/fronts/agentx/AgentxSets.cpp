// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxSets.h"

#include <algorithm>
#include <iterator>

namespace kvloamd {

namespace {

AgentxFault faultOf(SetFault fault) {
    switch (fault) {
    case SetFault::None:
        return AgentxFault::None;
    case SetFault::NotWritable:
        return AgentxFault::NotWritable;
    case SetFault::WrongType:
        return AgentxFault::WrongType;
    case SetFault::WrongValue:
        return AgentxFault::WrongValue;
    case SetFault::NoCreation:
        return AgentxFault::NoCreation;
    }
    return AgentxFault::NotWritable;
}

} // namespace

std::string AgentxSets::answer(AgentxHeader const& header, AgentxReader reader, Test const& test) {
    // What a former session has left open will never be ended.
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
    std::vector<Held> tested;
    for (std::uint16_t variable = 1; !reader.atEnd(); ++variable) {
        AgentxVariable const asked = reader.variable();
        std::optional<Change> change;
        SetFault const fault = test(asked.name, asked.integer, change);
        if (fault != SetFault::None || !change)
            return agentxResponse(header, faultOf(fault), variable);
        tested.push_back({*change, false, std::nullopt});
    }
    if (m_sets.size() >= kMost) m_sets.erase(m_sets.begin());
    auto& held = m_sets[{header.session, header.transaction}];
    held.insert(held.end(), tested.begin(), tested.end());
    return agentxResponse(header, AgentxFault::None);
}

std::string AgentxSets::commitSet(AgentxHeader const& header) {
    auto const set = m_sets.find({header.session, header.transaction});
    if (set == m_sets.end()) return agentxResponse(header, AgentxFault::CommitFailed, 1);
    for (Held& held : set->second) {
        if (held.made) continue;
        held.former = m_settings.exchange(held.change.key, held.change.value);
        held.made = true;
    }
    return agentxResponse(header, AgentxFault::None);
}

/// The last first: one instance may be set twice.
void AgentxSets::undo(AgentxHeader const& header) {
    auto const set = m_sets.find({header.session, header.transaction});
    if (set == m_sets.end()) return;
    std::for_each(set->second.rbegin(), set->second.rend(), [this](Held const& held) {
        if (held.made) m_settings.exchange(held.change.key, held.former);
    });
    m_sets.erase(set);
}

} // namespace kvloamd
