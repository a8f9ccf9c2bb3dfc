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

/// Which keys a row has; empty: all that are not on request only. Where a key has an object, it
/// stands for all of it.
using Fields = std::vector<std::string>;

/// Which rows a list has. The conditions add up.
struct RowFilter {
    std::uint32_t boardIndex = 0;         ///< only the rows of this board; 0: of all
    std::uint32_t line = 0;               ///< only channels of the line of this ifIndex; 0: of all
    std::vector<std::uint32_t> ifIndices; ///< only the rows of these, ascending; empty: all
};

/// A `ListWriter` writes the rows of a list. Immutable.
class ListWriter {
  public:
    /// `list` outlives the writer.
    explicit ListWriter(List const& list, Fields const& fields = {});

    List const& list() const { return m_list; }
    std::string_view key() const { return m_list.key; }
    /// Writes the rows, an array.
    void writeAll(JsonWriter& json, View const& view, RowFilter const& filter = {}) const;
    /// Writes the keys of the row of this index, which there is, without the braces around them.
    void writeKeys(JsonWriter& json, View const& view, OidView index) const;

    /// The keys of a row.
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
    /// A key that follows from the row's index.
    struct Lead {
        enum class What { Number, Name, Serial, Board } what;
        std::string key;
        std::size_t position; ///< of the number in the index
    };

    void writeLead(JsonWriter& json, View const& view, Lead const& lead, OidView index) const;
    static void writeColumns(JsonWriter& json, View const& view, Section const& section,
                             OidView index);
    bool passes(View const& view, OidView index, RowFilter const& filter) const;
    std::uint32_t boardOf(View const& view, OidView index) const;

    List const& m_list;
    std::vector<Lead> m_leads;
    std::vector<Extra> m_extras;
    std::vector<Section> m_sections;
};

/// All keys that requests may name for a row of `list`.
std::vector<std::string> fieldsOf(List const& list);

/// Writes one page of a table in the manner of its MIB module: the rows after `after`, at most
/// `most`. Returns the index of the last one if more follow, else an empty name.
Oid writeTable(JsonWriter& json, View const& view, Table const& table, OidView after,
               std::size_t most);

/// The row that has exactly this index; nothing when there is none.
std::optional<std::size_t> rowOf(Facts const& facts, Table const& table, OidView index);

} // namespace kvloamd
