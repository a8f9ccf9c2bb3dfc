// SPDX-License-Identifier: BSD-2-Clause
// A simulated platform's control socket, and the end of the process that holds it.
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <fstream>
#include <sstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/simulator/tool/ToolFixture.h"

namespace {

using support::ChildProcess;
using support::Finished;
using testing::HasSubstr;

class ControlSocketToolTest : public ToolTest {};

TEST_F(ControlSocketToolTest, SocketGoesWithItsProcess) {
    EXPECT_EQ(hold().finish().status, 0);
    EXPECT_NE(access(socket().c_str(), F_OK), 0);
}

TEST_F(ControlSocketToolTest, SocketOfAKilledProcessIsReplaced) {
    hold().kill();
    EXPECT_EQ(holder->finish().status, 1009);
    EXPECT_EQ(access(socket().c_str(), F_OK), 0);
    hold();
    succeed({"show"});
}

TEST_F(ControlSocketToolTest, SocketInUseIsRefusedAndItsOwnerKeepsIt) {
    hold();
    ChildProcess second({KVLSIM_PLATFORM_HOLDER}, {"KVLSIM_SOCKET=" + socket()});
    EXPECT_EQ(second.readLine(), "ready");
    second.writeLine("read 1 NAME");
    EXPECT_EQ(second.readLine(), "value NX5-T1");
    EXPECT_EQ(second.finish().err, "kvlsim: control socket " + socket() +
                                       ": is in use by another process, choose another path; the "
                                       "platform goes on without control\n");
    succeed({"show"});
}

TEST_F(ControlSocketToolTest, FileInTheSocketsPlaceIsLeftAlone) {
    write("socket", "precious");
    ChildProcess& process = hold();
    EXPECT_EQ(process.finish().err, "kvlsim: control socket " + socket() +
                                        ": is there and is no socket, choose another path; the "
                                        "platform goes on without control\n");
    std::stringstream text;
    text << std::ifstream(socket()).rdbuf();
    EXPECT_EQ(text.str(), "precious");
}

TEST_F(ControlSocketToolTest, SocketPathThatIsTooLongIsRefused) {
    std::string const path = "/tmp/" + std::string(120, 'x');
    ChildProcess process({KVLSIM_PLATFORM_HOLDER}, {"KVLSIM_SOCKET=" + path});
    EXPECT_EQ(process.readLine(), "ready");
    EXPECT_THAT(process.finish().err, HasSubstr("more than 107 bytes"));
}

TEST_F(ControlSocketToolTest, ProcessEndsCleanlyWhileEventsAreDelivered) {
    ChildProcess& process = hold();
    process.writeLine("flood 5000");
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0) << finished.err;
}

TEST_F(ControlSocketToolTest, HandlerMayEndTheProcess) {
    ChildProcess& process = hold();
    process.writeLine("exit-in-handler");
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0) << finished.err;
}

TEST_F(ControlSocketToolTest, ProcessEndsWhileAClientHangs) {
    ChildProcess& process = hold();
    int const client = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, socket().c_str(), sizeof address.sun_path - 1);
    ASSERT_EQ(connect(client, reinterpret_cast<sockaddr const*>(&address), sizeof address), 0);
    EXPECT_EQ(process.finish().status, 0);
    close(client);
}

} // namespace
