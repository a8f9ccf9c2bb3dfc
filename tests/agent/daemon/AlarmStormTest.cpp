// SPDX-License-Identifier: BSD-2-Clause
// A chassis loses its lines: everything that is wrong with 4000 of them is raised at once.
#include <algorithm>
#include <set>
#include <thread>
#include <utility>
#include <vector>

#include <gmock/gmock.h>

#include "agent/alarms/AlarmEvents.h"
#include "agent/alarms/AlarmTables.h"
#include "agent/daemon/AlarmReport.h"
#include "agent/notifications/NotificationQueue.h"
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

} // namespace
} // namespace kvloamd
