// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Target.h"

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST(TargetTest, PathIsSplitAndUnescaped) {
    EXPECT_THAT(parseTarget("/")->segments, IsEmpty());
    EXPECT_THAT(parseTarget("/api/v1/lines/a%20b%2Fc")->segments,
                ElementsAre("api", "v1", "lines", "a b/c"));
    EXPECT_THAT(parseTarget("/a/")->segments, ElementsAre("a", ""));
    EXPECT_THAT(parseTarget("//a")->segments, ElementsAre("", "a"));
}

TEST(TargetTest, QueryIsSplitAndUnescaped) {
    auto const target = parseTarget("/journal?after=1%30&empty&limit=5&after=7");
    EXPECT_THAT(target->segments, ElementsAre("journal"));
    EXPECT_EQ(*target->parameter("after"), "10");
    EXPECT_EQ(*target->parameter("limit"), "5");
    EXPECT_EQ(*target->parameter("empty"), "");
    EXPECT_EQ(target->parameter("absent"), nullptr);
}

TEST(TargetTest, TextThatIsNoTargetIsRefused) {
    for (char const* const text :
         {"", "a", "*", "http://host/", "/%", "/%4", "/%zz", "/%-1", "/a?x=%G0", "/% 1", "/%+1"})
        EXPECT_FALSE(parseTarget(text)) << text;
}

} // namespace
} // namespace kvloamd
