// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Lists.h"

#include <algorithm>

namespace kvloamd {

namespace {

bool isWanted(Part const& part, std::string_view column) {
    if (!part.only.empty()) return std::ranges::find(part.only, column) != part.only.end();
    return std::ranges::find(part.without, column) == part.without.end();
}

bool isWanted(Fields const& fields, std::string_view key, bool isOnRequest = false) {
    return fields.empty() ? !isOnRequest : std::ranges::find(fields, key) != fields.end();
}

} // namespace

ListWriter::ListWriter(List const& list, Fields const& fields) : m_list(list) {
    using enum Lead::What;
    auto const lead = [&](Lead::What what, std::string_view key, std::size_t position) {
        if (isWanted(fields, key)) m_leads.push_back({what, std::string(key), position});
    };
    for (std::size_t position = 0; position < list.index.size(); ++position) {
        std::string_view const number = list.index[position];
        if (number == "ifIndex") lead(Name, "name", position);
        if (number != "boardIndex") lead(Number, number, position);
        if (number != "ifIndex" && number != "boardIndex") continue;
        lead(Serial, "board", position);
        lead(Board, "boardIndex", position);
    }
    for (Extra const& extra : list.extras)
        if (isWanted(fields, extra.key, extra.isOnRequest)) m_extras.push_back(extra);
    for (Part const& part : list.parts) {
        Section section{part, {}};
        for (std::size_t number = 0; number < part.table->columnCount(); ++number) {
            ColumnHead const head = part.table->column(number);
            std::string key = keyOf(head.name, part.prefix, head.type);
            if (isWanted(part, head.name) &&
                isWanted(fields, part.object.empty() ? std::string_view(key) : part.object))
                section.columns.push_back({number, std::move(key), head});
        }
        if (!section.columns.empty()) m_sections.push_back(std::move(section));
    }
}

void ListWriter::writeAll(JsonWriter& json, View const& view, RowFilter const& filter) const {
    Table const& table = *m_list.parts.front().table;
    Facts const facts = view.facts();
    json.beginArray();
    Oid index;
    std::size_t const rows = table.rowCount(facts);
    for (std::size_t row = 0; row < rows; ++row) {
        index.clear();
        table.appendIndex(facts, row, index);
        if (!passes(view, index, filter)) continue;
        json.beginObject();
        writeKeys(json, view, index);
        json.endObject();
    }
    json.endArray();
}

void ListWriter::writeKeys(JsonWriter& json, View const& view, OidView index) const {
    for (Lead const& lead : m_leads)
        writeLead(json, view, lead, index);
    for (Extra const& extra : m_extras) {
        json.key(extra.key);
        extra.write(json, view, index);
    }
    for (auto section = m_sections.begin(); section != m_sections.end();) {
        std::string_view const object = section->part.object;
        if (object.empty()) {
            writeColumns(json, view, *section++, index);
            continue;
        }
        json.key(object);
        bool const exists = rowOf(view.facts(), *section->part.table, index).has_value();
        exists ? json.beginObject() : json.null();
        for (; section != m_sections.end() && section->part.object == object; ++section)
            if (exists) writeColumns(json, view, *section, index);
        if (exists) json.endObject();
    }
}

std::vector<std::string> ListWriter::keys() const {
    std::vector<std::string> keys;
    auto const add = [&](std::string_view key) {
        if (keys.empty() || keys.back() != key) keys.emplace_back(key);
    };
    for (Lead const& lead : m_leads)
        add(lead.key);
    for (Extra const& extra : m_extras)
        add(extra.key);
    for (Section const& section : m_sections)
        for (Column const& column : section.columns)
            add(section.part.object.empty() ? std::string_view(column.key) : section.part.object);
    return keys;
}

void ListWriter::writeLead(JsonWriter& json, View const& view, Lead const& lead,
                           OidView index) const {
    json.key(lead.key);
    std::uint32_t const number = index[lead.position];
    bool const isInterface = m_list.index[lead.position] == "ifIndex";
    InterfaceRow const* const interface = isInterface ? view.interface(number) : nullptr;
    std::uint32_t const interfacesBoard = interface == nullptr ? 0 : interface->boardIndex;
    std::uint32_t const boardIndex = isInterface ? interfacesBoard : number;
    BoardRow const* const board = view.board(boardIndex);
    switch (lead.what) {
    case Lead::What::Number:
        json.number(std::int64_t{number});
        return;
    case Lead::What::Name:
        interface == nullptr ? json.null() : json.text(interface->name);
        return;
    case Lead::What::Serial:
        board == nullptr ? json.null() : json.text(board->serialNumber);
        return;
    case Lead::What::Board:
        boardIndex == 0 ? json.null() : json.number(std::int64_t{boardIndex});
        return;
    }
}

void ListWriter::writeColumns(JsonWriter& json, View const& view, Section const& section,
                              OidView index) {
    Facts const facts = view.facts();
    Table const& table = *section.part.table;
    auto const row = rowOf(facts, table, index);
    for (Column const& column : section.columns) {
        json.key(column.key);
        writeValue(json, column.head.type, column.head.details,
                   row ? table.value(facts, column.number, *row) : Value{}, view.counters(),
                   Manner::People);
    }
}

bool ListWriter::passes(View const& view, OidView index, RowFilter const& filter) const {
    if (filter.boardIndex != 0 && boardOf(view, index) != filter.boardIndex) return false;
    if (!filter.ifIndices.empty() && !std::ranges::binary_search(filter.ifIndices, index[0]))
        return false;
    if (filter.line == 0) return true;
    Ds0ChannelRow const* const slot = view.timeSlot(index[0]);
    return slot != nullptr && slot->line == filter.line;
}

std::uint32_t ListWriter::boardOf(View const& view, OidView index) const {
    std::string_view const first = m_list.index.empty() ? "" : m_list.index.front();
    if (first == "boardIndex") return index[0];
    InterfaceRow const* const row = first == "ifIndex" ? view.interface(index[0]) : nullptr;
    return row == nullptr ? 0 : row->boardIndex;
}

std::vector<std::string> fieldsOf(List const& list) {
    std::vector<std::string> fields = ListWriter(list).keys();
    for (Extra const& extra : list.extras)
        if (extra.isOnRequest) fields.emplace_back(extra.key);
    return fields;
}

Oid writeTable(JsonWriter& json, View const& view, Table const& table, OidView after,
               std::size_t most) {
    Facts const facts = view.facts();
    std::vector<ColumnHead> heads;
    for (std::size_t column = 0; column < table.columnCount(); ++column)
        heads.push_back(table.column(column));
    std::size_t const rows = table.rowCount(facts);
    std::size_t const first = after.empty() ? 0 : table.firstRow(facts, after, false);
    std::size_t const last = std::min(rows, first + most);
    Oid index;
    json.beginArray();
    for (std::size_t row = first; row < last; ++row) {
        index.clear();
        table.appendIndex(facts, row, index);
        json.beginObject().key("index").beginArray();
        for (std::uint32_t const number : index)
            json.number(std::int64_t{number});
        json.endArray();
        for (std::size_t column = 0; column < heads.size(); ++column) {
            json.key(heads[column].name);
            writeValue(json, heads[column].type, heads[column].details,
                       table.value(facts, column, row), view.counters(), Manner::Module);
        }
        json.endObject();
    }
    json.endArray();
    return last < rows ? index : Oid{};
}

std::optional<std::size_t> rowOf(Facts const& facts, Table const& table, OidView index) {
    std::size_t const row = table.firstRow(facts, index, true);
    if (row >= table.rowCount(facts)) return std::nullopt;
    Oid found;
    table.appendIndex(facts, row, found);
    return std::is_eq(compare(found, index)) ? std::optional(row) : std::nullopt;
}

} // namespace kvloamd
