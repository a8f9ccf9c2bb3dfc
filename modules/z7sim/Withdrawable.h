// SPDX-License-Identifier: BSD-2-Clause
// A feature that something beside its board calls.
#pragma once

/// Withdrawn when the board takes the feature away: from then on nothing is begun on it.
class Withdrawable {
  public:
    virtual void Withdraw() = 0;

  protected:
    ~Withdrawable() = default;
};
