// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmPolicies.h"

#include <algorithm>
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using std::chrono::seconds;
using ::testing::HasSubstr;

TEST(AlarmPoliciesTest, KindWithoutConfigurationHasItsDefault) {
    AlarmPolicies const policies;
    EXPECT_EQ(policies.of(AlarmKind::LineRcvAIS, 1000),
              (AlarmPolicy{AlarmSeverity::Major, seconds(0), seconds(0), true}));
}

TEST(AlarmPoliciesTest, EntrySetsSeverityAndHoldTimes) {
    AlarmPolicies policies;
    EXPECT_EQ(policies.configure("dsx1RcvAIS=warning,raise=2,clear=10"), "");
    EXPECT_EQ(policies.of(AlarmKind::LineRcvAIS, 1000),
              (AlarmPolicy{AlarmSeverity::Warning, seconds(2), seconds(10), true}));
    EXPECT_EQ(policies.of(AlarmKind::LineLossOfSignal, 1000).severity, AlarmSeverity::Critical);
}

TEST(AlarmPoliciesTest, EntryWithoutSeverityKeepsTheDefault) {
    AlarmPolicies policies;
    EXPECT_EQ(policies.configure("linkDown=raise=3600"), "");
    EXPECT_EQ(policies.of(AlarmKind::LinkDown, 1).severity, AlarmSeverity::Major);
    EXPECT_EQ(policies.of(AlarmKind::LinkDown, 1).raiseHold, seconds(3600));
}

TEST(AlarmPoliciesTest, KindIsSwitchedOff) {
    AlarmPolicies policies;
    EXPECT_EQ(policies.configure("agentStoreUnreadable=off"), "");
    EXPECT_FALSE(policies.of(AlarmKind::StoreUnreadable, 0).enabled);
}

TEST(AlarmPoliciesTest, OneFaultValueHasAPolicyOfItsOwn) {
    AlarmPolicies policies;
    EXPECT_EQ(policies.configure("platformFault=minor"), "");
    EXPECT_EQ(policies.configure("platformFault.17=critical"), "");
    EXPECT_EQ(policies.of(AlarmKind::PlatformFault, 17).severity, AlarmSeverity::Critical);
    EXPECT_EQ(policies.of(AlarmKind::PlatformFault, 18).severity, AlarmSeverity::Minor);
}

TEST(AlarmPoliciesTest, WrongEntryIsNamedAndChangesNothing) {
    struct {
        char const* entry;
        char const* message;
    } const wrong[] = {
        {"dsx1LossOfSignl=major", "'dsx1LossOfSignl' is no kind of alarm"},
        {"linkDown.3=major", "'linkDown.3' has no such number"},
        {"platformFault.70000=major", "'platformFault.70000' has no such number"},
        {"platformFault.=major", "'platformFault.' has no such number"},
        {"linkDown=cleared", "'cleared' in 'linkDown=cleared' is neither"},
        {"linkDown=raise=3601", "'raise=3601'"},
        {"linkDown=raise=-1", "'raise=-1'"},
        {"linkDown=raise=", "'raise='"},
        {"linkDown=hold=3", "'hold=3'"},
        {"linkDown=", "configures nothing"},
        {"linkDown", "configures nothing"},
        {"", "'' is no kind of alarm"},
    };
    for (auto const& [entry, message] : wrong) {
        AlarmPolicies policies;
        EXPECT_THAT(policies.configure(entry), HasSubstr(message)) << entry;
        EXPECT_EQ(policies, AlarmPolicies()) << entry;
    }
}

TEST(AlarmPoliciesTest, KindIsConfiguredOnce) {
    AlarmPolicies policies;
    EXPECT_EQ(policies.configure("linkDown=minor"), "");
    EXPECT_THAT(policies.configure("linkDown=major"), HasSubstr("twice"));
    EXPECT_EQ(policies.of(AlarmKind::LinkDown, 1).severity, AlarmSeverity::Minor);
}

TEST(AlarmKindsTest, NumbersAndNamesAreUnique) {
    std::set<AlarmKind> numbers;
    std::set<std::string> names;
    for (AlarmKindInfo const& info : alarmKinds()) {
        EXPECT_TRUE(numbers.insert(info.kind).second) << info.name;
        EXPECT_TRUE(names.insert(info.name).second) << info.name;
        EXPECT_EQ(findAlarmKind(info.name), &info);
        EXPECT_EQ(&alarmKind(info.kind), &info);
    }
}

TEST(AlarmKindsTest, DocumentHasOneRowForEveryKindWithItsDefaultSeverityAndNoOther) {
    std::ifstream file(DOCS_DIR "/operating.md");
    std::string line;
    while (std::getline(file, line) && line != "## At 3 a.m.") {
    }
    std::set<std::string> rows;
    while (std::getline(file, line) && !line.starts_with("## ")) {
        if (!line.starts_with("| `")) continue;
        std::vector<std::string> cells;
        std::istringstream row(line);
        for (std::string cell; std::getline(row, cell, '|');)
            cells.push_back(cell.substr(std::min<std::size_t>(1, cell.size())));
        ASSERT_EQ(cells.size(), 5U) << line;
        for (std::string& cell : cells)
            if (!cell.empty()) cell.pop_back();
        EXPECT_FALSE(cells[3].empty()) << "what it means: " << line;
        EXPECT_FALSE(cells[4].empty()) << "what to do: " << line;
        EXPECT_TRUE(rows.insert(cells[1] + " " + cells[2]).second) << line;
    }
    std::set<std::string> kinds;
    for (AlarmKindInfo const& info : alarmKinds())
        kinds.insert(std::string("`") + info.name + "` " + severityName(info.severity));
    EXPECT_EQ(rows, kinds);
}

} // namespace
} // namespace kvloamd
