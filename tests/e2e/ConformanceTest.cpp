// SPDX-License-Identifier: BSD-2-Clause
// The agent's answers conform to the MIB modules, except as mibs/conformance.ini says.
#include <iostream>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

class ConformanceTest : public AgentFixture {
  protected:
    static constexpr char kClosedIntervals[] = "1.3.6.1.2.1.10.18.6.1.4.1000";
};

TEST_F(ConformanceTest, EveryObjectHasALegalValueOrAReasonToHaveNone) {
    startAgent();
    // The past of the lines is there from the first second that they count.
    ASSERT_TRUE(eventually([this] { return get(kClosedIntervals).starts_with("INTEGER: "); }));
    Result const check = run({SOURCE_DIR "/tests/mibs/check-conformance", SOURCE_DIR, address()});
    std::cout << check.output;
    EXPECT_EQ(check.status, 0);
}

} // namespace
} // namespace kvloamd::e2e
