// SPDX-License-Identifier: BSD-2-Clause
// A chassis of a thousand boards with four lines each is walked completely.
#include <algorithm>
#include <set>
#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::SizeIs;

/// 1000 boards; fewer under sanitizers, which are an order of magnitude slower.
constexpr std::size_t kManyBoards = LARGE_CHASSIS;
constexpr std::size_t kManyLines = 4 * kManyBoards;

class LargeChassisTest : public AgentFixture {
  protected:
    LargeChassisTest() {
        Result const chassis =
            run({KVLSIM, "generate", "--boards", std::to_string(kManyBoards), "--lines", "4"});
        EXPECT_EQ(chassis.status, 0) << chassis.output;
        useChassis(chassis.output);
    }

    /// Walks everything below `from` and expects ascending names.
    std::vector<Answer> bulkWalk(std::string const& from) const {
        auto walked = answers("snmpbulkwalk", {"-Cr50", from});
        EXPECT_EQ(std::ranges::adjacent_find(walked,
                                             [](Answer const& a, Answer const& b) {
                                                 return compare(a.name, b.name) >= 0;
                                             }),
                  walked.end());
        return walked;
    }
    /// The number of rows of each column. Expects that all columns of a table have the same.
    void expectRows(std::string const& entry, std::vector<int> const& columns,
                    std::size_t count) const {
        auto const walked = bulkWalk(entry);
        std::size_t const place = parseAnswers(entry + ".1 = x").front().name.size();
        for (int const column : columns) {
            std::set<std::uint32_t> rows;
            for (Answer const& answer : walked)
                if (answer.name[place - 1] == static_cast<std::uint32_t>(column))
                    rows.insert(answer.name[place]);
            EXPECT_THAT(rows, SizeIs(count)) << entry << ", column " << column;
        }
    }
};

TEST_F(LargeChassisTest, EveryBoardAndEveryLineIsThere) {
    startAgent();
    std::set<std::string> serialNumbers;
    for (Answer const& answer : bulkWalk("kvlBoardSerialNumber"))
        serialNumbers.insert(answer.value);
    EXPECT_THAT(serialNumbers, SizeIs(kManyBoards));
    // Besides its lines, a board may have interfaces of the host.
    std::string const number = get("1.3.6.1.2.1.2.1.0");
    std::size_t const interfaces = std::stoul(number.substr(number.find(": ") + 2));
    EXPECT_GE(interfaces, kManyLines);
    expectRows("1.3.6.1.2.1.2.2.1", {1, 2, 3, 7, 8}, interfaces);
    expectRows("1.3.6.1.2.1.10.18.6.1", {1, 3, 4, 5, 6, 10, 16}, kManyLines);
    expectRows("1.3.6.1.2.1.10.18.7.1", {1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11}, kManyLines);
}

} // namespace
} // namespace kvloamd::e2e
