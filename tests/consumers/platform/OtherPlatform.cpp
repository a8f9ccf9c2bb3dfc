// SPDX-License-Identifier: BSD-2-Clause
// A board platform with one board, of which it knows nothing but the name.
#include <cstring>

#include "boardplatform/dm_client.h"
#include "boardplatform/kpx.h"
#include "boardplatform/qsb.h"
#include "boardplatform/vqx_event_service.h"

namespace {

constexpr char kName[] = "OTHER-1";

class Mapper final : public DeviceMapperClient {
  public:
    int FindObjects(long, int, DMAttribute*, int* found, long* auids) override {
        *found = 1;
        auids[0] = 7;
        return 0;
    }
    int Reserved3() override { return -1; }
    int GetRootObject(long* auid) override {
        *auid = 1;
        return 0;
    }
    int FindObjectByName(char*, long*) override { return -1; }
    int GetAttributes(long, int count, DMAttribute* requests) override {
        for (int i = 0; i < count; ++i) {
            DMAttribute& request = requests[i];
            bool const known = std::strcmp(request.name, "NAME") == 0;
            request.status = known ? 0 : -1;
            request.size = known ? static_cast<int>(sizeof kName) : 0;
            if (known) std::memcpy(request.value, kName, sizeof kName);
        }
        return kDMSomeAttributesFailed;
    }
};

} // namespace

DeviceMapperClient* dm_getDeviceMapperClient() {
    static Mapper mapper;
    return &mapper;
}

int _kp_getpids(int*, int) {
    return 0;
}
int _kp_getstatsbypid(int, tag_KPXSTATISTICS*) {
    return -1;
}

int QSBOpenStorage(char*, int*) {
    return -1;
}
int QSBGetFirstInstance(char const*, char const*, int, int*) {
    return -1;
}
int QSBGetNextInstance(int*) {
    return -1;
}
int QSBGetDataValue(char const*, int, int, int, void*) {
    return -1;
}
int QSBCloseStorage() {
    return 0;
}

namespace VqxEventService {
VqxAdminConsumer::VqxAdminConsumer(char const*, wchar_t const*, AdminConsumer::FilterCallbackAssoc*,
                                   int, char const*, int) {}
VqxAdminConsumer::~VqxAdminConsumer() = default;
int VqxAdminConsumer::Start() {
    return 0;
}
} // namespace VqxEventService
