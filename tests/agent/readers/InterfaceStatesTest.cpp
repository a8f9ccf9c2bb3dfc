// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceStates.h"

#include <optional>

#include <gmock/gmock.h>

#include "agent/rows/StandardNumbers.h"

namespace kvloamd {
namespace {

class InterfaceStatesTest : public ::testing::Test {
  protected:
    /// Enters an interface; returns its number.
    std::uint32_t add(std::optional<int> operStatus, std::optional<int> type = std::nullopt) {
        InterfaceRow row;
        row.ifIndex = static_cast<std::uint32_t>(m_rows.interfaces.size() + 1);
        row.operStatus = operStatus;
        row.type = type;
        m_rows.interfaces.push_back(row);
        return row.ifIndex;
    }
    void stack(std::uint32_t higher, std::uint32_t lower) {
        m_rows.stack.push_back({higher, lower});
    }
    InterfaceRow const& row(std::uint32_t number) { return m_rows.interfaces[number - 1]; }
    /// The state of an interface that stands on others of these states.
    std::optional<int> stateOn(std::optional<int> own, std::vector<int> const& lower) {
        m_rows = {};
        std::uint32_t const higher = add(own);
        for (int const state : lower)
            stack(higher, add(state));
        completeStates(m_rows);
        return row(higher).operStatus;
    }

    BoardInterfaceRows m_rows;
};

TEST_F(InterfaceStatesTest, WhatIsNotKnownIsWantedUpAndUnknown) {
    std::uint32_t const number = add(std::nullopt);
    completeStates(m_rows);
    EXPECT_EQ(row(number).adminStatus, kUp);
    EXPECT_EQ(row(number).operStatus, kUnknownStatus);
}

TEST_F(InterfaceStatesTest, InterfaceOnNothingThatWorksIsLowerLayerDown) {
    for (int const own : {kUp, kDown, kDormant, kTesting, kUnknownStatus})
        for (int const lower : {kDown, kTesting, kNotPresent, kLowerLayerDown})
            EXPECT_EQ(stateOn(own, {lower}), kLowerLayerDown) << own << " " << lower;
    EXPECT_EQ(stateOn(std::nullopt, {kDown, kNotPresent}), kLowerLayerDown);
}

TEST_F(InterfaceStatesTest, InterfaceOnOneThatMayWorkKeepsItsState) {
    for (int const own : {kUp, kDown, kDormant})
        for (int const lower : {kUp, kDormant, kUnknownStatus})
            EXPECT_EQ(stateOn(own, {lower}), own) << own << " " << lower;
    EXPECT_EQ(stateOn(kUp, {kDown, kUp}), kUp);
}

TEST_F(InterfaceStatesTest, InterfaceThatIsNotPresentOrTakenDownStaysSo) {
    EXPECT_EQ(stateOn(kNotPresent, {kDown}), kNotPresent);
    m_rows = {};
    std::uint32_t const higher = add(kDown);
    m_rows.interfaces[0].adminStatus = kDown;
    stack(higher, add(kDown));
    completeStates(m_rows);
    EXPECT_EQ(row(higher).operStatus, kDown);
}

TEST_F(InterfaceStatesTest, StateReachesTheTopOfTheStackInAnyOrder) {
    std::uint32_t const top = add(kUp);
    std::uint32_t const middle = add(kUp);
    std::uint32_t const bottom = add(kDown);
    stack(top, middle);
    stack(middle, bottom);
    completeStates(m_rows);
    EXPECT_EQ(row(middle).operStatus, kLowerLayerDown);
    EXPECT_EQ(row(top).operStatus, kLowerLayerDown);
}

TEST_F(InterfaceStatesTest, InterfacesInARingAreSurvived) {
    std::uint32_t const one = add(kUp);
    std::uint32_t const other = add(kUp);
    stack(one, other);
    stack(other, one);
    stack(one, one);
    stack(one, 99);
    completeStates(m_rows);
    EXPECT_EQ(row(one).operStatus, kUp);
}

TEST_F(InterfaceStatesTest, LinksAreToldOfUnlessTheyStandOnOthersOrAreDs0) {
    std::uint32_t const line = add(kUp, 18);
    std::uint32_t const signalling = add(kUp, kTypeIsdn);
    std::uint32_t const unplaced = add(kUp, kTypeDs0);
    stack(signalling, line);
    completeStates(m_rows);
    EXPECT_EQ(row(line).linkUpDownTraps, kEnabled);
    EXPECT_EQ(row(signalling).linkUpDownTraps, kDisabled);
    EXPECT_EQ(row(unplaced).linkUpDownTraps, kDisabled);
}

} // namespace
} // namespace kvloamd
