// SPDX-License-Identifier: BSD-2-Clause
#include "RackBoard.h"

#include <ctime>

#include "RackChannels.h"
#include "RackLine.h"

RackBoard::RackBoard(std::string const& serialNumber) : m_card(new Card{serialNumber}) {}

RackBoard::~RackBoard() = default;

int RackBoard::GetName(char* name) {
    return putText("rack card", name);
}

int RackBoard::GetModel(char* model) {
    return putText("RACK-T1", model);
}

int RackBoard::GetFamily(char* family) {
    return putText("RACK", family);
}

int RackBoard::GetFirmwareName(char* name) {
    return putText("", name);
}

int RackBoard::GetFirmwareVersion(char* version) {
    return putText("", version);
}

int RackBoard::GetSerialNumber(char* serialNumber) {
    return putText(m_card->serialNumber, serialNumber);
}

int RackBoard::GetErrorMessage(char* message) {
    return putText("", message);
}

int RackBoard::GetFunctionalDescription(char* description) {
    return putText("card with one T1 trunk", description);
}

void RackBoard::update(CardReading const& reading) {
    m_card->violations = reading.violations;
    m_card->calls = reading.calls;
}

void RackBoard::start() {
    ReferenceCounter<DS1LineDevice> const line(new RackLine(m_card));
    m_lines = {new RackLineFeature(line)};
    m_channels = {new RackISDNFeature(m_card, line)};
    AddFeature(m_lines);
    AddFeature(m_channels);
    m_changed = std::time(nullptr);
    m_status = BoardStatusStarted;
}

void RackBoard::stop() {
    m_status = BoardStatusStopped;
    m_changed = std::time(nullptr);
    RemoveFeature(m_channels);
    RemoveFeature(m_lines);
    m_channels = {};
    m_lines = {};
}
