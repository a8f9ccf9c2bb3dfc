// SPDX-License-Identifier: BSD-2-Clause
// Random histories of a line, against a reckoning that looks at each of them as a whole.
#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "LinePerformance.h"
#include "tests/modules/z7sim/CountedLine.h"

namespace {

struct History {
    std::vector<LineSecond> seconds;
    std::vector<std::size_t> intervals; ///< of each second
};

std::int64_t pathViolations(LineFormat format, LineSecond const& second) {
    bool const crc = format == LineFormat::esf || format == LineFormat::e1Crc;
    return std::int64_t{second.framingErrors} + (crc ? second.pathCodeViolations : 0);
}

bool withoutFrame(LineSecond const& second) {
    return second.outOfFrame || second.lossOfSignal;
}

bool modelSevere(LineFormat format, LineSecond const& second) {
    std::int64_t const path = pathViolations(format, second);
    if (format == LineFormat::esf)
        return path >= 320 || withoutFrame(second) || second.alarmIndication;
    if (format == LineFormat::d4)
        return second.framingErrors > 0 || withoutFrame(second) ||
               second.lineCodeViolations >= 1544;
    if (format == LineFormat::e1) return second.lineCodeViolations >= 2048 || withoutFrame(second);
    return path >= 832 || withoutFrame(second);
}

std::vector<bool> severeSeconds(LineFormat format, History const& history) {
    std::vector<bool> severe;
    for (auto const& second : history.seconds)
        severe.push_back(modelSevere(format, second));
    return severe;
}

/// Run by run: one of ten or more decides for all of its seconds.
std::vector<bool> unavailableSeconds(std::vector<bool> const& severe) {
    std::vector<bool> result;
    bool unavailable = false;
    for (std::size_t first = 0; first < severe.size();) {
        std::size_t end = first;
        while (end < severe.size() && severe[end] == severe[first])
            ++end;
        if (end - first >= 10) unavailable = severe[first];
        result.insert(result.end(), end - first, unavailable);
        first = end;
    }
    return result;
}

LineCounts modelSecond(LineFormat format, LineSecond const& second) {
    std::int64_t const path = pathViolations(format, second);
    bool const alarm = second.alarmIndication;
    LineCounts counts;
    if (path > 0 || withoutFrame(second) || second.controlledSlips > 0 || alarm)
        counts.errorSeconds = 1;
    if ((format == LineFormat::d4 || format == LineFormat::e1) && second.lineCodeViolations > 0)
        counts.errorSeconds = 1;
    if (modelSevere(format, second)) counts.severelyErrorSeconds = 1;
    if (withoutFrame(second) || alarm) counts.severelyErrorFramingSeconds = 1;
    if (second.controlledSlips > 0) counts.controlledSlipSeconds = 1;
    if (second.lineCodeViolations > 0) counts.lineErrorSeconds = 1;
    if (format == LineFormat::esf && path > 1 && path < 320 && !withoutFrame(second) && !alarm)
        counts.burstyErrorSeconds = 1;
    counts.pathCodingViolations = static_cast<std::int32_t>(path);
    counts.lineCodeViolations = static_cast<std::int32_t>(second.lineCodeViolations);
    return counts;
}

/// The last seconds of the degraded minutes.
std::vector<std::size_t> degradedMinutes(LineFormat format, History const& history,
                                         std::vector<bool> const& severe,
                                         std::vector<bool> const& unavailable) {
    std::vector<std::size_t> grouped;
    for (std::size_t i = 0; i < severe.size(); ++i)
        if (!severe[i] && !unavailable[i]) grouped.push_back(i);
    bool const t1 = format == LineFormat::esf || format == LineFormat::d4;
    bool const crc = format == LineFormat::esf || format == LineFormat::e1Crc;
    std::vector<std::size_t> minutes;
    for (std::size_t last = 59; last < grouped.size(); last += 60) {
        std::int64_t errors = 0;
        for (std::size_t i = last - 59; i <= last; ++i) {
            LineSecond const& second = history.seconds[grouped[i]];
            errors += pathViolations(format, second) + (crc ? 0 : second.lineCodeViolations);
        }
        if (errors > (t1 ? 92 : 122) && errors <= (t1 ? 92'640 : 122'880))
            minutes.push_back(grouped[last]);
    }
    return minutes;
}

/// The counts of the history's intervals.
std::vector<LineCounts> modelCounts(LineFormat format, History const& history) {
    std::vector<bool> const severe = severeSeconds(format, history);
    std::vector<bool> const unavailable = unavailableSeconds(severe);
    std::vector<LineCounts> counts(history.intervals.back() + 1);
    for (std::size_t i = 0; i < severe.size(); ++i) {
        LineCounts& interval = counts[history.intervals[i]];
        if (unavailable[i])
            ++interval.unavailableSeconds;
        else
            interval += modelSecond(format, history.seconds[i]);
    }
    for (std::size_t last : degradedMinutes(format, history, severe, unavailable))
        ++counts[history.intervals[last]].degradedMinutes;
    return counts;
}

/// Makes histories out of runs of seconds of a kind.
class Histories {
  public:
    explicit Histories(unsigned seed) : m_random(seed) {}

    /// Of about so many seconds.
    History next(std::size_t seconds) {
        History history;
        while (history.seconds.size() < seconds)
            addRun(history.seconds);
        // Short intervals have the most borders, long ones are what a line has.
        std::size_t const longest = one(4) == 0 ? 900 : 10 + one(50);
        for (std::size_t i = 0; history.intervals.size() < history.seconds.size(); ++i)
            history.intervals.insert(history.intervals.end(), between(10, longest), i);
        history.intervals.resize(history.seconds.size());
        return history;
    }

  private:
    std::uint32_t between(std::size_t least, std::size_t most) {
        return std::uniform_int_distribution<std::uint32_t>(
            static_cast<std::uint32_t>(least), static_cast<std::uint32_t>(most))(m_random);
    }
    /// From 0 on, so many different ones.
    std::uint32_t one(std::uint32_t of) { return between(0, of - 1); }

    /// Many runs are about as long as what decides on availability.
    std::uint32_t runLength() {
        switch (one(4)) {
        case 0:
            return between(1, 5);
        case 1:
        case 2:
            return between(8, 12);
        default:
            return between(13, 150);
        }
    }

    void addRun(std::vector<LineSecond>& seconds) {
        std::uint32_t const kind = one(13);
        for (std::uint32_t left = runLength(); left > 0; --left)
            seconds.push_back(second(kind));
    }

    LineSecond second(std::uint32_t kind) {
        switch (kind) {
        case 0:
        case 1:
            return {};
        case 2:
            return {.lossOfSignal = true};
        case 3: // nothing but trouble, of any kind
            return {.lineCodeViolations = one(5000),
                    .pathCodeViolations = one(1000),
                    .framingErrors = one(3),
                    .controlledSlips = one(2),
                    .lossOfSignal = one(2) == 0,
                    .outOfFrame = one(2) == 0,
                    .alarmIndication = one(2) == 0};
        case 4:
            return {.alarmIndication = true};
        case 5:
            return {.controlledSlips = one(3)};
        case 6: // about a T1's least for a degraded minute
            return {.lineCodeViolations = between(1, 2), .pathCodeViolations = between(1, 2)};
        case 7: // about an E1's
            return {.lineCodeViolations = between(1, 3), .pathCodeViolations = between(1, 3)};
        case 8: // about severe, and about an E1's most for a degraded minute
            return {.lineCodeViolations = between(2045, 2047), .framingErrors = one(4)};
        case 9:
            return {.lineCodeViolations = between(1542, 1545), .pathCodeViolations = 319 + one(2)};
        case 10:
            return {.lineCodeViolations = between(2046, 2049), .pathCodeViolations = 831 + one(2)};
        case 11: // severe in every format
            return {.lineCodeViolations = 2048, .pathCodeViolations = 832};
        default:
            return {.pathCodeViolations = one(20) == 0 ? 1U : 0U, .outOfFrame = one(10) == 0};
        }
    }

    std::mt19937 m_random;
};

/// What happened in some histories, lest a check of them be a check of nothing.
struct Seen {
    LineCounts most; ///< the largest number of each count
    int intervals = 0;
    int lostAcrossBorder = 0;     ///< times the line became unavailable from a previous interval on
    int returnedAcrossBorder = 0; ///< and available
    int minutesGivenByReturn = 0; ///< degraded minutes among ten seconds that were given back
};

void note(LinePerformance::Change const& change, Seen& seen) {
    if (change.previous.unavailableSeconds > 0) ++seen.lostAcrossBorder;
    if (change.previous.unavailableSeconds < 0) ++seen.returnedAcrossBorder;
    bool const returned =
        change.running.unavailableSeconds < 0 || change.previous.unavailableSeconds < 0;
    if (returned) seen.minutesGivenByReturn += change.running.degradedMinutes;
    seen.minutesGivenByReturn += change.previous.degradedMinutes;
}

class LinePerformanceHistoryTest : public testing::TestWithParam<LineFormat> {};

TEST_P(LinePerformanceHistoryTest, ChangesAddUpToTheCountsOfTheWholeHistory) {
    Histories histories(495 + static_cast<unsigned>(GetParam()));
    Seen seen;
    for (int round = 0; round < 2000 && !HasFailure(); ++round) {
        SCOPED_TRACE(round);
        History const history = histories.next(200 + static_cast<std::size_t>(round % 1000));
        CountedLine line(GetParam());
        for (std::size_t i = 0; i < history.seconds.size(); ++i) {
            if (history.intervals[i] == line.intervals().size()) line.closeInterval();
            note(line.count(history.seconds[i]), seen);
        }
        EXPECT_EQ(line.intervals(), modelCounts(GetParam(), history));
        for (auto const& interval : line.intervals()) {
            for (auto const& field : kLineCountsFields)
                seen.most.*field.count = std::max(seen.most.*field.count, interval.*field.count);
            ++seen.intervals;
        }
    }
    for (auto const& field : kLineCountsFields) {
        if (GetParam() != LineFormat::esf && field.count == &LineCounts::burstyErrorSeconds)
            continue;
        EXPECT_GT(seen.most.*field.count, 0) << field.name;
    }
    EXPECT_GT(seen.intervals, 10'000);
    EXPECT_GT(seen.lostAcrossBorder, 100);
    EXPECT_GT(seen.returnedAcrossBorder, 100);
    EXPECT_GT(seen.minutesGivenByReturn, 100);
}

TEST_P(LinePerformanceHistoryTest, CountsAreRightAfterEverySecond) {
    Histories histories(2495 + static_cast<unsigned>(GetParam()));
    for (int round = 0; round < 50 && !HasFailure(); ++round) {
        SCOPED_TRACE(round);
        History const history = histories.next(250);
        CountedLine line(GetParam());
        History soFar;
        for (std::size_t i = 0; i < history.seconds.size(); ++i) {
            soFar.seconds.push_back(history.seconds[i]);
            soFar.intervals.push_back(history.intervals[i]);
            if (history.intervals[i] == line.intervals().size()) line.closeInterval();
            line.count(history.seconds[i]);
            ASSERT_EQ(line.intervals(), modelCounts(GetParam(), soFar)) << "after second " << i;
            ASSERT_EQ(line.unavailable(),
                      unavailableSeconds(severeSeconds(GetParam(), soFar)).back())
                << "after second " << i;
        }
    }
}

INSTANTIATE_TEST_SUITE_P(Formats, LinePerformanceHistoryTest,
                         testing::Values(LineFormat::esf, LineFormat::d4, LineFormat::e1,
                                         LineFormat::e1Crc),
                         testing::PrintToStringParamName());

} // namespace
