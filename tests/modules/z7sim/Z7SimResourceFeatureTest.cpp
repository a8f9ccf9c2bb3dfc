// SPDX-License-Identifier: BSD-2-Clause
// The devices of the reference board, by kind.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "board/DS1LineFeature.h"
#include "board/ISDNChannel.h"
#include "tests/modules/z7sim/PluggedBoard.h"
#include "z7/Z7ResourceFeature.h"

namespace {

class Z7SimResourceFeatureTest : public PluggedBoard {
  protected:
    ReferenceCounter<Z7ResourceFeature> resources() { return feature<Z7ResourceFeature>(); }
    /// The first device of that kind and name, as a caller finds it.
    template <class Kind>
    ReferenceCounter<Kind> find(std::string const& name) {
        auto const feature = resources();
        for (auto device = feature->GetFirstDevice(); device.get() != nullptr;
             device = feature->GetNextDevice(device))
            if (device->interfaces()->is_element(Kind::iid()) && device->GetName() == name)
                return {static_cast<Kind*>(device.get())};
        return {};
    }
    /// "name number" of every device of a kind.
    template <class Kind>
    std::vector<std::string> numbered() {
        std::vector<std::string> devices;
        auto const feature = resources();
        for (auto device = feature->GetFirstDevice(); device.get() != nullptr;
             device = feature->GetNextDevice(device))
            if (device->interfaces()->is_element(Kind::iid()))
                devices.push_back(std::string(device->GetName()) + " " +
                                  std::to_string(device->GetDeviceNumber()));
        return devices;
    }
    static std::string named(int type, std::string const& name, std::string const& attributes = "",
                             std::string const& rest = "") {
        static int s_handle = 100;
        return device(++s_handle, type,
                      "NAME: " + name + (attributes.empty() ? "" : ", " + attributes), rest);
    }
};

using Names = std::vector<std::string>;

TEST_F(Z7SimResourceFeatureTest, BoardWithoutDevicesOfAKindHasNoFeature) {
    plugIn("", named(518, "other") + named(520, "another"));
    EXPECT_EQ(resources().get(), nullptr);
}

TEST_F(Z7SimResourceFeatureTest, FeatureIsCalledResourcesAndCountsItsDevices) {
    plugIn("", named(501, "t") + named(518, "other") + named(503, "v"));
    EXPECT_STREQ(resources()->GetFeatureName(), "Resources");
    EXPECT_EQ(resources()->GetNumberOfDevices(), 2);
}

TEST_F(Z7SimResourceFeatureTest, EveryTypeIsOfItsKindAndNumberedWithinIt) {
    plugIn("", named(527, "s3") + named(525, "s2") + named(521, "s1") + named(511, "v4") +
                   named(509, "v3") + named(507, "v2") + named(503, "v1") + named(505, "t2") +
                   named(501, "t1") + named(516, "i2") + named(514, "i1"));
    EXPECT_EQ(resources()->GetNumberOfDevices(), 11);
    EXPECT_EQ(numbered<Z7VoiceDevice>(), (Names{"v1 1", "v2 2", "v3 3", "v4 4"}));
    EXPECT_EQ(numbered<Z7ISDNDevice>(), (Names{"i1 1", "i2 2"}));
    EXPECT_EQ(numbered<Z7TRKDevice>(), (Names{"t1 1", "t2 2", "i1 1", "i2 2"}))
        << "an ISDN trunk is a trunk as well";
    EXPECT_EQ(numbered<Z7STNDevice>(), (Names{"s1 1", "s2 2", "s3 3"}));
}

TEST_F(Z7SimResourceFeatureTest, DeviceAnswersWhatAllDevicesAnswer) {
    plugIn("", named(507, "conference"));
    auto const device = resources()->GetFirstDevice();
    EXPECT_EQ(device->GetStatus(), 1);
    EXPECT_EQ(device->GetBoardIndex(), 5);
    EXPECT_EQ(device->GetDeviceNumber(), 1);
    EXPECT_EQ(device->GetType(), 507);
    EXPECT_STREQ(device->GetName(), "conference");
}

TEST_F(Z7SimResourceFeatureTest, VoiceDeviceAnswersItsAttributes) {
    plugIn("", named(503, "voice",
                     "CODER_TYPE: 8, CHANNEL_STATE: 2, GAIN: {short: -3}, ECHO_CANCELLATION: 1"));
    auto const voice = find<Z7VoiceDevice>("voice");
    EXPECT_EQ(voice->GetCoderType(), 8);
    EXPECT_EQ(voice->GetChannelState(), 2);
    EXPECT_EQ(voice->GetGain(), -3);
    EXPECT_EQ(voice->GetEchoCancellation(), 1);
}

TEST_F(Z7SimResourceFeatureTest, VoiceDeviceWithoutAttributesAnswersMinusOne) {
    plugIn("", named(503, "voice"));
    auto const voice = find<Z7VoiceDevice>("voice");
    EXPECT_EQ(voice->GetCoderType(), -1);
    EXPECT_EQ(voice->GetChannelState(), -1);
    EXPECT_EQ(voice->GetGain(), -1);
    EXPECT_EQ(voice->GetEchoCancellation(), -1);
}

TEST_F(Z7SimResourceFeatureTest, TrunkAnswersItsAttributes) {
    plugIn("", named(501, "trunk", "Protocol_Type_0: 6", "line: {type: d4}"));
    auto const trunk = find<Z7TRKDevice>("trunk");
    EXPECT_EQ(trunk->GetLineNumber(), 1);
    EXPECT_EQ(trunk->GetLineType(), 3);
    EXPECT_EQ(trunk->GetProtocolType(), 6);
}

TEST_F(Z7SimResourceFeatureTest, TrunkWithoutAttributesAnswersMinusOne) {
    plugIn("", named(501, "trunk"));
    auto const trunk = find<Z7TRKDevice>("trunk");
    EXPECT_EQ(trunk->GetLineType(), -1);
    EXPECT_EQ(trunk->GetLineStatus(), -1);
    EXPECT_EQ(trunk->GetProtocolType(), -1);
}

TEST_F(Z7SimResourceFeatureTest, TrunkTellsTheStatusOfItsLine) {
    plugIn("", named(501, "other", "", "line: {type: esf}") +
                   named(501, "trunk", "", "line: {type: esf, alarms: [los]}"));
    auto const lines = feature<DS1LineFeature>();
    auto const line = lines->GetNextDevice(lines->GetFirstDevice());
    auto const trunk = find<Z7TRKDevice>("trunk");
    EXPECT_EQ(trunk->GetLineStatus(), line->GetLineStatus());
    EXPECT_NE(trunk->GetLineStatus(), find<Z7TRKDevice>("other")->GetLineStatus());
}

TEST_F(Z7SimResourceFeatureTest, TrunkHasTheNumberThatItsLineHas) {
    plugIn("", named(516, "i2", "", "line: {type: e1}") + named(514, "i1") + named(503, "v") +
                   named(505, "t2", "", "line: {type: e1}") +
                   named(501, "t1", "LINE_NUMBER: 7", "line: {type: esf}"));
    auto const lines = feature<DS1LineFeature>();
    for (char const* const name : {"t1", "t2", "i2"})
        EXPECT_EQ(find<Z7TRKDevice>(name)->GetLineNumber(), lines->Find(name)->GetLineIndex())
            << name;
    EXPECT_EQ(find<Z7TRKDevice>("t1")->GetLineNumber(), 7);
    EXPECT_EQ(find<Z7TRKDevice>("i2")->GetLineNumber(), 3);
    EXPECT_EQ(find<Z7TRKDevice>("i1")->GetLineNumber(), -1) << "it has no line";
}

TEST_F(Z7SimResourceFeatureTest, ISDNTrunkAsksItsSignallingChannel) {
    plugIn("", named(514, "plain") + device(301, 516, "NAME: isdn", "channels: {bearers: 23}"));
    auto const trunk = find<Z7ISDNDevice>("isdn");
    EXPECT_EQ(trunk->GetBChannelCount(), 23);
    EXPECT_EQ(trunk->GetDChannelStatus(), ISDNDChannelStatusL2Active);
    sim::command({{"command", "call-signalling"}, {"trunk", 301}, {"state", "l1"}});
    sim::drain();
    EXPECT_EQ(trunk->GetDChannelStatus(), ISDNDChannelStatusL1Active);
}

TEST_F(Z7SimResourceFeatureTest, ISDNTrunkWithoutChannelsAnswersMinusOne) {
    plugIn("", named(514, "plain"));
    EXPECT_EQ(find<Z7ISDNDevice>("plain")->GetBChannelCount(), -1);
    EXPECT_EQ(find<Z7ISDNDevice>("plain")->GetDChannelStatus(), -1);
}

TEST_F(Z7SimResourceFeatureTest, StationHasAsManyTimeSlotsAsChannels) {
    plugIn("", named(525, "station", "ChannelCount: 16") + named(527, "bare"));
    EXPECT_EQ(find<Z7STNDevice>("station")->GetTimeSlotCount(), 16);
    EXPECT_EQ(find<Z7STNDevice>("bare")->GetTimeSlotCount(), -1);
}

TEST_F(Z7SimResourceFeatureTest, DevicesAreReadAnewAtEveryStart) {
    plugIn("", device(301, 503, "NAME: voice, GAIN: 1"));
    sim::set(301, "GAIN", 2);
    EXPECT_EQ(find<Z7VoiceDevice>("voice")->GetGain(), 1) << "a query asked the platform";
    for (int round = 1; round <= 3; ++round) {
        stop();
        EXPECT_EQ(countFeatures<Z7ResourceFeature>(), 0);
        start();
        EXPECT_EQ(countFeatures<Z7ResourceFeature>(), 1);
    }
    EXPECT_EQ(find<Z7VoiceDevice>("voice")->GetGain(), 2);
}

} // namespace
