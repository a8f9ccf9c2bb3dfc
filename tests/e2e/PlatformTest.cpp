// SPDX-License-Identifier: BSD-2-Clause
// The tables of devices, store records, modules and processes, as the real agent serves them.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>

#include <gmock/gmock.h>

#include "agent/objects/OwnObjects.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::Field;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

/// An exclusive lock on a whole file for a scope.
class FileLock {
  public:
    explicit FileLock(std::string const& file) : m_descriptor(open(file.c_str(), O_RDWR)) {
        struct flock whole {};
        whole.l_type = F_WRLCK;
        whole.l_whence = SEEK_SET;
        m_held = m_descriptor >= 0 && fcntl(m_descriptor, F_SETLKW, &whole) == 0;
    }
    ~FileLock() { close(m_descriptor); }
    FileLock(FileLock const&) = delete;
    FileLock& operator=(FileLock const&) = delete;

    bool held() const { return m_held; }

  private:
    int m_descriptor;
    bool m_held = false;
};

class PlatformTest : public AgentFixture {
  protected:
    Result table(std::string const& name) const {
        return snmp("snmptable", {"-v2c", "-c", "public", "-t", "30", "-Ci", address(), name});
    }
    /// The lines of a table's rows, each beginning with the index: "1.101 ...".
    std::vector<std::string> rows(std::string const& name) const {
        auto lines = linesOf(table(name).output);
        // The title, an empty line and the column heads.
        lines.erase(lines.begin(), lines.begin() + std::min<std::ptrdiff_t>(3, std::ssize(lines)));
        return lines;
    }
    std::vector<std::string> values(std::string const& column) const {
        std::vector<std::string> all;
        // The only answer of a walk of a column without instances.
        for (Answer const& answer : walk(column))
            if (!answer.value.starts_with("No Such")) all.push_back(answer.value);
        return all;
    }
    static bool isStrictlyIncreasing(std::vector<Answer> const& answers) {
        return std::ranges::adjacent_find(answers, [](Answer const& a, Answer const& b) {
                   return compare(a.name, b.name) >= 0;
               }) == answers.end();
    }
    std::string storeFile() const { return path("store/attributes.db"); }
};

TEST_F(PlatformTest, DevicesOfTheExampleChassisAreShown) {
    startAgent();
    Result const result = table("kvlDeviceTable");
    for (std::size_t column = 0; column < deviceTable().columnCount(); ++column)
        EXPECT_THAT(result.output, HasSubstr(deviceTable().column(column).name));
    auto const devices = rows("kvlDeviceTable");
    ASSERT_THAT(devices, SizeIs(14)) << result.output;
    EXPECT_THAT(devices[0],
                AllOf(HasSubstr("1.101"), HasSubstr("nx5-trunk-1"), HasSubstr("digitalTrunk"),
                      HasSubstr("24"), HasSubstr("1.1.1.0"), HasSubstr("1,3,-1")));
    EXPECT_THAT(devices[13], AllOf(HasSubstr("3.304"), HasSubstr("vorn-lines")));
}

TEST_F(PlatformTest, SubDevicesOfTheExampleChassisAreShown) {
    startAgent();
    auto const subDevices = rows("kvlSubDeviceTable");
    ASSERT_THAT(subDevices, SizeIs(15));
    EXPECT_THAT(subDevices[0], AllOf(HasSubstr("1.101.111"), HasSubstr("nx5-trunk-1-slots"),
                                     HasSubstr("1.1.16.1"), HasSubstr("1.1.32.1")));
    EXPECT_EQ(get("kvlSubDeviceClusterAddress.2.202.213"), "STRING: 2.1.48.2");
    EXPECT_EQ(get("kvlSubDeviceIpvscAddress.2.203.214"), "STRING: 2.1.64.1");
    EXPECT_EQ(get("kvlSubDeviceOutVariant.3.302.313"), "INTEGER: -1");
    EXPECT_EQ(get("kvlSubDeviceFrontEndType.3.301.311"), "INTEGER: 2");
}

TEST_F(PlatformTest, ProcessorsOfTheExampleChassisAreShown) {
    startAgent();
    auto const processors = rows("kvlProcessorTable");
    ASSERT_THAT(processors, SizeIs(4));
    EXPECT_THAT(processors[0],
                AllOf(HasSubstr("1.191"), HasSubstr("nx5-control"), HasSubstr("1.08"),
                      HasSubstr("nx5_boot.bin"), HasSubstr("3.51"), HasSubstr("nx5_kernel.bin")));
}

TEST_F(PlatformTest, StoreRecordsOfTheExampleChassisAreShown) {
    startAgent();
    EXPECT_THAT(values("kvlStoreSerialNumber"),
                ElementsAre("STRING: NX50001", "STRING: QL-77-0420", "STRING: V0003-E"));
    EXPECT_EQ(get("kvlStoreModel.2"), "STRING: QUILLON-E1");
    EXPECT_EQ(get("kvlStoreVersion.2"), "STRING: BW1.0_BCI_Struct");
    EXPECT_EQ(get("kvlStoreSharedMemoryAddress.2"), "STRING: 0xd4000000");
    EXPECT_EQ(get("kvlStoreIrq.2"), "INTEGER: 10");
    EXPECT_EQ(get("kvlStorePciSlotNumber.2"), "INTEGER: 6");
}

TEST_F(PlatformTest, ProcessesOfTheExampleChassisAreShown) {
    startAgent();
    EXPECT_THAT(rows("kvlProcessTable"), SizeIs(3));
    // The name of a child is known once it has executed its program.
    for (char const* const name : {"STRING: kvloamd", "STRING: call-server", "STRING: announcer"})
        EXPECT_TRUE(eventually([&] {
            return std::ranges::count(values("kvlProcessName"), name) == 1;
        })) << name;
    EXPECT_THAT(values("kvlProcessEventQueueSize"),
                ::testing::UnorderedElementsAre("Gauge32: 128 events", "Gauge32: 256 events",
                                                "Gauge32: 64 events"));
}

TEST_F(PlatformTest, LoadedModulesAreShown) {
    startAgent();
    EXPECT_THAT(values("kvlModuleName"), ElementsAre("STRING: z7simkvl"));
    EXPECT_THAT(values("kvlModulePurpose"), ElementsAre("STRING: KVL Extension Module for z7sim"));
    EXPECT_THAT(values("kvlModuleVersion"), ElementsAre("STRING: 5.2"));
    EXPECT_THAT(values("kvlModuleDate"), ElementsAre(HasSubstr("STRING: 20")));
}

TEST_F(PlatformTest, ServicesThatNobodyEnteredAreLeftOut) {
    startAgent();
    EXPECT_THAT(table("kvlServiceTable").output, HasSubstr("No entries"));
    EXPECT_THAT(get("kvlPlatformServiceStatus.0"), HasSubstr("No Such Instance"));
    EXPECT_THAT(get("kvlPlatformServiceChangeDate.0"), HasSubstr("No Such Instance"));
}

TEST_F(PlatformTest, ValuesHaveTheTypesOfTheMib) {
    startAgent();
    Result const result = snmp("snmpwalk", {"-v2c", "-c", "public", "-t", "30", address(), "kvl"});
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.output, AllOf(Not(HasSubstr("Wrong Type")), HasSubstr("kvlProcessOpens."),
                                     HasSubstr("kvlStoreModel."), HasSubstr("kvlDeviceName.")));
}

TEST_F(PlatformTest, EveryTableIsWalkedInOrderWhateverTheRequest) {
    startAgent();
    auto const walked = walk();
    EXPECT_TRUE(isStrictlyIncreasing(walked));
    for (char const* const table : {"kvlDevices", "kvlStore", "kvlServices"}) {
        auto const single = walk(table);
        EXPECT_THAT(single, Not(IsEmpty()));
        for (char const* const repetitions : {"-Cr1", "-Cr7", "-Cr50"})
            EXPECT_EQ(answers("snmpbulkwalk", {repetitions, table}), single) << table;
    }
}

TEST_F(PlatformTest, BoardThatIsRemovedTakesItsRecordsWithIt) {
    startAgent();
    ASSERT_THAT(rows("kvlDeviceTable"), SizeIs(14));
    sim({"remove", "2"});
    EXPECT_TRUE(eventually([this] { return get("kvlBoardCount.0") == "Gauge32: 2 boards"; }));
    auto const records = walk();
    for (Answer const& answer : records)
        EXPECT_THAT(answer.value, Not(HasSubstr("quillon")));
    EXPECT_THAT(rows("kvlDeviceTable"), SizeIs(9));
    EXPECT_THAT(rows("kvlSubDeviceTable"), SizeIs(10));
    EXPECT_THAT(rows("kvlProcessorTable"), SizeIs(3));
    EXPECT_THAT(values("kvlStoreSerialNumber"), SizeIs(2));
}

TEST_F(PlatformTest, BoardThatComesBringsItsDevices) {
    startAgent();
    sim({"insert", "--handle", "50", "--serial", "NEW", "--devices", "2"});
    EXPECT_TRUE(eventually([this] { return get("kvlBoardCount.0") == "Gauge32: 4 boards"; }));
    EXPECT_THAT(rows("kvlDeviceTable"), SizeIs(16));
}

TEST_F(PlatformTest, AttributeThatChangesIsSeen) {
    startAgent();
    sim({"set", "nx5-voice-1", "ChannelCount", "47"});
    EXPECT_TRUE(eventually(
        [this] { return get("kvlDeviceChannelCount.1.103") == "INTEGER: 47 channels"; }));
}

TEST_F(PlatformTest, MissingAttributesLeaveHoles) {
    useChassis("boards:\n"
               "  - handle: 7\n"
               "    attributes: {SERIAL_NUMBER: \"S7\"}\n"
               "    devices: [{handle: 71, type: 501, subdevices: [{handle: 72, type: 502}]}]\n"
               "    processors: [{handle: 73, attributes: {NAME: only}}]\n");
    startAgent();
    EXPECT_EQ(get("kvlDeviceType.1.71"), "INTEGER: digitalTrunk(501)");
    EXPECT_EQ(get("kvlSubDeviceType.1.71.72"), "INTEGER: trunkTimeSlots(502)");
    for (char const* const missing :
         {"kvlDeviceName.1.71", "kvlDeviceChannelCount.1.71", "kvlDeviceLineAdminAddress.1.71",
          "kvlDeviceProtocolTypes.1.71", "kvlSubDeviceTscAddress.1.71.72",
          "kvlSubDeviceOutVariant.1.71.72", "kvlSubDeviceFrontEndType.1.71.72",
          "kvlProcessorNumber.1.73", "kvlProcessorBootKernelVersion.1.73"})
        EXPECT_THAT(get(missing), HasSubstr("No Such Instance")) << missing;
    for (char const* const table : {"kvlDeviceTable", "kvlSubDeviceTable", "kvlProcessorTable"})
        EXPECT_THAT(walk(table), SizeIs(1)) << table;
}

TEST_F(PlatformTest, StoreRecordThatIsAddedShowsUp) {
    useChassis("boards:\n"
               "  - handle: 7\n"
               "    attributes: {SERIAL_NUMBER: \"S7\"}\n"
               "store:\n"
               "  families: [NX5]\n");
    startAgent();
    EXPECT_THAT(values("kvlStoreModel"), IsEmpty());
    sim({"store", "add", "S7", "--family", "NX5", "--field", "Model=NX5-E1", "--field", "IRQ=9"});
    EXPECT_TRUE(eventually([this] { return get("kvlStoreModel.1") == "STRING: NX5-E1"; }));
    EXPECT_EQ(get("kvlStoreIrq.1"), "INTEGER: 9");
    sim({"store", "remove", "S7"});
    EXPECT_TRUE(eventually([this] { return values("kvlStoreModel").empty(); }));
}

TEST_F(PlatformTest, ProcessThatIsAddedShowsUpAndGoesWhenItEnds) {
    useChassis("boards: []\n"); // and no process but the agent's own
    startAgent();
    EXPECT_THAT(values("kvlProcessName"), ElementsAre("STRING: kvloamd"));
    sim({"process", "add", "--name", "ivr-worker", "--counter", "NumberOfOpens=7"});
    EXPECT_TRUE(eventually([this] {
        return std::ranges::count(values("kvlProcessName"), "STRING: ivr-worker") == 1;
    }));
    EXPECT_THAT(values("kvlProcessOpens"), ::testing::Contains("Counter32: 7 opens"));
    sim({"process", "end", "ivr-worker"});
    EXPECT_TRUE(eventually([this] { return values("kvlProcessName").size() == 1; }));
}

TEST_F(PlatformTest, TruncatedStoreLeavesTheAgentRunningWithAnEmptyTable) {
    write(storeFile(), "SQLite format 3");
    startAgent();
    EXPECT_THAT(agent().output(), HasSubstr("the attribute store cannot be read"));
    EXPECT_THAT(values("kvlStoreSerialNumber"), IsEmpty());
    EXPECT_THAT(rows("kvlDeviceTable"), SizeIs(14));
    EXPECT_EQ(std::filesystem::file_size(storeFile()), 15U);
}

TEST_F(PlatformTest, LockedStoreEmptiesItsTableUntilItIsLetGo) {
    startAgent();
    ASSERT_THAT(values("kvlStoreSerialNumber"), SizeIs(3));
    {
        FileLock const lock(storeFile());
        ASSERT_TRUE(lock.held());
        EXPECT_TRUE(eventually([this] { return values("kvlStoreSerialNumber").empty(); }));
        EXPECT_THAT(rows("kvlDeviceTable"), SizeIs(14));
    }
    EXPECT_TRUE(eventually([this] { return values("kvlStoreSerialNumber").size() == 3; }));
}

TEST_F(PlatformTest, StoreThatIsMadeGoodIsServedAgain) {
    write(storeFile(), "SQLite format 3");
    startAgent();
    EXPECT_THAT(values("kvlStoreSerialNumber"), IsEmpty());
    std::filesystem::remove(storeFile());
    EXPECT_TRUE(eventually([this] { return values("kvlStoreSerialNumber").size() == 3; }));
    EXPECT_TRUE(agent().waitFor("the attribute store can be read again"));
}

} // namespace
} // namespace kvloamd::e2e
