// SPDX-License-Identifier: BSD-2-Clause
// An agent whose tables of interfaces are read by column and ifIndex.
#pragma once

#include <algorithm>
#include <cstdlib>
#include <map>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "agent/daemon/Options.h"
#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {

inline constexpr char kIf[] = "1.3.6.1.2.1.2.2.1.";
inline constexpr char kIfX[] = "1.3.6.1.2.1.31.1.1.1.";
inline constexpr char kStack[] = "1.3.6.1.2.1.31.1.2.1.3";
inline constexpr char kConfig[] = "1.3.6.1.2.1.10.18.6.1.";
inline constexpr char kCurrent[] = "1.3.6.1.2.1.10.18.7.1.";
inline constexpr char kInterval[] = "1.3.6.1.2.1.10.18.8.1.";
inline constexpr char kTotal[] = "1.3.6.1.2.1.10.18.9.1.";
inline constexpr char kIsdn[] = "1.3.6.1.2.1.10.20.1.";
inline constexpr char kDot3[] = "1.3.6.1.2.1.10.7.2.1.";

/// An agent, with the values of its standard tables as the real clients print them.
class InterfaceFixture : public AgentFixture {
  protected:
    /// The value of an instance, without names: "INTEGER: 3", "STRING: "x"".
    std::string at(std::string const& column, std::string const& instance) const {
        auto const answered = answers("snmpget", {"-Oe", column + "." + instance});
        return answered.empty() ? "nothing" : answered.front().value;
    }
    std::vector<Answer> walkOf(std::string const& from) const {
        auto all = answers("snmpbulkwalk", {"-Oe", "-Cr50", from});
        std::erase_if(all,
                      [](Answer const& answer) { return answer.value.starts_with("No Such"); });
        return all;
    }
    /// The values of a column by index, such as "1000" or "1000.96".
    std::map<std::string, std::string> column(std::string const& name) const {
        std::map<std::string, std::string> values;
        std::size_t const parts = parseOid(name)->size();
        for (Answer const& answer : walkOf(name)) {
            std::string index;
            for (std::size_t i = parts; i < answer.name.size(); ++i)
                index += (i == parts ? "" : ".") + std::to_string(answer.name[i]);
            values[index] = answer.value;
        }
        return values;
    }
    /// The ifIndex of the line of that name; "none" when there is none.
    std::string lineNamed(std::string const& name) const {
        for (auto const& [index, value] : column(c(kIfX, 1)))
            if (value == "STRING: \"" + name + "\"") return index;
        return "none";
    }
    /// Starts the agent and waits until the first line has closed the last interval of its past,
    /// after which nothing is closed for a quarter of an hour.
    void startWithFullHistory() {
        startAgent();
        ASSERT_TRUE(eventually([&] { return at(c(kConfig, 4), "1000") == "INTEGER: 96"; }));
    }
    static long numberIn(std::string const& value) {
        auto const colon = value.find(": ");
        return colon == std::string::npos ? -1 : std::atol(value.c_str() + colon + 2);
    }
    static bool isStrictlyIncreasing(std::vector<Answer> const& answers) {
        return std::ranges::adjacent_find(answers, [](Answer const& a, Answer const& b) {
                   return compare(a.name, b.name) >= 0;
               }) == answers.end();
    }
    /// A board of a chassis with one line, "line-<serial number>".
    static std::string boardWithLine(int handle, std::string const& serialNumber) {
        return "  - handle: " + std::to_string(handle) +
               "\n    attributes: {SERIAL_NUMBER: " + serialNumber +
               "}\n    devices: [{handle: " + std::to_string(handle * 10) +
               ", type: 501, attributes: {NAME: line-" + serialNumber + "}, line: {type: esf}}]\n";
    }
    static std::string c(char const* entry, int number) { return entry + std::to_string(number); }
};

} // namespace kvloamd::e2e
