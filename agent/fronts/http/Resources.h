// SPDX-License-Identifier: BSD-2-Clause
// Which tables make which addresses of the JSON API.
#pragma once

#include <string_view>
#include <vector>

#include "agent/fronts/http/View.h"
#include "agent/objects/Description.h"

namespace kvloamd {

/// Columns of one table that become keys of a row.
struct Part {
    Table const* table;
    std::string_view prefix;                 ///< of the columns' names; keys lack it
    std::vector<std::string_view> only = {}; ///< names of columns; empty: all but `without`
    std::vector<std::string_view> without = {};
    /// The key of an object that has the columns; empty: the row itself has them. Parts that follow
    /// one another share an object of the same key. It is null when the first of them has no row.
    std::string_view object = {};
};

/// A key whose value is no column's.
struct Extra {
    std::string_view key;
    void (*write)(JsonWriter&, View const&, OidView index);
    bool isOnRequest = false; ///< only in answers to requests that name it
};

/// A list of rows, each joined from the rows of its parts that have the same index.
struct List {
    std::string_view key;
    /// The keys of the numbers of a row's index. `boardIndex` brings along the board's serial
    /// number, and `ifIndex` the interface's name and its board.
    std::vector<std::string_view> index;
    std::vector<Part> parts; ///< the first one has the rows
    std::vector<Extra> extras = {};
};

/// One address below /api/v1/ and the lists that it answers with.
struct Resource {
    std::string_view name;
    std::vector<List> lists;
};

std::vector<Resource> const& resources();

} // namespace kvloamd
