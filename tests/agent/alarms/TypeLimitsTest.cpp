// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/TypeLimits.h"

#include <cctype>
#include <string>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::Each;
using ::testing::HasSubstr;

constexpr int kESF = 2;
constexpr int kE1 = 4;
constexpr int kE1CRC = 5;
constexpr int kDS2 = 10;
constexpr int kJ1ESF = 14;

TEST(TypeLimitsTest, NothingIsLimitedUntilItIsConfigured) {
    TypeLimits const limits;
    EXPECT_THAT(limits.of(kESF), Each(0));
    EXPECT_THAT(limits.of(kE1), Each(0));
    EXPECT_THAT(limits.of(std::nullopt), Each(0));
}

TEST(TypeLimitsTest, EntrySetsTheLimitsOfItsType) {
    TypeLimits limits;
    EXPECT_EQ(limits.configure("t1=es15m=65,es24h=648,cv24h=132960"), "");
    EXPECT_EQ(limits.configure("e1=uas15m=10"), "");
    EXPECT_EQ(limits.of(kESF)[kErroredSeconds15m], 65);
    EXPECT_EQ(limits.of(kESF)[kErroredSeconds24h], 648);
    EXPECT_EQ(limits.of(kESF)[kCodeViolations24h], 132960);
    EXPECT_EQ(limits.of(kESF)[kUnavailableSeconds15m], 0);
    EXPECT_EQ(limits.of(kE1CRC)[kUnavailableSeconds15m], 10);
    EXPECT_THAT(limits.of(kJ1ESF), Each(0));
    EXPECT_THAT(limits.of(kDS2), Each(0)) << "no limits are configured for such lines";
}

TEST(TypeLimitsTest, EveryLimitHasANameAndAKindOfAlarm) {
    for (std::size_t threshold = 0; threshold < kThresholds; ++threshold) {
        TypeLimits limits;
        std::string const name = thresholdName(threshold);
        EXPECT_EQ(limits.configure("j1=" + name + "=7"), "");
        EXPECT_EQ(limits.of(kJ1ESF)[threshold], 7);
        std::string kind = alarmKind(thresholdKind(threshold)).name;
        for (char& letter : kind)
            letter = static_cast<char>(std::tolower(static_cast<unsigned char>(letter)));
        EXPECT_EQ(kind, "threshold" + name);
    }
}

TEST(TypeLimitsTest, WrongEntryIsNamedAndChangesNothing) {
    TypeLimits limits;
    EXPECT_THAT(limits.configure("t3=es15m=1"), HasSubstr("'t3' is no type of line"));
    EXPECT_THAT(limits.configure("t1"), HasSubstr("'t1' sets no limit"));
    EXPECT_THAT(limits.configure("t1="), HasSubstr("sets no limit"));
    for (char const* const word : {"es15m", "es15m=", "es15m=x", "es15m=-1", "es1h=3", "bes15m=1",
                                   "es15m=99999999999", "es15m=1 "})
        EXPECT_THAT(limits.configure("t1=ses15m=5," + std::string(word)),
                    HasSubstr("is no limit; write es"))
            << word;
    EXPECT_EQ(limits, TypeLimits{});
    EXPECT_EQ(limits.configure("t1=es15m=1"), "");
    EXPECT_THAT(limits.configure("t1=es24h=1"), HasSubstr("configured twice"));
}

} // namespace
} // namespace kvloamd
