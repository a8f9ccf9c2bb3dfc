// SPDX-License-Identifier: BSD-2-Clause
// Lines, the walks over them, and the events of their status changes.
#include <typeinfo>
#include <vector>

#include <gtest/gtest.h>

#include "board/DS1LineFeature.h"
#include "core/HandleWalk.h"
#include "core/ReferenceTable.h"
#include "tests/support/BareInterface.h"
#include "tests/support/PlainLine.h"
#include "tests/support/Slots.h"

namespace {

using Line = ReferenceCounter<DS1LineDevice>;
using Interface = ReferenceCounter<KVL::Interface>;

/// Lines in a vector. Records the argument of the last `GetNextDevice`.
class ListedLines final : public DS1LineFeature {
  public:
    int AddLineStatusListener(DS1LineStatusListener* /*listener*/) override { return 0; }
    Line GetFirstDevice() override { return KVL::first_in(lines); }
    Line GetNextDevice(Line previous) override {
        asked.push_back(previous.get());
        return KVL::next_in(lines, previous);
    }

    std::vector<Line> lines;
    std::vector<DS1LineDevice*> asked;
};

class DS1LineFeatureTest : public testing::Test {
  protected:
    void add(char const* name) { m_feature->lines.emplace_back(new PlainLine(name)); }
    DS1LineDevice* line(std::size_t i) { return m_feature->lines[i].get(); }

    ListedLines* m_feature = new ListedLines;
    ReferenceCounter<DS1LineFeature> m_handle{m_feature};
};

TEST_F(DS1LineFeatureTest, FindAnswersTheLineOfThatName) {
    add("T1-1");
    add("T1-2");
    EXPECT_EQ(m_feature->Find("T1-2").get(), line(1));
}

TEST_F(DS1LineFeatureTest, FindAnswersTheFirstOfTwoEqualNames) {
    add("E1");
    add("T1");
    add("T1");
    EXPECT_EQ(m_feature->Find("T1").get(), line(1));
}

TEST_F(DS1LineFeatureTest, EmptyNameFindsALineWithAnEmptyName) {
    add("T1");
    EXPECT_EQ(m_feature->Find("").get(), nullptr);
    add("");
    EXPECT_EQ(m_feature->Find("").get(), line(1));
}

TEST_F(DS1LineFeatureTest, FindComparesWholeNamesAndTheirCase) {
    add("T1-10");
    for (char const* name : {"T1-1", "T1-100", "t1-10", "T1-10 "})
        EXPECT_EQ(m_feature->Find(name).get(), nullptr) << name;
}

TEST_F(DS1LineFeatureTest, FeatureWithoutLinesFindsNothing) {
    EXPECT_EQ(m_feature->Find("T1").get(), nullptr);
    EXPECT_EQ(m_feature->GetFirstInterface().get(), nullptr);
}

TEST_F(DS1LineFeatureTest, InterfacesAreTheLinesInTheirOrder) {
    add("T1-1");
    add("T1-2");
    add("T1-3");
    std::size_t count = 0;
    for (Interface entry = m_feature->GetFirstInterface(); entry.get() != nullptr;
         entry = m_feature->GetNextInterface(entry)) {
        ASSERT_LT(count, 3U);
        EXPECT_EQ(dynamic_cast<DS1LineDevice*>(entry.get()), line(count));
        EXPECT_EQ(static_cast<Object*>(entry.get()), static_cast<Object*>(line(count)));
        EXPECT_TRUE(entry->interfaces()->is_element(DS1LineDevice::iid()));
        ++count;
    }
    EXPECT_EQ(count, 3U);
}

TEST_F(DS1LineFeatureTest, SuccessorOfALineIsAskedForWithThatLine) {
    add("T1-1");
    add("T1-2");
    EXPECT_EQ(m_feature->GetNextInterface(Interface(line(0))).get(), line(1));
    EXPECT_EQ(m_feature->asked, (std::vector<DS1LineDevice*>{line(0)}));
}

TEST_F(DS1LineFeatureTest, SuccessorOfAForeignInterfaceIsAskedForWithAnEmptyHandle) {
    add("T1");
    EXPECT_EQ(m_feature->GetNextInterface(Interface(new BareInterface<KVL::Interface>)).get(),
              nullptr);
    EXPECT_EQ(m_feature->asked, (std::vector<DS1LineDevice*>{nullptr}));
}

TEST_F(DS1LineFeatureTest, SuccessorOfNoInterfaceIsAskedForWithAnEmptyHandle) {
    add("T1");
    EXPECT_EQ(m_feature->GetNextInterface(Interface()).get(), nullptr);
    EXPECT_EQ(m_feature->asked, (std::vector<DS1LineDevice*>{nullptr}));
}

TEST_F(DS1LineFeatureTest, FeatureAnswersToItsIdentifiers) {
    auto const* const interfaces = m_feature->interfaces();
    EXPECT_TRUE(interfaces->is_element(KVL::InterfaceFeature::iid()));
    EXPECT_TRUE(interfaces->is_element(DS1LineFeature::iid()));
    EXPECT_FALSE(interfaces->is_element(DS1LineDevice::iid()));
}

TEST_F(DS1LineFeatureTest, IdentifiersAreTheTypeNames) {
    EXPECT_STREQ(DS1LineDevice::iid().tostring(), typeid(DS1LineDevice).name());
    EXPECT_STREQ(DS1LineFeature::iid().tostring(), typeid(DS1LineFeature).name());
}

TEST_F(DS1LineFeatureTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&DS1LineFeature::GetFirstInterface), 2);
    EXPECT_EQ(slotOf(&DS1LineFeature::GetNextInterface), 3);
    EXPECT_EQ(slotOf(&DS1LineFeature::AddLineStatusListener), 4);
    EXPECT_EQ(slotOf(&DS1LineFeature::GetFirstDevice), 5);
    EXPECT_EQ(slotOf(&DS1LineFeature::GetNextDevice), 6);
    EXPECT_EQ(slotOf(&DS1LineFeature::Find), 7);
}

class DS1LineDeviceTest : public testing::Test {
  protected:
    PlainLine* m_line = new PlainLine("T1");
    Line m_handle{m_line};
};

TEST_F(DS1LineDeviceTest, AddressComesWithItsLength) {
    char buffer[256] = "as it was";
    int length = -1;
    EXPECT_EQ(m_line->GetPhysAddress(buffer, length), 0);
    EXPECT_STREQ(buffer, "00:11:22");
    EXPECT_EQ(length, 8);
}

TEST_F(DS1LineDeviceTest, AddressThatCannotBeReadLeavesTheBufferAndHasNoLength) {
    for (int const answer : {-1, 1, KVL::kNotSupported}) {
        m_line->addressAnswer = answer;
        char buffer[256] = "as it was";
        int length = 5;
        EXPECT_EQ(m_line->GetPhysAddress(buffer, length), 1);
        EXPECT_STREQ(buffer, "as it was");
        EXPECT_EQ(length, 0);
    }
}

TEST_F(DS1LineDeviceTest, LineAnswersToItsOwnAndTheInheritedIdentifier) {
    EXPECT_TRUE(m_line->interfaces()->is_element(KVL::Interface::iid()));
    EXPECT_TRUE(m_line->interfaces()->is_element(DS1LineDevice::iid()));
    EXPECT_FALSE(m_line->interfaces()->is_element(DS1LineFeature::iid()));
}

TEST_F(DS1LineDeviceTest, StatusesAreTheBitsOfTheMib) {
    DS1LineStatusEnum const inOrder[] = {
        DS1LineStatusNoAlarm,       DS1LineStatusRcvFarEndLOF,     DS1LineStatusXmtFarEndLOF,
        DS1LineStatusRcvAIS,        DS1LineStatusXmtAIS,           DS1LineStatusLossOfFrame,
        DS1LineStatusLossOfSignal,  DS1LineStatusLoopbackState,    DS1LineStatusT16AIS,
        DS1LineStatusRcvFarEndLOMF, DS1LineStatusXmtFarEndLOMF,    DS1LineStatusRcvTestCode,
        DS1LineStatusOtherFailure,  DS1LineStatusUnavailSigState,  DS1LineStatusNetEquipOOS,
        DS1LineStatusRcvPayloadAIS, DS1LineStatusDs2PerfThreshold,
    };
    int bit = 1;
    for (DS1LineStatusEnum const status : inOrder) {
        EXPECT_EQ(status, bit);
        bit *= 2;
    }
    EXPECT_EQ(bit, 1 << 17);
}

TEST_F(DS1LineDeviceTest, OperationsKeepTheirSlotsBehindThoseOfTheInterface) {
    EXPECT_EQ(slotOf(&DS1LineDevice::GetDescription), 2);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetPhysAddress), 6);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetOutErrors), 19);
    int slot = 20;
    EXPECT_EQ(slotOf(&DS1LineDevice::GetName), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineIndex), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetIntervalTable), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineType), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineCoding), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetSendCode), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetCircuitIdentifier), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLoopbackConfig), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineStatus), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetSignalMode), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetPhysAddressString), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetTransmitClockSource), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetFdl), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineLength), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineStatusLastChange), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineStatusChangeTrapEnable), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::SetLineStatusChangeTrapEnable), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLoopbackStatus), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetDs1ChannelNumber), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetChannelization), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineMode), slot++);
    EXPECT_EQ(slotOf(&DS1LineDevice::GetLineBuildOut), slot++);
    EXPECT_EQ(slot, 20 + 22);
}

TEST(DS1LineStatusEventTest, EventCarriesTheStatusAndTheLine) {
    Line const line(new PlainLine("T1"));
    DS1LineStatusEvent event(DS1LineStatusLossOfSignal, line);
    EXPECT_EQ(event.GetLineStatus(), DS1LineStatusLossOfSignal);
    EXPECT_EQ(event.GetLine().get(), line.get());
}

TEST(DS1LineStatusEventTest, EventKeepsItsLineAliveUntilItGoes) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    ReferenceCounter<DS1LineStatusEvent> event(
        new DS1LineStatusEvent(DS1LineStatusNoAlarm, Line(new PlainLine("T1"))));
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before + 2);
    char name[64];
    event->GetLine()->GetName(name);
    EXPECT_STREQ(name, "T1");
    event = {};
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST(DS1LineStatusEventTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&DS1LineStatusEvent::GetLineStatus), 2);
    EXPECT_EQ(slotOf(&DS1LineStatusEvent::GetLine), 3);
    EXPECT_EQ(slotOf(&DS1LineStatusListener::ProcessLineStatusEvent), 0);
}

TEST(DS1LineStatusEventTest, ListenerIsFoundAtTheAddressOfItsFirstBase) {
    class Listener final : public DS1LineStatusListener {
        int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> /*event*/) override {
            return 0;
        }
    };
    Listener listener;
    DS1LineStatusListener* const lineListener = &listener;
    EventListener* const base = lineListener;
    EXPECT_EQ(static_cast<void*>(base), static_cast<void*>(lineListener));
    EXPECT_EQ(static_cast<DS1LineStatusListener*>(base), lineListener);
}

} // namespace
