// SPDX-License-Identifier: BSD-2-Clause
// The reference factory against searches that fail or never end. This program has a device mapper
// client of its own in the place of the platform's.
#include <algorithm>
#include <functional>
#include <vector>

#include <gtest/gtest.h>

#include "tests/modules/z7sim/OpenFactory.h"

namespace {

/// Finds boards as the test says; knows nothing of them.
class SearchedClient final : public DeviceMapperClient {
  public:
    int FindObjects(long parent, int /*count*/, DMAttribute* /*criteria*/, int* found,
                    long* auids) override {
        lastParent = parent;
        capacities.push_back(*found);
        return onFind(found, auids);
    }
    int Reserved3() override { return 1; }
    int GetRootObject(long* auid) override {
        *auid = 4711;
        return rootResult;
    }
    int FindObjectByName(char* /*name*/, long* /*auid*/) override { return 1; }
    int GetAttributes(long /*auid*/, int /*count*/, DMAttribute* /*requests*/) override {
        return 1;
    }

    int rootResult = 0;
    long lastParent = 0;
    std::vector<int> capacities;
    std::function<int(int*, long*)> onFind;
};

SearchedClient& client() {
    static SearchedClient only;
    return only;
}

class UnansweringPlatformTest : public testing::Test {
  protected:
    UnansweringPlatformTest() { client() = SearchedClient(); }
    static void find(std::vector<long> const& boards) {
        client().onFind = [boards](int* found, long* auids) {
            std::copy(boards.begin(), boards.end(), auids);
            *found = static_cast<int>(boards.size());
            return 0;
        };
    }
    static void failSearches() {
        client().onFind = [](int* /*found*/, long* /*auids*/) { return 1; };
    }
    std::vector<long> boards() { return m_factory->GetBoardIdentifiers(); }

    OpenFactory* m_factory = new OpenFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
};

TEST_F(UnansweringPlatformTest, BoardsAreSearchedUnderTheRoot) {
    find({3});
    boards();
    EXPECT_EQ(client().lastParent, 4711);
}

TEST_F(UnansweringPlatformTest, FailedSearchDoesNotMakeTheBoardsGo) {
    find({3, 5});
    EXPECT_EQ(boards(), (std::vector<long>{3, 5}));
    failSearches();
    EXPECT_EQ(boards(), (std::vector<long>{3, 5}));
    find({5});
    EXPECT_EQ(boards(), (std::vector<long>{5}));
}

TEST_F(UnansweringPlatformTest, MissingRootDoesNotMakeTheBoardsGo) {
    find({3, 5});
    boards();
    client().rootResult = 1;
    find({});
    EXPECT_EQ(boards(), (std::vector<long>{3, 5}));
}

TEST_F(UnansweringPlatformTest, SearchThatNeverAnsweredFindsNoBoards) {
    failSearches();
    EXPECT_TRUE(boards().empty());
}

TEST_F(UnansweringPlatformTest, SearchThatFailsOnTheWayKeepsTheFormerBoards) {
    find({3, 5});
    boards();
    client().onFind = [](int* found, long* /*auids*/) {
        return *found == client().capacities.front() ? 0 : 1;
    };
    client().capacities.clear();
    EXPECT_EQ(boards(), (std::vector<long>{3, 5}));
    EXPECT_EQ(client().capacities.size(), 2U);
}

TEST_F(UnansweringPlatformTest, FullAnswersMakeTheSearchGrowUpToALimit) {
    client().onFind = [](int* /*found*/, long* /*auids*/) { return 0; }; // always full
    EXPECT_EQ(boards().size(), 1U << 20);
    for (std::size_t i = 1; i < client().capacities.size(); ++i)
        EXPECT_EQ(client().capacities[i], 2 * client().capacities[i - 1]);
}

TEST_F(UnansweringPlatformTest, NegativeCountIsNoBoards) {
    client().onFind = [](int* found, long* /*auids*/) {
        *found = -1;
        return 0;
    };
    EXPECT_TRUE(boards().empty());
}

} // namespace

DeviceMapperClient* dm_getDeviceMapperClient() {
    return &client();
}
