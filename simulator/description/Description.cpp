// SPDX-License-Identifier: BSD-2-Clause
// Description trees: reading of YAML and JSON, numbers, words for messages.
#include "simulator/description/Description.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <sstream>

#include <nlohmann/json.hpp>
#include <yaml-cpp/eventhandler.h>
#include <yaml-cpp/exceptions.h>
#include <yaml-cpp/mark.h>
#include <yaml-cpp/parser.h>

#include "simulator/base/Text.h"
#include "simulator/chassis/ChassisError.h"

namespace kvlsim {

namespace {

// A spell's alarms sit deepest, at level 10: chassis, boards, board, devices, device, line, past,
// spells, spell, alarms.
constexpr std::size_t kMaxDepth = 12;

// A value takes some 200 bytes as a tree.
constexpr std::size_t kMaxValues = 2'000'000;

[[noreturn]] void refuseDepth(int line) {
    throw ChassisError(line, "too many nested levels; a chassis needs at most " +
                                 std::to_string(kMaxDepth));
}

void addEntry(Description& map, std::string const& key, int line, Description value) {
    map.entries.push_back({key, line, std::move(value)});
}

/// Maps are short (a dozen keys), except when somebody means harm: then sorting keeps it cheap.
void refuseRepeatedKeys(Description const& map) {
    std::vector<DescriptionEntry const*> sorted;
    sorted.reserve(map.entries.size());
    for (auto const& entry : map.entries)
        sorted.push_back(&entry);
    std::ranges::stable_sort(
        sorted, {}, [](auto* entry) -> auto const& { return entry->key; });
    auto const repeated = std::ranges::adjacent_find(
        sorted, [](auto* one, auto* next) { return one->key == next->key; });
    if (repeated == sorted.end()) return;
    throw ChassisError((*(repeated + 1))->line,
                       inQuotes((*repeated)->key) + " is written twice (first in line " +
                           std::to_string((*repeated)->line) + " of the file); keep one of them");
}

/// Does the quoted text that begins at `mark` end before the file does? The parser ends it there.
bool isClosed(std::string const& text, YAML::Mark const& mark) {
    constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";
    auto at = static_cast<std::size_t>(mark.pos);
    if (text.starts_with(byteOrderMark)) at += byteOrderMark.size();
    if (at >= text.size() || (text[at] != '"' && text[at] != '\'')) return true; // not a quoted one
    char const quote = text[at];
    for (++at; at < text.size(); ++at) {
        if (text[at] == quote) return true; // a doubled ' has another behind it, which ends it too
        if (text[at] == '\\' && quote == '"') ++at;
    }
    return false;
}

/// What the parser complains of, in words for those who do not know it.
std::string plainWords(std::string const& message) {
    constexpr char const* misfit = "this does not fit the lines above; indent entries that belong "
                                   "together alike, and close every quote";
    struct {
        std::string_view message;
        char const* words;
    } static constexpr known[] = {
        {"end of map not found", misfit},
        {"end of sequence not found", misfit},
        {"illegal block entry", misfit},
        {"illegal map key", misfit},
        {"illegal map value", "a \"key: value\" cannot stand here; indent it like its neighbours, "
                              "and write texts with a colon in quotes"},
        {"end of map flow not found", "a \"{\" is not closed; write its \"}\" here or before"},
        {"end of sequence flow not found", "a \"[\" is not closed; write its \"]\" here or before"},
        {"illegal EOF in scalar", "a quoted text begins here and never ends; close its quote"},
        {"unknown token", "a value cannot begin with this character; write it in quotes"},
    };
    for (auto const& each : known)
        if (message == each.message) return each.words;
    return "not readable as YAML: " + oneLine(message) + "; correct it there or just before";
}

/// Is the indentation of this line, counted from 0, made with a tab?
bool isIndentedWithTab(std::string const& text, int line) {
    std::size_t begin = 0;
    for (int i = 0; i < line; ++i) {
        auto const end = text.find('\n', begin);
        if (end == std::string::npos) return false;
        begin = end + 1;
    }
    auto const word = std::min(text.find_first_not_of(" \t-", begin), text.size());
    return text.substr(begin, word - begin).find('\t') != std::string::npos;
}

ChassisError inPlainWords(YAML::Exception const& error, std::string const& text) {
    if (error.mark.is_null()) return {0, plainWords(error.msg)};
    if (isIndentedWithTab(text, error.mark.line))
        return {error.mark.line + 1, "the line is indented with a tab; indent with spaces"};
    return {error.mark.line + 1, plainWords(error.msg)};
}

/// Builds the tree from the parser's events: unlike the parser's own nodes it keeps every line and
/// cannot be made to grow by aliases.
class TreeBuilder final : public YAML::EventHandler {
  public:
    TreeBuilder(std::string const& text, Findings& findings) : m_text(text), m_findings(findings) {}

    Description take() { return std::move(m_root); }

    void OnDocumentStart(YAML::Mark const& mark) override {
        if (m_begun) throw ChassisError(mark.line + 1, "a second YAML document; keep the first");
        m_begun = true;
    }
    void OnDocumentEnd() override {
        if (m_lastText && !isClosed(m_text, *m_lastText))
            throw ChassisError(m_lastText->line + 1,
                               "a quoted text begins here and never ends; close its quote");
    }

    void OnNull(YAML::Mark const& mark, YAML::anchor_t /*anchor*/) override {
        Description node;
        node.line = mark.line + 1;
        add(std::move(node));
    }

    void OnAlias(YAML::Mark const& mark, YAML::anchor_t /*anchor*/) override {
        throw ChassisError(mark.line + 1,
                           "references (*name) are not supported; write the value out");
    }

    void OnScalar(YAML::Mark const& mark, std::string const& tag, YAML::anchor_t /*anchor*/,
                  std::string const& value) override {
        Description node;
        node.line = mark.line + 1;
        node.scalar = value;
        node.form = (tag == "!" || tag == "tag:yaml.org,2002:str") ? Description::Form::text
                                                                   : Description::Form::plain;
        refuseTag(tag, node.line);
        if (node.form == Description::Form::text) m_lastText = mark;
        add(std::move(node));
    }

    void OnSequenceStart(YAML::Mark const& mark, std::string const& tag, YAML::anchor_t /*anchor*/,
                         YAML::EmitterStyle::value /*style*/) override {
        open(Description::Form::list, mark, tag);
    }
    void OnSequenceEnd() override { close(); }

    void OnMapStart(YAML::Mark const& mark, std::string const& tag, YAML::anchor_t /*anchor*/,
                    YAML::EmitterStyle::value /*style*/) override {
        open(Description::Form::map, mark, tag);
    }
    void OnMapEnd() override {
        m_findings.part([&] { refuseRepeatedKeys(m_open.back().node); });
        close();
    }

  private:
    struct Open {
        Description node;
        std::optional<DescriptionEntry> key; ///< read, its value still to come
    };

    static void refuseTag(std::string const& tag, int line) {
        if (tag.empty() || tag == "?" || tag == "!" || tag.starts_with("tag:yaml.org,2002:"))
            return;
        throw ChassisError(line, "the tag " + inQuotes(tag) + " means nothing here; remove it");
    }

    void open(Description::Form form, YAML::Mark const& mark, std::string const& tag) {
        int const line = mark.line + 1;
        refuseTag(tag, line);
        if (m_open.size() == kMaxDepth) refuseDepth(line);
        refuseComplexKey(line);
        Open opened;
        opened.node.form = form;
        opened.node.line = line;
        m_open.push_back(std::move(opened));
    }

    void close() {
        Description node = std::move(m_open.back().node);
        m_open.pop_back();
        add(std::move(node));
    }

    void refuseComplexKey(int line) const {
        if (!m_open.empty() && m_open.back().node.form == Description::Form::map &&
            !m_open.back().key)
            throw ChassisError(line, "a key must be a plain word; this one is a list or a map");
    }

    void add(Description node) {
        if (++m_values > kMaxValues)
            throw ChassisError(node.line, "too many values; a chassis has at most " +
                                              std::to_string(kMaxValues));
        if (m_open.empty()) {
            m_root = std::move(node);
            return;
        }
        Open& parent = m_open.back();
        if (parent.node.form == Description::Form::list) {
            parent.node.items.push_back(std::move(node));
        } else if (!parent.key) {
            if (!node.isScalar())
                throw ChassisError(node.line, "a key is missing before the colon; write one");
            parent.key = DescriptionEntry{std::move(node.scalar), node.line, {}};
        } else {
            // The parser places a missing value where the next thing begins.
            if (node.form == Description::Form::nothing) node.line = parent.key->line;
            addEntry(parent.node, parent.key->key, parent.key->line, std::move(node));
            parent.key.reset();
        }
    }

    std::string const& m_text;
    Findings& m_findings;
    bool m_begun = false;
    std::optional<YAML::Mark> m_lastText;
    std::size_t m_values = 0; ///< keys included
    Description m_root;
    std::vector<Open> m_open;
};

Description fromJson(nlohmann::json const& json, std::size_t depth) {
    if (depth > kMaxDepth) refuseDepth(0);
    Description node;
    switch (json.type()) {
    case nlohmann::json::value_t::object:
        node.form = Description::Form::map;
        for (auto const& [key, value] : json.items())
            addEntry(node, key, 0, fromJson(value, depth + 1));
        break;
    case nlohmann::json::value_t::array:
        node.form = Description::Form::list;
        for (auto const& value : json)
            node.items.push_back(fromJson(value, depth + 1));
        break;
    case nlohmann::json::value_t::string:
        node.form = Description::Form::text;
        node.scalar = json.get<std::string>();
        break;
    case nlohmann::json::value_t::number_integer:
    case nlohmann::json::value_t::number_unsigned:
        node.form = Description::Form::plain;
        node.scalar = json.dump();
        break;
    case nlohmann::json::value_t::null:
        break;
    default:
        node.form = Description::Form::other;
        node.scalar = json.dump();
        break;
    }
    return node;
}

bool isDecimal(std::string_view digits) {
    if (digits.empty() || (digits.size() > 1 && digits.front() == '0')) return false;
    return std::ranges::all_of(digits, [](char c) { return c >= '0' && c <= '9'; });
}

bool isHexadecimal(std::string_view digits) {
    return !digits.empty() && std::ranges::all_of(digits, [](char c) {
        return (c >= '0' && c <= '9') || (c >= 'a' && c <= 'f') || (c >= 'A' && c <= 'F');
    });
}

struct IntegerText {
    bool negative = false;
    bool hexadecimal = false;
    std::string_view digits;
};

std::optional<IntegerText> splitInteger(std::string_view text) {
    IntegerText split;
    if (text.starts_with('-') || text.starts_with('+')) {
        split.negative = text.front() == '-';
        text.remove_prefix(1);
    }
    split.hexadecimal = text.starts_with("0x") || text.starts_with("0X");
    if (split.hexadecimal) text.remove_prefix(2);
    split.digits = text;
    bool const good = split.hexadecimal ? isHexadecimal(text) : isDecimal(text);
    return good ? std::optional(split) : std::nullopt;
}

} // namespace

bool Description::readsAsInteger() const {
    return form == Form::plain && splitInteger(scalar).has_value();
}

std::optional<std::int64_t> Description::integer() const {
    auto const split = form == Form::plain ? splitInteger(scalar) : std::nullopt;
    if (!split) return std::nullopt;
    std::int64_t value = 0;
    auto const* const end = split->digits.data() + split->digits.size();
    if (std::from_chars(split->digits.data(), end, value, split->hexadecimal ? 16 : 10).ec !=
        std::errc())
        return std::nullopt;
    return split->negative ? -value : value;
}

std::optional<double> Description::decimal() const {
    if (form != Form::plain && form != Form::other) return std::nullopt;
    double number = 0;
    auto const* const end = scalar.data() + scalar.size();
    auto const [stop, error] = std::from_chars(scalar.data(), end, number);
    if (error != std::errc() || stop != end || !std::isfinite(number)) return std::nullopt;
    return number;
}

Description const* Description::find(std::string_view key) const {
    auto const found = std::ranges::find(entries, key, &DescriptionEntry::key);
    return found == entries.end() ? nullptr : &found->value;
}

std::string Description::words() const {
    switch (form) {
    case Form::nothing:
        return "nothing";
    case Form::list:
        return "a list";
    case Form::map:
        return "a map";
    case Form::text:
        return "the text " + inQuotes(scalar);
    case Form::plain:
        return readsAsInteger() ? scalar.substr(0, 40) : "the text " + inQuotes(scalar);
    case Form::other:
        return scalar.substr(0, 40);
    }
    return {};
}

Description describeYaml(std::string const& text) {
    Findings findings;
    return describeYaml(text, findings);
}

Description describeYaml(std::string const& text, Findings& findings) {
    std::istringstream stream(text);
    TreeBuilder builder(text, findings);
    try {
        YAML::Parser parser(stream);
        while (parser.HandleNextDocument(builder)) {
        }
    } catch (YAML::Exception const& error) {
        throw inPlainWords(error, text);
    }
    return builder.take();
}

Description describeJson(nlohmann::json const& json) {
    return fromJson(json, 1);
}

} // namespace kvlsim
