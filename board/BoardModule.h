// SPDX-License-Identifier: BSD-2-Clause
// How an agent meets a board module.
//
// A board module is a shared library `<name>kvl.so` with this one C entry point. The agent calls it
// once with the version that it was built with and attaches the factory to its board manager.
#pragma once

#include "board/BoardFactory.h"

/// The version of everything a module derives from or calls. Raised by every incompatible change.
inline constexpr int KVL_BOARD_MODULE_ABI_VERSION = 1;

/// The entry point's name, for dlsym().
inline constexpr char const* KVL_BOARD_MODULE_ENTRY_POINT = "kvl_create_board_factory";

using KVLCreateBoardFactory = BoardFactory*(int abi_version);

/// Returns a new factory, to be handed at once to a `ReferenceCounter<BoardFactory>`; null when the
/// module does not know `abi_version`.
extern "C" KVLOAM_API BoardFactory* kvl_create_board_factory(int abi_version);
