// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardSource.h"

#include <algorithm>
#include <exception>
#include <string>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardFaults.h"
#include "agent/readers/BoardReader.h"
#include "agent/readers/Courtesy.h"

namespace kvloamd {

std::vector<BoardRow> BoardSource::read() {
    std::vector<int> const present = indices();
    forgetGoneBoards(present);
    std::erase_if(m_answered, [&](auto const& entry) {
        return !std::ranges::binary_search(present, static_cast<int>(entry.first));
    });
    std::vector<BoardRow> rows;
    rows.reserve(present.size());
    for (int const index : present) {
        ReferenceCounter<Board> const board = m_manager.GetBoardByIndex(index);
        if (Board* const asked = board.get(); asked != nullptr)
            rows.push_back(readRow(*asked, index));
        yieldBetweenBoards();
    }
    std::erase_if(
        rows, [this](BoardRow const& row) { return hasGone(static_cast<int>(row.boardIndex)); });
    return rows;
}

BoardRow BoardSource::readRow(Board& board, int index) {
    auto const boardIndex = static_cast<std::uint32_t>(index);
    BoardRow& answered = m_answered[boardIndex];
    answered.boardIndex = boardIndex;
    std::string fault;
    if (readGuarded(boardIndex, "answers", [&] {
            try {
                answered = readBoard(board, index);
            } catch (std::exception const& error) {
                fault = error.what();
                throw;
            }
        }))
        return answered;
    BoardRow row = answered;
    row.status = BoardStatusNone;
    row.secondaryStatus = BoardStatusNone;
    row.errorMessage = printable("does not answer: " + fault);
    return row;
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

bool BoardSource::hasGone(int index) {
    std::scoped_lock const guard(m_mutex);
    return m_gone.contains(index);
}

} // namespace kvloamd
