// SPDX-License-Identifier: BSD-2-Clause
// A line of the SNMP configuration that names a notification receiver.
#pragma once

#include <cstddef>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>

namespace kvloamd {

/// A fault in such a line.
class ReceiverFault : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// Where a receiver is reached by UDP.
struct ReceiverAddress {
    int family = 0;   ///< AF_INET or AF_INET6
    std::string host; ///< a name or a number
    std::string port;

    /// The host as a number; nothing if it is a name.
    std::optional<std::string> number() const;
};

/// A `ReceiverLine` is a trapsink, trap2sink, informsink or trapsess line that has been taken apart
/// as far as needed to open its receiver without waiting for anybody. The SNMP library reads the
/// rest of it.
class ReceiverLine {
  public:
    /// `directive`: the first word, in lower case; `text`: the rest of the line; `thirdByDefault`:
    /// a trapsess without a version is of SNMPv3. Throws ReceiverFault.
    ReceiverLine(std::string directive, std::string text, bool thirdByDefault);

    std::string const& directive() const { return m_directive; }
    ReceiverAddress const& address() const { return m_address; }
    /// As the configuration writes it, for a message.
    std::string where() const { return m_text.substr(m_hostBegin, m_hostEnd - m_hostBegin); }
    /// Whether the receiver's SNMPv3 engine ID must be known before the first inform.
    bool asksEngine() const { return m_asksEngine; }
    /// Whether the receiver acknowledges notifications.
    bool isForInforms() const { return m_isForInforms; }
    /// The text with the host's number in place of its name, and with the octets of the engine ID
    /// unless they are empty.
    std::string resolved(std::string const& number, std::string_view engine) const;

  private:
    struct Word {
        std::size_t begin;
        std::size_t end;
        std::string text;
    };

    std::optional<Word> nextWord(std::size_t from) const;
    Word expectWord(std::size_t from, std::string const& missing) const;
    void readSink();
    void readSession(bool thirdByDefault);
    void readHost(Word const& word);

    std::string m_directive;
    std::string m_text;
    ReceiverAddress m_address;
    std::size_t m_hostBegin = 0;
    std::size_t m_hostEnd = 0;
    bool m_portIsApart = false;
    bool m_asksEngine = false;
    bool m_isForInforms = false;
};

} // namespace kvloamd
