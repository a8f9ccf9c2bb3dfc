// SPDX-License-Identifier: BSD-2-Clause
// The agent's messages when it cannot start, and --check-config.
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>

#include <gmock/gmock.h>

#include "agent/daemon/Options.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

class StartTest : public AgentFixture {
  protected:
    /// Arguments of a start that would succeed, and those of the test, which come last and win.
    Result start(std::vector<std::string> arguments, std::string const& moduleFolder = {}) {
        std::vector<std::string> all{
            "--snmp-config",    path("snmp.conf"),
            "--persistent-dir", path("second"),
            "--module-dir",     moduleFolder.empty() ? moduleDirectory() : moduleFolder};
        if (std::ranges::find(arguments, "--port") == arguments.end()) {
            all.emplace_back("--port");
            all.push_back(std::to_string(freePort()));
        }
        all.insert(all.end(), arguments.begin(), arguments.end());
        return runAgent(all);
    }
    /// The start fails with one line that says all of this.
    static void expectOneLine(Result const& result, int status,
                              ::testing::Matcher<std::string> const& text) {
        EXPECT_EQ(result.status, status) << result.output;
        EXPECT_THAT(linesOf(result.output), SizeIs(1)) << result.output;
        EXPECT_THAT(result.output, AllOf(HasSubstr("kvloamd: "), text));
    }
};

TEST_F(StartTest, PortInUseIsNamedWithTheRemedy) {
    startAgent();
    std::string const port = address().substr(address().find(':') + 1);
    expectOneLine(start({"--module", "z7sim", "--port", port}), kExitFailure,
                  AllOf(HasSubstr(address()), HasSubstr("in use"), HasSubstr("--port")));
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

/// Lets the programs that are started in a scope get no second thread: the stack limit, by which a
/// program sizes the stacks of its threads, is larger than any address space.
class NoThreadsScope {
  public:
    NoThreadsScope() {
        getrlimit(RLIMIT_STACK, &m_limit);
        rlimit huge = m_limit;
        huge.rlim_cur = rlim_t{1} << 60;
        m_set = setrlimit(RLIMIT_STACK, &huge) == 0;
    }
    ~NoThreadsScope() { setrlimit(RLIMIT_STACK, &m_limit); }
    NoThreadsScope(NoThreadsScope const&) = delete;
    NoThreadsScope& operator=(NoThreadsScope const&) = delete;

    /// False where the hard limit forbids it.
    bool isSet() const { return m_set; }

  private:
    rlimit m_limit{};
    bool m_set = false;
};

TEST_F(StartTest, SystemThatRefusesThreadsEndsTheStartWithAClearLine) {
#ifdef __SANITIZE_THREAD__
    GTEST_SKIP() << "ThreadSanitizer takes no other stack limit";
#endif
    NoThreadsScope const scope;
    if (!scope.isSet()) GTEST_SKIP() << "the stack limit cannot be raised here";
    Result const result = start({"--module", "z7sim"});
    EXPECT_EQ(result.status, kExitFailure);
    EXPECT_THAT(result.output, HasSubstr("kvloamd: the system refused a thread while starting"));
}

TEST_F(StartTest, AddressOfAnotherHostIsRefused) {
    Result const result = runAgent({"--module", "z7sim", "--module-dir", moduleDirectory(),
                                    "--snmp-config", path("snmp.conf"), "--persistent-dir",
                                    path("persistent"), "--listen", "udp:192.0.2.1:1161"});
    EXPECT_EQ(result.status, kExitFailure);
    EXPECT_THAT(result.output, HasSubstr("cannot listen on udp:192.0.2.1:1161"));
}

TEST_F(StartTest, UnknownOptionIsNamed) {
    expectOneLine(runAgent({"--prot", "1161"}), kExitUsage, HasSubstr("--prot"));
}

TEST_F(StartTest, UnknownModuleIsNamedWithTheFileThatWasTried) {
    expectOneLine(start({"--module", "nothing"}), kExitFailure,
                  AllOf(HasSubstr("'nothing'"), HasSubstr(moduleDirectory() + "/nothingkvl.so")));
}

TEST_F(StartTest, BrokenModulesAreNamed) {
    for (char const* const module :
         {"noentry", "refusing", "older", "newer", "throwing", "throwing-odd", "text"})
        expectOneLine(start({"--module", module}, BROKEN_MODULE_DIR), kExitFailure,
                      HasSubstr("'" + std::string(module) + "'"));
}

TEST_F(StartTest, BadChassisIsReportedByThePlatformThenByTheAgent) {
    useChassis("boards:\n  - handle: 1\n");
    Result const result = start({"--module", "z7sim"});
    EXPECT_EQ(result.status, kExitFailure);
    auto const lines = linesOf(result.output);
    ASSERT_THAT(lines, SizeIs(2)) << result.output;
    EXPECT_THAT(lines[0], AllOf(HasSubstr("chassis.yaml"), HasSubstr("SERIAL_NUMBER")));
    EXPECT_THAT(lines[1], HasSubstr("kvloamd: the board platform does not answer"));
}

TEST_F(StartTest, UnknownDirectiveIsNamedWithItsLine) {
    configureSnmp("rocommunity public 127.0.0.1\nrouserr op\n");
    expectOneLine(start({"--module", "z7sim"}), kExitFailure,
                  AllOf(HasSubstr("snmp.conf: line 2"), HasSubstr("rouserr")));
}

TEST_F(StartTest, MissingSnmpConfigurationIsNamed) {
    expectOneLine(runAgent({"--module", "z7sim", "--module-dir", moduleDirectory(), "--snmp-config",
                            path("none.conf")}),
                  kExitFailure, HasSubstr(path("none.conf")));
}

TEST_F(StartTest, UnknownKeyOfTheConfigurationFileIsNamed) {
    write(path("kvloamd.toml"), "prot=1161\n");
    expectOneLine(start({"--config", path("kvloamd.toml")}), kExitFailure, HasSubstr("prot"));
}

TEST_F(StartTest, CheckOfAGoodConfigurationSucceedsAndLeavesNothingBehind) {
    Result const result = start({"--module", "z7sim", "--check-config"});
    EXPECT_EQ(result.status, 0) << result.output;
    EXPECT_THAT(result.output, HasSubstr("the configuration is valid"));
    struct stat file {};
    EXPECT_NE(stat(path("second/kvloamd.conf").c_str(), &file), 0);
}

TEST_F(StartTest, SampleConfigurationsAreGood) {
    Result const result =
        runAgent({"--config", CONFIG_DIR "/kvloamd.toml", "--snmp-config", CONFIG_DIR "/snmp.conf",
                  "--module-dir", moduleDirectory(), "--check-config"});
    EXPECT_EQ(result.status, 0) << result.output;
}

TEST_F(StartTest, CheckNamesEveryFault) {
    configureSnmp("rouserr op\nrocommunityy public\n");
    Result const result = start({"--module", "nothing", "--check-config"});
    EXPECT_EQ(result.status, kExitFailure);
    EXPECT_THAT(result.output, AllOf(HasSubstr("'nothing'"), HasSubstr("rouserr"),
                                     HasSubstr("rocommunityy"), Not(HasSubstr("is valid"))));
}

TEST_F(StartTest, CheckNamesTheFaultOfABrokenChassis) {
    useChassis("boards:\n  - {handle: many}\n");
    Result const result = start({"--module", "z7sim", "--check-config"});
    EXPECT_EQ(result.status, kExitFailure);
    EXPECT_THAT(result.output, AllOf(HasSubstr("yaml:2"), HasSubstr("does not answer")));
}

TEST_F(StartTest, CheckNamesAddressesAtWhichTheAgentCannotListen) {
    for (char const* const address : {"bogus:127", "udp:192.0.2.1:1161", "udp:127.0.0.1:nowhere",
                                      "tcp:192.0.2.1:1161", "unix:/x"}) {
        Result const result = runAgent({"--snmp-config", path("snmp.conf"), "--persistent-dir",
                                        path("second"), "--check-config", "--listen", address});
        expectOneLine(result, kExitFailure,
                      HasSubstr("cannot listen on " + std::string(address) + ": "));
    }
}

TEST_F(StartTest, CheckNamesAnAddressThatIsGivenTwice) {
    std::string const address = "udp:127.0.0.1:" + std::to_string(freePort());
    expectOneLine(runAgent({"--snmp-config", path("snmp.conf"), "--persistent-dir", path("second"),
                            "--check-config", "--listen", address, "--listen", address}),
                  kExitFailure, HasSubstr("given twice"));
}

TEST_F(StartTest, CheckNamesEveryModuleThatAStartWouldRefuse) {
    for (char const* const module :
         {"noentry", "refusing", "older", "newer", "throwing", "throwing-odd", "text"})
        expectOneLine(start({"--module", module, "--check-config"}, BROKEN_MODULE_DIR),
                      kExitFailure, HasSubstr("'" + std::string(module) + "'"));
}

TEST_F(StartTest, CheckNamesAPersistentDirectoryThatAStartWouldRefuse) {
    ASSERT_EQ(symlink(path("store").c_str(), path("second").c_str()), 0);
    expectOneLine(start({"--module", "z7sim", "--check-config"}), kExitFailure,
                  AllOf(HasSubstr(path("second")), HasSubstr("symbolic link")));
}

TEST_F(StartTest, CheckAcceptsAPersistentDirectoryInUse) {
    startAgent();
    Result const result = runAgent({"--snmp-config", path("snmp.conf"), "--persistent-dir",
                                    path("persistent"), "--check-config"});
    EXPECT_EQ(result.status, 0) << result.output;
}

TEST_F(StartTest, ModulesAreFoundBesideTheProgram) {
    Result const result =
        runAgent({"--module", "z7sim", "--snmp-config", path("snmp.conf"), "--check-config"});
    EXPECT_EQ(result.status, 0) << result.output;
}

TEST_F(StartTest, ConfigurationThatIsFoundByItselfIsCheckedToo) {
    write(path("kvloamd.conf"), "rouserr op\n");
    auto variables = environment();
    variables["SNMPCONFPATH"] = path("");
    Process agent({KVLOAMD, "--check-config"}, variables);
    EXPECT_EQ(agent.wait(), kExitFailure);
    EXPECT_THAT(agent.output(), HasSubstr("kvloamd.conf: line 1"));
}

TEST_F(StartTest, CheckDoesNotNeedThePort) {
    startAgent();
    std::string const port = address().substr(address().find(':') + 1);
    EXPECT_EQ(start({"--module", "z7sim", "--port", port, "--check-config"}).status, 0);
}

TEST_F(StartTest, HelpAndVersionSucceed) {
    EXPECT_EQ(runAgent({"--help"}).status, 0);
    Result const version = runAgent({"--version"});
    EXPECT_EQ(version.status, 0);
    EXPECT_THAT(linesOf(version.output), SizeIs(1));
}

TEST_F(StartTest, AgentWithoutModuleSaysThatThereWillBeNoBoards) {
    Process agent({KVLOAMD, "--port", std::to_string(freePort()), "--snmp-config",
                   path("snmp.conf"), "--persistent-dir", path("persistent")},
                  environment());
    ASSERT_TRUE(agent.waitFor("serving 0 boards"));
    EXPECT_THAT(agent.output(), HasSubstr("--module"));
}

} // namespace
} // namespace kvloamd::e2e
