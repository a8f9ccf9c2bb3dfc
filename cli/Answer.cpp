// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Answer.h"

#include <algorithm>
#include <chrono>
#include <limits>

namespace kvloam {

namespace {

[[noreturn]] void refuse(std::string const& why) {
    throw CliError(kFailure, "the agent's answer cannot be read: " + why +
                                 "; is it an agent of this version?");
}

/// How deep the brackets of a JSON text are nested. What is no JSON gives some number.
int depthOf(std::string_view text) {
    int depth = 0;
    int deepest = 0;
    bool isInText = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        char const c = text[i];
        if (isInText) {
            if (c == '\\')
                ++i;
            else if (c == '"')
                isInText = false;
        } else if (c == '"') {
            isInText = true;
        } else if (c == '{' || c == '[') {
            deepest = std::max(deepest, ++depth);
        } else if (c == '}' || c == ']') {
            --depth;
        }
    }
    return deepest;
}

} // namespace

Json readAnswer(std::string_view body) {
    // Printing and deleting descend into what is nested.
    if (depthOf(body) > kDeepest) refuse("it is nested too deeply");
    Json answer = Json::parse(body, nullptr, false);
    if (answer.is_discarded()) refuse("it is no JSON");
    if (!answer.is_object()) refuse("it is no JSON object");
    return answer;
}

std::string jsonText(Json const& value, bool isCompact) {
    return value.dump(isCompact ? -1 : 2, ' ', true, Json::error_handler_t::replace);
}

Json const& field(Json const& row, char const* key) {
    static Json const null;
    if (!row.is_object()) return null;
    auto const found = row.find(key);
    return found == row.end() ? null : *found;
}

std::string textIn(Json const& row, char const* key) {
    Json const& value = field(row, key);
    return value.is_string() ? value.get<std::string>() : std::string();
}

std::optional<std::int64_t> numberIn(Json const& row, char const* key) {
    Json const& value = field(row, key);
    constexpr auto most = std::numeric_limits<std::int64_t>::max();
    if (value.is_number_unsigned())
        return static_cast<std::int64_t>(
            std::min<std::uint64_t>(value.get<std::uint64_t>(), std::uint64_t{most}));
    if (value.is_number_integer()) return value.get<std::int64_t>();
    return {};
}

std::optional<double> realIn(Json const& row, char const* key) {
    Json const& value = field(row, key);
    if (!value.is_number()) return {};
    return value.get<double>();
}

std::optional<bool> truthIn(Json const& row, char const* key) {
    Json const& value = field(row, key);
    if (value.is_boolean()) return value.get<bool>();
    // A TruthValue by its name.
    if (value == "true") return true;
    if (value == "false") return false;
    return {};
}

std::optional<Date> dateIn(Json const& row, char const* key) {
    return readDate(textIn(row, key));
}

std::vector<std::string> textsIn(Json const& row, char const* key) {
    std::vector<std::string> texts;
    for (Json const& value : field(row, key))
        if (value.is_string()) texts.push_back(value.get<std::string>());
    return texts;
}

Json const& rowsIn(Json const& answer, char const* key) {
    Json const& rows = field(answer, key);
    if (!rows.is_array()) refuse("it has no list \"" + std::string(key) + "\"");
    if (!std::ranges::all_of(rows, [](Json const& row) { return row.is_object(); }))
        refuse("\"" + std::string(key) + "\" lists something else than objects");
    return rows;
}

Date timeOf(Json const& answer) {
    if (auto const time = dateIn(answer, "time")) return *time;
    return std::chrono::floor<Seconds>(std::chrono::system_clock::now());
}

} // namespace kvloam
