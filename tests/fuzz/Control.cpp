// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the control commands of the simulated platform: every line of the input is a command.
#include <unistd.h>

#include <cstdlib>
#include <memory>
#include <optional>
#include <string>

#include "simulator/control/Commands.h"
#include "simulator/description/ChassisReader.h"
#include "tests/fuzz/Folder.h"
#include "tests/fuzz/FuzzInput.h"

namespace {

constexpr char kChassis[] = R"(
boards:
  - handle: 1
    attributes: {SERIAL_NUMBER: "A", NAME: one}
    devices:
      - handle: 11
        type: 501
        attributes: {NAME: trunk}
        line: {type: e1-crc}
        channels: {bearers: 30, signalling: l2}
  - handle: 2
    attributes: {SERIAL_NUMBER: "B", NAME: two}
)";
constexpr int kMaxCommands = 32;

/// The platform with its attribute store in a folder of its own.
class Host {
  public:
    Host() { platform().store().setDirectory(m_folder.path()); }
    static kvlsim::Platform& platform() { return kvlsim::Platform::instance(); }

    void restart() const {
        platform().replaceChassis(kvlsim::readChassis(kChassis));
        unlink(m_folder.file("attributes.db").c_str());
    }

  private:
    fuzz::Folder m_folder;
};

/// A command that starts a process, or looks at all of the host's, is too slow to be run by the
/// million.
bool isSlow(std::string_view line) {
    return line.find("process-") != std::string_view::npos &&
           line.find("process-list") == std::string_view::npos &&
           (line.find("\"name\"") != std::string_view::npos ||
            line.find("\"process\"") != std::string_view::npos);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    static Host const host;
    host.restart();
    fuzz::FuzzInput input(octets, size);
    for (int count = 0; count < kMaxCommands && !input.atEnd(); ++count) {
        std::string const line(input.line('\n'));
        if (isSlow(line)) continue;
        std::optional<std::uint64_t> waitFor;
        auto const reply = kvlsim::answerLine(Host::platform(), line, waitFor);
        fuzz::require(reply.is_object() && reply.contains("ok"), "a command is answered");
        std::string const text = kvlsim::asLine(reply);
        fuzz::require(text.find('\n') == text.size() - 1, "an answer is one line");
    }
    return 0;
}
