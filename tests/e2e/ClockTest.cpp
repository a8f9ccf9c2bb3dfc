// SPDX-License-Identifier: BSD-2-Clause
// The host's clock is set while the agent runs.
#include <cstdint>
#include <fstream>
#include <stdexcept>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

constexpr char kSysUpTime[] = "1.3.6.1.2.1.1.3.0";
constexpr char kOperStatus[] = "1.3.6.1.2.1.2.2.1.8.1000";
constexpr char kIfLastChange[] = "1.3.6.1.2.1.2.2.1.9.1000";
constexpr char kLineLastChange[] = "1.3.6.1.2.1.10.18.6.1.16.1000";
constexpr char kTimeElapsed[] = "1.3.6.1.2.1.10.18.6.1.3.1000";
constexpr char kValidIntervals[] = "1.3.6.1.2.1.10.18.6.1.4.1000";
constexpr char kIntervals[] = "1.3.6.1.2.1.10.18.8";
constexpr char kUp[] = "INTEGER: 1";
constexpr char kDown[] = "INTEGER: 2";
constexpr unsigned long kSecond = 100;  ///< as TimeTicks
constexpr unsigned long kHour = 360000; ///< as TimeTicks; no test takes so long

class ClockTest : public AgentFixture {
  protected:
    ClockTest() {
        stepTo(0);
        setVariable("HOOK_CLOCK", path("clock"));
        setVariable("Z7SIM_FAILURE_CLEARING", "1");
    }
    /// The host's clock is now this many seconds ahead of what it was.
    void stepTo(std::int64_t seconds) const {
        // In one operation, and in place, because the agent has mapped the file.
        std::fstream file(path("clock"), std::ios::in | std::ios::out | std::ios::binary);
        if (!file.is_open()) file.open(path("clock"), std::ios::out | std::ios::binary);
        file.write(reinterpret_cast<char const*>(&seconds), sizeof seconds);
        file.flush();
        ASSERT_TRUE(file.good());
    }
    /// The number in an answer such as "Timeticks: (518) 0:00:05.18" or "INTEGER: 4".
    unsigned long number(std::string const& name) const {
        std::string const value = get(name);
        auto const at = value.find_first_of("0123456789");
        if (at == std::string::npos) throw std::runtime_error(name + ": " + value);
        return std::stoul(value.substr(at));
    }
    bool becomes(char const* status) {
        return eventually([&] { return get(kOperStatus) == status; });
    }
    /// The line's interface has changed between the two readings of sysUpTime. It changes at the
    /// beginning of the first second that is unavailable or available. A line counts whole seconds
    /// of its own, so that this may be two seconds earlier.
    void expectChangedBetween(unsigned long before, unsigned long after) const {
        for (char const* const name : {kIfLastChange, kLineLastChange}) {
            unsigned long const when = number(name);
            EXPECT_GE(when + 2 * kSecond, before) << name;
            EXPECT_LE(when, after) << name;
        }
    }
};

TEST_F(ClockTest, StepsOfTheClockMoveNoTimes) {
    setVariable("LD_PRELOAD", HOOKS);
    startAgent();
    setVariable("LD_PRELOAD", "");
    ASSERT_TRUE(eventually([this] { return get(kValidIntervals) == "INTEGER: 96"; }));
    // The intervals of the first line; those of the others begin behind.
    auto const history = walk(kIntervals);
    ASSERT_FALSE(history.empty());
    unsigned long const begun = number(kSysUpTime);
    unsigned long const elapsed = number(kTimeElapsed);
    for (std::int64_t const step : {std::int64_t{7200}, std::int64_t{-172800}, std::int64_t{5}}) {
        SCOPED_TRACE(step);
        stepTo(step);
        unsigned long const before = number(kSysUpTime);
        EXPECT_GE(before, begun);
        sim({"line", "alarm", "101", "los"});
        ASSERT_TRUE(becomes(kDown));
        expectChangedBetween(before, number(kSysUpTime));
        unsigned long const between = number(kSysUpTime);
        sim({"line", "mend", "101"});
        ASSERT_TRUE(becomes(kUp));
        expectChangedBetween(between, number(kSysUpTime));
        EXPECT_LT(number(kSysUpTime), begun + kHour);
        EXPECT_LT(number("kvlAgentUpTime.0"), begun + kHour);
        EXPECT_LT(number("kvlSnapshotAge.0"), 60000U);
    }
    // Neither an interval was closed, nor is one missing.
    EXPECT_EQ(get(kValidIntervals), "INTEGER: 96");
    EXPECT_GE(number(kTimeElapsed), elapsed);
    EXPECT_EQ(walk(kIntervals), history);
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

} // namespace
} // namespace kvloamd::e2e
