// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/Visible.h"

#include <gtest/gtest.h>

#include "agent/objects/StandardObjects.h"

namespace kvloamd {
namespace {

Oid const kIfDescr{2, 2, 1, 2};

class VisibleTest : public ::testing::Test {
  protected:
    void haveInterfaces(std::uint32_t count) {
        m_snapshot.interfaces.interfaces.clear();
        for (std::uint32_t index = 1; index <= count; ++index)
            m_snapshot.interfaces.interfaces.emplace_back().ifIndex = index;
    }
    /// The first visible name from the beginning, if only what is below `shown` is visible.
    Oid firstBelow(Oid const& shown) {
        m_checks = 0;
        View const view{[&](Instance const& instance) {
                            ++m_checks;
                            return startsWith(instance.name, shown);
                        },
                        [&](OidView subtree) {
                            ++m_checks;
                            return !startsWith(shown, subtree) && !startsWith(subtree, shown);
                        }};
        Instance found;
        bool const any = nextVisible(
            m_tree, {m_snapshot, m_counters}, {2}, true, [](OidView) { return false; }, view,
            found);
        return any ? found.name : Oid{};
    }

    std::vector<Table const*> const m_tables = standardTables();
    ObjectTree const m_tree{standardScalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    int m_checks = 0;
};

TEST_F(VisibleTest, HiddenCellsCostNoMoreWhenThereAreMore) {
    haveInterfaces(100);
    EXPECT_EQ(firstBelow(kIfDescr), joined(kIfDescr, Oid{1}));
    int const checks = m_checks;
    haveInterfaces(100000);
    EXPECT_EQ(firstBelow(kIfDescr), joined(kIfDescr, Oid{1}));
    EXPECT_EQ(m_checks, checks);
    EXPECT_LT(checks, 50);
}

TEST_F(VisibleTest, VisibleInstanceIsFoundInAHiddenColumn) {
    haveInterfaces(3);
    EXPECT_EQ(firstBelow(joined(kIfDescr, Oid{2})), joined(kIfDescr, Oid{2}));
}

TEST_F(VisibleTest, NothingIsFoundWhereAllIsHidden) {
    haveInterfaces(1000);
    EXPECT_EQ(firstBelow({9}), Oid{});
    EXPECT_LT(m_checks, 50);
}

TEST_F(VisibleTest, SearchEndsWhereItIsToldTo) {
    haveInterfaces(1);
    View const all{[](Instance const&) { return true; }, [](OidView) { return false; }};
    Instance found;
    EXPECT_FALSE(nextVisible(
        m_tree, {m_snapshot, m_counters}, {2, 2}, true, [](OidView) { return true; }, all, found));
}

} // namespace
} // namespace kvloamd
