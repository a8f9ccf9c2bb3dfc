// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/AgentxPdu.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using namespace std::string_view_literals;

std::string_view payloadOf(std::string const& packet) {
    return std::string_view(packet).substr(AgentxHeader::kSize);
}

AgentxWriter ping() {
    return {AgentxKind::Ping, 7, 8, 9};
}

TEST(AgentxPduTest, HeaderIsWrittenInNetworkOrderWithItsLength) {
    AgentxWriter writer = ping();
    writer.text("abc");
    EXPECT_EQ(writer.take(), "\1\15\20\0"
                             "\0\0\0\7\0\0\0\10\0\0\0\11\0\0\0\10"
                             "\0\0\0\3abc\0"sv);
}

TEST(AgentxPduTest, HeaderIsReadAsItWasWritten) {
    AgentxWriter writer = ping();
    writer.number(1);
    AgentxHeader const header = parseAgentxHeader(writer.take());
    EXPECT_EQ(header.kind, AgentxKind::Ping);
    EXPECT_TRUE(header.networkOrder);
    EXPECT_FALSE(header.hasContext);
    EXPECT_EQ(header.session, 7U);
    EXPECT_EQ(header.transaction, 8U);
    EXPECT_EQ(header.packet, 9U);
    EXPECT_EQ(header.payload, 4U);
}

TEST(AgentxPduTest, HeaderOfTheOtherOrderIsReadToo) {
    AgentxHeader const header = parseAgentxHeader("\1\5\10\0\7\0\0\0\10\0\0\0\11\0\0\0\4\1\0\0"sv);
    EXPECT_FALSE(header.networkOrder);
    EXPECT_TRUE(header.hasContext);
    EXPECT_EQ(header.session, 7U);
    EXPECT_EQ(header.payload, 260U);
}

TEST(AgentxPduTest, OtherVersionIsRefused) {
    EXPECT_THROW(parseAgentxHeader("\2\5\20\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0\0"sv), AgentxError);
}

TEST(AgentxPduTest, LengthBeyondReasonIsRefused) {
    EXPECT_THROW(parseAgentxHeader("\1\5\20\0\0\0\0\0\0\0\0\0\0\0\0\0\377\0\0\0"sv), AgentxError);
}

TEST(AgentxPduTest, NameOfTheInternetIsWrittenShort) {
    AgentxWriter writer = ping();
    writer.name(Oid{1, 3, 6, 1, 4, 1, 32473});
    EXPECT_EQ(payloadOf(writer.take()), "\2\4\0\0\0\0\0\1\0\0\176\331"sv);
}

TEST(AgentxPduTest, NameReadsAsItWasWritten) {
    for (Oid const& name : {Oid{}, Oid{1, 3, 6, 1}, Oid{1, 3, 6, 1, 4}, Oid{1, 3, 6, 1, 0, 5},
                            Oid{1, 3, 6, 1, 256, 5}, Oid{2, 0, 4294967295}}) {
        AgentxWriter writer = ping();
        writer.name(name);
        std::string const packet = writer.take();
        AgentxReader reader(payloadOf(packet), true);
        EXPECT_EQ(reader.name().name, name);
        EXPECT_TRUE(reader.atEnd());
    }
}

TEST(AgentxPduTest, NameSaysWhetherItIsIncluded) {
    EXPECT_TRUE(AgentxReader("\0\4\1\0"sv, true).name().include);
    EXPECT_FALSE(AgentxReader("\0\4\0\0"sv, true).name().include);
}

TEST(AgentxPduTest, NameOfTheOtherOrderIsReadToo) {
    EXPECT_EQ(AgentxReader("\2\0\0\0\1\0\0\0\3\0\0\0"sv, false).name().name, (Oid{1, 3}));
}

TEST(AgentxPduTest, TextIsFilledUpToFourOctets) {
    for (std::size_t size = 0; size < 9; ++size) {
        AgentxWriter writer = ping();
        writer.text(std::string(size, 'x'));
        EXPECT_EQ(payloadOf(writer.take()).size() % 4, 0U) << size;
    }
}

TEST(AgentxPduTest, ValuesAreWrittenWithTheirTypes) {
    Oid const name{1, 3, 6, 1, 2, 7};
    struct Case {
        ValueType type;
        Value value;
        std::string_view written;
    };
    for (Case const& example :
         {Case{ValueType::Integer, std::int64_t{-2}, "\0\2\0\0\0\0\0\0\377\377\377\376"sv},
          Case{ValueType::Counter, std::int64_t{4294967295},
               "\0\101\0\0\0\0\0\0\377\377\377\377"sv},
          Case{ValueType::Counter64, std::int64_t{0x100000002},
               "\0\106\0\0\0\0\0\0\0\0\0\1\0\0\0\2"sv},
          Case{ValueType::Gauge, std::int64_t{1}, "\0\102\0\0\0\0\0\0\0\0\0\1"sv},
          Case{ValueType::TimeTicks, std::int64_t{256}, "\0\103\0\0\0\0\0\0\0\0\1\0"sv},
          Case{ValueType::Text, "ab"sv, "\0\4\0\0\0\0\0\0\0\0\0\2ab\0\0"sv},
          Case{ValueType::ObjectId, NameView{name}, "\0\6\0\0\0\0\0\0\1\2\0\0\0\0\0\7"sv}}) {
        AgentxWriter writer = ping();
        writer.variable(Oid{}, example.type, example.value);
        EXPECT_EQ(payloadOf(writer.take()), example.written);
    }
}

TEST(AgentxPduTest, PacketCutAnywhereIsRefused) {
    AgentxWriter writer = ping();
    writer.name(Oid{1, 3, 6, 1, 4, 1, 32473});
    std::string const packet = writer.take();
    for (std::size_t size = 0; size < packet.size() - AgentxHeader::kSize; ++size)
        EXPECT_THROW(AgentxReader(payloadOf(packet).substr(0, size), true).name(), AgentxError)
            << size;
    for (std::size_t size = 0; size < AgentxHeader::kSize; ++size)
        EXPECT_THROW(parseAgentxHeader(std::string_view(packet).substr(0, size)), AgentxError)
            << size;
}

} // namespace
} // namespace kvloamd
