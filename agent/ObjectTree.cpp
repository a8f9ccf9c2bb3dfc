// SPDX-License-Identifier: BSD-2-Clause
#include "agent/ObjectTree.h"

#include <algorithm>

namespace kvloamd {

namespace {

/// A scalar's one instance.
constexpr std::uint32_t kScalarIndex[] = {0};

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
    return std::ranges::partition_point(
        m_nodes, [&](Node const& node) { return compare(node.place, name) <= 0; });
}

Lookup ObjectTree::find(Facts const& facts, OidView name, Instance& found) const {
    auto const above = nodeAbove(name);
    if (above == m_nodes.begin()) return Lookup::NoSuchObject;
    Node const& node = *std::prev(above);
    if (!startsWith(name, node.place)) return Lookup::NoSuchObject;
    OidView const index = name.subspan(node.place.size());
    if (node.scalar != nullptr) {
        if (compare(index, kScalarIndex) != 0) return Lookup::NoSuchInstance;
        found.value = node.scalar->get(facts);
    } else {
        std::size_t const row = node.table->firstRow(facts, index, true);
        if (row == node.table->rowCount(facts) || node.table->firstRow(facts, index, false) == row)
            return Lookup::NoSuchInstance;
        found.value = node.table->value(facts, node.column, row);
    }
    found.type = node.type;
    return isKnown(found.value) ? Lookup::Found : Lookup::NoSuchInstance;
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

bool ObjectTree::firstIn(Node const& node, Facts const& facts, OidView index, bool orEqual,
                         Instance& found) {
    if (node.scalar != nullptr) {
        auto const order = compare(index, kScalarIndex);
        if (order > 0 || (order == 0 && !orEqual)) return false;
        found.value = node.scalar->get(facts);
        if (!isKnown(found.value)) return false;
        found.name = node.place;
        found.name.push_back(kScalarIndex[0]);
        found.type = node.type;
        return true;
    }
    std::size_t const rows = node.table->rowCount(facts);
    for (std::size_t row = node.table->firstRow(facts, index, orEqual); row < rows; ++row) {
        found.value = node.table->value(facts, node.column, row);
        if (!isKnown(found.value)) continue;
        found.name = node.place;
        node.table->appendIndex(facts, row, found.name);
        found.type = node.type;
        return true;
    }
    return false;
}

} // namespace kvloamd
