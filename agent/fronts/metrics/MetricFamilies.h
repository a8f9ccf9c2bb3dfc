// SPDX-License-Identifier: BSD-2-Clause
// Which metrics there are: what the description of the managed objects becomes as metrics.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <vector>

#include "agent/objects/Description.h"

namespace kvloamd {

enum class MetricType { Counter, Gauge, Info };

/// How the value of an object becomes samples.
enum class MetricShape {
    Number, ///< one sample
    States, ///< one for each name: 1 for that of the value, 0 for all others
    Bits,   ///< the same for a sum of bits: 1 for each that is set
    Stamp,  ///< a time since the agent's start, as seconds since the epoch
    Date    ///< a date, as seconds since the epoch
};

/// A `MetricFamily` is a metric: its name, and all samples with their labels.
struct MetricFamily {
    std::string name; ///< without the endings _total and _info, which follow from the type
    MetricType type = MetricType::Gauge;
    std::string unit = {};   ///< the name ends with it; empty: none
    std::string help = {};   ///< one line without a full stop
    std::string source = {}; ///< the object that it shows
    MetricShape shape = MetricShape::Number;
    bool is64 = false;
    Names states = {};
    // The value of the object in the unit of the metric: times `factor`, divided by `divisor`.
    std::int64_t factor = 1;
    std::int64_t divisor = 1;
    Table const* table = nullptr; ///< null: a scalar
    std::size_t column = 0;       ///< of the table, or place of the scalar
};

/// The names and values of the labels of a row's samples.
enum class MetricLabels {
    None,
    Board,     ///< board: the serial number
    Line,      ///< board, line: the line's name
    Interface, ///< board, interface
    Channel,   ///< board, channel
    Process,   ///< process, pid
    Module,    ///< module
    Service,   ///< service
    Fault      ///< board, fault: the platform's number
};

/// What is known about the rows of one table, and of others with the same rows, or the agent's
/// scalars.
struct MetricGroup {
    /// A column that is a label of the group's information metric.
    struct InfoLabel {
        std::string name;
        std::string source;
        Table const* table; ///< null: a scalar
        std::size_t column;
    };

    std::string stem;             ///< of the metrics' names
    std::string thing;            ///< what a row is, in words
    Table const* table = nullptr; ///< null: the scalars
    MetricLabels labels = MetricLabels::None;
    bool ofChannels = false; ///< only written if channels are asked for
    std::vector<MetricFamily> families;
    MetricFamily info; ///< without a name if there are no `infoLabels`
    std::vector<InfoLabel> infoLabels;
};

/// All metrics that follow from the description.
std::vector<MetricGroup> const& metricGroups();

/// An object that no metric shows, and why.
struct UnshownObject {
    std::string name;
    std::string reason;
};
/// Every object of the description is either in a group or here.
std::vector<UnshownObject> const& unshownObjects();

/// The totals of a line's counters, in the order of `LineTotals`.
std::vector<MetricFamily> const& lineTotalFamilies();

/// "InUcastPkts" becomes "in_unicast_packets".
std::string snakeCase(std::string_view name);

} // namespace kvloamd
