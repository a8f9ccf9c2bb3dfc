// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/JsonValues.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

constexpr NamedNumber kStates[] = {{1, "up"}, {2, "down"}};
constexpr NamedNumber kTruth[] = {{1, "true"}, {2, "false"}};
constexpr NamedNumber kBits[] = {{1, "noAlarm"}, {4, "lossOfSignal"}};
constexpr NamedNumber kSet[] = {{0, "unknown"}, {3, "major"}};

class JsonValuesTest : public ::testing::Test {
  protected:
    std::string written(ValueType type, Details const& details, Value const& value,
                        Manner manner = Manner::People) {
        JsonWriter json;
        writeValue(json, type, details, value, m_counters, manner);
        return json.take();
    }
    static Value number(std::int64_t value) { return value; }

    Counters m_counters;
};

using enum ValueType;

TEST_F(JsonValuesTest, KeyLacksTheTablesPrefixAndBeginsSmall) {
    EXPECT_EQ(keyOf("kvlBoardSerialNumber", "kvlBoard", Text), "serialNumber");
    EXPECT_EQ(keyOf("dsx1LineStatus", "dsx1", Integer), "lineStatus");
    EXPECT_EQ(keyOf("entPhysicalClass", "entPhysical", Integer), "class");
}

TEST_F(JsonValuesTest, WordInCapitalsAtTheBeginBecomesSmallAsAWhole) {
    EXPECT_EQ(keyOf("dsx1CurrentESs", "dsx1Current", Gauge), "es");
    EXPECT_EQ(keyOf("dsx1CurrentSEFSs", "dsx1Current", Gauge), "sefs");
    EXPECT_EQ(keyOf("entPhysicalUUID", "entPhysical", Octets), "uuid");
    EXPECT_EQ(keyOf("ifHCInOctets", "if", Counter64), "hcInOctets");
    EXPECT_EQ(keyOf("entPhysicalAssetID", "entPhysical", Text), "assetID");
}

TEST_F(JsonValuesTest, KeyOfATimeSinceTheStartNamesItsUnit) {
    EXPECT_EQ(keyOf("ifLastChange", "if", TimeStamp), "lastChangeSeconds");
    EXPECT_EQ(keyOf("kvlAgentUpTime", "kvl", TimeTicks), "agentUpTimeSeconds");
    EXPECT_EQ(keyOf("kvlBoardChangeDate", "kvlBoard", Date), "changeDate");
}

TEST_F(JsonValuesTest, NumberOfAnEnumerationBecomesItsName) {
    EXPECT_EQ(written(Integer, about("").oneOf(kStates), number(2)), "\"down\"");
    EXPECT_EQ(written(Integer, about("").someOf(kStates), number(9)), "9");
}

TEST_F(JsonValuesTest, TruthValueBecomesTrueOrFalse) {
    EXPECT_EQ(written(Integer, about("").oneOf(kTruth), number(1)), "true");
    EXPECT_EQ(written(Integer, about("").oneOf(kTruth), number(2)), "false");
}

TEST_F(JsonValuesTest, SumOfBitsBecomesAListOfNamesAndUnnamedBits) {
    EXPECT_EQ(written(Integer, about("").sumOf(kBits), number(1)), R"(["noAlarm"])");
    EXPECT_EQ(written(Integer, about("").sumOf(kBits), number(14)), R"([2,"lossOfSignal",8])");
    EXPECT_EQ(written(Integer, about("").sumOf(kBits), number(0)), "[]");
}

TEST_F(JsonValuesTest, SetBecomesAListOfNamesFromTheHighestBit) {
    EXPECT_EQ(written(Octets, about("").oneOf(kSet), std::string("\x90\x80")),
              R"(["unknown","major",8])");
}

TEST_F(JsonValuesTest, OctetsAreHexadecimalUnlessOperatorsMaySetThem) {
    std::string const octets("\x02\x00\xfe", 3);
    EXPECT_EQ(written(Octets, about(""), octets), "\"02:00:fe\"");
    EXPECT_EQ(
        written(Octets, about("").settable({Setting::EntityUris, 0, 255}), std::string("urn:a")),
        "\"urn:a\"");
}

TEST_F(JsonValuesTest, CounterOf64BitsIsUnsigned) {
    EXPECT_EQ(written(Counter64, about(""), number(-1)), "18446744073709551615");
}

TEST_F(JsonValuesTest, TimeIsInSecondsForPeopleAndInTheModulesUnitForPrograms) {
    EXPECT_EQ(written(TimeTicks, about(""), number(150)), "1.5");
    EXPECT_EQ(written(TimeTicks, about(""), number(150), Manner::Module), "150");
}

TEST_F(JsonValuesTest, TimeOfAnEventIsSysUpTimeForPrograms) {
    m_counters.sysUpTimeLead = 1000;
    EXPECT_EQ(written(TimeStamp, about(""), number(150)), "1.5");
    EXPECT_EQ(written(TimeStamp, about(""), number(150), Manner::Module), "1150");
    EXPECT_EQ(written(TimeStamp, about(""), number(0), Manner::Module), "0");
}

TEST_F(JsonValuesTest, NameIsDotted) {
    Oid const name{1, 3, 6, 1};
    EXPECT_EQ(written(ObjectId, about(""), NameView{name}), "\"1.3.6.1\"");
}

TEST_F(JsonValuesTest, WhatIsNotKnownIsNull) {
    for (ValueType const type : {Integer, Counter64, Text, Octets, Date, TimeTicks, ObjectId})
        EXPECT_EQ(written(type, about("").oneOf(kStates), Value{}), "null");
}

TEST_F(JsonValuesTest, DateBecomesUtc) {
    // 1 January 2026, 00:30:05.4, two hours and a half east of Greenwich.
    std::string const date("\x07\xea\x01\x01\x00\x1e\x05\x04+\x02\x1e", 11);
    EXPECT_EQ(rfc3339(date), "2025-12-31T22:00:05.4Z");
    std::string west = date;
    west[8] = '-';
    EXPECT_EQ(rfc3339(west), "2026-01-01T03:00:05.4Z");
    EXPECT_EQ(rfc3339(date.substr(0, 8)), "2026-01-01T00:30:05.4Z");
    EXPECT_EQ(written(Date, about(""), date), "\"2025-12-31T22:00:05.4Z\"");
}

TEST_F(JsonValuesTest, DateThatIsNoneIsNull) {
    EXPECT_EQ(rfc3339(std::string(8, '\0')), std::nullopt);
    EXPECT_EQ(rfc3339("short"), std::nullopt);
    EXPECT_EQ(rfc3339(std::string("\x07\xea\x02\x1e\x00\x00\x00\x00", 8)), std::nullopt);
    EXPECT_EQ(rfc3339(std::string("\x07\xea\x01\x01\x00\x00\x00\x00x\x00\x00", 11)), std::nullopt);
    EXPECT_EQ(written(Date, about(""), std::string(8, '\0')), "null");
}

TEST_F(JsonValuesTest, MillisecondsSinceTheEpochBecomeADate) {
    EXPECT_EQ(rfc3339(std::int64_t{0}), "1970-01-01T00:00:00Z");
    EXPECT_EQ(rfc3339(std::int64_t{1'700'000'000'120}), "2023-11-14T22:13:20.12Z");
}

} // namespace
} // namespace kvloamd
