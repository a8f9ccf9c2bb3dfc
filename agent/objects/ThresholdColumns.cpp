// SPDX-License-Identifier: BSD-2-Clause
// kvlThresholdTable: the limits on what lines may count.
#include <limits>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

using enum ValueType;
using Row = ThresholdRow;

template <std::size_t Threshold>
Value limit(Row const& row) {
    return std::int64_t{row.limits[Threshold]};
}

constexpr int kForget = -1;

constexpr Details limitOn(std::size_t threshold, char const* help, char const* unit) {
    Writable own{thresholdSetting(threshold), kForget, std::numeric_limits<int>::max()};
    own.forgetting = kForget;
    return about(help).in(unit).settable(own);
}

constexpr Column<Row> kColumns[] = {
    {"kvlThresholdES15m", 2, Integer, limit<kErroredSeconds15m>,
     limitOn(kErroredSeconds15m, "The limit on the line's errored seconds in 15 minutes; 0 is none",
             "seconds")},
    {"kvlThresholdES24h", 3, Integer, limit<kErroredSeconds24h>,
     limitOn(kErroredSeconds24h, "The limit on the line's errored seconds in 24 hours; 0 is none",
             "seconds")},
    {"kvlThresholdSES15m", 4, Integer, limit<kSeverelyErroredSeconds15m>,
     limitOn(kSeverelyErroredSeconds15m,
             "The limit on the line's severely errored seconds in 15 minutes; 0 is none",
             "seconds")},
    {"kvlThresholdSES24h", 5, Integer, limit<kSeverelyErroredSeconds24h>,
     limitOn(kSeverelyErroredSeconds24h,
             "The limit on the line's severely errored seconds in 24 hours; 0 is none", "seconds")},
    {"kvlThresholdUAS15m", 6, Integer, limit<kUnavailableSeconds15m>,
     limitOn(kUnavailableSeconds15m,
             "The limit on the line's unavailable seconds in 15 minutes; 0 is none", "seconds")},
    {"kvlThresholdUAS24h", 7, Integer, limit<kUnavailableSeconds24h>,
     limitOn(kUnavailableSeconds24h,
             "The limit on the line's unavailable seconds in 24 hours; 0 is none", "seconds")},
    {"kvlThresholdCSS15m", 8, Integer, limit<kControlledSlipSeconds15m>,
     limitOn(kControlledSlipSeconds15m,
             "The limit on the line's controlled slip seconds in 15 minutes; 0 is none",
             "seconds")},
    {"kvlThresholdCSS24h", 9, Integer, limit<kControlledSlipSeconds24h>,
     limitOn(kControlledSlipSeconds24h,
             "The limit on the line's controlled slip seconds in 24 hours; 0 is none", "seconds")},
    {"kvlThresholdCV15m", 10, Integer, limit<kCodeViolations15m>,
     limitOn(kCodeViolations15m,
             "The limit on the line's path coding violations in 15 minutes; 0 is none",
             "violations")},
    {"kvlThresholdCV24h", 11, Integer, limit<kCodeViolations24h>,
     limitOn(kCodeViolations24h,
             "The limit on the line's path coding violations in 24 hours; 0 is none",
             "violations")},
};

std::vector<Row> const& rows(Snapshot const& snapshot) {
    return snapshot.thresholds;
}

} // namespace

Table const& thresholdTable() {
    static RowTable<Row, rows> const table("kvlThresholdTable", {1, 1, 13, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
