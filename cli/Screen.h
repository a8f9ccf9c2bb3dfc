// SPDX-License-Identifier: BSD-2-Clause
// What is written to: a terminal with its size and abilities, or a file.
#pragma once

#include <cstddef>
#include <limits>
#include <string>
#include <string_view>

namespace kvloam {

/// What a text means, which a terminal shows by a colour.
enum class Paint { Plain, Good, Warning, Bad, Heading, Faint };

/// A `Screen` describes the standard output.
struct Screen {
    static constexpr std::size_t kUnlimited = std::numeric_limits<std::size_t>::max();

    std::size_t width = kUnlimited;
    std::size_t height = kUnlimited;
    bool isTerminal = false;
    bool hasColours = false;
    bool hasUtf8 = true;

    /// Asks the system. `COLUMNS` counts where the terminal does not say its width, and
    /// `NO_COLOR` switches colours off. Sets the program's LC_CTYPE.
    static Screen ofStandardOutput();

    /// A text of others as this screen may show it.
    std::string clean(std::string_view text) const;
    /// `text` in the colour of `paint`. Requires: it is clean.
    std::string painted(std::string_view text, Paint paint) const;
    /// Stands for the rest of a text.
    std::string_view mark() const { return hasUtf8 ? "…" : "~"; }
};

} // namespace kvloam
