// SPDX-License-Identifier: BSD-2-Clause
// Tables whose last column is the physical entity of a row.
#pragma once

#include <cstddef>
#include <cstdint>

#include "agent/objects/Description.h"

namespace kvloamd {

/// The getter of a column whose value the table itself finds.
template <class Row>
Value notOfTheRow(Row const&) {
    return {};
}

/// An `EntityColumnTable` is a `RowTable` whose last column tells the physical entity of the row.
/// The entities are found after the rows, so they lie beside them: `Entities`, in the order of the
/// rows. An entity that is missing there or is 0 is not known.
template <class Row, auto From, auto Entities>
class EntityColumnTable final : public RowTable<Row, From> {
  public:
    using RowTable<Row, From>::RowTable;

    Value value(Facts const& facts, std::size_t column, std::size_t row) const override {
        if (column + 1 != this->columnCount())
            return RowTable<Row, From>::value(facts, column, row);
        std::vector<std::uint32_t> const& entities = facts.snapshot.entities.*Entities;
        if (row >= entities.size() || entities[row] == 0) return {};
        return std::int64_t{entities[row]};
    }
};

} // namespace kvloamd
