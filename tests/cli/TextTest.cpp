// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Text.h"

#include <string>

#include <gtest/gtest.h>

namespace {

using kvloam::cut;
using kvloam::printable;
using kvloam::printableAscii;
using kvloam::width;

TEST(TextTest, PlainTextStaysAsItIs) {
    EXPECT_EQ(printable("NX5-T1 ~ \"x\""), "NX5-T1 ~ \"x\"");
    EXPECT_EQ(printable("Köln 東京 😀"), "Köln 東京 😀");
    EXPECT_EQ(printable(""), "");
}

TEST(TextTest, ControlCharactersAreReplaced) {
    EXPECT_EQ(printable("\033[2Jgone\007"), "?[2Jgone?");
    EXPECT_EQ(printable("a\nb\tc\rd"), "a b c?d");
    EXPECT_EQ(printable(std::string("a\0b", 3)), "a?b");
    EXPECT_EQ(printable("\x7f"), "?");
    // The control sequence introducer as one character.
    EXPECT_EQ(printable("\u009b2J"), "?2J");
}

TEST(TextTest, CharactersThatTurnTheWritingAroundAreReplaced) {
    EXPECT_EQ(printable("a\u202eb\u2066c\u200fd\u2028e\ufefff"), "a?b?c?d?e?f");
}

TEST(TextTest, WhatIsNotUtf8IsReplaced) {
    EXPECT_EQ(printable("a\xff"), "a?");
    EXPECT_EQ(printable("a\xc3"), "a?");              // cut off
    EXPECT_EQ(printable("\xc0\xaf"), "??");           // longer than needed
    EXPECT_EQ(printable("\xe0\x80\xaf"), "???");      // longer than needed
    EXPECT_EQ(printable("\xed\xa0\x80"), "???");      // half of a pair
    EXPECT_EQ(printable("\xf4\x90\x80\x80"), "????"); // beyond the last character
    EXPECT_EQ(printable("\x80x"), "?x");
    EXPECT_EQ(printable("\xc3\x28"), "?(");
}

TEST(TextTest, AsciiScreensGetAsciiOnly) {
    EXPECT_EQ(printableAscii("K\u00f6ln\033"), "K?ln?");
}

TEST(TextTest, WidthIsThatOnTheScreen) {
    EXPECT_EQ(width("abc"), 3U);
    EXPECT_EQ(width("Köln"), 4U);
    EXPECT_EQ(width("東京"), 4U);
    EXPECT_EQ(width("e\u0301"), 1U); // a combining accent
}

TEST(TextTest, CutTextFitsAndIsMarked) {
    EXPECT_EQ(cut("abc", 3, "~"), "abc");
    EXPECT_EQ(cut("abcd", 3, "~"), "ab~");
    EXPECT_EQ(cut("abcd", 1, "~"), "~");
    EXPECT_EQ(cut("abcd", 0, "~"), "");
    // A wide character is not cut in half.
    EXPECT_EQ(cut("東京都", 4, "…"), "東…");
    EXPECT_EQ(cut("東京都", 5, "…"), "東京…");
}

} // namespace
