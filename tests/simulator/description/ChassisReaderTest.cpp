// SPDX-License-Identifier: BSD-2-Clause
// Reading of chassis files: what is refused, with which line, and what becomes of what is accepted.
#include "simulator/description/ChassisReader.h"

#include <clocale>
#include <ctime>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/chassis/AttributeSchema.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/AttributeReader.h"
#include "simulator/description/Description.h"
#include "tests/simulator/description/BadFixture.h"

namespace {

using namespace kvlsim;

std::string refusalOf(std::string const& text) {
    try {
        readChassis(text);
    } catch (ChassisError const& error) {
        return describeError("chassis", error);
    }
    return "accepted";
}

/// A chassis of one board with these attribute lines.
std::string boardWith(std::string const& attributeLines) {
    return "boards:\n  - handle: 1\n    attributes:\n      SERIAL_NUMBER: \"A1\"\n" +
           attributeLines;
}

AttributeValue attributeOf(Chassis const& chassis, long handle, char const* name) {
    return *chassis.find(handle)->attribute(name);
}

class BadChassisFileTest : public testing::TestWithParam<BadFixture> {};

TEST_P(BadChassisFileTest, IsRefusedWithPlaceAndRemedy) {
    EXPECT_EQ(refusalOf(GetParam()), std::string(GetParam().file) + GetParam().refusal);
}

constexpr char const* kAllSubDeviceTypes =
    ":8: sub-device 3 cannot be of type 501; choose one of 502, 504, 506, 508, 510, 517, 519, 522, "
    "512, 526, 528";

INSTANTIATE_TEST_SUITE_P(
    Fixtures, BadChassisFileTest,
    testing::Values(
        BadFixture{"not-yaml.yaml", ":4: a \"{\" is not closed; write its \"}\" here or before"},
        BadFixture{"empty.yaml", ":1: there is nothing in it; begin the chassis with \"boards:\""},
        BadFixture{"no-boards.yaml", ":2: no boards; begin the chassis with \"boards:\""},
        BadFixture{"boards-is-a-map.yaml", ":2: boards cannot be a map; write a list, each board "
                                           "beginning with \"- handle:\""},
        BadFixture{"board-is-a-text.yaml",
                   ":2: a board cannot be the text \"first\"; begin it with \"handle:\""},
        BadFixture{"misspelt-key.yaml", ":3: unknown key \"atributes\" in board 1; known: handle, "
                                        "attributes, devices, processors"},
        BadFixture{"unknown-top-key.yaml",
                   ":2: unknown key \"borads\" in the chassis; known: boards, "
                   "store, processes"},
        BadFixture{"key-twice.yaml",
                   ":6: \"IRQ\" is written twice (first in line 5 of the file); keep one of them"},
        BadFixture{"list-as-key.yaml",
                   ":2: a key must be a plain word; this one is a list or a map"},
        BadFixture{"no-handle.yaml",
                   ":4: board without handle; give it a \"handle:\" of its own, 1 or more"},
        BadFixture{"handle-zero.yaml",
                   ":2: the handle of a board cannot be 0; write a number from 1 to 2147483646"},
        BadFixture{"handle-too-large.yaml",
                   ":3: the handle of a board cannot be 2147483647; write a "
                   "number from 1 to 2147483646"},
        BadFixture{"handle-huge.yaml", ":2: the handle of a board cannot be "
                                       "99999999999999999999999999; write a number from 1 to "
                                       "2147483646"},
        BadFixture{"handle-text.yaml",
                   ":2: the handle of a board cannot be the text \"1\"; write a "
                   "number from 1 to 2147483646"},
        BadFixture{"handle-twice.yaml",
                   ":6: handle 7 is already the processor of line 5 of the file; give every "
                   "object a handle of its own"},
        BadFixture{"no-serial.yaml",
                   ":2: board 5 has no SERIAL_NUMBER; give it one under attributes"},
        BadFixture{"serial-twice.yaml", ":4: board 2 cannot have SERIAL_NUMBER \"A1\": board 1 has "
                                        "it; serial numbers must differ"},
        BadFixture{"serial-number.yaml",
                   ":4: SERIAL_NUMBER cannot be 12345; it is a text, write it in quotes"},
        BadFixture{"number-as-text.yaml", ":5: IRQ cannot be the text \"eleven\"; it is a number, "
                                          "write a decimal or 0x number"},
        BadFixture{"number-quoted.yaml",
                   ":5: IRQ cannot be the text \"11\"; it is a number, write a "
                   "decimal or 0x number"},
        BadFixture{"number-out-of-range.yaml", ":5: IRQ: 4294967296 is out of range; a number of 4 "
                                               "bytes goes from -2147483648 to 4294967295"},
        BadFixture{"short-out-of-range.yaml",
                   ":5: LOGICAL ID: 65536 is out of range; a number of 2 "
                   "bytes goes from -32768 to 65535"},
        BadFixture{"byte-out-of-range.yaml",
                   ":8: Protocol_Type_3: 256 is out of range; a number of 1 "
                   "byte goes from -128 to 255"},
        BadFixture{"descriptor-short.yaml", ":8: LINEADMINADDR: a descriptor is a list of four "
                                            "numbers; write {descriptor: [1, 2, 3, 4]}"},
        BadFixture{"descriptor-as-number.yaml",
                   ":8: LINEADMINADDR cannot be 5; it is a descriptor, "
                   "write {descriptor: [1, 2, 3, 4]}"},
        BadFixture{"unknown-form.yaml", ":5: IRQ: no form of value is called \"word\"; there are "
                                        "text, number, short, byte, empty, descriptor"},
        BadFixture{
            "list-as-value.yaml",
            ":5: COLOUR cannot be a list; write a text, a whole number, or one of {short: 1}, "
            "{byte: 1}, {empty: true}, {descriptor: [1, 2, 3, 4]}"},
        BadFixture{"no-value.yaml", ":5: IRQ has no value; write one or remove the attribute"},
        BadFixture{"long-text.yaml",
                   ":5: DESCRIPTION: a text of 128 bytes is too long; 127 is the most"},
        BadFixture{"nul-in-text.yaml", ":4: SERIAL_NUMBER: a text cannot contain a NUL; remove it"},
        BadFixture{"type-attribute.yaml", ":5: TYPE follows from what the object is; remove it (a "
                                          "device's is written as type:)"},
        BadFixture{"no-device-type.yaml", ":5: device 2 has no type; give it one of 501, 503, 505, "
                                          "507, 509, 514, 516, 518, 520, 521, 511, 525, 527"},
        BadFixture{
            "unknown-device-type.yaml",
            ":6: device 2 cannot be of type 502; choose one of 501, 503, 505, 507, 509, 514, "
            "516, 518, 520, 521, 511, 525, 527"},
        BadFixture{"unknown-subdevice-type.yaml", kAllSubDeviceTypes},
        BadFixture{"devices-is-a-map.yaml", ":4: devices cannot be a map; write a list, each entry "
                                            "beginning with \"- handle:\""},
        BadFixture{"reference.yaml",
                   ":5: references (*name) are not supported; write the value out"},
        BadFixture{"tag.yaml", ":4: the tag \"!secret\" means nothing here; remove it"},
        BadFixture{"two-documents.yaml", ":2: a second YAML document; keep the first"},
        BadFixture{"too-deep.yaml", ":5: too many nested levels; a chassis needs at most 12"},
        BadFixture{"no-such-file.yaml",
                   ": cannot be read (No such file or directory); name a chassis "
                   "file that exists and is readable"},
        BadFixture{".", ": cannot be read (Is a directory); name a chassis file that exists and is "
                        "readable"}));

TEST(ChassisReaderTest, PlainWholeNumbersAreFourBytes) {
    Chassis const chassis = readChassis(boardWith("      IRQ: 0x0B\n"));
    EXPECT_EQ(attributeOf(chassis, 1, "IRQ").form(), ValueForm::number);
    EXPECT_EQ(attributeOf(chassis, 1, "IRQ").asNumber(), 11);
}

TEST(ChassisReaderTest, NumbersAboveTheSignedRangeKeepTheirBits) {
    Chassis const chassis = readChassis(boardWith("      MEMBASEADDR: 0xD0000000\n"));
    EXPECT_EQ(static_cast<std::uint32_t>(attributeOf(chassis, 1, "MEMBASEADDR").asNumber()),
              0xD0000000U);
}

TEST(ChassisReaderTest, WordsThatAreNoWholeNumberAreTexts) {
    Chassis const chassis = readChassis(boardWith("      FIRMWARE_VERSION: 4.2\n"));
    EXPECT_EQ(attributeOf(chassis, 1, "FIRMWARE_VERSION").asText(), "4.2");
}

TEST(ChassisReaderTest, NumbersWithLeadingZerosAreTexts) {
    Chassis const chassis = readChassis(boardWith("      NAME: 007\n"));
    EXPECT_EQ(attributeOf(chassis, 1, "NAME").asText(), "007");
}

TEST(ChassisReaderTest, ExplicitFormsHaveTheirWidths) {
    Chassis const chassis = readChassis(boardWith("      LOGICAL ID: {short: 0xFFFF}\n"
                                                  "      MEMBASEADDR: {empty: true}\n"
                                                  "      A: {byte: -1}\n"
                                                  "      B: {descriptor: [1, 2, 3, 0xFFFF]}\n"
                                                  "      C: {text: 5}\n"));
    EXPECT_EQ(attributeOf(chassis, 1, "LOGICAL ID").bytes().size(), 2U);
    EXPECT_EQ(attributeOf(chassis, 1, "MEMBASEADDR").bytes().size(), 0U);
    EXPECT_EQ(attributeOf(chassis, 1, "A").bytes(), "\xFF");
    EXPECT_THAT(attributeOf(chassis, 1, "B").asDescriptor(), testing::ElementsAre(1, 2, 3, 0xFFFF));
    EXPECT_EQ(attributeOf(chassis, 1, "C").asText(), "5");
}

TEST(ChassisReaderTest, KnownByteAttributesTakePlainNumbersAsOneByte) {
    Chassis const chassis = readChassis(boardWith("    devices:\n"
                                                  "      - handle: 2\n"
                                                  "        type: 501\n"
                                                  "        attributes: {Protocol_Type_3: 255}\n"));
    EXPECT_EQ(attributeOf(chassis, 2, "Protocol_Type_3").bytes(), "\xFF");
}

TEST(ChassisReaderTest, TextOfOneHundredAndTwentySevenBytesIsAccepted) {
    std::string const text(127, 'x');
    Chassis const chassis = readChassis(boardWith("      NAME: " + text + "\n"));
    EXPECT_EQ(attributeOf(chassis, 1, "NAME").asText(), text);
}

TEST(ChassisReaderTest, EveryKindOfObjectGetsItsType) {
    Chassis const chassis = readChassis(boardWith("    devices:\n"
                                                  "      - handle: 2\n"
                                                  "        type: 503\n"
                                                  "        subdevices: [{handle: 3, type: 504}]\n"
                                                  "    processors: [{handle: 4}]\n"));
    EXPECT_EQ(attributeOf(chassis, 1, "TYPE").asNumber(), 200);
    EXPECT_EQ(attributeOf(chassis, 2, "TYPE").asNumber(), 503);
    EXPECT_EQ(attributeOf(chassis, 3, "TYPE").asNumber(), 504);
    EXPECT_EQ(attributeOf(chassis, 4, "TYPE").asNumber(), 800);
}

TEST(ChassisReaderTest, BoardsAreStartedAndPresentUnlessTheFileSaysOtherwise) {
    Chassis const chassis = readChassis("boards:\n"
                                        "  - handle: 1\n"
                                        "    attributes: {SERIAL_NUMBER: \"A1\"}\n"
                                        "  - handle: 2\n"
                                        "    attributes: {SERIAL_NUMBER: \"A2\", "
                                        "BOARD_CONDITION: 15, BOARD_PRESENT: 0}\n");
    EXPECT_EQ(attributeOf(chassis, 1, "BOARD_CONDITION").asNumber(), 3);
    EXPECT_EQ(attributeOf(chassis, 1, "BOARD_PRESENT").asNumber(), 1);
    EXPECT_EQ(attributeOf(chassis, 2, "BOARD_CONDITION").asNumber(), 15);
    EXPECT_EQ(attributeOf(chassis, 2, "BOARD_PRESENT").asNumber(), 0);
}

TEST(ChassisReaderTest, StateChangeDateIsTheTimeOfLoading) {
    // The date is local and has no zone, so that some dates of other zones are ambiguous.
    setenv("TZ", "UTC", 1);
    tzset();
    std::time_t const before = std::time(nullptr);
    Chassis const chassis = readChassis(boardWith(""));
    std::time_t const after = std::time(nullptr);
    std::tm broken{};
    std::string const date(attributeOf(chassis, 1, "STATE_CHANGE_DATE").asText());
    char const* const end = strptime(date.c_str(), "%a %b %e %T %Y", &broken);
    ASSERT_NE(end, nullptr) << date;
    EXPECT_EQ(*end, '\0') << date;
    broken.tm_isdst = -1;
    std::time_t const read = std::mktime(&broken);
    unsetenv("TZ");
    tzset();
    EXPECT_GE(read, before);
    EXPECT_LE(read, after);
}

TEST(ChassisReaderTest, ChassisWithoutBoardsIsAccepted) {
    EXPECT_EQ(readChassis("boards: []\n").boardCount(), 0U);
    EXPECT_EQ(readChassis("boards:\n").boardCount(), 0U);
}

TEST(ChassisReaderTest, KeysWithControlCharactersAreRefusedOnOneLine) {
    std::string const refusal = refusalOf(boardWith("      \"a\\nb\": 1\n"));
    EXPECT_EQ(refusal, "chassis:5: \"a?b\" cannot be an attribute's name; it has 1 to 127 "
                       "printable characters");
}

TEST(ChassisReaderTest, WordsOfTheYamlParserStayOnOneLine) {
    EXPECT_EQ(refusalOf("boards: \"\\\001\"\n"),
              "chassis:1: not readable as YAML: unknown escape character: ?; correct it there or "
              "just before");
}

TEST(ChassisReaderTest, DeepNestingIsRefusedWithoutUsingUpTheStack) {
    EXPECT_EQ(refusalOf(std::string(100000, '[') + std::string(100000, ']')),
              "chassis:1: too many nested levels; a chassis needs at most 12");
}

TEST(ChassisReaderTest, TooManyValuesAreRefusedWhileTheyAreRead) {
    std::string text = "boards:\n  - [";
    for (int i = 0; i < 2000000; ++i)
        text += "1,";
    EXPECT_EQ(refusalOf(text + "1]\n"),
              "chassis:2: too many values; a chassis has at most 2000000");
}

TEST(ChassisReaderTest, TooManyObjectsAreRefused) {
    ObjectDraft board;
    board.handle = 1;
    board.line = 7;
    for (std::int32_t i = 0; i < 200000; ++i) {
        ObjectDraft device;
        device.kind = ObjectKind::device;
        device.handle = i + 2;
        board.children.push_back(std::move(device));
    }
    Chassis chassis;
    try {
        chassis.insertBoard(board);
        FAIL() << "accepted";
    } catch (ChassisError const& error) {
        EXPECT_EQ(describeError("chassis", error),
                  "chassis:7: board 1 is too much: a chassis has at most 200000 boards, devices, "
                  "sub-devices and processors");
    }
    board.children.pop_back();
    chassis.insertBoard(std::move(board));
}

TEST(ChassisReaderTest, TooManyAttributesAreRefused) {
    std::string attributes;
    for (int i = 0; i < 999; ++i)
        attributes += "      A" + std::to_string(i) + ": 1\n";
    EXPECT_EQ(refusalOf(boardWith(attributes)), "accepted");
    EXPECT_EQ(refusalOf(boardWith(attributes + "      MORE: 1\n")),
              "chassis:4: 1001 attributes are too many; an object has at most 1000");
}

TEST(ChassisReaderTest, AttributeTooManyIsRefusedAtRunTime) {
    Chassis chassis = readChassis(boardWith(""));
    for (int i = static_cast<int>(chassis.find(1)->attributes.size()); i < 1000; ++i)
        chassis.setAttribute(1, "A" + std::to_string(i), AttributeValue::number(i));
    EXPECT_THROW(chassis.setAttribute(1, "MORE", AttributeValue::number(1)), ChassisError);
    chassis.setAttribute(1, "A999", AttributeValue::number(1));
}

} // namespace
