// SPDX-License-Identifier: BSD-2-Clause
// The parts "line" and "channels" of devices in chassis files: what is refused, what becomes of the
// rest.
#include <algorithm>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/chassis/ChassisError.h"
#include "simulator/description/ChassisJson.h"
#include "simulator/description/ChassisReader.h"
#include "simulator/description/LineReader.h"
#include "tests/simulator/description/BadFixture.h"

namespace {

using namespace kvlsim;

class BadLinePartTest : public testing::TestWithParam<BadFixture> {};

TEST_P(BadLinePartTest, IsRefusedWithPlaceAndRemedy) {
    EXPECT_EQ(refusalOf(GetParam()), std::string(GetParam().file) + GetParam().refusal);
}

INSTANTIATE_TEST_SUITE_P(
    Fixtures, BadLinePartTest,
    testing::Values(
        BadFixture{"channels-is-a-number.yaml",
                   ":7: the part channels of device 2 cannot be 30; begin it with \"bearers:\""},
        BadFixture{
            "channels-no-bearers.yaml",
            ":7: the part channels of device 2 has no bearers; give it \"bearers:\", 1 to 31"},
        BadFixture{"channels-too-many-bearers.yaml",
                   ":8: bearers cannot be 32; write a whole number from 1 to 31"},
        BadFixture{"channels-unknown-key.yaml",
                   ":7: unknown key \"signaling\" in the part channels "
                   "of device 2; known: bearers, signalling"},
        BadFixture{"channels-unknown-signalling.yaml",
                   ":9: signalling cannot be the text \"l3\"; choose inactive, l1 or l2"},
        BadFixture{"line-alarm-is-a-map.yaml",
                   ":9: an alarm cannot be a map; write a name, such as los"},
        BadFixture{"line-alarm-twice.yaml", ":9: alarm \"los\" is written twice; keep one"},
        BadFixture{
            "line-alarms-is-a-text.yaml",
            ":9: alarms cannot be the text \"los\"; write a list of names, such as [los, rai]"},
        BadFixture{"line-counters-written.yaml",
                   ":8: LINE_COUNTERS follows from the device's line: or channels:; remove it"},
        BadFixture{"line-errors-is-a-list.yaml",
                   ":9: errors cannot be a list; write one kind a line, such as slips: 2"},
        BadFixture{"line-is-a-text.yaml",
                   ":7: the line of device 2 cannot be the text \"esf\"; begin it with \"type:\""},
        BadFixture{"line-no-type.yaml",
                   ":7: the line of device 2 has no type; give it one of esf, d4, e1, "
                   "e1-crc, e1-mf, e1-crc-mf"},
        BadFixture{"line-of-a-subdevice.yaml",
                   ":8: unknown key \"line\" in sub-device 3; known: handle, type, attributes"},
        BadFixture{"line-past-is-a-number.yaml",
                   ":9: the past of a line cannot be 24; begin it with \"hours:\""},
        BadFixture{"line-past-no-length.yaml",
                   ":9: the past of a line has one length; give either \"hours:\" or \"seconds:\""},
        BadFixture{"line-past-of-no-second.yaml",
                   ":9: seconds cannot be 0; write a whole number from 1 to 86400"},
        BadFixture{"line-past-too-long.yaml",
                   ":9: hours cannot be 25; write a whole number from 1 to 24"},
        BadFixture{"line-past-two-lengths.yaml",
                   ":9: the past of a line has one length; give either \"hours:\" or \"seconds:\""},
        BadFixture{"line-past-unknown-key.yaml",
                   ":9: unknown key \"alarms\" in the past of a line; "
                   "known: hours, seconds, errors, spells"},
        BadFixture{"line-rate-negative.yaml",
                   ":10: the rate of slips cannot be -0.5; write a number "
                   "per second from 0 to 1000000, such as 0.5"},
        BadFixture{
            "line-rate-text.yaml",
            ":9: the rate of code-violations cannot be the text \"some\"; write a number per "
            "second from 0 to 1000000, such as 0.5"},
        BadFixture{"line-rate-too-large.yaml",
                   ":9: the rate of path-violations cannot be 1000000.5; write a number per second "
                   "from 0 to 1000000, such as 0.5"},
        BadFixture{"line-spell-before-the-past.yaml",
                   ":12: ago cannot be 3601; write a whole number "
                   "from 1 to 3600, the seconds of this past"},
        BadFixture{
            "line-spell-beyond-loading.yaml",
            ":12: seconds cannot be 61; write a whole number from 1 to 60, for the spell ends "
            "at the latest with the past"},
        BadFixture{"line-spell-is-a-text.yaml",
                   ":11: a spell cannot be the text \"los\"; begin it with \"ago:\""},
        BadFixture{
            "line-spell-no-ago.yaml",
            ":12: a spell has no ago; say when it began (ago:) and how long it lasted (seconds:)"},
        BadFixture{"line-spell-no-seconds.yaml", ":12: a spell has no seconds; say when it began "
                                                 "(ago:) and how long it lasted (seconds:)"},
        BadFixture{"line-spell-of-nothing.yaml",
                   ":12: a spell without alarms and errors is none; give it one or remove it"},
        BadFixture{"line-spell-unknown-key.yaml",
                   ":12: unknown key \"alarm\" in a spell; known: ago, seconds, alarms, errors"},
        BadFixture{
            "line-spells-is-a-map.yaml",
            ":11: spells cannot be a map; write a list, each spell beginning with \"- ago:\""},
        BadFixture{
            "line-bearers-of-a-t1.yaml",
            ":9: the line of device 2 is of type esf (2), which carries at most 24 channels, "
            "not 30"},
        BadFixture{"line-type-empty.yaml",
                   ":8: the line of device 2 is of type e1 (4), but its LINE_TYPE is empty; remove "
                   "LINE_TYPE from the attributes"},
        BadFixture{"line-type-contradicted.yaml",
                   ":8: the line of device 2 is of type esf (2), but its LINE_TYPE is 3; remove "
                   "LINE_TYPE from the attributes"},
        BadFixture{"line-unknown-alarm.yaml",
                   ":9: no alarm is called \"red\"; there are los, lof, ais, rai, sending-rai, "
                   "sending-ais, loopback, ts16-ais, remote-multiframe, sending-remote-multiframe, "
                   "test-code"},
        BadFixture{"line-unknown-error.yaml",
                   ":10: no error of a line is called \"slip\"; there are code-violations, "
                   "path-violations, framing-errors, slips"},
        BadFixture{
            "line-unknown-key.yaml",
            ":9: unknown key \"error\" in the line of device 2; known: type, errors, alarms, past"},
        BadFixture{"line-unknown-type.yaml", ":8: the line of device 2 cannot be of type \"t1\"; "
                                             "choose one of esf, d4, e1, e1-crc, e1-mf, "
                                             "e1-crc-mf"}),
    [](auto const& each) {
        std::string name = each.param.file;
        name.erase(name.find('.'));
        std::erase(name, '-');
        return name;
    });

std::string withDevice(std::string const& parts) {
    return "boards: [{handle: 1, attributes: {SERIAL_NUMBER: \"A1\"}, devices: [{handle: 2, type: "
           "501, " +
           parts + "}]}]\n";
}

TEST(LinePartsTest, PastOfTooManySpellsIsRefused) {
    std::string spells;
    for (int i = 0; i < 1001; ++i)
        spells += "{ago: 9, seconds: 1, alarms: [rai]}, ";
    try {
        readChassis(withDevice("line: {type: esf, past: {hours: 1, spells: [" + spells + "]}}"));
        FAIL() << "accepted";
    } catch (ChassisError const& error) {
        EXPECT_STREQ(error.what(), "a past of 1001 spells is too long; 1000 is the most");
    }
}

TEST(LinePartsTest, TypeOfTheLineBecomesItsLineType) {
    struct {
        char const* name;
        int number;
    } constexpr types[] = {{"esf", 2},    {"d4", 3},    {"e1", 4},
                           {"e1-crc", 5}, {"e1-mf", 6}, {"e1-crc-mf", 7}};
    for (auto const& [name, number] : types) {
        Chassis const chassis = readChassis(withDevice(std::string("line: {type: ") + name + "}"));
        EXPECT_EQ(chassis.find(2)->attribute("LINE_TYPE")->asNumber(), number) << name;
    }
}

TEST(LinePartsTest, LineTypeThatAgreesMayBeWritten) {
    Chassis const chassis = readChassis(withDevice("attributes: {LINE_TYPE: 3}, line: {type: d4}"));
    EXPECT_EQ(chassis.find(2)->attribute("LINE_TYPE")->asNumber(), 3);
}

TEST(LinePartsTest, EveryAlarmAndErrorIsRead) {
    Chassis const chassis = readChassis(withDevice(
        "line: {type: esf, errors: {code-violations: 1, path-violations: 0.25, framing-errors: "
        "1e-3, slips: 1000000}, alarms: [los, lof, ais, rai, sending-rai, sending-ais, loopback, "
        "ts16-ais, remote-multiframe, sending-remote-multiframe, test-code]}"));
    LineDraft const& line = chassis.find(2)->ds1Line->draft();
    EXPECT_EQ(line.alarms, 0x7FFU);
    EXPECT_THAT(line.rates, testing::ElementsAre(1'000'000'000U, 250'000'000U, 1'000'000U,
                                                 1'000'000'000'000'000U));
    EXPECT_EQ(line.past.seconds, 0);
}

TEST(LinePartsTest, PartsWithoutContentAreAsGoodAsNone) {
    Chassis const chassis = readChassis(withDevice("line: {type: e1, errors: , alarms: , past: }"));
    EXPECT_EQ(chassis.find(2)->ds1Line->draft().past.seconds, 0);
    EXPECT_EQ(chassis.find(2)->ds1Line->draft().alarms, 0U);
}

TEST(LinePartsTest, ChannelsAreIdleAndSignallingIsUpUnlessTheFileSaysOtherwise) {
    Chassis const chassis = readChassis(withDevice("channels: {bearers: 2}"));
    Channels const& channels = *chassis.find(2)->channels;
    EXPECT_EQ(channels.states(), std::string_view("\1\1"));
    EXPECT_EQ(channels.signalling(), ISDNSignallingState::layer2Active);
}

TEST(LinePartsTest, SignallingIsAsWritten) {
    Chassis const chassis = readChassis(withDevice("channels: {bearers: 1, signalling: inactive}"));
    EXPECT_EQ(chassis.find(2)->channels->signalling(), ISDNSignallingState::inactive);
}

TEST(LinePartsTest, LineAndChannelsAreWrittenAsTheyAreRead) {
    std::string const parts =
        R"("line": {"type": "e1-crc", "errors": {"slips": 0.001, "code-violations": 2},
            "alarms": ["rai", "test-code"], "past": {"seconds": 600, "errors": {"slips": 0.1},
            "spells": [{"ago": 60, "seconds": 5, "alarms": ["los"],
                        "errors": {"framing-errors": 12.5}}]}},
            "channels": {"bearers": 31, "signalling": "l1"})";
    Chassis const chassis = readChassis(withDevice(parts));
    nlohmann::json const expected = nlohmann::json::parse("{" + parts + "}");
    nlohmann::json const written = toJson(*chassis.find(2), chassis);
    EXPECT_EQ(written["line"], expected["line"]);
    EXPECT_EQ(written["channels"], expected["channels"]);
}

TEST(LinePartsTest, AttributesOfLinesAndInterfacesHaveTheirKinds) {
    Chassis const chassis = readChassis(
        withDevice("attributes: {CIRCUIT: T1-0001, LINE_CODING: 2, LINE_LENGTH: 40, "
                   "LINE_BUILD_OUT: 5, SIGNAL_MODE: 2, CLOCK_SOURCE: 1, FDL: 2, LINE_NUMBER: 1, "
                   "ETHERNET_SPEED: 100000000, IP_ADDRESS_0: 192.0.2.10}"));
    EXPECT_EQ(chassis.find(2)->attribute("IP_ADDRESS_0")->asText(), "192.0.2.10");
    for (char const* text : {"CIRCUIT", "ETHERNET_DEVICE", "ETHERNET_ADDRESS", "IP_ADDRESS_1",
                             "IP_MASK_10", "IP_BROADCAST_0"})
        EXPECT_THROW(readChassis(withDevice("attributes: {" + std::string(text) + ": 5}")),
                     ChassisError)
            << text;
    for (char const* number :
         {"LINE_TYPE", "LINE_CODING", "LINE_LENGTH", "LINE_BUILD_OUT", "SIGNAL_MODE",
          "CLOCK_SOURCE", "FDL", "LINE_NUMBER", "ETHERNET_SPEED", "ETHERNET_MTU",
          "ETHERNET_IN_OCTETS", "ETHERNET_OUT_OCTETS", "ETHERNET_FCS_ERRORS"})
        EXPECT_THROW(readChassis(withDevice("attributes: {" + std::string(number) + ": x}")),
                     ChassisError)
            << number;
}

TEST(LinePartsTest, ExampleChassisHasLinesWithAndWithoutAPastAndChannels) {
    Chassis const chassis = readChassis(readChassisFile(KVLSIM_SMALL_CHASSIS));
    for (long const line : {101L, 102L, 201L, 301L, 303L})
        EXPECT_NE(chassis.find(line)->ds1Line, nullptr) << line;
    EXPECT_EQ(chassis.find(101)->ds1Line->draft().past.seconds, 86400);
    EXPECT_EQ(chassis.find(102)->ds1Line->draft().past.seconds, 0);
    EXPECT_EQ(chassis.find(301)->channels->bearers(), 30);
    EXPECT_EQ(chassis.find(303)->channels->bearers(), 30);
}

} // namespace
