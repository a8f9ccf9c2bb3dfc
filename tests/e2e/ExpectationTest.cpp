// SPDX-License-Identifier: BSD-2-Clause
// Compares every object of every table with the expectation file.
#include "tests/e2e/Expectation.h"

#include <fstream>

namespace kvloamd::e2e {
namespace {

class ExpectationTest : public AgentFixture {
  protected:
    static constexpr char kValidIntervals[] = "1.3.6.1.2.1.10.18.6.1.4.1000";

    void serve() {
        std::ifstream chassis(E2E_DIR "/expected.yaml");
        useChassis({std::istreambuf_iterator<char>(chassis), {}});
        startAgent();
        sim({"fault", "2", "17"});
        ASSERT_TRUE(eventually([this] { return get("kvlFaultCount.0") == "Gauge32: 1 faults"; }));
        // The line's past ends with a whole interval, which the first live second closes.
        ASSERT_TRUE(eventually([this] { return get(kValidIntervals) == "INTEGER: 4"; }));
    }
    Expectation expected() {
        return {E2E_DIR "/expected.walk", Expectation::Served::Alone, agent().pid(),
                [this](auto const& tool, auto const& names) { return answers(tool, names); }};
    }
};

TEST_F(ExpectationTest, EveryObjectIsFoundByGet) {
    serve();
    expected().expectGet();
}

TEST_F(ExpectationTest, EveryObjectHasItsSuccessor) {
    serve();
    expected().expectGetNext();
}

TEST_F(ExpectationTest, EveryObjectIsFollowedByTheRestInBulk) {
    serve();
    expected().expectGetBulk();
}

TEST_F(ExpectationTest, WalkFindsEveryObjectAndNoOther) {
    serve();
    expected().expectWalk();
}

} // namespace
} // namespace kvloamd::e2e
