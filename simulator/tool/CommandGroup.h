// SPDX-License-Identifier: BSD-2-Clause
// A group of commands of kvlsim, such as `kvlsim line ...`.
#pragma once

#include <functional>
#include <memory>

#include <CLI/CLI.hpp>

#include "simulator/tool/ControlClient.h"

namespace kvlsim {

/// A `CommandGroup` is a group of commands that share one set of options. The chosen command puts
/// its action into `chosen`.
template <class Options>
class CommandGroup {
  public:
    CommandGroup(CLI::App& app, char const* name, char const* help, Connect connect,
                 std::function<void()>& chosen)
        : m_group(app.add_subcommand(name, help)), m_connect(std::move(connect)), m_chosen(chosen) {
        m_group->fallthrough()->require_subcommand(1);
    }

    std::shared_ptr<Options> const& options() const { return m_options; }

    /// `run(options, connect)` does the work.
    template <class Run>
    CLI::App* add(char const* name, char const* help, Run run) {
        CLI::App* const command = m_group->add_subcommand(name, help);
        command->fallthrough();
        command->callback([&chosen = m_chosen, options = m_options, connect = m_connect, run] {
            chosen = [options, connect, run] { run(*options, connect); };
        });
        return command;
    }

  private:
    CLI::App* m_group;
    std::shared_ptr<Options> m_options = std::make_shared<Options>();
    Connect m_connect;
    std::function<void()>& m_chosen;
};

} // namespace kvlsim
