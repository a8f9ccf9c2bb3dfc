// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/SubjectObjects.h"

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

constexpr std::uint32_t kIfName = 1;
constexpr std::uint32_t kIfAlias = 18;
constexpr std::uint32_t kPhysicalName = 7;
constexpr std::uint32_t kPhysicalAlias = 14;
constexpr std::uint32_t kBoardName = 4;
constexpr std::uint32_t kBoardSerialNumber = 9;

/// The row with this index; null if there is none.
template <class Row>
Row const* find(Rows<Row> const& rows, std::uint32_t index) {
    auto const found =
        std::ranges::partition_point(rows, [&](Row const& row) { return row.index()[0] < index; });
    return found == rows.end() || found->index()[0] != index ? nullptr : &*found;
}

/// A text of its own, because notifications outlive snapshots.
decltype(NotifiedObject::value) owned(Value const& value) {
    if (auto const octets = octetsOf(value)) return std::string(*octets);
    if (auto const* const named = std::get_if<NameView>(&value))
        return Oid(named->name.begin(), named->name.end());
    return std::get<std::int64_t>(value);
}

/// Appends objects to one notification.
class Appender {
  public:
    Appender(Notification& notification, std::span<ServedTree const> trees, Facts const& facts)
        : m_notification(notification), m_trees(trees), m_facts(facts) {}

    /// Appends the cell of `table` in `row`, if there is one.
    void append(Table const& table, std::uint32_t column, std::uint32_t row) {
        Oid const name = joined(table.entry(), Oid{column, row});
        for (ServedTree const& tree : m_trees) {
            Instance found;
            if (tree.tree.find(m_facts, name, found) != Lookup::Found) continue;
            m_notification.objects.push_back(
                {joined(tree.arc, name), found.type, owned(found.value)});
            return;
        }
    }
    void appendBoardOf(std::uint32_t ifIndex) {
        auto const* const interface = find(m_facts.snapshot.interfaces.interfaces, ifIndex);
        if (interface != nullptr) append(boardTable(), kBoardSerialNumber, interface->boardIndex);
    }

  private:
    Notification& m_notification;
    std::span<ServedTree const> m_trees;
    Facts const& m_facts;
};

} // namespace

void nameSubject(Notification& notification, std::span<ServedTree const> trees,
                 Facts const& facts) {
    Subject const subject = notification.subject;
    Appender appender(notification, trees, facts);
    if (subject.ifIndex != 0) {
        appender.append(ifXTable(), kIfName, subject.ifIndex);
        appender.append(ifXTable(), kIfAlias, subject.ifIndex);
        appender.appendBoardOf(subject.ifIndex);
    }
    if (subject.entity != 0) {
        appender.append(entPhysicalTable(), kPhysicalName, subject.entity);
        appender.append(entPhysicalTable(), kPhysicalAlias, subject.entity);
        auto const* const entity = find(facts.snapshot.entities.physical->entities, subject.entity);
        if (entity != nullptr && entity->boardIndex != 0)
            appender.append(boardTable(), kBoardSerialNumber, entity->boardIndex);
        else if (entity != nullptr)
            appender.appendBoardOf(entity->ifIndex);
    }
    if (subject.boardIndex != 0) appender.append(boardTable(), kBoardName, subject.boardIndex);
}

} // namespace kvloamd
