// SPDX-License-Identifier: BSD-2-Clause
// Checking of hand-written chassis files: all errors at once, misspelt names, plain messages.
#include "simulator/description/Findings.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/description/ChassisReader.h"

namespace {

using namespace kvlsim;
using testing::ElementsAre;
using testing::IsEmpty;

Findings findingsIn(std::string const& text) {
    Findings findings(Findings::OnError::collect);
    auto const chassis = readChassis(text, findings);
    EXPECT_EQ(chassis.has_value(), !findings.hasErrors());
    return findings;
}

std::vector<std::string> errorsIn(std::string const& text) {
    return findingsIn(text).errors("f");
}

/// What a chassis of one board with these attributes, each in a line from line 5 on, is warned of.
std::vector<std::string> warningsOf(std::string const& attributes) {
    Findings const findings = findingsIn(
        "boards:\n  - handle: 1\n    attributes:\n      SERIAL_NUMBER: \"A1\"\n" + attributes);
    EXPECT_FALSE(findings.hasErrors());
    return findings.warnings("f");
}

TEST(ChassisFindingsTest, MisspeltAttributesAreWarnedOfWithTheNameMeant) {
    EXPECT_THAT(warningsOf("      BOARD_PRESNT: 0\n      FAMILIY: NX5\n      Name: X\n"
                           "      IP_ADRESS_3: 127.0.0.1\n"),
                ElementsAre("f:5: warning: unknown attribute \"BOARD_PRESNT\"; did you mean "
                            "BOARD_PRESENT?",
                            "f:6: warning: unknown attribute \"FAMILIY\"; did you mean FAMILY?",
                            "f:7: warning: unknown attribute \"Name\"; did you mean NAME?",
                            "f:8: warning: unknown attribute \"IP_ADRESS_3\"; did you mean "
                            "IP_ADDRESS_3?"));
}

TEST(ChassisFindingsTest, NumbersThatTheStandardDoesNotHaveAreWarnedOf) {
    EXPECT_THAT(warningsOf("      LINE_BUILD_OUT: 0\n      LINE_CODING: 8\n      FDL: 15\n"
                           "      LINE_LENGTH: -1\n      LINE_IMPEDANCE: 4\n"),
                ElementsAre("f:5: warning: LINE_BUILD_OUT 0 is not a value of DS1-MIB, which has "
                            "1 to 5; agents leave it out",
                            "f:6: warning: LINE_CODING 8 is not a value of DS1-MIB, which has 1 to "
                            "7; agents leave it out",
                            "f:8: warning: LINE_LENGTH -1 is not a value of DS1-MIB, which has 0 "
                            "to 64000; agents leave it out"));
}

TEST(ChassisFindingsTest, OtherUnknownAttributesAreNotWarnedOf) {
    EXPECT_THAT(warningsOf("      COLOUR: red\n      NAME2: X\n      IRQ7: 1\n      A: 1\n"
                           "      FIRMWARE_NAME2: X\n      IP_ADDRESS_12: 127.0.0.1\n"),
                IsEmpty());
}

TEST(ChassisFindingsTest, TheExampleChassisIsNotWarnedOf) {
    Findings const findings = findingsIn(readChassisFile(KVLSIM_SMALL_CHASSIS));
    EXPECT_THAT(findings.errors("f"), IsEmpty());
    EXPECT_THAT(findings.warnings("f"), IsEmpty());
}

TEST(ChassisFindingsTest, WarningsAreBounded) {
    std::string attributes;
    for (int i = 0; i < 300; ++i)
        attributes += "      IP_ADRESS_" + std::to_string(i) + ": 127.0.0.1\n";
    std::vector<std::string> const warnings = warningsOf(attributes);
    ASSERT_EQ(warnings.size(), 101U);
    EXPECT_EQ(warnings.back(), "f: 200 more warnings; correct these first");
}

TEST(ChassisFindingsTest, AllErrorsAreFoundAtOnce) {
    EXPECT_THAT(
        errorsIn("boards:\n"
                 "  - handle: 0\n"
                 "    attributes: {SERIAL_NUMBER: 5}\n"
                 "  - handle: 2\n"
                 "    colour: red\n"
                 "    attributes:\n"
                 "      SERIAL_NUMBER: \"A2\"\n"
                 "      IRQ: x\n"
                 "      IRQ: 5\n"
                 "      PCI_SLOT_NUMBER: y\n"
                 "    devices:\n"
                 "      - handle: 3\n"
                 "        type: 1\n"
                 "        line: t9\n"
                 "      - what\n"
                 "      - {handle: 2, type: 501}\n"
                 "    processors: 7\n"
                 "  - handle: 4\n"
                 "    attributes: {SERIAL_NUMBER: \"A2\"}\n"
                 "store:\n"
                 "  families: NX5\n"
                 "  boards:\n"
                 "    - family: NX5\n"
                 "    - serial: 5\n"
                 "processes:\n"
                 "  - kind: x\n"
                 "  - kind: child\n"),
        ElementsAre(
            "f:2: the handle of a board cannot be 0; write a number from 1 to 2147483646",
            "f:3: SERIAL_NUMBER cannot be 5; it is a text, write it in quotes",
            "f:5: unknown key \"colour\" in board 2; known: handle, attributes, devices, "
            "processors",
            "f:8: IRQ cannot be the text \"x\"; it is a number, write a decimal or 0x number",
            "f:9: \"IRQ\" is written twice (first in line 8 of the file); keep one of them",
            "f:10: PCI_SLOT_NUMBER cannot be the text \"y\"; it is a number, write a decimal or 0x "
            "number",
            testing::StartsWith("f:13: device 3 cannot be of type 1; choose one of "),
            "f:14: the line of device 3 cannot be the text \"t9\"; begin it with \"type:\"",
            "f:15: a device cannot be the text \"what\"; begin it with \"handle:\"",
            "f:16: handle 2 is already the board of line 4 of the file; give every object a handle "
            "of its own",
            "f:17: processors cannot be 7; write a list, each entry beginning with \"- handle:\"",
            "f:18: board 4 cannot have SERIAL_NUMBER \"A2\": board 2 has it; serial numbers must "
            "differ",
            "f:21: families cannot be the text \"NX5\"; write a list of names, such as [NX5, VORN]",
            "f:23: a board of the store has no serial number; give it \"serial:\"",
            "f:24: a serial number cannot be 5; it is a text, write it in quotes",
            "f:26: the kind of a process cannot be the text \"x\"; choose self, child or command",
            "f:27: process without name; give it \"name:\""));
}

TEST(ChassisFindingsTest, ErrorsAreBounded) {
    std::string text = "boards:\n";
    for (int i = 0; i < 150; ++i)
        text += "  - handle: 0\n    attributes: {SERIAL_NUMBER: \"A\"}\n";
    std::vector<std::string> const errors = errorsIn(text);
    ASSERT_EQ(errors.size(), 101U);
    EXPECT_EQ(errors.back(), "f: 50 more errors; correct these first");
}

TEST(ChassisFindingsTest, TabsAreNamed) {
    for (char const* const text : {"boards:\n  - handle: 1\n\tattributes: {A: 1}\n",
                                   "boards:\n  - handle: 1\n\t- handle: 2\n",
                                   "boards:\n  - handle: 1\n    \tattributes: {A: 1}\n"})
        EXPECT_THAT(errorsIn(text),
                    ElementsAre("f:3: the line is indented with a tab; indent with spaces"))
            << text;
    EXPECT_THAT(errorsIn("boards:\n\t- handle: 1\n"),
                ElementsAre("f:2: the line is indented with a tab; indent with spaces"));
}

TEST(ChassisFindingsTest, WrongIndentationIsSaidInPlainWords) {
    constexpr char const* misfit = "f:3: this does not fit the lines above; indent entries that "
                                   "belong together alike, and close every quote";
    EXPECT_THAT(errorsIn("boards:\n  - handle: 1\n   attributes: {A: 1}\n"), ElementsAre(misfit));
    EXPECT_THAT(errorsIn("boards:\n  - handle: 1\n - handle: 2\n"), ElementsAre(misfit));
    EXPECT_THAT(errorsIn("boards:\n  - handle: 1\n     attributes: {A: 1}\n"),
                ElementsAre("f:3: a \"key: value\" cannot stand here; indent it like its "
                            "neighbours, and write texts with a colon in quotes"));
}

TEST(ChassisFindingsTest, QuotesThatNeverEndAreRefused) {
    for (char const* const text :
         {"boards:\n  - A: \"x\n", "boards:\n  - A: \"x", "boards:\n  - A: 'x\n",
          "boards:\r\n  - A: 'x\r\n", "boards:\n  - A: \"x\\\"\n",
          "\xEF\xBB\xBF"
          "boards:\n  - A: \"\xC3\xA4\n"})
        EXPECT_THAT(errorsIn(text),
                    ElementsAre("f:2: a quoted text begins here and never ends; close its quote"))
            << text;
}

TEST(ChassisFindingsTest, QuotesThatEndAreAccepted) {
    for (char const* const text :
         {"boards: []\r\nprocesses:\r\n  - {kind: command, name: \"x\"}\r\n",
          "boards: []\nprocesses: [{kind: command, name: \"x\\\"\"}]\n",
          "\xEF\xBB\xBF"
          "boards: []\nprocesses: [{kind: command, name: 'it''s'}]",
          "boards: []\nprocesses:\n  - kind: command\n    name: \"\xC3\xA4 x\"",
          "boards: []\nprocesses:\n  - kind: command\n    name: |\n      \"x\n"})
        EXPECT_THAT(errorsIn(text), IsEmpty()) << text;
}

} // namespace
