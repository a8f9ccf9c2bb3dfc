// SPDX-License-Identifier: BSD-2-Clause
// What the agent logs while a test runs.
#pragma once

#include <algorithm>
#include <string>

#include <gtest/gtest.h>

namespace kvloamd {

/// A `LogCapture` captures standard error for a scope.
class LogCapture {
  public:
    LogCapture() { ::testing::internal::CaptureStderr(); }
    ~LogCapture() {
        if (!m_taken) ::testing::internal::GetCapturedStderr();
    }
    LogCapture(LogCapture const&) = delete;
    LogCapture& operator=(LogCapture const&) = delete;

    /// What was logged. Ends the capture.
    std::string take() {
        m_taken = true;
        return ::testing::internal::GetCapturedStderr();
    }

  private:
    bool m_taken = false;
};

inline long linesIn(std::string const& text) {
    return std::ranges::count(text, '\n');
}

} // namespace kvloamd
