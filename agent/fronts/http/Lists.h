// SPDX-License-Identifier: BSD-2-Clause
// Writes lists of rows from the descriptions of their tables.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "agent/fronts/http/JsonValues.h"
#include "agent/fronts/http/Resources.h"

namespace kvloamd {

/// A `ListWriter` writes the rows of a list. Immutable.
class ListWriter {
  public:
    /// `list` outlives the writer.
    explicit ListWriter(List const& list);

    std::string_view key() const { return m_list.key; }
    /// Writes all rows, an array; only those of this board if `boardIndex` is not 0.
    void writeAll(JsonWriter& json, View const& view, std::uint32_t boardIndex = 0) const;
    /// Writes the keys of the row of this index, which there is, without the braces around them.
    void writeKeys(JsonWriter& json, View const& view, OidView index) const;

    /// The keys of a row, those of an object as "current.es".
    std::vector<std::string> keys() const;

  private:
    struct Column {
        std::size_t number; ///< in the table
        std::string key;
        ColumnHead head;
    };
    struct Section {
        Part const& part;
        std::vector<Column> columns;
    };

    void writeIndex(JsonWriter& json, View const& view, OidView index) const;
    static void writeColumns(JsonWriter& json, View const& view, Section const& section,
                             OidView index);
    std::uint32_t boardOf(View const& view, OidView index) const;

    List const& m_list;
    std::vector<Section> m_sections;
};

/// Writes one page of a table in the manner of its MIB module: the rows after `after`, at most
/// `most`. Returns the index of the last one if more follow, else an empty name.
Oid writeTable(JsonWriter& json, View const& view, Table const& table, OidView after,
               std::size_t most);

/// The row that has exactly this index; nothing when there is none.
std::optional<std::size_t> rowOf(Facts const& facts, Table const& table, OidView index);

} // namespace kvloamd
