// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/ThresholdWatch.h"

#include <future>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "tests/support/FakeLines.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

constexpr std::uint32_t kIfIndex = 1000;
constexpr int kESF = 2;

class ThresholdWatchTest : public ::testing::Test {
  protected:
    ThresholdWatchTest() {
        BoardRow board;
        board.boardIndex = 1;
        board.serialNumber = "S1";
        m_boards = {board};
        m_line->history = ReferenceCounter<DS1IntervalTable>(m_history);
    }
    /// A refresh.
    void update() {
        m_snapshot = {};
        m_snapshot.boards = m_boards;
        InterfaceRow interface;
        interface.ifIndex = kIfIndex;
        interface.boardIndex = 1;
        interface.description = "T1 line trunk-1";
        m_snapshot.interfaces.interfaces = {interface};
        LineRow line;
        line.ifIndex = kIfIndex;
        line.lineType = kESF;
        line.closed = std::make_shared<ClosedIntervals>();
        m_snapshot.interfaces.lines = {line};
        m_watch.update(m_snapshot, {{kIfIndex, m_handle, 1}});
    }
    static TypeLimits t1(std::string const& limits) {
        TypeLimits configured;
        EXPECT_EQ(configured.configure("t1=" + limits), "");
        return configured;
    }
    /// Ends the running interval, with these error seconds, and begins another one.
    void close(int errorSeconds) {
        m_history->close(errorSeconds);
        ++m_history->closed;
        m_history->run(0, 1);
    }
    void look() {
        m_now.steady += std::chrono::seconds(1);
        m_watch.look(m_now);
    }
    std::vector<std::string> active() const {
        std::vector<std::string> all;
        for (Alarm const& alarm : m_list.active())
            all.push_back(std::string(alarmKind(alarm.condition.key.kind).name) + " on " +
                          alarm.condition.resource + " (" + alarm.condition.text + ")");
        return all;
    }

    LogCapture m_log;
    std::vector<BoardRow> m_boards;
    FakeHistoryWithGaps* m_history = new FakeHistoryWithGaps;
    FakeLine* m_line = new FakeLine("trunk-1", "");
    ReferenceCounter<DS1LineDevice> m_handle{m_line};
    Snapshot m_snapshot;
    Settings m_settings;
    std::promise<void> m_raised;
    AlarmList m_list{{}, [this](AlarmEvent event, Alarm const&) {
                         if (event == AlarmEvent::Raised) m_raised.set_value();
                         return 1U;
                     }};
    ThresholdWatch m_watch{m_list, m_settings, t1("es15m=10")};
    Instant m_now{Clock::time_point(std::chrono::hours(1)), {}};
};

TEST_F(ThresholdWatchTest, LineThatHasReachedItsLimitIsAnAlarm) {
    update();
    m_history->run(9, 100);
    look();
    EXPECT_THAT(active(), IsEmpty());
    m_history->run(10, 101);
    look();
    EXPECT_THAT(active(), ElementsAre("thresholdES15m on board S1, T1 line trunk-1 (limit 10)"));
    close(10);
    look();
    EXPECT_THAT(active(), SizeIs(1));
    close(0);
    look();
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(ThresholdWatchTest, OwnLimitOverridesTheTypes) {
    m_settings.exchange({thresholdSetting(kErroredSeconds15m), kIfIndex}, 5);
    update();
    m_history->run(5, 100);
    look();
    EXPECT_THAT(active(), SizeIs(1));
    m_settings.exchange({thresholdSetting(kErroredSeconds15m), kIfIndex}, 0);
    update();
    look();
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(ThresholdWatchTest, RowShowsTheLimitsOfTheType) {
    update();
    ASSERT_THAT(m_snapshot.thresholds, SizeIs(1));
    EXPECT_EQ(m_snapshot.thresholds[0].ifIndex, kIfIndex);
    EXPECT_EQ(m_snapshot.thresholds[0].limits[kErroredSeconds15m], 10);
    EXPECT_EQ(m_snapshot.thresholds[0].limits[kErroredSeconds24h], 0);
}

TEST_F(ThresholdWatchTest, OtherConfigurationHoldsFromTheNextRefreshOn) {
    update();
    m_history->run(10, 100);
    look();
    EXPECT_THAT(active(), SizeIs(1));
    m_watch.configure(t1("es15m=11"));
    update();
    look();
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(ThresholdWatchTest, LineThatHasGoneHasNoAlarm) {
    update();
    m_history->run(10, 100);
    look();
    m_snapshot = {};
    m_watch.update(m_snapshot, {});
    look();
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(ThresholdWatchTest, AlarmStaysWhileTheLineDoesNotAnswer) {
    update();
    m_history->run(10, 100);
    look();
    m_line->history = ReferenceCounter<DS1IntervalTable>();
    look();
    EXPECT_THAT(active(), SizeIs(1));
}

TEST_F(ThresholdWatchTest, RestoredAlarmOfALineBelowItsLimitIsCleared) {
    Alarm alarm;
    alarm.condition.key = {AlarmKind::ThresholdES15m, "S1", kIfIndex};
    m_list.restore({alarm}, m_now);
    update();
    look();
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(ThresholdWatchTest, ThreadLooksByItself) {
    m_watch.start();
    m_history->run(10, 100);
    update();
    m_raised.get_future().wait();
    EXPECT_THAT(active(), SizeIs(1));
}

} // namespace
} // namespace kvloamd
