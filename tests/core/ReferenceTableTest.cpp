// SPDX-License-Identifier: BSD-2-Clause
// The reference table: records, their number, and the dump.
#include <cstdint>
#include <iostream>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include <gtest/gtest.h>

#include "core/ReferenceCounter.h"

class ReferenceTableTestObject : public Object {
  public:
    ReferenceTableTestObject() : Object(false) {}
};

namespace {

using Handle = ReferenceCounter<ReferenceTableTestObject>;

/// A table besides the one that the process has.
class OwnTable : public ReferenceTable {
  public:
    OwnTable() = default;
    using ReferenceTable::lockable;
};

class ReferenceTableTest : public testing::Test {
  protected:
    static std::string dump(ReferenceTable& table) {
        std::ostringstream text;
        auto* const before = std::cout.rdbuf(text.rdbuf());
        table.dump();
        std::cout.rdbuf(before);
        return text.str();
    }

    static std::string address(Object const* object) {
        return std::to_string(reinterpret_cast<std::uintptr_t>(object));
    }

    OwnTable m_table;
};

TEST_F(ReferenceTableTest, DumpOfAnEmptyTableIsItsFrame) {
    EXPECT_EQ(dump(m_table), "\n##Start of ReferenceTable:\n##End of ReferenceTable\n");
}

TEST_F(ReferenceTableTest, DumpShowsCountDecimalAddressAndTypeName) {
    auto* object = new ReferenceTableTestObject;
    Handle const first(object);
    Handle const second(object);
    EXPECT_NE(dump(*ReferenceTable::get_instance())
                  .find("   RefCount    2    obj: Object pointer address is 0x" + address(object) +
                        "[24ReferenceTableTestObject]\n"),
              std::string::npos);
}

TEST_F(ReferenceTableTest, DumpWritesAddressesInTheBaseOfTheStream) {
    ReferenceTableTestObject object;
    m_table.create_refinfo(&object);
    std::cout << std::hex;
    std::string const text = dump(m_table);
    std::cout << std::dec;
    std::ostringstream hexadecimal;
    hexadecimal << std::hex << reinterpret_cast<std::uintptr_t>(&object);
    EXPECT_NE(text.find("address is 0x" + hexadecimal.str() + "["), std::string::npos);
    m_table.destroy_refcount(&object);
}

TEST_F(ReferenceTableTest, DumpIsInTheOrderOfAddresses) {
    std::vector<ReferenceTableTestObject> objects(100);
    for (std::size_t i = 0; i < objects.size(); ++i)
        m_table.create_refinfo(&objects[(i * 37) % objects.size()]);
    std::string const text = dump(m_table);
    std::size_t last = 0;
    for (auto const& object : objects) {
        std::size_t const found = text.find("0x" + address(&object) + "[");
        ASSERT_NE(found, std::string::npos);
        EXPECT_GT(found, last);
        last = found;
    }
    for (auto& object : objects)
        m_table.destroy_refcount(&object);
}

TEST_F(ReferenceTableTest, DumpDoesNotHoldTheLockWhileItWrites) {
    /// A stream buffer that tries the table's lock from another thread at every write.
    class Trying : public std::stringbuf {
      public:
        explicit Trying(KVLLockable* lock) : m_lock(lock) {}
        int writes() const { return m_writes; }
        int refused() const { return m_refused; }

      protected:
        std::streamsize xsputn(char const* text, std::streamsize size) override {
            tryLock();
            return std::stringbuf::xsputn(text, size);
        }
        int_type overflow(int_type character) override {
            tryLock();
            return std::stringbuf::overflow(character);
        }

      private:
        void tryLock() {
            ++m_writes;
            std::thread([this] {
                if (m_lock->trylock() == KVLLockOk)
                    m_lock->unlock();
                else
                    ++m_refused;
            }).join();
        }

        KVLLockable* m_lock;
        int m_writes = 0;
        int m_refused = 0;
    };
    ReferenceTableTestObject object;
    m_table.create_refinfo(&object);
    Trying buffer(m_table.lockable());
    auto* const before = std::cout.rdbuf(&buffer);
    m_table.dump();
    std::cout.rdbuf(before);
    EXPECT_GT(buffer.writes(), 0);
    EXPECT_EQ(buffer.refused(), 0);
    EXPECT_NE(buffer.str().find("##End of ReferenceTable"), std::string::npos);
    m_table.destroy_refcount(&object);
}

TEST_F(ReferenceTableTest, NumberOfObjectsIsZeroBeforeAnyHandleAndReturnsToItsFormerValue) {
    EXPECT_EQ(m_table.referenced_objects(), 0);
    ReferenceTable& shared = *ReferenceTable::get_instance();
    int const before = shared.referenced_objects();
    {
        Handle const one(new ReferenceTableTestObject);
        Handle const same(one);
        Handle const two(new ReferenceTableTestObject);
        EXPECT_EQ(shared.referenced_objects(), before + 2);
    }
    EXPECT_EQ(shared.referenced_objects(), before);
}

TEST_F(ReferenceTableTest, NullHasNoRecord) {
    EXPECT_EQ(m_table.get_refinfo(nullptr), nullptr);
    EXPECT_EQ(m_table.create_refinfo(nullptr), nullptr);
    m_table.destroy_refcount(nullptr);
    EXPECT_EQ(m_table.referenced_objects(), 0);
}

TEST_F(ReferenceTableTest, RecordIsMadeOnceWithCountZero) {
    ReferenceTableTestObject object;
    EXPECT_EQ(m_table.get_refinfo(&object), nullptr);
    ReferenceInfo* const record = m_table.create_refinfo(&object);
    EXPECT_EQ(record->count(), 0);
    EXPECT_EQ(m_table.create_refinfo(&object), record);
    EXPECT_EQ(m_table.get_refinfo(&object), record);
    m_table.destroy_refcount(&object);
    EXPECT_EQ(m_table.get_refinfo(&object), nullptr);
}

TEST_F(ReferenceTableTest, RecordIsMadeOnlyWhenTheDerivedTableKnowsNone) {
    /// A table whose objects all share one record.
    class SharedRecord : public OwnTable {
      public:
        ReferenceInfo* get_refinfo(Object* /*object*/) override { return &m_record; }
        ReferenceInfo m_record;
    };
    SharedRecord table;
    ReferenceTableTestObject object;
    EXPECT_EQ(table.create_refinfo(&object), &table.m_record);
    EXPECT_EQ(table.referenced_objects(), 0);
}

TEST_F(ReferenceTableTest, RecordOfALaterObjectStartsAtZero) {
    ReferenceTableTestObject object;
    ReferenceInfo* const record = m_table.create_refinfo(&object);
    record->lock();
    record->raise();
    record->unlock();
    m_table.destroy_refcount(&object);
    EXPECT_EQ(m_table.create_refinfo(&object)->count(), 0);
    m_table.destroy_refcount(&object);
}

TEST_F(ReferenceTableTest, AddressOfADeletedObjectHasNoRecord) {
    auto* object = new ReferenceTableTestObject;
    { Handle const handle(object); }
    EXPECT_EQ(ReferenceTable::get_instance()->get_refinfo(object),
              nullptr); // NOLINT: only compared
}

} // namespace
