// SPDX-License-Identifier: BSD-2-Clause
// Compares the answers of an agent with an expectation file.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {

/// A line of the file is "name = TYPE: value", in the order of names. "*" in the place of the value
/// stands for one that differs from run to run, "PID" in a name for the agent's process id. A line
/// that begins with "alone " or "beside " is for an agent that serves alone, or beside a master.
class Expectation {
  public:
    enum class Served { Alone, Beside };
    /// Runs one of the SNMP tools, with options and names.
    using Ask = std::function<std::vector<Answer>(std::string const& tool,
                                                  std::vector<std::string> const& arguments)>;

    Expectation(std::string const& file, Served served, int agentPid, Ask ask);

    std::vector<Answer> const& all() const { return m_all; }

    /// GET of every name answers with its line's value.
    void expectGet() const;
    /// GETNEXT of every name answers with the next line.
    void expectGetNext() const;
    /// GETBULK from every seventh name answers with the lines after it.
    void expectGetBulk() const;
    /// A walk of everything that the agent serves answers with exactly the lines of the file.
    void expectWalk() const;

  private:
    bool isForeign(Oid const& name) const;
    std::vector<Answer> nextOwn(std::vector<Oid> const& names) const;

    Served m_served;
    Ask m_ask;
    std::vector<Answer> m_all;
};

} // namespace kvloamd::e2e
