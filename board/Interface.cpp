// SPDX-License-Identifier: BSD-2-Clause
#include "board/Interface.h"

namespace KVL {

Interface::Interface() : Object(true) {
    answer_to(iid());
}

Interface::~Interface() = default;

int Interface::GetDescription(std::string& /*description*/) {
    return kNotSupported;
}
int Interface::GetType() {
    return kNotSupported;
}
int Interface::GetMTU() {
    return kNotSupported;
}
int Interface::GetSpeed() {
    return kNotSupported;
}
int Interface::GetPhysAddress(char* /*buffer*/, int& /*length*/) {
    return kNotSupported;
}
int Interface::GetAdminStatus() {
    return kNotSupported;
}
int Interface::SetAdminStatus(int /*status*/) {
    return kNotSupported;
}
int Interface::GetOperStatus() {
    return kNotSupported;
}
int Interface::GetLastChange(int& /*seconds*/, int& /*microseconds*/) {
    return kNotSupported;
}
int Interface::GetInOctets() {
    return kNotSupported;
}
int Interface::GetInUcastPkts() {
    return kNotSupported;
}
int Interface::GetInDiscards() {
    return kNotSupported;
}
int Interface::GetInErrors() {
    return kNotSupported;
}
int Interface::GetInUnknownProtos() {
    return kNotSupported;
}
int Interface::GetOutOctets() {
    return kNotSupported;
}
int Interface::GetOutUcastPkts() {
    return kNotSupported;
}
int Interface::GetOutDiscards() {
    return kNotSupported;
}
int Interface::GetOutErrors() {
    return kNotSupported;
}

} // namespace KVL
