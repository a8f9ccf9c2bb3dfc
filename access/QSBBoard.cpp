// SPDX-License-Identifier: BSD-2-Clause
#include "access/QSBBoard.h"

#include <cstdint>
#include <cstring>

QSBBoard::QSBBoard(std::string const& serialNumber)
    : m_serialNumber(serialNumber), m_accessor(std::make_unique<QSBAccessor>()) {
    m_instanceID = m_accessor->GetBoardInstance(m_serialNumber);
}

QSBBoard::~QSBBoard() = default;

void QSBBoard::UpdateInstanceID() {
    m_accessor->Update();
    m_instanceID = m_accessor->GetBoardInstance(m_serialNumber);
}

// The offsets are those of the layout KVL::kQSBBoardLayout.
std::string QSBBoard::Version() {
    return text(0);
}
std::string QSBBoard::Model() {
    return text(80);
}
int QSBBoard::Type() {
    return number(160);
}
std::string QSBBoard::FunctionalDescription() {
    return text(164);
}
std::string QSBBoard::FirmwareName() {
    return text(244);
}
std::string QSBBoard::FirmwareVersion() {
    return text(324);
}
std::string QSBBoard::SerialNumber() {
    return text(404);
}
int QSBBoard::SharedMemoryBaseAddress() {
    return number(484);
}
int QSBBoard::IOBaseAddress() {
    return number(488);
}
int QSBBoard::IRQ() {
    return number(492);
}
int QSBBoard::BoardID() {
    return number(496);
}
int QSBBoard::PCISlotNumber() {
    return number(500);
}
std::string QSBBoard::DeviceChangeDate() {
    return text(508);
}

bool QSBBoard::read(int offset, int length, void* buffer) {
    if (m_instanceID == -1) UpdateInstanceID();
    return m_instanceID != -1 && QSBGetDataValue(KVL::kQSBRecordTypes[1].name, m_instanceID, offset,
                                                 length, buffer) == QSB_SUCCESS;
}

std::string QSBBoard::text(int offset) {
    char text[80] = {};
    if (!read(offset, sizeof text, text)) return "Error";
    return {text, strnlen(text, sizeof text)};
}

int QSBBoard::number(int offset) {
    std::int32_t value = -1;
    return read(offset, sizeof value, &value) ? value : -1;
}
