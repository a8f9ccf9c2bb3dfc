// SPDX-License-Identifier: BSD-2-Clause
// What a new attribute store holds.
#include "simulator/store/StoreContents.h"

#include <algorithm>

#include "simulator/chassis/Chassis.h"

namespace kvlsim {

namespace {

/// -1 when it is missing or no number.
std::int32_t numberOf(ChassisObject const* board, std::string_view name) {
    if (board == nullptr) return -1;
    auto const value = board->attribute(name);
    if (!value || value->form() == ValueForm::text || value->form() == ValueForm::descriptor)
        return -1;
    return value->asNumber();
}

void addFamily(std::vector<std::string>& families, std::string const& name) {
    if (std::ranges::find(families, name) == families.end()) families.push_back(name);
}

} // namespace

StoreBoard makeRecord(StoreBoardDraft const& draft, ChassisObject const* board) {
    StoreBoard made;
    made.family = draft.family.empty() ? textOf(board, "FAMILY") : draft.family;
    for (auto const& field : boardFields()) {
        if (field.kind == FieldKind::text)
            made.record.set(field, textOf(board, field.attribute));
        else
            made.record.set(field, numberOf(board, field.attribute));
    }
    made.record.set(*boardFieldNamed("Version"), std::string(kBoardLayout));
    made.record.set(*boardFieldNamed("SerialNumber"), draft.serial);
    for (auto const& [field, value] : draft.fields)
        made.record.set(*field, value);
    return made;
}

StoreContents contentsFor(Chassis const& chassis) {
    StoreDraft const& store = chassis.store();
    StoreContents contents;
    if (store.boards) {
        for (auto const& draft : *store.boards)
            contents.boards.push_back(makeRecord(draft, chassis.boardWithSerial(draft.serial)));
    } else {
        for (std::int32_t const handle : chassis.root().children) {
            ChassisObject const* const board = chassis.find(handle);
            StoreBoardDraft draft;
            draft.serial = textOf(board, "SERIAL_NUMBER");
            contents.boards.push_back(makeRecord(draft, board));
        }
    }
    if (store.families) {
        contents.families = *store.families;
    } else {
        contents.families.assign(knownFamilies().begin(), knownFamilies().end());
        for (auto const& board : contents.boards)
            if (fitsAsFamily(board.family)) addFamily(contents.families, board.family);
    }
    std::erase_if(contents.boards, [&](StoreBoard const& board) {
        return std::ranges::find(contents.families, board.family) == contents.families.end();
    });
    return contents;
}

} // namespace kvlsim
