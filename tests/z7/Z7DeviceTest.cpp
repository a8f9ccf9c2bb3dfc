// SPDX-License-Identifier: BSD-2-Clause
// The devices of a Z7 board by kind, and the feature that lists them.
#include <string>
#include <typeinfo>
#include <vector>

#include <gtest/gtest.h>

#include "tests/support/Slots.h"
#include "z7/Z7ResourceFeature.h"

namespace {

/// A device that implements the common queries.
template <class Kind>
class Answering : public Kind {
  public:
    explicit Answering(char const* name) : Kind(name) {}
    int GetStatus() override { return -1; }
    int GetBoardIndex() override { return -1; }
    int GetDeviceNumber() override { return -1; }
    void setType(int type) { this->m_type = type; }
};

using PlainDevice = Answering<Z7Device>;

class VoiceDevice final : public Answering<Z7VoiceDevice> {
  public:
    using Answering::Answering;
    int GetCoderType() override { return -1; }
    int GetChannelState() override { return -1; }
    int GetGain() override { return -1; }
    int GetEchoCancellation() override { return -1; }
};

template <class Kind>
class TrunkDevice : public Answering<Kind> {
  public:
    using Answering<Kind>::Answering;
    int GetLineNumber() override { return -1; }
    int GetLineType() override { return -1; }
    int GetLineStatus() override { return -1; }
    int GetProtocolType() override { return -1; }
};

class ISDNDevice final : public TrunkDevice<Z7ISDNDevice> {
  public:
    using TrunkDevice::TrunkDevice;
    int GetBChannelCount() override { return -1; }
    int GetDChannelStatus() override { return -1; }
};

class StationDevice final : public Answering<Z7STNDevice> {
  public:
    using Answering::Answering;
    int GetTimeSlotCount() override { return -1; }
};

std::string nameOf(Z7Device& device) {
    return {device.GetName(), Z7Device::kNameSize};
}

/// `name` as a device keeps it.
std::string padded(std::string name) {
    name.resize(64, '\0');
    return name;
}

TEST(Z7DeviceTest, ShortNameIsFilledUpWithZeros) {
    PlainDevice device("DTI1");
    EXPECT_EQ(nameOf(device), padded("DTI1"));
    EXPECT_STREQ(device.GetName(), "DTI1");
}

TEST(Z7DeviceTest, NameIsCutTo64CharactersWithoutATerminator) {
    std::string const name = std::string(64, 'a') + std::string(6, 'b');
    PlainDevice device(name.c_str());
    EXPECT_EQ(nameOf(device), std::string(64, 'a'));
}

TEST(Z7DeviceTest, NameOf63CharactersIsTerminated) {
    PlainDevice device(std::string(63, 'a').c_str());
    EXPECT_EQ(nameOf(device), padded(std::string(63, 'a')));
}

TEST(Z7DeviceTest, ShorterNameLeavesNothingOfALongerOne) {
    PlainDevice device(std::string(64, 'a').c_str());
    device.SetName("dx");
    EXPECT_EQ(nameOf(device), padded("dx"));
    device.SetName("");
    EXPECT_EQ(nameOf(device), padded(""));
}

TEST(Z7DeviceTest, TypeIsMinusOneUntilTheConcreteDeviceSetsIt) {
    PlainDevice device("DTI1");
    EXPECT_EQ(device.GetType(), -1);
    device.setType(3);
    EXPECT_EQ(device.GetType(), 3);
}

/// Whether `device` has each of the identifiers of Object, device, voice, trunk, ISDN and station.
std::vector<bool> answersTo(Object const& device) {
    std::vector<bool> answers;
    for (KVL::IID const& id : {KVL::IID("6Object"), Z7Device::iid(), Z7VoiceDevice::iid(),
                               Z7TRKDevice::iid(), Z7ISDNDevice::iid(), Z7STNDevice::iid()})
        answers.push_back(device.interfaces()->is_element(id));
    return answers;
}

TEST(Z7DeviceTest, DeviceAnswersToTheIdentifiersOfItsKindAndItsBases) {
    using Answers = std::vector<bool>;
    EXPECT_EQ(answersTo(PlainDevice("x")), (Answers{1, 1, 0, 0, 0, 0}));
    EXPECT_EQ(answersTo(VoiceDevice("x")), (Answers{1, 1, 1, 0, 0, 0}));
    EXPECT_EQ(answersTo(TrunkDevice<Z7TRKDevice>("x")), (Answers{1, 1, 0, 1, 0, 0}));
    EXPECT_EQ(answersTo(ISDNDevice("x")), (Answers{1, 1, 0, 1, 1, 0}));
    EXPECT_EQ(answersTo(StationDevice("x")), (Answers{1, 1, 0, 0, 0, 1}));
}

TEST(Z7DeviceTest, IdentifiersAreTheTypeNames) {
    EXPECT_STREQ(Z7Device::iid().tostring(), typeid(Z7Device).name());
    EXPECT_STREQ(Z7VoiceDevice::iid().tostring(), typeid(Z7VoiceDevice).name());
    EXPECT_STREQ(Z7TRKDevice::iid().tostring(), typeid(Z7TRKDevice).name());
    EXPECT_STREQ(Z7ISDNDevice::iid().tostring(), typeid(Z7ISDNDevice).name());
    EXPECT_STREQ(Z7STNDevice::iid().tostring(), typeid(Z7STNDevice).name());
    EXPECT_STREQ(Z7ResourceFeature::iid().tostring(), typeid(Z7ResourceFeature).name());
}

TEST(Z7DeviceTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&Z7Device::GetStatus), 2);
    EXPECT_EQ(slotOf(&Z7Device::GetBoardIndex), 3);
    EXPECT_EQ(slotOf(&Z7Device::GetDeviceNumber), 4);

    EXPECT_EQ(slotOf(&Z7VoiceDevice::GetCoderType), 5);
    EXPECT_EQ(slotOf(&Z7VoiceDevice::GetChannelState), 6);
    EXPECT_EQ(slotOf(&Z7VoiceDevice::GetGain), 7);
    EXPECT_EQ(slotOf(&Z7VoiceDevice::GetEchoCancellation), 8);

    EXPECT_EQ(slotOf(&Z7TRKDevice::GetLineNumber), 5);
    EXPECT_EQ(slotOf(&Z7TRKDevice::GetLineType), 6);
    EXPECT_EQ(slotOf(&Z7TRKDevice::GetLineStatus), 7);
    EXPECT_EQ(slotOf(&Z7TRKDevice::GetProtocolType), 8);

    EXPECT_EQ(slotOf(&Z7ISDNDevice::GetBChannelCount), 9);
    EXPECT_EQ(slotOf(&Z7ISDNDevice::GetDChannelStatus), 10);

    EXPECT_EQ(slotOf(&Z7STNDevice::GetTimeSlotCount), 5);
}

using Device = ReferenceCounter<Z7Device>;

class Resources final : public Z7ResourceFeature {
  public:
    int GetNumberOfDevices() override { return static_cast<int>(m_devices.size()); }
    Device add(char const* name) { return m_devices.emplace_back(new PlainDevice(name)); }
};

class Z7ResourceFeatureTest : public testing::Test {
  protected:
    Resources* m_feature = new Resources;
    ReferenceCounter<Feature> m_handle{m_feature};
};

TEST_F(Z7ResourceFeatureTest, NewFeatureHasNoDevices) {
    EXPECT_EQ(m_feature->GetFirstDevice().get(), nullptr);
    EXPECT_EQ(m_feature->GetNextDevice(Device()).get(), nullptr);
}

TEST_F(Z7ResourceFeatureTest, DevicesAreWalkedInTheOrderOfTheirEntry) {
    Device const devices[] = {m_feature->add("a"), m_feature->add("b"), m_feature->add("c")};
    EXPECT_EQ(m_feature->GetFirstDevice().get(), devices[0].get());
    EXPECT_EQ(m_feature->GetNextDevice(devices[0]).get(), devices[1].get());
    EXPECT_EQ(m_feature->GetNextDevice(devices[1]).get(), devices[2].get());
    EXPECT_EQ(m_feature->GetNextDevice(devices[2]).get(), nullptr);
}

TEST_F(Z7ResourceFeatureTest, DeviceOfNoneOfTheFeatureHasNoSuccessor) {
    m_feature->add("a");
    m_feature->add("b");
    EXPECT_EQ(m_feature->GetNextDevice(Device(new PlainDevice("a"))).get(), nullptr);
    EXPECT_EQ(m_feature->GetNextDevice(Device()).get(), nullptr);
}

TEST_F(Z7ResourceFeatureTest, DeviceIsFoundByNoName) {
    m_feature->add("DTI1");
    char name[] = "DTI1";
    EXPECT_EQ(m_feature->GetDevice(name).get(), nullptr);
}

TEST_F(Z7ResourceFeatureTest, FeatureAnswersToItsIdentifier) {
    EXPECT_TRUE(m_feature->interfaces()->is_element(Z7ResourceFeature::iid()));
}

TEST_F(Z7ResourceFeatureTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&Z7ResourceFeature::GetNumberOfDevices), 2);
}

} // namespace
