// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/TextCheck.h"

#include <string>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

TEST(TextCheckTest, EveryPrintableAsciiCharacterIsText) {
    for (char c = ' '; c < 0x7f; ++c)
        EXPECT_TRUE(isText(std::string(1, c))) << int{c};
    EXPECT_TRUE(isText(""));
}

TEST(TextCheckTest, ControlCharactersAreNotText) {
    for (char const c : {'\0', '\x1b', '\n', '\x7f'})
        EXPECT_FALSE(isText(std::string("a") + c)) << int{c};
    EXPECT_FALSE(isText("\xc2\x9b")); // U+009B, which begins a control sequence
}

TEST(TextCheckTest, CharactersOfEveryLengthAreText) {
    EXPECT_TRUE(isText("Zw\xc3\xb6lf"));
    EXPECT_TRUE(isText("\xe2\x82\xac"));
    EXPECT_TRUE(isText("\xf0\x9f\x93\x9e"));
    EXPECT_TRUE(isText("\xf4\x8f\xbf\xbf")); // the last one
}

TEST(TextCheckTest, BrokenSequencesAreNotText) {
    for (char const* const broken :
         {"\x80", "\xc3", "\xc3(", "\xe2\x82", "\xf0\x9f\x93", "\xff", "\xfe\x80\x80\x80\x80\x80"})
        EXPECT_FALSE(isText(broken)) << broken;
}

TEST(TextCheckTest, SequencesThatUtf8ForbidsAreNotText) {
    EXPECT_FALSE(isText("\xc1\x81"));         // "A" in two octets
    EXPECT_FALSE(isText("\xe0\x82\xa9"));     // two octets are enough
    EXPECT_FALSE(isText("\xf0\x82\x82\xac")); // three are
    EXPECT_FALSE(isText("\xed\xa0\x80"));     // half of a pair
    EXPECT_FALSE(isText("\xf4\x90\x80\x80")); // above the last one
}

TEST(TextCheckTest, OnlySevenBitsAreAscii) {
    EXPECT_TRUE(isAscii("trunk 1"));
    EXPECT_FALSE(isAscii("Zw\xc3\xb6lf"));
}

} // namespace
} // namespace kvloamd
