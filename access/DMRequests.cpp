// SPDX-License-Identifier: BSD-2-Clause
#include "access/DMRequests.h"

#include <algorithm>
#include <cstring>

#include "access/DeviceMapperIf.h"

namespace KVL {

long DMNumber::answer(DMAttribute const& request) const {
    return request.status == 0 ? extended(request) : -1;
}

long DMNumber::extended(DMAttribute const& request) const {
    if (request.size != sizeof(std::int16_t)) return m_word;
    std::int16_t narrow = 0;
    std::memcpy(&narrow, &m_word, sizeof narrow);
    return narrow;
}

std::string DMText::text() const {
    return {m_buffer, strnlen(m_buffer, sizeof m_buffer)};
}

std::string DMText::answer(DMAttribute const& request, char const* missing) const {
    return request.status == 0 ? text() : missing;
}

void append_matches(DeviceMapperClient& client, long parent, DMAttribute criterion,
                    std::vector<long>& found) {
    long auids[kDMSearchCapacity];
    int count = kDMSearchCapacity;
    if (client.FindObjects(parent, 1, &criterion, &count, auids) != 0) return;
    found.insert(found.end(), auids, auids + std::clamp(count, 0, kDMSearchCapacity));
}

void append_objects_of_type(DeviceMapperClient& client, long parent, int type,
                            std::vector<long>& found) {
    auto value = static_cast<std::int32_t>(type);
    append_matches(client, parent, {"TYPE", &value, 0, 0, sizeof value}, found);
}

} // namespace KVL
