// SPDX-License-Identifier: BSD-2-Clause
// The start of the control server where the system refuses a thread, or another process is about to
// start one at the same path.
#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <string>
#include <system_error>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/base/Descriptor.h"
#include "simulator/base/ThreadStart.h"
#include "simulator/control/ControlServer.h"
#include "tests/support/TemporaryDirectory.h"

namespace {
bool s_controlThreadFails = false;
} // namespace

namespace kvlsim {

/// Replaces the simulator's own function: it fails when a test asks for it.
std::thread startThread(char const* name, std::function<void()> body) {
    if (s_controlThreadFails && std::string(name) == "kvlsim-control")
        throw std::system_error(EAGAIN, std::generic_category());
    return std::thread(std::move(body));
}

} // namespace kvlsim

namespace {

using namespace kvlsim;
using testing::HasSubstr;

class ControlStartTest : public testing::Test {
  protected:
    std::string path() const { return m_directory.file("control"); }
    static std::string start(std::string const& path) {
        testing::internal::CaptureStderr();
        startControlServer(path, Platform::instance());
        return testing::internal::GetCapturedStderr();
    }

  private:
    support::TemporaryDirectory m_directory;
};

TEST_F(ControlStartTest, EventsAreDeliveredAfterTheControlThreadCouldNotStart) {
    s_controlThreadFails = true;
    EXPECT_THAT(start(path()), HasSubstr("Resource temporarily unavailable"));
    s_controlThreadFails = false;
    EXPECT_FALSE(std::filesystem::exists(path()));
    // The address sanitizer sees a call of the server that is gone.
    EventService& events = Platform::instance().events();
    EXPECT_TRUE(events.waitDelivered(events.announce({0x40001, {}})));
}

TEST_F(ControlStartTest, SocketThatIsBoundButNotYetListeningIsLeftAlone) {
    // What another process has between bind() and listen(), with its lock held.
    Descriptor const lock(open((path() + ".lock").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600));
    ASSERT_EQ(flock(lock.get(), LOCK_EX), 0);
    Descriptor const socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, path().c_str(), sizeof address.sun_path - 1);
    ASSERT_EQ(bind(socket.get(), reinterpret_cast<sockaddr const*>(&address), sizeof address), 0);
    auto const inode = [this] {
        struct stat file {};
        return stat(path().c_str(), &file) == 0 ? file.st_ino : 0;
    };
    auto const before = inode();
    EXPECT_EQ(start(path()), "kvlsim: control socket " + path() +
                                 ": is in use by another process, choose another path; the "
                                 "platform goes on without control\n");
    EXPECT_NE(before, 0U);
    EXPECT_EQ(inode(), before);
}

} // namespace
