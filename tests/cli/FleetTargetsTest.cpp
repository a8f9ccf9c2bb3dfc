// SPDX-License-Identifier: BSD-2-Clause
#include "cli/FleetTargets.h"

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cli/Answer.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

using kvloam::discoveryFile;

/// The file, or what is wrong with the list.
std::string fileOf(std::string const& list) {
    std::istringstream in(list);
    try {
        return discoveryFile(in, "hosts", 8161);
    } catch (kvloam::CliError const& error) {
        return error.what();
    }
}

TEST(FleetTargetsTest, EachAgentBecomesATargetWithLabels) {
    EXPECT_EQ(fileOf("# north\n"
                     "192.0.2.11 north gw1   # the first\n"
                     "\n"
                     "gw2.example.net:9000\n"
                     "[2001:db8::21] south\n"),
              "# Made by \"kvloam fleet targets\".\n"
              "- targets: [\"192.0.2.11:8161\"]\n"
              "  labels: {site: \"north\", chassis: \"gw1\"}\n"
              "- targets: [\"gw2.example.net:9000\"]\n"
              "  labels: {chassis: \"gw2.example.net\"}\n"
              "- targets: [\"[2001:db8::21]:8161\"]\n"
              "  labels: {site: \"south\", chassis: \"2001:db8::21\"}\n");
}

TEST(FleetTargetsTest, FaultsAreNamedByTheirLine) {
    using testing::HasSubstr;
    EXPECT_EQ(fileOf("a\nb\na:8161\n"), "hosts:3: a:8161 is in line 1 already");
    EXPECT_EQ(fileOf("a s x\nb s x\n"), "hosts:2: chassis x is in line 1 already");
    EXPECT_EQ(fileOf("a s x y\n"), "hosts:1: more than an address, a site and a chassis");
    for (char const* address : {"http://a", "a:0", "a:65536", "a:x", "a:", "2001:db8::1", "[a:b",
                                "[x]:1", "a\"b", "a:1:2", "\033[2J", "a:000000000000000000001"})
        EXPECT_THAT(fileOf(address), HasSubstr("\" is no address; write HOST")) << address;
    EXPECT_THAT(fileOf("# none\n"), HasSubstr("hosts: lists no agent;"));
}

TEST(FleetTargetsTest, LabelsOfAnyCharactersAreTexts) {
    EXPECT_THAT(fileOf("a {x:\"y\" \\n\n"),
                testing::HasSubstr(R"(labels: {site: "{x:\"y\"", chassis: "\\n"})"));
}

TEST(FleetTargetsTest, AFileIsReplacedAsAWhole) {
    support::TemporaryDirectory const directory;
    std::string const path = directory.file("targets.yml");
    kvloam::replaceFile(path, "old");
    kvloam::replaceFile(path, "new");
    std::string text;
    std::getline(std::ifstream(path), text);
    EXPECT_EQ(text, "new");
    EXPECT_FALSE(std::filesystem::exists(path + ".new"));
    EXPECT_THROW(kvloam::replaceFile(directory.file("none/x"), "x"), kvloam::CliError);
}

} // namespace
