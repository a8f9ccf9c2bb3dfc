// SPDX-License-Identifier: BSD-2-Clause
// The control commands for the attribute store: what each changes, and what it refuses.
#include <array>
#include <atomic>
#include <fstream>
#include <set>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>

#include "tests/support/ChildProcess.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/SimulatedStore.h"

namespace {

using testing::ElementsAre;
using testing::HasSubstr;

class StoreChangesTest : public testing::Test {
  protected:
    StoreChangesTest() {
        sim::load({sim::board(1, "A1", "FAMILY: NX5, NAME: NX5-T1, IRQ: 11"),
                   sim::board(2, "B1", "FAMILY: VORN")});
        store.make();
    }

    static sim::Json list() { return sim::command({{"command", "store-list"}}); }
    static std::vector<std::string> serials() {
        std::vector<std::string> all;
        sim::Json const listing = list();
        for (auto const& board : listing["boards"])
            all.push_back(board["family"].get<std::string>() + " " +
                          board["serial"].get<std::string>());
        return all;
    }
    static sim::Json record(char const* serial) {
        return sim::command({{"command", "store-list"}, {"serial", serial}})["boards"][0];
    }
    static std::string refusal(std::string const& command) {
        sim::Json const reply = kvlsim::execute(sim::Json::parse(command));
        EXPECT_EQ(reply["ok"], false) << command << " -> " << reply;
        return reply.value("error", "");
    }

    sim::Store store;
};

TEST_F(StoreChangesTest, ListTellsFileFamiliesAndRecords) {
    sim::Json const listing = list();
    EXPECT_EQ(listing["file"], store.file());
    EXPECT_EQ(listing["families"].size(), 5U);
    EXPECT_EQ(listing["families"][1]["name"], "QUILLON");
    EXPECT_THAT(serials(), ElementsAre("NX5 A1", "VORN B1"));
    EXPECT_EQ(record("A1")["fields"]["IRQ"], 11);
    EXPECT_EQ(record("A1")["fields"]["Model"], "NX5-T1");
}

TEST_F(StoreChangesTest, AddedRecordIsInItsFamily) {
    sim::command({{"command", "store-add"},
                  {"serial", "NEW"},
                  {"family", "NX5"},
                  {"fields", {{"Model", "X"}, {"IRQ", -5}}}});
    EXPECT_THAT(serials(), ElementsAre("NX5 A1", "NX5 NEW", "VORN B1"));
    EXPECT_EQ(record("NEW")["fields"]["IRQ"], -5);
    EXPECT_EQ(record("NEW")["fields"]["BoardID"], -1);
    EXPECT_EQ(record("NEW")["fields"]["Version"], "BW1.0_BCI_Struct");
}

TEST_F(StoreChangesTest, AddedRecordIsLikeTheBoardOfTheChassis) {
    sim::command(
        {{"command", "insert"},
         {"board",
          {{"handle", 9},
           {"attributes", {{"SERIAL_NUMBER", "P9"}, {"FAMILY", "Z7"}, {"NAME", "Z7-E1"}}}}}});
    sim::command({{"command", "store-add"}, {"serial", "P9"}});
    EXPECT_EQ(record("P9")["family"], "Z7");
    EXPECT_EQ(record("P9")["fields"]["Model"], "Z7-E1");
}

TEST_F(StoreChangesTest, FamilyIsAddedWithItsFirstRecord) {
    sim::command({{"command", "store-add"}, {"serial", "NEW"}, {"family", "MINE"}});
    EXPECT_EQ(list()["families"][5]["name"], "MINE");
}

TEST_F(StoreChangesTest, FamilyCanBeAddedAlone) {
    sim::command({{"command", "store-add"}, {"family", "MINE"}});
    EXPECT_EQ(list()["families"].size(), 6U);
}

TEST_F(StoreChangesTest, SetChangesTheFieldsGivenAndNoOther) {
    sim::Json expected = record("A1");
    expected["fields"]["FirmwareVersion"] = "9.9";
    expected["fields"]["PCISlotNumber"] = 3;
    sim::command({{"command", "store-set"},
                  {"serial", "A1"},
                  {"fields", {{"FirmwareVersion", "9.9"}, {"PCISlotNumber", 3}}}});
    EXPECT_EQ(record("A1"), expected);
}

TEST_F(StoreChangesTest, RemovedRecordIsGone) {
    sim::command({{"command", "store-remove"}, {"serial", "A1"}});
    EXPECT_THAT(serials(), ElementsAre("VORN B1"));
}

TEST_F(StoreChangesTest, RemovedFamilyTakesItsBoardsAlong) {
    sim::command({{"command", "store-remove"}, {"family", "NX5"}});
    EXPECT_THAT(serials(), ElementsAre("VORN B1"));
    EXPECT_EQ(list()["families"][0]["name"], "QUILLON");
}

TEST_F(StoreChangesTest, InstanceOfARemovedRecordIsNotGivenAgain) {
    sim::command({{"command", "store-add"}, {"serial", "NEW"}, {"family", "NX5"}});
    auto const before = record("NEW")["instance"].get<int>();
    sim::command({{"command", "store-remove"}, {"serial", "NEW"}});
    sim::command({{"command", "store-add"}, {"serial", "NEW"}, {"family", "NX5"}});
    EXPECT_GT(record("NEW")["instance"].get<int>(), before);
}

TEST_F(StoreChangesTest, FirstChangeMakesTheStore) {
    std::filesystem::remove(store.file());
    sim::command({{"command", "store-remove"}, {"serial", "B1"}});
    EXPECT_THAT(serials(), ElementsAre("NX5 A1"));
}

TEST_F(StoreChangesTest, UnusableFileIsNamedWithTheRemedy) {
    std::ofstream(store.file()) << "something else";
    EXPECT_EQ(refusal(R"({"command": "store-list"})"),
              store.file() + ": is no attribute store; move it away, and a new one is made");
}

TEST_F(StoreChangesTest, LongestTextsFit) {
    std::string const text(79, 'm');
    sim::command({{"command", "store-set"}, {"serial", "A1"}, {"fields", {{"Model", text}}}});
    EXPECT_EQ(record("A1")["fields"]["Model"], text);
}

struct BadChange {
    char const* name;
    char const* command;
    char const* error;
};

class BadStoreChangeTest : public StoreChangesTest,
                           public testing::WithParamInterface<BadChange> {};

TEST_P(BadStoreChangeTest, IsRefusedAndChangesNothing) {
    sim::Json const before = list();
    EXPECT_THAT(refusal(GetParam().command), HasSubstr(GetParam().error));
    EXPECT_EQ(list(), before);
}

INSTANTIATE_TEST_SUITE_P(
    Commands, BadStoreChangeTest,
    testing::Values(
        BadChange{"SerialNumberIsThere",
                  R"({"command": "store-add", "serial": "A1", "family": "NX5"})",
                  "serial number \"A1\" is in the store already; set its fields or remove it"},
        BadChange{"FamilyIsThere", R"({"command": "store-add", "family": "NX5"})",
                  "family \"NX5\" is in the store already"},
        BadChange{"NoFamily", R"({"command": "store-add", "serial": "NEW"})",
                  "no board of the chassis has serial number \"NEW\" and a FAMILY; give "
                  "\"family\""},
        BadChange{"NothingToAdd", R"({"command": "store-add"})",
                  "argument \"family\" is missing; give it"},
        BadChange{"FamilyTooLong",
                  R"({"command": "store-add", "family": "012345678901234567890123456789"})",
                  "a family's name has 30 bytes; 29 is the most"},
        BadChange{"EmptySerialNumber", R"({"command": "store-add", "serial": "", "family": "X"})",
                  "a serial number is empty; write one"},
        BadChange{"ControlCharacters",
                  R"({"command": "store-add", "serial": "a\u0007", "family": "X"})",
                  "a serial number \"a?\" contains control characters; remove them"},
        BadChange{"UnknownField",
                  R"({"command": "store-set", "serial": "A1", "fields": {"Colour": 1}})",
                  "a board's record has no field \"Colour\"; there are Version, Model, Type,"},
        BadChange{"NumberForAText",
                  R"({"command": "store-set", "serial": "A1", "fields": {"Model": 1}})",
                  "Model cannot be 1; it is a text, write it in quotes"},
        BadChange{"TextForANumber",
                  R"({"command": "store-set", "serial": "A1", "fields": {"IRQ": "x"}})",
                  "IRQ cannot be the text \"x\"; it is a number of 4 bytes"},
        BadChange{"NumberTooLarge",
                  R"({"command": "store-set", "serial": "A1", "fields": {"IRQ": 4294967296}})",
                  "IRQ cannot be 4294967296; it is a number of 4 bytes"},
        BadChange{"SerialNumberAsField",
                  R"({"command": "store-set", "serial": "A1", "fields": {"SerialNumber": "X"}})",
                  "it cannot be among its fields, remove it"},
        BadChange{"NoFields", R"({"command": "store-set", "serial": "A1"})",
                  "argument \"fields\" is missing; give it"},
        BadChange{
            "UnknownSerialNumber",
            R"({"command": "store-set", "serial": "Z1", "fields": {"IRQ": 1}})",
            "no record with serial number \"Z1\" in the store; \"kvlsim store list\" lists what is "
            "there"},
        BadChange{"RemoveOfAnUnknownOne", R"({"command": "store-remove", "serial": "Z1"})",
                  "no record with serial number \"Z1\" in the store"},
        BadChange{"RemoveOfAnUnknownFamily", R"({"command": "store-remove", "family": "ZZ"})",
                  "no family \"ZZ\" in the store"},
        BadChange{"RemoveOfNothing", R"({"command": "store-remove"})",
                  "give either \"serial\", to remove a board's record, or \"family\""},
        BadChange{"ListOfAnUnknownOne", R"({"command": "store-list", "serial": "Z1"})",
                  "no record with serial number \"Z1\" in the store"}),
    [](auto const& each) { return each.param.name; });

TEST_F(StoreChangesTest, ReaderSeesTheOldRecordOrTheNewOneOfAnotherProcess) {
    // Two fields that always change together, read in one call while another process changes them.
    std::string const commands[] = {
        R"(run {"command": "store-set", "serial": "A1", "fields": {"Model": "aa", "Type": 1}})",
        R"(run {"command": "store-set", "serial": "A1", "fields": {"Model": "bb", "Type": 2}})"};
    support::ChildProcess writer({KVLSIM_PLATFORM_HOLDER}, {"VQRXCFGPATH=" + store.directory()});
    ASSERT_EQ(writer.readLine(), "ready");
    writer.writeLine(commands[0]);
    ASSERT_THAT(writer.readLine(), HasSubstr("\"ok\":true"));
    auto const board = record("A1")["instance"].get<int>();
    std::array<char, kQSBTypeNameSize> type{};
    int root = 0;
    ASSERT_EQ(QSBOpenStorage(type.data(), &root), QSB_SUCCESS);
    std::atomic<bool> done = false;
    int refused = 0;
    std::thread driver([&] {
        for (int i = 1; i <= 100; ++i) {
            writer.writeLine(commands[i % 2]);
            // A change that a reader blocks for too long is refused, and changes nothing.
            if (writer.readLine().find("\"ok\":true") == std::string::npos) ++refused;
        }
        done = true;
    });
    std::set<std::string> seen;
    do {
        std::array<char, 84> both{}; // Model and Type
        if (QSBGetDataValue("Board", board, 80, sizeof both, both.data()) == QSB_SUCCESS)
            seen.insert(std::string(both.data()) + std::to_string(both[80] + both[83]));
    } while (!done);
    driver.join();
    EXPECT_LT(refused, 100);
    EXPECT_FALSE(seen.empty());
    seen.erase("aa1");
    seen.erase("bb2");
    EXPECT_TRUE(seen.empty()) << *seen.begin();
}

} // namespace
