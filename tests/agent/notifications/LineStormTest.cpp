// SPDX-License-Identifier: BSD-2-Clause
// Lines change on several threads while they are read.
#include <latch>
#include <map>
#include <string>
#include <thread>

#include <gtest/gtest.h>

#include "agent/notifications/LineListener.h"
#include "agent/readers/BoardSource.h"
#include "agent/readers/InterfaceReader.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/FakeLines.h"

namespace kvloamd {
namespace {

constexpr int kBoards = 4;
constexpr int kChanges = 500;

class LineStormTest : public ::testing::Test {
  protected:
    FakeLineFeature* insert(std::string const& serialNumber) {
        auto const board = m_chassis.insert(serialNumber);
        auto* const line = new FakeLine("line", "");
        line->trapEnable = 1;
        auto* const feature = new FakeLineFeature({line});
        board->AddFeature(ReferenceCounter<Feature>(feature));
        return feature;
    }
    void read() {
        auto const boards = m_source.read();
        m_listener.listen(boards, m_reader.changeTimes());
        m_reader.read(boards);
        auto const lines = m_reader.lines();
        m_listener.place(lines);
        applySettings(m_settings, lines);
    }

    FakeChassis m_chassis;
    BoardSource m_source{*m_chassis.manager.get()};
    StableIndices m_indices{1000};
    InterfaceReader m_reader{*m_chassis.manager.get(), m_indices, Clock::now()};
    Settings m_settings;
    Counters m_counters;
    NotificationQueue m_queue{m_counters};
    LineListener m_listener{*m_chassis.manager.get(), m_settings, m_queue, m_counters};
};

TEST_F(LineStormTest, NoChangeIsMissedOrToldOutOfOrderWhileLinesAreRead) {
    std::vector<FakeLineFeature*> features;
    for (int board = 0; board < kBoards; ++board)
        features.push_back(insert("B" + std::to_string(board)));
    // The first changes arrive before any line has an ifIndex.
    m_listener.listen(m_source.read(), m_reader.changeTimes());
    std::latch done(kBoards);
    std::vector<std::jthread> tellers;
    for (FakeLineFeature* const feature : features)
        tellers.emplace_back([feature, &done] {
            for (int status = 1; status <= kChanges; ++status)
                feature->NotifyLineStatusListeners(feature->GetFirstDevice(),
                                                   static_cast<DS1LineStatusEnum>(status));
            done.count_down();
        });
    while (!done.try_wait()) {
        m_settings.exchange({Setting::LineStatusChangeTraps, 7}, 1);
        read();
    }
    read();
    std::map<std::uint32_t, std::int64_t> last;
    while (auto const told = m_queue.pop()) {
        std::int64_t& before = last[told->objects.at(0).name.back()];
        EXPECT_EQ(std::get<std::int64_t>(told->objects.at(0).value), before + 1);
        ++before;
    }
    EXPECT_EQ(last.size(), std::size_t{kBoards});
    for (auto const& [index, count] : last)
        EXPECT_EQ(count, kChanges) << index;
    EXPECT_EQ(m_counters.notificationsDropped, 0U);
}

} // namespace
} // namespace kvloamd
