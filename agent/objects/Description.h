// SPDX-License-Identifier: BSD-2-Clause
// How managed objects are described: name, type, place in the tree, and where the value comes from.
//
// The descriptions are independent of protocols; all fronts use the same ones.
#pragma once

#include <algorithm>
#include <atomic>
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

/// What a text that can be set may consist of. Control characters are never accepted.
enum class Characters { Utf8, Ascii };

/// What can be set in a column of integers or of texts.
struct Writable {
    Setting setting;
    int lowest; ///< an enumeration without gaps is the range of its numbers; of a text: its length
    int highest;
    Characters characters = Characters::Utf8; ///< of a text
    /// The number that means: forget what was set, so that the row says what counts.
    std::optional<int> forgetting = std::nullopt;
};

/// A number of an enumeration, and its name in the MIB module.
struct NamedNumber {
    int number;
    char const* name;
};

/// All numbers of an enumeration.
using Names = std::span<NamedNumber const>;

/// What a value tells. It decides how other surfaces than SNMP show it.
enum class Kind {
    Information, ///< what something is
    State,       ///< one of several that something may be in
    Counter,     ///< only grows
    Gauge,       ///< goes up and down
    Time         ///< a date, or a time since the start
};

/// What there is to say about an object beyond its name, type and place. Written as a sentence:
///
///     about("The state of the line").oneOf(kStates)
///     about("What is wrong with the line, as a sum of bits").sumOf(kFailures)
///     about("Octets received").in("octets")
///     about("The name that operators gave").settable(kAlias).identifies()
struct Details {
    char const* help = "";                           ///< one line for people, without a full stop
    char const* unit = "";                           ///< in the plural; empty: none
    Names names = {};                                ///< of an enumeration, or of the bits of a set
    Names bits = {};                                 ///< of a sum: its powers of two
    bool hasOtherNumbers = false;                    ///< numbers without a name are legal as well
    std::optional<Writable> writable = std::nullopt; ///< nothing: the object is read-only
    bool isIdentifying = false;                      ///< people recognise the row by it
    std::optional<Kind> kind = std::nullopt;         ///< nothing: follows from the type

    constexpr Details oneOf(Names numbers) const {
        Details changed = *this;
        changed.names = numbers;
        return changed;
    }
    constexpr Details someOf(Names numbers) const {
        Details changed = oneOf(numbers);
        changed.hasOtherNumbers = true;
        return changed;
    }
    constexpr Details sumOf(Names powers) const {
        Details changed = *this;
        changed.bits = powers;
        return changed;
    }
    constexpr Details in(char const* what) const {
        Details changed = *this;
        changed.unit = what;
        return changed;
    }
    constexpr Details settable(Writable what) const {
        Details changed = *this;
        changed.writable = what;
        return changed;
    }
    constexpr Details identifies() const {
        Details changed = *this;
        changed.isIdentifying = true;
        return changed;
    }
    constexpr Details as(Kind what) const {
        Details changed = *this;
        changed.kind = what;
        return changed;
    }

    /// Whether the MIB module has a word for `value`. A value without one counts as not known.
    bool allows(Value const& value) const {
        auto const* const number = std::get_if<std::int64_t>(&value);
        return names.empty() || hasOtherNumbers || number == nullptr ||
               std::ranges::any_of(
                   names, [&](NamedNumber const& named) { return named.number == *number; });
    }
};

constexpr Details about(char const* help) {
    Details details;
    details.help = help;
    return details;
}

/// The kind of an object of this type.
constexpr Kind kindOf(ValueType type, Details const& details) {
    if (details.kind) return *details.kind;
    switch (type) {
    case ValueType::Counter:
    case ValueType::Counter64:
        return Kind::Counter;
    case ValueType::Gauge:
        return Kind::Gauge;
    case ValueType::TimeTicks:
    case ValueType::TimeStamp:
    case ValueType::BeginStamp:
    case ValueType::Date:
        return Kind::Time;
    default:
        return details.names.empty() ? Kind::Information : Kind::State;
    }
}

/// An object with one instance.
struct Scalar {
    char const* name;
    Oid place; ///< relative
    ValueType type;
    Value (*get)(Facts const&);
    Details details = {};
};

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

/// A table whose rows lie in a sorted sequence of the snapshot; a row says its own `index()`.
/// `From`: what gives the sequence of a snapshot, a member or a function.
template <class Row, auto From>
class RowTable : public Table {
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
        auto const isBefore = [&](Row const& row) {
            auto const order = compare(row.index(), index);
            return std::is_lt(order) || (std::is_eq(order) && !orEqual);
        };
        // A walk asks for the row after the last one, or for another column of it.
        std::size_t const last = m_lastFound.load(std::memory_order_relaxed);
        for (std::size_t const guess : {last + 1, last})
            if (guess > 0 && guess < all.size() && isBefore(all[guess - 1]) &&
                !isBefore(all[guess]))
                return found(guess);
        return found(static_cast<std::size_t>(
            std::partition_point(all.begin(), all.end(), isBefore) - all.begin()));
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
    std::size_t found(std::size_t row) const {
        m_lastFound.store(row, std::memory_order_relaxed);
        return row;
    }
    static auto const& rows(Facts const& facts) { return std::invoke(From, facts.snapshot); }

    char const* m_name;
    Oid m_entry;
    std::span<Column<Row> const> m_columns;
    mutable std::atomic<std::size_t> m_lastFound{0}; ///< where to look first, in whatever snapshot
};

} // namespace kvloamd
