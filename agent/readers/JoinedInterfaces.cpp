// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/JoinedInterfaces.h"

#include <algorithm>
#include <tuple>

namespace kvloamd {

void JoinedInterfaces::begin(std::size_t boards, bool anew) {
    m_tables.begin(boards, anew);
    m_lines.begin(boards, anew);
}

void JoinedInterfaces::update(PartsOfAll<Tables> const& tables, PartsOfAll<Lines> const& lines,
                              std::optional<std::uint32_t> time) {
    bool interfaces = false; // have come or gone
    bool stack = false;
    if (m_tables.areMany()) {
        InterfaceRows const former = m_all;
        joinTables(tables());
        auto const index = [](InterfaceRow const& row) { return row.ifIndex; };
        interfaces = !std::ranges::equal(m_all.interfaces, former.interfaces, {}, index, index);
        stack = m_all.stack != former.stack;
    } else {
        std::tie(interfaces, stack) = exchangeTables();
    }
    if (m_lines.areMany())
        joinLines(lines());
    else
        exchangeLines();
    m_tables.end();
    m_lines.end();
    if (time && interfaces) m_all.lastChange = *time;
    if (time && stack) m_all.stackLastChange = *time;
}

void JoinedInterfaces::joinTables(std::vector<std::shared_ptr<Tables const>> all) {
    auto const parts =
        std::make_shared<std::vector<std::shared_ptr<Tables const>> const>(std::move(all));
    auto const join = [&](auto& table, auto rowsOf) {
        TableJoin joining(table, parts);
        for (auto const& part : *parts)
            joining.append((*part).*rowsOf);
        joining.end();
    };
    join(m_all.interfaces, &Tables::interfaces);
    join(m_all.bearers, &Tables::bearers);
    join(m_all.ds0Channels, &Tables::ds0Channels);
    join(m_all.signalling, &Tables::signalling);
    join(m_all.lapds, &Tables::lapds);
    join(m_all.ethernets, &Tables::ethernets);
    join(m_all.receiveAddresses, &Tables::receiveAddresses);
    join(m_all.ports, &Tables::ports);
    joinStack(*parts, parts);
}

void JoinedInterfaces::joinStack(std::vector<std::shared_ptr<Tables const>> const& parts,
                                 std::shared_ptr<void const> owner) {
    // The topmost interfaces of all boards come first, above which there is nothing.
    TableJoin joining(m_all.stack, std::move(owner));
    auto const lowerRows = [](Tables const& part) {
        return std::ranges::partition_point(part.stack,
                                            [](StackRow const& row) { return row.higher == 0; });
    };
    for (auto const& part : parts)
        joining.append({part->stack.begin(), lowerRows(*part)});
    for (auto const& part : parts)
        joining.append({lowerRows(*part), part->stack.end()});
    joining.end();
}

std::pair<bool, bool> JoinedInterfaces::exchangeTables() {
    auto const& parts = m_tables.all();
    if (parts.empty()) return {false, false};
    auto const exchange = [&]<class Row>(Rows<Row>& table,
                                         std::vector<Row> InterfaceTables<RowVector>::*rowsOf) {
        auto const rows = exchangeOf<Row>(parts, rowsOf);
        rows.apply(table);
        return rows.changesIndices();
    };
    exchange(m_all.bearers, &Tables::bearers);
    exchange(m_all.ds0Channels, &Tables::ds0Channels);
    exchange(m_all.signalling, &Tables::signalling);
    exchange(m_all.lapds, &Tables::lapds);
    exchange(m_all.ethernets, &Tables::ethernets);
    exchange(m_all.receiveAddresses, &Tables::receiveAddresses);
    exchange(m_all.ports, &Tables::ports);
    bool const interfaces = exchange(m_all.interfaces, &Tables::interfaces);
    return {interfaces, exchange(m_all.stack, &Tables::stack)};
}

void JoinedInterfaces::joinLines(std::vector<std::shared_ptr<Lines const>> const& all) {
    TableJoin joining(m_all.lines, nullptr);
    for (auto const& lines : all)
        joining.append(*lines, lines);
    joining.end();
    countIntervals(m_all);
}

void JoinedInterfaces::exchangeLines() {
    RowExchange<LineRow> const exchange = exchangeOf<LineRow>(m_lines.all(), std::identity());
    if (exchange.gone.empty() && exchange.come.empty()) return;
    Rows<LineRow> const former = m_all.lines;
    std::vector<std::size_t> const before = std::move(m_all.intervalsBefore);
    exchange.apply(m_all.lines);
    // The closed intervals of lines that stay need not be asked for.
    auto& counts = m_all.intervalsBefore;
    counts.clear();
    counts.reserve(m_all.lines.size() + 1);
    std::size_t sum = 0;
    std::size_t place = 0; // in `former`
    auto come = exchange.come.begin();
    for (LineRow const& line : m_all.lines) {
        counts.push_back(sum);
        if (come != exchange.come.end() && *come == &line) {
            sum += line.closedIntervals();
            ++come;
            continue;
        }
        while (&former[place] != &line)
            ++place;
        sum += before[place + 1] - before[place];
        ++place;
    }
    counts.push_back(sum);
}

} // namespace kvloamd
