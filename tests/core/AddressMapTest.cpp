// SPDX-License-Identifier: BSD-2-Clause
// The hash map of the reference table: what it finds, and how much work one operation is.
#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <vector>

#include <gtest/gtest.h>

#include "core/AddressMap.h"

namespace {

long s_looks = 0; ///< at keys of entries

/// An address that counts how often it is looked at. Every step of a search and every move of an
/// entry to another bucket looks at a key.
class CountedKey {
  public:
    CountedKey& operator=(void const* address) {
        m_address = address;
        return *this;
    }
    operator void const*() const { // NOLINT(google-explicit-constructor): in the place of a pointer
        ++s_looks;
        return m_address;
    }

  private:
    void const* m_address = nullptr;
};

struct Entry {
    CountedKey key;
    Entry* next = nullptr;
};

using Map = KVL::AddressMap<Entry>;

class AddressMapTest : public testing::Test {
  protected:
    /// The entries have the addresses `stride`, twice `stride`, and so on.
    void have(std::size_t entries, std::uintptr_t stride = 48) {
        m_entries = std::vector<Entry>(entries);
        for (std::size_t i = 0; i < entries; ++i)
            m_entries[i].key = address(i, stride);
        m_stride = stride;
    }
    static void const* address(std::size_t i, std::uintptr_t stride) {
        return reinterpret_cast<void const*>((i + 1) * stride); // NOLINT(*-no-int-to-ptr)
    }
    void const* address(std::size_t i) const { return address(i, m_stride); }

    void insert(std::size_t i) {
        m_map.insert(&m_entries[i]);
        if (m_provides && m_map.wantsSegment()) {
            auto segment = std::make_unique<Map::Segment>();
            m_map.provide(segment);
            EXPECT_EQ(segment, nullptr);
            ++m_segments;
        }
    }
    void insertAll() {
        for (std::size_t i = 0; i < m_entries.size(); ++i)
            insert(i);
    }
    void erase(std::size_t i) {
        ASSERT_EQ(m_map.erase(address(i)), &m_entries[i]);
        if (m_map.shrink() != nullptr) --m_segments;
    }
    bool finds(std::size_t i) { return m_map.find(address(i)) == &m_entries[i]; }
    bool findsFirst(std::size_t entries) {
        for (std::size_t i = 0; i < entries; ++i)
            if (!finds(i)) return false;
        return true;
    }
    std::size_t longestBucket() {
        std::size_t longest = 0;
        for (std::uint32_t bucket = 0; bucket < m_map.buckets(); ++bucket) {
            std::size_t length = 0;
            m_map.visit(bucket, [&](Entry const&) { ++length; });
            longest = std::max(longest, length);
        }
        return longest;
    }
    /// What `operation` looks at.
    template <class Operation>
    static long looksOf(Operation const& operation) {
        long const before = s_looks;
        operation();
        return s_looks - before;
    }

    Map m_map;
    std::vector<Entry> m_entries;
    std::uintptr_t m_stride = 0;
    bool m_provides = true;
    int m_segments = 0; ///< provided and not returned
};

TEST_F(AddressMapTest, EmptyMapFindsNothing) {
    have(1);
    EXPECT_EQ(m_map.find(address(0)), nullptr);
    EXPECT_EQ(m_map.erase(address(0)), nullptr);
    EXPECT_EQ(m_map.size(), 0U);
}

TEST_F(AddressMapTest, FindsWhatIsInItThroughGrowthAndErasure) {
    have(5000);
    std::vector<bool> in(m_entries.size(), false);
    std::size_t size = 0;
    std::uint32_t random = 12345;
    for (int step = 0; step < 60000; ++step) {
        random = random * 1664525U + 1013904223U;
        std::size_t const i = (random >> 8) % m_entries.size();
        in[i] ? erase(i) : insert(i);
        in[i] ? --size : ++size;
        in[i] = !in[i];
        ASSERT_EQ(m_map.size(), size);
    }
    for (std::size_t i = 0; i < m_entries.size(); ++i)
        EXPECT_EQ(finds(i), in[i]) << i;
}

TEST_F(AddressMapTest, AllEntriesAreFoundAfterEveryStepOfAGrowth) {
    have(1200);
    for (std::size_t i = 0; i < m_entries.size(); ++i) {
        insert(i);
        ASSERT_TRUE(findsFirst(i + 1)) << i;
    }
    EXPECT_GT(m_map.buckets(), 2 * Map::kSegmentSize) << "it has not grown twice";
}

TEST_F(AddressMapTest, AllEntriesAreFoundAfterEveryStepOfAShrinkage) {
    have(1200);
    insertAll();
    for (std::size_t i = m_entries.size(); i-- > 0;) {
        erase(i);
        ASSERT_TRUE(findsFirst(i)) << i;
        ASSERT_EQ(m_map.find(address(i)), nullptr);
    }
    EXPECT_EQ(m_map.buckets(), Map::kSegmentSize);
}

TEST_F(AddressMapTest, VisitMeetsEveryEntryOnce) {
    have(3000);
    insertAll();
    std::map<Entry const*, int> visits;
    for (std::uint32_t bucket = 0; bucket < m_map.buckets(); ++bucket)
        m_map.visit(bucket, [&](Entry const& entry) { ++visits[&entry]; });
    EXPECT_EQ(visits.size(), 3000U);
    for (auto const& [entry, number] : visits)
        EXPECT_EQ(number, 1);
}

TEST_F(AddressMapTest, NoOperationLooksAtManyEntriesWhateverTheSize) {
    constexpr long kMany = 64;
    have(200'000);
    long most = 0;
    for (std::size_t i = 0; i < m_entries.size(); ++i) {
        most = std::max(most, looksOf([&] { insert(i); }));
        most = std::max(most, looksOf([&] { m_map.find(address(i / 2)); }));
    }
    EXPECT_LE(most, kMany);
    most = 0;
    for (std::size_t i = 0; i < m_entries.size(); ++i)
        most = std::max(most, looksOf([&] { erase(i); }));
    EXPECT_LE(most, kMany);
}

TEST_F(AddressMapTest, BucketsAreAddedAndRemovedAFewAtATime) {
    have(20'000);
    std::uint32_t before = m_map.buckets();
    for (std::size_t i = 0; i < m_entries.size(); ++i) {
        insert(i);
        ASSERT_LE(m_map.buckets() - before, 4U);
        before = m_map.buckets();
    }
    EXPECT_GE(m_map.buckets(), 2 * m_map.size());
    for (std::size_t i = 0; i < m_entries.size(); ++i) {
        erase(i);
        ASSERT_LE(before - m_map.buckets(), 4U);
        before = m_map.buckets();
        ASSERT_LE(before, std::max(4 * m_map.size() + 8, Map::kSegmentSize));
    }
}

TEST_F(AddressMapTest, SegmentsAreReturnedWhenEntriesGo) {
    have(20'000);
    insertAll();
    int const most = m_segments;
    EXPECT_GE(most, 38);
    for (std::size_t i = 0; i < 15'000; ++i)
        erase(i);
    EXPECT_LE(m_segments, 20);
    for (std::size_t i = 15'000; i < 20'000; ++i)
        erase(i);
    EXPECT_EQ(m_segments, 0);
}

TEST_F(AddressMapTest, SegmentThatTheLastEntryAskedForIsReturned) {
    have(Map::kSegmentSize / 2 + 1);
    insertAll();
    EXPECT_EQ(m_segments, 1);
    for (std::size_t i = 0; i < m_entries.size(); ++i)
        erase(i);
    EXPECT_EQ(m_segments, 0);
}

TEST_F(AddressMapTest, MapThatGetsNoSegmentFindsEverythingAndCatchesUpWhenItDoes) {
    have(20'000);
    m_provides = false;
    for (std::size_t i = 0; i < 10'000; ++i)
        insert(i);
    EXPECT_EQ(m_map.buckets(), Map::kSegmentSize);
    EXPECT_TRUE(m_map.wantsSegment());
    EXPECT_TRUE(findsFirst(10'000));
    m_provides = true;
    for (std::size_t i = 10'000; i < 20'000; ++i)
        insert(i);
    EXPECT_TRUE(findsFirst(20'000));
    EXPECT_GE(m_map.buckets(), 2 * m_map.size());
}

TEST_F(AddressMapTest, SegmentThatIsNotWantedStaysWithTheCaller) {
    auto segment = std::make_unique<Map::Segment>();
    m_map.provide(segment);
    EXPECT_NE(segment, nullptr);
}

class AddressMapDistanceTest : public AddressMapTest,
                               public testing::WithParamInterface<std::uintptr_t> {};

TEST_P(AddressMapDistanceTest, BucketsStayShortForAddressesAtEqualDistances) {
    have(50'000, GetParam());
    insertAll();
    EXPECT_LE(longestBucket(), 12U);
}

INSTANTIATE_TEST_SUITE_P(Distances, AddressMapDistanceTest,
                         testing::Values(8, 16, 24, 48, 64, 80, 128, 192, 256, 1024, 2752, 4096,
                                         65536));

} // namespace
