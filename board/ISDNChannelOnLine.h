// SPDX-License-Identifier: BSD-2-Clause
// What an ISDN channel may say about the DS1 line that carries it.
#pragma once

#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"

/// An `ISDNChannelOnLine` is an ISDN channel that knows its DS1 line. A class derived from
/// `ISDNBChannel` or `ISDNDChannel` may derive from this class too; agents find it by a dynamic
/// cast of the channel. It has no interface identifier and no reference count of its own.
class KVLOAM_API ISDNChannelOnLine {
  public:
    /// The line that carries the channel, one of the channel's own board; an empty handle if it is
    /// not known. Thread-safe.
    virtual ReferenceCounter<DS1LineDevice> GetLine() = 0;

  protected:
    ISDNChannelOnLine() = default;
    ISDNChannelOnLine(ISDNChannelOnLine const&) = default;
    ISDNChannelOnLine& operator=(ISDNChannelOnLine const&) = default;
    ~ISDNChannelOnLine() = default;
};
