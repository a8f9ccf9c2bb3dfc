// SPDX-License-Identifier: BSD-2-Clause
// Features by name, and network interfaces that support nothing.
#include <string>

#include <gtest/gtest.h>

#include "board/Ethernet.h"
#include "board/EthernetFeature.h"
#include "board/Feature.h"
#include "board/InterfaceFeature.h"
#include "core/ReferenceCounter.h"
#include "tests/support/BareInterface.h"
#include "tests/support/Slots.h"

namespace {

class FeatureTest : public testing::Test {
  protected:
    ReferenceCounter<Feature> m_feature{new Feature};
};

TEST_F(FeatureTest, NewFeatureHasAnEmptyName) {
    EXPECT_STREQ(m_feature->GetFeatureName(), "");
}

TEST_F(FeatureTest, NameReadsBack) {
    EXPECT_EQ(m_feature->SetFeatureName("lines"), 1);
    EXPECT_STREQ(m_feature->GetFeatureName(), "lines");
}

TEST_F(FeatureTest, ShorterNameReplacesALongerOne) {
    m_feature->SetFeatureName("resources");
    m_feature->SetFeatureName("dsp");
    EXPECT_STREQ(m_feature->GetFeatureName(), "dsp");
}

TEST_F(FeatureTest, LongNameIsCutTo256Characters) {
    std::string const name = std::string(256, 'a') + std::string(44, 'b');
    m_feature->SetFeatureName(name.c_str());
    EXPECT_EQ(m_feature->GetFeatureName(), std::string(256, 'a'));
}

TEST_F(FeatureTest, NameOf256CharactersIsKeptWhole) {
    std::string const name(256, 'x');
    m_feature->SetFeatureName(name.c_str());
    EXPECT_EQ(m_feature->GetFeatureName(), name);
}

TEST_F(FeatureTest, OwnNameMayBeSetAgain) {
    m_feature->SetFeatureName("ports");
    m_feature->SetFeatureName(m_feature->GetFeatureName());
    EXPECT_STREQ(m_feature->GetFeatureName(), "ports");
}

TEST_F(FeatureTest, FeatureCanBeLocked) {
    EXPECT_EQ(m_feature->lock(), 0);
    EXPECT_EQ(m_feature->unlock(), 0);
}

TEST(FeatureHelperTest, MinAndMaxPickByValue) {
    EXPECT_EQ(min(-3, 2), -3);
    EXPECT_EQ(min(2, -3), -3);
    EXPECT_EQ(max(-3, 2), 2);
    EXPECT_EQ(max(2, -3), 2);
}

/// An interface that calls the base for every query.
class BareEthernet final : public BareInterface<KVL::Ethernet> {
  public:
    int GetAlignmentErrors() override { return KVL::kNotSupported; }
    int GetFCSErrors() override { return KVL::kNotSupported; }
    int GetSingleCollisionFrames() override { return KVL::kNotSupported; }
    int GetMultipleCollisionFrames() override { return KVL::kNotSupported; }
    int GetSQETestErrors() override { return KVL::kNotSupported; }
    int GetDeferredTransmissions() override { return KVL::kNotSupported; }
    int GetLateCollisions() override { return KVL::kNotSupported; }
    int GetExcessiveCollisions() override { return KVL::kNotSupported; }
    int GetInternalMacTransmitErrors() override { return KVL::kNotSupported; }
    int GetCarrierSenseErrors() override { return KVL::kNotSupported; }
    int GetFrameTooLongs() override { return KVL::kNotSupported; }
    int GetInternalMacReceiveErrors() override { return KVL::kNotSupported; }
    int GetSymbolErrors() override { return KVL::kNotSupported; }
    int GetDuplexStatus() override { return KVL::kNotSupported; }
};

class InterfaceTest : public testing::Test {
  protected:
    ReferenceCounter<KVL::Interface> m_interface{new BareEthernet};
};

TEST_F(InterfaceTest, NumbersLeftToTheBaseAreNotSupported) {
    KVL::Interface& bare = *m_interface.get();
    for (int const answer :
         {bare.GetType(), bare.GetMTU(), bare.GetSpeed(), bare.GetAdminStatus(),
          bare.SetAdminStatus(1), bare.GetOperStatus(), bare.GetInOctets(), bare.GetInUcastPkts(),
          bare.GetInDiscards(), bare.GetInErrors(), bare.GetInUnknownProtos(), bare.GetOutOctets(),
          bare.GetOutUcastPkts(), bare.GetOutDiscards(), bare.GetOutErrors()})
        EXPECT_EQ(answer, -2);
}

TEST_F(InterfaceTest, QueriesLeftToTheBaseTouchNoArgument) {
    std::string description = "as it was";
    EXPECT_EQ(m_interface->GetDescription(description), -2);
    EXPECT_EQ(description, "as it was");

    char buffer[] = "old";
    int length = 3;
    EXPECT_EQ(m_interface->GetPhysAddress(buffer, length), -2);
    EXPECT_STREQ(buffer, "old");
    EXPECT_EQ(length, 3);

    int seconds = 11, microseconds = 22;
    EXPECT_EQ(m_interface->GetLastChange(seconds, microseconds), -2);
    EXPECT_EQ(seconds, 11);
    EXPECT_EQ(microseconds, 22);
}

TEST_F(InterfaceTest, EthernetAnswersToItsOwnAndTheInheritedIdentifier) {
    EXPECT_TRUE(m_interface->interfaces()->is_element(KVL::Interface::iid()));
    EXPECT_TRUE(m_interface->interfaces()->is_element(KVL::Ethernet::iid()));
    EXPECT_FALSE(m_interface->interfaces()->is_element(KVL::EthernetFeature::iid()));
}

TEST_F(InterfaceTest, InterfaceCanBeLocked) {
    EXPECT_EQ(m_interface->lock(), 0);
    EXPECT_EQ(m_interface->unlock(), 0);
}

TEST_F(InterfaceTest, IdentifiersAreTheTypeNames) {
    EXPECT_STREQ(KVL::Interface::iid().tostring(), "N3KVL9InterfaceE");
    EXPECT_STREQ(KVL::Ethernet::iid().tostring(), "N3KVL8EthernetE");
    EXPECT_STREQ(KVL::InterfaceFeature::iid().tostring(), "N3KVL16InterfaceFeatureE");
    EXPECT_STREQ(KVL::EthernetFeature::iid().tostring(), "N3KVL15EthernetFeatureE");
}

TEST_F(InterfaceTest, OperationsKeepTheirSlots) {
    using KVL::Ethernet;
    using KVL::Interface;
    int slot = 2;
    EXPECT_EQ(slotOf(&Interface::GetDescription), slot++);
    EXPECT_EQ(slotOf(&Interface::GetType), slot++);
    EXPECT_EQ(slotOf(&Interface::GetMTU), slot++);
    EXPECT_EQ(slotOf(&Interface::GetSpeed), slot++);
    EXPECT_EQ(slotOf(&Interface::GetPhysAddress), slot++);
    EXPECT_EQ(slotOf(&Interface::GetAdminStatus), slot++);
    EXPECT_EQ(slotOf(&Interface::SetAdminStatus), slot++);
    EXPECT_EQ(slotOf(&Interface::GetOperStatus), slot++);
    EXPECT_EQ(slotOf(&Interface::GetLastChange), slot++);
    EXPECT_EQ(slotOf(&Interface::GetInOctets), slot++);
    EXPECT_EQ(slotOf(&Interface::GetInUcastPkts), slot++);
    EXPECT_EQ(slotOf(&Interface::GetInDiscards), slot++);
    EXPECT_EQ(slotOf(&Interface::GetInErrors), slot++);
    EXPECT_EQ(slotOf(&Interface::GetInUnknownProtos), slot++);
    EXPECT_EQ(slotOf(&Interface::GetOutOctets), slot++);
    EXPECT_EQ(slotOf(&Interface::GetOutUcastPkts), slot++);
    EXPECT_EQ(slotOf(&Interface::GetOutDiscards), slot++);
    EXPECT_EQ(slotOf(&Interface::GetOutErrors), slot++);
    EXPECT_EQ(slotOf(&Ethernet::GetAlignmentErrors), slot++);
    EXPECT_EQ(slotOf(&Ethernet::GetDuplexStatus), slot + 12);
}

TEST_F(InterfaceTest, FeatureOperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&KVL::InterfaceFeature::GetFirstInterface), 2);
    EXPECT_EQ(slotOf(&KVL::InterfaceFeature::GetNextInterface), 3);
    EXPECT_EQ(slotOf(&KVL::EthernetFeature::GetFirstEthernet), 2);
    EXPECT_EQ(slotOf(&KVL::EthernetFeature::GetNextEthernet), 3);
}

} // namespace
