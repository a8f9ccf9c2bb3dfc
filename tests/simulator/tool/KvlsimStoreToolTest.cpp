// SPDX-License-Identifier: BSD-2-Clause
// kvlsim store and kvlsim process, end to end: the real tool against a real process.
#include <csignal>
#include <filesystem>
#include <memory>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/simulator/tool/ToolFixture.h"

namespace {

using nlohmann::json;
using support::Finished;
using testing::HasSubstr;

class KvlsimStoreToolTest : public ToolTest {
  protected:
    KvlsimStoreToolTest() { hold({"VQRXCFGPATH=" + directory.file(".")}); }

    std::string serials() const {
        holder->writeLine("store");
        return holder->readLine();
    }
};

TEST_F(KvlsimStoreToolTest, AddedAndRemovedRecordsReachARunningReader) {
    ASSERT_EQ(serials(), "serials NX50001 NX50002 QL-77-0420 V0003-E");
    succeed({"store", "add", "NEW", "--family", "Z7", "--field", "Model=Z7-T1"});
    EXPECT_EQ(serials(), "serials NX50001 NX50002 QL-77-0420 V0003-E NEW");
    succeed({"store", "remove", "NEW", "NX50001"});
    succeed({"store", "remove", "--family", "QUILLON"});
    EXPECT_EQ(serials(), "serials NX50002 V0003-E");
}

TEST_F(KvlsimStoreToolTest, SetFieldsAreShown) {
    succeed({"store", "set", "NX50001", "FirmwareVersion=7", "IRQ=0x10"});
    json const shown = json::parse(succeed({"store", "list", "NX50001", "--json"}))["boards"][0];
    EXPECT_EQ(shown["fields"]["FirmwareVersion"], "7");
    EXPECT_EQ(shown["fields"]["IRQ"], 16);
    EXPECT_THAT(succeed({"store", "list", "NX50001"}), HasSubstr("IRQ                     16\n"));
}

TEST_F(KvlsimStoreToolTest, ListIsATable) {
    std::string const table = succeed({"store", "list"});
    EXPECT_THAT(table, HasSubstr("families  NX5 QUILLON VORN Z7 VELQUOR\n"));
    EXPECT_THAT(table, HasSubstr("\n7         NX5      NX50001     NX5-T1      200   16     4  "));
}

TEST_F(KvlsimStoreToolTest, ProcessWithoutADirectoryHasNoStore) {
    hold({"VQRXCFGPATH="});
    expectRefusal({"store", "list"}, 1,
                  "kvlsim: no attribute store: the process has no VQRXCFGPATH; set it to a "
                  "directory\n");
}

TEST_F(KvlsimStoreToolTest, WrongUseIsRefused) {
    expectRefusal({"store"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"store", "add"}, 2, "kvlsim: a serial number or --family is required");
    expectRefusal({"store", "remove"}, 2, "kvlsim: a serial number or --family is required");
    expectRefusal({"store", "set", "NX50001", "IRQ"}, 1,
                  "kvlsim: \"IRQ\" is no NAME=VALUE; write for example IRQ=11\n");
    expectRefusal({"store", "set", "NX50001"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"process"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"process", "add"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"process", "add", "--name", "a", "--pid", "1"}, 2, "; kvlsim --help explains\n");
}

TEST_F(KvlsimStoreToolTest, AddedProcessRunsUntilItIsEnded) {
    std::string const added = succeed({"process", "add", "--name", "/opt/app/server", "--counter",
                                       "NumberOfOpens=3", "--rate", "TotalQueuedEvents=0.5"});
    ASSERT_EQ(added.substr(0, 8), "process ");
    int const pid = std::stoi(added.substr(8));
    EXPECT_EQ(kill(pid, 0), 0);
    EXPECT_THAT(succeed({"process", "list"}), HasSubstr("server"));
    json const listed = json::parse(succeed({"process", "list", "--json"}))["processes"];
    EXPECT_EQ(listed.back()["counters"]["NumberOfOpens"], 3);
    succeed({"process", "end", std::to_string(pid)});
    EXPECT_EQ(kill(pid, 0), -1);
    expectRefusal({"process", "end", "server"}, 1, "kvlsim: no process \"server\" was added");
}

TEST_F(KvlsimStoreToolTest, BundledChassisStartsItsProcesses) {
    std::string const table = succeed({"process", "list"});
    for (char const* name : {"kvlsim_platform_holder", "call-server", "announcer"})
        EXPECT_THAT(table, HasSubstr(name));
    succeed({"process", "end", "announcer"});
    EXPECT_THAT(succeed({"process", "list"}), testing::Not(HasSubstr("announcer")));
}

} // namespace
