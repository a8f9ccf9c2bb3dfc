// SPDX-License-Identifier: BSD-2-Clause
// The command kvloam asks the real agent.
#include <algorithm>
#include <filesystem>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include "tests/e2e/HttpFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

class KvloamTest : public HttpFixture {
  protected:
    KvloamTest() {
        setVariable("KVLOAM_SOCKET", socketPath());
        setVariable("LC_ALL", "C.UTF-8");
        setVariable("TZ", "UTC");
    }
    void serve() { startHttpAgent(); }

    Result kvloam(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), KVLOAM);
        return run(arguments);
    }
    std::string show(std::vector<std::string> const& arguments) const {
        Result const result = kvloam(arguments);
        EXPECT_EQ(result.status, 0) << result.output;
        return result.output;
    }
    Json json(std::vector<std::string> arguments) const {
        arguments.emplace_back("--json");
        return Json::parse(show(arguments), nullptr, false);
    }
    /// Waits until the command's output contains `words`.
    bool comesToShow(std::vector<std::string> const& arguments, std::string const& words) const {
        return eventually(
            [&] { return kvloam(arguments).output.find(words) != std::string::npos; });
    }
};

TEST_F(KvloamTest, EveryCommandHasAnAnswer) {
    serve();
    EXPECT_THAT(show({}), HasSubstr("\nboards    3: 3 started\n"));
    EXPECT_THAT(show({"boards"}), HasSubstr("NX50001"));
    EXPECT_THAT(show({"board", "NX50001"}), StartsWith("Board NX50001: started\n"));
    EXPECT_THAT(show({"board", "1"}), StartsWith("Board NX50001: started\n"));
    EXPECT_THAT(show({"lines"}), HasSubstr("quillon-span-1"));
    EXPECT_THAT(show({"line", "nx5-trunk-2"}), StartsWith("Line nx5-trunk-2: NoAlarm\n"));
    EXPECT_THAT(show({"channels"}), HasSubstr("vorn-primary-rate-1"));
    EXPECT_THAT(show({"devices"}), HasSubstr("digitalTrunk"));
    EXPECT_THAT(show({"interfaces"}), HasSubstr("softwareLoopback"));
    EXPECT_EQ(show({"alarms"}), "no alarms\n");
    EXPECT_EQ(show({"faults"}), "no faults\n");
    EXPECT_THAT(show({"journal"}), HasSubstr("agentStarted"));
    EXPECT_THAT(show({"health"}), HasSubstr("board count"));
    EXPECT_THAT(show({"processes"}), HasSubstr("kvloamd"));
    EXPECT_THAT(show({"modules"}), HasSubstr("z7sim"));
    EXPECT_EQ(show({"services"}), "no services\n");
    EXPECT_THAT(show({"scalars"}), HasSubstr("kvlBoardCount "));
    EXPECT_THAT(show({"names", "board"}), HasSubstr("V0003-E\n"));
}

TEST_F(KvloamTest, EveryTableIsShownByItsName) {
    serve();
    auto const tables = json({"tables"}).at("tables");
    ASSERT_GT(tables.size(), 20U);
    for (std::string const name : tables) {
        EXPECT_TRUE(json({"table", name}).at("rows").is_array()) << name;
        EXPECT_THAT(show({"table", name}), Not(HasSubstr("\033")));
    }
    // The names of its columns are those of the MIB module, and the values what SNMP gets.
    Json const board = json({"table", "kvlBoardTable"}).at("rows").at(0);
    EXPECT_EQ("STRING: " + board.at("kvlBoardSerialNumber").get<std::string>(),
              get(std::string(kTable) + ".1.9.1"));
}

TEST_F(KvloamTest, ABrokenLineShowsEverywhere) {
    serve();
    EXPECT_EQ(kvloam({"check"}).status, 0);
    sim({"line", "alarm", "nx5-trunk-1", "los"});
    EXPECT_TRUE(comesToShow({"alarms"}, "dsx1LossOfSignal"));
    EXPECT_TRUE(comesToShow({"lines"}, "LossOfSignal"));
    EXPECT_TRUE(comesToShow({"journal"}, "alarmRaised"));
    EXPECT_THAT(show({}), HasSubstr("Lines with a status to look at"));
    Result const check = kvloam({"check"});
    EXPECT_EQ(check.status, 2);
    EXPECT_THAT(check.output, StartsWith("KVLOAM CRITICAL: "));
}

TEST_F(KvloamTest, APulledBoardIsNoLongerThere) {
    serve();
    sim({"remove", "NX50001"});
    EXPECT_TRUE(comesToShow({"board", "NX50001"}, "there is no board NX50001; kvloam boards lists "
                                                  "them"));
    EXPECT_EQ(kvloam({"board", "NX50001"}).status, 1);
    EXPECT_THAT(show({"boards"}), Not(HasSubstr("NX50001")));
}

TEST_F(KvloamTest, NewEntriesOfTheJournalAreFollowed) {
    serve();
    Process follower({KVLOAM, "journal", "--follow"}, environment());
    ASSERT_TRUE(follower.waitFor("agentStarted"));
    sim({"fail", "NX50001"});
    EXPECT_TRUE(follower.waitFor("boardFailed"));
}

TEST_F(KvloamTest, WithoutTheAgentItSaysWhatToStart) {
    Result const result = kvloam({"boards"});
    EXPECT_EQ(result.status, 3);
    EXPECT_THAT(result.output, HasSubstr("start it with: systemctl start kvloamd\n"));
    EXPECT_EQ(kvloam({"check"}).status, 3);
}

TEST_F(KvloamTest, AnAgentIsAskedByTcpWithItsToken) {
    write(path("token"), "a-token-of-a-test-0123456789\n");
    std::filesystem::permissions(path("token"), std::filesystem::perms::owner_read |
                                                    std::filesystem::perms::owner_write);
    std::string address;
    // Another process may take the port between the choice and the start.
    for (int attempt = 0; attempt < 5 && address.empty(); ++attempt) {
        std::string const chosen = "127.0.0.1:" + std::to_string(freePort());
        startAgent({"--http-socket", path("http.socket"), "--http", chosen, "--http-token-file",
                    path("token")});
        if (kvloam({"--host", chosen, "boards"}).output.find("no agent at") == std::string::npos)
            address = chosen;
    }
    Result const refused = kvloam({"--host", address, "boards"});
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.output, HasSubstr("; give --token-file\n"));
    EXPECT_THAT(show({"--host", address, "--token-file", path("token"), "boards"}),
                HasSubstr("NX50001"));
}

TEST_F(KvloamTest, PrometheusTakesTheHistory) {
    serve();
    std::string const samples = show({"history", "--openmetrics", "nx5-trunk-1"});
    EXPECT_THAT(samples, HasSubstr("kvloam_line_interval_unavailable_seconds{board=\"NX50001\""));
    write(path("history.txt"), samples);
    Result const made = run({"promtool", "tsdb", "create-blocks-from", "openmetrics",
                             path("history.txt"), path("blocks")});
    ASSERT_EQ(made.status, 0) << made.output;
    std::filesystem::create_directory(path("blocks/wal")); // which the dump expects
    Result const dumped = run({"promtool", "tsdb", "dump", path("blocks")});
    ASSERT_EQ(dumped.status, 0) << dumped.output;
    // Ten counters of each closed interval with data.
    std::size_t valid = 0;
    Json const line = json({"line", "nx5-trunk-1"}).at("line");
    for (Json const& interval : line.at("intervals"))
        valid += interval.at("validData") == true ? 1U : 0U;
    ASSERT_GT(valid, 50U);
    EXPECT_EQ(static_cast<std::size_t>(std::ranges::count(dumped.output, '{')), 10 * valid);
}

TEST_F(KvloamTest, EveryTableHasTheValuesThatTheAgentHas) {
    serve();
    sim({"fail", "3"}); // so that there is an alarm
    ASSERT_TRUE(comesToShow({"alarms"}, "boardFailed"));
    std::size_t values = 0;
    // What differs between the two, unless rows have come or gone meanwhile.
    auto const differences = [&](std::string const& table) -> std::vector<std::string> {
        Json const before = document("tables/" + table)["rows"];
        Json const shown = json({"table", table})["rows"];
        Json const after = document("tables/" + table)["rows"];
        if (before.size() != shown.size() || shown.size() != after.size())
            return {"rows come and go"};
        std::vector<std::string> found;
        for (std::size_t row = 0; row < shown.size(); ++row) {
            if (shown[row].size() != before[row].size()) found.push_back(shown[row].dump());
            for (auto const& [key, value] : shown[row].items()) {
                ++values;
                if (!isBetween(before[row].value(key, Json("none")), value, after[row][key]))
                    found.push_back(key + ": " + value.dump());
            }
        }
        return found;
    };
    auto const tables = json({"tables"})["tables"].get<std::vector<std::string>>();
    for (std::string const& table : tables) {
        std::vector<std::string> found;
        for (int attempt = 0; attempt < 3; ++attempt) {
            found = differences(table);
            if (found.empty()) break;
        }
        EXPECT_THAT(found, ::testing::IsEmpty()) << table;
    }
    EXPECT_GT(tables.size(), 40U);
    EXPECT_GT(values, 2000U);
}

} // namespace
} // namespace kvloamd::e2e
