// SPDX-License-Identifier: BSD-2-Clause
#include "agent/journal/NotificationLog.h"

#include <gmock/gmock.h>

#include "agent/readers/Answers.h"

namespace kvloamd {
namespace {

using std::chrono::hours;
using std::chrono::seconds;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class NotificationLogTest : public ::testing::Test {
  protected:
    JournalEntry entry(std::uint32_t number) const {
        JournalEntry entry;
        entry.sequence = number;
        entry.date = m_date;
        entry.notification = {{1, 3, number},
                              {{{1, 3, 9, 0}, VariableType::Integer32, std::int64_t{number}}}};
        return entry;
    }
    void add(std::uint32_t number) { m_log.add(entry(number), m_started + seconds(7)); }
    std::shared_ptr<NotificationLogRows const> rows() { return m_log.rows(m_started, m_date); }
    std::vector<std::uint32_t> numbers() {
        std::vector<std::uint32_t> all;
        for (NotificationRow const& row : rows()->notifications)
            all.push_back(row.number);
        return all;
    }

    Clock::time_point const m_started = Clock::now();
    std::chrono::system_clock::time_point m_date{seconds(1800000000)};
    NotificationLog m_log{hours(2), 3};
};

TEST_F(NotificationLogTest, NotificationIsARowWithItsVariables) {
    add(5);
    auto const all = rows();
    ASSERT_THAT(all->notifications, SizeIs(1));
    NotificationRow const& row = all->notifications.front();
    EXPECT_EQ(row.number, 5U);
    EXPECT_EQ(row.time, 700U);
    EXPECT_EQ(row.date, dateOctets(1800000000));
    EXPECT_EQ(row.name, (Oid{1, 3, 5}));
    ASSERT_THAT(all->variables, SizeIs(1));
    EXPECT_EQ(all->variables.front().index(), (std::array<std::uint32_t, 3>{0, 5, 1}));
    EXPECT_EQ(all->limit, 3U);
    EXPECT_EQ(all->age, 120U);
}

TEST_F(NotificationLogTest, OldestIsRemovedWhenTheLogIsFull) {
    for (std::uint32_t number = 1; number <= 5; ++number)
        add(number);
    EXPECT_THAT(numbers(), ElementsAre(3, 4, 5));
    EXPECT_EQ(rows()->logs.front().logged, 5U);
    EXPECT_EQ(rows()->logs.front().bumped, 2U);
}

TEST_F(NotificationLogTest, NotificationsThatAreTooOldAreRemoved) {
    add(1);
    m_date += hours(1);
    add(2);
    EXPECT_THAT(numbers(), ElementsAre(1, 2));
    m_date += hours(1) + seconds(1);
    EXPECT_THAT(numbers(), ElementsAre(2));
}

TEST_F(NotificationLogTest, ThoseOfEarlierRunsHaveNoTime) {
    m_log.load({entry(1), entry(2), entry(3), entry(4)});
    add(5);
    EXPECT_THAT(numbers(), ElementsAre(3, 4, 5));
    EXPECT_EQ(rows()->notifications.front().time, 0U);
    EXPECT_EQ(rows()->notifications.back().time, 700U);
    EXPECT_EQ(rows()->logs.front().logged, 1U);
}

TEST_F(NotificationLogTest, RowsAreAscendingWhateverTheOrderInWhichThreadsEnterThem) {
    add(2);
    add(1);
    EXPECT_THAT(numbers(), ElementsAre(1, 2));
}

TEST_F(NotificationLogTest, RowsAreMadeAgainOnlyWhenTheLogHasChanged) {
    add(1);
    auto const before = rows();
    EXPECT_EQ(rows(), before);
    add(2);
    EXPECT_NE(rows(), before);
}

TEST_F(NotificationLogTest, EntryWithoutANotificationIsNone) {
    m_log.add({}, m_started);
    m_log.load({JournalEntry{}});
    EXPECT_THAT(numbers(), IsEmpty());
}

} // namespace
} // namespace kvloamd
