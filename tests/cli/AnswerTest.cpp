// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Answer.h"

#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

using kvloam::CliError;
using kvloam::Json;
using kvloam::readAnswer;

/// What is said about an answer that is none.
std::string refusalOf(std::string const& body) {
    try {
        readAnswer(body);
    } catch (CliError const& error) {
        EXPECT_EQ(error.status(), kvloam::kFailure);
        return error.what();
    }
    return "(accepted)";
}

TEST(AnswerTest, AnswersThatAreNoneAreRefusedWithAReason) {
    using testing::HasSubstr;
    EXPECT_THAT(refusalOf(""), HasSubstr("it is no JSON;"));
    EXPECT_THAT(refusalOf("<html>"), HasSubstr("it is no JSON;"));
    EXPECT_THAT(refusalOf(R"({"boards":[{"a":1})"), HasSubstr("it is no JSON;"));
    EXPECT_THAT(refusalOf("{\"a\":\"\xff\"}"), HasSubstr("it is no JSON;"));
    EXPECT_THAT(refusalOf("[]"), HasSubstr("it is no JSON object;"));
    EXPECT_THAT(refusalOf("{\"a\":" + std::string(100000, '[')), HasSubstr("too deeply"));
    EXPECT_THAT(refusalOf("{\"a\":" + std::string(40, '[') + std::string(40, ']') + "}"),
                HasSubstr("too deeply"));
    EXPECT_EQ(refusalOf(R"({"a":"[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[[\"[["})"), "(accepted)");
}

TEST(AnswerTest, FieldsOfAnotherTypeAreUnknown) {
    Json const row = readAnswer(
        R"({"text":"a","number":5,"real":1.5,"list":["x",1,"y"],"null":null,"huge":18446744073709551615,
            "minus":-3,"yes":true,"no":"false","date":"2026-11-22T17:20:03Z","object":{"a":1}})");
    EXPECT_EQ(kvloam::textIn(row, "text"), "a");
    for (char const* key : {"number", "list", "null", "object", "missing"})
        EXPECT_EQ(kvloam::textIn(row, key), "") << key;
    EXPECT_EQ(kvloam::numberIn(row, "number"), 5);
    EXPECT_EQ(kvloam::numberIn(row, "minus"), -3);
    EXPECT_EQ(kvloam::numberIn(row, "huge"), INT64_MAX);
    for (char const* key : {"text", "real", "list", "null", "object", "missing"})
        EXPECT_FALSE(kvloam::numberIn(row, key)) << key;
    EXPECT_EQ(kvloam::realIn(row, "real"), 1.5);
    EXPECT_FALSE(kvloam::realIn(row, "text"));
    EXPECT_EQ(kvloam::truthIn(row, "yes"), true);
    EXPECT_EQ(kvloam::truthIn(row, "no"), false);
    EXPECT_FALSE(kvloam::truthIn(row, "text"));
    EXPECT_TRUE(kvloam::dateIn(row, "date"));
    EXPECT_FALSE(kvloam::dateIn(row, "text"));
    EXPECT_THAT(kvloam::textsIn(row, "list"), testing::ElementsAre("x", "y"));
    EXPECT_THAT(kvloam::textsIn(row, "missing"), testing::IsEmpty());
    EXPECT_EQ(kvloam::textIn(Json("no object"), "text"), "");
}

TEST(AnswerTest, AListOfRowsConsistsOfObjects) {
    Json const answer = readAnswer(R"({"good":[{}],"bad":[{},1],"none":{}})");
    EXPECT_EQ(kvloam::rowsIn(answer, "good").size(), 1U);
    for (char const* key : {"bad", "none", "missing"})
        EXPECT_THROW(kvloam::rowsIn(answer, key), CliError) << key;
}

TEST(AnswerTest, PrintedJsonIsAsciiInTheAgentsOrder) {
    Json const answer = readAnswer("{\"z\":\"K\u00f6ln \u009b\x7f\",\"a\":[]}");
    EXPECT_EQ(kvloam::jsonText(answer, true), R"({"z":"K\u00f6ln \u009b\u007f","a":[]})");
}

} // namespace
