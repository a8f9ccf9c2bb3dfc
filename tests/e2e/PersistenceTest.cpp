// SPDX-License-Identifier: BSD-2-Clause
// What survives a restart, and what the agent does when something is in the way.
#include <unistd.h>

#include <csignal>
#include <filesystem>

#include <gmock/gmock.h>
#include <sqlite3.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class PersistenceTest : public AgentFixture {
  protected:
    static constexpr char kIfDescr[] = "1.3.6.1.2.1.2.2.1.2";

    /// Starts a second agent on the persistent directory of the first.
    Result startSecondAgent() {
        return runAgent({"--listen", "udp:127.0.0.1:" + std::to_string(freePort()), "--module",
                         "z7sim", "--module-dir", moduleDirectory(), "--snmp-config",
                         path("snmp.conf"), "--persistent-dir", path("persistent")});
    }
    std::string persistence() const { return get("kvlPersistence.0"); }
};

/// Another program's use of a database.
class Lock {
  public:
    explicit Lock(std::string const& file) {
        sqlite3_open(file.c_str(), &m_database);
        EXPECT_EQ(sqlite3_exec(m_database, "BEGIN EXCLUSIVE", nullptr, nullptr, nullptr),
                  SQLITE_OK);
    }
    ~Lock() { sqlite3_close(m_database); }
    Lock(Lock const&) = delete;
    Lock& operator=(Lock const&) = delete;

  private:
    sqlite3* m_database = nullptr;
};

TEST_F(PersistenceTest, IndicesAreTheSameAfterAKill) {
    startAgent();
    auto const before = walk(kIfDescr);
    ASSERT_FALSE(before.empty());
    agent().signal(SIGKILL);
    agent().wait();
    startAgent({"--interface-base", "9000"});
    EXPECT_EQ(walk(kIfDescr), before);
    EXPECT_EQ(persistence(), "INTEGER: kept(1)");
}

TEST_F(PersistenceTest, SecondAgentOnOneDirectoryIsRefusedAndNamesTheFirst) {
    startAgent();
    Result const second = startSecondAgent();
    EXPECT_EQ(second.status, 1);
    EXPECT_THAT(second.output, HasSubstr("another kvloamd (process "));
    EXPECT_EQ(persistence(), "INTEGER: kept(1)");
}

TEST_F(PersistenceTest, PlantedLinkIsRefused) {
    std::filesystem::create_directories(path("persistent"));
    std::filesystem::create_symlink(path("planted.conf"), path("persistent/kvloamd.conf"));
    write(path("planted.conf"), "rocommunity planted 127.0.0.1\n");
    Result const result = startSecondAgent();
    EXPECT_EQ(result.status, 1);
    EXPECT_THAT(result.output, HasSubstr("kvloamd.conf: is not a regular file"));
}

TEST_F(PersistenceTest, FileThatIsLockedAtTheStartIsReadLater) {
    startAgent();
    auto const before = walk(kIfDescr);
    ASSERT_FALSE(before.empty());
    EXPECT_EQ(stopAgent(), 0);
    {
        Lock const backup(path("persistent/ifindex.sqlite"));
        startAgent();
        EXPECT_THAT(agent().output(), HasSubstr("another process uses it"));
        EXPECT_EQ(persistence(), "INTEGER: inUse(2)");
        EXPECT_EQ(get("kvlInterfaceCount.0"), "Gauge32: 0 interfaces");
    }
    EXPECT_TRUE(eventually([&] { return walk(kIfDescr) == before; }));
    EXPECT_TRUE(eventually([&] { return persistence() == "INTEGER: kept(1)"; }));
}

TEST_F(PersistenceTest, SettingThatCannotBeSavedCountsAndIsSavedLater) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    std::string const traps = "1.3.6.1.2.1.10.18.6.1.17.1000";
    {
        Lock const backup(path("persistent/ifindex.sqlite"));
        EXPECT_EQ(ask("snmpset", {traps, "i", "1"}).status, 0);
        EXPECT_TRUE(eventually([&] { return persistence() == "INTEGER: inUse(2)"; }));
        EXPECT_THAT(ask("snmpget", {traps}).output, HasSubstr("INTEGER: 1"));
    }
    EXPECT_TRUE(eventually([&] { return persistence() == "INTEGER: kept(1)"; }));
    agent().signal(SIGKILL);
    agent().wait();
    startAgent();
    EXPECT_THAT(ask("snmpget", {traps}).output, HasSubstr("INTEGER: 1"));
}

} // namespace
} // namespace kvloamd::e2e
