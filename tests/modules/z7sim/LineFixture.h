// SPDX-License-Identifier: BSD-2-Clause
// A board with one line whose seconds the test counts.
#pragma once

#include <atomic>
#include <chrono>
#include <string>

#include <gtest/gtest.h>

#include "LineStatusDelivery.h"
#include "Z7SimLineFeature.h"
#include "board/BoardManager.h"
#include "platform/ActionScheduler_pthread.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/SimulatedPlatform.h"

/// Time as the platform's lines have it.
class LineClock {
  public:
    LineClock() {
        s_now = std::chrono::hours(1);
        kvlsim::setLineClock([] { return s_now.load(); });
    }
    ~LineClock() { kvlsim::setLineClock(nullptr); }
    LineClock(LineClock const&) = delete;
    LineClock& operator=(LineClock const&) = delete;

    static void advance(std::chrono::nanoseconds by) { s_now = s_now.load() + by; }

  private:
    static inline std::atomic<std::chrono::nanoseconds> s_now{};
};

/// The process's scheduler, standing still: no tick but the test's own. Made before any line.
class StillScheduler final : public ActionScheduler_pthread {
  public:
    static void install() {
        if (s_actionScheduler == nullptr) s_actionScheduler = new StillScheduler;
    }

  private:
    StillScheduler() : ActionScheduler_pthread([] { return 0L; }) {}
};

/// Board 5 with line 51, as the reference factory makes it.
class LineTest : public testing::Test {
  protected:
    LineTest() {
        StillScheduler::install();
        m_factory->SetPingInterval(0);
    }
    ~LineTest() override {
        if (m_feature.get() != nullptr) m_feature->Withdraw();
    }

    /// `line`: how the chassis describes it, such as `type: esf`.
    void plugIn(std::string const& line, std::string const& attributes = "NAME: span-1") {
        load(line, attributes);
        m_manager->Attach(m_handle);
        m_board = m_manager->GetFirstBoard();
        find();
    }
    /// Another line takes the place of the one that was plugged in.
    void exchange(std::string const& line) {
        load(line, "NAME: span-1");
        restart();
    }
    void restart() {
        sim::command({{"command", "stop"}, {"board", 5}});
        sim::command({{"command", "start"}, {"board", 5}});
        sim::drain();
        find();
    }
    /// Looks the line up on the board as it is now.
    void find() {
        m_feature = {};
        m_line = {};
        m_table = {};
        auto const feature = m_board->GetFirstFeature(DS1LineFeature::iid());
        if (feature.get() == nullptr) return;
        m_feature = {dynamic_cast<Z7SimLineFeature*>(feature.get())};
        m_line = m_feature->GetFirstDevice();
        m_table = m_line->GetIntervalTable();
    }

    /// `count` seconds pass, and each is counted.
    void tick(int count = 1) {
        for (int i = 0; i < count; ++i) {
            LineClock::advance(std::chrono::seconds(1));
            m_table->ScheduledAction();
        }
    }
    static void errors(sim::Json const& counts) {
        sim::command({{"command", "line-errors"}, {"line", 51}, {"errors", counts}});
    }
    static void alarm(char const* name, bool clear = false) {
        sim::command({{"command", "line-alarm"}, {"line", 51}, {"alarm", name}, {"clear", clear}});
    }
    static void mend() { sim::command({{"command", "line-mend"}, {"line", 51}}); }
    int status() { return m_line->GetLineStatus(); }
    static void load(std::string const& line, std::string const& attributes) {
        sim::load({sim::board(5, "S5", "NAME: NX5-T1",
                              "devices: [{handle: 51, type: 501, attributes: {" + attributes +
                                  "}, line: {" + line + "}}]")});
    }

    LineClock m_clock;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    OpenFactory* m_factory = new OpenFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
    ReferenceCounter<Board> m_board;
    ReferenceCounter<Z7SimLineFeature> m_feature;
    ReferenceCounter<DS1LineDevice> m_line;
    ReferenceCounter<DS1IntervalTable> m_table;
};
