// SPDX-License-Identifier: BSD-2-Clause
// Checks that all readers of descriptions share.
#include "simulator/description/DescriptionChecks.h"

#include <algorithm>

#include "simulator/base/Text.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/Description.h"

namespace kvlsim {

void refuseUnknownKeys(Description const& map, std::string const& what,
                       std::span<std::string_view const> known) {
    Findings findings;
    findUnknownKeys(map, what, known, findings);
}

void findUnknownKeys(Description const& map, std::string const& what,
                     std::span<std::string_view const> known, Findings& findings) {
    for (auto const& entry : map.entries) {
        if (std::ranges::find(known, entry.key) != known.end()) continue;
        std::string list;
        for (auto const& key : known)
            appendToList(list, key);
        findings.part([&] {
            throw ChassisError(entry.line, "unknown key " + inQuotes(entry.key) + " in " + what +
                                               "; known: " + list);
        });
    }
}

void requireMap(Description const& node, std::string const& what, char const* begin) {
    if (node.form != Description::Form::map)
        throw ChassisError(node.line, what + " cannot be " + node.words() + "; begin it with \"" +
                                          begin + "\"");
}

} // namespace kvlsim
