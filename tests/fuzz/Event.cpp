// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the platform's administrative and fault messages: the adaptors, the reference board
// module's factory and boards, and the agent's listeners must accept any message in any order.
#include <algorithm>
#include <cstdint>
#include <cstring>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "Z7SimBoardFactory.h"
#include "access/ExternalEventAdaptor.h"
#include "access/ExternalFaultEventAdaptor.h"
#include "agent/log/Log.h"
#include "agent/notifications/FaultListener.h"
#include "agent/notifications/StatusListener.h"
#include "agent/readers/BoardSource.h"
#include "simulator/exports/Control.h"
#include "tests/fuzz/FuzzInput.h"

namespace kvloamd {
namespace {

constexpr int kMaxSteps = 32;

/// Boards come, go, and change their serial numbers from one chassis to the next.
constexpr char const* kChassis[] = {
    "boards: []",
    "boards:\n"
    "  - {handle: 1, attributes: {SERIAL_NUMBER: A, LOGICAL ID: 1}}\n"
    "  - {handle: 2, attributes: {SERIAL_NUMBER: B, VORN_DRIVER_BOARD_ID: 7}}\n"
    "  - {handle: 3, attributes: {SERIAL_NUMBER: C, NAME: neither}}\n",
    "boards:\n"
    "  - {handle: 1, attributes: {SERIAL_NUMBER: B, LOGICAL ID: 1}}\n"
    "  - {handle: 3, attributes: {SERIAL_NUMBER: C, LOGICAL ID: 1, BOARD_CONDITION: 99}}\n"
    "  - {handle: 4, attributes: {SERIAL_NUMBER: D}}\n"};

/// The reference factory with its passes opened.
class OpenFactory final : public Z7SimBoardFactory {
  public:
    using Z7SimBoardFactory::check_for_changed_boards;
    using Z7SimBoardFactory::ping_boards;
};

/// The agent's side of the messages, for all inputs of the process.
class Agent {
  public:
    Agent() {
        setLogLevel(LogLevel::Error);
        kvlsim::loadChassis(kChassis[1]);
        m_factory->SetPingInterval(0);
        m_manager->AddBoardStatusListener(&m_status);
        m_manager->AddBoardStatusListener(&m_fault);
        ExternalFaultEventAdaptor::get_instance()->AddExternalFaultEventListener(&m_fault);
        m_manager->Attach(ReferenceCounter<BoardFactory>(m_factory));
        m_status.start([] {});
        m_fault.start([] {});
    }

    void step(fuzz::FuzzInput& input) {
        switch (input.choice(8)) {
        case 0:
        case 1:
        case 2:
            return administer(input);
        case 3:
        case 4:
            return fault(input);
        case 5:
            return kvlsim::loadChassis(kChassis[input.choice(std::size(kChassis))]);
        case 6:
            m_factory->ping_boards();
            return;
        default:
            read();
        }
    }
    /// As before the first input.
    void restore() {
        kvlsim::loadChassis(kChassis[0]);
        m_factory->check_for_changed_boards();
        fuzz::require(m_source.read().empty(), "boards that are gone are not shown");
        kvlsim::loadChassis(kChassis[1]);
        m_factory->check_for_changed_boards();
        for (FaultRow const& row : m_faults.read(m_counters.started).rows)
            m_faults.clear(row.boardIndex, row.platformBoard,
                           static_cast<std::uint16_t>(row.value));
        while (m_queue.pop()) {
        }
    }

  private:
    /// A board of the chassis, or none.
    static std::int32_t boardFrom(fuzz::FuzzInput& input) {
        std::uint8_t const octet = input.octet();
        return octet < 250 ? octet % 6 : input.number<std::int32_t>();
    }
    /// The payload has the size that the platform gives it, to the octet.
    template <class Adaptor>
    static void deliver(Adaptor& adaptor, std::uint32_t id, std::vector<char> payload) {
        payload.shrink_to_fit();
        AdminCallbackMsg message{id, {}, payload.data()};
        fuzz::require(adaptor.HandleEvent(&message, nullptr) == 1, "a message is accepted");
    }
    template <class Value>
    static void append(std::vector<char>& payload, Value value) {
        char octets[sizeof value];
        std::memcpy(octets, &value, sizeof value);
        payload.insert(payload.end(), octets, octets + sizeof value);
    }

    static void administer(fuzz::FuzzInput& input) {
        std::uint32_t id = AdminAllStarted - 1U + static_cast<std::uint32_t>(input.choice(12));
        if (input.octet() == 0xff) id = input.number<std::uint32_t>();
        std::vector<char> payload;
        if (id >= AdminBoardGone && id <= AdminBoardStopPending) append(payload, boardFrom(input));
        deliver(*ExternalEventAdaptor::get_instance().get(), id, std::move(payload));
    }
    static void fault(fuzz::FuzzInput& input) {
        std::uint32_t id = FaultRaised - 1U + static_cast<std::uint32_t>(input.choice(4));
        if (input.octet() == 0xff) id = input.number<std::uint32_t>();
        std::vector<char> payload;
        append(payload, boardFrom(input));
        append(payload, input.number<std::uint16_t>());
        deliver(*ExternalFaultEventAdaptor::get_instance().get(), id, std::move(payload));
    }
    void read() {
        auto const rows = m_source.read();
        fuzz::require(std::ranges::adjacent_find(rows, std::ranges::greater_equal(),
                                                 &BoardRow::boardIndex) == rows.end(),
                      "board indices ascend");
        Faults const faults = m_faults.read(m_counters.started);
        fuzz::require(faults.rows.size() <= FaultLog::kCapacity, "the list of faults is bounded");
        fuzz::require(m_queue.size() <= NotificationQueue::kCapacity, "the queue is bounded");
    }

    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    Counters m_counters;
    BoardSource m_source{*m_manager.get()};
    NotificationQueue m_queue{m_counters};
    FaultLog m_faults;
    Oid const m_enterprise{1, 3, 6, 1, 4, 1, 32473};
    StatusListener m_status{*m_manager.get(), m_source, m_queue, m_counters, m_enterprise};
    FaultListener m_fault{*m_manager.get(), m_faults, m_queue, m_enterprise};
    OpenFactory* m_factory = new OpenFactory;
};

} // namespace
} // namespace kvloamd

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    // Never destroyed: the adaptors keep pointers to the listeners.
    static auto* const agent = new kvloamd::Agent;
    fuzz::FuzzInput input(octets, size);
    for (int steps = 0; steps < kvloamd::kMaxSteps && !input.atEnd(); ++steps)
        agent->step(input);
    agent->restore();
    return 0;
}
