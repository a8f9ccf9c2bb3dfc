// SPDX-License-Identifier: BSD-2-Clause
// Reads the part "store" of a chassis and the fields of records.
#include <algorithm>
#include <array>
#include <map>

#include "simulator/base/Text.h"
#include "simulator/chassis/ChassisError.h"
#include "simulator/description/AttributeReader.h"
#include "simulator/description/Description.h"
#include "simulator/description/DescriptionChecks.h"
#include "simulator/description/StoreReader.h"

namespace kvlsim {

namespace {

using Form = Description::Form;

constexpr std::array<std::string_view, 2> kStoreKeys = {"families", "boards"};
constexpr std::array<std::string_view, 3> kBoardKeys = {"serial", "family", "fields"};

/// What a text of a record may be: it has `size` bytes there, the terminating NUL included.
void refuseUnfit(std::string const& what, std::string_view text, int size, int line) {
    if (text.empty()) throw ChassisError(line, what + " is empty; write one");
    if (text.size() >= static_cast<std::size_t>(size))
        throw ChassisError(line, what + " has " + std::to_string(text.size()) + " bytes; " +
                                     std::to_string(size - 1) + " is the most");
    if (std::ranges::any_of(text, isControl))
        throw ChassisError(line, what + " " + inQuotes(text) +
                                     " contains control characters; remove them");
}

std::string readText(std::string const& what, Description const& value) {
    if (!value.isScalar() || value.readsAsInteger())
        throw ChassisError(value.line, what + " cannot be " + value.words() +
                                           "; it is a text, write it in quotes");
    return value.scalar;
}

FieldValue readField(RecordField const& field, Description const& value) {
    std::string const name(field.name);
    if (field.kind == FieldKind::text) {
        std::string text = readText(name, value);
        if (text.size() >= static_cast<std::size_t>(field.length))
            throw ChassisError(value.line, name + ": a text of " + std::to_string(text.size()) +
                                               " bytes is too long; " +
                                               std::to_string(field.length - 1) + " is the most");
        refuseUnfitText(name, text, value.line);
        return text;
    }
    auto const number = value.integer();
    if (!number || *number < INT32_MIN || *number > UINT32_MAX)
        throw ChassisError(value.line, name + " cannot be " + value.words() +
                                           "; it is a number of 4 bytes, write a decimal or 0x "
                                           "number");
    return static_cast<std::int32_t>(*number);
}

std::vector<std::string> readFamilies(Description const& list) {
    if (list.form != Form::list)
        throw ChassisError(list.line, "families cannot be " + list.words() +
                                          "; write a list of names, such as [NX5, VORN]");
    std::vector<std::string> families;
    for (auto const& item : list.items) {
        std::string const name = readText("a family's name", item);
        refuseUnfitFamily(name, item.line);
        if (std::ranges::find(families, name) != families.end())
            throw ChassisError(item.line,
                               "family " + inQuotes(name) + " is written twice; keep one of them");
        families.push_back(name);
    }
    return families;
}

StoreBoardDraft readRecord(Description const& item) {
    requireMap(item, "a board of the store", "serial:");
    refuseUnknownKeys(item, "a board of the store", kBoardKeys);
    StoreBoardDraft draft;
    draft.line = item.line;
    Description const* const serial = item.find("serial");
    if (serial == nullptr)
        throw ChassisError(item.line, "a board of the store has no serial number; give it "
                                      "\"serial:\"");
    draft.serial = readText("a serial number", *serial);
    refuseUnfitSerial(draft.serial, serial->line);
    if (Description const* const family = item.find("family")) {
        draft.family = readText("a family's name", *family);
        refuseUnfitFamily(draft.family, family->line);
    }
    if (Description const* const fields = item.find("fields")) draft.fields = readFields(*fields);
    return draft;
}

std::vector<StoreBoardDraft> readRecords(Description const& list, Findings& findings) {
    if (list.form != Form::list)
        throw ChassisError(list.line,
                           "the store's boards cannot be " + list.words() +
                               "; write a list, each board beginning with \"- serial:\"");
    std::vector<StoreBoardDraft> boards;
    std::map<std::string, int> lines;
    for (auto const& item : list.items) {
        findings.part([&] {
            StoreBoardDraft board = readRecord(item);
            auto const [first, isNew] = lines.emplace(board.serial, board.line);
            if (!isNew)
                throw ChassisError(board.line, "serial number " + inQuotes(board.serial) +
                                                   " is already that of the record of line " +
                                                   std::to_string(first->second) +
                                                   " of the file; serial numbers must differ");
            boards.push_back(std::move(board));
        });
    }
    return boards;
}

void refuseHomeless(StoreBoardDraft const& draft, StoreDraft const& store, Chassis const& chassis) {
    std::string const family = draft.family.empty()
                                   ? textOf(chassis.boardWithSerial(draft.serial), "FAMILY")
                                   : draft.family;
    if (!fitsAsFamily(family))
        throw ChassisError(draft.line, "record " + inQuotes(draft.serial) +
                                           " has no family; give it \"family:\"");
    if (store.families && std::ranges::find(*store.families, family) == store.families->end())
        throw ChassisError(draft.line, "record " + inQuotes(draft.serial) + " is of family " +
                                           inQuotes(family) +
                                           ", which is not among the store's families; add it "
                                           "there");
}

} // namespace

void refuseUnfitFamily(std::string_view name, int line) {
    refuseUnfit("a family's name", name, kFamilyRecord.size, line);
}

void refuseUnfitSerial(std::string_view serial, int line) {
    refuseUnfit("a serial number", serial, boardFieldNamed("SerialNumber")->length, line);
}

FieldValues readFields(Description const& fields) {
    if (fields.form != Form::map)
        throw ChassisError(fields.line, "fields cannot be " + fields.words() +
                                            "; write one field a line, such as Model: NX5-T1");
    FieldValues values;
    for (auto const& entry : fields.entries) {
        if (entry.key == "SerialNumber")
            throw ChassisError(entry.line, "the serial number is what a record is found by; it "
                                           "cannot be among its fields, remove it");
        RecordField const* const field = boardFieldNamed(entry.key);
        if (field == nullptr) {
            std::string known;
            for (auto const& each : boardFields())
                if (each.name != "SerialNumber")
                    known += (known.empty() ? "" : ", ") + std::string(each.name);
            throw ChassisError(entry.line, "a board's record has no field " + inQuotes(entry.key) +
                                               "; there are " + known);
        }
        values.emplace_back(field, readField(*field, entry.value));
    }
    return values;
}

void refuseHomelessBoards(StoreDraft const& store, Chassis const& chassis, Findings& findings) {
    if (!store.boards) return;
    for (auto const& draft : *store.boards)
        findings.part([&] { refuseHomeless(draft, store, chassis); });
}

StoreDraft readStore(Description const& store, Findings& findings) {
    requireMap(store, "the store", "families:");
    findUnknownKeys(store, "the store", kStoreKeys, findings);
    StoreDraft draft;
    if (Description const* const families = store.find("families"))
        findings.part([&] { draft.families = readFamilies(*families); });
    if (Description const* const boards = store.find("boards"))
        findings.part([&] { draft.boards = readRecords(*boards, findings); });
    return draft;
}

} // namespace kvlsim
