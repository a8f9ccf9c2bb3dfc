// SPDX-License-Identifier: BSD-2-Clause
// The agent serves on when something around it fails: a disk, the reader of its log, a board, or
// the supply of descriptors.
#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <memory>
#include <sstream>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"
#include "tests/e2e/Namespaces.h"
#include "tests/e2e/SnmpMessage.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

constexpr char kReadAgain[] = "kvloamd: the configuration has been read again\n";

class BadDayTest : public AgentFixture {
  protected:
    void expectService() { EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards"); }
    /// The command line of an agent at a free port, to which the SNMP tools are directed.
    std::vector<std::string> command(std::vector<std::string> const& more = {}) {
        askPort(freePort());
        std::vector<std::string> words{
            KVLOAMD,           "--listen",         "udp:" + address(), "--module",
            "z7sim",           "--module-dir",     moduleDirectory(),  "--snmp-config",
            path("snmp.conf"), "--persistent-dir", path("persistent")};
        words.insert(words.end(), more.begin(), more.end());
        return words;
    }
    /// Runs a command by the shell; "$@" in `script` stands for it.
    std::unique_ptr<Process> runBy(std::string const& script,
                                   std::vector<std::string> const& words) const {
        std::vector<std::string> all{"sh", "-c", script, "sh"};
        all.insert(all.end(), words.begin(), words.end());
        return std::make_unique<Process>(all, environment());
    }
    /// Makes the agent write more than 4096 octets to its log, and expects answers meanwhile.
    void reloadOften(Process const& process) {
        for (int round = 0; round < 3000; ++round) {
            process.signal(SIGHUP);
            // A request is answered after the reload, of which there is a line.
            if (round % 20 == 0) expectService();
        }
    }
    static std::string contentOf(std::string const& file) {
        std::ostringstream text;
        text << std::ifstream(file).rdbuf();
        return text.str();
    }
};

/// A small file system in memory, which a test fills.
class FullDiskTest : public BadDayTest {
  protected:
    /// Mounts it at this path of the test's folder; false where the system forbids it.
    bool mountDisk(std::string const& name) {
        m_disk = path(name);
        std::filesystem::create_directories(m_disk);
        return enterNamespaces(CLONE_NEWNS) &&
               mount("none", m_disk.c_str(), "tmpfs", 0, "size=1m,mode=0700") == 0;
    }
    void fillDisk() const {
        std::ofstream filler(m_disk + "/filler");
        filler.exceptions(std::ios::goodbit);
        // The last octets, too.
        for (std::size_t piece = 65536; piece > 0; piece /= 16) {
            std::string const octets(piece, 'x');
            while (filler << octets << std::flush) {
            }
            filler.clear();
        }
    }
    void freeDisk() const { std::filesystem::remove(m_disk + "/filler"); }
    ~FullDiskTest() override {
        if (!m_disk.empty()) umount2(m_disk.c_str(), MNT_DETACH);
    }

  private:
    std::string m_disk;
};

TEST_F(FullDiskTest, SettingIsKeptOnceThereIsRoomAgain) {
    if (!mountDisk("persistent")) GTEST_SKIP() << "no file system can be mounted here";
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startAgent();
    EXPECT_EQ(get("kvlPersistence.0"), "INTEGER: kept(1)");
    fillDisk();
    std::string const traps = "1.3.6.1.2.1.10.18.6.1.17.1000";
    ASSERT_EQ(ask("snmpset", {traps, "i", "1"}).status, 0);
    EXPECT_TRUE(eventually([this] { return get("kvlPersistence.0") != "INTEGER: kept(1)"; }));
    expectService();
    EXPECT_THAT(get(traps), HasSubstr("INTEGER: 1"));
    freeDisk();
    EXPECT_TRUE(eventually([this] { return get("kvlPersistence.0") == "INTEGER: kept(1)"; }));
    agent().signal(SIGKILL);
    agent().wait();
    startAgent();
    EXPECT_THAT(get(traps), HasSubstr("INTEGER: 1"));
}

TEST_F(FullDiskTest, LogOnAFullDiskLosesLinesAndCountsThem) {
    if (!mountDisk("logs")) GTEST_SKIP() << "no file system can be mounted here";
    std::string const log = path("logs/log");
    auto const process = runBy("exec \"$@\" 2>>" + log, command());
    ASSERT_TRUE(eventually([&] { return contentOf(log).find("serving ") != std::string::npos; }));
    fillDisk();
    // Soon the room in the log's last block is used up.
    reloadOften(*process);
    freeDisk();
    EXPECT_TRUE(eventually([&] {
        process->signal(SIGHUP);
        return contentOf(log).find("log lines lost, because the log took no more") !=
               std::string::npos;
    }));
    process->signal(SIGTERM);
    EXPECT_EQ(process->wait(), 0);
}

TEST_F(BadDayTest, ReaderOfTheLogThatLeavesDoesNotEndTheAgent) {
    startAgent();
    agent().closePipe();
    for (int round = 0; round < 20; ++round) {
        agent().signal(SIGHUP);
        expectService();
    }
    EXPECT_EQ(stopAgent(), 0);
}

TEST_F(BadDayTest, StormOfReloadsIntoAnUnreadLogStopsNoAnswer) {
    startAgent();
    // A smaller pipe is full sooner.
    ASSERT_GT(fcntl(agent().pipe(), F_SETPIPE_SZ, 4096), 0);
    reloadOften(agent());
    // Everything that was written is read; the next line tells how many were lost.
    agent().hasNow(kReadAgain);
    EXPECT_TRUE(eventually([this] {
        agent().signal(SIGHUP);
        return agent().hasNow("kvloamd: log lines lost, because the log took no more");
    }));
    EXPECT_EQ(stopAgent(), 0);
}

TEST_F(BadDayTest, BoardThatThrowsIsShownAsNotAnsweringAndTheOtherGoesOn) {
    setVariable("FAULTY_BOARD_MARK", path("mark"));
    askPort(freePort());
    launchAgent({"--listen", "udp:" + address(), "--module", "faulty", "--module-dir",
                 BROKEN_MODULE_DIR, "--snmp-config", path("snmp.conf"), "--persistent-dir",
                 path("persistent")});
    ASSERT_TRUE(agent().waitFor("serving 2 boards")) << agent().output();
    EXPECT_EQ(get("kvlBoardStatus.1"), "INTEGER: started(3)");
    write(path("mark"), "");
    EXPECT_TRUE(eventually([this] { return get("kvlBoardStatus.1") == "INTEGER: none(0)"; }));
    EXPECT_THAT(get("kvlBoardErrorMessage.1"), HasSubstr("does not answer: the bus is gone"));
    EXPECT_EQ(get("kvlBoardSerialNumber.1"), "STRING: S1");
    EXPECT_EQ(get("kvlBoardStatus.2"), "INTEGER: started(3)");
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 2 boards");
    std::filesystem::remove(path("mark"));
    EXPECT_TRUE(eventually([this] { return get("kvlBoardStatus.1") == "INTEGER: started(3)"; }));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
}

TEST_F(BadDayTest, FewDescriptorsAreEnoughForUdpWhateverTcpClientsDo) {
    auto words = command();
    words.insert(words.end(), {"--listen", "tcp:" + address()});
    auto const process = runBy("ulimit -n 40; exec \"$@\"", words);
    ASSERT_TRUE(process->waitFor("kvloamd: serving ")) << process->output();
    std::vector<std::unique_ptr<SnmpSocket>> idle;
    int const port = std::stoi(address().substr(address().find(':') + 1));
    for (int client = 0; client < 100; ++client)
        idle.push_back(std::make_unique<SnmpSocket>(port, true));
    expectService();
    sim({"stop", "1"});
    EXPECT_TRUE(eventually([this] { return get("kvlBoardStatus.1") == "INTEGER: stopped(4)"; }));
    process->signal(SIGTERM);
    EXPECT_EQ(process->wait(), 0) << process->output();
}

} // namespace
} // namespace kvloamd::e2e
