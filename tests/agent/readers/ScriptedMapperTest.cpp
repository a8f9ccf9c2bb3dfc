// SPDX-License-Identifier: BSD-2-Clause
// The agent's reading of boards and devices against answers that a sound device mapper does not
// give. This program has a device mapper client of its own in the place of the platform's.
#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "agent/readers/BoardFinder.h"
#include "agent/readers/DeviceReader.h"
#include "agent/readers/PlatformReader.h"
#include "agent/rows/DeviceRows.h"
#include "boardplatform/dm_client.h"

namespace {

/// Boards with serial numbers, or without; each has the objects of `children` as devices of type
/// 501.
class ScriptedMapper final : public DeviceMapperClient {
  public:
    int FindObjects(long parent, int /*count*/, DMAttribute* criteria, int* found,
                    long* auids) override {
        if (!answers) return 1;
        std::int32_t type = 0;
        std::memcpy(&type, criteria[0].value, sizeof type);
        std::vector<long> matches;
        if (type == 200)
            for (auto const& [auid, serial] : boards)
                matches.push_back(auid);
        if (type == 501 && boards.contains(parent)) matches = children;
        if (static_cast<int>(matches.size()) < *found) *found = static_cast<int>(matches.size());
        std::copy_n(matches.begin(), *found, auids);
        return 0;
    }
    int Reserved3() override { return 1; }
    int GetRootObject(long* auid) override {
        *auid = 1;
        return rootResult;
    }
    int FindObjectByName(char* /*name*/, long* /*auid*/) override { return 1; }
    int GetAttributes(long auid, int count, DMAttribute* requests) override {
        for (int i = 0; i < count; ++i) {
            auto const board = boards.find(auid);
            bool const known = board != boards.end() && !board->second.empty() &&
                               std::strcmp(requests[i].name, "SERIAL_NUMBER") == 0;
            requests[i].status = known ? 0 : 1;
            requests[i].size = 0;
            if (!known) continue;
            requests[i].size = static_cast<std::int32_t>(board->second.size() + 1);
            std::memcpy(requests[i].value, board->second.c_str(), board->second.size() + 1);
        }
        return kDMSomeAttributesFailed;
    }

    bool answers = true;
    int rootResult = 0;
    std::map<long, std::string> boards;
    std::vector<long> children;
};

ScriptedMapper* s_mapper = nullptr;

} // namespace

DeviceMapperClient* dm_getDeviceMapperClient() {
    return s_mapper == nullptr ? (s_mapper = new ScriptedMapper) : s_mapper;
}

namespace kvloamd {
namespace {

class ScriptedMapperTest : public ::testing::Test {
  protected:
    ScriptedMapperTest() {
        dm_getDeviceMapperClient();
        *s_mapper = ScriptedMapper();
        setenv("VQRXCFGPATH", "/dev/null", 1); // no store
    }
    static std::vector<BoardRow> boardTable() {
        BoardRow row;
        row.boardIndex = 1;
        row.serialNumber = "A";
        return {row};
    }
};

TEST_F(ScriptedMapperTest, SerialNumberOfSeveralBoardsFindsNone) {
    s_mapper->boards = {{5, "A"}, {6, "A"}, {7, "B"}};
    EXPECT_EQ(BoardFinder().find("A"), std::nullopt);
    EXPECT_EQ(BoardFinder().find("B"), 7);
}

TEST_F(ScriptedMapperTest, BoardWithoutSerialNumberIsNotFound) {
    s_mapper->boards = {{5, ""}};
    BoardFinder const finder;
    EXPECT_TRUE(finder.good());
    EXPECT_EQ(finder.find("unknown"), std::nullopt);
    EXPECT_EQ(finder.find(""), std::nullopt);
}

TEST_F(ScriptedMapperTest, SearchThatFailsIsNotGood) {
    s_mapper->boards = {{5, "A"}};
    s_mapper->answers = false;
    EXPECT_FALSE(BoardFinder().good());
}

TEST_F(ScriptedMapperTest, MapperWithoutRootIsNotGood) {
    s_mapper->rootResult = 1;
    EXPECT_FALSE(BoardFinder().good());
}

TEST_F(ScriptedMapperTest, HandleThatIsListedTwiceIsOneRow) {
    s_mapper->boards = {{5, "A"}};
    s_mapper->children = {9, 8, 9};
    auto const devices = readDevices(5, 1).devices;
    ASSERT_EQ(devices.size(), 2U);
    EXPECT_EQ(devices[0].auid, 8U);
    EXPECT_EQ(devices[1].auid, 9U);
}

TEST_F(ScriptedMapperTest, NegativeHandleIsItsFourBytes) {
    s_mapper->boards = {{5, "A"}};
    s_mapper->children = {-2};
    EXPECT_EQ(readDevices(5, 1).devices.at(0).auid, 0xFFFFFFFEU);
}

TEST_F(ScriptedMapperTest, DevicesStayWhileTheMapperDoesNotAnswer) {
    s_mapper->boards = {{5, "A"}};
    s_mapper->children = {9};
    PlatformReader reader(std::chrono::milliseconds(0));
    reader.read(boardTable());
    s_mapper->answers = false;
    EXPECT_EQ(reader.read(boardTable())->devices.size(), 1U);
}

TEST_F(ScriptedMapperTest, DevicesGoWhenTheMapperKnowsTheBoardNoMore) {
    s_mapper->boards = {{5, "A"}};
    s_mapper->children = {9};
    PlatformReader reader(std::chrono::milliseconds(0));
    reader.read(boardTable());
    s_mapper->boards.clear();
    EXPECT_TRUE(reader.read(boardTable())->devices.empty());
}

} // namespace
} // namespace kvloamd
