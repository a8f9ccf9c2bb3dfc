// SPDX-License-Identifier: BSD-2-Clause
// Faults of the boards, in the table and as a notification receiver prints them.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class FaultTest : public AgentFixture {
  protected:
    void expectAnnounced(std::string const& which, int index, std::string const& serialNumber,
                         int fault, int platformBoard) {
        std::string const text =
            "KVL-OAM-MIB::" + which +
            "\tKVL-OAM-MIB::kvlNotifyBoardIndex.0 = " + std::to_string(index) +
            "\tKVL-OAM-MIB::kvlNotifyBoardSerialNumber.0 = " + serialNumber +
            "\tKVL-OAM-MIB::kvlNotifyFaultValue.0 = " + std::to_string(fault) +
            "\tKVL-OAM-MIB::kvlNotifyFaultPlatformBoard.0 = " + std::to_string(platformBoard) +
            "\tKVL-OAM-MIB::kvlNotifyFaultKind.0 = " + kindOf(fault) +
            (index == 0 ? "\tKVL-OAM-MIB::kvlEventNumber.0 = "
                        : "\tKVL-OAM-MIB::kvlBoardName." + std::to_string(index) + " = ");
        EXPECT_TRUE(trapReceiver().waitFor(text)) << text << "not in:\n" << trapReceiver().output();
    }
    static std::string kindOf(int fault) {
        return fault == 256 ? "lossOfSignal" : fault == 259 ? "receivingRai" : "other";
    }
    std::vector<Answer> faults() const {
        auto all = walk("kvlFaultTimesRaised");
        std::erase_if(all,
                      [](Answer const& answer) { return answer.value.starts_with("No Such"); });
        return all;
    }
};

TEST_F(FaultTest, RaisedFaultIsInTheTableWhenItsNotificationArrives) {
    startWithReceiver();
    sim({"fault", "2", "17"});
    expectAnnounced("kvlFaultRaised", 2, "QL-77-0420", 17, 1);
    EXPECT_EQ(get("kvlFaultTimesRaised.2.17"), "Counter32: 1 times");
    EXPECT_EQ(get("kvlFaultPlatformBoard.2.17"), "INTEGER: 1");
    EXPECT_EQ(get("kvlFaultKind.2.17"), "INTEGER: other(1)");
    EXPECT_THAT(get("kvlFaultDate.2.17"), HasSubstr("STRING: 20"));
    EXPECT_EQ(get("kvlFaultTime.2.17"), get("kvlFaultTableLastChange.0"));
    EXPECT_EQ(get("kvlFaultCount.0"), "Gauge32: 1 faults");
    EXPECT_EQ(get("kvlFaultsRaised.0"), "Counter32: 1 faults");
}

TEST_F(FaultTest, ClearedFaultIsOutOfTheTableWhenItsNotificationArrives) {
    startWithReceiver();
    sim({"fault", "2", "17"});
    sim({"fault", "2", "17", "--clear"});
    expectAnnounced("kvlFaultCleared", 2, "QL-77-0420", 17, 1);
    EXPECT_THAT(faults(), IsEmpty());
    EXPECT_EQ(get("kvlFaultCount.0"), "Gauge32: 0 faults");
    EXPECT_EQ(get("kvlFaultsRaised.0"), "Counter32: 1 faults");
}

TEST_F(FaultTest, FaultsOfABoardThatIsPulledAreGone) {
    startAgent();
    sim({"fault", "1", "16"});
    sim({"fault", "2", "17"});
    EXPECT_TRUE(eventually([this] { return faults().size() == 2; }));
    sim({"remove", "2"});
    EXPECT_TRUE(eventually([this] { return faults().size() == 1; }));
    EXPECT_EQ(get("kvlFaultTimesRaised.1.16"), "Counter32: 1 times");
}

TEST_F(FaultTest, LinesAlarmIsAFaultOfItsBoard) {
    startAgent();
    sim({"line", "alarm", "101", "los"});
    EXPECT_TRUE(
        eventually([this] { return get("kvlFaultTimesRaised.1.256") == "Counter32: 1 times"; }));
}

TEST_F(FaultTest, FaultStaysWhileAnotherLineOfTheBoardHasTheAlarm) {
    startWithReceiver();
    sim({"line", "alarm", "101", "los"});
    sim({"line", "alarm", "102", "los"});
    EXPECT_TRUE(
        eventually([this] { return get("kvlFaultTimesRaised.1.256") == "Counter32: 2 times"; }));
    sim({"line", "mend", "101"});
    expectAnnounced("kvlFaultCleared", 1, "NX50001", 256, 0);
    EXPECT_THAT(faults(), SizeIs(1));
}

TEST_F(FaultTest, AlarmFromBeforeTheStartIsAFault) {
    useChassis("boards:\n"
               "  - handle: 7\n"
               "    attributes: {SERIAL_NUMBER: \"S7\"}\n"
               "    devices:\n"
               "      - handle: 70\n"
               "        type: 501\n"
               "        attributes: {NAME: trunk}\n"
               "        line: {type: esf, alarms: [rai]}\n");
    startAgent();
    EXPECT_TRUE(
        eventually([this] { return get("kvlFaultTimesRaised.1.259") == "Counter32: 1 times"; }));
    EXPECT_EQ(get("kvlFaultPlatformBoard.1.259"), "INTEGER: -1");
    EXPECT_EQ(get("kvlFaultKind.1.259"), "INTEGER: receivingRai(259)");
}

TEST_F(FaultTest, BoardWithoutLogicalIdentifierIsKnownByItsDrivers) {
    useChassis("boards:\n"
               "  - {handle: 7, attributes: {SERIAL_NUMBER: \"S7\", VORN_DRIVER_BOARD_ID: 70}}\n");
    startWithReceiver();
    sim({"fault", "7", "5"});
    expectAnnounced("kvlFaultRaised", 1, "S7", 5, 70);
}

TEST_F(FaultTest, FaultThatComesWithABoardIsTheBoards) {
    startWithReceiver();
    sim({"insert", "--handle", "9", "--serial", "NEW-9"});
    sim({"fault", "9", "5"});
    expectAnnounced("kvlFaultRaised", 4, "NEW-9", 5, 8);
    EXPECT_THAT(faults(), SizeIs(1));
}

TEST_F(FaultTest, FaultOfABoardThatNobodyKnowsIsUnderBoardZero) {
    startWithReceiver();
    sim({"event", "0x30001", "--board", "4711", "--value", "9"});
    expectAnnounced("kvlFaultRaised", 0, "", 9, -1);
    EXPECT_EQ(get("kvlFaultPlatformBoard.0.9"), "INTEGER: -1");
}

} // namespace
} // namespace kvloamd::e2e
