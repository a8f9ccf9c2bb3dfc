// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceNames.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

InterfaceRow completed(IndexKind kind, std::string const& name, std::string key) {
    InterfaceRow row;
    row.name = name;
    completeName(row, {kind, std::move(key)}, "A");
    return row;
}

TEST(InterfaceNamesTest, InterfaceWithoutANameIsCalledAfterItsKind) {
    EXPECT_EQ(completed(IndexKind::Ethernet, "", "1").name, "eth1@A");
    EXPECT_EQ(completed(IndexKind::Ip, "", "2").name, "ip2@A");
    EXPECT_EQ(completed(IndexKind::Other, "", "3").name, "if3@A");
    EXPECT_EQ(completed(IndexKind::Ethernet, "", "1").description,
              "Ethernet interface 1 of board A");
    EXPECT_EQ(completed(IndexKind::Line, "", "").name, "line@A");
}

TEST(InterfaceNamesTest, SecondOfANameOnABoardIsNumbered) {
    EXPECT_EQ(completed(IndexKind::Line, "trunk", "trunk#2").name, "trunk#2");
    EXPECT_EQ(completed(IndexKind::Line, "trunk", "trunk").name, "trunk");
}

} // namespace
} // namespace kvloamd
