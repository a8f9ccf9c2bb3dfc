// SPDX-License-Identifier: BSD-2-Clause
// A line of the reference board: its answers, its counts and its status events.
#include <ctime>
#include <string>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "Z7SimLine.h"
#include "tests/modules/z7sim/LineFixture.h"

namespace {

using Z7SimLineTest = LineTest;

/// Keeps what it is told.
class LineLog final : public DS1LineStatusListener {
  public:
    int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) override {
        char name[64] = "";
        event->GetLine()->GetName(name);
        m_told.emplace_back(name, event->GetLineStatus());
        return 0;
    }
    std::vector<std::pair<std::string, int>> const& told() {
        LineStatusDelivery::instance().drain();
        return m_told;
    }

  private:
    std::vector<std::pair<std::string, int>> m_told;
};

/// The status of a line without signal.
constexpr int kCut = DS1LineStatusLossOfSignal | DS1LineStatusLossOfFrame |
                     DS1LineStatusXmtFarEndLOF | DS1LineStatusUnavailSigState;

using Told = std::vector<std::pair<std::string, int>>;

std::string text(DS1LineDevice& line, int (DS1LineDevice::*query)(char*)) {
    char buffer[256] = "unwritten";
    EXPECT_EQ((line.*query)(buffer), 0);
    return buffer;
}

TEST_F(Z7SimLineTest, AnEsfLineAnswersAsItIsUsuallySetUp) {
    plugIn("type: esf", "NAME: span-1, CIRCUIT: T1-0001");
    EXPECT_EQ(text(*m_line.get(), &DS1LineDevice::GetName), "span-1");
    EXPECT_EQ(text(*m_line.get(), &DS1LineDevice::GetCircuitIdentifier), "T1-0001");
    EXPECT_EQ(m_line->GetLineIndex(), 1);
    EXPECT_EQ(m_line->GetLineType(), 2);
    EXPECT_EQ(m_line->GetLineCoding(), 2);
    EXPECT_EQ(m_line->GetSendCode(), 1);
    EXPECT_EQ(m_line->GetLoopbackConfig(), 1);
    EXPECT_EQ(m_line->GetLineStatus(), DS1LineStatusNoAlarm);
    EXPECT_EQ(m_line->GetSignalMode(), 1);
    EXPECT_EQ(m_line->GetTransmitClockSource(), 1);
    EXPECT_EQ(m_line->GetFdl(), 2);
    EXPECT_EQ(m_line->GetLineLength(), 0);
    EXPECT_EQ(m_line->GetLineStatusLastChange(), 0);
    EXPECT_EQ(m_line->GetLoopbackStatus(), 1);
    EXPECT_EQ(m_line->GetDs1ChannelNumber(), 0);
    EXPECT_EQ(m_line->GetChannelization(), 1);
    EXPECT_EQ(m_line->GetLineMode(), 1);
    EXPECT_EQ(m_line->GetLineBuildOut(), 1);
}

TEST_F(Z7SimLineTest, WhatTheChassisSaysOfTheSetUpIsAnswered) {
    plugIn("type: e1-crc",
           "NAME: span-1, LINE_NUMBER: 4, LINE_CODING: 5, LINE_LENGTH: 120, LINE_BUILD_OUT: 3, "
           "SIGNAL_MODE: 4, CLOCK_SOURCE: 2, FDL: 1");
    EXPECT_EQ(m_line->GetLineType(), 5);
    EXPECT_EQ(m_line->GetLineIndex(), 4);
    EXPECT_EQ(m_line->GetLineCoding(), 5);
    EXPECT_EQ(m_line->GetLineLength(), 120);
    EXPECT_EQ(m_line->GetLineBuildOut(), 3);
    EXPECT_EQ(m_line->GetSignalMode(), 4);
    EXPECT_EQ(m_line->GetTransmitClockSource(), 2);
    EXPECT_EQ(m_line->GetFdl(), 1);
}

TEST_F(Z7SimLineTest, ImpedanceIsThatOfTheChassis) {
    plugIn("type: e1-crc", "LINE_IMPEDANCE: 4");
    auto* const known = dynamic_cast<DS1LineImpedance*>(m_line.get());
    ASSERT_NE(known, nullptr);
    EXPECT_EQ(known->GetLineImpedance(), 4);
}

TEST_F(Z7SimLineTest, ImpedanceThatIsNotSaidIsNotApplicable) {
    plugIn("type: e1-crc", "");
    auto* const unknown = dynamic_cast<DS1LineImpedance*>(m_line.get());
    ASSERT_NE(unknown, nullptr);
    EXPECT_EQ(unknown->GetLineImpedance(), 1);
}

TEST_F(Z7SimLineTest, AnInterfaceOfTypeDs1AnswersItsSpeedAndNoPackets) {
    plugIn("type: e1", "NAME: span-1, CIRCUIT: E1-0007");
    std::string description;
    EXPECT_EQ(m_line->GetDescription(description), 0);
    EXPECT_EQ(description, "E1 line span-1");
    EXPECT_EQ(m_line->GetType(), 18);
    EXPECT_EQ(m_line->GetSpeed(), 2048000);
    EXPECT_EQ(m_line->GetAdminStatus(), 1);
    EXPECT_EQ(m_line->GetOperStatus(), 1);
    EXPECT_EQ(m_line->GetMTU(), KVL::kNotSupported);
    EXPECT_EQ(m_line->SetAdminStatus(2), KVL::kNotSupported);
    for (auto const query : {&KVL::Interface::GetInOctets, &KVL::Interface::GetInUcastPkts,
                             &KVL::Interface::GetInDiscards, &KVL::Interface::GetInErrors,
                             &KVL::Interface::GetInUnknownProtos, &KVL::Interface::GetOutOctets,
                             &KVL::Interface::GetOutUcastPkts, &KVL::Interface::GetOutDiscards,
                             &KVL::Interface::GetOutErrors})
        EXPECT_EQ((m_line.get()->*query)(), KVL::kNotSupported);
    char address[64] = "";
    int length = -1;
    EXPECT_EQ(m_line->GetPhysAddress(address, length), 0);
    EXPECT_EQ(std::string(address, static_cast<std::size_t>(length)), "E1-0007");
}

TEST_F(Z7SimLineTest, TheTrapEnableKeepsWhatIsAllowed) {
    plugIn("type: esf");
    EXPECT_EQ(m_line->GetLineStatusChangeTrapEnable(), 2);
    EXPECT_EQ(m_line->SetLineStatusChangeTrapEnable(1), 0);
    EXPECT_EQ(m_line->SetLineStatusChangeTrapEnable(3), -1);
    EXPECT_EQ(m_line->GetLineStatusChangeTrapEnable(), 1);
}

TEST_F(Z7SimLineTest, CleanSecondsPassTimeAndCountNothing) {
    plugIn("type: esf");
    tick(5);
    EXPECT_EQ(m_table->GetTimeElapsed(), 5);
    EXPECT_EQ(m_table->GetErrorSeconds(0), 0);
    EXPECT_EQ(m_table->GetValidIntervals(), 0);
}

TEST_F(Z7SimLineTest, A320thPathViolationMakesAT1SecondSevere) {
    plugIn("type: esf");
    errors({{"path-violations", 319}});
    tick();
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 0);
    EXPECT_EQ(m_table->GetBurstyErrorSeconds(0), 1);
    errors({{"path-violations", 320}});
    tick();
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 1);
    EXPECT_EQ(m_table->GetErrorSeconds(0), 2);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 639);
}

TEST_F(Z7SimLineTest, An832ndPathViolationMakesAnE1SecondSevere) {
    plugIn("type: e1-crc");
    errors({{"path-violations", 831}});
    tick();
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 0);
    errors({{"path-violations", 832}});
    tick();
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 1);
}

TEST_F(Z7SimLineTest, EveryKindOfErrorReachesItsCounters) {
    plugIn("type: esf");
    errors({{"code-violations", 7}});
    tick();
    EXPECT_EQ(m_table->GetLineCodeViolations(0), 7);
    EXPECT_EQ(m_table->GetLineErrorSeconds(0), 1);
    EXPECT_EQ(m_table->GetErrorSeconds(0), 0);
    errors({{"framing-errors", 3}});
    tick();
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 3);
    errors({{"slips", 1}});
    tick();
    EXPECT_EQ(m_table->GetControlledSlipSeconds(0), 1);
    EXPECT_EQ(m_table->GetErrorSeconds(0), 2);
}

TEST_F(Z7SimLineTest, ALostSignalIsUnavailableFromItsFirstSecond) {
    plugIn("type: esf");
    alarm("los");
    tick(2);
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 2);
    EXPECT_EQ(m_table->GetSeverelyErrorFramingSeconds(0), 2);
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 0);
    tick();
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 0);
    EXPECT_EQ(m_table->GetErrorSeconds(0), 0);
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 3);
}

TEST_F(Z7SimLineTest, AMendedLineIsAvailableFromItsFirstGoodSecond) {
    plugIn("type: esf");
    alarm("los");
    tick(15);
    mend();
    tick(9);
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 24);
    tick();
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 15);
}

TEST_F(Z7SimLineTest, TenSevereSecondsAcrossABorderAreTakenBackOnBothSides) {
    plugIn("type: esf");
    tick(896);
    for (int i = 0; i < 9; ++i) {
        errors({{"path-violations", 400}});
        tick();
    }
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(1), 4);
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(0), 5);
    errors({{"path-violations", 400}});
    tick();
    EXPECT_EQ(m_table->GetSeverelyErrorSeconds(1), 0);
    EXPECT_EQ(m_table->GetUnavailableSeconds(1), 4);
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 6);
}

TEST_F(Z7SimLineTest, TheTickThatClosesAnIntervalCountsItsSecondInTheNext) {
    plugIn("type: esf");
    tick(900);
    EXPECT_EQ(m_table->GetTimeElapsed(), 900);
    EXPECT_EQ(m_table->GetValidIntervals(), 0);
    errors({{"slips", 1}});
    tick();
    EXPECT_EQ(m_table->GetValidIntervals(), 1);
    EXPECT_EQ(m_table->GetTimeElapsed(), 1);
    EXPECT_EQ(m_table->GetControlledSlipSeconds(0), 1);
    EXPECT_EQ(m_table->GetControlledSlipSeconds(1), 0);
    tick(900);
    EXPECT_EQ(m_table->GetValidIntervals(), 2);
    EXPECT_EQ(m_table->GetControlledSlipSeconds(1), 1);
}

TEST_F(Z7SimLineTest, DefectShowsInTheStatusOnceItIsAFailure) {
    plugIn("type: esf");
    alarm("los");
    tick(2);
    EXPECT_EQ(status(), DS1LineStatusNoAlarm);
    EXPECT_EQ(m_line->GetOperStatus(), 1);
    tick();
    EXPECT_EQ(status(), kCut);
    EXPECT_EQ(m_line->GetOperStatus(), 2);
}

TEST_F(Z7SimLineTest, DefectThatIsNoFailureIsNoStatus) {
    plugIn("type: e1");
    LineLog log;
    m_feature->AddLineStatusListener(&log);
    alarm("lof");
    tick(2);
    mend();
    tick(20);
    EXPECT_EQ(log.told(), Told());
    EXPECT_EQ(m_table->GetSeverelyErrorFramingSeconds(0), 2);
}

TEST_F(Z7SimLineTest, MendedLineHasItsFailureAndIsUnavailableForTenSeconds) {
    plugIn("type: esf");
    alarm("los");
    tick(3);
    mend();
    tick(9);
    EXPECT_EQ(status(), kCut & ~DS1LineStatusXmtFarEndLOF);
    tick();
    EXPECT_EQ(status(), DS1LineStatusNoAlarm);
    EXPECT_EQ(m_line->GetOperStatus(), 1);
}

TEST_F(Z7SimLineTest, OtherAlarmsShowInTheStatusAtOnce) {
    plugIn("type: esf");
    alarm("rai");
    alarm("loopback");
    tick();
    EXPECT_EQ(status(), DS1LineStatusRcvFarEndLOF | DS1LineStatusLoopbackState);
    EXPECT_EQ(m_line->GetOperStatus(), 1);
    EXPECT_EQ(m_line->GetLoopbackStatus(), 4);
    EXPECT_EQ(m_line->GetLoopbackConfig(), 3);
    alarm("sending-rai");
    tick();
    EXPECT_EQ(status(),
              DS1LineStatusRcvFarEndLOF | DS1LineStatusLoopbackState | DS1LineStatusXmtFarEndLOF);
    mend();
    tick();
    EXPECT_EQ(status(), DS1LineStatusNoAlarm);
}

TEST_F(Z7SimLineTest, ReceivedAlarmIndicationIsALossOfFrameToo) {
    plugIn("type: e1-crc");
    alarm("ais");
    tick(3);
    EXPECT_EQ(status(), DS1LineStatusRcvAIS | DS1LineStatusLossOfFrame | DS1LineStatusXmtFarEndLOF |
                            DS1LineStatusUnavailSigState);
}

TEST_F(Z7SimLineTest, UnavailabilityByErrorsIsAStatusOfItsOwn) {
    plugIn("type: esf, errors: {path-violations: 400}");
    tick(9);
    EXPECT_EQ(status(), DS1LineStatusNoAlarm);
    tick();
    EXPECT_EQ(status(), DS1LineStatusUnavailSigState);
    mend();
    tick(9);
    EXPECT_EQ(status(), DS1LineStatusUnavailSigState);
    tick();
    EXPECT_EQ(status(), DS1LineStatusNoAlarm);
}

TEST_F(Z7SimLineTest, ListenersHearOfEveryChangeOnce) {
    plugIn("type: esf");
    LineLog log;
    EXPECT_EQ(m_feature->AddLineStatusListener(&log), 0);
    EXPECT_EQ(m_feature->AddLineStatusListener(&log), 0);
    tick();
    alarm("los");
    tick(10);
    mend();
    tick(11);
    EXPECT_EQ(log.told(), (Told{{"span-1", kCut},
                                {"span-1", kCut & ~DS1LineStatusXmtFarEndLOF},
                                {"span-1", DS1LineStatusNoAlarm}}));
}

TEST_F(Z7SimLineTest, AChangeLeavesItsDate) {
    plugIn("type: esf");
    auto const before = static_cast<long>(std::time(nullptr));
    alarm("los");
    tick(3);
    EXPECT_GE(m_line->GetLineStatusLastChange(), before);
    int seconds = 0;
    int microseconds = -1;
    EXPECT_EQ(m_line->GetLastChange(seconds, microseconds), 0);
    EXPECT_EQ(microseconds, 0);
    // The line has been unavailable since its signal was lost, which was a failure seconds later.
    long const declared = m_line->GetLineStatusLastChange() - seconds;
    EXPECT_GE(declared, 2);
    EXPECT_LE(declared, 4);
}

TEST_F(Z7SimLineTest, LineIsAvailableSinceTheFirstOfTenGoodSeconds) {
    plugIn("type: esf");
    int seconds = 0;
    int microseconds = 0;
    EXPECT_EQ(m_line->GetLastChange(seconds, microseconds), 0);
    EXPECT_EQ(seconds, 0); // it has not changed yet
    alarm("los");
    tick(3);
    mend();
    tick(11);
    ASSERT_EQ(m_line->GetOperStatus(), 1);
    EXPECT_EQ(m_line->GetLastChange(seconds, microseconds), 0);
    EXPECT_GE(m_line->GetLineStatusLastChange() - seconds, 10);
    EXPECT_LE(m_line->GetLineStatusLastChange() - seconds, 11);
    // An alarm that leaves the line available moves the one date only.
    int const available = seconds;
    alarm("rai");
    tick();
    EXPECT_EQ(m_line->GetLastChange(seconds, microseconds), 0);
    EXPECT_EQ(seconds, available);
}

TEST_F(Z7SimLineTest, AnAlarmFromTheStartIsAStatusAndNoChange) {
    plugIn("type: esf, alarms: [ais]");
    LineLog log;
    m_feature->AddLineStatusListener(&log);
    EXPECT_EQ(status(), DS1LineStatusRcvAIS | DS1LineStatusLossOfFrame | DS1LineStatusXmtFarEndLOF |
                            DS1LineStatusUnavailSigState);
    tick(4);
    EXPECT_EQ(log.told(), Told());
    EXPECT_EQ(m_line->GetLineStatusLastChange(), 0);
}

TEST_F(Z7SimLineTest, AWithdrawnFeatureTellsNothingMore) {
    plugIn("type: esf");
    LineLog log;
    m_feature->AddLineStatusListener(&log);
    m_feature->Withdraw();
    alarm("los");
    tick(3);
    EXPECT_EQ(log.told(), Told());
    EXPECT_NE(status(), DS1LineStatusNoAlarm);
}

TEST_F(Z7SimLineTest, LinesGoWithAStoppedBoardAndComeBackWithAStartedOne) {
    plugIn("type: esf");
    stop();
    EXPECT_EQ(m_board->GetFirstFeature(DS1LineFeature::iid()).get(), nullptr);
    start();
    ASSERT_NE(m_feature.get(), nullptr);
    EXPECT_EQ(m_feature->GetNumberOfLines(), 1);
}

TEST(LineSetupTest, EveryTypeOfTheMibHasItsFormatOrNone) {
    auto const format = [](int type) {
        LineSetup setup;
        setup.type = type;
        return setup.format();
    };
    for (int const type : {2, 14})
        EXPECT_EQ(format(type), LineFormat::esf) << type;
    EXPECT_EQ(format(3), LineFormat::d4);
    for (int const type : {4, 6, 12})
        EXPECT_EQ(format(type), LineFormat::e1) << type;
    for (int const type : {5, 7, 13})
        EXPECT_EQ(format(type), LineFormat::e1Crc) << type;
    for (int const type : {-1, 0, 1, 8, 9, 10, 11, 15, 16, 99})
        EXPECT_EQ(format(type), LineFormat::other) << type;
}

TEST_F(Z7SimLineTest, LineOfAnUnknownTypeIsNoT1) {
    load("type: esf", "NAME: span-1");
    sim::unset(51, "LINE_TYPE");
    attach();
    std::string description;
    m_line->GetDescription(description);
    EXPECT_EQ(description, "Line span-1");
    EXPECT_EQ(m_line->GetLineType(), 1); // other
    EXPECT_EQ(m_line->GetLineCoding(), 6);
    EXPECT_EQ(m_line->GetSpeed(), KVL::kNotSupported);
    EXPECT_EQ(m_table.get(), nullptr);
}

TEST_F(Z7SimLineTest, ABoardWithoutLinesHasNoFeatureOfThem) {
    sim::load({sim::board(5, "S5", "", "devices: [{handle: 51, type: 501}]")});
    m_manager->Attach(m_handle);
    m_board = m_manager->GetFirstBoard();
    EXPECT_EQ(m_board->GetFirstFeature(DS1LineFeature::iid()).get(), nullptr);
}

} // namespace
