// SPDX-License-Identifier: BSD-2-Clause
// When the platform's records are read, and what becomes of them, on the simulated platform.
#include "agent/readers/PlatformReader.h"

#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <gtest/gtest.h>

#include "access/QSBBoard.h"
#include "agent/readers/StoreReader.h"
#include "board/Board.h"
#include "tests/support/SimulatedPlatform.h"

namespace kvloamd {
namespace {

using namespace std::chrono_literals;

/// Boards 5 and 7, one device each, both in a store of the test's own.
class PlatformReaderTest : public ::testing::Test {
  protected:
    PlatformReaderTest() {
        std::string folder = ::testing::TempDir() + "kvloam-store-XXXXXX";
        if (mkdtemp(folder.data()) == nullptr) throw std::runtime_error("no temporary folder");
        m_folder = folder;
        setenv("VQRXCFGPATH", m_folder.c_str(), 1);
        sim::load({board(5, "S5"), board(7, "S7")});
    }
    ~PlatformReaderTest() override {
        unsetenv("VQRXCFGPATH");
        std::filesystem::remove_all(m_folder);
    }

    static std::string board(int handle, std::string const& serial) {
        std::string const device = std::to_string(handle * 10);
        return sim::board(
            handle, serial, "FAMILY: NX5, NAME: NX5-T1, IRQ: 11, MEMBASEADDR: 0xD0000000",
            "devices: [{handle: " + device +
                ", type: 501, attributes: {NAME: d}, subdevices: [{handle: " + device +
                "1, type: 502}]}], processors: [{handle: " + device + "2}]");
    }
    static BoardRow row(std::uint32_t index, std::string serial) {
        BoardRow row;
        row.boardIndex = index;
        row.serialNumber = std::move(serial);
        return row;
    }
    /// Boards 5 and 7 in the board table.
    static std::vector<BoardRow> both() { return {row(1, "S5"), row(2, "S7")}; }
    static std::string nameAfter(PlatformReader& reader, std::vector<BoardRow> const& boards) {
        return reader.read(boards)->devices.at(0).name;
    }
    std::string storeFile() const { return m_folder + "/attributes.db"; }
    void spoilStore() const { std::filesystem::resize_file(storeFile(), 100); }
    static int timesIn(std::string const& text, std::string const& part) {
        int times = 0;
        for (auto at = text.find(part); at != std::string::npos; at = text.find(part, at + 1))
            ++times;
        return times;
    }

    std::string m_folder;
    PlatformReader m_seldom{1h};
    PlatformReader m_always{0ms};
};

TEST_F(PlatformReaderTest, EveryBoardHasItsRecords) {
    auto const records = m_seldom.read(both());
    ASSERT_EQ(records->devices.size(), 2U);
    EXPECT_EQ(records->devices[0].index(), (std::array<std::uint32_t, 2>{1, 50}));
    EXPECT_EQ(records->devices[1].index(), (std::array<std::uint32_t, 2>{2, 70}));
    ASSERT_EQ(records->subDevices.size(), 2U);
    EXPECT_EQ(records->subDevices[1].index(), (std::array<std::uint32_t, 3>{2, 70, 701}));
    ASSERT_EQ(records->processors.size(), 2U);
    EXPECT_EQ(records->processors[1].index(), (std::array<std::uint32_t, 2>{2, 702}));
    ASSERT_EQ(records->store.size(), 2U);
    EXPECT_EQ(records->store[1].boardIndex, 2U);
}

TEST_F(PlatformReaderTest, BoardThatThePlatformDoesNotKnowHasNoRecords) {
    auto const records = m_seldom.read({row(1, "other")});
    EXPECT_TRUE(records->devices.empty());
    EXPECT_TRUE(records->subDevices.empty());
    EXPECT_TRUE(records->processors.empty());
    EXPECT_TRUE(records->store.empty());
}

TEST_F(PlatformReaderTest, NothingIsReadAnewWhileItIsYoung) {
    auto const records = m_seldom.read(both());
    sim::set(50, "NAME", "changed");
    EXPECT_EQ(m_seldom.read(both()), records);
}

TEST_F(PlatformReaderTest, EverythingIsReadAnewWhenItIsOld) {
    m_always.read(both());
    sim::set(50, "NAME", "changed");
    EXPECT_EQ(nameAfter(m_always, both()), "changed");
}

TEST_F(PlatformReaderTest, SnapshotThatIsHeldKeepsItsRecords) {
    auto const held = m_always.read(both());
    sim::set(50, "NAME", "changed");
    m_always.read(both());
    EXPECT_EQ(held->devices.at(0).name, "d");
}

TEST_F(PlatformReaderTest, BoardThatComesIsReadAtOnce) {
    m_seldom.read({row(1, "S5")});
    auto const records = m_seldom.read(both());
    EXPECT_EQ(records->devices.size(), 2U);
    EXPECT_EQ(records->store.size(), 2U);
}

TEST_F(PlatformReaderTest, BoardThatComesLeavesTheOthersUnread) {
    m_seldom.read({row(1, "S5")});
    sim::set(50, "NAME", "changed");
    EXPECT_EQ(nameAfter(m_seldom, both()), "d");
}

TEST_F(PlatformReaderTest, BoardThatGoesTakesItsRecordsWithIt) {
    m_seldom.read(both());
    auto const records = m_seldom.read({row(2, "S7")});
    ASSERT_EQ(records->devices.size(), 1U);
    EXPECT_EQ(records->devices[0].boardIndex, 2U);
    EXPECT_EQ(records->subDevices.size(), 1U);
    EXPECT_EQ(records->processors.size(), 1U);
    EXPECT_EQ(records->store.size(), 1U);
}

TEST_F(PlatformReaderTest, BoardWithAnotherSerialNumberIsReadAtOnce) {
    m_seldom.read({row(1, "S5")});
    auto const records = m_seldom.read({row(1, "S7")});
    ASSERT_EQ(records->devices.size(), 1U);
    EXPECT_EQ(records->devices[0].auid, 70U);
    EXPECT_EQ(records->store.at(0).serialNumber, "S7");
}

TEST_F(PlatformReaderTest, StatusOfABoardCausesNoReading) {
    auto boards = both();
    auto const records = m_seldom.read(boards);
    boards[0].status = BoardStatusStopped;
    EXPECT_EQ(m_seldom.read(boards), records);
}

TEST_F(PlatformReaderTest, StoreRecordHasItsFields) {
    auto const records = m_seldom.read(both());
    ASSERT_FALSE(records->store.empty());
    StoreRow const& record = records->store[0];
    EXPECT_EQ(record.serialNumber, "S5");
    EXPECT_EQ(record.model, "NX5-T1");
    EXPECT_EQ(record.version, KVL::kQSBBoardLayout);
    EXPECT_EQ(record.irq, 11);
    EXPECT_EQ(record.sharedMemoryAddress, "0xd0000000");
}

TEST_F(PlatformReaderTest, StoreFieldThatReadsAsMinusOneIsLeftEmpty) {
    m_always.read(both());
    sim::command({{"command", "store-set"},
                  {"serial", "S5"},
                  {"fields", {{"IRQ", -1}, {"IOBaseAddress", -1}, {"Model", ""}}}});
    auto const records = m_always.read(both());
    ASSERT_FALSE(records->store.empty());
    EXPECT_EQ(records->store[0].irq, std::nullopt);
    EXPECT_EQ(records->store[0].ioAddress, "");
    EXPECT_EQ(records->store[0].model, "");
}

TEST_F(PlatformReaderTest, BoardWithoutStoreRecordHasNoStoreRow) {
    m_always.read(both());
    sim::command({{"command", "store-remove"}, {"serial", "S5"}});
    auto const records = m_always.read(both());
    ASSERT_EQ(records->store.size(), 1U);
    EXPECT_EQ(records->store[0].boardIndex, 2U);
    EXPECT_EQ(records->devices.size(), 2U);
}

TEST_F(PlatformReaderTest, StoreRecordThatIsAddedIsSeen) {
    m_always.read(both());
    sim::command({{"command", "store-remove"}, {"serial", "S5"}});
    m_always.read(both());
    sim::command({{"command", "store-add"}, {"serial", "S5"}});
    EXPECT_EQ(m_always.read(both())->store.size(), 2U);
}

TEST_F(PlatformReaderTest, StoreThatIsSpoiledLeavesItsTableEmptyAndTheOthersFull) {
    m_always.read(both());
    spoilStore();
    auto const records = m_always.read(both());
    EXPECT_TRUE(records->store.empty());
    EXPECT_EQ(records->devices.size(), 2U);
}

TEST_F(PlatformReaderTest, StoreThatIsReplacedIsReadAgain) {
    m_always.read(both());
    spoilStore();
    m_always.read(both());
    std::filesystem::remove(storeFile());
    EXPECT_EQ(m_always.read(both())->store.size(), 2U);
}

TEST_F(PlatformReaderTest, StoresStateIsLoggedOncePerChange) {
    testing::internal::CaptureStderr();
    m_always.read(both());
    spoilStore();
    for (int reading = 0; reading < 3; ++reading)
        m_always.read(both());
    std::filesystem::remove(storeFile());
    for (int reading = 0; reading < 3; ++reading)
        m_always.read(both());
    std::string const logged = testing::internal::GetCapturedStderr();
    EXPECT_EQ(timesIn(logged, "the attribute store cannot be read"), 1) << logged;
    EXPECT_EQ(timesIn(logged, "the attribute store can be read again"), 1) << logged;
}

TEST_F(PlatformReaderTest, HostWithoutAStoreIsNoFault) {
    testing::internal::CaptureStderr();
    setenv("VQRXCFGPATH", "", 1);
    PlatformReader reader(0ms, storeIsConfigured());
    EXPECT_TRUE(reader.read(both())->store.empty());
    EXPECT_TRUE(reader.storeIsReadable());
    std::string const logged = testing::internal::GetCapturedStderr();
    EXPECT_EQ(timesIn(logged, "attribute store"), 0) << logged;
}

TEST_F(PlatformReaderTest, StoreIsConfiguredByItsDirectory) {
    EXPECT_TRUE(storeIsConfigured());
    setenv("VQRXCFGPATH", "/nowhere", 1);
    EXPECT_TRUE(storeIsConfigured()) << "a wrong directory is a fault";
    setenv("VQRXCFGPATH", "", 1);
    EXPECT_FALSE(storeIsConfigured());
    unsetenv("VQRXCFGPATH");
    EXPECT_EQ(storeIsConfigured(), std::filesystem::exists("/usr/velquor/cfg"));
}

TEST_F(PlatformReaderTest, StoreOfAnotherChassisIsLoggedOnce) {
    m_always.read(both()); // which opens this test's store
    sim::command({{"command", "store-remove"}, {"serial", "S5"}});
    testing::internal::CaptureStderr();
    m_always.read(both());
    EXPECT_EQ(testing::internal::GetCapturedStderr(), ""); // one board has a record
    sim::command({{"command", "store-remove"}, {"serial", "S7"}});
    testing::internal::CaptureStderr();
    for (int reading = 0; reading < 3; ++reading)
        m_always.read(both());
    sim::command({{"command", "store-add"}, {"serial", "S7"}});
    m_always.read(both());
    std::string const logged = testing::internal::GetCapturedStderr();
    EXPECT_EQ(timesIn(logged, "the attribute store has a record of none of the boards"), 1)
        << logged;
    EXPECT_EQ(timesIn(logged, "the attribute store has records of the boards"), 1) << logged;
}

} // namespace
} // namespace kvloamd
