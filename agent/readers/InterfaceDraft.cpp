// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceDraft.h"

#include <algorithm>
#include <iterator>

#include "board/ISDNChannelOnLine.h"

namespace kvloamd {

namespace {

/// The values of dsx1LineType that are E1 lines.
constexpr int kTypesOfE1[] = {4, 5, 6, 7, 9, 12, 13};

} // namespace

InterfaceRow& InterfaceDraft::enter(IndexKind kind, std::string const& name) {
    IndexKey key{kind, name};
    for (int copy = 2; !m_taken.insert(key).second; ++copy)
        key.name = name + "#" + std::to_string(copy);
    m_found.keys.push_back(std::move(key));
    InterfaceRow& row = m_found.rows.interfaces.emplace_back();
    row.ifIndex = static_cast<std::uint32_t>(m_found.keys.size());
    return row;
}

InterfaceRow& InterfaceDraft::enterNameless(IndexKind kind) {
    return enter(kind, std::to_string(++m_nameless[kind]));
}

void InterfaceDraft::stack(std::uint32_t higher, std::uint32_t lower) {
    if (lower != 0) m_found.rows.stack.push_back({higher, lower});
}

void InterfaceDraft::addLine(DS1LineDevice const& line, std::string const& name,
                             std::string const& circuit, std::uint32_t index) {
    m_lines.emplace(name, index);
    m_lines.emplace(circuit, index);
    m_lineObjects.emplace(&line, index);
}

std::uint32_t InterfaceDraft::findLine(std::string const& name) const {
    auto const found = m_lines.find(name);
    return name.empty() || found == m_lines.end() ? 0 : found->second;
}

std::optional<std::uint32_t> InterfaceDraft::lineOf(Object& channel) const {
    auto* const onLine = dynamic_cast<ISDNChannelOnLine*>(&channel);
    if (onLine == nullptr) return std::nullopt;
    ReferenceCounter<DS1LineDevice> const line = onLine->GetLine();
    auto const found = m_lineObjects.find(line.get());
    return found == m_lineObjects.end() ? 0 : found->second;
}

bool InterfaceDraft::isE1(std::uint32_t line) const {
    auto const found = std::ranges::find(m_found.rows.lines, line, &LineRow::ifIndex);
    return found != m_found.rows.lines.end() && found->lineType &&
           std::ranges::find(kTypesOfE1, *found->lineType) != std::end(kTypesOfE1);
}

} // namespace kvloamd
