// SPDX-License-Identifier: BSD-2-Clause
#include "cli/FleetTargets.h"

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstring>
#include <fstream>
#include <map>
#include <optional>
#include <sstream>
#include <string_view>

#include "cli/Answer.h"
#include "cli/Text.h"

namespace kvloam {

namespace {

constexpr std::string_view kLetters = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ";
constexpr std::string_view kDigits = "0123456789";

bool consistsOf(std::string_view text, std::string const& signs) {
    return !text.empty() && text.find_first_not_of(signs) == std::string_view::npos;
}

struct Address {
    std::string host; ///< without brackets
    std::string port; ///< empty: none was written
};

/// HOST, HOST:PORT, or an IPv6 address in brackets instead of the host; nothing when it is none.
std::optional<Address> readAddress(std::string_view text) {
    Address address;
    std::string_view rest;
    if (text.starts_with('[')) {
        std::size_t const end = std::min(text.find(']'), text.size());
        address.host = text.substr(1, end - 1);
        rest = text.substr(std::min(end + 1, text.size()));
        if (end == text.size() || !consistsOf(address.host, "0123456789abcdefABCDEF:.")) return {};
    } else {
        std::size_t const end = std::min(text.find(':'), text.size());
        address.host = text.substr(0, end);
        rest = text.substr(end);
        if (!consistsOf(address.host, std::string(kLetters) + std::string(kDigits) + ".-_"))
            return {};
    }
    if (rest.empty()) return address;
    int port = 0;
    rest.remove_prefix(1);
    address.port = rest;
    std::from_chars(rest.data(), rest.data() + rest.size(), port);
    bool const isPort =
        consistsOf(rest, std::string(kDigits)) && rest.size() <= 5 && port >= 1 && port <= 65535;
    return isPort ? std::optional(address) : std::nullopt;
}

} // namespace

std::string discoveryFile(std::istream& list, std::string const& name, int port) {
    std::string text = "# Made by \"kvloam fleet targets\".\n";
    std::map<std::string, int> lines; ///< of addresses and chassis
    int number = 0;
    auto const refuse = [&](std::string const& why) {
        throw CliError(kFailure, name + ":" + std::to_string(number) + ": " + why);
    };
    auto const enter = [&](std::string const& key, std::string const& what) {
        auto const [before, isNew] = lines.emplace(key, number);
        if (!isNew)
            refuse(printable(what) + " is in line " + std::to_string(before->second) + " already");
    };
    for (std::string line; std::getline(list, line);) {
        ++number;
        std::istringstream words(line.substr(0, line.find('#')));
        std::string target;
        std::string site;
        std::string chassis;
        std::string more;
        if (!(words >> target)) continue;
        words >> site >> chassis >> more;
        if (!more.empty()) refuse("more than an address, a site and a chassis");
        auto const address = readAddress(target);
        if (!address)
            refuse("\"" + printable(target) +
                   "\" is no address; write HOST, HOST:PORT or [IPv6 address]:PORT");
        if (chassis.empty()) chassis = address->host;
        bool const isIpv6 = address->host.find(':') != std::string::npos;
        target = (isIpv6 ? "[" + address->host + "]" : address->host) + ":" +
                 (address->port.empty() ? std::to_string(port) : address->port);
        enter("address " + target, target);
        enter("chassis " + chassis, "chassis " + chassis);
        // Texts of JSON are texts of YAML.
        text += "- targets: [" + jsonText(target, true) + "]\n  labels: {";
        if (!site.empty()) text += "site: " + jsonText(site, true) + ", ";
        text += "chassis: " + jsonText(chassis, true) + "}\n";
    }
    if (list.bad() || lines.empty())
        throw CliError(kFailure, name + ": lists no agent; a line is ADDRESS [SITE [CHASSIS]]");
    return text;
}

void replaceFile(std::string const& path, std::string const& text) {
    std::string const beside = path + ".new";
    std::ofstream file(beside, std::ios::trunc);
    bool const isWritten = bool(file << text << std::flush);
    file.close();
    if (isWritten && std::rename(beside.c_str(), path.c_str()) == 0) return;
    std::string const why = std::strerror(errno);
    std::remove(beside.c_str());
    throw CliError(kFailure, path + ": cannot be written: " + why);
}

} // namespace kvloam
