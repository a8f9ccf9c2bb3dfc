// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/HostInterfaces.h"

#include <gmock/gmock.h>

#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::HasSubstr;

class HostInterfacesTest : public ::testing::Test {
  protected:
    HostInterfacesTest() {
        for (std::uint32_t const index : {1000U, 1001U, 1016U})
            m_ours.emplace_back().ifIndex = index;
    }
    std::uint32_t conflicts() {
        m_now += HostInterfaces::kPause;
        return m_host.conflicts(m_ours, m_now);
    }

    std::vector<InterfaceRow> m_ours;
    std::vector<HostInterface> m_list{{1, "lo"}, {2, "eth0"}};
    HostInterfaces m_host{[this] { return m_list; }};
    Clock::time_point m_now = Clock::now();
};

TEST_F(HostInterfacesTest, KernelsListHasTheLoopbackInterface) {
    auto const all = listHostInterfaces();
    EXPECT_TRUE(std::ranges::any_of(all, [](auto const& each) { return each.name == "lo"; }));
}

TEST_F(HostInterfacesTest, LowIndicesDoNotConflict) {
    LogCapture logged;
    EXPECT_EQ(conflicts(), 0U);
    EXPECT_EQ(m_host.highest(), 2U);
    EXPECT_EQ(logged.take(), "");
}

TEST_F(HostInterfacesTest, ConflictsAreCountedAndLoggedOnceEachWay) {
    LogCapture logged;
    m_list.push_back({1001, "veth7"});
    m_list.push_back({1002, "veth8"});
    m_list.push_back({1016, "veth9"});
    EXPECT_EQ(conflicts(), 2U);
    EXPECT_EQ(conflicts(), 2U);
    EXPECT_EQ(m_host.highest(), 1016U);
    m_list.resize(2);
    EXPECT_EQ(conflicts(), 0U);
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 2) << message;
    EXPECT_THAT(message, HasSubstr("interface veth7 of the host has ifIndex 1001"));
}

TEST_F(HostInterfacesTest, HostIsNotAskedAtEveryRefresh) {
    EXPECT_EQ(conflicts(), 0U);
    m_list.push_back({1001, "veth7"});
    EXPECT_EQ(m_host.conflicts(m_ours, m_now), 0U);
}

} // namespace
} // namespace kvloamd
