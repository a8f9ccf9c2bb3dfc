// SPDX-License-Identifier: BSD-2-Clause
#include "agent/AgentxAnswers.h"

#include <limits>
#include <utility>
#include <vector>

namespace kvloamd {

namespace {

/// A longer answer to one request is cut; the master asks for the rest.
constexpr std::size_t kLongAnswer = 32 * 1024;

} // namespace

AgentxAnswers::AgentxAnswers(ObjectTree const& tree, Counters const& counters, Oid enterprise,
                             TakeSnapshot takeSnapshot)
    : m_tree(tree),
      m_counters(counters),
      m_enterprise(std::move(enterprise)),
      m_takeSnapshot(std::move(takeSnapshot)) {}

std::string AgentxAnswers::answer(AgentxHeader const& header, std::string_view payload) const {
    // All names are registered without a context.
    if (header.hasContext) return agentxResponse(header, AgentxFault::UnsupportedContext);
    AgentxReader const reader(payload, header.networkOrder);
    switch (header.kind) {
    case AgentxKind::Get:
        return get(header, reader);
    case AgentxKind::GetNext:
        return getNext(header, reader);
    case AgentxKind::GetBulk:
        return getBulk(header, reader);
    case AgentxKind::TestSet:
        return agentxResponse(header, AgentxFault::NotWritable, 1);
    case AgentxKind::CommitSet:
        return agentxResponse(header, AgentxFault::CommitFailed, 1);
    case AgentxKind::UndoSet:
        return agentxResponse(header, AgentxFault::UndoFailed, 1);
    case AgentxKind::CleanupSet:
        return {};
    default:
        return agentxResponse(header, AgentxFault::RequestDenied);
    }
}

AgentxAnswers::Range AgentxAnswers::readRange(AgentxReader& reader) {
    AgentxName start = reader.name();
    return {std::move(start), reader.name().name};
}

/// The part of a name below the enterprise arc. A name outside of the arc reads as one before or
/// after all of ours.
Oid AgentxAnswers::relative(OidView name, bool& orEqual) const {
    if (startsWith(name, m_enterprise)) {
        OidView const rest = name.subspan(m_enterprise.size());
        return {rest.begin(), rest.end()};
    }
    orEqual = true;
    return std::is_lt(compare(name, m_enterprise)) ? Oid{}
                                                   : Oid{std::numeric_limits<std::uint32_t>::max()};
}

std::string AgentxAnswers::get(AgentxHeader const& header, AgentxReader reader) const {
    auto const snapshot = m_takeSnapshot();
    Facts const facts{*snapshot, m_counters};
    AgentxWriter response = beginAgentxResponse(header);
    while (!reader.atEnd()) {
        Oid const name = readRange(reader).start.name;
        bool orEqual = false;
        Instance instance;
        switch (m_tree.find(facts, relative(name, orEqual), instance)) {
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
    bool orEqual = range.start.include;
    Oid const after = relative(range.start.name, orEqual);
    Instance instance;
    if (m_tree.next(facts, after, orEqual, instance)) {
        Oid name = m_enterprise;
        name.insert(name.end(), instance.name.begin(), instance.name.end());
        if (range.end.empty() || std::is_lt(compare(name, range.end))) {
            response.variable(name, instance.type, instance.value);
            range.start = {std::move(name), false};
            return;
        }
    }
    response.endOfView(range.start.name);
}

std::string AgentxAnswers::getNext(AgentxHeader const& header, AgentxReader reader) const {
    auto const snapshot = m_takeSnapshot();
    Facts const facts{*snapshot, m_counters};
    AgentxWriter response = beginAgentxResponse(header);
    while (!reader.atEnd()) {
        Range range = readRange(reader);
        writeNext(response, facts, range);
    }
    return response.take();
}

std::string AgentxAnswers::getBulk(AgentxHeader const& header, AgentxReader reader) const {
    std::size_t single = reader.number16();
    std::size_t const rounds = reader.number16();
    auto const snapshot = m_takeSnapshot();
    Facts const facts{*snapshot, m_counters};
    AgentxWriter response = beginAgentxResponse(header);
    std::vector<Range> repeated;
    while (!reader.atEnd()) {
        Range range = readRange(reader);
        if (single > 0) {
            --single;
            writeNext(response, facts, range);
        } else {
            repeated.push_back(std::move(range));
        }
    }
    for (std::size_t round = 0; round < rounds && !repeated.empty(); ++round) {
        for (Range& range : repeated)
            writeNext(response, facts, range);
        if (response.size() > kLongAnswer) break;
    }
    return response.take();
}

} // namespace kvloamd
