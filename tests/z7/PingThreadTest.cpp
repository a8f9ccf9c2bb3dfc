// SPDX-License-Identifier: BSD-2-Clause
// The ping thread of a factory.
#include <chrono>
#include <condition_variable>
#include <mutex>
#include <vector>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/z7/RecordingBoard.h"
#include "z7/Z7BoardFactory.h"

namespace {

/// Counts the passes of pings.
class CountingFactory final : public Z7BoardFactory {
  public:
    std::vector<long> GetBoardIdentifiers() override {
        return DeviceMapperIf::get_interface()->ListAllBoards();
    }
    int RefreshBoardData() override { return 0; }
    Z7Board* MakeBoard(long id) override {
        auto* const board = new RecordingBoard(id);
        board->onPing = [this] {
            std::scoped_lock const guard(m_mutex);
            ++m_pings;
            m_changed.notify_all();
        };
        return board;
    }

    bool waitForPings(int count) {
        std::unique_lock guard(m_mutex);
        return m_changed.wait_for(guard, std::chrono::minutes(2), [&] { return m_pings >= count; });
    }

  private:
    std::mutex m_mutex;
    std::condition_variable m_changed;
    int m_pings = 0;
};

TEST(PingThreadTest, BoardsArePingedAtEveryInterval) {
    sim::load({sim::board(1, "A")});
    auto* const factory = new CountingFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    ReferenceCounter<BoardManager> const manager(new BoardManager);
    // Not 1: if a busy machine delays a pass beyond the interval, it is the last one.
    factory->SetPingInterval(2);
    manager->Attach(handle);
    EXPECT_TRUE(factory->waitForPings(2));
    factory->SetPingInterval(3600); // the process ends while the thread sleeps
}

} // namespace
