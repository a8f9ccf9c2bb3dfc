// SPDX-License-Identifier: BSD-2-Clause
// The lines of a Z7 board.
#include <string>

#include <gtest/gtest.h>

#include "tests/support/PlainLine.h"
#include "tests/support/Slots.h"
#include "z7/DS1LineFeatureZ7.h"

namespace {

using Line = ReferenceCounter<DS1LineDevice>;

class Lines final : public DS1LineFeatureZ7 {
  public:
    int GetNumberOfLines() override { return static_cast<int>(m_lines.size()); }
    Line add(char const* name) { return m_lines.emplace_back(new PlainLine(name)); }
};

class CountingListener final : public DS1LineStatusListener {
  public:
    int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> /*event*/) override {
        return ++calls;
    }
    int calls = 0;
};

class Z7LineFeatureTest : public testing::Test {
  protected:
    Line get(std::string name) { return m_feature->Get(name.data()); }

    Lines* m_feature = new Lines;
    ReferenceCounter<DS1LineFeature> m_handle{m_feature};
};

TEST_F(Z7LineFeatureTest, NewFeatureHasNoLines) {
    EXPECT_EQ(m_feature->GetFirstDevice().get(), nullptr);
    EXPECT_EQ(m_feature->GetNextDevice(Line()).get(), nullptr);
    EXPECT_EQ(m_feature->GetFirstInterface().get(), nullptr);
    EXPECT_EQ(m_feature->Find("x").get(), nullptr);
    EXPECT_EQ(get("x").get(), nullptr);
    EXPECT_EQ(m_feature->Get(0L).get(), nullptr);
}

TEST_F(Z7LineFeatureTest, LinesAreWalkedInTheOrderOfTheirEntry) {
    Line const lines[] = {m_feature->add("L1"), m_feature->add("L2"), m_feature->add("L3")};
    EXPECT_EQ(m_feature->GetFirstDevice().get(), lines[0].get());
    EXPECT_EQ(m_feature->GetNextDevice(lines[0]).get(), lines[1].get());
    EXPECT_EQ(m_feature->GetNextDevice(lines[1]).get(), lines[2].get());
    EXPECT_EQ(m_feature->GetNextDevice(lines[2]).get(), nullptr);
}

TEST_F(Z7LineFeatureTest, LineOfNoneOfTheFeatureHasNoSuccessor) {
    m_feature->add("L1");
    m_feature->add("L2");
    EXPECT_EQ(m_feature->GetNextDevice(Line(new PlainLine("L1"))).get(), nullptr);
    EXPECT_EQ(m_feature->GetNextDevice(Line()).get(), nullptr);
}

TEST_F(Z7LineFeatureTest, LineIsFoundByItsName) {
    m_feature->add("L1");
    Line const second = m_feature->add("L2");
    m_feature->add("L2");
    EXPECT_EQ(get("L2").get(), second.get());
    EXPECT_EQ(m_feature->Find("L2").get(), second.get());
    EXPECT_EQ(get("L3").get(), nullptr);
}

TEST_F(Z7LineFeatureTest, LineIsFoundByNoIndex) {
    for (char const* name : {"L1", "L2", "L3"})
        m_feature->add(name);
    for (long const index : {-1L, 0L, 1L, 2L, 3L})
        EXPECT_EQ(m_feature->Get(index).get(), nullptr) << index;
}

TEST_F(Z7LineFeatureTest, ListenerMayBeAddedTwice) {
    CountingListener listener;
    EXPECT_EQ(m_feature->AddLineStatusListener(&listener), 0);
    EXPECT_EQ(m_feature->AddLineStatusListener(&listener), 0);
}

TEST_F(Z7LineFeatureTest, NotificationReachesNobody) {
    CountingListener listener;
    m_feature->AddLineStatusListener(&listener);
    Line const line = m_feature->add("L1");
    EXPECT_EQ(m_feature->NotifyLineStatusListeners(line, DS1LineStatusLossOfSignal), 0);
    EXPECT_EQ(listener.calls, 0);
}

TEST_F(Z7LineFeatureTest, OperationsKeepTheirSlotsBehindThoseOfTheAbstractFeature) {
    using ByName = Line (DS1LineFeatureZ7::*)(char*);
    using ByIndex = Line (DS1LineFeatureZ7::*)(long);
    EXPECT_EQ(slotOf(&DS1LineFeatureZ7::AddLineStatusListener), 4);
    EXPECT_EQ(slotOf(&DS1LineFeatureZ7::GetFirstDevice), 5);
    EXPECT_EQ(slotOf(&DS1LineFeatureZ7::GetNextDevice), 6);
    EXPECT_EQ(slotOf(&DS1LineFeatureZ7::Find), 7);
    EXPECT_EQ(slotOf(static_cast<ByName>(&DS1LineFeatureZ7::Get)), 8);
    EXPECT_EQ(slotOf(static_cast<ByIndex>(&DS1LineFeatureZ7::Get)), 9);
    EXPECT_EQ(slotOf(&DS1LineFeatureZ7::GetNumberOfLines), 10);
    EXPECT_EQ(slotOf(&DS1LineFeatureZ7::NotifyLineStatusListeners), 11);
}

} // namespace
