// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Whereabouts.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

/// Boards 1 and 2, which are the entities 17 and 33; board 1 has a line, 1000, which is the port
/// 18, with a channel, 1001; board 2 has a channel, 1016.
class WhereaboutsTest : public ::testing::Test {
  protected:
    WhereaboutsTest() {
        for (std::uint32_t const index : {1U, 2U}) {
            BoardRow& board = m_snapshot.boards.emplace_back();
            board.boardIndex = index;
            board.serialNumber = "S" + std::to_string(index);
        }
        addInterface(1000, 1);
        addInterface(1001, 1);
        addInterface(1016, 2);
        PhysicalEntities physical;
        addEntity(physical, 1, 0, 0);
        addEntity(physical, 17, 1, 0);
        addEntity(physical, 18, 0, 1000);
        addEntity(physical, 33, 2, 0);
        m_snapshot.entities.physical = std::make_shared<PhysicalEntities>(physical);
        noteWhereabouts(m_snapshot);
    }
    void addInterface(std::uint32_t ifIndex, std::uint32_t boardIndex) {
        InterfaceRow& row = m_snapshot.interfaces.interfaces.emplace_back();
        row.ifIndex = ifIndex;
        row.boardIndex = boardIndex;
    }
    static void addEntity(PhysicalEntities& physical, std::uint32_t entity,
                          std::uint32_t boardIndex, std::uint32_t ifIndex) {
        PhysicalRow& row = physical.entities.emplace_back();
        row.entity = entity;
        row.boardIndex = boardIndex;
        row.ifIndex = ifIndex;
    }
    std::uint32_t entityOf(std::size_t interface) const {
        return m_snapshot.entities.ofInterfaces.at(interface);
    }

    Snapshot m_snapshot;
};

TEST_F(WhereaboutsTest, BoardKnowsItsEntity) {
    EXPECT_EQ(m_snapshot.entities.ofBoards.at(0), 17U);
    EXPECT_EQ(m_snapshot.entities.ofBoards.at(1), 33U);
}

TEST_F(WhereaboutsTest, InterfaceKnowsItsPortAndAChannelItsBoard) {
    EXPECT_EQ(entityOf(0), 18U);
    EXPECT_EQ(entityOf(1), 17U);
    EXPECT_EQ(entityOf(2), 33U);
}

TEST_F(WhereaboutsTest, WhatHasNoEntityHasNone) {
    m_snapshot.entities.physical = std::make_shared<PhysicalEntities>();
    noteWhereabouts(m_snapshot);
    EXPECT_EQ(m_snapshot.entities.ofBoards.at(0), 0U);
    EXPECT_EQ(entityOf(1), 0U);
}

} // namespace
} // namespace kvloamd
