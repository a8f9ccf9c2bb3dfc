// SPDX-License-Identifier: BSD-2-Clause
// Random sequences of everything that can happen to conditions, held against a model that is
// written differently: it keeps the whole past of every condition and works every answer out anew.
#include <algorithm>
#include <map>
#include <random>
#include <set>
#include <vector>

#include <gtest/gtest.h>

#include "agent/alarms/AlarmList.h"

namespace kvloamd {
namespace {

using Seconds = int;

constexpr Seconds kWindow = 60;
constexpr Seconds kRaiseHold = 4;
constexpr Seconds kClearHold = 7;

/// A `PastOfOne` is everything that has happened to one condition.
class PastOfOne {
  public:
    PastOfOne(Seconds raiseHold, Seconds clearHold)
        : m_raiseHold(raiseHold), m_clearHold(clearHold) {}

    void set(bool present, Seconds now) {
        if (present == isPresent()) return;
        m_edges.push_back(now);
        settle(now, true);
    }
    bool isPresent() const { return m_edges.size() % 2 == 1; }
    /// The list looks at an alarm when something happens and when a hold time ends, never between
    /// these.
    void settle(Seconds now, bool edge = false) {
        Seconds const lasted = m_edges.empty() ? 0 : now - m_edges.back();
        if (isPresent()) {
            if (edge) ++m_count;
            if (edge && beginningsSince(now) >= 3) m_flaps = true;
            if (!m_raised && (m_flaps || lasted >= m_raiseHold)) m_raised = true;
            return;
        }
        if (edge && beginningsSince(now) < 3) m_flaps = false;
        if (m_raised && lasted >= (m_flaps ? std::max(m_clearHold, kWindow) : m_clearHold)) {
            m_raised = m_flaps = false;
            m_accounted += m_count;
            m_count = 0;
        }
        if (!m_raised && !m_edges.empty() && lasted >= kWindow) {
            m_suppressed += m_count;
            m_count = 0;
            m_flaps = false;
            m_forgotten = m_edges.size();
        }
    }
    bool isRaised() const { return m_raised; }
    unsigned count() const { return m_count; }
    unsigned beginnings() const { return static_cast<unsigned>((m_edges.size() + 1) / 2); }
    unsigned suppressed() const { return m_suppressed; }
    unsigned accounted() const { return m_accounted; }

  private:
    /// Within the window before `now`, and since the condition was last forgotten.
    int beginningsSince(Seconds now) const {
        int beginnings = 0;
        for (std::size_t i = 0; i < m_edges.size(); i += 2)
            if (i >= m_forgotten && now - m_edges[i] < kWindow) ++beginnings;
        return beginnings;
    }

    Seconds m_raiseHold;
    Seconds m_clearHold;
    std::vector<Seconds> m_edges; ///< beginning, end, beginning ...
    std::size_t m_forgotten = 0;
    bool m_raised = false;
    bool m_flaps = false;
    unsigned m_count = 0;
    unsigned m_suppressed = 0;
    unsigned m_accounted = 0;
};

class AlarmListModelTest : public ::testing::TestWithParam<unsigned> {
  protected:
    static constexpr int kConditions = 6;

    AlarmListModelTest() {
        AlarmPolicies policies;
        EXPECT_EQ(policies.configure("dsx1RcvAIS=major,raise=4,clear=7"), "");
        m_list.apply(policies, at(0));
        for (int i = 0; i < kConditions; ++i)
            m_past.emplace_back(i % 2 == 0 ? 0 : kRaiseHold, i % 2 == 0 ? 0 : kClearHold);
    }
    static Instant at(Seconds now) {
        return {Clock::time_point(std::chrono::seconds(1000 + now)),
                std::chrono::system_clock::time_point(std::chrono::seconds(now))};
    }
    static Condition condition(int i) {
        return {{i % 2 == 0 ? AlarmKind::LineLossOfSignal : AlarmKind::LineRcvAIS, "S",
                 static_cast<std::uint32_t>(i)},
                "a line",
                1,
                static_cast<std::uint32_t>(i),
                {},
                {}};
    }
    int any(int below) { return std::uniform_int_distribution(0, below - 1)(m_random); }

    void advance(Seconds by) {
        // One second at a time: the model has no deadlines, and looks every second.
        for (Seconds i = 0; i < by; ++i) {
            ++m_now;
            m_list.advance(at(m_now));
            for (PastOfOne& past : m_past)
                past.settle(m_now);
        }
    }
    void compareAll() {
        std::vector<Condition> present;
        for (int i = 0; i < kConditions; ++i) {
            bool const now = any(2) == 0;
            if (now) present.push_back(condition(i));
            m_past[static_cast<std::size_t>(i)].set(now, m_now);
        }
        m_list.compare(AlarmScope::Snapshot, present, at(m_now).steady, at(m_now));
    }
    void setOne() {
        int const i = any(kConditions);
        bool const present = any(2) == 0;
        if (present)
            m_list.begin(condition(i), at(m_now));
        else
            m_list.end(condition(i).key, at(m_now));
        m_past[static_cast<std::size_t>(i)].set(present, m_now);
    }
    void expectAgreement() {
        std::map<AlarmKey, unsigned> active;
        for (Alarm const& alarm : m_list.active())
            active[alarm.condition.key] = alarm.count;
        std::map<AlarmKey, unsigned> expected;
        AlarmList::Counts sums;
        unsigned accounted = 0;
        for (int i = 0; i < kConditions; ++i) {
            PastOfOne const& past = m_past[static_cast<std::size_t>(i)];
            if (past.isRaised()) expected[condition(i).key] = past.count();
            sums.begun += past.beginnings();
            sums.suppressed += past.suppressed();
            accounted += past.accounted() + past.count();
        }
        ASSERT_EQ(active, expected);
        AlarmList::Counts const counts = m_list.counts();
        ASSERT_EQ(counts.begun, sums.begun);
        ASSERT_EQ(counts.suppressed, sums.suppressed);
        ASSERT_EQ(counts.begun, accounted + sums.suppressed) << "nothing is lost";
        ASSERT_EQ(counts.raised - counts.cleared, active.size());
    }

    std::mt19937 m_random{GetParam()};
    Seconds m_now = 0;
    AlarmList m_list{{}, [](AlarmEvent, Alarm const&) { return 1U; }};
    std::vector<PastOfOne> m_past;
};

TEST_P(AlarmListModelTest, RandomChangesGiveWhatTheModelSays) {
    for (int step = 0; step < 2000; ++step) {
        switch (any(6)) {
        case 0:
            advance(1 + any(3));
            break;
        case 1:
            if (any(4) == 0) advance(any(90));
            break;
        case 2:
            if (any(5) == 0) compareAll();
            break;
        default:
            setOne();
            break;
        }
        ASSERT_NO_FATAL_FAILURE(expectAgreement()) << "seed " << GetParam() << ", step " << step;
    }
}

INSTANTIATE_TEST_SUITE_P(Seeds, AlarmListModelTest, ::testing::Range(1U, 21U));

} // namespace
} // namespace kvloamd
