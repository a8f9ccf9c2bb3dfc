// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/Settings.h"

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr SettingKey kLine{Setting::LineStatusChangeTraps, 1000};
constexpr SettingKey kLink{Setting::LinkUpDownTraps, 1000};
constexpr SettingKey kAlias{Setting::EntityAlias, 1};

TEST(SettingsTest, NothingIsSetAtFirst) {
    Settings const settings;
    EXPECT_EQ(settings.find(kLine), std::nullopt);
    EXPECT_FALSE(settings.hasUnsaved());
}

TEST(SettingsTest, WhatIsSetIsFoundAtOnce) {
    Settings settings;
    EXPECT_EQ(settings.exchange(kLine, 1), std::nullopt);
    EXPECT_EQ(settings.find(kLine), 1);
    EXPECT_EQ(settings.find(kLink), std::nullopt);
    EXPECT_EQ(settings.find({Setting::LineStatusChangeTraps, 1001}), std::nullopt);
}

TEST(SettingsTest, ChangeIsUndoneWithWhatWasThereBefore) {
    Settings settings;
    settings.exchange(kLine, 2);
    auto const former = settings.exchange(kLine, 1);
    settings.exchange(kLine, former);
    EXPECT_EQ(settings.find(kLine), 2);
}

TEST(SettingsTest, UndoneFirstSettingIsAsNeverSet) {
    Settings settings;
    auto const former = settings.exchange(kLine, 1);
    settings.exchange(kLine, former);
    EXPECT_EQ(settings.find(kLine), std::nullopt);
}

TEST(SettingsTest, EveryChangeIsHandedOutOnceToBeSaved) {
    Settings settings;
    settings.exchange(kLink, 1);
    settings.exchange(kLine, 1);
    settings.exchange(kLine, 2);
    EXPECT_TRUE(settings.hasUnsaved());
    EXPECT_THAT(settings.takeUnsaved(),
                ElementsAre(SettingEntry{kLine, 2}, SettingEntry{kLink, 1}));
    EXPECT_FALSE(settings.hasUnsaved());
    EXPECT_THAT(settings.takeUnsaved(), IsEmpty());
}

TEST(SettingsTest, ForgottenSettingIsSavedAsSuch) {
    Settings settings;
    settings.exchange(kLine, 1);
    settings.takeUnsaved();
    settings.exchange(kLine, std::nullopt);
    EXPECT_THAT(settings.takeUnsaved(), ElementsAre(SettingEntry{kLine, std::nullopt}));
}

TEST(SettingsTest, TextAndNumberAreFoundAsWhatTheyAre) {
    Settings settings;
    settings.exchange(kAlias, "west");
    settings.exchange(kLine, 1);
    EXPECT_EQ(settings.findText(kAlias), "west");
    EXPECT_EQ(settings.find(kAlias), std::nullopt);
    EXPECT_EQ(settings.findText(kLine), std::nullopt);
    EXPECT_EQ(settings.value(kAlias), SettingValue{"west"});
}

TEST(SettingsTest, SettingsOfInterfacesAndOfEntitiesAreHandedOutApart) {
    Settings settings;
    settings.exchange(kLine, 1);
    settings.exchange(kAlias, "west");
    EXPECT_THAT(settings.all(), ElementsAre(SettingEntry{kLine, 1}));
    EXPECT_THAT(settings.all(SettingIndex::Entity), ElementsAre(SettingEntry{kAlias, "west"}));
    EXPECT_THAT(settings.takeUnsaved(), ElementsAre(SettingEntry{kLine, 1}));
    EXPECT_TRUE(settings.hasUnsaved());
    EXPECT_THAT(settings.takeUnsaved(SettingIndex::Entity),
                ElementsAre(SettingEntry{kAlias, "west"}));
    EXPECT_FALSE(settings.hasUnsaved());
}

TEST(SettingsTest, WhatWasKeptCountsAndIsNotSavedAgain) {
    Settings settings;
    settings.load({{kLine, 1}});
    EXPECT_EQ(settings.find(kLine), 1);
    EXPECT_FALSE(settings.hasUnsaved());
}

} // namespace
} // namespace kvloamd
