// SPDX-License-Identifier: BSD-2-Clause
// A DS1 line as a chassis describes it: its type, its errors and alarms, and its past.
#pragma once

#include <cstdint>
#include <vector>

#include "simulator/chassis/Line.h"

namespace kvlsim {

/// A `LineSpell` is a part of the past with errors or alarms beyond the usual ones.
struct LineSpell {
    std::int64_t ago = 0;     ///< seconds before loading at which it began
    std::int64_t seconds = 0; ///< how long it lasted
    std::uint32_t alarms = 0;
    LineRates rates{}; ///< on top of the usual ones
};

/// A `LinePast` is the described past of a line.
struct LinePast {
    std::int64_t seconds = 0; ///< 0: none
    LineRates rates{};
    std::vector<LineSpell> spells; ///< may overlap
};

/// A `LineDraft` is a line as it is described.
struct LineDraft {
    DS1LineType type = DS1LineType::esf;
    LineRates rates{};
    std::uint32_t alarms = 0;
    LinePast past;
};

inline constexpr std::int64_t kMaxLinePast = 86400;
inline constexpr std::size_t kMaxLineSpells = 1000;

} // namespace kvlsim
