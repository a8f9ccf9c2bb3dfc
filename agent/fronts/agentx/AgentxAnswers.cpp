// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxAnswers.h"

#include <algorithm>
#include <utility>

namespace kvloamd {

namespace {

/// The response to a GetBulk ends at this size; the master then asks for the rest.
constexpr std::size_t kLongAnswer = std::size_t{32} * 1024;
/// No request of a master needs a longer response.
constexpr std::size_t kLongestAnswer = std::size_t{1024} * 1024;

} // namespace

AgentxAnswers::AgentxAnswers(std::vector<ServedTree> const& trees, Counters const& counters,
                             TakeSnapshot takeSnapshot, Settings& settings)
    : m_counters(counters), m_takeSnapshot(std::move(takeSnapshot)), m_settings(settings) {
    for (ServedTree const& served : trees)
        m_trees.push_back({served.arc, &served.tree});
    std::ranges::sort(m_trees, {}, &Tree::arc);
}

std::string AgentxAnswers::answer(AgentxHeader const& header, std::string_view payload) {
    // All names are registered in the default context.
    if (header.hasContext && header.kind != AgentxKind::CleanupSet)
        return agentxResponse(header, AgentxFault::UnsupportedContext);
    AgentxReader const reader(payload, header.networkOrder);
    switch (header.kind) {
    case AgentxKind::Get:
        return get(header, reader);
    case AgentxKind::GetNext:
        return getNext(header, reader);
    case AgentxKind::GetBulk:
        return getBulk(header, reader);
    case AgentxKind::TestSet:
    case AgentxKind::CommitSet:
    case AgentxKind::UndoSet:
    case AgentxKind::CleanupSet:
        return set(header, reader);
    default:
        return agentxResponse(header, AgentxFault::RequestDenied);
    }
}

AgentxAnswers::Range AgentxAnswers::readRange(AgentxReader& reader) {
    AgentxName start = reader.name();
    return {std::move(start), reader.name().name};
}

ObjectTree const* AgentxAnswers::treeOf(OidView& name) const {
    for (Tree const& each : m_trees) {
        if (!startsWith(name, each.arc)) continue;
        name = name.subspan(each.arc.size());
        return each.tree;
    }
    return nullptr;
}

Lookup AgentxAnswers::find(Facts const& facts, OidView name, Instance& found) const {
    ObjectTree const* const tree = treeOf(name);
    return tree == nullptr ? Lookup::NoSuchObject : tree->find(facts, name, found);
}

bool AgentxAnswers::next(Facts const& facts, AgentxName const& start, Instance& found) const {
    OidView const name = start.name;
    for (Tree const& each : m_trees) {
        bool const within = startsWith(name, each.arc);
        if (!within && std::is_gt(compare(name, each.arc))) continue;
        OidView const after = within ? name.subspan(each.arc.size()) : OidView{};
        if (!each.tree->next(facts, after, !within || start.include, found)) continue;
        found.name.insert(found.name.begin(), each.arc.begin(), each.arc.end());
        return true;
    }
    return false;
}

std::string AgentxAnswers::set(AgentxHeader const& header, AgentxReader reader) {
    // Only the test step needs a snapshot.
    std::shared_ptr<Snapshot const> snapshot;
    return m_sets.answer(
        header, reader, [&](OidView name, Value const& asked, std::optional<Change>& change) {
            ObjectTree const* const tree = treeOf(name);
            if (tree == nullptr) return SetFault::NotWritable;
            if (!snapshot) snapshot = m_takeSnapshot();
            return tree->test({*snapshot, m_counters, &m_settings}, name, asked, change);
        });
}

std::string AgentxAnswers::get(AgentxHeader const& header, AgentxReader reader) const {
    auto const snapshot = m_takeSnapshot();
    Facts const facts{*snapshot, m_counters, &m_settings};
    AgentxWriter response = beginAgentxResponse(header);
    while (!reader.atEnd()) {
        if (response.size() > kLongestAnswer)
            return agentxResponse(header, AgentxFault::ProcessingError);
        Oid const name = readRange(reader).start.name;
        Instance instance;
        switch (find(facts, name, instance)) {
        case Lookup::Found:
            response.variable(name, instance.type, instance.value);
            break;
        case Lookup::NoSuchObject:
            response.noSuchObject(name);
            break;
        case Lookup::NoSuchInstance:
            response.noSuchInstance(name);
            break;
        }
    }
    return response.take();
}

void AgentxAnswers::writeNext(AgentxWriter& response, Facts const& facts, Range& range) const {
    Instance instance;
    if (next(facts, range.start, instance) &&
        (range.end.empty() || std::is_lt(compare(instance.name, range.end)))) {
        response.variable(instance.name, instance.type, instance.value);
        range.start = {std::move(instance.name), false};
        return;
    }
    response.endOfView(range.start.name);
}

std::string AgentxAnswers::getNext(AgentxHeader const& header, AgentxReader reader) const {
    auto const snapshot = m_takeSnapshot();
    Facts const facts{*snapshot, m_counters, &m_settings};
    AgentxWriter response = beginAgentxResponse(header);
    while (!reader.atEnd()) {
        if (response.size() > kLongestAnswer)
            return agentxResponse(header, AgentxFault::ProcessingError);
        Range range = readRange(reader);
        writeNext(response, facts, range);
    }
    return response.take();
}

std::string AgentxAnswers::getBulk(AgentxHeader const& header, AgentxReader reader) const {
    std::size_t single = reader.number16();
    std::size_t const rounds = reader.number16();
    auto const snapshot = m_takeSnapshot();
    Facts const facts{*snapshot, m_counters, &m_settings};
    AgentxWriter response = beginAgentxResponse(header);
    std::vector<Range> repeated;
    while (!reader.atEnd()) {
        if (response.size() > kLongestAnswer)
            return agentxResponse(header, AgentxFault::ProcessingError);
        Range range = readRange(reader);
        if (single > 0) {
            --single;
            writeNext(response, facts, range);
        } else {
            repeated.push_back(std::move(range));
        }
    }
    for (std::size_t round = 0; round < rounds && !repeated.empty(); ++round) {
        for (Range& range : repeated) {
            if (response.size() > kLongestAnswer)
                return agentxResponse(header, AgentxFault::ProcessingError);
            writeNext(response, facts, range);
        }
        if (response.size() > kLongAnswer) break;
    }
    return response.take();
}

} // namespace kvloamd
