// SPDX-License-Identifier: BSD-2-Clause
// What a reader finds wrong with a description.
#include "simulator/description/Findings.h"

#include <algorithm>

#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"

namespace kvlsim {

void Findings::Kept::add(ChassisError const& error) {
    if (first.size() < kMost)
        first.push_back(error);
    else
        ++more;
}

std::vector<std::string> Findings::Kept::lines(std::string_view source, char const* what) const {
    auto sorted = first;
    std::ranges::stable_sort(sorted, {}, &ChassisError::line);
    std::vector<std::string> lines;
    lines.reserve(sorted.size() + 1);
    for (auto const& each : sorted)
        lines.push_back(describeError(source, each));
    if (more > 0)
        lines.push_back(std::string(source) + ": " + std::to_string(more) + " more " + what +
                        "; correct these first");
    return lines;
}

void Findings::checkName(std::string const& name, int line) {
    if (kindOf(name) != AttributeKind::any) return;
    auto found = m_meant.find(name);
    if (found == m_meant.end()) {
        if (m_meant.size() == kMostNames) return;
        found = m_meant.emplace(name, knownNameLike(name)).first;
    }
    if (!found->second.empty())
        m_warnings.add({line, "warning: unknown attribute " + inQuotes(name) + "; did you mean " +
                                  found->second + "?"});
}

void Findings::checkNumber(std::string const& name, AttributeValue const& value, int line) {
    auto const legal = legalNumbersOf(name);
    if (!legal || value.form() != ValueForm::number) return;
    std::int32_t const number = value.asNumber();
    if (number >= legal->lowest && number <= legal->highest) return;
    m_warnings.add({line, "warning: " + name + " " + std::to_string(number) +
                              " is not a value of DS1-MIB, which has " +
                              std::to_string(legal->lowest) + " to " +
                              std::to_string(legal->highest) + "; agents leave it out"});
}

std::vector<std::string> Findings::errors(std::string_view source) const {
    return m_errors.lines(source, "errors");
}

std::vector<std::string> Findings::warnings(std::string_view source) const {
    return m_warnings.lines(source, "warnings");
}

} // namespace kvlsim
