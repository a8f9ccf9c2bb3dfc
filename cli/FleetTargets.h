// SPDX-License-Identifier: BSD-2-Clause
// Lists of hosts for monitoring engines.
#pragma once

#include <istream>
#include <string>

namespace kvloam {

/// Makes of a list of agents a file for Prometheus's discovery of targets by files
/// (`file_sd_configs`). A line of the list is `ADDRESS [SITE [CHASSIS]]`; a `#` begins a comment.
/// An address without a port gets `port`; without a name, the chassis has that of its host. `name`
/// is the list's, for messages. Throws CliError with the line of a fault: a line that cannot be
/// read, or an address or a chassis that is there twice.
std::string discoveryFile(std::istream& list, std::string const& name, int port);

/// Replaces the file by one with this text as a whole: a reader never sees a part of it. Throws
/// CliError.
void replaceFile(std::string const& path, std::string const& text);

} // namespace kvloam
