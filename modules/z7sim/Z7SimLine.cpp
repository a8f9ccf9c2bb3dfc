// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimLine.h"

#include <cstring>
#include <utility>

#include "CopyText.h"

namespace {

constexpr int kUp = 1;
constexpr int kDown = 2;

/// dsx1LineType. The platform names four of them (`DS1LineType`); DS1-MIB has more.
enum LineType : int {
    kEsf = 2,
    kD4 = 3,
    kE1 = 4,
    kE1Crc = 5,
    kE1Mf = 6,
    kE1CrcMf = 7,
    kUnframed = 8,
    kE1Unframed = 9,
    kE1Q50 = 12,
    kE1Q50Crc = 13,
    kJ1Esf = 14,
    kJ1Unframed = 16
};

char const* carrierName(LineCarrier carrier) {
    switch (carrier) {
    case LineCarrier::t1:
        return "T1 line ";
    case LineCarrier::e1:
        return "E1 line ";
    case LineCarrier::unknown:
        break;
    }
    return "Line ";
}

} // namespace

LineFormat LineSetup::format() const {
    switch (type) {
    case kEsf:
    case kJ1Esf:
        return LineFormat::esf;
    case kD4:
        return LineFormat::d4;
    case kE1:
    case kE1Mf:
    case kE1Q50:
        return LineFormat::e1;
    case kE1Crc:
    case kE1CrcMf:
    case kE1Q50Crc:
        return LineFormat::e1Crc;
    default:
        return LineFormat::other;
    }
}

LineCarrier LineSetup::carrier() const {
    switch (format()) {
    case LineFormat::esf:
    case LineFormat::d4:
        return LineCarrier::t1;
    case LineFormat::e1:
    case LineFormat::e1Crc:
        return LineCarrier::e1;
    case LineFormat::other:
        break;
    }
    if (type == kUnframed || type == kJ1Unframed) return LineCarrier::t1;
    return type == kE1Unframed ? LineCarrier::e1 : LineCarrier::unknown;
}

Z7SimLine::Z7SimLine(LineSetup setup, std::shared_ptr<LineState> state,
                     ReferenceCounter<DS1IntervalTable> intervals)
    : m_setup(std::move(setup)), m_state(std::move(state)), m_intervals(std::move(intervals)) {}

Z7SimLine::~Z7SimLine() = default;

int Z7SimLine::GetDescription(std::string& description) {
    description = carrierName(m_setup.carrier()) + m_setup.name;
    return 0;
}
int Z7SimLine::GetType() {
    return 18; // ds1
}
int Z7SimLine::GetMTU() {
    return Interface::GetMTU();
}
int Z7SimLine::GetSpeed() {
    switch (m_setup.carrier()) {
    case LineCarrier::t1:
        return 1544000;
    case LineCarrier::e1:
        return 2048000;
    case LineCarrier::unknown:
        break;
    }
    return KVL::kNotSupported;
}
int Z7SimLine::GetAdminStatus() {
    return kUp;
}
int Z7SimLine::SetAdminStatus(int status) {
    return Interface::SetAdminStatus(status);
}
int Z7SimLine::GetOperStatus() {
    constexpr int carriesNothing = DS1LineStatusLossOfSignal | DS1LineStatusLossOfFrame |
                                   DS1LineStatusRcvAIS | DS1LineStatusUnavailSigState;
    return (m_state->status() & carriesNothing) == 0 ? kUp : kDown;
}
int Z7SimLine::GetLastChange(int& seconds, int& microseconds) {
    seconds = static_cast<int>(m_state->availabilityChange());
    microseconds = 0;
    return 0;
}
int Z7SimLine::GetInOctets() {
    return Interface::GetInOctets();
}
int Z7SimLine::GetInUcastPkts() {
    return Interface::GetInUcastPkts();
}
int Z7SimLine::GetInDiscards() {
    return Interface::GetInDiscards();
}
int Z7SimLine::GetInErrors() {
    return Interface::GetInErrors();
}
int Z7SimLine::GetInUnknownProtos() {
    return Interface::GetInUnknownProtos();
}
int Z7SimLine::GetOutOctets() {
    return Interface::GetOutOctets();
}
int Z7SimLine::GetOutUcastPkts() {
    return Interface::GetOutUcastPkts();
}
int Z7SimLine::GetOutDiscards() {
    return Interface::GetOutDiscards();
}
int Z7SimLine::GetOutErrors() {
    return Interface::GetOutErrors();
}

int Z7SimLine::GetName(char* name) {
    return copyText(m_setup.name, name);
}
int Z7SimLine::GetLineIndex() {
    return m_setup.number;
}
ReferenceCounter<DS1IntervalTable> Z7SimLine::GetIntervalTable() {
    if (m_setup.format() == LineFormat::other) return {};
    return m_intervals;
}
int Z7SimLine::GetLineType() {
    return m_setup.type;
}
int Z7SimLine::GetLineCoding() {
    return m_setup.coding;
}
int Z7SimLine::GetSendCode() {
    return 1; // none
}
int Z7SimLine::GetCircuitIdentifier(char* identifier) {
    return copyText(m_setup.circuit, identifier);
}
bool Z7SimLine::isLooped() const {
    return (m_state->status() & DS1LineStatusLoopbackState) != 0;
}
int Z7SimLine::GetLoopbackConfig() {
    return isLooped() ? 3 : 1; // line loop, no loop
}
int Z7SimLine::GetLineStatus() {
    return m_state->status();
}
int Z7SimLine::GetSignalMode() {
    return m_setup.signalMode;
}
int Z7SimLine::GetPhysAddressString(char* address) {
    return GetCircuitIdentifier(address);
}
int Z7SimLine::GetTransmitClockSource() {
    return m_setup.clockSource;
}
int Z7SimLine::GetFdl() {
    return m_setup.fdl;
}
int Z7SimLine::GetLineLength() {
    return m_setup.length;
}
long Z7SimLine::GetLineStatusLastChange() {
    return m_state->lastChange();
}
int Z7SimLine::GetLineStatusChangeTrapEnable() {
    return m_state->trapEnable();
}
int Z7SimLine::SetLineStatusChangeTrapEnable(int enable) {
    if (enable != 1 && enable != 2) return -1;
    m_state->setTrapEnable(enable);
    return 0;
}
int Z7SimLine::GetLoopbackStatus() {
    return isLooped() ? 4 : 1; // near end line loopback, none
}
int Z7SimLine::GetDs1ChannelNumber() {
    return 0; // not part of a DS3
}
int Z7SimLine::GetChannelization() {
    return m_setup.channelized ? 2 : 1; // into DS0s, disabled
}
int Z7SimLine::GetLineMode() {
    return 1; // csu
}
int Z7SimLine::GetLineBuildOut() {
    return m_setup.buildOut;
}
