// SPDX-License-Identifier: BSD-2-Clause
// Prints rows in columns that are as wide as their contents.
#include "simulator/tool/TextTable.h"

#include <algorithm>
#include <iomanip>

#include "simulator/base/Text.h"

namespace kvlsim {

void printColumns(std::vector<TextRow> const& rows, std::ostream& out) {
    std::vector<std::size_t> widths(rows.front().size());
    for (auto const& row : rows)
        for (std::size_t i = 0; i < row.size(); ++i)
            widths[i] = std::max(widths[i], row[i].size());
    for (auto const& row : rows) {
        for (std::size_t i = 0; i + 1 < row.size(); ++i)
            out << std::left << std::setw(static_cast<int>(widths[i])) << row[i] << "  ";
        out << row.back() << '\n';
    }
}

std::string cellText(nlohmann::json const& value) {
    if (value.is_null()) return "-";
    return value.is_string() ? oneLine(value.get<std::string>()) : value.dump();
}

} // namespace kvlsim
