// SPDX-License-Identifier: BSD-2-Clause
// kvlsim generate and check, and the chassis that a process loads.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/simulator/tool/ToolFixture.h"

namespace {

using nlohmann::json;
using support::ChildProcess;
using support::Finished;

class KvlsimChassisToolTest : public ToolTest {};

TEST_F(KvlsimChassisToolTest, GeneratedChassisIsGood) {
    std::string const path = directory.file("big.yaml");
    succeed({"generate", "--boards", "200", "--devices", "3", "--output", path});
    Finished const checked = kvlsim({"check", path});
    EXPECT_EQ(checked.status, 0) << checked.err;
    EXPECT_EQ(checked.out, path + ": good, 200 boards\n");
    EXPECT_EQ(checked.err, "");
    ChildProcess& process = hold({"KVLSIM_CHASSIS=" + path});
    process.writeLine("read 200 SERIAL_NUMBER");
    EXPECT_THAT(process.readLine(), testing::EndsWith("0000200"));
}

TEST_F(KvlsimChassisToolTest, SameSeedMakesTheSameChassisAndAnotherDoesNot) {
    std::string const one = kvlsim({"generate", "--boards", "5", "--seed", "7"}).out;
    EXPECT_FALSE(one.empty());
    EXPECT_EQ(kvlsim({"generate", "--boards", "5", "--seed", "7"}).out, one);
    auto const behindFirstLine = [](std::string const& text) {
        return text.substr(text.find('\n'));
    };
    EXPECT_NE(behindFirstLine(kvlsim({"generate", "--boards", "5", "--seed", "8"}).out),
              behindFirstLine(one));
}

TEST_F(KvlsimChassisToolTest, ChassisThatCannotBeWrittenLeavesNothingBehind) {
    expectRefusalLine(
        {"generate", "--boards", "1", "--output", directory.file("no/such/place.yaml")}, 1,
        "kvlsim: " + directory.file("no/such/place.yaml") +
            ": cannot be written (No such file or directory); choose a place that is "
            "writable and has room");
}

TEST_F(KvlsimChassisToolTest, CheckRefusesABadChassisWithItsLine) {
    std::string const path =
        write("bad.yaml", "boards:\n  - {handle: 0, attributes: {SERIAL_NUMBER: A1}}\n");
    expectRefusalLine({"check", path}, 1,
                      "kvlsim: " + path +
                          ":2: the handle of a board cannot be 0; write a number from 1 to "
                          "2147483646");
}

TEST_F(KvlsimChassisToolTest, CheckReportsEveryErrorAndWarning) {
    std::string const path = write("bad.yaml", "boards:\n"
                                               "  - handle: 0\n"
                                               "    attributes: {SERIAL_NUMBER: A1, FAMILIY: X}\n"
                                               "  - handle: 2\n");
    expectRefusalLine({"check", path}, 1,
                      "kvlsim: " + path +
                          ":3: warning: unknown attribute \"FAMILIY\"; did you mean FAMILY?\n"
                          "kvlsim: " +
                          path +
                          ":2: the handle of a board cannot be 0; write a number from 1 to "
                          "2147483646\n"
                          "kvlsim: " +
                          path + ":4: board 2 has no SERIAL_NUMBER; give it one under attributes");
}

TEST_F(KvlsimChassisToolTest, CheckOfAMisspeltAttributeWarnsAndSucceeds) {
    std::string const path =
        write("warned.yaml", "boards:\n"
                             "  - handle: 1\n"
                             "    attributes: {SERIAL_NUMBER: A1, BOARD_PRESNT: 0}\n");
    Finished const checked = kvlsim({"check", path});
    EXPECT_EQ(checked.status, 0);
    EXPECT_EQ(checked.out, path + ": good, 1 boards\n");
    EXPECT_EQ(checked.err, "kvlsim: " + path +
                               ":3: warning: unknown attribute \"BOARD_PRESNT\"; did you mean "
                               "BOARD_PRESENT?\n");
}

TEST_F(KvlsimChassisToolTest, BundledChassisIsTheExampleChassis) {
    hold();
    json const bundled = json::parse(kvlsim({"show", "--json"}).out)["boards"];
    hold({"KVLSIM_CHASSIS=" KVLSIM_SMALL_CHASSIS});
    json const example = json::parse(kvlsim({"show", "--json"}).out)["boards"];
    ASSERT_EQ(bundled.size(), 3U);
    for (std::size_t i = 0; i < 3; ++i)
        EXPECT_EQ(bundled[i]["devices"], example[i]["devices"]);
}

TEST_F(KvlsimChassisToolTest, BadChassisIsReportedInOneLineAndThePlatformAnswersNothing) {
    std::string const path = write("bad.yaml", "boards: 5\n");
    ChildProcess& process = hold({"KVLSIM_CHASSIS=" + path});
    std::string const reason = path + ":1: boards cannot be 5; write a list, each board beginning "
                                      "with \"- handle:\"";
    process.writeLine("read 1 NAME");
    EXPECT_EQ(process.readLine(), "result 204");
    expectRefusalLine({"show"}, 1, "kvlsim: there is no chassis: " + reason);
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0);
    EXPECT_EQ(finished.err, "kvlsim: " + reason + "\n");
}

TEST_F(KvlsimChassisToolTest, LoadingAChassisWarnsOfAMisspeltAttribute) {
    std::string const path = write("warned.yaml", "boards:\n"
                                                  "  - handle: 1\n"
                                                  "    attributes:\n"
                                                  "      SERIAL_NUMBER: A1\n"
                                                  "      FAMILIY: NX5\n");
    ChildProcess& process = hold({"KVLSIM_CHASSIS=" + path});
    process.writeLine("read 1 FAMILIY");
    EXPECT_THAT(process.readLine(), testing::EndsWith("NX5"));
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0);
    EXPECT_EQ(finished.err, "kvlsim: " + path +
                                ":5: warning: unknown attribute \"FAMILIY\"; did you mean "
                                "FAMILY?\n");
}

} // namespace
