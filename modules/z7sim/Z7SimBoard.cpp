// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimBoard.h"

#include <cstring>
#include <string>
#include <utility>

#include "CopyText.h"
#include "Withdrawable.h"

namespace {

/// What the platform's records have in the place of a text that was not answered.
constexpr char const* kUnknown = "unknown";
constexpr char const* kNoAnswer = "board does not answer";
constexpr char const* kOtherBoard = "another board answers in its place";
constexpr char const* kReportedFailed = "board is reported failed by the platform";

} // namespace

Z7SimBoard::Z7SimBoard(long id, FailureTimes const& times) : Z7Board(id), m_lines(id, times) {
    readLogicalID();
}

Z7SimBoard::~Z7SimBoard() {
    withdrawFeatures();
}

// Queries: answered from the record or from the board's own state, never by asking the platform.

BoardStatusEnum Z7SimBoard::GetStatus() {
    return m_status;
}

BoardStatusEnum Z7SimBoard::GetSecondaryStatus() {
    return m_secondaryStatus;
}

int Z7SimBoard::GetName(char* name) {
    return copyText(record()->Name(), name);
}

int Z7SimBoard::GetModel(char* model) {
    // The platform names a board after its model.
    return GetName(model);
}

int Z7SimBoard::GetFamily(char* family) {
    return copyText(record()->Family(), family);
}

int Z7SimBoard::GetFirmwareName(char* name) {
    return copyText(record()->FirmwareName(), name);
}

int Z7SimBoard::GetFirmwareVersion(char* version) {
    return copyText(record()->FirmwareVersion(), version);
}

int Z7SimBoard::GetLogicalID() {
    return m_logicalID;
}

int Z7SimBoard::GetBoardID() {
    return static_cast<int>(record()->BoardID());
}

int Z7SimBoard::GetShelfID() {
    return static_cast<int>(record()->ShelfID());
}

// State: everything from here on runs with m_transition held.

void Z7SimBoard::AdoptCondition() {
    std::scoped_lock const transition(m_transition);
    DevMapBoardIf live(*record());
    long const condition = live.BoardCondition();
    if (condition == BoardStatusStarted) {
        // As the base does it at status 3, but nobody listens yet, and there is no handle of the
        // board that could be handed around.
        StartStage1();
        if (m_startFailure == nullptr) StartStage2();
        if (m_startFailure == nullptr) StartStage3();
        if (m_startFailure == nullptr) {
            create_extended_features();
            create_ipethernet_feature();
        }
        SetStatus(BoardStatusStarted);
    } else if (condition == BoardStatusFailed) {
        m_startFailure = kReportedFailed;
    }
    if (m_startFailure == nullptr) return;
    m_silent = m_startFailure == kNoAnswer;
    SetErrorMessage(m_startFailure);
    SetSecondaryStatus(BoardStatusFailed);
}

void Z7SimBoard::Retire() {
    std::scoped_lock const transition(m_transition);
    m_retired = true;
    if (m_status == BoardStatusStarted) {
        SetStatus(BoardStatusStopped);
        StopBoard();
        destroy_extended_features();
    }
    // Handles may still keep the histories; what takes the board's place is not theirs.
    m_lines.suspend();
    m_lines.clear();
}

int Z7SimBoard::ProcessExternalEvent(BoardStatusEnum status) {
    std::scoped_lock const transition(m_transition);
    if (m_retired) return -1;
    m_startFailure = nullptr;
    switch (status) {
    case BoardStatusStarted:
        m_silent = false;
        readLogicalID();
        break;
    case BoardStatusStopped:
        m_silent = false;
        break;
    case BoardStatusFailed:
        m_silent = false;
        SetErrorMessage(kReportedFailed); // listeners of the failure may ask for it
        break;
    default:
        break;
    }
    Z7Board::ProcessExternalEvent(status);
    if (m_startFailure != nullptr) fail(m_startFailure);
    return -1;
}

int Z7SimBoard::PingBoard() {
    std::scoped_lock const transition(m_transition);
    if (m_retired || (!m_inService && !m_silent)) return 0;
    if (!answers()) {
        if (m_inService) fail(kNoAnswer);
        return -1;
    }
    if (m_silent) ProcessExternalEvent(BoardStatusStarted);
    return 0;
}

/// Whether the platform has the board in its place. A request that fails is no answer either.
bool Z7SimBoard::answers() {
    DevMapBoardIf live(*record());
    return live.BoardPresent() == 1;
}

void Z7SimBoard::readLogicalID() {
    DevMapBoardIf live(*record());
    m_logicalID = static_cast<int>(live.LogicalID());
}

void Z7SimBoard::fail(char const* reason) {
    SetErrorMessage(reason);
    m_silent = reason == kNoAnswer;
    Z7Board::ProcessExternalEvent(BoardStatusFailed);
}

int Z7SimBoard::SetStatus(BoardStatusEnum status) {
    // The base records a start whatever the stages said. A board that could not come up stays down,
    // so that nobody hears of a start that was none.
    if (status == BoardStatusStarted && m_startFailure != nullptr) return -1;
    m_status = status;
    return 0;
}

int Z7SimBoard::SetSecondaryStatus(BoardStatusEnum status) {
    if (status == BoardStatusNone && m_startFailure != nullptr) return -1;
    m_secondaryStatus = status;
    return 0;
}

int Z7SimBoard::giveUp(char const* reason) {
    if (m_startFailure == nullptr) m_startFailure = reason;
    return -1;
}

int Z7SimBoard::StartStage1() {
    return answers() ? 0 : giveUp(kNoAnswer);
}

int Z7SimBoard::StartStage2() {
    // The base has just read the record anew. A board that was exchanged while nobody looked is for
    // the factory to replace at its next rescan; it must not run under the old one's name.
    char serialNumber[256];
    GetSerialNumber(serialNumber);
    std::string const found = record()->SerialNumber();
    if (found != serialNumber) {
        if (found == kUnknown) return giveUp(kNoAnswer);
        m_lines.suspend();
        return giveUp(kOtherBoard);
    }
    m_lines.resume();
    return 0;
}

int Z7SimBoard::StartStage3() {
    if (m_startFailure != nullptr) return -1;
    m_inService = true;
    return 0;
}

int Z7SimBoard::StopBoard() {
    m_inService = false;
    return 0;
}

int Z7SimBoard::create_extended_features() {
    // Features that nobody will withdraw must not be made.
    if (m_startFailure == nullptr) offer(makeExtendedFeatures(GetBoardIdentifier(), m_lines));
    return 0;
}

int Z7SimBoard::create_ipethernet_feature() {
    if (m_startFailure == nullptr) offer(makeNetworkFeatures(GetBoardIdentifier()));
    return 0;
}

void Z7SimBoard::offer(FeatureList features) {
    for (auto& feature : features) {
        AddFeature(feature);
        m_offered.push_back(std::move(feature));
    }
}

int Z7SimBoard::destroy_extended_features() {
    withdrawFeatures();
    return 0;
}

void Z7SimBoard::withdrawFeatures() {
    for (auto const& feature : m_offered) {
        if (auto* const withdrawable = dynamic_cast<Withdrawable*>(feature.get()))
            withdrawable->Withdraw();
        RemoveFeature(feature);
    }
    m_offered.clear();
}
