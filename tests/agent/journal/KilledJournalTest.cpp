// SPDX-License-Identifier: BSD-2-Clause
// A process that writes the journal is killed at any moment.
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <map>
#include <random>
#include <string>
#include <utility>

#include <gtest/gtest.h>

#include "agent/journal/Journal.h"
#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

constexpr int kAlarms = 5;

/// Raises and clears alarms, and writes to `acknowledge` the number of every entry: "g" when it was
/// given, "w" when it was written.
[[noreturn]] void writeForEver(std::string const& file, int acknowledge, unsigned seed) {
    std::mt19937 random(seed);
    Journal journal(file);
    std::map<std::uint32_t, bool> raised;
    for (Alarm const& alarm : journal.formerAlarms())
        raised[alarm.condition.key.number] = true;
    auto const say = [&](char what, std::uint32_t number) {
        std::string const line = what + std::to_string(number) + "\n";
        if (write(acknowledge, line.data(), line.size()) < 0) _exit(1);
    };
    for (;;) {
        auto const number = static_cast<std::uint32_t>(random() % kAlarms);
        JournalEntry entry;
        entry.event = raised[number] ? JournalEvent::AlarmCleared : JournalEvent::AlarmRaised;
        raised[number] = !raised[number];
        entry.text = std::to_string(number);
        entry.date = std::chrono::system_clock::now();
        entry.alarm.emplace();
        entry.alarm->condition.key = {AlarmKind::LineRcvAIS, "S1", number};
        std::uint32_t const sequence = journal.append(entry);
        say('g', sequence);
        if (random() % 4 == 0) {
            journal.flush();
            say('w', sequence);
        }
    }
}

class KilledJournalTest : public ::testing::Test {
  protected:
    /// Starts a writer, reads `lines` lines of it, and kills it.
    void runAndKill(unsigned seed, int lines) {
        int ends[2];
        ASSERT_EQ(pipe(ends), 0);
        pid_t const writer = fork();
        ASSERT_GE(writer, 0);
        if (writer == 0) {
            close(ends[0]);
            writeForEver(m_file, ends[1], seed);
        }
        close(ends[1]);
        FILE* const stream = fdopen(ends[0], "r");
        char line[32];
        auto const next = [&] { return std::fgets(line, sizeof line, stream) != nullptr; };
        bool first = true;
        auto const take = [&] {
            if (std::string(line).back() != '\n') return;
            auto const number = static_cast<std::uint32_t>(std::stoul(line + 1));
            if (std::exchange(first, false)) {
                EXPECT_GT(number, m_highest) << "a number was given twice";
            }
            m_highest = std::max(m_highest, number);
            if (line[0] == 'w') m_written = number;
        };
        for (int i = 0; i < lines && next(); ++i)
            take();
        kill(writer, SIGKILL);
        while (next())
            take();
        std::fclose(stream);
        int status = 0;
        ASSERT_EQ(waitpid(writer, &status, 0), writer);
        EXPECT_TRUE(WIFSIGNALED(status)) << "the writer ended by itself";
    }
    /// What is on disk is whole, and the active alarms are those that the entries say.
    void expectSound() {
        JournalFile file(m_file);
        std::uint32_t last = 0;
        int unsaid = 0;
        std::map<std::uint32_t, bool> raised;
        for (JournalEntry const& entry : file.entries(1000000)) {
            unsaid += entry.sequence > m_highest ? 1 : 0;
            EXPECT_GT(entry.sequence, last);
            last = entry.sequence;
            bool const raises = entry.event == JournalEvent::AlarmRaised;
            bool& is = raised[static_cast<std::uint32_t>(std::stoul(entry.text))];
            EXPECT_NE(is, raises) << entry.sequence;
            is = raises;
        }
        EXPECT_GE(last, m_written) << "an entry that had been written is missing";
        // The journal may write an entry before its writer comes to say the number.
        EXPECT_LE(unsaid, 1) << "entries that no writer appended";
        m_highest = std::max(m_highest, last);
        std::map<std::uint32_t, bool> active;
        for (Alarm const& alarm : file.activeAlarms())
            active[alarm.condition.key.number] = true;
        std::erase_if(raised, [](auto const& entry) { return !entry.second; });
        EXPECT_EQ(active, raised);
    }

    support::TemporaryDirectory m_folder;
    std::string m_file = m_folder.file("journal.sqlite");
    std::uint32_t m_highest = 0;
    std::uint32_t m_written = 0;
};

TEST_F(KilledJournalTest, EntriesAndAlarmsAreWholeAfterTwoHundredKills) {
    constexpr unsigned kKills = 200;
    std::mt19937 random(1);
    for (unsigned kill = 0; kill < kKills; ++kill) {
        ASSERT_NO_FATAL_FAILURE(runAndKill(kill, static_cast<int>(random() % 40)));
        expectSound();
        ASSERT_FALSE(HasFailure()) << "after kill " << kill;
    }
    EXPECT_GT(m_written, 0U);
}

} // namespace
} // namespace kvloamd
