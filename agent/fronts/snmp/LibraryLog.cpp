// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/LibraryLog.h"

#include <algorithm>
#include <string_view>

#include "agent/log/Log.h"
#include "agent/log/RepeatFilter.h"

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
// clang-format on

namespace kvloamd {

namespace {

LibraryFaults* collecting = nullptr;

LogLevel levelOf(int priority) {
    if (priority <= LOG_ERR) return LogLevel::Error;
    if (priority == LOG_WARNING) return LogLevel::Warning;
    // The library's informational messages are about its internals.
    return LogLevel::Debug;
}

/// Joins the lines of a library message to one.
std::string oneLine(std::string_view message) {
    std::string line;
    for (char const character : message) {
        if (character != '\n' && character != ' ')
            line += character;
        else if (!line.empty() && line.back() != ' ')
            line += ' ';
    }
    while (line.ends_with(' '))
        line.pop_back();
    return line;
}

int takeLogLine(int /*major*/, int /*minor*/, void* message, void* /*argument*/) {
    auto const* const entry = static_cast<snmp_log_message const*>(message);
    std::string const text = oneLine(entry->msg);
    // Only a count of errors that were reported before.
    if (text.find("error(s) in config file(s)") != std::string::npos) return SNMP_ERR_NOERROR;
    if (collecting != nullptr && collecting->take(text)) return SNMP_ERR_NOERROR;
    static RepeatFilter filter;
    if (filter.passes(text, RepeatFilter::Clock::now())) log(levelOf(entry->priority), text);
    return SNMP_ERR_NOERROR;
}

} // namespace

void takeLibraryLog() {
    snmp_disable_stderrlog();
    snmp_enable_calllog();
    snmp_register_callback(SNMP_CALLBACK_LIBRARY, SNMP_CALLBACK_LOGGING, takeLogLine, nullptr);
}

LibraryFaults::LibraryFaults() {
    collecting = this;
}

LibraryFaults::~LibraryFaults() {
    collecting = nullptr;
}

bool LibraryFaults::take(std::string const& text) {
    if (text.starts_with("Warning: no access control information configured")) {
        m_nobodyMayAsk = true;
        return true;
    }
    if (text.find(": line ") == std::string::npos) return false;
    // The library reads the file twice and reports some errors in both rounds.
    if (std::ranges::find(m_lines, text) == m_lines.end()) m_lines.push_back(text);
    return true;
}

} // namespace kvloamd
