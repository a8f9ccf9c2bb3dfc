// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/KeptSettings.h"

#include <gmock/gmock.h>

#include "tests/agent/readers/StateFolder.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

constexpr SettingKey kFirst{Setting::LineStatusChangeTraps, 1000};
constexpr SettingKey kSecond{Setting::LinkUpDownTraps, 1001};

constexpr SettingKey kAlias{Setting::EntityAlias, 1000};

/// One run of the agent, with the file as that of physical entities.
struct EntityRun {
    explicit EntityRun(std::string const& path)
        : file(path, "physical entities"),
          indices(file, 1000),
          kept(file, indices, settings, SettingIndex::Entity) {
        file.open();
    }

    Settings settings;
    StateFile file;
    StableIndices indices;
    KeptSettings kept;
};

class KeptSettingsTest : public StateFolder {
  protected:
    KeptSettingsTest() { AgentRun(file()).ask("A", lines(2)); }
};

TEST_F(KeptSettingsTest, SettingsAreTheSameAfterARestart) {
    {
        AgentRun run(file());
        EXPECT_THAT(run.settings.all(), IsEmpty());
        run.set(kFirst, 1);
        run.set(kSecond, 1);
        run.set(kSecond, 2);
    }
    EXPECT_THAT(AgentRun(file()).settings.all(),
                ElementsAre(SettingEntry{kFirst, 1}, SettingEntry{kSecond, 2}));
}

TEST_F(KeptSettingsTest, TextIsTheSameAfterARestartEvenIfItLooksLikeANumber) {
    for (char const* const text : {"West wing", "0042", "", "Zw\xc3\xb6lf"}) {
        {
            EntityRun run(file());
            run.settings.exchange(kAlias, text);
            run.settings.exchange(kFirst, 1); // an interface's: it is in another file
        }
        EntityRun const run(file());
        EXPECT_THAT(run.settings.all(SettingIndex::Entity),
                    ElementsAre(SettingEntry{kAlias, text}));
        EXPECT_THAT(run.settings.all(), IsEmpty());
    }
}

TEST_F(KeptSettingsTest, SettingIsSavedWhenTheAgentStops) {
    {
        AgentRun run(file());
        run.settings.exchange(kFirst, 1);
    }
    EXPECT_THAT(AgentRun(file()).settings.all(), ElementsAre(SettingEntry{kFirst, 1}));
}

TEST_F(KeptSettingsTest, ForgottenSettingIsGoneAfterARestart) {
    {
        AgentRun run(file());
        run.set(kFirst, 1);
        run.set(kSecond, 1);
        run.set(kFirst, std::nullopt);
    }
    EXPECT_THAT(AgentRun(file()).settings.all(), ElementsAre(SettingEntry{kSecond, 1}));
}

TEST_F(KeptSettingsTest, FileFromBeforeThereWereSettingsKeepsItsIndicesAndTakesSettings) {
    OtherProgram(file()).execute("DROP TABLE setting; DROP TABLE seen; DROP TABLE calendar");
    {
        AgentRun run(file());
        EXPECT_THAT(run.ask("A", lines(2)), ElementsAre(1000, 1001));
        run.set(kFirst, 1);
    }
    EXPECT_THAT(damagedFiles(), IsEmpty());
    EXPECT_THAT(AgentRun(file()).settings.all(), ElementsAre(SettingEntry{kFirst, 1}));
}

TEST_F(KeptSettingsTest, SettingOfABoardThatCannotBeIdentifiedCountsButIsNotKept) {
    {
        AgentRun run(file());
        std::uint32_t const index = run.ask("x", lines(1), false)[0];
        run.set({Setting::LinkUpDownTraps, index}, 2);
        EXPECT_EQ(run.settings.find({Setting::LinkUpDownTraps, index}), 2);
    }
    EXPECT_THAT(AgentRun(file()).settings.all(), IsEmpty());
}

TEST_F(KeptSettingsTest, SettingOfAForgottenIndexIsDeleted) {
    {
        AgentRun run(file());
        run.set(kFirst, 1);
    }
    OtherProgram(file()).execute("DELETE FROM interface; DELETE FROM block");
    EXPECT_THAT(AgentRun(file()).settings.all(), IsEmpty());
    Database database(file());
    EXPECT_EQ(database.number("SELECT count(*) FROM setting"), 0);
}

} // namespace
} // namespace kvloamd
