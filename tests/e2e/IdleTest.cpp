// SPDX-License-Identifier: BSD-2-Clause
// What an agent with four boards of four lines costs that nobody asks.
#include <sys/prctl.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <thread>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

/// It is 2: one for the tick of the lines, and a few for what else is due.
constexpr int kMostWakeupsPerSecond = 8;
/// In kilobytes, of memory that is not of files: what the code of libraries takes, the system
/// shares and can drop. It is 5 MB.
constexpr long kMostMemory = 10000;

class IdleTest : public AgentFixture {
  protected:
    IdleTest() {
        // Huge pages, where the system gives them to every program, would be counted whole.
        m_hadHugePages = prctl(PR_GET_THP_DISABLE, 0, 0, 0, 0) == 0;
        if (m_hadHugePages) prctl(PR_SET_THP_DISABLE, 1, 0, 0, 0);
    }
    ~IdleTest() override {
        if (m_hadHugePages) prctl(PR_SET_THP_DISABLE, 0, 0, 0, 0);
    }

    void SetUp() override {
#ifdef KVLOAM_SANITIZED
        GTEST_SKIP() << "a sanitizer has memory and a thread of its own";
#endif
        Result const chassis = run({KVLSIM, "generate", "--boards", "4", "--lines", "4"});
        ASSERT_EQ(chassis.status, 0) << chassis.output;
        useChassis(chassis.output);
        startAgent({"--http-socket", path("http")});
    }

    std::string process() {
        return "/proc/" + std::to_string(agent().pid());
    }

    /// The sum of the numbers after `key` in the file.
    static long numberIn(std::string const& file, std::string const& key) {
        std::ifstream lines(file);
        for (std::string line; std::getline(lines, line);)
            if (line.starts_with(key)) return std::stol(line.substr(key.size()));
        return 0;
    }
    /// How many times the agent's threads have waited for something, all together.
    long waits() {
        long count = 0;
        for (auto const& thread : std::filesystem::directory_iterator(process() + "/task"))
            count += numberIn(thread.path() / "status", "voluntary_ctxt_switches:");
        return count;
    }

  private:
    bool m_hadHugePages = false;
};

TEST_F(IdleTest, MemoryOfItsOwnIsSmall) {
    // It has read the boards, and made an answer.
    EXPECT_FALSE(walk().empty());
    long const memory = numberIn(process() + "/smaps_rollup", "Anonymous:");
    EXPECT_GT(memory, 0);
    EXPECT_LT(memory, kMostMemory);
}

// Processor time depends on the machine and on what else runs there; how often the agent wakes does
// not. A second that the machine is late about has fewer wake-ups.
TEST_F(IdleTest, AgentSeldomWakes) {
    using std::chrono::steady_clock;
    double rate = 0;
    // The start may not be over in the first windows.
    bool const sleeps = eventually([&] {
        long const before = waits();
        auto const began = steady_clock::now();
        std::this_thread::sleep_for(std::chrono::seconds(3));
        std::chrono::duration<double> const seconds = steady_clock::now() - began;
        rate = static_cast<double>(waits() - before) / seconds.count();
        return rate < kMostWakeupsPerSecond;
    });
    EXPECT_TRUE(sleeps) << rate << " times a second";
    EXPECT_GT(rate, 0);
}

} // namespace
} // namespace kvloamd::e2e
