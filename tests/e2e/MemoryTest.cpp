// SPDX-License-Identifier: BSD-2-Clause
// What a board costs the agent in memory does not grow unnoticed.
#include <string>

#include "tests/e2e/AgentFixture.h"
#include "tests/support/AnonymousMemory.h"

namespace kvloamd::e2e {
namespace {

#ifndef KVLOAM_SANITIZED
/// Of a board with four lines, its simulated platform included, in kB. A fifth above what was
/// measured (bench/README.md).
constexpr long kMostOfABoard = 80;
#endif

class MemoryTest : public AgentFixture {
  protected:
    /// The memory of an agent that serves so many boards, in kB, without what processes share.
    long memoryWith(int boards) {
        Result const chassis =
            run({KVLSIM, "generate", "--boards", std::to_string(boards), "--lines", "4"});
        EXPECT_EQ(chassis.status, 0) << chassis.output;
        useChassis(chassis.output);
        startAgent();
        long const memory = anonymousMemory(std::to_string(agent().pid())) / 1024;
        EXPECT_GT(memory, 0);
        EXPECT_EQ(stopAgent(), 0);
        return memory;
    }
};

TEST_F(MemoryTest, BoardCostsLittleMemory) {
#ifdef KVLOAM_SANITIZED
    GTEST_SKIP() << "a sanitizer needs memory of its own for every allocation";
#else
    constexpr int kFew = 100;
    constexpr int kMany = 300;
    long const few = memoryWith(kFew);
    EXPECT_LE((memoryWith(kMany) - few) / (kMany - kFew), kMostOfABoard);
#endif
}

} // namespace
} // namespace kvloamd::e2e
