// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Table.h"

#include <algorithm>
#include <numeric>

#include "cli/Text.h"

namespace kvloam {

namespace {

constexpr std::size_t kGap = 2;
constexpr std::size_t kLeftOut = 0;

/// The widths that make a row of columns fit into `room`.
std::vector<std::size_t> fit(std::vector<TableColumn> const& columns,
                             std::vector<std::size_t> widths, std::size_t room) {
    auto const needed = [&] {
        std::size_t sum = 0;
        for (std::size_t const own : widths)
            if (own != kLeftOut) sum += own + (sum > 0 ? kGap : 0);
        return sum;
    };
    std::vector<std::size_t> order(columns.size());
    std::iota(order.begin(), order.end(), 0U);
    std::ranges::stable_sort(order, [&](std::size_t a, std::size_t b) {
        return columns[a].priority > columns[b].priority;
    });
    for (std::size_t const i : order) {
        std::size_t const excess = needed() - std::min(needed(), room);
        if (excess == 0) break;
        TableColumn const& column = columns[i];
        bool const stays = column.priority == 0;
        std::size_t const least = stays && column.least == 0 ? 1 : column.least;
        if (least == 0 || widths[i] < least + excess) {
            widths[i] = stays ? std::min(widths[i], least) : kLeftOut;
        } else {
            widths[i] -= excess;
        }
    }
    return widths;
}

std::string fitted(Cell const& cell, std::size_t columns, Align align, Screen const& screen) {
    std::string const text = cut(cell.text, columns, screen.mark());
    std::string const blanks(columns - std::min(columns, width(text)), ' ');
    std::string const shown = screen.painted(text, cell.paint);
    return align == Align::Right ? blanks + shown : shown + blanks;
}

} // namespace

void Table::print(std::ostream& out, Screen const& screen) const {
    std::vector<std::vector<Cell>> rows;
    rows.reserve(m_rows.size() + 1);
    auto& titles = rows.emplace_back();
    for (auto const& column : m_columns)
        titles.push_back({column.title, Paint::Heading});
    rows.insert(rows.end(), m_rows.begin(), m_rows.end());

    std::vector<std::size_t> widths(m_columns.size(), 1);
    for (auto& row : rows)
        for (std::size_t i = 0; i < m_columns.size(); ++i) {
            row[i].text = screen.clean(row[i].text);
            widths[i] = std::max(widths[i], width(row[i].text));
        }
    if (screen.width != Screen::kUnlimited) widths = fit(m_columns, widths, screen.width);

    std::size_t last = m_columns.size();
    while (last > 0 && widths[last - 1] == kLeftOut)
        --last;
    for (auto const& row : rows) {
        std::string line;
        for (std::size_t i = 0; i < last; ++i) {
            if (widths[i] == kLeftOut) continue;
            if (!line.empty()) line += std::string(kGap, ' ');
            line += fitted(row[i], widths[i], m_columns[i].align, screen);
        }
        line.resize(line.find_last_not_of(' ') + 1);
        out << line << '\n';
    }
}

void printWords(std::ostream& out, Screen const& screen, Cell const& line) {
    out << screen.painted(cut(screen.clean(line.text), screen.width, screen.mark()), line.paint)
        << '\n';
}

void printPairs(std::ostream& out, Screen const& screen,
                std::vector<std::pair<std::string, Cell>> const& pairs) {
    std::size_t widest = 1;
    for (auto const& pair : pairs)
        widest = std::max(widest, width(screen.clean(pair.first)));
    // Half of a narrow screen is for the values.
    widest = std::min(widest, std::max<std::size_t>(screen.width / 2, 1));
    std::size_t const used = widest + kGap;
    for (auto const& [name, cell] : pairs) {
        std::string const shown = cut(screen.clean(name), widest, screen.mark());
        out << screen.painted(shown, Paint::Faint);
        if (screen.width > used)
            out << std::string(used - width(shown), ' ')
                << screen.painted(cut(screen.clean(cell.text), screen.width - used, screen.mark()),
                                  cell.paint);
        out << '\n';
    }
}

} // namespace kvloam
