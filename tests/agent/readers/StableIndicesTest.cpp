// SPDX-License-Identifier: BSD-2-Clause
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include <gmock/gmock.h>
#include <sqlite3.h>

#include "agent/readers/StableIndices.h"
#include "agent/rows/IndexKey.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::SizeIs;

/// Captures what is logged, for a scope.
class LogCapture {
  public:
    LogCapture() { ::testing::internal::CaptureStderr(); }
    ~LogCapture() {
        if (!m_taken) ::testing::internal::GetCapturedStderr();
    }
    LogCapture(LogCapture const&) = delete;
    LogCapture& operator=(LogCapture const&) = delete;

    std::string take() {
        m_taken = true;
        return ::testing::internal::GetCapturedStderr();
    }

  private:
    bool m_taken = false;
};

class StableIndicesTest : public ::testing::Test {
  protected:
    StableIndicesTest() {
        std::string folder = ::testing::TempDir() + "ifindex-XXXXXX";
        if (mkdtemp(folder.data()) == nullptr) throw std::runtime_error("no temporary folder");
        m_folder = folder;
    }
    ~StableIndicesTest() override {
        chmod(m_folder.c_str(), S_IRWXU);
        std::filesystem::remove_all(m_folder);
    }

    std::string file() const { return m_folder + "/ifindex.sqlite"; }
    StableIndices open(std::uint32_t base = 1000) const { return {file(), base, "interfaces"}; }
    static std::vector<IndexKey> lines(int count) {
        std::vector<IndexKey> keys;
        for (int i = 1; i <= count; ++i)
            keys.push_back({IndexKind::Line, "line" + std::to_string(i)});
        return keys;
    }
    static std::vector<std::uint32_t> ask(StableIndices& indices, std::string const& board,
                                          std::vector<IndexKey> const& keys) {
        auto const given = indices.indicesOf(board, keys);
        indices.save();
        return given;
    }
    std::vector<std::string> damagedFiles() const {
        std::vector<std::string> names;
        for (auto const& entry : std::filesystem::directory_iterator(m_folder))
            if (std::string name = entry.path().filename(); name.find(".damaged-") != name.npos)
                names.push_back(std::move(name));
        return names;
    }
    /// Changes the file as another program would.
    void execute(char const* sql) const {
        sqlite3* database = nullptr;
        ASSERT_EQ(sqlite3_open(file().c_str(), &database), SQLITE_OK);
        EXPECT_EQ(sqlite3_exec(database, sql, nullptr, nullptr, nullptr), SQLITE_OK) << sql;
        sqlite3_close(database);
    }
    void write(std::string const& content) const {
        std::ofstream stream(file(), std::ios::binary);
        stream << content;
    }

    std::string m_folder;
};

TEST_F(StableIndicesTest, FirstBoardBeginsAtTheBase) {
    auto indices = open(500);
    EXPECT_THAT(ask(indices, "A", lines(3)), ElementsAre(500, 501, 502));
}

TEST_F(StableIndicesTest, SameInterfaceHasTheSameIndexWheneverItIsAsked) {
    auto indices = open();
    ask(indices, "A", lines(3));
    EXPECT_THAT(ask(indices, "A", {lines(3)[2], lines(3)[0]}), ElementsAre(1002, 1000));
}

TEST_F(StableIndicesTest, IndicesAreTheSameAfterARestart) {
    {
        auto indices = open();
        ask(indices, "A", lines(3));
        ask(indices, "B", lines(2));
    }
    auto indices = open();
    EXPECT_THAT(ask(indices, "B", lines(2)), ElementsAre(1016, 1017));
    EXPECT_THAT(ask(indices, "A", lines(3)), ElementsAre(1000, 1001, 1002));
}

TEST_F(StableIndicesTest, BoardThatWasAwayDuringARestartHasItsIndicesAgain) {
    {
        auto indices = open();
        ask(indices, "A", lines(1));
        ask(indices, "B", lines(1));
    }
    {
        auto indices = open();
        ask(indices, "B", lines(1));
        ask(indices, "C", lines(1));
    }
    auto indices = open();
    EXPECT_THAT(ask(indices, "A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(ask(indices, "C", lines(1)), ElementsAre(1032));
}

TEST_F(StableIndicesTest, BoardOfAnotherSerialNumberHasItsOwnIndices) {
    auto indices = open();
    ask(indices, "A", lines(2));
    EXPECT_THAT(ask(indices, "A2", lines(2)), ElementsAre(1016, 1017));
}

TEST_F(StableIndicesTest, InterfacesOfOneNameAndSeveralKindsAreDifferent) {
    auto indices = open();
    EXPECT_THAT(ask(indices, "A", {{IndexKind::Ethernet, "1"}, {IndexKind::Ip, "1"}}),
                ElementsAre(1000, 1001));
}

TEST_F(StableIndicesTest, BlockHasThePowerOfTwoThatLeavesRoom) {
    auto indices = open();
    ask(indices, "A", lines(32)); // with room for more: 64
    EXPECT_THAT(ask(indices, "B", lines(1)), ElementsAre(1064));
}

TEST_F(StableIndicesTest, TwoBoardsThatGrowStayApart) {
    auto indices = open();
    ask(indices, "A", lines(10));
    ask(indices, "B", lines(10));
    auto const a = ask(indices, "A", lines(20));
    auto const b = ask(indices, "B", lines(20));
    EXPECT_EQ(a[15], 1015U); // the last of its first block
    EXPECT_EQ(a[16], 1032U); // the first of its second
    EXPECT_EQ(b[15], 1031U);
    EXPECT_EQ(b[16], 1048U);
}

TEST_F(StableIndicesTest, GrownBoardIsTheSameAfterARestart) {
    std::vector<std::uint32_t> before;
    {
        auto indices = open();
        ask(indices, "A", lines(10));
        ask(indices, "B", lines(10));
        before = ask(indices, "A", lines(20));
    }
    auto indices = open();
    EXPECT_EQ(ask(indices, "A", lines(20)), before);
    EXPECT_EQ(ask(indices, "A", lines(21)).back(), before.back() + 1);
}

TEST_F(StableIndicesTest, InterfaceThatGoesLeavesNoRoomForAnother) {
    auto indices = open();
    ask(indices, "A", lines(2));
    EXPECT_THAT(ask(indices, "A", {lines(2)[0], {IndexKind::Ip, "1"}}), ElementsAre(1000, 1002));
}

TEST_F(StableIndicesTest, AnotherBaseLeavesOldIndicesAlone) {
    {
        auto indices = open(1000);
        ask(indices, "A", lines(1));
    }
    auto indices = open(5000);
    EXPECT_THAT(ask(indices, "A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(ask(indices, "B", lines(1)), ElementsAre(5000));
}

TEST_F(StableIndicesTest, InterfacesBeyondTheLastIndexHaveNone) {
    StableIndices indices("", kLastIndex - 15, "interfaces");
    EXPECT_THAT(ask(indices, "A", lines(1)), ElementsAre(kLastIndex - 15));
    EXPECT_THAT(ask(indices, "B", lines(1)), ElementsAre(0));
}

TEST_F(StableIndicesTest, FileThatIsNoDatabaseIsSetAsideWithOneMessage) {
    write("this is no database, and long enough to be taken for one if nobody looks into it");
    LogCapture logged;
    auto indices = open();
    std::string const message = logged.take();
    EXPECT_EQ(std::ranges::count(message, '\n'), 1) << message;
    EXPECT_THAT(message, HasSubstr(file()));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
    EXPECT_THAT(ask(indices, "A", lines(1)), ElementsAre(1000));
}

TEST_F(StableIndicesTest, RebuiltFileIsKept) {
    write("this is no database, and long enough to be taken for one if nobody looks into it");
    {
        LogCapture logged;
        auto indices = open();
        ask(indices, "A", lines(1));
    }
    auto indices = open(7000);
    EXPECT_THAT(ask(indices, "A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
}

TEST_F(StableIndicesTest, DatabaseWithABrokenPageIsSetAside) {
    {
        auto indices = open();
        ask(indices, "A", lines(500));
    }
    std::fstream stream(file(), std::ios::in | std::ios::out | std::ios::binary);
    stream.seekp(4096);
    stream << std::string(4096, 'x');
    stream.close();
    LogCapture logged;
    auto indices = open();
    EXPECT_THAT(logged.take(), HasSubstr(".damaged-"));
    EXPECT_THAT(damagedFiles(), SizeIs(1));
}

TEST_F(StableIndicesTest, EmptyFileIsBegun) {
    write("");
    LogCapture logged;
    auto indices = open();
    EXPECT_THAT(logged.take(), IsEmpty());
    EXPECT_THAT(damagedFiles(), IsEmpty());
}

TEST_F(StableIndicesTest, PlaceThatCanNotBeWrittenIsWarnedOfOnce) {
    write("");
    // Below a file there is no directory, whoever asks.
    LogCapture logged;
    StableIndices indices(file() + "/state/ifindex.sqlite", 1000, "interfaces");
    EXPECT_THAT(ask(indices, "A", lines(1)), ElementsAre(1000));
    EXPECT_THAT(ask(indices, "B", lines(1)), ElementsAre(1016));
    std::string const message = logged.take();
    EXPECT_EQ(std::ranges::count(message, '\n'), 1) << message;
    EXPECT_THAT(message, HasSubstr("--persistent-dir"));
}

TEST_F(StableIndicesTest, FileThatIsInUseIsLeftAlone) {
    auto first = open();
    ask(first, "A", lines(1));
    LogCapture logged;
    auto second = open();
    EXPECT_THAT(logged.take(), HasSubstr("another process uses it"));
    EXPECT_THAT(damagedFiles(), IsEmpty());
    EXPECT_THAT(ask(first, "B", lines(1)), ElementsAre(1016));
}

TEST_F(StableIndicesTest, MissingDirectoryIsMadeForItsOwnerOnly) {
    std::string const folder = m_folder + "/state";
    StableIndices const indices(folder + "/ifindex.sqlite", 1000, "interfaces");
    struct stat status {};
    ASSERT_EQ(stat(folder.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0700U);
}

constexpr SettingKey kFirst{Setting::LineStatusChangeTraps, 1000};
constexpr SettingKey kSecond{Setting::LinkUpDownTraps, 1001};

TEST_F(StableIndicesTest, SettingsAreTheSameAfterARestart) {
    {
        auto indices = open();
        EXPECT_THAT(indices.settings(), IsEmpty());
        indices.save({{kFirst, 1}, {kSecond, 1}});
        indices.save({{kSecond, 2}});
    }
    EXPECT_THAT(open().settings(), ElementsAre(SettingEntry{kFirst, 1}, SettingEntry{kSecond, 2}));
}

TEST_F(StableIndicesTest, ForgottenSettingIsGoneAfterARestart) {
    {
        auto indices = open();
        indices.save({{kFirst, 1}, {kSecond, 1}});
        indices.save({{kFirst, std::nullopt}});
    }
    EXPECT_THAT(open().settings(), ElementsAre(SettingEntry{kSecond, 1}));
}

TEST_F(StableIndicesTest, FileFromBeforeThereWereSettingsKeepsItsIndicesAndTakesSettings) {
    {
        auto indices = open();
        ask(indices, "A", lines(3));
    }
    execute("DROP TABLE setting");
    {
        auto indices = open();
        EXPECT_THAT(ask(indices, "A", lines(3)), ElementsAre(1000, 1001, 1002));
        indices.save({{kFirst, 1}});
    }
    EXPECT_THAT(damagedFiles(), IsEmpty());
    EXPECT_THAT(open().settings(), ElementsAre(SettingEntry{kFirst, 1}));
}

TEST_F(StableIndicesTest, SettingsWithoutAFileAreNotKeptAndNothingIsSaid) {
    LogCapture log;
    StableIndices indices("", 1000, "interfaces");
    indices.save({{kFirst, 1}});
    EXPECT_EQ(log.take(), "");
}

} // namespace
} // namespace kvloamd
