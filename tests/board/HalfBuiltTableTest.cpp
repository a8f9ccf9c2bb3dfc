// SPDX-License-Identifier: BSD-2-Clause
// Interval tables that the scheduler calls while they are under construction or destruction.
#include <gtest/gtest.h>

#include "board/DS1IntervalTable.h"
#include "core/ReferenceCounter.h"
#include "tests/board/DrivenScheduler.h"

namespace {

int s_asked = 0; ///< the number of `CollectSecond` and `CloseInterval` calls

/// A `SlowMember` takes three seconds for its construction and for its destruction. The scheduler
/// makes its passes meanwhile.
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

/// A table without a constructor and a destructor of its own.
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

/// A table whose pure operations are implemented by a further derived class.
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

/// A table whose constructor's body takes three seconds.
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
