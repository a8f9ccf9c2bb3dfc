// SPDX-License-Identifier: BSD-2-Clause
// The documents of the JSON API.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "agent/fronts/http/HttpFault.h"
#include "agent/fronts/http/Lists.h"
#include "agent/fronts/http/Target.h"
#include "agent/rows/JournalRow.h"

namespace kvloamd {

/// The objects that the documents show.
struct DescribedObjects {
    std::vector<Table const*> tables;
    std::vector<std::span<Scalar const>> scalars;
};

/// Which entries of the journal are asked for.
struct JournalQuery {
    std::optional<std::uint32_t> after; ///< those above this number; nothing: the newest
    std::size_t limit = 200;
};

/// A `Documents` writes the documents below /api/v1/. Immutable.
class Documents {
  public:
    /// The most rows in one answer of /api/v1/tables/<name>.
    static constexpr std::size_t kMostRows = 10000;

    /// What is described outlives the documents.
    explicit Documents(DescribedObjects objects);

    /// The document that `target` names, whose first two segments are "api" and "v1". Throws
    /// HttpFault when there is none. Not the journal, which is in no snapshot.
    std::string write(View const& view, Target const& target) const;

    /// The most entries of the journal in one answer.
    static constexpr std::size_t kMostEntries = 1000;
    /// Throws HttpFault when the query of `target` is none.
    static JournalQuery journalQuery(Target const& target);
    static std::string journal(View const& view, JournalPage const& page);

  private:
    struct Lists {
        std::string_view name; ///< of the resource
        std::vector<ListWriter> writers;
    };

    static std::string resource(View const& view, Lists const& lists, Target const& target);
    std::string board(View const& view, std::string_view name) const;
    std::string line(View const& view, std::string_view name) const;
    std::string health(View const& view) const;
    std::string scalars(View const& view) const;
    std::string tables(View const& view) const;
    std::string table(View const& view, std::string_view name, Target const& target) const;
    ListWriter const& writerOf(std::string_view key) const;

    DescribedObjects m_objects;
    std::vector<Lists> m_lists;
    ListWriter m_intervals;
};

/// The keys of /api/v1/health's object that come from scalars, with the scalars.
std::vector<std::pair<std::string, Scalar const*>>
healthScalars(std::vector<std::span<Scalar const>> const& scalars);

} // namespace kvloamd
