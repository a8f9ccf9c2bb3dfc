// SPDX-License-Identifier: BSD-2-Clause
// The reference factory and the module's entry point, loaded as an agent loads it.
#include <dlfcn.h>

#include <cstdlib>

#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "Settings.h"
#include "board/BoardManager.h"
#include "board/BoardModule.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/SimulatedPlatform.h"

namespace {

class Z7SimBoardFactoryTest : public testing::Test {
  protected:
    OpenFactory* m_factory = new OpenFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
};

TEST_F(Z7SimBoardFactoryTest, AllBoardsAreFoundInThePlatformsOrder) {
    sim::load({sim::board(9, "A"), sim::board(3, "B")});
    EXPECT_EQ(m_factory->GetBoardIdentifiers(), (std::vector<long>{9, 3}));
}

TEST_F(Z7SimBoardFactoryTest, EmptyChassisHasNoBoards) {
    sim::load({});
    EXPECT_TRUE(m_factory->GetBoardIdentifiers().empty());
}

TEST_F(Z7SimBoardFactoryTest, MoreBoardsAreFoundThanOneSmallSearchAnswers) {
    for (int const count : {100, 101, 255, 256, 257, 1500}) {
        sim::loadMany(count);
        std::vector<long> const boards = m_factory->GetBoardIdentifiers();
        ASSERT_EQ(boards.size(), static_cast<std::size_t>(count));
        EXPECT_EQ(boards.back(), count);
    }
}

TEST_F(Z7SimBoardFactoryTest, LargeChassisIsEnteredWhole) {
    sim::loadMany(600);
    ReferenceCounter<BoardManager> const manager(new BoardManager);
    m_factory->SetPingInterval(0);
    manager->Attach(m_handle);
    EXPECT_EQ(manager->GetNumberOfBoards(), 600);
    EXPECT_EQ(manager->GetBoardByIndex(600)->GetStatus(), BoardStatusStarted);
}

TEST_F(Z7SimBoardFactoryTest, ThereIsNothingToRefresh) {
    EXPECT_EQ(m_factory->RefreshBoardData(), 0);
}

TEST(PingIntervalTest, IntervalIsSixtySecondsUnlessSet) {
    EXPECT_EQ(readPingInterval(nullptr), 60);
}

TEST(PingIntervalTest, WholeSecondsAreTaken) {
    EXPECT_EQ(readPingInterval("1"), 1);
    EXPECT_EQ(readPingInterval("3600"), 3600);
    EXPECT_EQ(readPingInterval("0"), 0);
}

TEST(PingIntervalTest, AnythingElseIsReportedAndLeavesTheDefault) {
    for (std::string const text : {"", "ten", "1.5", "-1", "5s", " 5", "99999999999"}) {
        testing::internal::CaptureStderr();
        EXPECT_EQ(readPingInterval(text.c_str()), 60) << text;
        EXPECT_EQ(testing::internal::GetCapturedStderr(),
                  "z7sim: Z7SIM_PING_INTERVAL is \"" + text +
                      "\"; write a number of whole seconds, 0 for no pings. Boards are pinged "
                      "every 60 seconds.\n");
    }
}

TEST(FailureTimesTest, DefectsBecomeFailuresAfterTwoSecondsAndEndAfterTenUnlessSet) {
    FailureTimes const times = readFailureTimes(nullptr, nullptr);
    EXPECT_EQ(times.declaration, 2);
    EXPECT_EQ(times.clearing, 10);
}

TEST(FailureTimesTest, TimesWithinTheStandardsRangesAreTaken) {
    EXPECT_EQ(readFailureTimes("9", nullptr).declaration, 9);
    EXPECT_EQ(readFailureTimes(nullptr, "0").clearing, 0);
    EXPECT_EQ(readFailureTimes(nullptr, "19").clearing, 19);
}

TEST(FailureTimesTest, AnythingElseIsReportedAndLeavesTheDefault) {
    for (std::string const text : {"", "two", "1", "10", "-2", "2s"}) {
        testing::internal::CaptureStderr();
        EXPECT_EQ(readFailureTimes(text.c_str(), nullptr).declaration, 2) << text;
        EXPECT_EQ(testing::internal::GetCapturedStderr(),
                  "z7sim: Z7SIM_FAILURE_DECLARATION is \"" + text +
                      "\"; write a whole number of seconds from 2 to 9. Defects become failures "
                      "after 2 seconds.\n");
    }
    testing::internal::CaptureStderr();
    EXPECT_EQ(readFailureTimes(nullptr, "20").clearing, 10);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "z7sim: Z7SIM_FAILURE_CLEARING is \"20\"; write a whole number of seconds from 0 to "
              "19. Failures end after 10 seconds.\n");
}

/// The module as it is installed.
class Z7SimModuleTest : public testing::Test {
  protected:
    Z7SimModuleTest() {
        void* const module = dlopen(Z7SIM_MODULE, RTLD_NOW | RTLD_LOCAL);
        if (module == nullptr) {
            ADD_FAILURE() << dlerror();
            return;
        }
        m_create =
            reinterpret_cast<KVLCreateBoardFactory*>(dlsym(module, KVL_BOARD_MODULE_ENTRY_POINT));
    }
    ~Z7SimModuleTest() override { unsetenv(kPingIntervalVariable); }

    /// A factory of the module with this ping interval, attached.
    ReferenceCounter<BoardFactory> attach(char const* interval) {
        setenv(kPingIntervalVariable, interval, 1);
        ReferenceCounter<BoardFactory> factory(m_create(KVL_BOARD_MODULE_ABI_VERSION));
        m_manager->Attach(factory);
        return factory;
    }

    KVLCreateBoardFactory* m_create = nullptr;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
};

TEST_F(Z7SimModuleTest, FactoryOfTheModuleEntersItsBoards) {
    ASSERT_NE(m_create, nullptr);
    sim::load({sim::board(1, "A", "NAME: NX5-T1"), sim::board(2, "B", "NAME: QUILLON-E1")});
    attach("0");
    ASSERT_EQ(m_manager->GetNumberOfBoards(), 2);
    char name[256];
    m_manager->GetBoardByIndex(2)->GetName(name);
    EXPECT_STREQ(name, "QUILLON-E1");
}

TEST_F(Z7SimModuleTest, UnknownVersionIsRefused) {
    ASSERT_NE(m_create, nullptr);
    EXPECT_EQ(m_create(KVL_BOARD_MODULE_ABI_VERSION + 1), nullptr);
    EXPECT_EQ(m_create(0), nullptr);
}

TEST_F(Z7SimModuleTest, PingIntervalComesFromTheEnvironment) {
    ASSERT_NE(m_create, nullptr);
    sim::load({});
    auto const running = [](ReferenceCounter<BoardFactory> const& factory) {
        return dynamic_cast<KVLThread*>(factory.get())->GetThreadState() == KVLThreadRunning;
    };
    EXPECT_FALSE(running(attach("0")));
    EXPECT_TRUE(running(attach("3600")));
}

} // namespace
