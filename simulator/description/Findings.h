// SPDX-License-Identifier: BSD-2-Clause
// What a reader finds wrong with a description.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "simulator/chassis/AttributeValue.h"
#include "simulator/chassis/ChassisError.h"

namespace kvlsim {

/// `Findings` are the errors and warnings of one description.
class Findings {
  public:
    enum class OnError : std::uint8_t {
        stop,    ///< the first error is thrown
        collect, ///< reading goes on behind an error
    };
    /// The most errors, and the most warnings, that are kept; the rest is counted.
    static constexpr std::size_t kMost = 100;

    explicit Findings(OnError onError = OnError::stop) : m_onError(onError) {}

    /// Runs `read`, and keeps the ChassisError that it throws where errors are collected.
    template <typename Read>
    void part(Read read) {
        try {
            read();
        } catch (ChassisError const& error) {
            if (m_onError == OnError::stop) throw;
            m_errors.add(error);
        }
    }
    /// Warns of an attribute whose name is unknown but close to a known one.
    void checkName(std::string const& name, int line);
    /// Warns of a number that the standard does not allow for the attribute.
    void checkNumber(std::string const& name, AttributeValue const& value, int line);

    bool hasErrors() const { return !m_errors.first.empty(); }

    /// "source:line: message" each, in the order of lines, then how many more there are.
    std::vector<std::string> errors(std::string_view source) const;
    /// Likewise; the messages begin with "warning: ".
    std::vector<std::string> warnings(std::string_view source) const;

  private:
    struct Kept {
        std::vector<ChassisError> first;
        std::size_t more = 0;
        void add(ChassisError const& error);
        std::vector<std::string> lines(std::string_view source, char const* what) const;
    };

    /// Unknown names beyond these are not compared with the known ones, which takes its time.
    static constexpr std::size_t kMostNames = 1000;

    OnError m_onError;
    std::unordered_map<std::string, std::string> m_meant; ///< by unknown name; empty: nothing
    Kept m_errors;
    Kept m_warnings;
};

} // namespace kvlsim
