// SPDX-License-Identifier: BSD-2-Clause
// Writes a file whole or not at all.
#pragma once

#include <string>

namespace kvlsim {

/// Writes aside and renames, so that a reader never meets half a file. Throws ToolError.
void writeWholeFile(std::string const& path, std::string const& text);

} // namespace kvlsim
