// SPDX-License-Identifier: BSD-2-Clause
// A process that holds a simulated platform: prints every event, answers lines of standard input.
//
// read HANDLE NAME    the text attribute as a device mapper client reads it: "value TEXT"
// flood COUNT         announces COUNT events and ends at once, while they are being delivered
// exit-in-handler     from now on the first event ends the process from within its handler
// end of input        ends the process
#include <unistd.h>

#include <array>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <iostream>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include "boardplatform/dm_client.h"
#include "boardplatform/qsb.h"
#include "boardplatform/vqx_event_service.h"
#include "simulator/exports/Control.h"

namespace {

using Filter = VqxEventService::AdminConsumer::FilterCallbackAssoc;

/// A `Printer` is a consumer that prints events. It is a static object that is older than the
/// platform, so delivery must have ended before it is destroyed.
class Printer final : public VqxEventService::CEventHandlerAdaptor {
  public:
    ~Printer() { m_gone = true; }

    int HandleEvent(AdminCallbackMsg* message, void*) override {
        if (m_gone) std::abort();
        if (exitInHandler) std::exit(0);
        if (silent) return 1;
        std::int32_t board = 0;
        if (message->payload != nullptr) std::memcpy(&board, message->payload, sizeof board);
        std::printf("event %X %d\n", message->id, board);
        std::fflush(stdout);
        return 1;
    }

    std::atomic<bool> silent = false;
    std::atomic<bool> exitInHandler = false;

  private:
    std::atomic<bool> m_gone = false;
};

Printer s_printer;

void printAttribute(long handle, std::string const& name) {
    std::array<char, 129> text{};
    DMAttribute request{name.c_str(), text.data(), 0, 0, 128};
    int const result = dm_getDeviceMapperClient()->GetAttributes(handle, 1, &request);
    if (result == 0)
        std::printf("value %s\n", text.data());
    else
        std::printf("result %d\n", result);
    std::fflush(stdout);
}

/// All boards of the attribute store, "serials A B ...", or why there are none.
void printStore() {
    std::array<char, kQSBTypeNameSize> rootType{};
    int root = 0;
    int result = QSBOpenStorage(rootType.data(), &root);
    if (result != QSB_SUCCESS) {
        std::printf("result %d\n", result);
        std::fflush(stdout);
        return;
    }
    std::vector<int> families;
    int family = 0;
    for (result = QSBGetFirstInstance("Family", rootType.data(), root, &family);
         result == QSB_SUCCESS; result = QSBGetNextInstance(&family))
        families.push_back(family);
    std::printf("serials");
    for (int const each : families) {
        int board = 0;
        for (result = QSBGetFirstInstance("Board", "Family", each, &board); result == QSB_SUCCESS;
             result = QSBGetNextInstance(&board)) {
            std::array<char, 80> serial{};
            QSBGetDataValue("Board", board, 404, 80, serial.data());
            std::printf(" %s", serial.data());
        }
    }
    QSBCloseStorage();
    std::printf("\n");
    std::fflush(stdout);
}

} // namespace

int main() {
    std::vector<Filter> admin;
    for (std::uint32_t id = 0x40001; id <= 0x4000A; ++id)
        admin.push_back({&s_printer, nullptr, id, 1});
    std::vector<Filter> fault;
    for (std::uint32_t id = 0x30001; id <= 0x30002; ++id)
        fault.push_back({&s_printer, nullptr, id, 1});
    // Never destroyed, like a monitoring process's own.
    static auto* const adminConsumer = new VqxEventService::VqxAdminConsumer(
        "ADMIN", L"Holder", admin.data(), static_cast<int>(admin.size()), nullptr, 0);
    static auto* const faultConsumer = new VqxEventService::VqxAdminConsumer(
        "FAULT", L"Holder", fault.data(), static_cast<int>(fault.size()), nullptr, 0);
    if (adminConsumer->Start() != 0 || faultConsumer->Start() != 0) return 1;
    std::puts("ready");
    std::fflush(stdout);
    for (std::string line; std::getline(std::cin, line);) {
        std::istringstream words(line);
        std::string command;
        words >> command;
        if (command == "read") {
            long handle = 0;
            std::string name;
            words >> handle >> name;
            printAttribute(handle, name);
        } else if (command == "run") {
            std::string json;
            std::getline(words, json);
            std::puts(kvlsim::execute(nlohmann::json::parse(json)).dump().c_str());
            std::fflush(stdout);
        } else if (command == "child") {
            std::string name;
            words >> name;
            auto const reply = kvlsim::execute({{"command", "process-add"}, {"name", name}});
            std::printf("child %d\n", reply.value("pid", 0));
            std::fflush(stdout);
        } else if (command == "store") {
            printStore();
        } else if (command == "flood") {
            int count = 0;
            words >> count;
            s_printer.silent = true;
            for (int i = 0; i < count; ++i)
                kvlsim::execute({{"command", "event"}, {"id", 0x40001}});
            return 0;
        } else if (command == "exit-in-handler") {
            s_printer.exitInHandler = true;
            kvlsim::execute({{"command", "event"}, {"id", 0x40001}});
            while (true)
                pause(); // two threads must not both end the process
        }
    }
    return 0;
}
