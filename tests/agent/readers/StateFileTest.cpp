// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StateFile.h"

#include <sys/resource.h>

#include <csignal>

#include <gmock/gmock.h>

#include "tests/agent/readers/StateFolder.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

constexpr char kNoDatabase[] =
    "this is no database, and long enough to be taken for one if nobody looks into it";

/// No file of this process can become larger than `size`, for a scope.
class NoRoom {
  public:
    explicit NoRoom(std::uintmax_t size) {
        std::signal(SIGXFSZ, SIG_IGN);
        getrlimit(RLIMIT_FSIZE, &m_former);
        rlimit const limit{static_cast<rlim_t>(size), m_former.rlim_max};
        setrlimit(RLIMIT_FSIZE, &limit);
    }
    ~NoRoom() { setrlimit(RLIMIT_FSIZE, &m_former); }
    NoRoom(NoRoom const&) = delete;
    NoRoom& operator=(NoRoom const&) = delete;

  private:
    rlimit m_former{};
};

using StateFileTest = StateFolder;

TEST_F(StateFileTest, FileThatIsNotADatabaseIsSetAsideWithOneMessage) {
    write(kNoDatabase);
    LogCapture logged;
    AgentRun run(file());
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_THAT(message, HasSubstr(file()));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
    EXPECT_THAT(run.ask("A", lines(1)), ElementsAre(1000));
}

TEST_F(StateFileTest, FileThatWasBegunAnewIsKept) {
    write(kNoDatabase);
    {
        LogCapture logged;
        AgentRun(file()).ask("A", lines(1));
    }
    EXPECT_THAT(AgentRun(file(), 7000).ask("A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
}

TEST_F(StateFileTest, DatabaseWithABrokenPageIsSetAside) {
    AgentRun(file()).ask("A", lines(500));
    std::fstream stream(file(), std::ios::in | std::ios::out | std::ios::binary);
    stream.seekp(4096);
    stream << std::string(4096, 'x');
    stream.close();
    LogCapture logged;
    AgentRun const run(file());
    std::string const message = logged.take();
    EXPECT_THAT(message, HasSubstr(".damaged-"));
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_THAT(damagedFiles(), SizeIs(1));
}

TEST_F(StateFileTest, EmptyFileIsBegun) {
    write("");
    LogCapture logged;
    AgentRun const run(file());
    EXPECT_THAT(logged.take(), IsEmpty());
    EXPECT_THAT(damagedFiles(), IsEmpty());
}

TEST_F(StateFileTest, FileOfAnotherProgramIsSetAside) {
    OtherProgram(file()).execute("CREATE TABLE mine (x); PRAGMA application_id = 7");
    LogCapture logged;
    AgentRun const run(file());
    EXPECT_THAT(logged.take(), HasSubstr("another program's"));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
}

TEST_F(StateFileTest, PlaceThatCannotBeWrittenIsLoggedOnce) {
    write("");
    // There is no directory below a file, not even for root.
    LogCapture logged;
    AgentRun run(file() + "/state/ifindex.sqlite");
    EXPECT_THAT(run.ask("A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_EQ(run.file.state(), Persistence::Failing);
}

TEST_F(StateFileTest, PlaceThatCanBeWrittenLaterGetsWhatWasGivenMeanwhile) {
    std::string const later = m_folder + "/later";
    {
        LogCapture logged;
        AgentRun run(later + "/ifindex.sqlite");
        run.ask("A", lines(2));
        std::filesystem::create_directory(later);
        run.ask("B", lines(1));
        EXPECT_EQ(run.file.state(), Persistence::Kept);
        EXPECT_THAT(logged.take(), HasSubstr("again"));
    }
    AgentRun run(later + "/ifindex.sqlite", 5000);
    EXPECT_THAT(run.ask("A", lines(2)), ElementsAre(1000, 1001));
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
}

TEST_F(StateFileTest, WriteThatFailsIsRetriedAndLoggedOnceEachWay) {
    LogCapture logged;
    {
        AgentRun run(file());
        run.ask("A", lines(1));
        {
            NoRoom const full(std::filesystem::file_size(file()));
            EXPECT_THAT(run.ask("B", lines(500))[0], 1016U);
            EXPECT_EQ(run.file.state(), Persistence::Failing);
            run.set({Setting::LinkUpDownTraps, 1016}, 2);
            run.ask("B", lines(500));
            EXPECT_EQ(run.settings.find({Setting::LinkUpDownTraps, 1016}), 2);
        }
        run.indices.save();
        EXPECT_EQ(run.file.state(), Persistence::Kept);
    }
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 2) << message;
    AgentRun run(file(), 7000);
    EXPECT_EQ(run.ask("B", lines(500))[499], 1515U);
    EXPECT_THAT(run.ask("A", lines(1)), ElementsAre(1000));
    EXPECT_EQ(run.settings.find({Setting::LinkUpDownTraps, 1016}), 2);
}

TEST_F(StateFileTest, FileThatWasDeletedIsWrittenAgain) {
    {
        LogCapture logged;
        AgentRun run(file());
        run.ask("A", lines(3));
        std::filesystem::remove(file());
        run.ask("B", lines(1));
        run.indices.save();
        EXPECT_EQ(run.file.state(), Persistence::Kept);
    }
    AgentRun run(file(), 7000);
    EXPECT_THAT(run.ask("A", lines(3)), ElementsAre(1000, 1001, 1002));
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
}

TEST_F(StateFileTest, FileThatIsLockedAtTheStartIsNotNumberedAnew) {
    AgentRun(file()).ask("A", lines(2));
    LogCapture logged;
    OtherProgram backup(file());
    backup.execute("BEGIN EXCLUSIVE");
    AgentRun run(file());
    EXPECT_EQ(run.file.state(), Persistence::InUse);
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(0));
    EXPECT_THAT(run.ask("A", lines(2)), ElementsAre(0, 0));
    backup.execute("ROLLBACK");
    run.indices.save();
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
    EXPECT_THAT(run.ask("A", lines(2)), ElementsAre(1000, 1001));
    EXPECT_EQ(run.file.state(), Persistence::Kept);
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 2) << message;
    EXPECT_THAT(message, HasSubstr("another process uses it"));
    EXPECT_THAT(damagedFiles(), IsEmpty());
}

TEST_F(StateFileTest, FileThatIsReadAtTheStartKeepsItsIndices) {
    AgentRun(file()).ask("A", lines(2));
    LogCapture logged;
    OtherProgram backup(file());
    backup.execute("BEGIN; SELECT * FROM interface");
    AgentRun run(file());
    EXPECT_THAT(run.ask("A", lines(2)), ElementsAre(1000, 1001));
    EXPECT_EQ(run.file.state(), Persistence::InUse);
    backup.execute("COMMIT");
    run.indices.save();
    EXPECT_EQ(run.file.state(), Persistence::Kept);
}

TEST_F(StateFileTest, StartWaitsForALockedFile) {
    AgentRun(file()).ask("A", lines(1));
    OtherProgram backup(file());
    backup.execute("BEGIN EXCLUSIVE");
    LogCapture logged;
    auto const begun = std::chrono::steady_clock::now();
    StateFile waiting(file(), "interfaces", std::chrono::milliseconds(50));
    waiting.open();
    EXPECT_GE(std::chrono::steady_clock::now() - begun, std::chrono::milliseconds(50));
    EXPECT_EQ(waiting.state(), Persistence::InUse);
}

TEST_F(StateFileTest, FileThatIsLockedMeanwhileIsWrittenLater) {
    LogCapture logged;
    {
        AgentRun run(file());
        run.ask("A", lines(1));
        OtherProgram backup(file());
        backup.execute("BEGIN; SELECT * FROM interface");
        EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
        EXPECT_EQ(run.file.state(), Persistence::InUse);
        backup.execute("COMMIT");
        run.indices.save();
        EXPECT_EQ(run.file.state(), Persistence::Kept);
    }
    EXPECT_THAT(AgentRun(file(), 7000).ask("B", lines(1)), ElementsAre(1016));
}

TEST_F(StateFileTest, FileOfANewerVersionIsLeftAlone) {
    AgentRun(file()).ask("A", lines(1));
    OtherProgram(file()).execute("PRAGMA user_version = 2");
    LogCapture logged;
    AgentRun run(file());
    run.ask("B", lines(1));
    run.ask("C", lines(1));
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_THAT(message, HasSubstr("newer version"));
    EXPECT_THAT(message, Not(HasSubstr("keeps trying")));
    EXPECT_EQ(run.file.state(), Persistence::Failing);
    EXPECT_THAT(damagedFiles(), IsEmpty());
    Database database(file());
    EXPECT_EQ(database.number("SELECT count(*) FROM interface"), 1);
}

TEST_F(StateFileTest, FileThatTurnsOutToBeDamagedByAWriteIsWrittenAnewFromMemory) {
    LogCapture logged;
    {
        AgentRun run(file());
        run.ask("A", lines(1));
        // What an index of the file knows, and a walk of the table does not.
        OtherProgram(file()).execute("INSERT INTO interface VALUES ('X', 1, 'x', 1016)");
        EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
        EXPECT_EQ(run.file.state(), Persistence::Kept);
        run.ask("C", lines(1));
    }
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_THAT(message, HasSubstr("UNIQUE constraint failed"));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
    AgentRun run(file(), 7000);
    EXPECT_THAT(run.ask("A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(run.ask("B", lines(1)), ElementsAre(1016));
    EXPECT_THAT(run.ask("C", lines(1)), ElementsAre(1032));
}

TEST_F(StateFileTest, FileThatIsDamagedAgainAndAgainIsGivenUp) {
    LogCapture logged;
    AgentRun run(file());
    run.ask("A", lines(1));
    for (char const* const board : {"B", "C", "D", "E"}) {
        std::error_code missing;
        if (std::filesystem::exists(file(), missing))
            OtherProgram(file()).execute("DROP TABLE IF EXISTS interface;"
                                         "CREATE TABLE interface (x)");
        run.ask(board, lines(1));
    }
    EXPECT_THAT(damagedFiles(), SizeIs(::testing::Le(1U)));
    EXPECT_EQ(run.file.state(), Persistence::Failing);
}

TEST_F(StateFileTest, WithoutAFileNothingIsKeptAndNothingIsLogged) {
    LogCapture logged;
    AgentRun run("");
    run.ask("A", lines(1));
    run.set({Setting::LinkUpDownTraps, 1000}, 1);
    EXPECT_EQ(logged.take(), "");
}

} // namespace
} // namespace kvloamd
