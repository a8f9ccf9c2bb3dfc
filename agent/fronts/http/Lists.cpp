// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Lists.h"

#include <algorithm>

namespace kvloamd {

namespace {

bool isWanted(Part const& part, std::string_view column) {
    if (!part.only.empty()) return std::ranges::find(part.only, column) != part.only.end();
    return std::ranges::find(part.without, column) == part.without.end();
}

void writeBoard(JsonWriter& json, View const& view, std::uint32_t boardIndex) {
    BoardRow const* const board = view.board(boardIndex);
    json.key("board");
    board == nullptr ? json.null() : json.text(board->serialNumber);
    json.key("boardIndex");
    boardIndex == 0 ? json.null() : json.number(std::int64_t{boardIndex});
}

void writeInterface(JsonWriter& json, View const& view, std::uint32_t ifIndex) {
    InterfaceRow const* const row = view.interface(ifIndex);
    json.key("name");
    row == nullptr ? json.null() : json.text(row->name);
    json.key("ifIndex").number(std::int64_t{ifIndex});
    writeBoard(json, view, row == nullptr ? 0 : row->boardIndex);
}

} // namespace

ListWriter::ListWriter(List const& list) : m_list(list) {
    for (Part const& part : list.parts) {
        Section section{part, {}};
        for (std::size_t number = 0; number < part.table->columnCount(); ++number) {
            ColumnHead const head = part.table->column(number);
            if (isWanted(part, head.name))
                section.columns.push_back({number, keyOf(head.name, part.prefix, head.type), head});
        }
        m_sections.push_back(std::move(section));
    }
}

void ListWriter::writeAll(JsonWriter& json, View const& view, std::uint32_t boardIndex) const {
    Table const& table = *m_list.parts.front().table;
    Facts const facts = view.facts();
    json.beginArray();
    Oid index;
    std::size_t const rows = table.rowCount(facts);
    for (std::size_t row = 0; row < rows; ++row) {
        index.clear();
        table.appendIndex(facts, row, index);
        if (boardIndex != 0 && boardOf(view, index) != boardIndex) continue;
        json.beginObject();
        writeKeys(json, view, index);
        json.endObject();
    }
    json.endArray();
}

void ListWriter::writeKeys(JsonWriter& json, View const& view, OidView index) const {
    writeIndex(json, view, index);
    if (m_list.more != nullptr) m_list.more(json, view, index);
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
    for (std::string_view const number : m_list.index) {
        if (number == "ifIndex") keys.insert(keys.end(), {"name", "board", "boardIndex"});
        if (number == "boardIndex") keys.emplace_back("board");
        keys.emplace_back(number);
    }
    for (Section const& section : m_sections) {
        std::string const object =
            section.part.object.empty() ? "" : std::string(section.part.object) + '.';
        for (Column const& column : section.columns)
            keys.push_back(object + column.key);
    }
    return keys;
}

void ListWriter::writeIndex(JsonWriter& json, View const& view, OidView index) const {
    for (std::size_t i = 0; i < std::min(index.size(), m_list.index.size()); ++i) {
        if (m_list.index[i] == "ifIndex")
            writeInterface(json, view, index[i]);
        else if (m_list.index[i] == "boardIndex")
            writeBoard(json, view, index[i]);
        else
            json.key(m_list.index[i]).number(std::int64_t{index[i]});
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

std::uint32_t ListWriter::boardOf(View const& view, OidView index) const {
    std::string_view const first = m_list.index.empty() ? "" : m_list.index.front();
    if (first == "boardIndex") return index[0];
    InterfaceRow const* const row = first == "ifIndex" ? view.interface(index[0]) : nullptr;
    return row == nullptr ? 0 : row->boardIndex;
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
