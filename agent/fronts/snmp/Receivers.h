// SPDX-License-Identifier: BSD-2-Clause
// Opens the notification receivers of the SNMP configuration.
#pragma once

#include <chrono>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "agent/fronts/EventLoop.h"
#include "agent/fronts/snmp/EngineProbe.h"
#include "agent/fronts/snmp/Informs.h"
#include "agent/fronts/snmp/NameResolver.h"
#include "agent/fronts/snmp/ReceiverLine.h"

namespace kvloamd {

/// `Receivers` are the notification receivers that the SNMP configuration names. The SNMP library
/// resolves names and asks SNMPv3 receivers for their engine IDs while everything else waits, and
/// gives up if that fails. `Receivers` do both without delaying anything, as often as needed, and
/// give the library only what it can open at once. Thread-bound to the SNMP thread; one object
/// exists at a time, while the library is started.
class Receivers final : public EventLoop::Source {
  public:
    /// How long notifications wait for the first attempts to open the receivers.
    static constexpr std::chrono::seconds kFirstAttempts{5};
    /// How long an SNMPv3 receiver may take to answer with its engine ID.
    static constexpr std::chrono::seconds kAnswerTime{2};
    /// The pause after an attempt that failed; it doubles up to the longest.
    static constexpr std::chrono::seconds kShortestPause{1};
    static constexpr std::chrono::seconds kLongestPause{60};

    Receivers() = default;
    ~Receivers() override;

    /// Takes over the directives that name receivers. Call it between init_mib_modules and
    /// init_snmp.
    void takeDirectives();
    /// The configuration has been read: begins to open its receivers. Calls `settled` once, now or
    /// later, when every receiver is open or was tried, or `kFirstAttempts` have passed.
    void begin(std::function<void()> settled);

    /// Whether `settled` has been called.
    bool isSettled() const { return m_begun && !m_whenSettled; }
    /// Whether every receiver is open.
    bool allOpen() const { return m_waiting.empty(); }
    /// The receivers that acknowledge notifications.
    Informs& informs() { return m_informs; }

    std::optional<Clock::time_point> prepare(std::vector<pollfd>& polled) override;
    void handle(std::span<pollfd const> polled) override;

  private:
    enum class Stage { Paused, Resolving, Probing, Open };
    /// A receiver that is not open yet.
    struct Waiting {
        explicit Waiting(ReceiverLine waitingLine) : line(std::move(waitingLine)) {}

        ReceiverLine line;
        Stage stage = Stage::Paused;
        Clock::time_point due; ///< the end of the pause, or of the wait for an engine ID
        std::uint64_t question = 0;
        std::string number; ///< of the host
        std::unique_ptr<EngineProbe> probe;
        std::chrono::seconds pause = kShortestPause;
        bool wasTried = false;
    };

    static void takeLine(char const* directive, char* text);
    /// Forgets all receivers, before the configuration is read again.
    static void forget();
    /// Lets the library open a receiver that delays nothing.
    void openByLibrary(ReceiverLine const& line, std::string const& number,
                       std::string_view engine);

    void add(ReceiverLine line);
    void takeAnswers(Clock::time_point now);
    void advance(Waiting& waiting, Clock::time_point now);
    /// Continues with the host's number.
    void proceed(Waiting& waiting, std::string const& number, Clock::time_point now);
    void open(Waiting& waiting, std::string_view engine, Clock::time_point now);
    void fail(Waiting& waiting, std::string const& why, Clock::time_point now);
    void settleIfDue(Clock::time_point now);

    std::vector<Waiting> m_waiting;
    Informs m_informs;
    NameResolver m_resolver;
    bool m_begun = false;
    Clock::time_point m_deadline; ///< of the first attempts
    std::function<void()> m_whenSettled;
};

} // namespace kvloamd
