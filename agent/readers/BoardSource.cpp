// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardSource.h"

#include <algorithm>
#include <exception>
#include <string>
#include <utility>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardFaults.h"
#include "agent/readers/BoardReader.h"
#include "agent/readers/Courtesy.h"

namespace kvloamd {

Rows<BoardRow> BoardSource::read() {
    std::vector<int> const present = indices();
    forgetGoneBoards(present);
    if (m_turns != nullptr) m_turns->begin(present, Clock::now());
    std::vector<std::shared_ptr<BoardRow const>> rows;
    rows.reserve(present.size());
    auto const drop = [](Known const&) {};
    m_known.begin();
    for (int const index : present) {
        auto const boardIndex = static_cast<std::uint32_t>(index);
        Known& known = m_known.at(boardIndex, drop);
        // No other board ever gets its index.
        if (known.board.unlocked() == nullptr) known.board = m_manager.GetBoardByIndex(index);
        if (Board* const asked = known.board.unlocked(); asked != nullptr) {
            if (isDue(m_turns, boardIndex) || !known.check || hasChanged(*asked, *known.check)) {
                if (m_turns != nullptr) m_turns->add(boardIndex);
                readRow(*asked, index, known);
            }
            rows.push_back(known.shown);
        }
        yieldBetweenBoards();
    }
    m_known.end(drop);
    if (std::set<int> const gone = goneBoards(); !gone.empty())
        std::erase_if(rows, [&](std::shared_ptr<BoardRow const> const& row) {
            return gone.contains(static_cast<int>(row->boardIndex));
        });
    auto const address = [](auto const& row) { return row.get(); };
    auto const addressOf = [](BoardRow const& row) { return &row; };
    if (!std::ranges::equal(rows, m_rows, {}, address, addressOf)) {
        m_rows.clear();
        m_rows.reserve(rows.size());
        for (auto const& row : rows)
            m_rows.append({row.get(), 1}, row);
    }
    return m_rows;
}

BoardSource::Check BoardSource::check(Board& board) {
    return {board.GetStatus(), board.GetSecondaryStatus(), board.GetFeatureListSize(),
            board.GetDeviceChangeDate()};
}

bool BoardSource::hasChanged(Board& board, Check const& before) {
    try {
        return check(board) != before;
    } catch (...) {
        // The full reading finds out, and says so.
        return true;
    }
}

void BoardSource::readRow(Board& board, int index, Known& known) {
    auto const boardIndex = static_cast<std::uint32_t>(index);
    known.check.reset();
    std::string fault;
    bool const answers = readGuarded(boardIndex, "answers", [&] {
        try {
            // Before the row, so that the next check sees what changes meanwhile.
            Check const now = check(board);
            BoardRow row = readBoard(board, index);
            if (known.answered == nullptr || *known.answered != row)
                known.answered = std::make_shared<BoardRow const>(std::move(row));
            known.check = now;
        } catch (std::exception const& error) {
            fault = error.what();
            throw;
        }
    });
    if (answers) {
        known.shown = known.answered;
        return;
    }
    BoardRow row = known.answered == nullptr ? BoardRow{} : *known.answered;
    row.boardIndex = boardIndex;
    row.status = BoardStatusNone;
    row.secondaryStatus = BoardStatusNone;
    row.errorMessage = printable("does not answer: " + fault);
    if (known.shown == nullptr || *known.shown != row)
        known.shown = std::make_shared<BoardRow const>(std::move(row));
}

void BoardSource::boardHasGone(int index) {
    std::scoped_lock const guard(m_mutex);
    m_gone.insert(index);
}

std::vector<int> BoardSource::indices() {
    std::vector<int> seen;
    std::vector<int> way; // what was seen and may still be there, to go on from
    int next = m_manager.GetFirstBoardIndex();
    for (;;) {
        for (; next != 0; next = m_manager.GetNextBoardIndex(next)) {
            seen.push_back(next);
            way.push_back(next);
        }
        // A walk ends with 0 at the last board, but also when its own board has been taken out
        // meanwhile. Indices only ever grow, so going on from the board before misses none.
        if (way.empty() || m_manager.GetBoardByIndex(way.back()).get() != nullptr) return seen;
        way.pop_back();
        next =
            way.empty() ? m_manager.GetFirstBoardIndex() : m_manager.GetNextBoardIndex(way.back());
    }
}

void BoardSource::forgetGoneBoards(std::vector<int> const& indices) {
    std::scoped_lock const guard(m_mutex);
    std::erase_if(m_gone, [&](int index) { return !std::ranges::binary_search(indices, index); });
}

std::set<int> BoardSource::goneBoards() {
    std::scoped_lock const guard(m_mutex);
    return m_gone;
}

} // namespace kvloamd
