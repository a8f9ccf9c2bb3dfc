// SPDX-License-Identifier: BSD-2-Clause
// Values of the agent as people read them.
#pragma once

#include <string>

#include "cli/Answer.h"
#include "cli/Table.h"

namespace kvloam {

/// Any value in words; "-" when it is not known, or empty.
std::string valueText(Json const& value);
/// The value under `key`, as its name says: a date with its age, seconds as a span of time.
std::string fieldText(Json const& row, std::string const& key, Date now);
/// A key in words: "boardTableLastChangeSeconds" is "board table last change".
std::string keyWords(std::string const& key);
/// The name of an enumeration without the prefix of its MIB module: "dsx1ESF" is "ESF".
std::string shortName(std::string const& name);

Cell boardState(Json const& board);
bool isGoodBoard(Json const& board);
/// The line's failures, loopbacks and test codes.
Cell lineStatus(Json const& line);
bool isGoodLine(Json const& line);
Cell operStatus(Json const& interface);
Cell severity(Json const& row);

/// How grave a severity is: 0 for none and "cleared", 5 for "critical".
int gravity(std::string const& severity);

} // namespace kvloam
