// SPDX-License-Identifier: BSD-2-Clause
// Fuzzes the library's and the agent's reading of the board platform. This program has a platform
// of its own, whose device mapper, attribute store and statistics answer what the input says.
#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include "access/DevMapBoardIf.h"
#include "access/DevMapDeviceIf.h"
#include "access/DevMapProcessorIf.h"
#include "access/DevMapSubDeviceIf.h"
#include "access/KPXStatisticsTable.h"
#include "access/QSBBoard.h"
#include "agent/log/Log.h"
#include "agent/readers/BoardFinder.h"
#include "agent/readers/DeviceReader.h"
#include "agent/readers/PlatformReader.h"
#include "agent/readers/ProcessReader.h"
#include "boardplatform/dm_client.h"
#include "boardplatform/kpx.h"
#include "boardplatform/qsb.h"
#include "tests/fuzz/FuzzInput.h"

namespace {

fuzz::FuzzInput s_input{std::string_view()};

/// Small, so that what one answer names another one finds.
long handleFrom(fuzz::FuzzInput& input) {
    std::uint8_t const octet = input.octet();
    return octet < 250 ? octet % 16 : static_cast<long>(input.number<std::int64_t>());
}

/// Puts at most as many octets into the caller's buffer as it has room for, which is the contract.
void answer(DMAttribute& request) {
    std::string const value = s_input.text();
    std::size_t const size =
        std::min(value.size(), static_cast<std::size_t>(std::max(request.size, 0)));
    std::memcpy(request.value, value.data(), size);
    request.size =
        s_input.octet() == 0xff ? s_input.number<std::int32_t>() : static_cast<std::int32_t>(size);
    request.status = static_cast<std::int32_t>(s_input.choice(3));
}

class FuzzedMapper final : public DeviceMapperClient {
  public:
    int FindObjects(long /*parent*/, int /*count*/, DMAttribute* /*criteria*/, int* found,
                    long* auids) override {
        if (s_input.atEnd()) return 1;
        int const capacity = *found;
        int const stored = std::min(static_cast<int>(s_input.choice(8)), capacity);
        for (int i = 0; i < stored; ++i)
            auids[i] = handleFrom(s_input);
        // Of a count beyond what is stored, the rest of the array stays as it was.
        *found = s_input.octet() == 0xff ? s_input.number<std::int32_t>() : stored;
        return s_input.octet() == 0xff ? 1 : 0;
    }
    int Reserved3() override { return 1; }
    int GetRootObject(long* auid) override {
        *auid = 1;
        return s_input.octet() == 0xff ? 1 : 0;
    }
    int FindObjectByName(char* /*name*/, long* auid) override {
        *auid = handleFrom(s_input);
        return s_input.octet();
    }
    int GetAttributes(long /*auid*/, int count, DMAttribute* requests) override {
        for (int i = 0; i < count; ++i) {
            requests[i].status = 1;
            if (!s_input.atEnd()) answer(requests[i]);
        }
        static constexpr int kResults[] = {0, kDMSomeAttributesFailed, 7};
        return kResults[s_input.choice(std::size(kResults))];
    }
};

} // namespace

DeviceMapperClient* dm_getDeviceMapperClient() {
    static auto* const mapper = new FuzzedMapper;
    return mapper;
}

int QSBOpenStorage(char* rootType, int* rootInstance) {
    std::string const type = s_input.text();
    std::memset(rootType, 'x', kQSBTypeNameSize);
    type.copy(rootType, kQSBTypeNameSize);
    *rootInstance = 1;
    return s_input.octet();
}

int QSBGetFirstInstance(char const* /*type*/, char const* /*parentType*/, int /*parent*/,
                        int* instance) {
    *instance = static_cast<int>(handleFrom(s_input));
    // A walk ends with the input.
    return s_input.atEnd() ? QSB_ENOINST : static_cast<int>(s_input.choice(2));
}

int QSBGetNextInstance(int* instance) {
    *instance = static_cast<int>(handleFrom(s_input));
    return s_input.atEnd() ? QSB_ENOMORE : static_cast<int>(s_input.choice(2));
}

int QSBGetDataValue(char const* /*type*/, int /*instance*/, int /*offset*/, int length,
                    void* buffer) {
    std::string const value = s_input.text();
    std::memcpy(buffer, value.data(),
                std::min(value.size(), static_cast<std::size_t>(std::max(length, 0))));
    return static_cast<int>(s_input.choice(2));
}

int QSBCloseStorage() {
    return s_input.octet();
}

int _kp_getpids(int* pids, int max) {
    int const stored = std::min(static_cast<int>(s_input.choice(4)), max);
    for (int i = 0; i < stored; ++i)
        pids[i] = s_input.number<std::int32_t>();
    return s_input.octet() == 0xff ? s_input.number<std::int32_t>() : stored;
}

int _kp_getstatsbypid(int /*pid*/, tag_KPXSTATISTICS* record) {
    s_input.take(sizeof *record).copy(reinterpret_cast<char*>(record), sizeof *record);
    return s_input.octet() == 0 ? -1 : 0;
}

namespace {

/// A table that never takes its rows for fresh.
class EagerTable final : public KPXStatisticsTable {
  public:
    EagerTable()
        : KPXStatisticsTable([] {
              static std::time_t now = 0;
              return now += 60;
          }) {}
};

/// What a reader may get is a text of at most as many octets as the platform's buffer has.
void requireFits(std::string const& text) {
    fuzz::require(text.size() <= 128 && text.find('\0') == std::string::npos, "a text fits");
}

void readBoard(long handle) {
    DevMapBoardIf board(handle);
    for (std::string const& text : {board.SerialNumber(), board.Name(), board.Description(),
                                    board.Family(), board.FirmwareName(), board.FirmwareVersion()})
        requireFits(text);
    board.LogicalID();
    board.BoardCondition();
    board.BoardPresent();
    board.StateChangeDate();
    board.ListAllDevices();
    board.ListProcessors();
}

void readDevice(long handle) {
    DevMapDeviceIf device(handle);
    QCompDesc address{};
    device.LineAdminAddress(address);
    device.ProtocolType(3);
    for (std::string const& name : device.ListAllSubDeviceNames())
        requireFits(name);
    DevMapSubDeviceIf const subDevice(handle);
    subDevice.TSCAddress(address);
    DevMapProcessorIf const processor(handle);
    char name[] = "name";
    DevMapDeviceIf const named(name);
}

void readStore(std::string const& serialNumber) {
    QSBBoard board(serialNumber);
    for (std::string const& text : {board.Version(), board.Model(), board.SerialNumber()})
        requireFits(text);
    board.Type();
    board.PCISlotNumber();
}

void readAsTheAgent() {
    kvloamd::BoardRow row;
    row.boardIndex = 1;
    row.serialNumber = s_input.text();
    kvloamd::PlatformReader reader(std::chrono::milliseconds(0));
    auto const records = reader.read({row});
    fuzz::require(std::ranges::adjacent_find(records->devices, std::ranges::greater_equal(),
                                             [](auto const& device) { return device.index(); }) ==
                      records->devices.end(),
                  "the indices of devices ascend");
    EagerTable statistics;
    kvloamd::readProcesses(statistics);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(std::uint8_t const* octets, std::size_t size) {
    kvloamd::setLogLevel(kvloamd::LogLevel::Error);
    s_input = fuzz::FuzzInput(octets, size);
    switch (s_input.choice(6)) {
    case 0:
        readBoard(1);
        break;
    case 1:
        readDevice(1);
        break;
    case 2:
        readStore(s_input.text());
        break;
    case 3: {
        std::vector<long> boards;
        DeviceMapperIf::get_interface()->FindAllBoards(boards);
        DeviceMapperIf::get_interface()->ListAllBoards();
        kvloamd::BoardFinder const finder;
        finder.find("A");
        finder.serialNumberOfDriverBoard(1);
        break;
    }
    case 4:
        kvloamd::readDevices(1, 1);
        break;
    default:
        readAsTheAgent();
    }
    s_input = fuzz::FuzzInput(std::string_view());
    return 0;
}
