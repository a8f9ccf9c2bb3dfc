// SPDX-License-Identifier: BSD-2-Clause
// Writes metrics as text.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <utility>

#include "agent/fronts/metrics/MetricFamilies.h"

namespace kvloamd {

/// The text formats of metrics.
enum class MetricFormat {
    OpenMetrics, ///< OpenMetrics 1.0
    /// Prometheus's own, 0.0.4, for programs that do not know OpenMetrics. UNIT and EOF are
    /// comments in it.
    Plain
};

/// The value of the HTTP header Content-Type.
constexpr char const* contentType(MetricFormat format) {
    return format == MetricFormat::OpenMetrics
               ? "application/openmetrics-text; version=1.0.0; charset=utf-8"
               : "text/plain; version=0.0.4; charset=utf-8";
}

/// A `MetricText` appends families of samples to a text. A family without samples is left out.
/// Unsynchronised.
class MetricText {
  public:
    explicit MetricText(MetricFormat format, std::size_t expectedSize = 0);

    /// Begins a family, which outlives its samples.
    void begin(MetricFamily const& family);
    /// A sample of the family; `labels` as `label` writes them, with commas between them. The value
    /// is `value` * `family.factor` / `family.divisor`.
    void sample(std::string_view labels, std::int64_t value);
    void sample(std::string_view labels, double value);
    /// A sample with one label more, which is written already, and the value 0 or 1.
    void state(std::string_view labels, std::string_view state, bool holds);

    /// Ends the text and gives it away.
    std::string take();

    /// Appends a label, with a comma before it unless it is the first; nothing for an empty value.
    static void label(std::string& labels, std::string_view name, std::string_view value);

  private:
    void head();
    void begin(std::string_view labels);
    void number(std::int64_t value);

    MetricFormat m_format;
    std::string m_text;
    MetricFamily const* m_family = nullptr;
    std::string m_name; ///< of the family's samples
    bool m_hasHead = false;
};

} // namespace kvloamd
