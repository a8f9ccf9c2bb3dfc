// SPDX-License-Identifier: BSD-2-Clause
// A chassis or board description as a plain tree, the same whether it was written in YAML or JSON.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <nlohmann/json_fwd.hpp>

#include "simulator/description/Findings.h"

namespace kvlsim {

struct DescriptionEntry;

/// A `Description` is one node of the tree.
struct Description {
    enum class Form : std::uint8_t {
        nothing, ///< written, but without a value
        text,    ///< certainly a text (quoted)
        plain,   ///< unquoted: a number where it reads as one, else a text
        other,   ///< a JSON value that is neither text nor whole number (true, 1.5)
        list,
        map,
    };

    Form form = Form::nothing;
    int line = 0;
    std::string scalar;
    std::vector<Description> items;
    std::vector<DescriptionEntry> entries; ///< in the order written; keys are unique

    bool isScalar() const { return form == Form::text || form == Form::plain; }
    /// The number that an unquoted scalar reads as, if it reads as one and fits 64 bits.
    std::optional<std::int64_t> integer() const;
    /// Whether an unquoted scalar reads as a whole number, of any size.
    bool readsAsInteger() const;
    /// The finite number, 0.5 or -2, that an unquoted scalar or a JSON number reads as.
    std::optional<double> decimal() const;
    Description const* find(std::string_view key) const;
    /// For messages: `the list`, `the text "x"`, `11`.
    std::string words() const;
};

/// A `DescriptionEntry` is a key of a map with its value.
struct DescriptionEntry {
    std::string key;
    int line = 0;
    Description value;
};

/// Both throw ChassisError; trees deeper than a chassis can be are refused. A key that is written
/// twice is a finding.
Description describeYaml(std::string const& text, Findings& findings);
Description describeYaml(std::string const& text);
Description describeJson(nlohmann::json const& json);

} // namespace kvlsim
