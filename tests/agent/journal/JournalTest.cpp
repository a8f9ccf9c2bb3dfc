// SPDX-License-Identifier: BSD-2-Clause
#include "agent/journal/Journal.h"

#include <sys/resource.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include <gmock/gmock.h>

#include "tests/support/LogCapture.h"
#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::SizeIs;

JournalEntry entryOf(std::string text) {
    JournalEntry entry;
    entry.event = JournalEvent::BoardStatus;
    entry.date = std::chrono::system_clock::now();
    entry.text = std::move(text);
    return entry;
}

JournalEntry alarmEntry(JournalEvent event, std::uint32_t number) {
    JournalEntry entry = entryOf("alarm");
    entry.event = event;
    entry.alarm.emplace();
    entry.alarm->condition = {
        {AlarmKind::LineRcvAIS, "S1", number}, "board S1, line", 1, number, "why", "slot 3"};
    entry.alarm->severity = AlarmSeverity::Major;
    entry.alarm->count = 4;
    entry.alarm->began = std::chrono::system_clock::time_point(std::chrono::milliseconds(1234));
    entry.alarm->raised = std::chrono::system_clock::time_point(std::chrono::milliseconds(5678));
    return entry;
}

class JournalTest : public ::testing::Test {
  protected:
    std::string file() const { return m_folder.file("journal.sqlite"); }
    /// The texts of the entries on disk.
    std::vector<std::string> texts() const {
        std::vector<std::string> all;
        for (JournalEntry const& entry : JournalFile(file()).entries(1000000))
            all.push_back(entry.text);
        return all;
    }

    support::TemporaryDirectory m_folder;
};

TEST_F(JournalTest, EntriesAreOnDiskWithTheirNumbers) {
    {
        Journal journal(file());
        EXPECT_EQ(journal.append(entryOf("first")), 1U);
        EXPECT_EQ(journal.append(entryOf("second")), 2U);
        journal.flush();
        EXPECT_EQ(journal.counts().written, 2U);
    }
    EXPECT_THAT(texts(), ElementsAre("first", "second"));
}

TEST_F(JournalTest, NumbersContinueAfterAnOrderlyStop) {
    Journal(file()).append(entryOf("first"));
    {
        Journal journal(file());
        journal.append(entryOf("second"));
        journal.close({});
    }
    Journal journal(file());
    EXPECT_GT(journal.append(entryOf("third")), 2U);
    journal.close({});
    EXPECT_EQ(JournalFile(file()).nextSequence(), JournalFile(file()).entries(1)[0].sequence + 1);
}

TEST_F(JournalTest, JournalWithoutAFileGivesNumbers) {
    LogCapture log;
    Journal journal("");
    EXPECT_EQ(journal.append(entryOf("first")), 1U);
    EXPECT_EQ(journal.append(entryOf("second")), 2U);
    journal.flush();
    EXPECT_EQ(log.take(), "");
}

TEST_F(JournalTest, RaisedAlarmIsKnownAfterARestartWithEverythingAboutIt) {
    {
        Journal journal(file());
        journal.append(alarmEntry(JournalEvent::AlarmRaised, 1000));
        journal.append(alarmEntry(JournalEvent::AlarmRaised, 1001));
        journal.append(alarmEntry(JournalEvent::AlarmCleared, 1001));
        journal.flush();
    }
    Journal const journal(file());
    ASSERT_THAT(journal.formerAlarms(), SizeIs(1));
    Alarm const& former = journal.formerAlarms().front();
    Alarm const raised = *alarmEntry(JournalEvent::AlarmRaised, 1000).alarm;
    EXPECT_EQ(former.condition, raised.condition);
    EXPECT_EQ(former.severity, raised.severity);
    EXPECT_EQ(former.count, raised.count);
    EXPECT_EQ(former.began, raised.began);
    EXPECT_EQ(former.raised, raised.raised);
    EXPECT_EQ(former.number, 1U);
}

TEST_F(JournalTest, OrderlyStopKeepsTheCountsOfAlarms) {
    Alarm alarm = *alarmEntry(JournalEvent::AlarmRaised, 1000).alarm;
    {
        Journal journal(file());
        journal.append(alarmEntry(JournalEvent::AlarmRaised, 1000));
        alarm.count = 99;
        journal.close({alarm});
    }
    EXPECT_EQ(Journal(file()).formerAlarms().front().count, 99U);
}

TEST_F(JournalTest, OldestEntriesAreDeletedWhenThereAreTooMany) {
    JournalLimits limits;
    limits.entries = 100;
    {
        Journal journal(file(), limits);
        for (int i = 1; i <= 2500; ++i)
            journal.append(entryOf(std::to_string(i)));
        journal.close({});
    }
    auto const kept = texts();
    ASSERT_THAT(kept, SizeIs(100));
    EXPECT_EQ(kept.front(), "2401");
}

TEST_F(JournalTest, EntriesThatAreTooOldAreDeleted) {
    {
        Journal journal(file());
        JournalEntry old = entryOf("old");
        old.date -= JournalLimits{}.age + std::chrono::hours(1);
        journal.append(old);
        journal.append(entryOf("new"));
        journal.close({});
    }
    EXPECT_THAT(texts(), ElementsAre("new"));
}

TEST_F(JournalTest, DamagedFileIsSetAsideAndNumbersAreNotRepeated) {
    std::ofstream(file()) << std::string(10000, 'x');
    LogCapture log;
    std::uint32_t first = 0;
    {
        Journal journal(file());
        first = journal.append(entryOf("first"));
        journal.close({});
    }
    EXPECT_THAT(log.take(), HasSubstr("the journal is damaged"));
    // More than any journal can have given: one each second since its first version.
    EXPECT_GT(first, 20000000U);
    EXPECT_THAT(texts(), ElementsAre("first"));
}

TEST_F(JournalTest, DirectoryThatIsMissingCostsEntriesOnly) {
    LogCapture log;
    {
        Journal journal(m_folder.file("no/such/journal.sqlite"), {}, 10,
                        std::chrono::milliseconds(1));
        for (int i = 0; i < 30; ++i)
            EXPECT_NE(journal.append(entryOf("entry")), 0U);
        journal.flush();
        EXPECT_TRUE(journal.counts().failing);
        EXPECT_GE(journal.counts().lost, 20U);
        journal.close({});
    }
    std::string const text = log.take();
    EXPECT_THAT(text, HasSubstr("the journal cannot be written: "));
    EXPECT_THAT(text, HasSubstr("entries of the journal that are lost at the stop: 10"));
}

/// Files cannot grow beyond a limit while it exists, as on a full disk.
class FullDisk {
  public:
    explicit FullDisk(rlim_t limit) {
        std::signal(SIGXFSZ, SIG_IGN);
        getrlimit(RLIMIT_FSIZE, &m_former);
        rlimit const full{limit, m_former.rlim_max};
        setrlimit(RLIMIT_FSIZE, &full);
    }
    ~FullDisk() { setrlimit(RLIMIT_FSIZE, &m_former); }
    FullDisk(FullDisk const&) = delete;
    FullDisk& operator=(FullDisk const&) = delete;

  private:
    rlimit m_former{};
};

TEST_F(JournalTest, FullDiskCostsEntriesThatAreCountedAndNothingElse) {
    constexpr std::uint32_t kCapacity = 500;
    constexpr rlim_t kRoom = 65536;
    Journal journal(file(), {}, kCapacity, std::chrono::milliseconds(1));
    journal.append(entryOf("before"));
    journal.flush();
    std::uint32_t appended = 1;
    {
        LogCapture const log;
        FullDisk const full(kRoom);
        // Entries are lost when the queue is full, also before the disk is.
        while (!journal.counts().failing || journal.counts().lost == 0) {
            journal.append(entryOf(std::string(1000, 'x')));
            ++appended;
        }
    }
    // Room again: what waited is written.
    while (journal.counts().failing)
        std::this_thread::yield();
    journal.flush();
    journal.append(entryOf("after"));
    ++appended;
    journal.flush();
    EXPECT_EQ(journal.counts().written + journal.counts().lost, appended);
    journal.close({});
    auto const kept = texts();
    EXPECT_EQ(kept.size(), journal.counts().written);
    EXPECT_EQ(kept.front(), "before");
    EXPECT_EQ(kept.back(), "after");
}

class JournalReadingTest : public JournalTest {
  protected:
    static std::vector<std::uint32_t> numbers(std::optional<JournalPage> const& page) {
        std::vector<std::uint32_t> all;
        if (page)
            for (JournalRow const& row : page->rows)
                all.push_back(row.number);
        return all;
    }

    Journal m_journal{file()};
};

TEST_F(JournalReadingTest, NothingIsThereBeforeTheFirstEntry) {
    EXPECT_EQ(m_journal.newest(), 0U);
    auto const page = m_journal.entriesAfter(0, 10);
    ASSERT_TRUE(page);
    EXPECT_THAT(page->rows, IsEmpty());
    EXPECT_EQ(page->newest, 0U);
}

TEST_F(JournalReadingTest, EntriesAreReadInPagesWhileTheyAreWritten) {
    for (int i = 1; i <= 5; ++i)
        m_journal.append(entryOf(std::to_string(i)));
    m_journal.flush();
    EXPECT_EQ(m_journal.newest(), 5U);
    EXPECT_THAT(numbers(m_journal.entriesAfter(0, 2)), ElementsAre(1, 2));
    EXPECT_THAT(numbers(m_journal.entriesAfter(2, 2)), ElementsAre(3, 4));
    EXPECT_THAT(numbers(m_journal.entriesAfter(4, 2)), ElementsAre(5));
    EXPECT_THAT(numbers(m_journal.entriesAfter(5, 2)), IsEmpty());
    EXPECT_THAT(numbers(m_journal.newestEntries(2)), ElementsAre(4, 5));
    EXPECT_EQ(m_journal.entriesAfter(0, 2)->newest, 5U);
}

TEST_F(JournalReadingTest, EntryHasWhatWasRecordedOfItsAlarm) {
    m_journal.append(entryOf("board"));
    JournalEntry entry = alarmEntry(JournalEvent::AlarmRaised, 1000);
    entry.date = std::chrono::system_clock::time_point(std::chrono::milliseconds(98765));
    entry.board = "S1";
    entry.ifIndex = 1000;
    m_journal.append(entry);
    m_journal.flush();
    auto const page = m_journal.entriesAfter(0, 10);
    ASSERT_TRUE(page);
    ASSERT_THAT(page->rows, SizeIs(2));
    EXPECT_EQ(page->rows[0].event, "boardStatus");
    EXPECT_EQ(page->rows[0].alarm, "");
    EXPECT_EQ(page->rows[0].severity, 0);
    JournalRow const& row = page->rows[1];
    EXPECT_EQ(row.number, 2U);
    EXPECT_EQ(row.date, entry.date);
    EXPECT_EQ(row.event, "alarmRaised");
    EXPECT_EQ(row.text, "alarm");
    EXPECT_EQ(row.board, "S1");
    EXPECT_EQ(row.ifIndex, 1000U);
    EXPECT_EQ(row.alarm, "dsx1RcvAIS");
    EXPECT_EQ(row.severity, static_cast<int>(AlarmSeverity::Major));
    EXPECT_EQ(row.times, 4U);
}

TEST_F(JournalReadingTest, EntriesOfTheLastRunAreThereAtOnce) {
    m_journal.append(entryOf("before"));
    m_journal.close({});
    Journal const next(file());
    EXPECT_EQ(next.newest(), 1U);
    EXPECT_THAT(numbers(next.entriesAfter(0, 10)), ElementsAre(1));
}

TEST_F(JournalReadingTest, FileThatCannotBeReadIsNoPage) {
    m_journal.append(entryOf("before"));
    m_journal.close({});
    std::ofstream(file()) << std::string(10000, 'x');
    EXPECT_EQ(m_journal.entriesAfter(0, 10), std::nullopt);
}

TEST_F(JournalReadingTest, ReaderSeesWholeEntriesInOrderWhileAThreadWrites) {
    constexpr std::uint32_t kEntries = 3000;
    std::jthread const writer([this] {
        for (std::uint32_t i = 1; i <= kEntries; ++i)
            m_journal.append(entryOf(std::to_string(i)));
    });
    std::uint32_t last = 0;
    while (last < kEntries) {
        auto const page = m_journal.entriesAfter(last, 100);
        ASSERT_TRUE(page);
        for (JournalRow const& row : page->rows) {
            ASSERT_EQ(row.number, ++last);
            ASSERT_EQ(row.text, std::to_string(last));
        }
    }
}

TEST_F(JournalTest, JournalWithoutAFileHasNothingToRead) {
    Journal journal("");
    journal.append(entryOf("first"));
    EXPECT_EQ(journal.newest(), 0U);
    EXPECT_THAT(journal.entriesAfter(0, 10)->rows, IsEmpty());
}

LoggedNotification const kNotification{
    {1, 3, 6, 1, 4},
    {{{1, 3, 1}, VariableType::Integer32, std::int64_t{-5}},
     {{1, 3, 2}, VariableType::OctetString, std::string("a\0b", 3)},
     {{1, 3, 3}, VariableType::OctetString, std::string()},
     {{1, 3, 4}, VariableType::ObjectId, Oid{1, 3, 4294967295}},
     {{1, 3, 5}, VariableType::Counter64, static_cast<std::int64_t>(0xffffffffffffffffU)}}};

JournalEntry notificationEntry() {
    JournalEntry entry = entryOf("notification");
    entry.event = JournalEvent::Notification;
    entry.notification = kNotification;
    return entry;
}

TEST_F(JournalTest, NotificationsAreKnownAfterARestartWithTheirVariables) {
    {
        Journal journal(file());
        journal.append(entryOf("before"));
        journal.append(notificationEntry());
        journal.append(entryOf("between"));
        JournalEntry bare = notificationEntry();
        bare.notification->variables.clear();
        journal.append(bare);
        journal.flush();
    }
    auto const former = Journal(file()).takeFormerNotifications();
    ASSERT_THAT(former, SizeIs(2));
    EXPECT_EQ(former[0].sequence, 2U);
    EXPECT_EQ(former[0].notification, kNotification);
    EXPECT_EQ(former[1].sequence, 4U);
    EXPECT_THAT(former[1].notification->variables, IsEmpty());
}

TEST_F(JournalTest, OnlyTheNewestNotificationsAreReadAgain) {
    {
        Journal journal(file());
        for (int i = 0; i < 10; ++i)
            journal.append(notificationEntry());
    }
    auto const newest = JournalFile(file()).notifications(3);
    ASSERT_THAT(newest, SizeIs(3));
    EXPECT_EQ(newest.front().sequence, 8U);
    EXPECT_EQ(newest.back().notification, kNotification);
}

TEST_F(JournalTest, VariablesAreDeletedWithTheirNotification) {
    JournalLimits limits;
    limits.entries = 10;
    {
        Journal journal(file(), limits);
        for (int i = 0; i < 30; ++i)
            journal.append(notificationEntry());
        journal.close({});
    }
    Database database(file());
    EXPECT_EQ(database.number("SELECT count(*) FROM entry"), 10);
    EXPECT_EQ(database.number("SELECT count(DISTINCT sequence) FROM variable"), 10);
}

} // namespace
} // namespace kvloamd
