// SPDX-License-Identifier: BSD-2-Clause
// Status changes as a notification receiver prints them.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class NotificationTest : public AgentFixture {
  protected:
    /// Starts receiver and agent, with notifications of version 3; `kind` is "" or "-Ci".
    void startWithUser(std::string const& kind) {
        startTrapReceiver("createUser -e 0x8000000001020304 op SHA authpass1 AES privpass1\n"
                          "createUser op SHA authpass1 AES privpass1\n"
                          "authUser log op priv\n");
        configureSnmp("exactEngineID 0x8000000001020304\n"
                      "rocommunity public 127.0.0.1\n"
                      "createUser op SHA authpass1 AES privpass1\n"
                      "trapsess " +
                      kind + " -v 3 -u op -l authPriv -a SHA -A authpass1 -x AES -X privpass1 " +
                      trapAddress() + "\n");
        startAgent();
    }

    /// A notification as the receiver prints it: its name, the board, and the new status.
    static std::string announced(int index, std::string const& serialNumber,
                                 std::string const& status) {
        return "KVL-OAM-MIB::kvlBoardStatusChange\tKVL-OAM-MIB::kvlNotifyBoardIndex.0 = " +
               std::to_string(index) +
               "\tKVL-OAM-MIB::kvlNotifyBoardSerialNumber.0 = " + serialNumber +
               "\tKVL-OAM-MIB::kvlNotifyBoardStatus.0 = " + status;
    }
    void expectAnnounced(int index, std::string const& serialNumber, std::string const& status,
                         int times = 1) {
        EXPECT_TRUE(trapReceiver().waitFor(announced(index, serialNumber, status), times))
            << announced(index, serialNumber, status) << "not in:\n"
            << trapReceiver().output();
    }
};

TEST_F(NotificationTest, RemovedBoardIsAnnounced) {
    startWithReceiver();
    sim({"remove", "2"});
    expectAnnounced(2, "QL-77-0420", "removed");
}

TEST_F(NotificationTest, InsertedBoardIsAnnouncedAsAddedThenStarted) {
    startWithReceiver();
    sim({"insert", "--handle", "9", "--serial", "NEW-9"});
    expectAnnounced(4, "NEW-9", "added");
    expectAnnounced(4, "NEW-9", "started");
    auto const& output = trapReceiver().output();
    EXPECT_LT(output.find(announced(4, "NEW-9", "added")),
              output.find(announced(4, "NEW-9", "started")));
}

TEST_F(NotificationTest, ReplacedBoardIsAnnouncedAsAnotherBoard) {
    startWithReceiver();
    sim({"replace", "3", "--serial", "SWAPPED"});
    expectAnnounced(3, "V0003-E", "removed");
    expectAnnounced(4, "SWAPPED", "added");
}

TEST_F(NotificationTest, StoppedAndStartedBoardIsAnnounced) {
    startWithReceiver();
    sim({"stop", "1"});
    expectAnnounced(1, "NX50001", "stopped");
    sim({"start", "1"});
    expectAnnounced(1, "NX50001", "started");
}

TEST_F(NotificationTest, FailedBoardIsAnnounced) {
    startWithReceiver();
    sim({"fail", "1"});
    expectAnnounced(1, "NX50001", "failed");
}

TEST_F(NotificationTest, TableShowsTheChangeWhenItsNotificationArrives) {
    startWithReceiver();
    sim({"remove", "2"});
    expectAnnounced(2, "QL-77-0420", "removed");
    EXPECT_THAT(get("kvlBoardName.2"), HasSubstr("No Such Instance"));
    sim({"stop", "1"});
    expectAnnounced(1, "NX50001", "stopped");
    EXPECT_EQ(get("kvlBoardStatus.1"), "INTEGER: stopped(4)");
    sim({"insert", "--handle", "9", "--serial", "NEW-9"});
    expectAnnounced(4, "NEW-9", "added");
    EXPECT_EQ(get("kvlBoardSerialNumber.4"), "STRING: NEW-9");
}

TEST_F(NotificationTest, BoardsThatAreThereAtTheStartAreNotAnnounced) {
    startWithReceiver();
    sim({"remove", "2"});
    expectAnnounced(2, "QL-77-0420", "removed");
    EXPECT_EQ(get("kvlBoardStatusChanges.0"), "Counter32: 1 changes");
    EXPECT_EQ(trapReceiver().output().find("kvlBoardStatusChange"),
              trapReceiver().output().rfind("kvlBoardStatusChange"));
}

TEST_F(NotificationTest, ManyChangesArriveEachOnceAndInOrder) {
    startWithReceiver();
    for (int round = 0; round < 20; ++round) {
        sim({"stop", "1"});
        sim({"start", "1"});
    }
    expectAnnounced(1, "NX50001", "stopped", 20);
    expectAnnounced(1, "NX50001", "started", 20);
    EXPECT_EQ(get("kvlBoardStatusChanges.0"), "Counter32: 40 changes");
    EXPECT_EQ(get("kvlNotificationsDropped.0"), "Counter32: 0 notifications");
    std::string statuses;
    for (std::string const& line : linesOf(trapReceiver().output()))
        if (auto const at = line.find("kvlNotifyBoardStatus.0 = "); at != std::string::npos)
            statuses += line.substr(at + 25, 3) + " ";
    std::string expected;
    for (int round = 0; round < 20; ++round)
        expected += "sto sta ";
    EXPECT_EQ(statuses, expected);
}

TEST_F(NotificationTest, TimeOfChangeMovesWithTheTable) {
    startWithReceiver();
    EXPECT_EQ(get("kvlBoardTableLastChange.0"), "Timeticks: (0) 0:00:00.00");
    sim({"stop", "1"});
    expectAnnounced(1, "NX50001", "stopped");
    EXPECT_NE(get("kvlBoardTableLastChange.0"), "Timeticks: (0) 0:00:00.00");
}

TEST_F(NotificationTest, ThirdVersionCarriesTheSame) {
    startWithUser("");
    sim({"remove", "2"});
    expectAnnounced(2, "QL-77-0420", "removed");
}

TEST_F(NotificationTest, InformOfTheThirdVersionIsAcknowledged) {
    startWithUser("-Ci");
    sim({"remove", "2"});
    expectAnnounced(2, "QL-77-0420", "removed");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

TEST_F(NotificationTest, AgentServesOnWhenNobodyReceives) {
    configureSnmp("rocommunity public 127.0.0.1\n"
                  "trap2sink 127.0.0.1:" +
                  std::to_string(freePort()) + " public\n");
    startAgent();
    for (int round = 0; round < 5; ++round) {
        sim({"stop", "1"});
        sim({"start", "1"});
    }
    EXPECT_TRUE(
        eventually([this] { return get("kvlBoardStatusChanges.0") == "Counter32: 10 changes"; }));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

} // namespace
} // namespace kvloamd::e2e
