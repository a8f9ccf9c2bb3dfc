// SPDX-License-Identifier: BSD-2-Clause
// The target of a request: the path and the query after it.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace kvloamd {

/// "/lines/a%20b?after=5" has the segments "lines" and "a b", and the query after = "5".
struct Target {
    std::vector<std::string> segments;
    std::map<std::string, std::string> query; ///< the first value of each name

    std::string const* parameter(std::string const& name) const {
        auto const found = query.find(name);
        return found == query.end() ? nullptr : &found->second;
    }
};

/// Nothing when `text` does not begin with "/", or has an escape that is none.
std::optional<Target> parseTarget(std::string_view text);

} // namespace kvloamd
