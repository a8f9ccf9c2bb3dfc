// SPDX-License-Identifier: BSD-2-Clause
// A chassis loses its lines: everything that is wrong with 4000 of them is raised at once.
#include <algorithm>
#include <functional>
#include <future>
#include <set>
#include <thread>
#include <utility>
#include <vector>

#include <gmock/gmock.h>

#include "agent/alarms/AlarmEvents.h"
#include "agent/alarms/AlarmTables.h"
#include "agent/daemon/AlarmReport.h"
#include "agent/daemon/AlarmThread.h"
#include "agent/fronts/EventLoop.h"
#include "agent/fronts/Wakeup.h"
#include "agent/notifications/NotificationQueue.h"
#include "agent/notifications/Notifier.h"
#include "agent/notifications/StandardNotifications.h"
#include "board/DS1LineDevice.h"
#include "tests/support/LogCapture.h"
#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr std::uint32_t kStormLines = 4000;
constexpr std::uint32_t kFirstStormLine = 1000;
constexpr std::uint32_t kStormThreads = 4;
constexpr int kCutOff =
    DS1LineStatusLossOfSignal | DS1LineStatusLossOfFrame | DS1LineStatusUnavailSigState;
/// One for each line: what follows from the loss of signal is no alarm of its own.
constexpr std::size_t kStormAlarms = kStormLines;

class AlarmStormTest : public ::testing::Test {
  protected:
    AlarmStormTest() {
        m_alarms.restore(m_report.open(m_folder.file("")), Instant::now());
        m_queue.observeDrops([this](Notification const& notification) {
            Notification dropped = notification;
            m_report.record(dropped, true);
        });
        Snapshot snapshot;
        snapshot.begun = Clock::now();
        for (std::uint32_t line = 0; line < kStormLines; ++line) {
            InterfaceRow interface;
            interface.ifIndex = kFirstStormLine + line;
            snapshot.interfaces.interfaces.push_back(interface);
            LineRow row;
            row.ifIndex = interface.ifIndex;
            row.lineStatus = DS1LineStatusNoAlarm;
            snapshot.interfaces.lines.push_back(row);
        }
        m_events.update(snapshot);
    }
    /// Reports this status of every line, and a notification for it, on several threads at once.
    void setAll(int status) {
        std::vector<std::jthread> threads;
        for (std::uint32_t first = 0; first < kStormThreads; ++first)
            threads.emplace_back([this, first, status] {
                for (std::uint32_t line = first; line < kStormLines; line += kStormThreads) {
                    m_events.lineStatus(kFirstStormLine + line, status);
                    m_queue.push(lineStatusChange(kFirstStormLine + line, status, 0, Clock::now()));
                }
            });
    }
    /// The whole journal, read in pages.
    std::vector<JournalRow> journal() {
        m_report.journal().flush();
        std::vector<JournalRow> all;
        for (;;) {
            auto const page =
                m_report.journal().entriesAfter(all.empty() ? 0 : all.back().number, 5000);
            if (!page || page->rows.empty()) return all;
            all.insert(all.end(), page->rows.begin(), page->rows.end());
        }
    }
    static std::size_t countOf(std::vector<JournalRow> const& rows, std::string const& event) {
        return static_cast<std::size_t>(std::ranges::count(rows, event, &JournalRow::event));
    }

    LogCapture m_log;
    support::TemporaryDirectory m_folder;
    AlarmReport m_report;
    AlarmList m_alarms{
        {}, [this](AlarmEvent event, Alarm const& alarm) { return m_report.report(event, alarm); }};
    AlarmEvents m_events{m_alarms};
    AlarmTables m_tables{m_alarms, {1, 3, 9}, Clock::now()};
    Counters m_counters;
    NotificationQueue m_queue{m_counters};
};

TEST_F(AlarmStormTest, EveryAlarmIsInTheJournalAndInTheTables) {
    setAll(kCutOff);
    auto const rows = m_tables.rows();
    EXPECT_THAT(rows->alarms, SizeIs(kStormAlarms));
    EXPECT_THAT(rows->active, SizeIs(kStormAlarms));
    auto const entries = journal();
    EXPECT_EQ(m_report.counts().lost, 0U);
    std::set<std::pair<std::string, std::uint32_t>> raised;
    for (JournalRow const& row : entries)
        if (row.event == "alarmRaised") raised.insert({row.alarm, row.ifIndex});
    EXPECT_THAT(raised, SizeIs(kStormAlarms));
    EXPECT_EQ(countOf(entries, "alarmRaised"), kStormAlarms) << "none twice";
    EXPECT_TRUE(std::ranges::is_sorted(entries, std::ranges::less_equal{}, &JournalRow::number));
}

TEST_F(AlarmStormTest, NotificationsThatFindTheQueueFullAreCountedAndInTheJournal) {
    setAll(kCutOff);
    setAll(DS1LineStatusNoAlarm);
    EXPECT_EQ(m_queue.size(), NotificationQueue::kCapacity);
    EXPECT_EQ(m_counters.notificationsDropped, 2 * kStormLines - NotificationQueue::kCapacity);
    EXPECT_EQ(countOf(journal(), "notification"), m_counters.notificationsDropped);
    EXPECT_EQ(m_report.counts().lost, 0U);
}

TEST_F(AlarmStormTest, EveryAlarmIsClearedWhenTheLinesAreBack) {
    setAll(kCutOff);
    setAll(DS1LineStatusNoAlarm);
    auto const rows = m_tables.rows();
    EXPECT_THAT(rows->alarms, IsEmpty());
    EXPECT_THAT(rows->cleared, SizeIs(AlarmList::kClearedCapacity)) << "their number is bounded";
    EXPECT_EQ(countOf(journal(), "alarmCleared"), kStormAlarms);
    m_report.close(m_alarms.active());
    EXPECT_THAT(Journal(m_folder.file("") + "/journal.sqlite").formerAlarms(), IsEmpty());
}

/// A sink that takes everything at once.
class OpenSink final : public NotificationSink {
  public:
    bool ready() const override { return true; }
    void send(Notification const&, Delivered delivered) override { delivered(Delivery::Sent); }
};

TEST_F(AlarmStormTest, RequestsAreAnsweredBetweenBatchesOfNotifications) {
    setAll(kCutOff);
    OpenSink sink;
    Notifier notifier(m_queue, sink,
                      [this](Notification& notification) { m_report.record(notification, false); });
    EventLoop loop;
    loop.beforeSleep([&] { return notifier.send(Clock::now()); });
    // A client that asks without a pause.
    Wakeup client;
    client.wake();
    std::size_t waiting = m_queue.size();
    std::size_t mostAtOnce = 0;
    loop.watch(client.descriptor(), [&] {
        mostAtOnce = std::max(mostAtOnce, waiting - m_queue.size());
        waiting = m_queue.size();
        if (waiting == 0) loop.stop();
    });
    loop.run(Clock::time_point::max());
    EXPECT_EQ(mostAtOnce, Notifier::kBatch);
    EXPECT_EQ(countOf(journal(), "notification"), kStormLines);
}

TEST_F(AlarmStormTest, AlarmsThatAreSettledKeepNobodyWaiting) {
    // The journal takes the first alarm that time raises when the test says so.
    std::promise<void> settling;
    std::promise<void> goOn;
    bool isFirst = true;
    AlarmList alarms({}, [&](AlarmEvent event, Alarm const& alarm) {
        if (std::exchange(isFirst, false)) {
            settling.set_value();
            goOn.get_future().wait();
        }
        return m_report.report(event, alarm);
    });
    // All of them are held.
    Instant const begun = Instant::now();
    for (std::uint32_t channel = 1; channel <= kStormLines; ++channel)
        alarms.begin({{AlarmKind::ChannelInactive, "B", channel}, "channel", 1, channel, {}, {}},
                     begun);
    Instant const later{begun.steady + std::chrono::hours(1), begun.date};
    std::vector<std::uint32_t> asked;
    {
        AlarmThread thread(
            [&] { return alarms.advance(later).value_or(Clock::time_point::max()); });
        thread.wake();
        settling.get_future().wait();
        // The thread is in the middle of it. A new reading wakes it, and others are recorded.
        thread.wake();
        m_report.note(JournalEvent::Configuration, "meanwhile");
        asked.push_back(m_report.counts().last);
        goOn.set_value();
        // The end of the agent waits for it.
    }
    EXPECT_THAT(alarms.active(), SizeIs(kStormLines));
    auto const entries = journal();
    EXPECT_EQ(countOf(entries, "alarmRaised"), kStormLines);
    EXPECT_TRUE(std::ranges::is_sorted(entries, std::ranges::less_equal{}, &JournalRow::number));
    EXPECT_LT(asked.front(), alarms.active().front().number) << "recorded before the first alarm";
}

} // namespace
} // namespace kvloamd
