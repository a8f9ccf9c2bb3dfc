// SPDX-License-Identifier: BSD-2-Clause
// Random histories of a line, against a model that looks at each of them as a whole.
#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <optional>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "LinePerformance.h"
#include "tests/modules/z7sim/CountedLine.h"

namespace {

struct History {
    std::vector<LineSecond> seconds;
    std::vector<std::size_t> intervals; ///< of each second
    FailureTimes times;
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
    if (format == LineFormat::e1) return second.lineCodeViolations >= 2048;
    return path >= 832 || withoutFrame(second);
}

std::vector<bool> severeSeconds(LineFormat format, History const& history) {
    std::vector<bool> severe;
    for (auto const& second : history.seconds)
        severe.push_back(modelSevere(format, second));
    return severe;
}

/// What a line's seconds show of one defect.
struct DefectSeconds {
    std::vector<bool> present;
    std::vector<bool> lasting; ///< still there at the second's end
};

std::vector<DefectSeconds> defectSeconds(History const& history) {
    std::vector<DefectSeconds> defects(3);
    for (auto const& second : history.seconds) {
        bool const signal = second.lossOfSignal && !second.ended.lossOfSignal;
        bool const frame = second.outOfFrame && !second.ended.outOfFrame;
        defects[0].present.push_back(second.lossOfSignal);
        defects[0].lasting.push_back(signal);
        defects[1].present.push_back(withoutFrame(second));
        defects[1].lasting.push_back(signal || frame);
        defects[2].present.push_back(second.alarmIndication);
        defects[2].lasting.push_back(second.alarmIndication && !second.ended.alarmIndication);
    }
    return defects;
}

/// A failure, from the second that declares it to the one that clears it; both are indices, and so
/// is the second of its defect's onset.
struct ModelFailure {
    std::size_t onset;
    std::size_t declared;
    std::size_t cleared;
};

/// The failures of one defect: looks for each declaration, and from there for its end.
std::vector<ModelFailure> modelFailures(DefectSeconds const& defect, FailureTimes const& times) {
    auto const declaration = static_cast<std::size_t>(times.declaration);
    auto const clearing = static_cast<std::size_t>(times.clearing);
    std::size_t const size = defect.present.size();
    std::vector<ModelFailure> failures;
    for (std::size_t onset = 0; onset + declaration < size;) {
        auto const at = [&](std::size_t i) {
            return defect.lasting.begin() + static_cast<std::ptrdiff_t>(i);
        };
        if (std::find(at(onset), at(onset + declaration + 1), false) !=
            at(onset + declaration + 1)) {
            ++onset;
            continue;
        }
        std::size_t const declared = onset + declaration;
        std::size_t cleared = declared + 1;
        for (std::size_t without = 0; cleared < size; ++cleared) {
            without = defect.present[cleared] ? 0 : without + 1;
            if (!defect.lasting[cleared] && without >= clearing) break;
        }
        failures.push_back({onset, declared, cleared});
        onset = cleared + 1;
    }
    return failures;
}

/// Decision by decision: searches where the line becomes unavailable next, and where it is
/// available again.
std::vector<bool> unavailableSeconds(History const& history, std::vector<bool> const& severe) {
    std::size_t const size = severe.size();
    auto const defects = defectSeconds(history);
    std::vector<std::vector<ModelFailure>> failures;
    std::vector<bool> failing(size, false);   // a failure is declared
    std::vector<bool> sustained(size, false); // and its defect is there
    for (auto const& defect : defects) {
        failures.push_back(modelFailures(defect, history.times));
        for (auto const& failure : failures.back())
            for (std::size_t i = failure.declared; i < failure.cleared; ++i) {
                failing[i] = true;
                if (defect.present[i]) sustained[i] = true;
            }
    }
    // The first unavailable second, if the line turns out to be unavailable in second `i`.
    auto const lostFrom = [&](std::size_t i) -> std::optional<std::size_t> {
        std::optional<std::size_t> from;
        if (i >= 9 && std::all_of(severe.begin() + static_cast<std::ptrdiff_t>(i) - 9,
                                  severe.begin() + static_cast<std::ptrdiff_t>(i) + 1,
                                  [](bool each) { return each; }))
            from = i - 9;
        for (auto const& kind : failures)
            for (auto const& failure : kind) {
                if (failure.declared != i) continue;
                std::size_t first = failure.onset;
                while (first > 0 && severe[first - 1])
                    --first;
                from = std::min(first, from.value_or(first));
            }
        return from;
    };
    std::vector<bool> result(size, false);
    for (std::size_t i = 0; i < size; ++i) {
        std::optional<std::size_t> const from = lostFrom(i);
        if (!from) continue;
        std::size_t good = 0; // seconds in a row
        std::size_t end = i + 1;
        for (; end < size; ++end) {
            good = severe[end] || sustained[end] ? 0 : good + 1;
            if (good >= 10 && !failing[end]) break;
        }
        std::size_t const until = end == size ? size : end + 1 - good;
        for (std::size_t second = *from; second < until; ++second)
            result[second] = true;
        i = end;
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
    std::vector<bool> const unavailable = unavailableSeconds(history, severe);
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
        std::size_t const longest = one(4) == 0 ? 900 : 25 + one(50);
        for (std::size_t i = 0; history.intervals.size() < history.seconds.size(); ++i)
            history.intervals.insert(history.intervals.end(), between(24, longest), i);
        history.intervals.resize(history.seconds.size());
        if (one(2) == 0)
            history.times = {static_cast<int>(between(2, 9)), static_cast<int>(one(20))};
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
            return between(1, 6);
        case 1:
        case 2:
            return between(8, 12);
        default:
            return between(13, 150);
        }
    }

    void addRun(std::vector<LineSecond>& seconds) {
        std::uint32_t const kind = one(15);
        std::uint32_t const restless = one(3) == 0 ? 3 : 30; // how rarely a defect ends
        for (std::uint32_t left = runLength(); left > 0; --left) {
            seconds.push_back(second(kind));
            LineSecond& last = seconds.back();
            last.ended = {last.lossOfSignal && one(restless) == 0,
                          last.outOfFrame && one(restless) == 0,
                          last.alarmIndication && one(restless) == 0};
        }
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
        case 11:
            return {.outOfFrame = true};
        case 12: // on and off
            return {.pathCodeViolations = one(2), .outOfFrame = one(4) != 0};
        case 13: // severe in every format
            return {.lineCodeViolations = 2048, .pathCodeViolations = 832, .framingErrors = 1};
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
    int lostEarly = 0;            ///< times fewer than ten seconds made the line unavailable
    int lostLate = 0;             ///< and more than ten
    int minutesTakenByLoss = 0;   ///< degraded minutes that were none after all
};

void note(LinePerformance::Change const& change, Seen& seen) {
    if (change.previous.unavailableSeconds > 0) ++seen.lostAcrossBorder;
    if (change.previous.unavailableSeconds < 0) ++seen.returnedAcrossBorder;
    bool const returned =
        change.running.unavailableSeconds < 0 || change.previous.unavailableSeconds < 0;
    if (returned) seen.minutesGivenByReturn += change.running.degradedMinutes;
    if (change.previous.degradedMinutes > 0) ++seen.minutesGivenByReturn;
    if (change.running.degradedMinutes < 0 || change.previous.degradedMinutes < 0)
        ++seen.minutesTakenByLoss;
    int const lost = change.running.unavailableSeconds + change.previous.unavailableSeconds;
    if (lost > 1 && lost < 10) ++seen.lostEarly;
    if (lost > 10) ++seen.lostLate;
}

class LinePerformanceHistoryTest : public testing::TestWithParam<LineFormat> {};

TEST_P(LinePerformanceHistoryTest, ChangesAddUpToTheCountsOfTheWholeHistory) {
    Histories histories(495 + static_cast<unsigned>(GetParam()));
    Seen seen;
    for (int round = 0; round < 2000 && !HasFailure(); ++round) {
        SCOPED_TRACE(round);
        History const history = histories.next(200 + static_cast<std::size_t>(round % 1000));
        CountedLine line(GetParam(), history.times);
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
    EXPECT_GT(seen.lostEarly, 100);
    // A defect that is always severe makes the line unavailable with its tenth second at the
    // latest.
    if (GetParam() != LineFormat::esf) {
        EXPECT_GT(seen.lostLate, 10);
    }
    // Only here has an available line defects for seconds that are not severely errored.
    if (GetParam() == LineFormat::e1) {
        EXPECT_GT(seen.minutesTakenByLoss, 10);
    }
}

TEST_P(LinePerformanceHistoryTest, CountsAreRightAfterEverySecond) {
    Histories histories(2495 + static_cast<unsigned>(GetParam()));
    for (int round = 0; round < 20 && !HasFailure(); ++round) {
        SCOPED_TRACE(round);
        History const history = histories.next(250);
        CountedLine line(GetParam(), history.times);
        History soFar;
        soFar.times = history.times;
        for (std::size_t i = 0; i < history.seconds.size(); ++i) {
            soFar.seconds.push_back(history.seconds[i]);
            soFar.intervals.push_back(history.intervals[i]);
            if (history.intervals[i] == line.intervals().size()) line.closeInterval();
            line.count(history.seconds[i]);
            ASSERT_EQ(line.intervals(), modelCounts(GetParam(), soFar)) << "after second " << i;
            ASSERT_EQ(line.unavailable(),
                      unavailableSeconds(soFar, severeSeconds(GetParam(), soFar)).back())
                << "after second " << i;
        }
    }
}

/// `countClean` is a shorter way for seconds of which nothing was counted, and leaves no trace.
TEST_P(LinePerformanceHistoryTest, CleanSecondIsTheSameAsOneThatIsCounted) {
    Histories histories(4805 + static_cast<unsigned>(GetParam()));
    std::mt19937 random(7);
    int taken = 0;
    for (int round = 0; round < 60 && !HasFailure(); ++round) {
        SCOPED_TRACE(round);
        History const history = histories.next(250);
        LinePerformance longer(GetParam(), history.times);
        LinePerformance shorter(GetParam(), history.times);
        auto const count = [&](LineSecond const& second, bool isClean) {
            LinePerformance::Change const expected = longer.count(second);
            LinePerformance::Change change;
            if (isClean && shorter.countClean())
                ++taken;
            else
                change = shorter.count(second);
            ASSERT_EQ(change.running, expected.running);
            ASSERT_EQ(change.previous, expected.previous);
            ASSERT_EQ(shorter.unavailable(), longer.unavailable());
            ASSERT_EQ(shorter.failures(), longer.failures());
        };
        for (LineSecond const& second : history.seconds) {
            count(second, false);
            for (std::size_t clean = random() % 20 == 0 ? random() % 150 : 0; clean > 0; --clean)
                count(LineSecond(), true);
        }
    }
    EXPECT_GT(taken, 10'000);
}

INSTANTIATE_TEST_SUITE_P(Formats, LinePerformanceHistoryTest,
                         testing::Values(LineFormat::esf, LineFormat::d4, LineFormat::e1,
                                         LineFormat::e1Crc),
                         testing::PrintToStringParamName());

} // namespace
