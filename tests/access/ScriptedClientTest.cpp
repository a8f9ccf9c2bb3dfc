// SPDX-License-Identifier: BSD-2-Clause
// The record classes with unusual answers of the device mapper. This program has its own device
// mapper client instead of the platform's.
#include <cstddef>
#include <cstdint>
#include <cstring>

#include <algorithm>
#include <functional>
#include <set>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "access/DevMapBoardIf.h"
#include "access/DevMapDeviceIf.h"
#include "access/DevMapProcessorIf.h"
#include "access/DevMapSubDeviceIf.h"

namespace {

/// A client whose answers the test chooses.
class ScriptedClient final : public DeviceMapperClient {
  public:
    int FindObjects(long /*parent*/, int count, DMAttribute* criteria, int* found,
                    long* auids) override {
        ++searches;
        lastCriterion.assign(static_cast<char const*>(criteria[0].value),
                             static_cast<std::size_t>(criteria[0].size));
        lastCriteria = count;
        lastCapacity = *found;
        return onFind(found, auids);
    }
    int Reserved3() override { return 1; }
    int GetRootObject(long* auid) override {
        *auid = 1;
        return rootResult;
    }
    int FindObjectByName(char* /*name*/, long* /*auid*/) override { return 1; }
    int GetAttributes(long /*auid*/, int count, DMAttribute* requests) override {
        asked.clear();
        for (int i = 0; i < count; ++i)
            asked.push_back(requests[i]);
        for (int i = 0; i < count; ++i)
            onAttribute(requests[i]);
        return result;
    }

    int rootResult = 0;
    int searches = 0;
    int lastCriteria = 0;
    int lastCapacity = 0;
    std::string lastCriterion;
    std::vector<DMAttribute> asked;
    int result = 0;
    std::function<int(int*, long*)> onFind;
    std::function<void(DMAttribute&)> onAttribute = [](DMAttribute& request) { missing(request); };

    static void missing(DMAttribute& request) {
        request.status = 1;
        request.size = 0;
    }
};

ScriptedClient* s_client = nullptr;

class ScriptedClientTest : public testing::Test {
  protected:
    ScriptedClientTest() {
        DeviceMapperIf::get_interface(); // makes the client, at the first call
        *s_client = ScriptedClient();
    }
    DeviceMapperIf& mapper() { return *DeviceMapperIf::get_interface(); }
};

TEST_F(ScriptedClientTest, BoardIsReadInOneRequestOfSixteenAttributes) {
    DevMapBoardIf const board(5);
    std::vector<std::string> names;
    for (auto const& request : s_client->asked)
        names.emplace_back(request.name);
    EXPECT_EQ(names, (std::vector<std::string>{"SERIAL_NUMBER", "PCI_SLOT_NUMBER", "PCI_BUS_NUMBER",
                                               "MEMBASEADDR", "IOBASEADDR", "IRQ", "FIRMWARE_NAME",
                                               "FIRMWARE_NAME1", "DESCRIPTION", "NAME", "SHELF_ID",
                                               "VORN_DRIVER_BOARD_ID", "FAMILY", "CHASSIS_SLOT",
                                               "Board Id (BLT ID)", "FIRMWARE_VERSION"}));
}

TEST_F(ScriptedClientTest, RequestsComeClearedAndWithTheirSizes) {
    DevMapBoardIf const board(5);
    std::set<std::string> const texts = {"SERIAL_NUMBER",   "FIRMWARE_NAME", "FIRMWARE_NAME1",
                                         "DESCRIPTION",     "NAME",          "FAMILY",
                                         "FIRMWARE_VERSION"};
    for (auto const& request : s_client->asked) {
        EXPECT_EQ(request.status, 0) << request.name;
        EXPECT_EQ(request.reserved, 0) << request.name;
        EXPECT_EQ(request.size, texts.contains(request.name) ? 128 : 4) << request.name;
    }
}

TEST_F(ScriptedClientTest, TextThatFillsItsBufferIsReadWhole) {
    s_client->onAttribute = [](DMAttribute& request) {
        if (request.size == 128) std::memset(request.value, 'x', 128);
    };
    DevMapBoardIf const board(5);
    EXPECT_EQ(board.SerialNumber(), std::string(128, 'x'));
    EXPECT_EQ(board.Description(), std::string(128, 'x'));
}

TEST_F(ScriptedClientTest, TextEndsAtItsTerminator) {
    s_client->onAttribute = [](DMAttribute& request) {
        if (request.size == 128) std::memcpy(request.value, "one\0two", 8);
    };
    EXPECT_EQ(DevMapBoardIf(5).Name(), "one");
}

TEST_F(ScriptedClientTest, NumbersReadInPlaceKeepWhatWasWrittenWhenTheWholeRequestFails) {
    s_client->result = 7;
    s_client->onAttribute = [](DMAttribute& request) {
        if (request.size == 4) std::memset(request.value, 0, 4);
        request.status = 1;
    };
    DevMapBoardIf const board(5);
    EXPECT_EQ(board.ShelfID(), 0);
    EXPECT_EQ(board.ChassisSlot(), 0);
    EXPECT_EQ(board.VORNDriverBoardID(), 0);
    EXPECT_EQ(board.IRQ(), -1);
}

TEST_F(ScriptedClientTest, NumbersReadInPlaceGoByTheirStatusWhenTheRequestFailsInPart) {
    s_client->result = kDMSomeAttributesFailed;
    s_client->onAttribute = [](DMAttribute& request) {
        if (request.size == 4) std::memset(request.value, 0, 4);
        if (std::string(request.name) == "SHELF_ID") request.status = 1;
    };
    DevMapBoardIf const board(5);
    EXPECT_EQ(board.ShelfID(), -1);
    EXPECT_EQ(board.ChassisSlot(), 0);
}

TEST_F(ScriptedClientTest, ConditionKeepsWhatWasWrittenUnlessTheRequestFailsInPart) {
    s_client->onAttribute = [](DMAttribute& request) {
        std::int32_t const written = 15;
        if (request.size == 4) std::memcpy(request.value, &written, sizeof written);
        request.status = 1;
    };
    DevMapBoardIf board(5);
    s_client->result = 7;
    EXPECT_EQ(board.BoardCondition(), 15);
    EXPECT_EQ(board.BoardPresent(), 15);
    s_client->result = kDMSomeAttributesFailed;
    EXPECT_EQ(board.BoardCondition(), -1);
    EXPECT_EQ(board.BoardPresent(), -1);
}

TEST_F(ScriptedClientTest, ConditionOfTwoBytesIsSignExtended) {
    std::int16_t written = 3;
    s_client->onAttribute = [&](DMAttribute& request) {
        if (request.size != 4) return;
        std::memcpy(request.value, &written, sizeof written);
        request.size = sizeof written;
    };
    DevMapBoardIf board(5);
    EXPECT_EQ(board.BoardCondition(), 3);
    EXPECT_EQ(board.BoardPresent(), 3);
    EXPECT_EQ(board.LogicalID(), 3);
    written = -7;
    EXPECT_EQ(board.BoardCondition(), -7);
    EXPECT_EQ(board.BoardPresent(), -7);
    EXPECT_EQ(board.LogicalID(), -7);
}

/// Reads the record of an object that has all attributes, reads it again after all of them are
/// gone, and returns it.
template <class Record>
Record readTwice() {
    s_client->onAttribute = [](DMAttribute& request) {
        if (request.size == 128) std::strcpy(static_cast<char*>(request.value), "former");
    };
    Record record(7L);
    EXPECT_EQ(record.Name(), "former");
    s_client->result = kDMSomeAttributesFailed;
    s_client->onAttribute = ScriptedClient::missing;
    record.PopulateAttributes();
    return record;
}

TEST_F(ScriptedClientTest, NameThatIsGoneAtTheNextReadingStaysAsItWas) {
    EXPECT_EQ(readTwice<DevMapDeviceIf>().Name(), "former");
    EXPECT_EQ(readTwice<DevMapSubDeviceIf>().Name(), "former");
    EXPECT_EQ(readTwice<DevMapProcessorIf>().Name(), "former");
}

TEST_F(ScriptedClientTest, OtherAttributesThatAreGoneAtTheNextReadingAreMissing) {
    auto const device = readTwice<DevMapDeviceIf>();
    QCompDesc address{};
    EXPECT_EQ(device.DeviceType(), -1);
    EXPECT_FALSE(device.LineAdminAddress(address));
    EXPECT_EQ(readTwice<DevMapSubDeviceIf>().FrontEndType(), -1);
    EXPECT_FALSE(readTwice<DevMapSubDeviceIf>().TSCAddress(address));
    auto const processor = readTwice<DevMapProcessorIf>();
    EXPECT_EQ(processor.ProcessorNumber(), -1);
    EXPECT_EQ(processor.BootKernelVersion(), "unknown");
}

TEST_F(ScriptedClientTest, NameThatIsMissingFromTheStartIsEmpty) {
    EXPECT_EQ(DevMapDeviceIf(7L).Name(), "");
    EXPECT_EQ(DevMapSubDeviceIf(7L).Name(), "");
    EXPECT_EQ(DevMapProcessorIf(7L).Name(), "");
}

TEST_F(ScriptedClientTest, DateOfAFailedRequestIsZero) {
    s_client->onAttribute = [](DMAttribute& request) {
        if (request.size == 128)
            std::strcpy(static_cast<char*>(request.value), "Tue Mar  2 09:05:00 2004");
    };
    DevMapBoardIf board(5);
    EXPECT_NE(board.StateChangeDate(), 0);
    s_client->result = kDMSomeAttributesFailed;
    EXPECT_EQ(board.StateChangeDate(), 0);
}

TEST_F(ScriptedClientTest, FailedSearchFindsNothing) {
    s_client->onFind = [](int* found, long* auids) {
        auids[0] = 3;
        *found = 1;
        return 1;
    };
    EXPECT_TRUE(mapper().ListAllBoards().empty());
}

TEST_F(ScriptedClientTest, FailedSearchOfOneDeviceTypeLeavesOutThatTypeOnly) {
    s_client->onFind = [](int* found, long* auids) {
        auids[0] = s_client->searches;
        *found = 1;
        return s_client->searches == 2 ? 1 : 0;
    };
    EXPECT_EQ(DevMapBoardIf(5).ListAllDevices(),
              (std::vector<long>{1, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13}));
}

TEST_F(ScriptedClientTest, CountsBeyondTheCapacityAreNotBelieved) {
    s_client->onFind = [](int* found, long* /*auids*/) {
        *found = 5000;
        return 0;
    };
    EXPECT_EQ(mapper().ListAllBoards().size(), 100U);
    s_client->onFind = [](int* found, long* /*auids*/) {
        *found = -4;
        return 0;
    };
    EXPECT_TRUE(mapper().ListAllBoards().empty());
}

TEST_F(ScriptedClientTest, BoardSearchHasOneCriterionAndRoomForOneHundred) {
    s_client->onFind = [](int* found, long* /*auids*/) {
        *found = 0;
        return 0;
    };
    mapper().ListAllBoards();
    std::int32_t const type = 200;
    EXPECT_EQ(s_client->lastCriteria, 1);
    EXPECT_EQ(s_client->lastCapacity, 100);
    EXPECT_EQ(s_client->lastCriterion,
              std::string(reinterpret_cast<char const*>(&type), sizeof type));
}

TEST_F(ScriptedClientTest, SearchForAllBoardsTakesMoreThanOneHundred) {
    s_client->onFind = [](int* found, long* auids) {
        *found = std::min(*found, 700);
        for (int i = 0; i < *found; ++i)
            auids[i] = i;
        return 0;
    };
    std::vector<long> boards;
    EXPECT_TRUE(mapper().FindAllBoards(boards));
    ASSERT_EQ(boards.size(), 700U);
    EXPECT_EQ(boards.back(), 699);
}

TEST_F(ScriptedClientTest, SearchForAllBoardsThatFailsLeavesWhatIsKnown) {
    std::vector<long> boards{3, 5};
    s_client->onFind = [](int* /*found*/, long* /*auids*/) { return 1; };
    EXPECT_FALSE(mapper().FindAllBoards(boards));
    s_client->onFind = [](int* found, long* /*auids*/) { return *found > 256 ? 1 : 0; };
    EXPECT_FALSE(mapper().FindAllBoards(boards));
    s_client->onFind = [](int* found, long* /*auids*/) { return *found = 0; };
    s_client->rootResult = 1;
    EXPECT_FALSE(mapper().FindAllBoards(boards));
    EXPECT_EQ(boards, (std::vector<long>{3, 5}));
}

TEST_F(ScriptedClientTest, SearchForAllBoardsFindsNoneWhereThereAreNone) {
    std::vector<long> boards{3, 5};
    s_client->onFind = [](int* found, long* /*auids*/) { return *found = 0; };
    EXPECT_TRUE(mapper().FindAllBoards(boards));
    EXPECT_TRUE(boards.empty());
}

TEST_F(ScriptedClientTest, PlatformCriterionIncludesTheTerminator) {
    s_client->onFind = [](int* found, long* /*auids*/) {
        *found = 0;
        return 0;
    };
    mapper().ListBoardsByPlatform("VORN");
    EXPECT_EQ(s_client->lastCriterion, std::string("VORN\0", 5));
}

} // namespace

DeviceMapperClient* dm_getDeviceMapperClient() {
    static ScriptedClient client;
    s_client = &client;
    return s_client;
}
