// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/Options.h"

#include <unistd.h>

#include <cstdlib>
#include <fstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;

class OptionsTest : public ::testing::Test {
  protected:
    OptionsTest() { unsetenv("KVLOAM_MODULE_DIR"); }
    ~OptionsTest() override { unlink(m_file.c_str()); }

    static std::variant<Options, Exit> parse(std::vector<char const*> arguments) {
        arguments.insert(arguments.begin(), "kvloamd");
        return parseOptions(static_cast<int>(arguments.size()), arguments.data());
    }
    static Options options(std::vector<char const*> const& arguments) {
        return std::get<Options>(parse(arguments));
    }
    static Exit refusal(std::vector<char const*> const& arguments) {
        return std::get<Exit>(parse(arguments));
    }
    /// Writes the configuration file; returns its name.
    char const* file(std::string const& text) {
        std::ofstream(m_file) << text;
        return m_file.c_str();
    }

    std::string const m_file =
        ::testing::TempDir() + "kvloamd-options-" + std::to_string(getpid()) + ".toml";
};

TEST_F(OptionsTest, DefaultListensOnLoopbackOnly) {
    EXPECT_THAT(options({}).listen, ElementsAre("udp:127.0.0.1:1161"));
}

TEST_F(OptionsTest, PortIsOneOfTheLoopbackAddress) {
    EXPECT_THAT(options({"--port", "4711"}).listen, ElementsAre("udp:127.0.0.1:4711"));
}

TEST_F(OptionsTest, ListenReplacesTheDefaultAndRepeats) {
    EXPECT_THAT(options({"--listen", "udp:127.0.0.1:1", "--listen", "tcp:127.0.0.1:2"}).listen,
                ElementsAre("udp:127.0.0.1:1", "tcp:127.0.0.1:2"));
}

TEST_F(OptionsTest, EmptyAddressIsRefused) {
    EXPECT_EQ(refusal({"--listen", ""}).status, kExitUsage);
}

TEST_F(OptionsTest, PortAndListenExcludeEachOther) {
    EXPECT_EQ(refusal({"--port", "4711", "--listen", "udp:127.0.0.1:1"}).status, kExitUsage);
}

TEST_F(OptionsTest, PortOutOfRangeIsRefused) {
    Exit const exit = refusal({"--port", "65536"});
    EXPECT_EQ(exit.status, kExitUsage);
    EXPECT_THAT(exit.text, HasSubstr("65536"));
}

TEST_F(OptionsTest, AgentStandsAloneUnlessAskedOtherwise) {
    EXPECT_EQ(options({}).agentx, "");
}

TEST_F(OptionsTest, MasterIsWhereMastersAreUnlessAnAddressIsGiven) {
    EXPECT_EQ(options({"--agentx"}).agentx, "/var/agentx/master");
    EXPECT_EQ(options({"--agentx", "--module", "a"}).agentx, "/var/agentx/master");
    EXPECT_EQ(options({"--agentx", "tcp:127.0.0.1:705"}).agentx, "tcp:127.0.0.1:705");
}

TEST_F(OptionsTest, FileNamesTheMasterToo) {
    EXPECT_EQ(options({"--config", file("agentx=\"unix:/run/master\"\n")}).agentx,
              "unix:/run/master");
}

TEST_F(OptionsTest, MasterThatIsNoAddressIsRefused) {
    Exit const exit = refusal({"--agentx", "here"});
    EXPECT_EQ(exit.status, kExitUsage);
    EXPECT_THAT(exit.text, HasSubstr("'here' is not an address; write it like unix:"));
}

TEST_F(OptionsTest, MasterAndWhatIsTheMastersOwnExcludeEachOther) {
    EXPECT_THAT(refusal({"--agentx", "--port", "4711"}).text, HasSubstr("excludes --port"));
    EXPECT_THAT(refusal({"--agentx", "--listen", "udp:127.0.0.1:1"}).text,
                HasSubstr("excludes --port and --listen"));
    EXPECT_THAT(refusal({"--agentx", "--snmp-config", "file"}).text,
                HasSubstr("excludes --snmp-config"));
    EXPECT_EQ(refusal({"--agentx", "--port", "4711"}).status, kExitUsage);
}

TEST_F(OptionsTest, ModulesRepeat) {
    EXPECT_THAT(options({"--module", "a", "--module", "b"}).modules, ElementsAre("a", "b"));
}

TEST_F(OptionsTest, ModuleDirectoryComesFromTheEnvironment) {
    setenv("KVLOAM_MODULE_DIR", "/somewhere", 1);
    EXPECT_EQ(options({}).moduleDirectory, "/somewhere");
}

TEST_F(OptionsTest, ModuleDirectoryOptionWinsOverTheEnvironment) {
    setenv("KVLOAM_MODULE_DIR", "/somewhere", 1);
    EXPECT_EQ(options({"--module-dir", "/elsewhere"}).moduleDirectory, "/elsewhere");
}

TEST_F(OptionsTest, UnknownOptionIsNamedInOneLine) {
    Exit const exit = refusal({"--prot", "4711"});
    EXPECT_EQ(exit.status, kExitUsage);
    EXPECT_THAT(exit.text, HasSubstr("--prot"));
    EXPECT_THAT(exit.text, Not(HasSubstr("\n")));
}

TEST_F(OptionsTest, EnterpriseArcIsRead) {
    EXPECT_EQ(options({"--enterprise-oid", ".1.3.6.1.4.1.99"}).enterprise,
              (Oid{1, 3, 6, 1, 4, 1, 99}));
}

TEST_F(OptionsTest, EnterpriseArcThatIsNoNameIsRefused) {
    for (char const* const text :
         {"", "1", "1.3.", "1..3", "a.b", "1.3.x", "3.1", "1.40", "1.3.4294967296", "-1.3"}) {
        EXPECT_FALSE(parseOid(text).has_value()) << text;
        EXPECT_EQ(refusal({"--enterprise-oid", text}).status, kExitUsage) << text;
    }
}

/// The agent of a test has no service manager.
TEST_F(OptionsTest, HttpSocketIsInTheServicesDirectory) {
    unsetenv("RUNTIME_DIRECTORY");
    EXPECT_EQ(options({}).httpSocket, "");
    setenv("RUNTIME_DIRECTORY", "/run/kvloam:/run/other", 1);
    EXPECT_EQ(options({}).httpSocket, "/run/kvloam/kvloamd.socket");
    EXPECT_EQ(options({"--http-socket", "/tmp/other"}).httpSocket, "/tmp/other");
    EXPECT_EQ(options({"--http-socket", ""}).httpSocket, "");
    unsetenv("RUNTIME_DIRECTORY");
}

TEST_F(OptionsTest, HttpAddressHasAPortAndAHostOfItsOwn) {
    EXPECT_EQ(options({}).http, "");
    for (char const* const address : {"127.0.0.1:8161", "8161", "[::1]:8161", "localhost:1"})
        EXPECT_EQ(options({"--http", address}).http, address);
    for (char const* const address : {"127.0.0.1", ":8161", "127.0.0.1:", "127.0.0.1:0", "::1:8161",
                                      "localhost:65536", "localhost:80x", "[]:80"})
        EXPECT_EQ(refusal({"--http", address}).status, kExitUsage) << address;
}

TEST_F(OptionsTest, TokenWithoutTcpIsRefused) {
    EXPECT_EQ(refusal({"--http-token-file", "token"}).status, kExitUsage);
    EXPECT_EQ(options({"--http", "8161", "--http-token-file", "token"}).httpTokenFile, "token");
}

TEST_F(OptionsTest, InterfaceBaseIsRead) {
    EXPECT_EQ(options({}).interfaceBase, 1000U);
    EXPECT_EQ(options({"--interface-base", "1"}).interfaceBase, 1U);
}

TEST_F(OptionsTest, InterfaceBaseOutOfRangeIsRefused) {
    for (char const* const base : {"0", "-1", "1000000001", "many"})
        EXPECT_EQ(refusal({"--interface-base", base}).status, kExitUsage) << base;
}

TEST_F(OptionsTest, LogLevelIsRead) {
    EXPECT_EQ(options({"--log-level", "debug"}).logLevel, LogLevel::Debug);
}

TEST_F(OptionsTest, UnknownLogLevelIsRefused) {
    EXPECT_EQ(refusal({"--log-level", "loud"}).status, kExitUsage);
}

TEST_F(OptionsTest, FileSetsOptions) {
    Options const read =
        options({"--config", file("port=4711\nmodule=[\"a\", \"b\"]\nlog-level=\"error\"\n")});
    EXPECT_THAT(read.listen, ElementsAre("udp:127.0.0.1:4711"));
    EXPECT_THAT(read.modules, ElementsAre("a", "b"));
    EXPECT_EQ(read.logLevel, LogLevel::Error);
}

TEST_F(OptionsTest, CommandLineWinsOverTheFile) {
    EXPECT_THAT(options({"--config", file("port=4711\n"), "--port", "4712"}).listen,
                ElementsAre("udp:127.0.0.1:4712"));
}

TEST_F(OptionsTest, UnknownKeyInTheFileIsNamedWithFileAndLine) {
    std::string const name = file("port=4711\n\nprot=4711\n");
    Exit const exit = refusal({"--config", name.c_str()});
    EXPECT_EQ(exit.status, kExitFailure);
    EXPECT_THAT(exit.text, HasSubstr(name + ":3: unknown key 'prot'"));
}

TEST_F(OptionsTest, ValueThatTheOptionRefusesIsNamedWithFileAndLine) {
    std::string const name = file("# the port\nport=many\n");
    Exit const exit = refusal({"--config", name.c_str()});
    EXPECT_EQ(exit.status, kExitFailure);
    EXPECT_THAT(exit.text, HasSubstr(name + ":2: --port"));
}

TEST_F(OptionsTest, LogLevelOfTheFileThatDoesNotExistIsNamedWithTheOnesThatDo) {
    std::string const name = file("log-level=\"loud\"\n");
    EXPECT_THAT(refusal({"--config", name.c_str()}).text,
                AllOf(HasSubstr(name + ":1: "), HasSubstr("'loud'"),
                      HasSubstr("error, warning, info or debug")));
}

TEST_F(OptionsTest, AlarmsAreConfiguredOnTheCommandLine) {
    Options const read =
        options({"--alarm", "linkDown=minor,raise=5", "--alarm", "agentStoreUnreadable=off"});
    EXPECT_EQ(read.alarmPolicies.of(AlarmKind::LinkDown, 1),
              (AlarmPolicy{AlarmSeverity::Minor, std::chrono::seconds(5)}));
    EXPECT_FALSE(read.alarmPolicies.of(AlarmKind::StoreUnreadable, 0).enabled);
}

TEST_F(OptionsTest, AlarmsAreConfiguredInTheFile) {
    Options const read = options(
        {"--config", file("alarm = [\"linkDown=minor,raise=5\", \"platformFault.17=major\"]\n")});
    EXPECT_EQ(read.alarmPolicies.of(AlarmKind::LinkDown, 1).severity, AlarmSeverity::Minor);
    EXPECT_EQ(read.alarmPolicies.of(AlarmKind::PlatformFault, 17).severity, AlarmSeverity::Major);
}

TEST_F(OptionsTest, WrongAlarmOfTheFileIsReportedWithItsLine) {
    std::string const name = file("# alarms\nalarm = [\"linkDwn=minor\"]\n");
    EXPECT_THAT(refusal({"--config", name.c_str()}).text,
                AllOf(HasSubstr(name + ":2: "), HasSubstr("'linkDwn' is no kind of alarm")));
}

TEST_F(OptionsTest, LimitsOfLinesAreConfiguredInTheFile) {
    constexpr int kT1 = 2;
    EXPECT_EQ(options({}).typeLimits, TypeLimits{});
    Options const read =
        options({"--config", file("threshold = [\"t1=es15m=65,css24h=4\", \"e1=uas15m=10\"]\n")});
    EXPECT_EQ(read.typeLimits.of(kT1)[kErroredSeconds15m], 65);
    EXPECT_EQ(read.typeLimits.of(kT1)[kControlledSlipSeconds24h], 4);
}

TEST_F(OptionsTest, WrongLimitsOfTheFileAreReportedWithTheirLine) {
    std::string const wrong = file("\nthreshold = [\"t1=es15m=many\"]\n");
    EXPECT_THAT(refusal({"--config", wrong.c_str()}).text,
                AllOf(HasSubstr(wrong + ":2: "), HasSubstr("'es15m=many'")));
    std::string const twice = file("threshold = [\"t1=es15m=1\", \"t1=es24h=1\"]\n");
    EXPECT_THAT(refusal({"--config", twice.c_str()}).text,
                AllOf(HasSubstr(twice + ":1: "), HasSubstr("'t1' is configured twice")));
}

TEST_F(OptionsTest, AlarmThatIsConfiguredTwiceIsReportedWithItsLine) {
    std::string const name = file("alarm = [\"linkDown=minor\", \"linkDown=major\"]\n");
    EXPECT_THAT(refusal({"--config", name.c_str()}).text,
                AllOf(HasSubstr(name + ":1: "), HasSubstr("'linkDown' is configured twice")));
    EXPECT_EQ(refusal({"--alarm", "linkDown=minor", "--alarm", "linkDown=major"}).status,
              kExitUsage);
}

TEST_F(OptionsTest, ModulesAreFoundBesideTheProgram) {
    unsetenv("KVLOAM_MODULE_DIR");
    auto const program = std::filesystem::read_symlink("/proc/self/exe");
    auto const beside = program.parent_path().parent_path() / "lib" / "kvloam";
    ASSERT_TRUE(std::filesystem::is_directory(beside)) << beside;
    EXPECT_EQ(options({}).moduleDirectory, beside);
}

TEST_F(OptionsTest, FileThatIsNotThereIsNamed) {
    Exit const exit = refusal({"--config", "/nowhere/kvloamd.toml"});
    EXPECT_EQ(exit.status, kExitFailure);
    EXPECT_THAT(exit.text, HasSubstr("/nowhere/kvloamd.toml"));
}

TEST_F(OptionsTest, HelpNamesEveryOption) {
    Exit const exit = refusal({"--help"});
    EXPECT_EQ(exit.status, 0);
    for (char const* const option :
         {"--port", "--listen", "--module", "--module-dir", "--config", "--snmp-config",
          "--persistent-dir", "--enterprise-oid", "--check-config", "--version", "--log-level"})
        EXPECT_THAT(exit.text, HasSubstr(option));
}

TEST_F(OptionsTest, VersionNamesAgentAndLibrary) {
    Exit const exit = refusal({"--version"});
    EXPECT_EQ(exit.status, 0);
    EXPECT_THAT(exit.text, HasSubstr("kvloamd 0."));
    EXPECT_THAT(exit.text, HasSubstr("VQcid 01010000-164 OAM"));
}

} // namespace
} // namespace kvloamd
