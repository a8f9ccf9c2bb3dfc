// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/metrics/MetricRows.h"

#include <algorithm>
#include <string_view>
#include <unordered_set>

#include "agent/fronts/metrics/MetricText.h"

namespace kvloamd {

MetricRows::MetricRows(Snapshot const& snapshot, bool channels)
    : m_snapshot(snapshot), m_channels(channels) {
    m_boards.resize(snapshot.boards.size());
    std::unordered_set<std::string> seen;
    for (std::size_t row = 0; row < m_boards.size(); ++row) {
        BoardRow const& board = snapshot.boards[row];
        std::string name = board.serialNumber;
        if (name.empty() || !seen.insert(name).second)
            name += "#" + std::to_string(board.boardIndex);
        MetricText::label(m_boards[row], "board", name);
    }
}

void MetricRows::distinguish(std::vector<std::string>& labels) {
    std::unordered_set<std::string_view> seen;
    seen.reserve(labels.size());
    for (std::size_t row = 0; row < labels.size(); ++row) {
        if (labels[row].empty() || seen.insert(labels[row]).second) continue;
        MetricText::label(labels[row], "copy", std::to_string(row + 1));
    }
}

std::string const* MetricRows::boardOf(std::uint32_t boardIndex) const {
    auto const found =
        std::ranges::lower_bound(m_snapshot.boards, boardIndex, {}, &BoardRow::boardIndex);
    if (found == m_snapshot.boards.end() || found->boardIndex != boardIndex) return nullptr;
    return &m_boards[static_cast<std::size_t>(found - m_snapshot.boards.begin())];
}

std::string MetricRows::interfaceLabels(std::uint32_t ifIndex, MetricLabels kind) const {
    auto const& all = m_snapshot.interfaces.interfaces;
    auto const found = std::ranges::lower_bound(all, ifIndex, {}, &InterfaceRow::ifIndex);
    if (found == all.end() || found->ifIndex != ifIndex) return {};
    if (found->type == kTypeDs0 && !m_channels) return {};
    std::string const* const board = boardOf(found->boardIndex);
    if (board == nullptr) return {};
    std::string labels = *board;
    MetricText::label(labels,
                      kind == MetricLabels::Line      ? "line"
                      : kind == MetricLabels::Channel ? "channel"
                                                      : "interface",
                      found->name.empty() ? std::to_string(ifIndex) : found->name);
    return labels;
}

std::string MetricRows::rowLabels(MetricLabels kind, Snapshot const& snapshot, std::size_t row,
                                  OidView index) const {
    std::string labels;
    switch (kind) {
    case MetricLabels::Board:
        return m_boards[row];
    case MetricLabels::Line:
    case MetricLabels::Interface:
    case MetricLabels::Channel:
        return interfaceLabels(index[0], kind);
    case MetricLabels::Process:
        MetricText::label(labels, "process", snapshot.processes[row].name);
        MetricText::label(labels, "pid", std::to_string(index[0]));
        break;
    case MetricLabels::Module:
        MetricText::label(labels, "module", snapshot.modules[row].name);
        break;
    case MetricLabels::Service:
        MetricText::label(labels, "service", snapshot.services[row].name);
        break;
    case MetricLabels::Fault:
        if (index[0] != 0) {
            std::string const* const board = boardOf(index[0]);
            if (board == nullptr) return {};
            labels = *board;
        }
        MetricText::label(labels, "fault", std::to_string(index[1]));
        break;
    case MetricLabels::None:
        break;
    }
    return labels;
}

std::vector<std::string> MetricRows::labels(MetricGroup const& group, Facts const& facts) const {
    std::vector<std::string> labels(group.table->rowCount(facts));
    Oid index;
    for (std::size_t row = 0; row < labels.size(); ++row) {
        index.clear();
        group.table->appendIndex(facts, row, index);
        labels[row] = rowLabels(group.labels, m_snapshot, row, index);
    }
    distinguish(labels);
    return labels;
}

} // namespace kvloamd
