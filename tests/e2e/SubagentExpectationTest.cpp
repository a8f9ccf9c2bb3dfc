// SPDX-License-Identifier: BSD-2-Clause
// Compares every object of every table, through a master, with the expectation file.
#include <algorithm>
#include <fstream>

#include "tests/e2e/Expectation.h"
#include "tests/e2e/MasterFixture.h"

namespace kvloamd::e2e {
namespace {

class SubagentExpectationTest : public MasterFixture {
  protected:
    static constexpr char kValidIntervals[] = "1.3.6.1.2.1.10.18.6.1.4.1000";

    void serve() {
        std::ifstream chassis(E2E_DIR "/expected.yaml");
        useChassis({std::istreambuf_iterator<char>(chassis), {}});
        startMaster();
        startSubagent(2);
        ASSERT_TRUE(isConnected()) << agent().output();
        sim({"fault", "2", "17"});
        // Rows among the master's are registered from the last name to the first.
        ASSERT_TRUE(eventually([this] {
            return std::ranges::count_if(walk("1.3.6.1.2.1.2.2.1.1"), [](Answer const& answer) {
                       return answer.name.back() >= 1000;
                   }) == 8;
        }));
        ASSERT_TRUE(eventually([this] { return get("kvlFaultCount.0") == "Gauge32: 1 faults"; }));
        // The line's past ends with a whole interval, which the first live second closes.
        ASSERT_TRUE(eventually([this] { return get(kValidIntervals) == "INTEGER: 4"; }));
    }
    Expectation expected() {
        return {E2E_DIR "/expected.walk", Expectation::Served::Beside, agent().pid(),
                [this](auto const& tool, auto const& names) { return answers(tool, names); }};
    }
};

TEST_F(SubagentExpectationTest, EveryObjectIsFoundByGet) {
    serve();
    expected().expectGet();
}

TEST_F(SubagentExpectationTest, EveryObjectHasItsSuccessor) {
    serve();
    expected().expectGetNext();
}

TEST_F(SubagentExpectationTest, EveryObjectIsFollowedByTheRestInBulk) {
    serve();
    expected().expectGetBulk();
}

TEST_F(SubagentExpectationTest, WalkFindsEveryObjectAndNoOther) {
    serve();
    expected().expectWalk();
}

} // namespace
} // namespace kvloamd::e2e
