// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/LineListener.h"

#include <chrono>
#include <string>

#include <gtest/gtest.h>

#include "agent/readers/BoardSource.h"
#include "agent/readers/InterfaceReader.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/FakeLines.h"

namespace kvloamd {
namespace {

constexpr long kDate = 1'763'800'000; // the present, as dates of the host count it

/// Boards with one line each, and a listener.
class LineListenerTest : public ::testing::Test {
  protected:
    struct LineOfBoard {
        ReferenceCounter<Board> board;
        FakeLine* line;
        FakeLineFeature* feature;
    };

    LineOfBoard insert(std::string const& serialNumber) {
        auto const board = m_chassis.insert(serialNumber);
        auto* const line = new FakeLine("line-" + serialNumber, "");
        line->trapEnable = 1;
        auto* const feature = new FakeLineFeature({line});
        board->AddFeature(ReferenceCounter<Feature>(feature));
        return {board, line, feature};
    }
    static void change(LineOfBoard const& of, DS1LineStatusEnum status) {
        of.feature->NotifyLineStatusListeners(of.feature->GetFirstDevice(), status);
    }
    /// Refreshes as the agent does; `meanwhile` runs between `listen` and `place`.
    void read(std::function<void()> const& meanwhile = [] {}) {
        auto const boards = m_source.read();
        m_listener.listen(boards, m_reader.changeTimes());
        m_reader.read(boards);
        meanwhile();
        auto const lines = m_reader.lines();
        m_listener.place(lines);
        applySettings(m_settings, lines);
    }
    /// The notifications since the last call: "1000:64 " for each.
    std::string told() {
        std::string all;
        while (auto const notification = m_queue.pop())
            all += std::to_string(notification->objects.at(0).name.back()) + ":" +
                   std::to_string(std::get<std::int64_t>(notification->objects.at(0).value)) + " ";
        return all;
    }

    FakeChassis m_chassis;
    BoardSource m_source{*m_chassis.manager.get()};
    StableIndices m_indices{1000};
    // The agent has run for an hour by these clocks, which stand still.
    Clock::time_point const m_now = Clock::now();
    InterfaceReader m_reader{
        *m_chassis.manager.get(),
        m_indices,
        m_now - std::chrono::hours(1),
        nullptr,
        {[this] { return m_now; }, [] { return std::chrono::seconds(kDate); }}};
    Settings m_settings;
    Counters m_counters;
    NotificationQueue m_queue{m_counters};
    LineListener m_listener{*m_chassis.manager.get(), m_settings, m_queue, m_counters};
};

TEST_F(LineListenerTest, EveryChangeIsToldUnderTheLinesIndexInOrder) {
    auto const a = insert("A");
    auto const b = insert("B");
    read();
    change(b, DS1LineStatusLossOfSignal);
    change(a, DS1LineStatusLossOfFrame);
    change(b, DS1LineStatusNoAlarm);
    EXPECT_EQ(told(), "1016:64 1000:32 1016:1 ");
}

TEST_F(LineListenerTest, NotificationCarriesStatusAndTimeOfChange) {
    auto const a = insert("A");
    read();
    long const changed = kDate - 60;
    a.line->statusLastChange = changed;
    auto const before = Clock::now();
    change(a, DS1LineStatusLossOfSignal);
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_GE(told->when, before);
    EXPECT_EQ(told->name, (Oid{1, 3, 6, 1, 2, 1, 10, 18, 15, 0, 1}));
    ASSERT_EQ(told->objects.size(), 2U);
    EXPECT_EQ(told->objects[0].name, (Oid{1, 3, 6, 1, 2, 1, 10, 18, 6, 1, 10, 1000}));
    EXPECT_EQ(told->objects[0].type, ValueType::Integer);
    EXPECT_EQ(std::get<std::int64_t>(told->objects[0].value), 64);
    EXPECT_EQ(told->objects[1].name, (Oid{1, 3, 6, 1, 2, 1, 10, 18, 6, 1, 16, 1000}));
    EXPECT_EQ(told->objects[1].type, ValueType::TimeTicks);
    EXPECT_EQ(std::get<std::int64_t>(told->objects[1].value), 354000); // a minute before now
}

TEST_F(LineListenerTest, LineThatDoesNotKnowWhenItChangedHasChangedNow) {
    auto const a = insert("A");
    read();
    auto const before = m_reader.changeTimes().uptime().now();
    change(a, DS1LineStatusLossOfSignal);
    auto const told = m_queue.pop();
    ASSERT_TRUE(told);
    EXPECT_GE(std::get<std::int64_t>(told->objects.at(1).value), before);
}

TEST_F(LineListenerTest, LineForWhichItIsNotEnabledIsNotTold) {
    auto const a = insert("A");
    for (int const enable : {2, KVL::kNotSupported}) {
        a.line->trapEnable = enable;
        read();
        change(a, DS1LineStatusLossOfSignal);
        EXPECT_EQ(told(), "") << enable;
    }
}

TEST_F(LineListenerTest, WhatIsSetCountsAtOnceWhateverTheLineSays) {
    auto const a = insert("A");
    read();
    m_settings.exchange({Setting::LineStatusChangeTraps, 1000}, 2);
    change(a, DS1LineStatusLossOfSignal);
    EXPECT_EQ(told(), "");
    a.line->trapEnable = 2;
    m_settings.exchange({Setting::LineStatusChangeTraps, 1000}, 1);
    change(a, DS1LineStatusNoAlarm);
    EXPECT_EQ(told(), "1000:1 ");
}

TEST_F(LineListenerTest, WhatIsSetIsHandedToTheLineAtTheNextReading) {
    auto const a = insert("A");
    auto const b = insert("B");
    read();
    m_settings.exchange({Setting::LineStatusChangeTraps, 1000}, 2);
    EXPECT_EQ(a.line->trapEnable, 1);
    read();
    EXPECT_EQ(a.line->trapEnable, 2);
    EXPECT_EQ(b.line->trapEnable, 1);
}

TEST_F(LineListenerTest, BoardThatComesBackIsToldWhatIsSet) {
    auto const first = insert("A");
    read();
    m_settings.exchange({Setting::LineStatusChangeTraps, 1000}, 2);
    m_chassis.factory->takeOut(first.board);
    read();
    auto const again = insert("A");
    read();
    EXPECT_EQ(again.line->trapEnable, 2);
}

TEST_F(LineListenerTest, ChangeDuringTheFirstReadingOfALineIsToldAfterIt) {
    auto const a = insert("A");
    read([&] {
        change(a, DS1LineStatusLossOfSignal);
        change(a, DS1LineStatusNoAlarm);
        EXPECT_EQ(told(), "");
    });
    EXPECT_EQ(told(), "1000:64 1000:1 ");
}

TEST_F(LineListenerTest, ChangeOfALineWithoutAnIndexIsForgotten) {
    auto const a = insert("A");
    read();
    m_chassis.factory->takeOut(a.board);
    read();
    change(a, DS1LineStatusLossOfSignal);
    read();
    EXPECT_EQ(told(), "");
}

TEST_F(LineListenerTest, ListensOnceAtEveryFeature) {
    auto const a = insert("A");
    read();
    auto const b = insert("B");
    read();
    read();
    EXPECT_EQ(a.feature->listenerCount(), 1);
    EXPECT_EQ(b.feature->listenerCount(), 1);
}

TEST_F(LineListenerTest, EveryChangeAsksForASnapshotWhetherItIsEnabledOrNot) {
    auto const a = insert("A");
    a.line->trapEnable = 2;
    read();
    int asked = 0;
    m_listener.start([&] { ++asked; });
    change(a, DS1LineStatusLossOfSignal);
    EXPECT_EQ(asked, 1);
}

TEST_F(LineListenerTest, NothingIsToldOnceItHasStopped) {
    auto const a = insert("A");
    read();
    int asked = 0;
    m_listener.start([&] { ++asked; });
    m_listener.stop();
    change(a, DS1LineStatusLossOfSignal);
    EXPECT_EQ(told(), "");
    EXPECT_EQ(asked, 0);
}

TEST_F(LineListenerTest, EventWithoutALineIsPassedOver) {
    ReferenceCounter<DS1LineStatusEvent> const event(
        new DS1LineStatusEvent(DS1LineStatusLossOfSignal, {}));
    m_listener.ProcessLineStatusEvent(event);
    m_listener.ProcessLineStatusEvent({});
    EXPECT_EQ(told(), "");
}

TEST_F(LineListenerTest, FeatureThatReplacesAnotherIsListenedTo) {
    auto const a = insert("A");
    read();
    // Freed memory is often given out again at once, so new features get the old ones' addresses.
    for (int round = 0; round < 100; ++round) {
        a.board->RemoveFeature(a.board->GetFirstFeature(DS1LineFeature::iid()));
        auto* const line = new FakeLine("line-A", "");
        line->trapEnable = 1;
        auto* const feature = new FakeLineFeature({line});
        a.board->AddFeature(ReferenceCounter<Feature>(feature));
        read();
        feature->NotifyLineStatusListeners(feature->GetFirstDevice(), DS1LineStatusLossOfSignal);
        ASSERT_EQ(told(), "1000:64 ") << "round " << round;
    }
}

} // namespace
} // namespace kvloamd
