// SPDX-License-Identifier: BSD-2-Clause
// The boards' resources by kind, as the SNMP tools show them.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

class ResourceDeviceTest : public AgentFixture {
  protected:
    std::vector<std::string> values(std::string const& column) const {
        std::vector<std::string> all;
        for (Answer const& answer : walk(column))
            all.push_back(answer.value);
        return all;
    }
};

TEST_F(ResourceDeviceTest, ResourcesOfTheExampleChassisAreShown) {
    startAgent();
    EXPECT_THAT(values("kvlResourceDeviceName"),
                ElementsAre("STRING: nx5-trunk-1", "STRING: nx5-trunk-2", "STRING: nx5-voice-1",
                            "STRING: nx5-tones", "STRING: nx5-fax", "STRING: quillon-span-1",
                            "STRING: quillon-conference", "STRING: quillon-clock",
                            "STRING: vorn-primary-rate-1", "STRING: vorn-primary-rate-2",
                            "STRING: vorn-stations", "STRING: vorn-lines"));
    EXPECT_EQ(get("kvlResourceDeviceKind.1.3"), "INTEGER: voice(2)");
    EXPECT_EQ(get("kvlResourceDeviceKind.3.1"), "INTEGER: isdnTrunk(4)");
    EXPECT_EQ(get("kvlResourceDeviceBearerCount.3.1"), "INTEGER: 30 channels");
    EXPECT_EQ(get("kvlResourceDeviceTimeSlotCount.3.3"), "INTEGER: 16 slots");
}

TEST_F(ResourceDeviceTest, QueriesThatADeviceCanNotAnswerHaveNoInstance) {
    startAgent();
    EXPECT_THAT(get("kvlResourceDeviceGain.1.3"), HasSubstr("No Such Instance"));
    EXPECT_THAT(get("kvlResourceDeviceLineStatus.1.3"), HasSubstr("No Such Instance"));
}

TEST_F(ResourceDeviceTest, GainThatThePlatformKnowsIsShown) {
    useChassis("boards:\n"
               "  - handle: 7\n"
               "    attributes: {SERIAL_NUMBER: \"S7\"}\n"
               "    devices: [{handle: 71, type: 503, attributes: {GAIN: -6}}]\n");
    startAgent();
    EXPECT_EQ(get("kvlResourceDeviceGain.1.1"), "INTEGER: -6 decibels");
}

TEST_F(ResourceDeviceTest, TrunkTellsOfItsLinesAlarm) {
    startAgent();
    EXPECT_EQ(get("kvlResourceDeviceLineStatus.1.1"), "INTEGER: 1");
    sim({"line", "alarm", "101", "los"});
    EXPECT_TRUE(
        eventually([this] { return get("kvlResourceDeviceLineStatus.1.1") != "INTEGER: 1"; }));
}

TEST_F(ResourceDeviceTest, BoardThatIsRemovedTakesItsResourcesWithIt) {
    startAgent();
    sim({"remove", "1"});
    EXPECT_TRUE(eventually([this] { return values("kvlResourceDeviceName").size() == 7; }));
}

} // namespace
} // namespace kvloamd::e2e
