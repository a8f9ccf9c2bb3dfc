// SPDX-License-Identifier: BSD-2-Clause
// The metrics of the agent and its boards.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <utility>

#include "agent/fronts/metrics/MetricText.h"
#include "agent/fronts/metrics/ProcessUsage.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

struct MetricOptions {
    MetricFormat format = MetricFormat::Plain;
    bool channels = false; ///< a series for each bearer channel as well
};

/// What metrics show beside the facts.
struct MetricMoment {
    std::int64_t now = 0;     ///< milliseconds since the epoch
    std::int64_t started = 0; ///< the agent's start, in seconds since the epoch
    ProcessUsage process;
};

/// All metrics as text. Boards, lines and channels that are not there have none; what is not known
/// has no sample. Thread-safe.
std::string metricsText(Facts const& facts, MetricMoment const& moment,
                        MetricOptions const& options, std::size_t expectedSize = 0);

/// The format for a request whose header Accept says this: OpenMetrics if it names it, as
/// Prometheus does, and the plain one for everything else, which every reader of metrics
/// understands.
MetricFormat metricFormat(std::string_view accept);

/// A `MetricsCache` keeps the texts of the newest snapshot, so that several scrapers cost no more
/// than one. Thread-bound (HTTP thread).
class MetricsCache {
  public:
    using Text = std::shared_ptr<std::string const>;

    Text text(Facts const& facts, MetricOptions const& options);

  private:
    using Key = std::pair<MetricFormat, bool>;

    std::uint32_t m_number = 0; ///< of the snapshot that the texts show, if there are any
    std::map<Key, Text> m_texts;
    std::map<Key, std::size_t> m_sizes; ///< of the last texts
    std::int64_t m_started = 0;         ///< the agent's start, as `MetricMoment::started`
};

/// The metrics that neither the description nor the totals of lines have, for their documentation.
std::vector<MetricFamily> const& otherFamilies();

} // namespace kvloamd
