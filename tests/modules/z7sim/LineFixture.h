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
#include "board/DS1IntervalValidity.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/StillLineScheduler.h"

/// The clock of the platform's lines.
class LineClock {
  public:
    LineClock() {
        s_now = std::chrono::hours(1);
        useAgain();
    }
    ~LineClock() { kvlsim::setLineClock(nullptr); }
    LineClock(LineClock const&) = delete;
    LineClock& operator=(LineClock const&) = delete;

    /// All lines of the platform begin anew.
    static void useAgain() {
        kvlsim::setLineClock([] { return s_now.load(); });
    }
    static void advance(std::chrono::nanoseconds by) { s_now = s_now.load() + by; }

  private:
    static inline std::atomic<std::chrono::nanoseconds> s_now{};
};

/// Board 5 with line 51, as the reference factory makes it.
class LineTest : public testing::Test {
  protected:
    LineTest() { m_factory->SetPingInterval(0); }
    ~LineTest() override {
        if (m_feature.get() != nullptr) m_feature->Withdraw();
    }

    /// `line`: how the chassis describes it, such as `type: esf`.
    void plugIn(std::string const& line, std::string const& attributes = "NAME: span-1") {
        load(line, attributes);
        attach();
    }
    /// Attaches the factory to the chassis that is loaded.
    void attach() {
        m_manager->Attach(m_handle);
        m_board = m_manager->GetFirstBoard();
        find();
    }
    /// Another board, with another line, takes the place of the one that was plugged in.
    void exchange(std::string const& line) {
        load(line, "NAME: span-1", "T5");
        m_factory->check_for_changed_boards();
        m_board = m_manager->GetFirstBoard();
        find();
    }
    static void stop() {
        sim::command({{"command", "stop"}, {"board", 5}});
        sim::drain();
    }
    void start() {
        sim::command({{"command", "start"}, {"board", 5}});
        sim::drain();
        find();
    }
    void restart() {
        stop();
        start();
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
            m_scheduler.pass(LineScheduler::time() + 1);
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
    bool isValid(int n) {
        return dynamic_cast<DS1IntervalValidity*>(m_table.get())->IsIntervalValid(n);
    }
    static void load(std::string const& line, std::string const& attributes,
                     std::string const& serial = "S5") {
        sim::load({sim::board(5, serial, "NAME: NX5-T1",
                              "devices: [{handle: 51, type: 501, attributes: {" + attributes +
                                  "}, line: {" + line + "}}]")});
    }

    StillLineScheduler& m_scheduler = StillLineScheduler::install();
    LineClock m_clock;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    OpenFactory* m_factory = new OpenFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
    ReferenceCounter<Board> m_board;
    ReferenceCounter<Z7SimLineFeature> m_feature;
    ReferenceCounter<DS1LineDevice> m_line;
    ReferenceCounter<DS1IntervalTable> m_table;
};
