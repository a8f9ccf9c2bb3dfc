// SPDX-License-Identifier: BSD-2-Clause
#include "Requests.h"

#include <cstddef>
#include <stdexcept>
#include <utility>

#include "IntervalRows.h"

namespace {

using kvloamd::Oid;

Oid below(Oid name, std::initializer_list<std::uint32_t> numbers) {
    name.insert(name.end(), numbers);
    return name;
}

/// A number as a response holds it: of 32 bits at most, not negative.
std::uint32_t number(std::string const& value) {
    std::uint32_t number = 0;
    for (char const octet : std::string_view(value).substr(2))
        number = number << 8 | static_cast<unsigned char>(octet);
    return number;
}

} // namespace

std::vector<std::string> requestsFor(Oid const& entry, std::vector<std::uint32_t> const& columns,
                                     std::uint32_t lines) {
    std::vector<std::string> requests;
    for (std::uint32_t row = 0; row < lines * kIntervalsOfALine; row += kRepetitions) {
        std::vector<Oid> names;
        for (std::uint32_t const column : columns) {
            names.push_back(below(entry, {column}));
            // The row before is where the last request ended.
            if (row > 0)
                names.back() = below(names.back(), {kFirstLine + (row - 1) / kIntervalsOfALine,
                                                    (row - 1) % kIntervalsOfALine + 1});
        }
        requests.push_back(LeanClient::bulkRequest(names, kRepetitions));
    }
    return requests;
}

std::vector<std::uint32_t> counterColumns() {
    std::vector<std::uint32_t> columns;
    for (std::uint32_t i = 0; i < kCounters; ++i)
        columns.push_back(kFirstCounterColumn + i);
    return columns;
}

void checkTable(LeanClient& client, Oid const& entry, std::uint32_t lines) {
    auto const made = makeIntervals(lines);
    for (std::uint32_t const column : counterColumns()) {
        std::uint32_t rows = 0;
        for (std::string const& request : requestsFor(entry, {column}, lines)) {
            for (auto const& [name, value] : LeanClient::read(client.ask(request))) {
                std::uint32_t const line = rows / kIntervalsOfALine;
                std::uint32_t const interval = rows % kIntervalsOfALine + 1;
                if (line == lines) break; // what comes behind the column
                auto const count = made.interfaces.lines[line]
                                       .closed->counts[interval - 1][column - kFirstCounterColumn];
                if (name != below(entry, {column, kFirstLine + line, interval}) ||
                    number(value) != static_cast<std::uint32_t>(count))
                    throw std::runtime_error("an agent answers wrongly");
                ++rows;
            }
        }
        if (rows != lines * kIntervalsOfALine) throw std::runtime_error("an agent leaves rows out");
    }
}
