// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Journal.h"

#include <algorithm>

#include "cli/Cells.h"
#include "cli/Text.h"

namespace kvloam {

namespace {

/// The text in exactly `columns` columns, the last of them blank.
std::string padded(std::string const& text, std::size_t columns) {
    std::string const shown = cut(text, columns - 1, "~");
    return shown + std::string(columns - width(shown), ' ');
}

/// What the entry says beside its event and severity, which have columns of their own.
std::string textOf(Json const& entry) {
    std::string const text = textIn(entry, "text");
    std::string const kind = textIn(entry, "kind");
    std::size_t const at = kind.empty() ? std::string::npos : text.find(kind);
    return at == std::string::npos ? text : text.substr(at);
}

} // namespace

std::int64_t newestEntry(Json const& answer) {
    std::int64_t newest = 0;
    for (Json const& entry : rowsIn(answer, "entries"))
        newest = std::max(newest, numberIn(entry, "number").value_or(0));
    return newest;
}

std::int64_t printJournal(View const& view, Json const& answer, std::int64_t last) {
    // The columns are fixed: entries that come later stand below those that are there.
    constexpr std::size_t kDate = 21;
    constexpr std::size_t kEvent = 14;
    constexpr std::size_t kSeverity = 15;
    constexpr std::size_t kLeastText = 20;
    std::size_t const screenWidth = view.screen.width;
    bool const hasSeverity = screenWidth >= kDate + kSeverity + kLeastText;
    bool const hasEvent = screenWidth >= kDate + kSeverity + kEvent + kLeastText;
    for (Json const& entry : rowsIn(answer, "entries")) {
        auto const date = dateIn(entry, "date");
        view.out << cut(padded(date ? localDate(*date) : "-", kDate), screenWidth,
                        view.screen.mark());
        if (hasEvent)
            view.out << padded(view.screen.clean(valueText(field(entry, "event"))), kEvent);
        if (hasSeverity) {
            Cell grave = severity(entry);
            if (grave.text == "-") grave.text.clear();
            if (textIn(entry, "event") == "alarmCleared") grave.paint = Paint::Good;
            view.out << view.screen.painted(padded(view.screen.clean(grave.text), kSeverity),
                                            grave.paint);
        }
        std::size_t const used = kDate + (hasEvent ? kEvent : 0) + (hasSeverity ? kSeverity : 0);
        view.out << cut(view.screen.clean(hasSeverity && hasEvent ? textOf(entry)
                                                                  : textIn(entry, "text")),
                        screenWidth - std::min(screenWidth, used), view.screen.mark())
                 << '\n';
    }
    return std::max(last, newestEntry(answer));
}

std::int64_t printJournalJson(std::ostream& out, Json const& answer, std::int64_t last) {
    for (Json const& entry : rowsIn(answer, "entries"))
        out << jsonText(entry, true) << '\n';
    return std::max(last, newestEntry(answer));
}

} // namespace kvloam
