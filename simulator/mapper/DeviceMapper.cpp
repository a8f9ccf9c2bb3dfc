// SPDX-License-Identifier: BSD-2-Clause
// The simulated device mapper client: searches and reads over the chassis.
#include "simulator/mapper/DeviceMapper.h"

#include <algorithm>
#include <cstring>
#include <optional>
#include <span>

#include "simulator/chassis/LinePast.h"

namespace kvlsim {

namespace {

/// Equal when sizes and bytes are equal; a text's size counts its terminating NUL.
bool matches(ChassisObject const& object, DMAttribute const& criterion) {
    auto const value = object.attribute(criterion.name);
    if (!value) return false;
    std::string_view const bytes = value->bytes();
    return bytes.size() == static_cast<std::size_t>(criterion.size) &&
           (bytes.empty() || std::memcmp(bytes.data(), criterion.value, bytes.size()) == 0);
}

/// `size`: of the value of a criterion, or of the buffer of a request.
bool isSound(DMAttribute const& attribute, std::int32_t size) {
    return attribute.name != nullptr && size >= 0 && (attribute.value != nullptr || size == 0);
}

/// Whether the request is one for the counters of a board's lines and nothing else.
bool isForLines(std::span<DMAttribute const> requests) {
    return requests.size() == 1 && isSound(requests[0], requests[0].size) &&
           std::string_view(requests[0].name) == kDS1BoardCounters;
}

/// The whole past of a line, or nothing.
std::int32_t readPast(DMAttribute& request, std::int32_t capacity, LinePast const& past) {
    std::int64_t const size = (past.seconds + 1) * std::int64_t(sizeof(DS1LineCounters));
    if (size > capacity) return kBufferTooSmall;
    auto* to = static_cast<unsigned char*>(request.value);
    replayPast(past, [&to](DS1LineCounters const& counters) {
        std::memcpy(to, &counters, sizeof counters);
        to += sizeof counters;
    });
    request.size = static_cast<std::int32_t>(size);
    return 0;
}

std::int32_t readBytes(DMAttribute& request, std::int32_t capacity, void const* bytes,
                       std::size_t size) {
    if (size > static_cast<std::size_t>(capacity)) return kBufferTooSmall;
    std::memcpy(request.value, bytes, size);
    request.size = static_cast<std::int32_t>(size);
    return 0;
}

/// As many lines of a board as the buffer holds.
std::int32_t readLines(DMAttribute& request, std::int32_t capacity,
                       std::vector<LineOfBoard> const& lines, LiveLine::Time now) {
    std::size_t const count =
        std::min(lines.size(), static_cast<std::size_t>(capacity) / sizeof(DS1BoardLine));
    for (std::size_t i = 0; i < count; ++i)
        lines[i].line->fetch();
    auto* to = static_cast<unsigned char*>(request.value);
    for (std::size_t i = 0; i < count; ++i) {
        DS1BoardLine const line{lines[i].device, lines[i].line->counters(now)};
        std::memcpy(to, &line, sizeof line);
        to += sizeof line;
    }
    request.size = static_cast<std::int32_t>(count * sizeof(DS1BoardLine));
    return 0;
}

/// Writes the generations of as many boards as the buffer holds.
std::int32_t readGenerations(DMAttribute& request, std::int32_t capacity, Chassis const& chassis) {
    auto const& boards = chassis.boardsWithLines();
    std::size_t const count =
        std::min(boards.size(), static_cast<std::size_t>(capacity) / sizeof(DS1BoardGeneration));
    LiveLine::Time const now = chassis.lineTime();
    auto* to = static_cast<unsigned char*>(request.value);
    for (std::size_t i = 0; i < count; ++i) {
        BoardLines const& lines = boards[i];
        DS1BoardGeneration const answer{lines.board, Line::wholeSeconds(now - lines.born),
                                        lines.generation};
        std::memcpy(to, &answer, sizeof answer);
        to += sizeof answer;
    }
    request.size = static_cast<std::int32_t>(count * sizeof(DS1BoardGeneration));
    return 0;
}

/// The answer of the chassis, a board's lines, a line or ISDN channels; none for an attribute that
/// they do not answer.
std::optional<std::int32_t> readLive(DMAttribute& request, std::int32_t capacity,
                                     ChassisObject const& object, Chassis const& chassis) {
    std::string_view const name = request.name;
    if (object.kind == ObjectKind::root && name == kDS1LineGenerations)
        return readGenerations(request, capacity, chassis);
    if (object.kind == ObjectKind::board && name == kDS1BoardCounters)
        if (BoardLines const* const lines = chassis.linesOf(object.handle))
            return readLines(request, capacity, lines->all, chassis.lineTime());
    if (object.ds1Line) {
        LinePast const& past = object.ds1Line->draft().past;
        if (name == kDS1LineCounters) {
            DS1LineCounters const counters = object.ds1Line->counters(chassis.lineTime());
            return readBytes(request, capacity, &counters, sizeof counters);
        }
        if (past.seconds > 0 && name == kDS1LinePastSeconds) {
            auto const seconds = static_cast<std::int32_t>(past.seconds);
            return readBytes(request, capacity, &seconds, sizeof seconds);
        }
        if (past.seconds > 0 && name == kDS1LinePast) return readPast(request, capacity, past);
    }
    if (object.channels) {
        std::string_view const states = object.channels->states();
        if (name == kISDNChannelStates)
            return readBytes(request, capacity, states.data(), states.size());
        auto const signalling = object.channels->signalling();
        if (name == kISDNSignallingState)
            return readBytes(request, capacity, &signalling, sizeof signalling);
        auto const calls = object.channels->calls();
        if (name == kISDNCallRecords)
            return readBytes(request, capacity, calls.data(), calls.size_bytes());
        auto const& counters = object.channels->counters();
        if (name == kISDNSignallingCounters)
            return readBytes(request, capacity, &counters, sizeof counters);
    }
    return std::nullopt;
}

/// Answers one attribute; leaves the buffer alone unless the status is 0.
void readInto(DMAttribute& request, ChassisObject const& object, Chassis const& chassis) {
    std::int32_t const capacity = request.size;
    request.size = 0;
    if (!isSound(request, capacity)) {
        request.status = kInvalidAttribute;
        return;
    }
    if (auto const status = readLive(request, capacity, object, chassis)) {
        request.status = *status;
        return;
    }
    auto const value = object.attribute(request.name);
    if (!value) {
        request.status = kNoAttribute;
        return;
    }
    std::string_view bytes = value->bytes();
    // A text is cut to the buffer, without terminator when it fills it; half a number is useless.
    if (value->form() == ValueForm::text)
        bytes = bytes.substr(0, static_cast<std::size_t>(capacity));
    if (bytes.size() > static_cast<std::size_t>(capacity)) {
        request.status = kBufferTooSmall;
        return;
    }
    // There is a buffer unless its capacity is 0.
    if (!bytes.empty() && request.value != nullptr)
        std::memcpy(request.value, bytes.data(), bytes.size());
    request.size = static_cast<std::int32_t>(bytes.size());
    request.status = 0;
}

void failAll(std::span<DMAttribute> requests) {
    for (auto& request : requests) {
        request.status = kInvalidAttribute;
        request.size = 0;
    }
}

/// A `Client` is the client of the device mapper for one chassis; thread-safe.
class Client final : public DeviceMapperClient {
  public:
    explicit Client(GuardedChassis& chassis) : m_chassis(chassis) {}

    int FindObjects(long parent, int count, DMAttribute* criteria, int* found,
                    long* auids) override {
        if (found == nullptr) return kInvalidRequest;
        int const capacity = *found;
        *found = 0;
        if (count < 0 || capacity < 0 || (criteria == nullptr && count > 0) ||
            (auids == nullptr && capacity > 0))
            return kInvalidRequest;
        std::span const wanted(criteria, static_cast<std::size_t>(count));
        auto const isWhole = [](auto const& each) { return isSound(each, each.size); };
        if (!std::ranges::all_of(wanted, isWhole)) return kInvalidRequest;
        return m_chassis.read([&](Chassis const* chassis) {
            if (chassis == nullptr) return kNoChassis;
            ChassisObject const* const object = chassis->find(parent);
            if (object == nullptr) return kUnknownObject;
            for (std::int32_t const handle : object->children) {
                if (*found == capacity) break;
                ChassisObject const& child = *chassis->find(handle);
                auto const holds = [&child](auto const& each) { return matches(child, each); };
                if (std::ranges::all_of(wanted, holds)) auids[(*found)++] = handle;
            }
            return 0;
        });
    }

    int Reserved3() override { return kInvalidRequest; }

    int GetRootObject(long* auid) override {
        if (auid == nullptr) return kInvalidRequest;
        return m_chassis.read([&](Chassis const* chassis) {
            if (chassis == nullptr) return kNoChassis;
            *auid = Chassis::kRootHandle;
            return 0;
        });
    }

    int FindObjectByName(char* name, long* auid) override {
        if (name == nullptr || auid == nullptr) return kInvalidRequest;
        return m_chassis.read([&](Chassis const* chassis) {
            if (chassis == nullptr) return kNoChassis;
            ChassisObject const* const object = chassis->firstNamed(name);
            if (object == nullptr) return kUnknownObject;
            *auid = object->handle;
            return 0;
        });
    }

    int GetAttributes(long auid, int count, DMAttribute* requests) override {
        if (count < 0 || (requests == nullptr && count > 0)) return kInvalidRequest;
        std::span const wanted(requests, static_cast<std::size_t>(count));
        return m_chassis.read([&](Chassis const* chassis) {
            // Clients ask this every second. It is found without the board's object, which lies
            // elsewhere in memory.
            if (chassis != nullptr && isForLines(wanted))
                if (BoardLines const* const lines = chassis->linesOf(auid)) {
                    DMAttribute& request = wanted.front();
                    request.status =
                        readLines(request, request.size, lines->all, chassis->lineTime());
                    return request.status == 0 ? 0 : kDMSomeAttributesFailed;
                }
            ChassisObject const* const object = chassis == nullptr ? nullptr : chassis->find(auid);
            if (object == nullptr) {
                failAll(wanted);
                return chassis == nullptr ? kNoChassis : kUnknownObject;
            }
            int result = 0;
            for (auto& request : wanted) {
                readInto(request, *object, *chassis);
                if (request.status != 0) result = kDMSomeAttributesFailed;
            }
            return result;
        });
    }

  private:
    GuardedChassis& m_chassis;
};

} // namespace

std::unique_ptr<DeviceMapperClient> makeDeviceMapper(GuardedChassis& chassis) {
    return std::make_unique<Client>(chassis);
}

} // namespace kvlsim
