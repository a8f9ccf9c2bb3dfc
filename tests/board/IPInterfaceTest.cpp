// SPDX-License-Identifier: BSD-2-Clause
// IP addresses, their configurations, and the interface that has one.
#include <cstdint>
#include <string>
#include <typeinfo>
#include <vector>

#include <gtest/gtest.h>

#include "board/IPInterface.h"
#include "tests/support/BareInterface.h"
#include "tests/support/Slots.h"

namespace {

using KVL::IPAddress;
using KVL::IPAddressConfig;
using Config = ReferenceCounter<IPAddressConfig>;
using Octets = std::vector<std::uint32_t>;

Octets octets(IPAddress const& address) {
    return {address.octet(0), address.octet(1), address.octet(2), address.octet(3)};
}

IPAddress parsed(std::string text) {
    return IPAddress(text.data());
}

int number(std::uint32_t bits) {
    return static_cast<int>(bits);
}

TEST(IPAddressTest, OctetsAreTheBytesOfTheNumberFromTheMostSignificantDown) {
    EXPECT_EQ(octets(IPAddress(number(0xC0A80001))), (Octets{192, 168, 0, 1}));
    EXPECT_EQ(octets(IPAddress(0x0A010203)), (Octets{10, 1, 2, 3}));
    EXPECT_EQ(octets(IPAddress(-1)), (Octets{255, 255, 255, 255}));
}

TEST(IPAddressTest, NumberCanBeAssigned) {
    IPAddress address(0x0A010203);
    address = number(0xFE000080);
    EXPECT_EQ(octets(address), (Octets{254, 0, 0, 128}));
}

TEST(IPAddressTest, TextIsDottedDecimal) {
    EXPECT_EQ(octets(parsed("192.168.0.1")), (Octets{192, 168, 0, 1}));
}

TEST(IPAddressTest, TextIsOnlyRead) {
    char text[] = "10.1.2.3";
    IPAddress const address(text);
    EXPECT_STREQ(text, "10.1.2.3");
    EXPECT_EQ(octets(address), (Octets{10, 1, 2, 3}));
}

TEST(IPAddressTest, MissingOctetsAreZero) {
    EXPECT_EQ(octets(parsed("10.1.2")), (Octets{10, 1, 2, 0}));
    EXPECT_EQ(octets(parsed("")), (Octets{0, 0, 0, 0}));
}

TEST(IPAddressTest, TextThatIsAssignedLeavesNothingOfTheOldAddress) {
    char text[] = "10.1.2";
    IPAddress address(number(0xC0A80009));
    address = text;
    EXPECT_EQ(octets(address), (Octets{10, 1, 2, 0}));
}

TEST(IPAddressTest, OctetsAreTakenAsTheyAreWritten) {
    EXPECT_EQ(octets(parsed("300.1.2.3")), (Octets{300, 1, 2, 3}));
}

TEST(IPAddressTest, WhatFollowsTheFourthOctetIsIgnored) {
    EXPECT_EQ(parsed("10.1.2.3.99"), parsed("10.1.2.3"));
}

TEST(IPAddressTest, FirstOctetThatDiffersDecidesTheOrder) {
    EXPECT_LT(parsed("10.0.0.1"), parsed("10.0.0.2"));
    EXPECT_FALSE(parsed("10.0.0.2") < parsed("10.0.0.1"));
    EXPECT_LT(parsed("9.255.255.255"), parsed("10.0.0.0"));
    EXPECT_LT(parsed("10.1.255.0"), parsed("10.2.0.255"));
    EXPECT_LT(parsed("127.0.0.1"), parsed("128.0.0.0"));
}

TEST(IPAddressTest, AddressIsEqualToItselfAndNotLess) {
    EXPECT_FALSE(parsed("10.0.0.1") < parsed("10.0.0.1"));
    EXPECT_EQ(parsed("10.0.0.1"), IPAddress(0x0A000001));
    EXPECT_NE(parsed("10.0.0.1"), parsed("10.0.0.2"));
}

TEST(IPAddressConfigTest, NewConfigurationIsZeroThroughout) {
    IPAddressConfig const config;
    for (auto const& address : {config.GetAddress(), config.GetMask(), config.GetBroadcast()})
        EXPECT_EQ(address, IPAddress(0));
}

TEST(IPAddressConfigTest, NumbersAreAddressMaskAndBroadcastAddress) {
    IPAddressConfig const config(0x0A010203, number(0xFFFFFF00), 0x0A0102FF);
    EXPECT_EQ(config.GetAddress(), parsed("10.1.2.3"));
    EXPECT_EQ(config.GetMask(), parsed("255.255.255.0"));
    EXPECT_EQ(config.GetBroadcast(), parsed("10.1.2.255"));
}

TEST(IPAddressConfigTest, TextGivesTheAddressAlone) {
    char text[] = "10.1.2.3";
    IPAddressConfig const config(text);
    EXPECT_EQ(config.GetAddress(), parsed("10.1.2.3"));
    EXPECT_EQ(config.GetMask(), IPAddress(0));
    EXPECT_EQ(config.GetBroadcast(), IPAddress(0));
}

class IPInterfaceTest : public testing::Test {
  protected:
    ReferenceCounter<KVL::IPInterface> m_interface{new BareInterface<KVL::IPInterface>};
};

TEST_F(IPInterfaceTest, OnlyConfigurationOfTheBaseIsALoopbackAddress) {
    Config const first = m_interface->GetFirstIPAddressConfig();
    ASSERT_NE(first.get(), nullptr);
    EXPECT_EQ(first->GetAddress(), parsed("127.1.1.1"));
    EXPECT_EQ(m_interface->GetNextIPAddressConfig(first).get(), nullptr);
    EXPECT_EQ(m_interface->GetNextIPAddressConfig(Config()).get(), nullptr);
}

TEST_F(IPInterfaceTest, ConfigurationOfTheBaseIsMadeAnewAtEveryCall) {
    Config const first = m_interface->GetFirstIPAddressConfig();
    Config const again = m_interface->GetFirstIPAddressConfig();
    EXPECT_NE(first.get(), again.get());
    EXPECT_EQ(again->GetAddress(), first->GetAddress());
}

TEST_F(IPInterfaceTest, InterfaceAnswersToItsOwnAndTheInheritedIdentifier) {
    EXPECT_TRUE(m_interface->interfaces()->is_element(KVL::Interface::iid()));
    EXPECT_TRUE(m_interface->interfaces()->is_element(KVL::IPInterface::iid()));
    EXPECT_STREQ(KVL::IPInterface::iid().tostring(), typeid(KVL::IPInterface).name());
}

TEST_F(IPInterfaceTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&KVL::IPInterface::GetDescription), 2);
    EXPECT_EQ(slotOf(&KVL::IPInterface::GetOutErrors), 19);
    EXPECT_EQ(slotOf(&KVL::IPInterface::GetFirstIPAddressConfig), 20);
    EXPECT_EQ(slotOf(&KVL::IPInterface::GetNextIPAddressConfig), 21);
}

} // namespace
