// SPDX-License-Identifier: BSD-2-Clause
// Interval tables that the scheduler meets while they are being built or destroyed.
#include <gtest/gtest.h>

#include "board/DS1IntervalTable.h"
#include "core/ReferenceCounter.h"
#include "tests/board/DrivenScheduler.h"

namespace {

int s_asked = 0; ///< how often the scheduler has asked a table for something

/// A member whose construction and destruction take some seconds, during which the scheduler comes
/// by.
class SlowMember {
  public:
    explicit SlowMember(Schedulable* table) : m_table(table) { hesitate(); }
    ~SlowMember() { hesitate(); }
    SlowMember(SlowMember const&) = delete;
    SlowMember& operator=(SlowMember const&) = delete;

  private:
    void hesitate() {
        auto& scheduler = DrivenScheduler::install();
        EXPECT_EQ(scheduler.AddPeriodic(m_table, 1), 1) << "the table is not on the list";
        scheduler.passSeconds(3);
    }

    Schedulable* m_table;
};

/// A complete table with nothing special about its constructor and destructor.
class Table : public DS1IntervalTable {
  public:
    int GetControlledSlipSeconds(int /*n*/) override { return 0; }
    int GetDegradedMinutes(int /*n*/) override { return 0; }
    int CollectSecond() override { return ++s_asked; }
    int CloseInterval() override { return ++s_asked; }
};

class TableWithSlowMember final : public Table {
    SlowMember m_member{this};
};

/// Leaves the pure operations to a further class.
class AbstractTable : public DS1IntervalTable {
    SlowMember m_member{this};
};

class TableBehindAbstractOne final : public AbstractTable {
  public:
    int GetControlledSlipSeconds(int /*n*/) override { return 0; }
    int GetDegradedMinutes(int /*n*/) override { return 0; }
    int CollectSecond() override { return ++s_asked; }
    int CloseInterval() override { return ++s_asked; }
};

/// Whose constructor's body takes its time.
class SlowlyFilledTable final : public Table {
  public:
    SlowlyFilledTable() { SlowMember const pause(this); }
};

template <class T>
class HalfBuiltTableTest : public testing::Test {
  protected:
    HalfBuiltTableTest() { s_asked = 0; }

    DrivenScheduler& m_scheduler = DrivenScheduler::install();
};

using Tables = testing::Types<TableWithSlowMember, TableBehindAbstractOne, SlowlyFilledTable>;
TYPED_TEST_SUITE(HalfBuiltTableTest, Tables, );

TYPED_TEST(HalfBuiltTableTest, IsNotTickedDuringConstruction) {
    auto* const table = new TypeParam;
    EXPECT_EQ(s_asked, 0);
    ReferenceCounter<DS1IntervalTable> const handle(table);
}

TYPED_TEST(HalfBuiltTableTest, IsTickedFromItsFirstHandleOn) {
    ReferenceCounter<DS1IntervalTable> const handle(new TypeParam);
    this->m_scheduler.passSeconds(1);
    EXPECT_EQ(s_asked, 1);
}

TYPED_TEST(HalfBuiltTableTest, IsNotTickedDuringDestruction) {
    ReferenceCounter<DS1IntervalTable> handle(new TypeParam);
    handle = {};
    EXPECT_EQ(s_asked, 0);
}

} // namespace
