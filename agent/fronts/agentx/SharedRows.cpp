// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/SharedRows.h"

#include <algorithm>
#include <iterator>

#include "agent/log/Log.h"

namespace kvloamd {

SharedRows::SharedRows(std::vector<ServedTree> const& trees) {
    for (ServedTree const& served : trees) {
        for (Place const& place : served.places) {
            if (place.hostHas != HostHas::Rows) continue;
            for (TableColumn& cells : served.tree.columnsBelow(place.place)) {
                Oid name = joined(served.arc, cells.place);
                m_columns.push_back({std::move(name), place.name, std::move(cells), {}});
            }
        }
    }
    std::ranges::sort(m_columns, {}, &Column::name);
}

void SharedRows::update(Facts const& facts, Clock::time_point now) {
    for (Column& column : m_columns)
        updateColumn(column, facts, now);
    listSteps();
}

void SharedRows::updateColumn(Column& column, Facts const& facts, Clock::time_point now) {
    auto& ranges = column.ranges;
    for (auto& [first, range] : ranges)
        range.gone = now - range.used > kKeep;
    Table const& table = *column.cells.table;
    auto above = ranges.begin(); // the first range that begins after the row
    auto fresh = ranges.end();   // made for the row before this one
    Oid index;
    for (std::size_t row = 0; row < table.rowCount(facts); ++row) {
        if (!isKnown(table.value(facts, column.cells.column, row))) continue;
        index.clear();
        table.appendIndex(facts, row, index);
        std::uint32_t const number = index.front();
        while (above != ranges.end() && above->first <= number)
            ++above;
        auto const around = above == ranges.begin() ? ranges.end() : std::prev(above);
        if (around != ranges.end() && around->second.last >= number) {
            around->second.used = now;
            around->second.gone = false;
        } else if (fresh != ranges.end() && fresh == around && fresh->second.last + 1 == number &&
                   number - fresh->first < kLongest) {
            fresh->second.last = number;
        } else {
            fresh = ranges.insert({number, {number, State::Missing, false, now}}).first;
        }
    }
    // A range that is not registered need not be unregistered.
    std::erase_if(ranges, [](auto const& entry) {
        State const state = entry.second.state;
        return entry.second.gone && (state == State::Missing || state == State::Refused);
    });
}

void SharedRows::listSteps() {
    m_steps.clear();
    for (std::size_t column = 0; column < m_columns.size(); ++column)
        for (auto const& [first, range] : m_columns[column].ranges)
            if (range.state == State::Missing || (range.state == State::Entered && range.gone))
                m_steps.emplace_back(column, first);
}

std::optional<SharedRows::Step> SharedRows::next() {
    if (m_underWay || m_steps.empty()) return std::nullopt;
    m_underWay = m_steps.back();
    m_steps.pop_back();
    Range& range = underWay();
    bool const enters = range.state == State::Missing;
    range.state = enters ? State::Entering : State::Leaving;
    return Step{enters, {m_columns[m_underWay->first].name, m_underWay->second, range.last}};
}

void SharedRows::done() {
    if (!m_underWay) return;
    if (underWay().state == State::Entering)
        underWay().state = State::Entered;
    else
        m_columns[m_underWay->first].ranges.erase(m_underWay->second);
    m_underWay.reset();
}

void SharedRows::refused(std::string const& why) {
    if (!m_underWay) return;
    // The master does not know the range, so there is nothing to unregister.
    if (underWay().state == State::Leaving) return done();
    underWay().state = State::Refused;
    Column const& column = m_columns[m_underWay->first];
    std::string const table = column.place;
    bool const isNew = std::ranges::find(m_told, table) == m_told.end();
    log(isNew ? LogLevel::Warning : LogLevel::Debug,
        "the SNMP master refuses rows of " + table + ", of index " +
            std::to_string(m_underWay->second) + " on: " + why + "; the rest is served");
    if (isNew) m_told.push_back(table);
    m_underWay.reset();
}

void SharedRows::restart() {
    m_underWay.reset();
    for (Column& column : m_columns) {
        std::erase_if(column.ranges, [](auto const& entry) {
            return entry.second.gone || entry.second.state == State::Leaving;
        });
        for (auto& [first, range] : column.ranges)
            range.state = State::Missing;
    }
    listSteps();
}

} // namespace kvloamd
