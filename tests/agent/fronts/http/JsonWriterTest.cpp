// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/JsonWriter.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

std::string textOf(std::string_view octets) {
    JsonWriter json;
    return json.text(octets).take();
}

TEST(JsonWriterTest, CommasSeparateValuesOfObjectsAndArrays) {
    JsonWriter json;
    json.beginObject().key("a").beginArray().endArray().key("b").beginArray();
    json.number(std::int64_t{-1}).null().boolean(true).beginObject().endObject();
    json.endArray().key("c").text("x").endObject();
    EXPECT_EQ(json.take(), R"({"a":[],"b":[-1,null,true,{}],"c":"x"})");
}

TEST(JsonWriterTest, LargestNumbersAreWrittenWhole) {
    JsonWriter json;
    json.beginArray().number(std::uint64_t{18446744073709551615U});
    json.number(std::numeric_limits<std::int64_t>::min()).endArray();
    EXPECT_EQ(json.take(), "[18446744073709551615,-9223372036854775808]");
}

TEST(JsonWriterTest, DecimalHasNoTrailingZeroes) {
    JsonWriter json;
    json.beginArray().decimal(1234, 2).decimal(1200, 2).decimal(1205, 3).decimal(7, 3).decimal(0,
                                                                                               2);
    EXPECT_EQ(json.endArray().take(), "[12.34,12,1.205,0.007,0]");
}

TEST(JsonWriterTest, QuotesBackslashesAndControlCharactersAreEscaped) {
    EXPECT_EQ(textOf("a\"b\\c\n\t\x01\x7f"), R"("a\"b\\c\n\t\u0001\u007f")");
    EXPECT_EQ(textOf(std::string_view("\0", 1)), R"("\u0000")");
}

TEST(JsonWriterTest, CharactersOfEveryLengthAreKept) {
    EXPECT_EQ(textOf("a\u00e9\u20ac\U0001f600"), "\"a\u00e9\u20ac\U0001f600\"");
}

TEST(JsonWriterTest, OctetsThatAreNotUtf8AreReplaced) {
    std::string const replaced = "\"\xef\xbf\xbd\"";
    EXPECT_EQ(textOf("\xff"), replaced);
    EXPECT_EQ(textOf("\xc3"), replaced); // the second octet is missing
    std::string const twice = "\"\xef\xbf\xbd\xef\xbf\xbd\"";
    EXPECT_EQ(textOf("\xc0\x80"), twice); // longer than need be
    EXPECT_EQ(textOf("\xed\xa0\x80"), "\"\xef\xbf\xbd\xef\xbf\xbd\xef\xbf\xbd\""); // a surrogate
    EXPECT_EQ(textOf("\xc3z"), "\"\xef\xbf\xbdz\"");
}

} // namespace
} // namespace kvloamd
