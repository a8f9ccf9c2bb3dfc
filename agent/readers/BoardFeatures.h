// SPDX-License-Identifier: BSD-2-Clause
// A board's features of one kind.
#pragma once

#include "board/Board.h"

namespace kvloamd {

/// Calls `call(feature)` for every feature of `board` that is a `Kind`.
template <class Kind, class Call>
void forEachFeature(Board& board, Call const& call) {
    for (auto feature = board.GetFirstFeature(Kind::iid()); feature.get() != nullptr;
         feature = board.GetNextFeature(feature, Kind::iid()))
        if (auto* const found = dynamic_cast<Kind*>(feature.get())) call(*found);
}

} // namespace kvloamd
