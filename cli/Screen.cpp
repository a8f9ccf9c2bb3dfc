// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Screen.h"

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <charconv>
#include <clocale>
#include <cstdlib>
#include <cstring>

#include "cli/Text.h"

namespace kvloam {

namespace {

std::string_view variable(char const* name) {
    char const* const value = std::getenv(name);
    return value == nullptr ? std::string_view() : value;
}

/// The number that a variable is; 0: it is none.
std::size_t numberIn(char const* name) {
    std::string_view const text = variable(name);
    std::size_t number = 0;
    auto const read = std::from_chars(text.data(), text.data() + text.size(), number);
    return read.ec == std::errc() && read.ptr == text.data() + text.size() ? number : 0;
}

} // namespace

Screen Screen::ofStandardOutput() {
    constexpr std::size_t kUsualWidth = 80;
    Screen screen;
    std::setlocale(LC_CTYPE, "");
    screen.hasUtf8 = std::strcmp(nl_langinfo(CODESET), "UTF-8") == 0;
    screen.isTerminal = isatty(STDOUT_FILENO) == 1;
    if (std::size_t const columns = numberIn("COLUMNS"); columns > 0) screen.width = columns;
    if (!screen.isTerminal) return screen;
    screen.hasColours = variable("NO_COLOR").empty() && variable("TERM") != "dumb";
    winsize size{};
    if (ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) {
        screen.width = size.ws_col;
        if (size.ws_row > 0) screen.height = size.ws_row;
    } else if (screen.width == kUnlimited) {
        screen.width = kUsualWidth;
    }
    return screen;
}

std::string Screen::clean(std::string_view text) const {
    return hasUtf8 ? printable(text) : printableAscii(text);
}

std::string Screen::painted(std::string_view text, Paint paint) const {
    if (!hasColours || paint == Paint::Plain || text.empty()) return std::string(text);
    char const* begin = "";
    switch (paint) {
    case Paint::Good:
        begin = "\033[32m";
        break;
    case Paint::Warning:
        begin = "\033[33m";
        break;
    case Paint::Bad:
        begin = "\033[1;31m";
        break;
    case Paint::Heading:
        begin = "\033[1m";
        break;
    case Paint::Faint:
        begin = "\033[2m";
        break;
    case Paint::Plain:
        break;
    }
    return begin + std::string(text) + "\033[0m";
}

} // namespace kvloam
