// SPDX-License-Identifier: BSD-2-Clause
// Finds instances of managed objects by name, and the next one in order.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <vector>

#include "agent/objects/Description.h"

namespace kvloamd {

/// One instance and its value. The value is good while the facts that it came from are.
struct Instance {
    Oid name;       ///< relative
    OidView object; ///< the beginning of `name` that is the object's place; of the tree
    ValueType type = ValueType::Integer;
    Value value;
};

/// A table's column and its place.
struct TableColumn {
    Oid place; ///< relative
    Table const* table;
    std::size_t column;
};

enum class Lookup {
    Found,
    NoSuchObject,  ///< no object has this name
    NoSuchInstance ///< the object has no such instance, or its value is not known
};

/// Why an instance cannot be set, in the order of the checks.
enum class SetFault {
    None,
    NotWritable, ///< no such object, or it is read-only
    WrongType,   ///< the object takes integers, or octets
    WrongLength, ///< the object takes fewer octets
    WrongValue,  ///< none that the object takes
    NoCreation   ///< there is no such instance, and setting it would not make one
};

/// A setting and what it is to be; nothing: it is forgotten. `Settings::exchange` makes the change,
/// and undoes it.
struct Change {
    SettingKey key;
    std::optional<SettingValue> value;
};

/// An `ObjectTree` holds all scalars and columns in the order of their places. Thread-safe: nothing
/// but the place where a search begins ever changes. A search looks first where the last one ended;
/// if it does not find the name there, it is binary: over the objects, then over a table's rows.
class ObjectTree {
  public:
    /// `scalars` and `tables` outlive the tree.
    ObjectTree(std::span<Scalar const> scalars, std::span<Table const* const> tables);

    /// The value of the instance `name`; `found.name` and `found.object` stay as they are.
    Lookup find(Facts const& facts, OidView name, Instance& found) const;

    /// The first instance after `name`, or at `name` if `orEqual`. False when there is none.
    bool next(Facts const& facts, OidView name, bool orEqual, Instance& found) const;

    /// Whether the instance `name` can be set to `asked`, an integer or octets; nothing when the
    /// value is of another type. `change` is what to do, if it can.
    SetFault test(Facts const& facts, OidView name, Value const& asked,
                  std::optional<Change>& change) const;

    /// The columns of tables that are at `place` or below, ascending.
    std::vector<TableColumn> columnsBelow(OidView place) const;

  private:
    /// A scalar, or one column of a table.
    struct Node {
        Oid place;
        ValueType type;
        Scalar const* scalar;
        Table const* table;
        std::size_t column;
    };

    /// The first node whose place is above `name`.
    std::vector<Node>::const_iterator nodeAbove(OidView name) const;
    /// The node whose place `name` begins with; null when there is none.
    Node const* nodeOf(OidView name) const;
    /// Gives `found` the node's value, if it is known.
    static bool fill(Instance& found, Node const& node, Facts const& facts, Value const& value);
    static bool firstIn(Node const& node, Facts const& facts, OidView index, bool orEqual,
                        Instance& found);

    std::vector<Node> m_nodes; ///< ascending; no place is the beginning of another
    mutable std::atomic<std::size_t> m_lastAbove{1}; ///< what `nodeAbove` found last, and where it
                                                     ///< looks first
};

} // namespace kvloamd
