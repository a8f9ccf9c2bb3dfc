// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ServiceReader.h"

#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

/// The records' texts know no limit; those that the library itself writes have 255 characters.
constexpr std::size_t kTextCapacity = 4096;

template <class Record>
std::string text(Record& record, void (Record::*query)(char*)) {
    char answer[kTextCapacity];
    answer[0] = '\0';
    (record.*query)(answer);
    return printable(answer);
}

std::optional<int> status(int answer) {
    return answer == 0 ? std::nullopt : std::optional(answer);
}

} // namespace

std::vector<ModuleRow> readModules(ServiceManager& manager) {
    std::vector<ModuleRow> rows;
    for (int index = manager.GetFirstModuleIndex(); index > 0;
         index = manager.GetNextModuleIndex(index)) {
        ReferenceCounter<Module> const handle = manager.GetModuleByIndex(index);
        Module* const module = handle.get();
        if (module == nullptr) continue;
        rows.push_back({static_cast<std::uint32_t>(index), text(*module, &Module::GetModuleName),
                        text(*module, &Module::GetModulePurpose),
                        text(*module, &Module::GetModuleVersion),
                        dateOctets(module->GetModuleDate())});
    }
    return rows;
}

std::vector<ServiceRow> readServices(ServiceManager& manager) {
    std::vector<ServiceRow> rows;
    for (int index = manager.GetFirstServiceIndex(); index > 0;
         index = manager.GetNextServiceIndex(index)) {
        ReferenceCounter<Service> const handle = manager.GetServiceByIndex(index);
        Service* const service = handle.get();
        if (service == nullptr) continue;
        rows.push_back({static_cast<std::uint32_t>(index), text(*service, &Service::GetServiceName),
                        text(*service, &Service::GetServiceScmName),
                        status(service->GetServiceStatus()),
                        dateOctets(service->GetServiceChangeDate())});
    }
    return rows;
}

PlatformService readPlatformService(ServiceManager& manager) {
    return {status(manager.GetVelquorServiceStatus()),
            dateOctets(manager.GetVelquorServiceChangeDate())};
}

} // namespace kvloamd
