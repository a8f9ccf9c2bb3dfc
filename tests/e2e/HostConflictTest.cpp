// SPDX-License-Identifier: BSD-2-Clause
// Interfaces of the host that have the numbers of ours, beside snmpd.
#include <sched.h>

#include <gmock/gmock.h>

#include "tests/e2e/MasterFixture.h"
#include "tests/e2e/Namespaces.h"

namespace kvloamd::e2e {
namespace {

class HostConflictTest : public MasterFixture {
  protected:
    /// Gives the test a network of its own; false where the system forbids it.
    bool makeNetwork() {
        return enterNamespaces(CLONE_NEWNET) &&
               run({"ip", "link", "set", "lo", "up"}).status == 0 && addInterface("probe0", 500);
    }
    bool addInterface(std::string const& name, int index) const {
        return run({"ip", "link", "add", "name", name, "index", std::to_string(index), "type",
                    "bridge"})
                   .status == 0;
    }
    void start() {
        startMaster();
        startSubagent();
        ASSERT_TRUE(isConnected()) << agent().output();
    }
};

TEST_F(HostConflictTest, LaterInterfaceWithOurNumberIsLoggedAndCounted) {
    if (!makeNetwork()) GTEST_SKIP() << "no network interface can be made here";
    start();
    EXPECT_EQ(get("kvlInterfaceConflicts.0"), "Gauge32: 0 interfaces");
    ASSERT_TRUE(addInterface("late0", 1003));
    // Requests keep the snapshot, and with it the check, young.
    EXPECT_TRUE(
        eventually([this] { return get("kvlInterfaceConflicts.0") == "Gauge32: 1 interfaces"; }));
    EXPECT_TRUE(agent().waitFor("kvloamd: interface late0 of the host has ifIndex 1003"))
        << agent().output();
    ASSERT_EQ(run({"ip", "link", "delete", "late0"}).status, 0);
    EXPECT_TRUE(
        eventually([this] { return get("kvlInterfaceConflicts.0") == "Gauge32: 0 interfaces"; }));
    EXPECT_EQ(stopAgent(), 0);
}

TEST_F(HostConflictTest, NumbersThatTheHostHasReachedAreSkipped) {
    if (!makeNetwork()) GTEST_SKIP() << "no network interface can be made here";
    ASSERT_TRUE(addInterface("early0", 1500));
    start();
    EXPECT_EQ(get("kvlInterfaceConflicts.0"), "Gauge32: 0 interfaces");
    auto const lines = walk("1.3.6.1.2.1.10.18.6.1.1");
    ASSERT_FALSE(lines.empty());
    EXPECT_GT(lines.front().name.back(), 1500U);
    EXPECT_EQ(stopAgent(), 0);
}

} // namespace
} // namespace kvloamd::e2e
