// SPDX-License-Identifier: BSD-2-Clause
// The attribute store's record types and the fields of a board's record.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>
#include <variant>

namespace kvlsim {

/// A `RecordType` is a type of record; the root's has no parent.
struct RecordType {
    std::string_view name;
    std::string_view parent;
    int size; ///< bytes
};

inline constexpr RecordType kRootRecord{"root", "", 0};
inline constexpr RecordType kFamilyRecord{"Family", "root", 30};
inline constexpr RecordType kBoardRecord{"Board", "Family", 2128};

/// Null when there is no such type.
RecordType const* recordTypeNamed(std::string_view name);

/// The name of the layout of a board's record, which is its Version.
inline constexpr std::string_view kBoardLayout = "BW1.0_BCI_Struct";

/// The families that every store has.
std::span<std::string_view const> knownFamilies();

enum class FieldKind : std::uint8_t { text, number };

/// A `RecordField` is a field of the board's record. A text has at most `length` - 1 characters and
/// a NUL; a number is signed, in host byte order.
struct RecordField {
    std::string_view name;
    int offset;
    int length;
    FieldKind kind;
    std::string_view attribute; ///< the board's attribute that it is by default; empty: none
};

std::span<RecordField const> boardFields();
/// Null when there is no such field.
RecordField const* boardFieldNamed(std::string_view name);

using FieldValue = std::variant<std::int32_t, std::string>;

/// A `BoardRecord` is the bytes of one board's record.
class BoardRecord {
  public:
    BoardRecord() : m_bytes(static_cast<std::size_t>(kBoardRecord.size), '\0') {}
    /// Requires: as many bytes as a board's record has.
    explicit BoardRecord(std::string bytes) : m_bytes(std::move(bytes)) {}

    /// A text that is too long is cut. Requires: a value of the field's kind.
    void set(RecordField const& field, FieldValue const& value);
    /// A text up to its first NUL, at most the whole field.
    FieldValue get(RecordField const& field) const;
    std::string serialNumber() const;

    std::string const& bytes() const { return m_bytes; }

  private:
    std::string m_bytes;
};

/// A family's name fits in its record; a board's FAMILY may be longer.
bool fitsAsFamily(std::string_view name);
/// A family's record. Requires: a name that fits.
std::string familyRecord(std::string_view name);
/// The name that a family's record holds.
std::string familyName(std::string_view record);

} // namespace kvlsim
