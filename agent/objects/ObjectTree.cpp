// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/ObjectTree.h"

#include <algorithm>
#include <cstddef>
#include <string>
#include <utility>

#include "agent/objects/TextCheck.h"

namespace kvloamd {

namespace {

/// A scalar's one instance.
constexpr std::uint32_t kScalarIndex[] = {0};

/// Whether a column that is `writable` takes `asked`; then `value` is what to set.
SetFault accept(Writable const& writable, ValueType type, Value const& asked,
                std::optional<SettingValue>& value) {
    if (type == ValueType::Integer) {
        auto const* const integer = std::get_if<std::int64_t>(&asked);
        if (integer == nullptr) return SetFault::WrongType;
        if (*integer < writable.lowest || *integer > writable.highest) return SetFault::WrongValue;
        if (writable.forgetting != *integer) value = static_cast<int>(*integer);
        return SetFault::None;
    }
    auto const octets = octetsOf(asked);
    if (!octets) return SetFault::WrongType;
    auto const length = static_cast<std::ptrdiff_t>(octets->size());
    if (length < writable.lowest || length > writable.highest) return SetFault::WrongLength;
    if (!isText(*octets) || (writable.characters == Characters::Ascii && !isAscii(*octets)))
        return SetFault::WrongValue;
    value = std::string(*octets);
    return SetFault::None;
}

/// An instance's whole name, from the root on; longer ones have to be made room for.
constexpr std::size_t kUsualName = 20;

} // namespace

ObjectTree::ObjectTree(std::span<Scalar const> scalars, std::span<Table const* const> tables) {
    for (Scalar const& scalar : scalars)
        m_nodes.push_back({scalar.place, scalar.type, &scalar, nullptr, 0});
    for (Table const* const table : tables) {
        for (std::size_t column = 0; column < table->columnCount(); ++column) {
            ColumnHead const head = table->column(column);
            Oid place = table->entry();
            place.push_back(head.number);
            m_nodes.push_back({std::move(place), head.type, nullptr, table, column});
        }
    }
    std::ranges::sort(m_nodes, [](Node const& a, Node const& b) { return a.place < b.place; });
}

std::vector<ObjectTree::Node>::const_iterator ObjectTree::nodeAbove(OidView name) const {
    // A walk mostly stays in a column. Whatever is above the column is above the name, too.
    std::size_t const last = m_lastAbove.load(std::memory_order_relaxed);
    if (last <= m_nodes.size() && startsWith(name, m_nodes[last - 1].place))
        return m_nodes.begin() + static_cast<std::ptrdiff_t>(last);
    auto const above = std::ranges::partition_point(
        m_nodes, [&](Node const& node) { return std::is_lteq(compare(node.place, name)); });
    if (above != m_nodes.begin())
        m_lastAbove.store(static_cast<std::size_t>(above - m_nodes.begin()),
                          std::memory_order_relaxed);
    return above;
}

ObjectTree::Node const* ObjectTree::nodeOf(OidView name) const {
    auto const above = nodeAbove(name);
    if (above == m_nodes.begin()) return nullptr;
    Node const& node = *std::prev(above);
    return startsWith(name, node.place) ? &node : nullptr;
}

Lookup ObjectTree::find(Facts const& facts, OidView name, Instance& found) const {
    Node const* const around = nodeOf(name);
    if (around == nullptr) return Lookup::NoSuchObject;
    Node const& node = *around;
    OidView const index = name.subspan(node.place.size());
    Value value;
    if (node.scalar != nullptr) {
        if (std::is_neq(compare(index, kScalarIndex))) return Lookup::NoSuchInstance;
        value = node.scalar->get(facts);
    } else {
        std::size_t const row = node.table->firstRow(facts, index, true);
        if (row == node.table->rowCount(facts) || node.table->firstRow(facts, index, false) == row)
            return Lookup::NoSuchInstance;
        value = node.table->value(facts, node.column, row);
    }
    return fill(found, node, facts, value) ? Lookup::Found : Lookup::NoSuchInstance;
}

bool ObjectTree::next(Facts const& facts, OidView name, bool orEqual, Instance& found) const {
    auto node = nodeAbove(name);
    if (node != m_nodes.begin()) {
        Node const& around = *std::prev(node);
        if (startsWith(name, around.place) &&
            firstIn(around, facts, name.subspan(around.place.size()), orEqual, found))
            return true;
    }
    for (; node != m_nodes.end(); ++node)
        if (firstIn(*node, facts, {}, true, found)) return true;
    return false;
}

std::vector<TableColumn> ObjectTree::columnsBelow(OidView place) const {
    std::vector<TableColumn> columns;
    for (Node const& node : m_nodes)
        if (node.table != nullptr && startsWith(node.place, place))
            columns.push_back({node.place, node.table, node.column});
    return columns;
}

SetFault ObjectTree::test(Facts const& facts, OidView name, Value const& asked,
                          std::optional<Change>& change) const {
    Node const* const node = nodeOf(name);
    if (node == nullptr || node->table == nullptr) return SetFault::NotWritable;
    auto const writable = node->table->column(node->column).details.writable;
    if (!writable) return SetFault::NotWritable;
    std::optional<SettingValue> value;
    if (SetFault const fault = accept(*writable, node->type, asked, value); fault != SetFault::None)
        return fault;
    Instance present;
    if (find(facts, name, present) != Lookup::Found) return SetFault::NoCreation;
    change = {{writable->setting, name[node->place.size()]}, std::move(value)};
    return SetFault::None;
}

bool ObjectTree::fill(Instance& found, Node const& node, Facts const& facts, Value const& value) {
    found.value = value;
    found.type = node.type;
    if (node.type == ValueType::TimeStamp || node.type == ValueType::BeginStamp) {
        found.type = ValueType::TimeTicks;
        if (auto const* const ticks = std::get_if<std::int64_t>(&value)) {
            auto const since = static_cast<std::uint32_t>(*ticks);
            found.value = std::int64_t{node.type == ValueType::BeginStamp
                                           ? facts.counters.sysUpTimeSince(since)
                                           : facts.counters.sysUpTime(since)};
        }
    }
    return isKnown(value);
}

bool ObjectTree::firstIn(Node const& node, Facts const& facts, OidView index, bool orEqual,
                         Instance& found) {
    if (node.scalar != nullptr) {
        auto const order = compare(index, kScalarIndex);
        if (std::is_gt(order) || (std::is_eq(order) && !orEqual)) return false;
        if (!fill(found, node, facts, node.scalar->get(facts))) return false;
        found.name = node.place;
        found.name.push_back(kScalarIndex[0]);
        found.object = node.place;
        return true;
    }
    std::size_t const rows = node.table->rowCount(facts);
    for (std::size_t row = node.table->firstRow(facts, index, orEqual); row < rows; ++row) {
        if (!fill(found, node, facts, node.table->value(facts, node.column, row))) continue;
        found.name.reserve(kUsualName);
        found.name = node.place;
        node.table->appendIndex(facts, row, found.name);
        found.object = node.place;
        return true;
    }
    return false;
}

} // namespace kvloamd
