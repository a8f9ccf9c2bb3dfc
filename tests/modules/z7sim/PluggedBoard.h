// SPDX-License-Identifier: BSD-2-Clause
// Board 5 of a simulated chassis as an agent sees it, for the tests of what a board offers.
#pragma once

#include <string>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/SimulatedPlatform.h"

class PluggedBoard : public testing::Test {
  protected:
    PluggedBoard() { m_factory->SetPingInterval(0); }
    /// The factory stays for good; its boards must not, for they would hear of the next test's.
    ~PluggedBoard() override {
        sim::drain();
        sim::load({});
        m_factory->check_for_changed_boards();
    }

    /// Attaches the factory to a chassis of one board. `devices`: of the board, one after another.
    void plugIn(std::string const& attributes, std::string const& devices = "") {
        load(attributes, devices);
        attach();
    }
    static void load(std::string const& attributes, std::string const& devices) {
        sim::load({sim::board(5, "S5", attributes, "devices: [" + devices + "]")});
    }
    void attach() {
        m_manager->Attach(m_handle);
        m_board = m_manager->GetFirstBoard();
    }
    /// One device; `rest` may give it a line or channels.
    static std::string device(int handle, int type, std::string const& attributes = "",
                              std::string const& rest = "") {
        return "{handle: " + std::to_string(handle) + ", type: " + std::to_string(type) +
               ", attributes: {" + attributes + "}" + (rest.empty() ? "" : ", " + rest) + "},";
    }
    static void stop() { change("stop"); }
    static void start() { change("start"); }

    /// The first feature of class `T`; an empty handle when there is none.
    template <class T>
    ReferenceCounter<T> feature() {
        return {static_cast<T*>(m_board->GetFirstFeature(T::iid()).get())};
    }
    template <class T>
    int countFeatures() {
        int count = 0;
        for (auto found = m_board->GetFirstFeature(T::iid()); found.get() != nullptr;
             found = m_board->GetNextFeature(found, T::iid()))
            ++count;
        return count;
    }

    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    OpenFactory* m_factory = new OpenFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
    ReferenceCounter<Board> m_board;

  private:
    static void change(char const* command) {
        sim::command({{"command", command}, {"board", 5}});
        sim::drain();
    }
};
