// SPDX-License-Identifier: BSD-2-Clause
// The reference factory with its internal operations opened.
#pragma once

#include "Z7SimBoardFactory.h"

class OpenFactory final : public Z7SimBoardFactory {
  public:
    using Z7SimBoardFactory::check_for_changed_boards;
    using Z7SimBoardFactory::GetBoardIdentifiers;
    using Z7SimBoardFactory::MakeBoard;
    using Z7SimBoardFactory::ping_boards;
    using Z7SimBoardFactory::RefreshBoardData;
};
