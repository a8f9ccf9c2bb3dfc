// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/metrics/MetricText.h"

#include <algorithm>
#include <array>
#include <charconv>

#include "agent/objects/TextCheck.h"

namespace kvloamd {

namespace {

constexpr std::size_t kLongestNumber = 32;

char const* typeName(MetricType type, MetricFormat format) {
    switch (type) {
    case MetricType::Counter:
        return "counter";
    case MetricType::Info:
        return format == MetricFormat::OpenMetrics ? "info" : "gauge";
    case MetricType::Gauge:
        break;
    }
    return "gauge";
}

char const* ending(MetricType type) {
    return type == MetricType::Counter ? "_total" : type == MetricType::Info ? "_info" : "";
}

} // namespace

MetricText::MetricText(MetricFormat format, std::size_t expectedSize) : m_format(format) {
    m_text.reserve(expectedSize);
}

void MetricText::begin(MetricFamily const& family) {
    m_family = &family;
    m_name = family.name + ending(family.type);
    m_hasHead = false;
}

/// In Prometheus's own format a family is called as its samples.
void MetricText::head() {
    m_hasHead = true;
    std::string const& name = m_format == MetricFormat::OpenMetrics ? m_family->name : m_name;
    m_text += "# HELP " + name + " " + m_family->help + "\n# TYPE " + name + " " +
              typeName(m_family->type, m_format) + "\n";
    if (!m_family->unit.empty()) m_text += "# UNIT " + name + " " + m_family->unit + "\n";
}

void MetricText::begin(std::string_view labels) {
    if (!m_hasHead) head();
    m_text += m_name;
    if (!labels.empty()) m_text.append("{").append(labels).append("}");
    m_text += ' ';
}

void MetricText::number(std::int64_t value) {
    std::array<char, kLongestNumber> digits{};
    auto const end = m_family->is64
                         ? std::to_chars(digits.data(), digits.data() + digits.size(),
                                         static_cast<std::uint64_t>(value))
                         : std::to_chars(digits.data(), digits.data() + digits.size(), value);
    m_text.append(digits.data(), end.ptr);
}

void MetricText::sample(std::string_view labels, std::int64_t value) {
    std::int64_t const scaled = value * m_family->factor;
    if (scaled % m_family->divisor != 0) {
        sample(labels, static_cast<double>(scaled) / static_cast<double>(m_family->divisor));
        return;
    }
    begin(labels);
    number(scaled / m_family->divisor);
    m_text += '\n';
}

void MetricText::sample(std::string_view labels, double value) {
    begin(labels);
    std::array<char, kLongestNumber> digits{};
    auto const end = std::to_chars(digits.data(), digits.data() + digits.size(), value);
    m_text.append(digits.data(), end.ptr).append("\n");
}

void MetricText::state(std::string_view labels, std::string_view state, bool holds) {
    if (!m_hasHead) head();
    m_text.append(m_name).append("{").append(labels);
    if (!labels.empty()) m_text += ',';
    m_text.append(state).append(holds ? "} 1\n" : "} 0\n");
}

std::string MetricText::take() {
    m_text += "# EOF\n";
    return std::move(m_text);
}

void MetricText::label(std::string& labels, std::string_view name, std::string_view value) {
    if (value.empty()) return;
    if (!labels.empty()) labels += ',';
    labels.append(name).append("=\"");
    bool const isReadable = isText(value);
    auto const isPlain = [](char octet) { return octet >= ' ' && octet <= '~'; };
    for (char const octet : value) {
        if (octet == '\\' || octet == '"')
            labels.append("\\").append(1, octet);
        else if (octet == '\n')
            labels += "\\n";
        else
            labels += isReadable || isPlain(octet) ? octet : '?';
    }
    labels += '"';
}

} // namespace kvloamd
