// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/ConfigFile.h"

#include <algorithm>
#include <string_view>

namespace kvloamd {

namespace {

constexpr std::string_view kBlanks = " \t\r";

/// Reads one line from left to right.
class LineReader {
  public:
    LineReader(std::string_view text, int line) : m_text(text), m_line(line) {}

    /// Skips blanks. Whether nothing but a comment is left.
    bool atEnd() {
        m_text.remove_prefix(std::min(m_text.find_first_not_of(kBlanks), m_text.size()));
        return m_text.empty() || m_text.front() == '#';
    }
    /// Takes `character` if it is next.
    bool take(char character) {
        if (atEnd() || m_text.front() != character) return false;
        m_text.remove_prefix(1);
        return true;
    }
    /// Takes everything up to a blank or one of the marks of the syntax.
    std::string word() {
        if (atEnd()) return {};
        std::size_t const end = std::min(m_text.find_first_of(" \t\r=,[]#\"'"), m_text.size());
        std::string taken(m_text.substr(0, end));
        m_text.remove_prefix(end);
        return taken;
    }
    /// Takes a word or a quoted text.
    void item() {
        for (char const quote : {'"', '\''}) {
            if (!take(quote)) continue;
            std::size_t const end = m_text.find(quote);
            if (end == std::string_view::npos)
                fail("the text is not closed; add a " + std::string(1, quote));
            m_text.remove_prefix(end + 1);
            return;
        }
        if (word().empty()) fail("there is no value; write it like key = \"value\"");
    }
    void value() {
        if (!take('[')) return item();
        if (take(']')) return;
        do {
            if (atEnd()) fail("the list is not closed; end it with ] on the same line");
            item();
        } while (take(','));
        if (!take(']')) fail("the list is not closed; end it with ] on the same line");
    }

    [[noreturn]] void fail(std::string const& text) const { throw ConfigFault(m_line, text); }

  private:
    std::string_view m_text;
    int m_line;
};

} // namespace

std::map<std::string, int> checkConfigFile(std::istream& file, std::set<std::string> const& keys) {
    std::map<std::string, int> lines;
    std::string text;
    for (int line = 1; std::getline(file, text); ++line) {
        LineReader reader(text, line);
        if (reader.atEnd()) continue;
        std::string const key = reader.word();
        if (key.empty() || !reader.take('='))
            reader.fail("this is not of the form key = value; the keys are the names of the long "
                        "options, as in port = 1161");
        if (!keys.contains(key))
            reader.fail("unknown key '" + key +
                        "'; the keys are the names of the long options, see kvloamd --help");
        if (auto const [first, isNew] = lines.emplace(key, line); !isNew)
            reader.fail("'" + key + "' is set in line " + std::to_string(first->second) +
                        " already; write several values as a list");
        reader.value();
        if (!reader.atEnd()) reader.fail("something follows the value of '" + key + "'");
    }
    return lines;
}

} // namespace kvloamd
