// SPDX-License-Identifier: BSD-2-Clause
// The code of documents that is part of no other program, as check-snippets compares it.
#include <unistd.h>

#include <cstdlib>
#include <iostream>
#include <string>

#include <gtest/gtest.h>

#include "access/KPXStatisticsTable.h"
#include "access/QSBBoard.h"
#include "simulator/exports/Control.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

class SnippetTest : public ::testing::Test {
  protected:
    SnippetTest() { setenv("VQRXCFGPATH", m_store.file("").c_str(), 1); }
    ~SnippetTest() override { unsetenv("VQRXCFGPATH"); }

  private:
    support::TemporaryDirectory m_store;
};

TEST_F(SnippetTest, AttributeStoreReadsABoard) {
    kvlsim::loadChassis("boards:\n  - handle: 1\n    attributes: {SERIAL_NUMBER: NX50001, "
                        "NAME: NX5-T1, FAMILY: NX5, IRQ: 11}\n");
    QSBBoard board("NX50001");               // the first one opens the store
    std::string const model = board.Model(); // "Error" when there is no such record
    int const irq = board.IRQ();             // -1 likewise
    EXPECT_EQ(model, "NX5-T1");
    EXPECT_EQ(irq, 11);
}

TEST_F(SnippetTest, AttributeStoreReadsTheProcesses) {
    kvlsim::loadChassis("boards: []\nprocesses: [{kind: self}]\n");
    testing::internal::CaptureStdout();
    KPXStatisticsTable& table = *KPXStatisticsTable::GetInstance();
    for (int pid = table.GetFirstIndex(); pid != -1; pid = table.GetNextIndex(pid))
        std::cout << pid << ' ' << table.GetApplicationName(pid) << ' '
                  << table.GetTotalQueuedEvents(pid) << '\n';
    EXPECT_EQ(testing::internal::GetCapturedStdout().rfind(std::to_string(getpid()) + " ", 0), 0U);
}

TEST_F(SnippetTest, SimulatorStopsABoardOfItsOwnProcess) {
    kvlsim::loadChassis("boards:\n  - {handle: 1, attributes: {SERIAL_NUMBER: \"A1\"}}\n");
    kvlsim::execute({{"command", "stop"}, {"board", 1}});
    kvlsim::execute({{"command", "drain"}}); // not from an event handler: it is refused there
    auto const shown = kvlsim::execute({{"command", "show"}, {"board", 1}});
    EXPECT_NE(shown.dump().find("\"BOARD_CONDITION\":4"), std::string::npos) << shown;
}

} // namespace
