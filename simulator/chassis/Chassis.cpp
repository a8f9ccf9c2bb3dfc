// SPDX-License-Identifier: BSD-2-Clause
// The chassis: its objects and the indexes over them.
#include "simulator/chassis/Chassis.h"

#include <algorithm>
#include <atomic>
#include <chrono>

#include "simulator/base/Text.h"
#include "simulator/chassis/ChassisError.h"

namespace kvlsim {

namespace {

constexpr std::string_view kName = "NAME";
constexpr std::string_view kSerialNumber = "SERIAL_NUMBER";

std::size_t countObjects(ObjectDraft const& draft) {
    std::size_t count = 1;
    for (auto const& child : draft.children)
        count += countObjects(child);
    return count;
}

/// A generation that no lines of any chassis of this process have had.
std::uint64_t nextGeneration() {
    static std::atomic<std::uint64_t> last{0};
    return ++last;
}

std::optional<AttributeValue> textAttribute(ChassisObject const& object, std::string_view name) {
    std::optional<AttributeValue> value = object.attribute(name);
    if (value && value->form() != ValueForm::text) value.reset();
    return value;
}

} // namespace

char const* nameOf(ObjectKind kind) {
    switch (kind) {
    case ObjectKind::root:
        return "root";
    case ObjectKind::board:
        return "board";
    case ObjectKind::device:
        return "device";
    case ObjectKind::subDevice:
        return "sub-device";
    case ObjectKind::processor:
        return "processor";
    }
    return "object";
}

std::string textOf(ChassisObject const* object, std::string_view attribute) {
    if (object == nullptr) return "";
    auto const value = textAttribute(*object, attribute);
    return value ? std::string(value->asText()) : "";
}

Chassis::Chassis() {
    ChassisObject root;
    root.handle = kRootHandle;
    m_objects.emplace(kRootHandle, std::move(root));
}

ChassisObject const* Chassis::find(long handle) const {
    auto const narrow = static_cast<std::int32_t>(handle);
    if (narrow != handle) return nullptr; // a long may have 8 bytes, no handle has
    auto const found = m_objects.find(narrow);
    return found == m_objects.end() ? nullptr : &found->second;
}

ChassisObject const* Chassis::firstNamed(std::string_view name) const {
    auto const found = m_byName.find(name);
    return found == m_byName.end() ? nullptr : find(found->second.begin()->second);
}

std::vector<ChassisObject const*> Chassis::named(std::string_view name) const {
    std::vector<ChassisObject const*> objects;
    if (auto const found = m_byName.find(name); found != m_byName.end())
        for (auto const& [order, handle] : found->second)
            objects.push_back(find(handle));
    return objects;
}

ChassisObject const* Chassis::boardWithSerial(std::string_view serialNumber) const {
    auto const found = m_bySerial.find(serialNumber);
    return found == m_bySerial.end() ? nullptr : find(found->second);
}

void Chassis::insertBoard(ObjectDraft board) {
    refuseTaken(board);
    if (m_objects.size() - 1 + countObjects(board) > kMaxObjects)
        throw ChassisError(board.line, "board " + std::to_string(board.handle) +
                                           " is too much: a chassis has at most " +
                                           std::to_string(kMaxObjects) +
                                           " boards, devices, sub-devices and processors");
    if (auto const serial = board.attributes.find(kSerialNumber);
        serial != board.attributes.end() && serial->second.form() == ValueForm::text)
        refuseSerial(serial->second.asText(), board.handle, board.line);
    std::int32_t const handle = board.handle;
    add(std::move(board), kRootHandle, lineTime());
    gatherLines(m_objects.at(handle));
}

void Chassis::removeBoard(std::int32_t handle) {
    std::erase(m_objects.at(kRootHandle).children, handle);
    if (linesOf(handle) != nullptr)
        m_boardsWithLines.erase(m_boardsWithLines.begin() +
                                static_cast<std::ptrdiff_t>(placeOfLines(handle)));
    discard(handle);
}

void Chassis::setAttribute(std::int32_t handle, std::string_view name,
                           AttributeValue const& value) {
    ChassisObject& object = m_objects.at(handle);
    if (object.kind == ObjectKind::board && name == kSerialNumber &&
        value.form() == ValueForm::text)
        refuseSerial(value.asText(), handle, 0);
    if (object.attributes.size() >= kMaxAttributes && !object.attribute(name))
        throw ChassisError(0, std::string(nameOf(object.kind)) + " " + std::to_string(handle) +
                                  " has " + std::to_string(kMaxAttributes) +
                                  " attributes, which is the most; unset one first");
    unindex(object, name);
    object.attributes.set(name, value);
    index(object, name);
}

bool Chassis::unsetAttribute(std::int32_t handle, std::string_view name) {
    ChassisObject& object = m_objects.at(handle);
    unindex(object, name);
    return object.attributes.unset(name);
}

void Chassis::setLineClock(LineClock* clock) {
    m_lineClock = clock;
    LiveLine::Time const now = lineTime();
    for (auto& [handle, object] : m_objects)
        if (object.ds1Line) object.ds1Line->restart(now);
    for (BoardLines& lines : m_boardsWithLines)
        renew(lines);
}

LiveLine::Time Chassis::lineTime() const {
    return m_lineClock != nullptr ? m_lineClock()
                                  : std::chrono::steady_clock::now().time_since_epoch();
}

void Chassis::refuseTaken(ObjectDraft const& draft) const {
    if (auto const* taken = find(draft.handle))
        throw ChassisError(draft.line, "handle " + std::to_string(draft.handle) +
                                           " is taken by another " + nameOf(taken->kind) +
                                           "; choose a free one");
    for (auto const& child : draft.children)
        refuseTaken(child);
}

void Chassis::refuseSerial(std::string_view serialNumber, std::int32_t forBoard, int line) const {
    ChassisObject const* const other = boardWithSerial(serialNumber);
    if (other == nullptr || other->handle == forBoard) return;
    throw ChassisError(line, "board " + std::to_string(forBoard) + " cannot have SERIAL_NUMBER " +
                                 inQuotes(serialNumber) + ": board " +
                                 std::to_string(other->handle) +
                                 " has it; serial numbers must differ");
}

void Chassis::add(ObjectDraft draft, std::int32_t parent, LiveLine::Time now) {
    ChassisObject object;
    object.kind = draft.kind;
    object.handle = draft.handle;
    object.parent = parent;
    object.order = m_nextOrder++;
    object.attributes = PackedAttributes(draft.attributes);
    draft.attributes.clear();
    if (draft.ds1Line) object.ds1Line = std::make_unique<LiveLine>(std::move(*draft.ds1Line), now);
    if (draft.channels) object.channels = std::make_unique<Channels>(std::move(*draft.channels));
    ChassisObject const& added = m_objects.emplace(draft.handle, std::move(object)).first->second;
    m_objects.at(parent).children.push_back(draft.handle);
    index(added, kName);
    index(added, kSerialNumber);
    for (auto& child : draft.children)
        add(std::move(child), draft.handle, now);
}

BoardLines const* Chassis::linesOf(long board) const {
    auto const narrow = static_cast<std::int32_t>(board);
    std::size_t const place = placeOfLines(narrow);
    if (narrow != board || place == m_boardsWithLines.size()) return nullptr;
    BoardLines const& lines = m_boardsWithLines[place];
    return lines.board == narrow ? &lines : nullptr;
}

/// The place of a board in the list of boards with lines; if it has none, where it would be
/// entered.
std::size_t Chassis::placeOfLines(std::int32_t board) const {
    auto const place = std::ranges::lower_bound(m_boardsWithLines, board, {}, &BoardLines::board);
    return static_cast<std::size_t>(place - m_boardsWithLines.begin());
}

void Chassis::gatherLines(ChassisObject const& board) {
    BoardLines lines;
    lines.board = board.handle;
    for (std::int32_t const child : board.children)
        if (auto const& line = m_objects.at(child).ds1Line)
            lines.all.push_back({child, line.get()});
    if (lines.all.empty()) return;
    renew(lines);
    auto const place = static_cast<std::ptrdiff_t>(placeOfLines(board.handle));
    m_boardsWithLines.insert(m_boardsWithLines.begin() + place, std::move(lines));
}

/// Gives a board's lines a new generation. To be called after each change of one of them.
void Chassis::renew(BoardLines& lines) {
    bool const isSteady =
        std::ranges::all_of(lines.all, [](auto const& each) { return each.line->isSteady(); });
    lines.generation = isSteady ? nextGeneration() : 0;
    lines.born = lines.all.front().line->born();
}

void Chassis::discard(std::int32_t handle) {
    ChassisObject const& object = m_objects.at(handle);
    for (std::int32_t const child : object.children)
        discard(child);
    unindex(object, kName);
    unindex(object, kSerialNumber);
    m_objects.erase(handle);
}

void Chassis::index(ChassisObject const& object, std::string_view attribute) {
    auto const text = textAttribute(object, attribute);
    if (!text) return;
    if (attribute == kName)
        m_byName[std::string(text->asText())].emplace(object.order, object.handle);
    else if (attribute == kSerialNumber && object.kind == ObjectKind::board)
        m_bySerial.insert_or_assign(std::string(text->asText()), object.handle);
}

void Chassis::unindex(ChassisObject const& object, std::string_view attribute) {
    auto const text = textAttribute(object, attribute);
    if (!text) return;
    if (attribute == kName) {
        auto const found = m_byName.find(text->asText());
        found->second.erase({object.order, object.handle});
        if (found->second.empty()) m_byName.erase(found);
    } else if (attribute == kSerialNumber && object.kind == ObjectKind::board) {
        m_bySerial.erase(m_bySerial.find(text->asText()));
    }
}

} // namespace kvlsim
