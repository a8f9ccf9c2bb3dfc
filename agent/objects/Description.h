// SPDX-License-Identifier: BSD-2-Clause
// How managed objects are described: name, type, place in the tree, and where the value comes from.
//
// The descriptions are independent of protocols; all fronts use the same ones.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <span>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "agent/objects/Value.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// An object with one instance.
struct Scalar {
    char const* name;
    Oid place; ///< relative
    ValueType type;
    Value (*get)(Facts const&);
};

/// What a text that can be set may consist of. Control characters are never accepted.
enum class Characters { Utf8, Ascii };

/// What can be set in a column of integers or of texts.
struct Writable {
    Setting setting;
    int lowest; ///< an enumeration without gaps is the range of its numbers; of a text: its length
    int highest;
    Characters characters = Characters::Utf8; ///< of a text
};

/// A number of an enumeration, and its name in the MIB module.
struct NamedNumber {
    int number;
    char const* name;
};

/// All numbers of an enumeration.
using Names = std::span<NamedNumber const>;

/// What there is to say about an object beyond its name, type and place.
struct Details {
    constexpr Details() = default;
    /// An object that can be set.
    constexpr Details(Writable what)
        : writable(what) {} // NOLINT(google-explicit-constructor): reads well in tables

    std::optional<Writable> writable; ///< nothing: the object is read-only
    Names names;                      ///< of an enumeration; otherwise empty

    /// The same with the numbers that it may have. Any other number counts as not known.
    constexpr Details named(Names numbers) const {
        Details changed = *this;
        changed.names = numbers;
        return changed;
    }
    /// Whether the MIB module has a word for `value`.
    bool allows(Value const& value) const {
        auto const* const number = std::get_if<std::int64_t>(&value);
        return names.empty() || number == nullptr ||
               std::ranges::any_of(
                   names, [&](NamedNumber const& named) { return named.number == *number; });
    }
};

/// The details of an enumeration.
constexpr Details oneOf(Names numbers) {
    return Details().named(numbers);
}

struct ColumnHead {
    char const* name;
    std::uint32_t number; ///< in the table's entry
    ValueType type;
    Details details = {};
};

/// A table: columns ascending by number, rows ascending by index.
class Table {
  public:
    virtual ~Table() = default;

    virtual char const* name() const = 0;
    /// The place of the table's entry, relative.
    virtual Oid const& entry() const = 0;
    virtual std::size_t columnCount() const = 0;
    virtual ColumnHead column(std::size_t column) const = 0;
    virtual std::size_t rowCount(Facts const& facts) const = 0;
    /// Appends the row's index to `name`.
    virtual void appendIndex(Facts const& facts, std::size_t row, Oid& name) const = 0;
    /// The first row whose index is above `index`, or is `index` if `orEqual`; `rowCount` when
    /// there is none.
    virtual std::size_t firstRow(Facts const& facts, OidView index, bool orEqual) const = 0;
    virtual Value value(Facts const& facts, std::size_t column, std::size_t row) const = 0;
};

template <class Row>
struct Column {
    char const* name;
    std::uint32_t number;
    ValueType type;
    Value (*get)(Row const&);
    Details details = {}; ///< if the column can be set, `get` says what counts until it is
};

/// A table whose rows lie in a sorted vector of the snapshot; a row says its own `index()`.
/// `Rows`: what gives the vector of a snapshot, a member or a function.
template <class Row, auto Rows>
class RowTable final : public Table {
  public:
    RowTable(char const* name, Oid entry, std::span<Column<Row> const> columns)
        : m_name(name), m_entry(std::move(entry)), m_columns(columns) {}

    char const* name() const override { return m_name; }
    Oid const& entry() const override { return m_entry; }
    std::size_t columnCount() const override { return m_columns.size(); }
    ColumnHead column(std::size_t column) const override {
        Column<Row> const& described = m_columns[column];
        return {described.name, described.number, described.type, described.details};
    }
    std::size_t rowCount(Facts const& facts) const override { return rows(facts).size(); }
    void appendIndex(Facts const& facts, std::size_t row, Oid& name) const override {
        auto const index = rows(facts)[row].index();
        name.insert(name.end(), index.begin(), index.end());
    }
    std::size_t firstRow(Facts const& facts, OidView index, bool orEqual) const override {
        auto const& all = rows(facts);
        auto const found = std::partition_point(all.begin(), all.end(), [&](Row const& row) {
            auto const order = compare(row.index(), index);
            return std::is_lt(order) || (std::is_eq(order) && !orEqual);
        });
        return static_cast<std::size_t>(found - all.begin());
    }
    Value value(Facts const& facts, std::size_t column, std::size_t row) const override {
        Column<Row> const& described = m_columns[column];
        Row const& asked = rows(facts)[row];
        Value value = described.get(asked);
        if (!described.details.allows(value)) return {};
        auto const& writable = described.details.writable;
        if (!writable || facts.settings == nullptr || !isKnown(value)) return value;
        auto set = facts.settings->value({writable->setting, asked.index().front()});
        if (!set) return value;
        if (auto* const text = std::get_if<std::string>(&*set)) return std::move(*text);
        return std::int64_t{std::get<int>(*set)};
    }

  private:
    static std::vector<Row> const& rows(Facts const& facts) {
        return std::invoke(Rows, facts.snapshot);
    }

    char const* m_name;
    Oid m_entry;
    std::span<Column<Row> const> m_columns;
};

} // namespace kvloamd
