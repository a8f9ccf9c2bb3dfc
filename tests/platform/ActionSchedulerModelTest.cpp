// SPDX-License-Identifier: BSD-2-Clause
// The scheduler compared with a plain model of its rules, and with many entries.
#include <cstddef>
#include <ctime>

#include <algorithm>
#include <array>
#include <limits>
#include <map>
#include <new>
#include <random>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "platform/ActionScheduler_pthread.h"

namespace {

constexpr long kLast = std::numeric_limits<long>::max();
constexpr long k2038 = 0x7FFFFFFF; ///< the last second of 32-bit time

long s_now = 0;

/// A scheduler without a thread. The test wakes it.
class DrivenScheduler final : public ActionScheduler_pthread {
  public:
    DrivenScheduler() : ActionScheduler_pthread([] { return s_now; }) {}

    void wakeAt(long time) {
        s_now = time;
        run_pass(time);
    }
    long nextWakeUp() const { return m_nextWakeUp; }
};

/// Appends its name to the test's record when it is called.
class Action final : public Schedulable {
  public:
    Action(char name, std::string& record) : m_name(name), m_record(record) {}
    int ScheduledAction() override {
        m_record += m_name;
        return 0;
    }
    char name() const { return m_name; }

  private:
    char m_name;
    std::string& m_record;
};

/// A `Model` follows the rules of the scheduler literally, one entry after the other.
class Model {
  public:
    explicit Model(std::string& record) : m_record(record) {}

    int addPeriodic(char name, long period) {
        return add(name, period >= 1 ? sum(s_now, period) : 0, period);
    }
    int addOneTimeAction(char name, long when) { return add(name, when, 0); }
    int remove(char name) {
        auto const found = find(name);
        if (found == m_list.end()) return 1;
        m_list.erase(found);
        return 0;
    }
    int changePeriod(char name, long period) {
        auto const found = find(name);
        if (found == m_list.end() || found->second.period < 1 || found->second.period == period)
            return 1;
        long const due = sum(found->first, sum(period, -found->second.period));
        m_list.erase(found);
        m_list.insert({due, {name, period}});
        return 0;
    }
    void wakeAt(long now) {
        if (now < m_nextWakeUp) {
            if (!m_list.empty()) m_nextWakeUp = m_list.begin()->first;
        } else {
            m_nextWakeUp = kLast;
            std::vector<std::pair<long, Entry>> again;
            while (!m_list.empty() && m_list.begin()->first <= now) {
                auto const [due, entry] = *m_list.begin();
                m_record += entry.name;
                if (entry.period > 0) {
                    again.emplace_back(sum(due, entry.period), entry);
                    m_nextWakeUp = std::min(m_nextWakeUp, again.back().first);
                }
                m_list.erase(m_list.begin());
            }
            m_list.insert(again.begin(), again.end());
        }
        if (m_list.empty()) m_nextWakeUp = kLast;
    }
    long nextWakeUp() const { return m_nextWakeUp; }

  private:
    struct Entry {
        char name;
        long period;
    };
    using List = std::multimap<long, Entry>;

    static long sum(long time, long seconds) {
        if (seconds > 0 && time > kLast - seconds) return kLast;
        if (seconds < 0 && time < std::numeric_limits<long>::min() - seconds)
            return std::numeric_limits<long>::min();
        return time + seconds;
    }
    int add(char name, long due, long period) {
        if (find(name) != m_list.end()) return 1;
        m_list.insert({due, {name, period}});
        return 0;
    }
    List::iterator find(char name) {
        return std::find_if(m_list.begin(), m_list.end(),
                            [=](auto const& item) { return item.second.name == name; });
    }

    std::string& m_record;
    List m_list;
    long m_nextWakeUp = kLast;
};

/// A `RandomDrive` applies the same random operations to a scheduler and to the model, and compares
/// the results.
class RandomDrive {
  public:
    explicit RandomDrive(unsigned seed) : m_random(seed) {
        s_now = 1000;
        for (char name = 'a'; name <= 'z'; ++name)
            m_actions.emplace_back(name, m_record);
    }

    void step() {
        Action& action = m_actions[pick(m_actions.size())];
        switch (pick(8)) {
        case 0:
        case 1: {
            long const period = kPeriods[pick(kPeriods.size())];
            EXPECT_EQ(m_scheduler.AddPeriodic(&action, period),
                      m_model.addPeriodic(action.name(), period));
            break;
        }
        case 2: {
            long const when = s_now + static_cast<long>(pick(6)) - 2;
            EXPECT_EQ(m_scheduler.AddOneTimeAction(&action, when),
                      m_model.addOneTimeAction(action.name(), when));
            break;
        }
        case 3:
            EXPECT_EQ(m_scheduler.Remove(&action), m_model.remove(action.name()));
            break;
        case 4: {
            long const period = kPeriods[pick(kPeriods.size())];
            EXPECT_EQ(m_scheduler.ChangePeriod(&action, period),
                      m_model.changePeriod(action.name(), period));
            break;
        }
        default:
            wake();
        }
    }

  private:
    static constexpr std::array<long, 10> kPeriods{-1, 0, 1, 1, 1, 2, 2, 3, 7, kLast};

    std::size_t pick(std::size_t choices) { return m_random() % choices; }

    /// Most often the next second; now and then the clock is set.
    void wake() {
        static constexpr std::array<long, 8> kSteps{0, 1, 1, 1, 1, 2, 30, -5};
        long const now = s_now + kSteps[pick(kSteps.size())];
        m_scheduler.wakeAt(now);
        std::string const called = std::exchange(m_record, "");
        m_model.wakeAt(now);
        EXPECT_EQ(called, std::exchange(m_record, ""));
        EXPECT_EQ(m_scheduler.nextWakeUp(), m_model.nextWakeUp());
    }

    std::minstd_rand m_random;
    std::string m_record;
    std::vector<Action> m_actions;
    DrivenScheduler m_scheduler;
    Model m_model{m_record};
};

TEST(ActionSchedulerModelTest, SchedulerDoesWhatItsRulesSay) {
    for (unsigned seed = 1; seed <= 40 && !testing::Test::HasFailure(); ++seed) {
        SCOPED_TRACE(seed);
        RandomDrive drive(seed);
        for (int i = 0; i < 2000 && !testing::Test::HasFailure(); ++i)
            drive.step();
    }
}

class Idle final : public Schedulable {
  public:
    int ScheduledAction() override { return 0; }
};

/// The processor time of this thread, in seconds.
double processorTime() {
    timespec time{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
}

/// The time to enter `count` entries of one period before an entry that is due later, and to remove
/// them in the same order.
double timeOfEntries(std::size_t count) {
    s_now = 1000;
    std::vector<Idle> targets(count);
    Idle other;
    DrivenScheduler scheduler;
    scheduler.AddPeriodic(&other, 900);
    double const start = processorTime();
    for (Idle& target : targets)
        scheduler.AddPeriodic(&target, 1);
    for (Idle& target : targets)
        scheduler.Remove(&target);
    return processorTime() - start;
}

TEST(ActionSchedulerModelTest, TimeOfEntryAndRemovalDoesNotGrowWithTheList) {
    double small = 1e9, large = 1e9;
    for (int i = 0; i < 3; ++i) {
        small = std::min(small, timeOfEntries(500));
        large = std::min(large, timeOfEntries(50000));
    }
    // A hundred times as many take a hundred times as long. With a search through the list, they
    // would take ten thousand times as long.
    EXPECT_LT(large, 1000 * small);
}

#if __SIZEOF_LONG__ > 4 // else times end in 2038

TEST(ActionSchedulerModelTest, EmptyListIsNotWokenForAfter2038) {
    DrivenScheduler scheduler;
    scheduler.wakeAt(k2038 + 1000L);
    EXPECT_GT(scheduler.nextWakeUp(), s_now);

    std::string record;
    Action action('a', record);
    scheduler.AddOneTimeAction(&action, s_now);
    scheduler.wakeAt(s_now);
    scheduler.wakeAt(s_now);
    EXPECT_EQ(record, "a");
    EXPECT_EQ(scheduler.nextWakeUp(), kLast);
}

TEST(ActionSchedulerModelTest, EntryIsWaitedForAfter2038) {
    std::string record;
    Action action('a', record);
    DrivenScheduler scheduler;
    s_now = k2038 - 1L;
    scheduler.AddPeriodic(&action, 1);
    for (long const now : {k2038 - 1L, k2038 + 0L, k2038 + 1L, k2038 + 2L}) {
        scheduler.wakeAt(now);
        EXPECT_EQ(scheduler.nextWakeUp(), std::max(now + 1, k2038 + 0L));
    }
    EXPECT_EQ(record, "aaa");
}

#endif

bool s_ready = false;

bool isReady(Schedulable* /*target*/) {
    return s_ready;
}

TEST(ActionSchedulerModelTest, TargetThatIsNotReadyIsNotCalledAndKeepsItsPlace) {
    std::string record;
    Action first('a', record), second('b', record), third('c', record);
    DrivenScheduler scheduler;
    s_now = 1000;
    scheduler.AddPeriodic(&first, 1);
    EXPECT_EQ(scheduler.AddPeriodicWhileReady(&second, 1, isReady), 0);
    EXPECT_EQ(scheduler.AddPeriodicWhileReady(&second, 1, isReady), 1);
    scheduler.AddPeriodic(&third, 1);
    scheduler.wakeAt(1000);
    scheduler.wakeAt(1001);
    EXPECT_EQ(record, "ac");
    s_ready = true;
    scheduler.wakeAt(1002);
    EXPECT_EQ(record, "acabc");
    EXPECT_EQ(scheduler.ChangePeriod(&second, 2), 0);
    s_ready = false;
    scheduler.wakeAt(1004);
    scheduler.wakeAt(1004);
    EXPECT_EQ(record, "acabcacac");
    EXPECT_EQ(scheduler.Remove(&second), 0);
}

/// A scheduler that runs out of memory. It counts the locks of its list.
class ExhaustedScheduler final : public ActionScheduler_pthread {
  public:
    ExhaustedScheduler() : ActionScheduler_pthread([] { return s_now; }) {}

    int put_item_on_list(Schedulable* /*target*/, long /*period*/, long /*when*/) override {
        throw std::bad_alloc();
    }
    int lock_list() override {
        ++m_locks;
        return ActionScheduler_pthread::lock_list();
    }
    int unlock_list() override {
        --m_locks;
        return ActionScheduler_pthread::unlock_list();
    }
    int locks() const { return m_locks; }

  private:
    int m_locks = 0;
};

TEST(ActionSchedulerModelTest, ListIsNotLeftLockedWhenMemoryRunsOut) {
    Idle target;
    ExhaustedScheduler scheduler;
    EXPECT_THROW(scheduler.AddPeriodic(&target, 1), std::bad_alloc);
    EXPECT_EQ(scheduler.locks(), 0);
    EXPECT_THROW(scheduler.AddOneTimeAction(&target, 1), std::bad_alloc);
    EXPECT_EQ(scheduler.locks(), 0);
}

} // namespace
