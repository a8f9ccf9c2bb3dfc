// SPDX-License-Identifier: BSD-2-Clause
// What the agent logs when something breaks.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

class AlarmLogTest : public AgentFixture {
  protected:
    void expectLogged(std::string const& text) {
        EXPECT_TRUE(agent().waitFor("kvloamd: " + text)) << text << " is not in:\n"
                                                         << agent().output();
    }
};

TEST_F(AlarmLogTest, FailedBoardIsLogged) {
    startAgent();
    sim({"fail", "2"});
    expectLogged("board QL-77-0420: failed\n");
    expectLogged("alarm raised: critical boardFailed on board QL-77-0420: the platform reports "
                 "that the board has failed\n");
    sim({"start", "2"});
    expectLogged("alarm cleared: critical boardFailed on board QL-77-0420");
}

TEST_F(AlarmLogTest, RemovedBoardIsMissedUntilItReturns) {
    startAgent();
    sim({"remove", "2"});
    expectLogged("board QL-77-0420: removed\n");
    expectLogged("alarm raised: major boardGone on board QL-77-0420");
    sim({"insert", "--serial", "QL-77-0420"});
    expectLogged("alarm cleared: major boardGone on board QL-77-0420");
}

TEST_F(AlarmLogTest, BoardThatIsStoppedAndRemovedIsNotMissed) {
    startAgent();
    sim({"stop", "2"});
    sim({"remove", "2"});
    expectLogged("board QL-77-0420: stopped\n");
    expectLogged("board QL-77-0420: removed\n");
    sim({"fail", "1"});
    expectLogged("alarm raised: critical boardFailed");
    EXPECT_THAT(agent().output(), Not(HasSubstr("boardGone")));
    EXPECT_THAT(agent().output(), Not(HasSubstr("boardStopped")));
}

TEST_F(AlarmLogTest, StopThatNobodyOrderedIsAnAlarm) {
    startAgent();
    sim({"event", "0x40008", "--board", "2"});
    expectLogged("board QL-77-0420: stopped, although nobody ordered it\n");
    expectLogged("alarm raised: major boardStopped on board QL-77-0420");
    sim({"start", "2"});
    expectLogged("alarm cleared: major boardStopped on board QL-77-0420");
}

TEST_F(AlarmLogTest, LineWithoutSignalIsLogged) {
    startAgent();
    sim({"line", "alarm", "101", "los"});
    expectLogged("board NX50001: fault 256 raised\n");
    expectLogged("alarm raised: critical dsx1LossOfSignal on board NX50001, ");
}

TEST_F(AlarmLogTest, PlatformFaultIsLogged) {
    startAgent();
    sim({"fault", "2", "17"});
    expectLogged("alarm raised: indeterminate platformFault on board QL-77-0420");
    sim({"fault", "2", "17", "--clear"});
    expectLogged("alarm cleared: indeterminate platformFault on board QL-77-0420");
}

} // namespace
} // namespace kvloamd::e2e
