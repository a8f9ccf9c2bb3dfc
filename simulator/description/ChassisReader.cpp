// SPDX-License-Identifier: BSD-2-Clause
// Reads chassis and boards from their description.
#include "simulator/description/ChassisReader.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <memory>
#include <optional>
#include <span>

#include "simulator/base/Text.h"
#include "simulator/chassis/AttributeSchema.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/chassis/ProcessDraft.h"
#include "simulator/description/AttributeReader.h"
#include "simulator/description/ChannelsReader.h"
#include "simulator/description/Description.h"
#include "simulator/description/DescriptionChecks.h"
#include "simulator/description/LineReader.h"
#include "simulator/description/ProcessReader.h"
#include "simulator/description/StoreReader.h"

namespace kvlsim {

namespace {

using Form = Description::Form;
using Keys = std::span<std::string_view const>;

constexpr std::array<std::string_view, 3> kChassisKeys = {"boards", "store", "processes"};
constexpr std::array<std::string_view, 4> kBoardKeys = {"handle", "attributes", "devices",
                                                        "processors"};
constexpr std::array<std::string_view, 6> kDeviceKeys = {"handle",     "type", "attributes",
                                                         "subdevices", "line", "channels"};
constexpr std::array<std::string_view, 3> kSubDeviceKeys = {"handle", "type", "attributes"};
constexpr std::array<std::string_view, 2> kProcessorKeys = {"handle", "attributes"};

constexpr std::size_t kMaxFileSize = std::size_t(32) << 20;

std::int32_t readHandle(Description const& object, ObjectKind kind) {
    std::string const what = nameOf(kind);
    Description const* const handle = object.find("handle");
    if (handle == nullptr)
        throw ChassisError(object.line,
                           what + " without handle; give it a \"handle:\" of its own, 1 or more");
    auto const number = handle->integer();
    if (!number || *number < 1 || *number >= Chassis::kRootHandle)
        throw ChassisError(handle->line, "the handle of a " + what + " cannot be " +
                                             handle->words() + "; write a number from 1 to " +
                                             std::to_string(Chassis::kRootHandle - 1));
    return static_cast<std::int32_t>(*number);
}

std::int32_t readType(Description const& object, std::string const& what,
                      std::span<std::int32_t const> known) {
    Description const* const type = object.find("type");
    auto const number = type == nullptr ? std::nullopt : type->integer();
    if (number && std::ranges::find(known, *number) != known.end())
        return static_cast<std::int32_t>(*number);
    std::string list;
    for (std::int32_t const code : known)
        appendToList(list, std::to_string(code));
    if (type == nullptr)
        throw ChassisError(object.line, what + " has no type; give it one of " + list);
    throw ChassisError(type->line,
                       what + " cannot be of type " + type->words() + "; choose one of " + list);
}

/// "device 101", or "a device" where the handle is missing.
std::string wordsFor(ObjectDraft const& object) {
    return object.handle > 0
               ? std::string(nameOf(object.kind)) + ' ' + std::to_string(object.handle)
               : std::string("a ") + nameOf(object.kind);
}

/// Handle, attributes and TYPE, which every kind of object has. The handle is 0 where it is wrong.
ObjectDraft readObject(Description const& object, ObjectKind kind, Keys keys, Findings& findings) {
    requireMap(object, std::string("a ") + nameOf(kind), "handle:");
    ObjectDraft draft;
    draft.kind = kind;
    draft.line = object.line;
    findings.part([&] { draft.handle = readHandle(object, kind); });
    std::string const what = wordsFor(draft);
    findUnknownKeys(object, what, keys, findings);
    switch (kind) {
    case ObjectKind::device:
        findings.part([&] { draft.type = readType(object, what, deviceTypes()); });
        break;
    case ObjectKind::subDevice:
        findings.part([&] { draft.type = readType(object, what, subDeviceTypes()); });
        break;
    case ObjectKind::processor:
        draft.type = kProcessorType;
        break;
    default:
        draft.type = kBoardType;
        break;
    }
    Description const* const attributes = object.find("attributes");
    if (attributes != nullptr && attributes->form != Form::nothing)
        findings.part([&] { draft.attributes = readAttributes(*attributes, findings); });
    draft.attributes.emplace("TYPE", AttributeValue::number(draft.type));
    return draft;
}

/// What a device may have beyond other objects.
void readDeviceParts(Description const& item, ObjectDraft& device, Findings& findings) {
    std::string const what = wordsFor(device);
    Description const* const channels = item.find("channels");
    if (channels != nullptr)
        findings.part([&] { device.channels = readChannels(*channels, what); });
    Description const* const line = item.find("line");
    if (line == nullptr) return;
    device.ds1Line = readLine(*line, what);
    auto const type = AttributeValue::number(static_cast<std::int32_t>(device.ds1Line->type));
    auto const [attribute, isNew] = device.attributes.emplace(kDS1LineType, type);
    AttributeValue const& written = attribute->second;
    std::string const ofType = "the line of " + what + " is of type " +
                               std::string(nameOf(device.ds1Line->type)) + " (" +
                               std::to_string(type.asNumber()) + ")";
    bool const empty = written.form() == ValueForm::empty;
    if (!isNew && (empty || written.asNumber() != type.asNumber()))
        throw ChassisError(line->line, ofType + ", but its LINE_TYPE is " +
                                           (empty ? "empty" : std::to_string(written.asNumber())) +
                                           "; remove LINE_TYPE from the attributes");
    bool const isT1 =
        device.ds1Line->type == DS1LineType::esf || device.ds1Line->type == DS1LineType::d4;
    if (isT1 && device.channels && device.channels->bearers() > kMaxT1Bearers)
        throw ChassisError(channels->line, ofType + ", which carries at most " +
                                               std::to_string(kMaxT1Bearers) + " channels, not " +
                                               std::to_string(device.channels->bearers()));
}

void readChildren(Description const& parent, std::string_view key, ObjectKind kind, Keys keys,
                  ObjectDraft& into, Findings& findings) {
    Description const* const list = parent.find(key);
    if (list == nullptr || list->form == Form::nothing) return;
    if (list->form != Form::list)
        throw ChassisError(list->line,
                           std::string(key) + " cannot be " + list->words() +
                               "; write a list, each entry beginning with \"- handle:\"");
    for (auto const& item : list->items) {
        findings.part([&] {
            ObjectDraft child = readObject(item, kind, keys, findings);
            if (kind == ObjectKind::device) {
                findings.part([&] { readDeviceParts(item, child, findings); });
                findings.part([&] {
                    readChildren(item, "subdevices", ObjectKind::subDevice, kSubDeviceKeys, child,
                                 findings);
                });
            }
            into.children.push_back(std::move(child));
        });
    }
}

/// Where a handle was written.
struct HandlePlace {
    ObjectKind kind;
    int line;
};
using HandlePlaces = std::unordered_map<std::int32_t, HandlePlace>;

void refuseSharedHandle(ObjectDraft const& object, HandlePlaces& seen) {
    auto const [first, isNew] = seen.emplace(object.handle, HandlePlace{object.kind, object.line});
    if (isNew) return;
    HandlePlace const& place = first->second;
    std::string const where =
        place.line > 0 ? " of line " + std::to_string(place.line) + " of the file" : "";
    throw ChassisError(object.line, "handle " + std::to_string(object.handle) + " is already the " +
                                        nameOf(place.kind) + where +
                                        "; give every object a handle of its own");
}

/// Two objects of one description with one handle: the second is refused and left out, and so is an
/// object whose handle is wrong.
void refuseSharedHandles(std::vector<ObjectDraft>& objects, HandlePlaces& seen,
                         Findings& findings) {
    std::vector<ObjectDraft> good;
    for (auto& object : objects) {
        bool fits = false;
        if (object.handle > 0)
            findings.part([&] {
                refuseSharedHandle(object, seen);
                fits = true;
            });
        refuseSharedHandles(object.children, seen, findings);
        if (fits) good.push_back(std::move(object));
    }
    objects = std::move(good);
}

/// Is it written under the attributes, rightly or not?
bool writesAttribute(Description const& object, std::string_view name) {
    Description const* const attributes = object.find("attributes");
    return attributes != nullptr && attributes->find(name) != nullptr;
}

void refuseMissingSerial(Description const& description, ObjectDraft const& board) {
    auto const serial = board.attributes.find(std::string_view("SERIAL_NUMBER"));
    if (serial == board.attributes.end() && writesAttribute(description, "SERIAL_NUMBER"))
        return; // refused already
    if (serial == board.attributes.end() || serial->second.form() != ValueForm::text ||
        serial->second.asText().empty())
        throw ChassisError(description.line,
                           wordsFor(board) + " has no SERIAL_NUMBER; give it one under attributes");
}

ObjectDraft readBoardOnly(Description const& description, std::string const& date,
                          Findings& findings) {
    ObjectDraft board = readObject(description, ObjectKind::board, kBoardKeys, findings);
    findings.part([&] { refuseMissingSerial(description, board); });
    board.attributes.emplace("BOARD_CONDITION", AttributeValue::number(static_cast<std::int32_t>(
                                                    BoardCondition::started)));
    board.attributes.emplace("BOARD_PRESENT", AttributeValue::number(1));
    board.attributes.emplace("STATE_CHANGE_DATE", AttributeValue::text(date));
    findings.part([&] {
        readChildren(description, "devices", ObjectKind::device, kDeviceKeys, board, findings);
    });
    findings.part([&] {
        readChildren(description, "processors", ObjectKind::processor, kProcessorKeys, board,
                     findings);
    });
    return board;
}

/// Reads the boards one after the other, so that each draft uses the memory of the one before.
/// Drafts that existed at once would leave gaps in memory too small for most later allocations.
void readBoards(Description const& list, Chassis& chassis, Findings& findings) {
    if (list.form == Form::nothing) return;
    if (list.form != Form::list)
        throw ChassisError(list.line,
                           "boards cannot be " + list.words() +
                               "; write a list, each board beginning with \"- handle:\"");
    std::string const date = currentDate();
    HandlePlaces seen;
    for (auto const& item : list.items) {
        std::vector<ObjectDraft> boards;
        findings.part([&] { boards.push_back(readBoardOnly(item, date, findings)); });
        refuseSharedHandles(boards, seen, findings);
        for (auto& board : boards)
            findings.part([&] { chassis.insertBoard(std::move(board)); });
    }
}

} // namespace

Chassis readChassis(Description const& file, Findings& findings) {
    if (file.form == Form::nothing)
        throw ChassisError(1, "there is nothing in it; begin the chassis with \"boards:\"");
    requireMap(file, "a chassis", "boards:");
    findUnknownKeys(file, "the chassis", kChassisKeys, findings);
    Chassis chassis;
    findings.part([&] {
        Description const* const list = file.find("boards");
        if (list == nullptr)
            throw ChassisError(file.line, "no boards; begin the chassis with \"boards:\"");
        readBoards(*list, chassis, findings);
    });
    if (Description const* const store = file.find("store"))
        findings.part([&] {
            chassis.setStore(readStore(*store, findings));
            // A record's family may be that of a board which is left out.
            if (!findings.hasErrors()) refuseHomelessBoards(chassis.store(), chassis, findings);
        });
    if (Description const* const processes = file.find("processes"))
        findings.part([&] { chassis.setProcesses(readProcesses(*processes, findings)); });
    return chassis;
}

ObjectDraft readBoard(Description const& description) {
    Findings findings;
    return *readBoard(description, findings); // errors are thrown
}

std::optional<ObjectDraft> readBoard(Description const& description, Findings& findings) {
    std::vector<ObjectDraft> boards;
    boards.push_back(readBoardOnly(description, currentDate(), findings));
    HandlePlaces seen;
    refuseSharedHandles(boards, seen, findings);
    if (findings.hasErrors()) return std::nullopt;
    return std::move(boards.front());
}

std::optional<Chassis> readChassis(std::string const& yamlText, Findings& findings) {
    std::optional<Chassis> chassis;
    findings.part([&] { chassis = readChassis(describeYaml(yamlText, findings), findings); });
    if (findings.hasErrors()) chassis.reset();
    return chassis;
}

Chassis readChassis(std::string const& yamlText) {
    return readChassis(describeYaml(yamlText));
}

Chassis readChassis(Description const& file) {
    Findings findings;
    return readChassis(file, findings);
}

std::string readChassisFile(std::string const& path) {
    auto const fail = [](int error) {
        throw ChassisError(0, std::string("cannot be read (") + std::strerror(error) +
                                  "); name a chassis file that exists and is readable");
    };
    std::unique_ptr<std::FILE, int (*)(std::FILE*)> const file(std::fopen(path.c_str(), "re"),
                                                               &std::fclose);
    if (file == nullptr) fail(errno);
    std::string text;
    std::array<char, 65536> block{};
    while (std::size_t const size = std::fread(block.data(), 1, block.size(), file.get())) {
        text.append(block.data(), size);
        if (text.size() > kMaxFileSize)
            throw ChassisError(0, "too large; a chassis file has at most 32 MiB");
    }
    if (std::ferror(file.get()) != 0) fail(errno);
    return text;
}

std::string currentDate() {
    static constexpr std::array<char const*, 7> days = {"Sun", "Mon", "Tue", "Wed",
                                                        "Thu", "Fri", "Sat"};
    static constexpr std::array<char const*, 12> months = {
        "Jan", "Feb", "Mar", "Apr", "May", "Jun", "Jul", "Aug", "Sep", "Oct", "Nov", "Dec"};
    std::time_t const now = std::time(nullptr);
    std::tm local{};
    localtime_r(&now, &local);
    // Not strftime: the platform's names are English whatever locale the process runs in.
    std::array<char, 80> text{};
    std::snprintf(text.data(), text.size(), "%s %s %2d %02d:%02d:%02d %d",
                  days[static_cast<std::size_t>(local.tm_wday)],
                  months[static_cast<std::size_t>(local.tm_mon)], local.tm_mday, local.tm_hour,
                  local.tm_min, local.tm_sec, local.tm_year + 1900);
    return text.data();
}

} // namespace kvlsim
