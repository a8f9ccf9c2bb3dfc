// SPDX-License-Identifier: BSD-2-Clause
#include "tests/fuzz/SampleRows.h"

#include <string>
#include <utility>

namespace kvloamd {

namespace {

std::shared_ptr<PlatformRecords const> sampleRecords() {
    auto records = std::make_shared<PlatformRecords>();
    for (std::uint32_t const board : {1U, 2U}) {
        DeviceRow device;
        device.boardIndex = board;
        device.auid = 100 + board;
        device.name = "device";
        device.channelCount = 30;
        records->devices.push_back(device);
        ProcessorRow processor;
        processor.boardIndex = board;
        processor.auid = 0xfffffffe;
        processor.name = std::string(128, 'p');
        records->processors.push_back(processor);
        StoreRow store;
        store.boardIndex = board;
        store.serialNumber = "S" + std::to_string(board);
        records->store.push_back(store);
    }
    return records;
}

InterfaceRows sampleInterfaces() {
    InterfaceRows rows;
    auto closed = std::make_shared<ClosedIntervals>();
    closed->counts = {LineCounts{1, 2, 3}, LineCounts{}};
    closed->valid = {true, false};
    for (std::uint32_t const index : {1000U, 1001U, 1003U, 0x7fffffffU}) {
        InterfaceRow row;
        row.ifIndex = index;
        row.boardIndex = 1;
        row.description = "line " + std::to_string(index);
        row.operStatus = 1;
        row.counters[kInOctets] = 0xffffffffffULL;
        rows.interfaces.push_back(row);
        if (index > 1001) continue;
        LineRow line;
        line.ifIndex = index;
        line.lineStatus = 1;
        line.timeElapsed = 7;
        line.closed = closed;
        rows.lines.push_back(line);
    }
    countIntervals(rows);
    rows.stack = {{0, 1000}, {1000, 1001}};
    return rows;
}

EntityRows sampleEntities() {
    auto physical = std::make_shared<PhysicalEntities>();
    PhysicalRow chassis;
    chassis.entity = 1;
    PhysicalRow port;
    port.entity = 7;
    port.containedIn = 1;
    port.physicalClass = PhysicalClass::Port;
    physical->entities = {chassis, port};
    physical->contains = {{1, 7}};
    physical->aliases = {{7, {1, 3, 6, 1, 2, 1, 2, 2, 1, 1, 1000}}};
    EntityRows rows;
    rows.physical = std::move(physical);
    EntityStateRow state;
    state.entity = 7;
    rows.states = {state};
    return rows;
}

} // namespace

std::shared_ptr<Snapshot const> sampleSnapshot() {
    auto snapshot = std::make_shared<Snapshot>();
    for (std::uint32_t const index : {1U, 2U, 0xffffffffU}) {
        BoardRow board;
        board.boardIndex = index;
        board.name = "board " + std::to_string(index);
        board.errorMessage = std::string(200, 'e');
        snapshot->boards.push_back(board);
    }
    FaultRow fault;
    fault.value = 3;
    snapshot->faults.rows = {fault};
    snapshot->records = sampleRecords();
    snapshot->interfaces = sampleInterfaces();
    snapshot->entities = sampleEntities();
    return snapshot;
}

} // namespace kvloamd
