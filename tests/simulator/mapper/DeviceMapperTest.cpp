// SPDX-License-Identifier: BSD-2-Clause
// The simulated device mapper client, called through the platform's own interface.
#include "boardplatform/dm_client.h"

#include <array>
#include <atomic>
#include <climits>
#include <cstdint>
#include <cstring>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/exports/Control.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using testing::SizeIs;

constexpr char const* kChassis = R"(
boards:
  - handle: 30
    attributes:
      SERIAL_NUMBER: "S30"
      NAME: SAME
      CTPLATFORM: NX5
      IRQ: 7
      LOGICAL ID: {short: -2}
      MEMBASEADDR: {empty: true}
      FLAG: {byte: -1}
      ADDRESS: {descriptor: [1, 2, 3, 4]}
    devices:
      - {handle: 33, type: 503, attributes: {NAME: voice}}
      - {handle: 31, type: 501, attributes: {NAME: trunk}, subdevices: [{handle: 32, type: 502}]}
      - {handle: 34, type: 501}
    processors:
      - {handle: 39, attributes: {NAME: cpu}}
  - handle: 10
    attributes: {SERIAL_NUMBER: "S10", NAME: SAME, CTPLATFORM: NX5X}
  - handle: 20
    attributes: {SERIAL_NUMBER: "S20", CTPLATFORM: NX5, IRQ: 7}
)";

class DeviceMapperTest : public testing::Test {
  protected:
    DeviceMapperTest() {
        kvlsim::loadChassis(kChassis);
        client().GetRootObject(&root);
    }

    static DeviceMapperClient& client() { return *dm_getDeviceMapperClient(); }

    static DMAttribute request(char const* name, void* buffer, std::int32_t size) {
        return {name, buffer, 77, 0, size};
    }

    static std::vector<long> find(long parent, std::vector<DMAttribute> criteria,
                                  int capacity = 100, int expected = 0) {
        std::vector<long> auids(static_cast<std::size_t>(capacity) + 1, -5);
        int found = capacity;
        EXPECT_EQ(client().FindObjects(parent, static_cast<int>(criteria.size()), criteria.data(),
                                       &found, auids.data()),
                  expected);
        EXPECT_EQ(auids[static_cast<std::size_t>(found)], -5) << "written behind the count";
        auids.resize(static_cast<std::size_t>(found));
        return auids;
    }

    std::vector<long> ofType(long parent, std::int32_t type, int capacity = 100) {
        return find(parent, {request("TYPE", &type, 4)}, capacity);
    }

    static long named(std::string name) {
        long auid = -9;
        client().FindObjectByName(name.data(), &auid);
        return auid;
    }

    long root = 0;
};

TEST_F(DeviceMapperTest, TheClientIsOnePerProcess) {
    EXPECT_EQ(dm_getDeviceMapperClient(), dm_getDeviceMapperClient());
}

TEST_F(DeviceMapperTest, BoardsAreFoundUnderTheRootInTheOrderOfTheChassis) {
    EXPECT_THAT(ofType(root, 200), ElementsAre(30, 10, 20));
}

TEST_F(DeviceMapperTest, OnlyDirectChildrenAreFound) {
    EXPECT_THAT(ofType(root, 501), IsEmpty());
    EXPECT_THAT(ofType(30, 502), IsEmpty());
    EXPECT_THAT(ofType(31, 502), ElementsAre(32));
}

TEST_F(DeviceMapperTest, DevicesAndProcessorsAreFoundByTheirTypeUnderTheirBoard) {
    EXPECT_THAT(ofType(30, 501), ElementsAre(31, 34));
    EXPECT_THAT(ofType(30, 503), ElementsAre(33));
    EXPECT_THAT(ofType(30, 800), ElementsAre(39));
}

TEST_F(DeviceMapperTest, TextCriterionMatchesWithItsTerminatorCounted) {
    std::string platform = "NX5";
    EXPECT_THAT(find(root, {request("CTPLATFORM", platform.data(), 4)}), ElementsAre(30, 20));
}

TEST_F(DeviceMapperTest, TextCriterionWithoutItsTerminatorMatchesNothing) {
    std::string platform = "NX5";
    EXPECT_THAT(find(root, {request("CTPLATFORM", platform.data(), 3)}), IsEmpty());
}

TEST_F(DeviceMapperTest, NumberCriterionOfAnotherWidthMatchesNothing) {
    std::int16_t type = 200;
    EXPECT_THAT(find(root, {request("TYPE", &type, 2)}), IsEmpty());
}

TEST_F(DeviceMapperTest, AllCriteriaMustMatch) {
    std::int32_t irq = 7;
    std::string serial = "S20";
    EXPECT_THAT(find(root, {request("IRQ", &irq, 4)}), ElementsAre(30, 20));
    EXPECT_THAT(find(root, {request("IRQ", &irq, 4), request("SERIAL_NUMBER", serial.data(), 4)}),
                ElementsAre(20));
}

TEST_F(DeviceMapperTest, WithoutCriteriaEveryChildMatches) {
    EXPECT_THAT(find(30, {}), ElementsAre(33, 31, 34, 39));
}

TEST_F(DeviceMapperTest, SearchStopsAtTheCapacity) {
    EXPECT_THAT(ofType(root, 200, 2), ElementsAre(30, 10));
    EXPECT_THAT(ofType(root, 200, 0), IsEmpty());
}

TEST_F(DeviceMapperTest, OneHundredOfOneHundredAndFiftyBoardsAreFound) {
    std::string text = "boards:\n";
    for (int i = 1; i <= 150; ++i)
        text += "  - {handle: " + std::to_string(i) + ", attributes: {SERIAL_NUMBER: \"S" +
                std::to_string(i) + "\"}}\n";
    kvlsim::loadChassis(text);
    EXPECT_THAT(ofType(root, 200), SizeIs(100));
}

TEST_F(DeviceMapperTest, SearchUnderAnUnknownParentFailsWithNothingFound) {
    EXPECT_THAT(find(4711, {}, 100, 201), IsEmpty());
    EXPECT_THAT(find(0, {}, 100, 201), IsEmpty());
    EXPECT_THAT(find(-1, {}, 100, 201), IsEmpty());
}

#if LONG_MAX > INT32_MAX
TEST_F(DeviceMapperTest, HandleThatMatchesInItsLowerHalfOnlyIsUnknown) {
    EXPECT_THAT(find((1L << 32) + 30, {}, 100, 201), IsEmpty());
}
#endif

TEST_F(DeviceMapperTest, SearchWithNullPointersIsRefused) {
    long auid = 0;
    int found = 1;
    DMAttribute nameless = request(nullptr, &found, 4);
    EXPECT_NE(client().FindObjects(root, 0, nullptr, nullptr, &auid), 0);
    EXPECT_NE(client().FindObjects(root, 0, nullptr, &found, nullptr), 0);
    EXPECT_NE(client().FindObjects(root, 1, nullptr, &found, &auid), 0);
    EXPECT_NE(client().FindObjects(root, 1, &nameless, &found, &auid), 0);
    EXPECT_NE(client().FindObjects(root, -1, &nameless, &found, &auid), 0);
}

TEST_F(DeviceMapperTest, NameFindsTheFirstObjectOfTheChassisThatBearsIt) {
    EXPECT_EQ(named("SAME"), 30);
    EXPECT_EQ(named("trunk"), 31);
    EXPECT_EQ(named("cpu"), 39);
}

TEST_F(DeviceMapperTest, UnknownNameFailsAndLeavesTheHandleAlone) {
    long auid = -9;
    std::string name = "nobody";
    EXPECT_NE(client().FindObjectByName(name.data(), &auid), 0);
    EXPECT_EQ(auid, -9);
}

TEST_F(DeviceMapperTest, AttributesComeWithStatusZeroAndTheirSize) {
    std::array<char, 128> serial{};
    std::int32_t irq = 0;
    std::int16_t logical = 0;
    std::int8_t flag = 0;
    QCompDesc address{};
    std::array requests = {request("SERIAL_NUMBER", serial.data(), 128), request("IRQ", &irq, 4),
                           request("LOGICAL ID", &logical, 2), request("FLAG", &flag, 1),
                           request("ADDRESS", &address, 8)};
    EXPECT_EQ(client().GetAttributes(30, 5, requests.data()), 0);
    EXPECT_THAT(requests, testing::Each(testing::Field(&DMAttribute::status, 0)));
    EXPECT_STREQ(serial.data(), "S30");
    EXPECT_EQ(requests[0].size, 4);
    EXPECT_EQ(irq, 7);
    EXPECT_EQ(requests[1].size, 4);
    EXPECT_EQ(logical, -2);
    EXPECT_EQ(requests[2].size, 2);
    EXPECT_EQ(flag, -1);
    EXPECT_EQ(requests[3].size, 1);
    EXPECT_THAT(address.word, ElementsAre(1, 2, 3, 4));
    EXPECT_EQ(requests[4].size, 8);
}

TEST_F(DeviceMapperTest, NarrowNumbersLeaveTheRestOfTheBufferAlone) {
    std::int32_t logical = 0x55555555;
    DMAttribute asked = request("LOGICAL ID", &logical, 4);
    EXPECT_EQ(client().GetAttributes(30, 1, &asked), 0);
    EXPECT_EQ(asked.size, 2);
    EXPECT_EQ(logical, 0x5555FFFE);
}

TEST_F(DeviceMapperTest, EmptyAnswerIsFoundWithoutAByte) {
    std::int32_t address = 0x55555555;
    DMAttribute asked = request("MEMBASEADDR", &address, 4);
    EXPECT_EQ(client().GetAttributes(30, 1, &asked), 0);
    EXPECT_EQ(asked.status, 0);
    EXPECT_EQ(asked.size, 0);
    EXPECT_EQ(address, 0x55555555);
}

TEST_F(DeviceMapperTest, MissingAttributesMakeTheResult202AndTheOthersAreRead) {
    std::int32_t irq = 0;
    std::int32_t slot = 4711;
    std::array requests = {request("PCI_SLOT_NUMBER", &slot, 4), request("IRQ", &irq, 4)};
    EXPECT_EQ(client().GetAttributes(30, 2, requests.data()), kDMSomeAttributesFailed);
    EXPECT_NE(requests[0].status, 0);
    EXPECT_EQ(requests[0].size, 0);
    EXPECT_EQ(slot, 4711);
    EXPECT_EQ(requests[1].status, 0);
    EXPECT_EQ(irq, 7);
}

TEST_F(DeviceMapperTest, UnknownObjectAnswers201AndLeavesTheBuffersAlone) {
    std::int32_t irq = 4711;
    std::array requests = {request("IRQ", &irq, 4), request("TYPE", &irq, 4)};
    EXPECT_EQ(client().GetAttributes(99, 2, requests.data()), 201);
    for (auto const& asked : requests) {
        EXPECT_NE(asked.status, 0);
        EXPECT_EQ(asked.size, 0);
    }
    EXPECT_EQ(irq, 4711);
}

TEST_F(DeviceMapperTest, TextThatFillsTheBufferExactlyIsNotTerminated) {
    std::array<char, 4> buffer = {'#', '#', '#', '#'};
    DMAttribute asked = request("SERIAL_NUMBER", buffer.data(), 3);
    EXPECT_EQ(client().GetAttributes(30, 1, &asked), 0);
    EXPECT_EQ(asked.size, 3);
    EXPECT_THAT(buffer, ElementsAre('S', '3', '0', '#'));
}

TEST_F(DeviceMapperTest, LongerTextIsCutToTheBuffer) {
    std::array<char, 4> buffer = {'#', '#', '#', '#'};
    DMAttribute asked = request("SERIAL_NUMBER", buffer.data(), 2);
    EXPECT_EQ(client().GetAttributes(30, 1, &asked), 0);
    EXPECT_EQ(asked.size, 2);
    EXPECT_THAT(buffer, ElementsAre('S', '3', '#', '#'));
}

TEST_F(DeviceMapperTest, NumberThatDoesNotFitIsNotRead) {
    std::array<char, 4> buffer = {'#', '#', '#', '#'};
    DMAttribute asked = request("IRQ", buffer.data(), 3);
    EXPECT_EQ(client().GetAttributes(30, 1, &asked), kDMSomeAttributesFailed);
    EXPECT_NE(asked.status, 0);
    EXPECT_EQ(asked.size, 0);
    EXPECT_THAT(buffer, ElementsAre('#', '#', '#', '#'));
}

TEST_F(DeviceMapperTest, RequestsWithoutNameOrBufferFailByThemselves) {
    std::int32_t irq = 0;
    std::array requests = {request(nullptr, &irq, 4), request("IRQ", nullptr, 4),
                           request("IRQ", &irq, -1), request("IRQ", &irq, 4)};
    EXPECT_EQ(client().GetAttributes(30, 4, requests.data()), kDMSomeAttributesFailed);
    for (std::size_t i = 0; i < 3; ++i)
        EXPECT_NE(requests[i].status, 0);
    EXPECT_EQ(requests[3].status, 0);
}

TEST_F(DeviceMapperTest, ReservedOperationAnswersWithAFailure) {
    EXPECT_NE(client().Reserved3(), 0);
}

TEST_F(DeviceMapperTest, ReadersNeverSeeATornTextWhileItChanges) {
    std::atomic<bool> torn = false;
    std::atomic<int> reads = 0;
    std::atomic<bool> done = false;
    auto const reader = [&] {
        while (!done.load()) {
            std::array<char, 128> name{};
            DMAttribute asked = request("NAME", name.data(), 128);
            client().GetAttributes(10, 1, &asked);
            std::string const text = name.data();
            if (text != "SAME" && text != std::string(20, 'a') && text != std::string(90, 'b'))
                torn = true;
            ++reads;
        }
    };
    std::vector<std::thread> readers;
    for (int i = 0; i < 3; ++i)
        readers.emplace_back(reader);
    for (int i = 0; i < 200 || reads.load() < 200; ++i) {
        std::string const name = i % 2 == 0 ? std::string(20, 'a') : std::string(90, 'b');
        ASSERT_EQ(
            kvlsim::execute(
                {{"command", "set"}, {"object", 10}, {"attribute", "NAME"}, {"value", name}})["ok"],
            true);
    }
    done = true;
    for (auto& thread : readers)
        thread.join();
    EXPECT_FALSE(torn.load());
}

} // namespace
