// SPDX-License-Identifier: BSD-2-Clause
// Features that other parts of the module call.
#pragma once

/// A `Withdrawable` is a feature that is called from outside its board, by messages or by ticks.
/// Its board withdraws it before removing it; no call begins after that.
class Withdrawable {
  public:
    virtual void Withdraw() = 0;

  protected:
    ~Withdrawable() = default;
};
