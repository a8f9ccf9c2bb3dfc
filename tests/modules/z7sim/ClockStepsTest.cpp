// SPDX-License-Identifier: BSD-2-Clause
// A line's history while the system's clock is set at random and data goes missing, against a model
// that knows which readings there were.
#include <cstddef>
#include <cstdint>

#include <algorithm>
#include <memory>
#include <random>
#include <vector>

#include <gtest/gtest.h>

#include "LineClocks.h"
#include "Z7SimIntervalTable.h"
#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"
#include "tests/support/StillLineScheduler.h"

namespace {

constexpr long kDay = 86'400;

/// The process's scheduler on a system's clock that the test sets. It calls everybody once for each
/// second that the clock shows, as the real one does.
class SystemScheduler final : public ActionScheduler_pthread {
  public:
    static SystemScheduler& install() {
        static auto* const scheduler = new SystemScheduler;
        s_actionScheduler = scheduler;
        return *scheduler;
    }
    void catchUp() {
        for (int passes = 0; passes < 2 * kDay && s_system >= m_nextWakeUp; ++passes)
            run_pass(s_system);
    }

    static inline long s_system = 0;

  private:
    SystemScheduler() : ActionScheduler_pthread([] { return s_system; }) {}
    ~SystemScheduler() override = default;
};

class ScriptedLine final : public LineSource {
  public:
    bool read(DS1LineCounters& counters) override {
        if (!answers) return false;
        counters = state;
        return true;
    }
    void pass(long seconds) {
        state.seconds += static_cast<std::uint32_t>(seconds);
        state.pathCodeViolations += static_cast<std::uint32_t>(seconds * errorsPerSecond);
        if (state.alarms == 0) return;
        state.lossOfSignalSeconds += static_cast<std::uint32_t>(seconds);
        state.outOfFrameSeconds += static_cast<std::uint32_t>(seconds);
    }
    void restart() {
        std::uint32_t const alarms = state.alarms;
        state = {};
        state.alarms = alarms;
    }

    bool answers = true;
    int errorsPerSecond = 0;
    DS1LineCounters state{};
};

/// The line's real time, second by second.
class Model {
  public:
    /// So many seconds pass, of which only the last can have been seen: it was when its beginning
    /// and its end were read.
    void pass(long seconds, bool read, bool restarted) {
        for (long i = 1; i < seconds; ++i)
            m_seen.push_back(false);
        m_seen.push_back(seconds == 1 && m_lastRead && read && !restarted);
        m_lastRead = read;
        m_seenInARow = m_seen.back() ? m_seenInARow + 1 : 0;
    }
    std::size_t closed() const { return m_seen.empty() ? 0 : (m_seen.size() - 1) / 900; }
    std::size_t elapsed() const { return m_seen.size() - 900 * closed(); }
    /// `n` as in the table.
    bool isValid(std::size_t n) const {
        if (n > closed() || n > 95) return false;
        auto const begin = m_seen.begin() + static_cast<std::ptrdiff_t>(900 * (closed() - n));
        auto const end = n == 0 ? m_seen.end() : begin + 900;
        return std::find(begin, end, false) == end;
    }
    int seenInARow() const { return m_seenInARow; }
    void breakRow() { m_seenInARow = 0; }

  private:
    std::vector<bool> m_seen;
    bool m_lastRead = true;
    int m_seenInARow = 0;
};

class World {
  public:
    explicit World(unsigned seed) : m_random(seed) {
        SystemScheduler::s_system = 1'795'000'000;
        s_monotonic = 1000;
        // Seconds with errors are counted in another way than clean ones.
        m_line->errorsPerSecond = seed % 2 == 0 ? 2 : 0;
        m_lines.pass(s_monotonic);
        m_table = ReferenceCounter<DS1IntervalTable>(
            new Z7SimIntervalTable(LineFormat::esf, {}, m_line, m_state, {}));
    }

    /// Something happens, and some time passes.
    void step() {
        switch (one(12)) {
        case 0:
            setClock();
            break;
        case 1: // the platform does not answer
            m_line->answers = false;
            run(between(1, one(4) == 0 ? 3000 : 20));
            m_line->answers = true;
            break;
        case 2: // the process is stopped
            leave(between(2, one(4) == 0 ? 200'000 : 1000), true);
            break;
        case 3: // the host is suspended
            leave(between(3, one(4) == 0 ? 10'000 : 100), false);
            break;
        case 4: // the line begins anew; a line that has just begun would not show it
            if (m_line->state.seconds < 2) return;
            m_line->restart();
            second(1, true, true);
            break;
        case 5:
        case 6:
            m_line->state.alarms ^= kDS1AlarmLossOfSignal;
            m_model.breakRow();
            break;
        case 7: // the clock runs away for a while
            for (long left = between(1, 50); left > 0; --left) {
                setClock();
                second(1, true, false);
            }
            break;
        default:
            run(between(1, one(3) == 0 ? 4000 : 300));
            break;
        }
        check();
    }

    int valid = 0;
    int invalid = 0;
    int changes = 0;

    static inline long s_monotonic = 0;

  private:
    std::size_t one(std::size_t of) { return m_random() % of; }
    long between(long least, long most) {
        return std::uniform_int_distribution<long>(least, most)(m_random);
    }

    void setClock() {
        long& system = SystemScheduler::s_system;
        switch (one(6)) {
        case 0:
            system += between(-10, 10);
            break;
        case 1:
            system += one(2) == 0 ? 3600 : -3600;
            break;
        case 2:
            system += kDay * between(1, 3);
            break;
        case 3:
            system -= kDay * between(1, 3);
            break;
        case 4:
            system = between(1, 1000); // 1970
            break;
        default:
            system = 1'795'000'000 + between(0, kDay);
            break;
        }
        system = std::max(system, 1L);
    }

    void run(long seconds) {
        for (; seconds > 0; --seconds)
            second(1, true, false);
    }
    /// No pass is made for so many seconds; then one.
    void leave(long seconds, bool monotonicGoesOn) { second(seconds, monotonicGoesOn, false); }

    void second(long seconds, bool monotonicGoesOn, bool restarted) {
        SystemScheduler::s_system += seconds;
        s_monotonic += monotonicGoesOn ? seconds : 1;
        m_line->pass(seconds);
        int const before = m_state->status();
        m_lines.pass(s_monotonic);
        m_system.catchUp();
        m_model.pass(seconds, m_line->answers, restarted);
        if (m_state->status() != before) {
            m_changedAt = s_monotonic;
            ++changes;
        }
    }

    void check() {
        auto& table = *m_table.get();
        auto& validity = dynamic_cast<DS1IntervalValidity&>(table);
        ASSERT_EQ(table.GetTimeElapsed(), static_cast<int>(m_model.elapsed()));
        ASSERT_EQ(table.GetValidIntervals(),
                  static_cast<int>(
                      std::min<std::size_t>(m_model.closed() > 95 ? 96 : m_model.closed(), 96)));
        ASSERT_EQ(validity.GetIntervalsClosed(), static_cast<int>(m_model.closed()));
        for (std::size_t n = 0; n <= 96; ++n) {
            int const interval = static_cast<int>(n);
            bool const isValid = validity.IsIntervalValid(interval);
            ASSERT_EQ(isValid, m_model.isValid(n)) << n;
            ++(isValid ? valid : invalid);
            int const errors = table.GetPathCodingViolations(interval);
            // Every second has as many errors; an unavailable one does not count them.
            int const most =
                m_line->errorsPerSecond * (900 - table.GetUnavailableSeconds(interval));
            if (isValid && n > 1) {
                ASSERT_EQ(errors, most) << n;
            }
            ASSERT_LE(errors, most) << n;
        }
        checkStatus();
    }

    void checkStatus() {
        bool const cut = (m_line->state.alarms & kDS1AlarmLossOfSignal) != 0;
        int const status = m_state->status();
        if (m_model.seenInARow() > 20) {
            ASSERT_EQ((status & DS1LineStatusLossOfSignal) != 0, cut);
            ASSERT_EQ(status == DS1LineStatusNoAlarm, !cut);
        }
        if (m_changedAt == 0) return;
        // The system's clock has gone on by that much since, whatever it was set to.
        long const ago = SystemScheduler::s_system - m_state->lastChange();
        ASSERT_LE(std::abs(ago - (s_monotonic - m_changedAt)), 1);
    }

    std::minstd_rand m_random;
    SystemScheduler& m_system = SystemScheduler::install();
    StillLineScheduler& m_lines = StillLineScheduler::install();
    std::shared_ptr<ScriptedLine> m_line = std::make_shared<ScriptedLine>();
    std::shared_ptr<LineState> m_state = std::make_shared<LineState>();
    ReferenceCounter<DS1IntervalTable> m_table;
    Model m_model;
    long m_changedAt = 0;
};

TEST(ClockStepsTest, IntervalsAreValidExactlyWhenTheyMissedNothing) {
    LineClocks const own = LineClocks::inUse();
    LineClocks::inUse() = {[] { return SystemScheduler::s_system; },
                           [] { return World::s_monotonic; }};
    int valid = 0;
    int invalid = 0;
    int changes = 0;
    for (unsigned seed = 1; seed <= 60; ++seed) {
        SCOPED_TRACE(seed);
        World world(seed);
        for (int step = 0; step < 150; ++step) {
            world.step();
            ASSERT_FALSE(testing::Test::HasFatalFailure()) << "in step " << step;
        }
        valid += world.valid;
        invalid += world.invalid;
        changes += world.changes;
    }
    LineClocks::inUse() = own;
    EXPECT_GT(valid, 50'000);
    EXPECT_GT(invalid, 100'000);
    EXPECT_GT(changes, 500);
}

} // namespace
