// SPDX-License-Identifier: BSD-2-Clause
#include "access/DevMapBoardIf.h"

#include "access/DMRequests.h"

using KVL::DMNumber;
using KVL::DMText;
using KVL::kDMUnknown;

namespace {

/// The types of devices on a board, in the order in which they are listed.
constexpr int kDeviceTypes[] = {501, 503, 505, 507, 509, 514, 516, 518, 520, 521, 511, 525, 527};

/// Deliberate: an answer of less than two bytes is address 0, as boards without shared memory give
/// it.
long address(DMNumber const& number, DMAttribute const& request) {
    return request.status == 0 && request.size < 2 ? 0 : number.answer(request);
}

} // namespace

DevMapBoardIf::DevMapBoardIf(long auid) : m_auid(auid), m_dmIf(DeviceMapperIf::get_interface()) {
    DMText serialNumber, firmwareName, firmwareName1, description, name, family, firmwareVersion;
    DMNumber pciSlot, pciBus, memoryBase, ioBase, irq, boardID;
    DMNumber shelf(-1), vornDriverBoard(-1), chassisSlot(-1);

    enum {
        AtSerialNumber,
        AtPciSlot,
        AtPciBus,
        AtMemoryBase,
        AtIOBase,
        AtIrq,
        AtFirmwareName,
        AtFirmwareName1,
        AtDescription,
        AtName,
        AtShelf,
        AtVornDriverBoard,
        AtFamily,
        AtChassisSlot,
        AtBoardID,
        AtFirmwareVersion,
        Count
    };
    DMAttribute requests[Count] = {
        serialNumber.request("SERIAL_NUMBER"),
        pciSlot.request("PCI_SLOT_NUMBER"),
        pciBus.request("PCI_BUS_NUMBER"),
        memoryBase.request("MEMBASEADDR"),
        ioBase.request("IOBASEADDR"),
        irq.request("IRQ"),
        firmwareName.request("FIRMWARE_NAME"),
        firmwareName1.request("FIRMWARE_NAME1"),
        description.request("DESCRIPTION"),
        name.request("NAME"),
        shelf.request("SHELF_ID"),
        vornDriverBoard.request("VORN_DRIVER_BOARD_ID"),
        family.request("FAMILY"),
        chassisSlot.request("CHASSIS_SLOT"),
        boardID.request("Board Id (BLT ID)"),
        firmwareVersion.request("FIRMWARE_VERSION"),
    };
    int const result = client().GetAttributes(auid, Count, requests);

    m_serialNumber = serialNumber.answer(requests[AtSerialNumber], kDMUnknown);
    m_firmwareName = firmwareName.answer(requests[AtFirmwareName], kDMUnknown);
    m_firmwareName1 = firmwareName1.answer(requests[AtFirmwareName1], kDMUnknown);
    m_description = description.answer(requests[AtDescription], kDMUnknown);
    m_name = name.answer(requests[AtName], kDMUnknown);
    m_family = family.answer(requests[AtFamily], kDMUnknown);
    m_firmwareVersion = firmwareVersion.answer(requests[AtFirmwareVersion], kDMUnknown);
    m_pciSlotNumber = pciSlot.answer(requests[AtPciSlot]);
    m_pciBusNumber = pciBus.answer(requests[AtPciBus]);
    m_sharedMemoryBaseAddress = address(memoryBase, requests[AtMemoryBase]);
    m_ioBaseAddress = ioBase.answer(requests[AtIOBase]);
    m_irq = irq.answer(requests[AtIrq]);
    m_boardID = boardID.answer(requests[AtBoardID]);
    m_shelfID = shelf.inPlace(requests[AtShelf], result);
    m_vornDriverBoardID = vornDriverBoard.inPlace(requests[AtVornDriverBoard], result);
    m_chassisSlot = chassisSlot.inPlace(requests[AtChassisSlot], result);
}

long DevMapBoardIf::LogicalID() {
    DMNumber number;
    DMAttribute request = number.request("LOGICAL ID");
    client().GetAttributes(m_auid, 1, &request);
    return number.answer(request);
}

long DevMapBoardIf::BoardCondition() {
    return readLive("BOARD_CONDITION");
}

long DevMapBoardIf::BoardPresent() {
    return readLive("BOARD_PRESENT");
}

long DevMapBoardIf::readLive(char const* name) {
    DMNumber number(-1);
    DMAttribute request = number.request(name);
    int const result = client().GetAttributes(m_auid, 1, &request);
    return result == kDMSomeAttributesFailed ? -1 : number.extended(request);
}

time_t DevMapBoardIf::StateChangeDate() {
    DMText text;
    DMAttribute request = text.request("STATE_CHANGE_DATE");
    if (client().GetAttributes(m_auid, 1, &request) != 0) return 0;
    std::tm date{};
    if (strptime(text.text().c_str(), "%a %b %e %T %Y", &date) == nullptr) return 0;
    date.tm_isdst = -1; // the text does not say whether summer time was in force
    // A 32-bit time_t may not hold the date. mktime() then fails and does not set the weekday.
    date.tm_wday = -1;
    time_t const seconds = std::mktime(&date);
    return date.tm_wday < 0 ? 0 : seconds;
}

std::vector<long> DevMapBoardIf::ListDevicesByType(int type) {
    std::vector<long> devices;
    KVL::append_objects_of_type(client(), m_auid, type, devices);
    return devices;
}

std::vector<long> DevMapBoardIf::ListAllDevices() {
    std::vector<long> devices;
    for (int const type : kDeviceTypes)
        KVL::append_objects_of_type(client(), m_auid, type, devices);
    return devices;
}

std::vector<long> DevMapBoardIf::ListProcessors() {
    return ListDevicesByType(DMObjectTypeProcessor);
}
