// SPDX-License-Identifier: BSD-2-Clause
// The rows of a table, which snapshots share.
#pragma once

#include <algorithm>
#include <compare>
#include <cstddef>
#include <functional>
#include <initializer_list>
#include <iterator>
#include <memory>
#include <span>
#include <stdexcept>
#include <type_traits>
#include <utility>
#include <vector>

namespace kvloamd {

/// A `Rows` is a sequence of rows that are read like those of a vector. Copies of it share their
/// rows, and so may sequences that were put together from the same parts: a row is never changed
/// in place once two sequences may have it; `edit` gives a sequence a row of its own.
///
/// Unsynchronised; different sequences are independent, whatever they share.
template <class Row>
class Rows {
    using Places = std::vector<Row const*>;

  public:
    /// Goes through the rows, which it cannot change.
    class Iterator {
      public:
        using iterator_concept = std::random_access_iterator_tag;
        using iterator_category = std::random_access_iterator_tag;
        using value_type = Row;
        using difference_type = std::ptrdiff_t;
        using pointer = Row const*;
        using reference = Row const&;

        Iterator() = default;
        explicit Iterator(Row const* const* place) : m_place(place) {}

        reference operator*() const { return **m_place; }
        pointer operator->() const { return *m_place; }
        reference operator[](difference_type n) const { return *m_place[n]; }
        Iterator& operator++() { return *this += 1; }
        Iterator operator++(int) { return std::exchange(*this, *this + 1); }
        Iterator& operator--() { return *this -= 1; }
        Iterator operator--(int) { return std::exchange(*this, *this - 1); }
        Iterator& operator+=(difference_type n) {
            m_place += n;
            return *this;
        }
        Iterator& operator-=(difference_type n) { return *this += -n; }
        friend Iterator operator+(Iterator from, difference_type n) { return from += n; }
        friend Iterator operator+(difference_type n, Iterator from) { return from += n; }
        friend Iterator operator-(Iterator from, difference_type n) { return from -= n; }
        friend difference_type operator-(Iterator a, Iterator b) { return a.m_place - b.m_place; }
        auto operator<=>(Iterator const&) const = default;

      private:
        Row const* const* m_place = nullptr;
    };

    using value_type = Row;
    using size_type = std::size_t;
    using const_iterator = Iterator;
    using iterator = Iterator;
    using const_reference = Row const&;

    Rows() = default;
    Rows(std::initializer_list<Row> rows) : Rows(std::vector<Row>(rows)) {}
    Rows(std::vector<Row> rows) {
        auto const part = std::make_shared<std::vector<Row> const>(std::move(rows));
        append(*part, part);
    }

    std::size_t size() const { return m_contents ? m_contents->places.size() : 0; }
    bool empty() const { return size() == 0; }
    Row const& operator[](std::size_t place) const { return *m_contents->places[place]; }
    /// Throws `std::out_of_range`.
    Row const& at(std::size_t place) const {
        if (place >= size()) throw std::out_of_range("there is no such row");
        return (*this)[place];
    }
    Row const& front() const { return (*this)[0]; }
    Row const& back() const { return (*this)[size() - 1]; }
    Iterator begin() const { return Iterator(m_contents ? m_contents->places.data() : nullptr); }
    Iterator end() const { return begin() + static_cast<std::ptrdiff_t>(size()); }

    /// Whether both are the same rows in memory, so that nothing differs between them. False for
    /// rows that are merely equal.
    bool shares(Rows const& other) const { return m_contents == other.m_contents; }
    bool operator==(Rows const& other) const {
        if (shares(other)) return true;
        if (size() != other.size()) return false;
        for (std::size_t place = 0; place < size(); ++place)
            if (&(*this)[place] != &other[place] && !((*this)[place] == other[place])) return false;
        return true;
    }

    void clear() { m_contents.reset(); }
    void push_back(Row row) { add(std::make_shared<Row>(std::move(row))); }
    /// The row can be changed until the sequence is copied.
    Row& emplace_back() { return add(std::make_shared<Row>()); }
    /// Appends rows as they are made by default, or removes the last ones.
    void resize(std::size_t size) {
        while (this->size() < size)
            emplace_back();
        if (this->size() > size) own().places.resize(size);
    }
    /// Gives the sequence a row of its own in the place of this one, with the same contents. It can
    /// be changed until the sequence is copied.
    Row& edit(std::size_t place) {
        auto row = std::make_shared<Row>((*this)[place]);
        Contents& contents = own();
        contents.places[place] = row.get();
        contents.owners.push_back(row);
        return *row;
    }

    /// Edits every row: calls `change(Row&)` for each.
    template <class Change>
    void editAll(Change const& change) {
        for (std::size_t place = 0; place < size(); ++place)
            change(edit(place));
    }

    void reserve(std::size_t size) { own().places.reserve(size); }
    /// Appends rows that lie in `owner`, or in what it owns, and that nobody changes any more. An
    /// owner that is null is one that an earlier call has named.
    void append(std::span<Row const> rows, std::shared_ptr<void const> owner) {
        Contents& contents = own();
        for (Row const& row : rows)
            contents.places.push_back(&row);
        if (owner) contents.owners.push_back(std::move(owner));
    }
    /// Puts the rows `come`, which lie in `owners`, in the place of those that have the indices of
    /// `gone`. The sequence and both lists are ascending by index, each without an index twice.
    void exchange(std::span<Row const* const> gone, std::span<Row const* const> come,
                  std::span<std::shared_ptr<void const> const> owners) {
        auto const index = [](Row const* row) { return row->index(); };
        auto const next = std::make_shared<Contents>();
        if (m_contents) next->owners = m_contents->owners;
        next->owners.insert(next->owners.end(), owners.begin(), owners.end());
        Places const none;
        Places const& former = m_contents ? m_contents->places : none;
        next->places.reserve(former.size() + come.size());
        auto from = former.begin();
        while (!gone.empty() || !come.empty()) {
            bool const takesOut =
                come.empty() || (!gone.empty() && index(gone.front()) <= index(come.front()));
            auto& rows = takesOut ? gone : come;
            auto const to =
                std::ranges::lower_bound(from, former.end(), index(rows.front()), {}, index);
            next->places.insert(next->places.end(), from, to);
            from = to;
            if (!takesOut)
                next->places.push_back(rows.front());
            else if (from != former.end() && index(*from) == index(rows.front()))
                ++from;
            rows = rows.subspan(1);
        }
        next->places.insert(next->places.end(), from, former.end());
        m_contents = next;
    }
    /// Sorts the sequence by what `index` says of a row.
    template <class Index>
    void sortBy(Index index) {
        auto const of = [&](Row const* row) { return std::invoke(index, *row); };
        std::ranges::sort(own().places, {}, of);
    }

  private:
    struct Contents {
        Places places;
        std::vector<std::shared_ptr<void const>> owners; ///< of the rows
    };

    Row& add(std::shared_ptr<Row> row) {
        Contents& contents = own();
        contents.places.push_back(row.get());
        Row& added = *row;
        contents.owners.push_back(std::move(row));
        return added;
    }
    /// The contents, of which no other sequence has the same.
    Contents& own() {
        if (!m_contents)
            m_contents = std::make_shared<Contents>();
        else if (m_contents.use_count() > 1)
            m_contents = std::make_shared<Contents>(*m_contents);
        return *m_contents;
    }

    std::shared_ptr<Contents> m_contents; ///< null: none
};

} // namespace kvloamd
