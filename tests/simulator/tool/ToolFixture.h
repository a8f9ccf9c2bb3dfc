// SPDX-License-Identifier: BSD-2-Clause
// The real kvlsim against a real process that holds a platform.
#pragma once

#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryDirectory.h"

/// A `ToolTest` runs the real kvlsim against a process that holds a platform.
class ToolTest : public testing::Test {
  protected:
    /// Starts the process, and ends an earlier one.
    support::ChildProcess& hold(std::vector<std::string> environment = {}) {
        holder.reset(); // an earlier one must release the socket first
        environment.push_back("KVLSIM_SOCKET=" + socket());
        holder = std::make_unique<support::ChildProcess>(
            std::vector<std::string>{KVLSIM_PLATFORM_HOLDER}, environment);
        EXPECT_EQ(holder->readLine(), "ready");
        return *holder;
    }
    support::Finished kvlsim(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), KVLSIM_TOOL);
        return support::run(arguments, {"KVLSIM_SOCKET=" + socket()});
    }
    /// The output of the tool, which must succeed and print no message.
    std::string succeed(std::vector<std::string> const& arguments) const {
        auto const finished = kvlsim(arguments);
        EXPECT_EQ(finished.status, 0) << arguments.front() << ": " << finished.err;
        EXPECT_EQ(finished.err, "");
        return finished.out;
    }
    /// The tool must fail with `status` and say `words`.
    void expectRefusal(std::vector<std::string> const& arguments, int status,
                       std::string const& words) const {
        auto const finished = kvlsim(arguments);
        EXPECT_EQ(finished.status, status);
        EXPECT_THAT(finished.err, testing::HasSubstr(words));
        EXPECT_EQ(finished.out, "");
    }
    /// The tool must fail with `status` and print `line` and nothing else.
    void expectRefusalLine(std::vector<std::string> const& arguments, int status,
                           std::string const& line) const {
        auto const finished = kvlsim(arguments);
        EXPECT_EQ(finished.status, status);
        EXPECT_EQ(finished.err, line + "\n");
        EXPECT_EQ(finished.out, "");
    }
    std::string write(char const* name, std::string const& text) const {
        std::string const path = directory.file(name);
        std::ofstream(path) << text;
        return path;
    }
    std::string socket() const { return directory.file("socket"); }

    support::TemporaryDirectory directory;
    std::unique_ptr<support::ChildProcess> holder;
};
