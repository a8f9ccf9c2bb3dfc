// SPDX-License-Identifier: BSD-2-Clause
// The chassis: boards with their devices, sub-devices and processors, found by handle, name or
// serial number; their lines and channels; the descriptions of the attribute store and processes.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <unordered_map>
#include <utility>
#include <vector>

#include "simulator/chassis/AttributeMap.h"
#include "simulator/chassis/Channels.h"
#include "simulator/chassis/LiveLine.h"
#include "simulator/chassis/PackedAttributes.h"
#include "simulator/chassis/ProcessDraft.h"
#include "simulator/chassis/StoreDraft.h"

namespace kvlsim {

enum class ObjectKind : std::uint8_t { root, board, device, subDevice, processor };

/// "board", "device" and so on.
char const* nameOf(ObjectKind kind);

/// An `ObjectDraft` is an object as it is described, with its children, before it enters a chassis.
struct ObjectDraft {
    ObjectKind kind = ObjectKind::board;
    std::int32_t handle = 0;
    std::int32_t type = 0;
    int line = 0;            ///< where it was described; 0 when it came without lines
    AttributeMap attributes; ///< TYPE included
    std::optional<LineDraft> ds1Line;
    std::optional<Channels> channels;
    std::vector<ObjectDraft> children;
};

/// A device that is a line, with its handle.
struct LineOfBoard {
    std::int32_t device = 0;
    LiveLine const* line = nullptr;
};

/// The `BoardLines` are the lines of a board.
struct BoardLines {
    std::int32_t board = 0;       ///< its handle
    std::uint64_t generation = 0; ///< as in `DS1BoardGeneration`
    LiveLine::Time born{}; ///< of the first line; the ages of the others differ by whole seconds
    std::vector<LineOfBoard> all; ///< in the order of the board's children; at least one
};

/// A `ChassisObject` is an object of the chassis: its root, a board, or an object of a board.
struct ChassisObject {
    ObjectKind kind = ObjectKind::root;
    std::int32_t handle = 0;
    std::int32_t parent = 0;
    std::uint64_t order = 0; ///< place in the chassis: objects found first have lower numbers
    PackedAttributes attributes;
    std::vector<std::int32_t> children; ///< in the order of the chassis
    std::unique_ptr<LiveLine> ds1Line;  ///< null: it is no line
    std::unique_ptr<Channels> channels; ///< null: it has no ISDN channels

    std::optional<AttributeValue> attribute(std::string_view name) const {
        return attributes.find(name);
    }
};

/// The text of an attribute; empty when there is no object or no such text.
std::string textOf(ChassisObject const* object, std::string_view attribute);

/// A `Chassis` is the set of all boards with their objects. Unsynchronised: the platform guards it
/// with its lock. An operation that throws has changed nothing.
class Chassis {
  public:
    /// The root object's handle. Objects have handles from 1 to just below it.
    static constexpr std::int32_t kRootHandle = 0x7FFFFFFF;

    /// The most objects of a chassis, its root not counted, and attributes of an object.
    static constexpr std::size_t kMaxObjects = 200'000;
    static constexpr std::size_t kMaxAttributes = 1'000;

    using LineClock = LiveLine::Time();

    Chassis();

    ChassisObject const* find(long handle) const;
    /// The first object of the chassis with this NAME, or null.
    ChassisObject const* firstNamed(std::string_view name) const;
    /// All objects with this NAME, in the order of the chassis.
    std::vector<ChassisObject const*> named(std::string_view name) const;
    ChassisObject const* boardWithSerial(std::string_view serialNumber) const;
    ChassisObject const& root() const { return m_objects.at(kRootHandle); }
    std::size_t boardCount() const { return root().children.size(); }

    /// Adds a board behind the others. Throws ChassisError when a handle or the serial number is
    /// taken, or there would be too many objects.
    void insertBoard(ObjectDraft board);
    /// Requires: the board is there.
    void removeBoard(std::int32_t handle);
    /// Throws ChassisError when this gives a board the serial number of another, or the object too
    /// many attributes.
    /// Requires: the object is there.
    void setAttribute(std::int32_t handle, std::string_view name, AttributeValue const& value);
    /// Returns whether the object had the attribute. Requires: the object is there.
    bool unsetAttribute(std::int32_t handle, std::string_view name);

    /// The clock of the lines; null: the steady clock. All lines begin again as at loading.
    void setLineClock(LineClock* clock);
    /// The time of the clock of the lines.
    LiveLine::Time lineTime() const;
    /// Calls `change(line)`, which may change the line. Requires: the object is a line.
    template <typename Change>
    void changeLine(std::int32_t handle, Change&& change) {
        ChassisObject const& object = m_objects.at(handle);
        BoardLines& lines = m_boardsWithLines[placeOfLines(object.parent)];
        lines.generation = 0; // and stays so if the change throws
        std::forward<Change>(change)(*object.ds1Line);
        renew(lines);
    }
    /// The boards that have lines, in the order of their handles.
    std::vector<BoardLines> const& boardsWithLines() const { return m_boardsWithLines; }
    /// Null: there is no such board, or it has no lines.
    BoardLines const* linesOf(long board) const;
    /// The channels of an object, which the caller may change. Requires: the object has channels.
    Channels& channels(std::int32_t handle) { return *m_objects.at(handle).channels; }

    /// The contents of the attribute store when it is created.
    StoreDraft const& store() const { return m_store; }
    void setStore(StoreDraft store) { m_store = std::move(store); }
    /// The processes of the runtime library; none: the process itself.
    std::optional<std::vector<ProcessDraft>> const& processes() const { return m_processes; }
    void setProcesses(std::vector<ProcessDraft> processes) { m_processes = std::move(processes); }

  private:
    void refuseTaken(ObjectDraft const& draft) const;
    void refuseSerial(std::string_view serialNumber, std::int32_t forBoard, int line) const;
    /// `now`: the time of the clock of the lines, which is the same for all lines of a board.
    void add(ObjectDraft draft, std::int32_t parent, LiveLine::Time now);
    void discard(std::int32_t handle);
    void index(ChassisObject const& object, std::string_view attribute);
    void unindex(ChassisObject const& object, std::string_view attribute);
    std::size_t placeOfLines(std::int32_t board) const;
    void gatherLines(ChassisObject const& board);
    static void renew(BoardLines& lines);

    using Named = std::set<std::pair<std::uint64_t, std::int32_t>>;

    std::unordered_map<std::int32_t, ChassisObject> m_objects;
    std::unordered_map<std::string, Named, TextHash, std::equal_to<>> m_byName;
    std::unordered_map<std::string, std::int32_t, TextHash, std::equal_to<>> m_bySerial;
    std::vector<BoardLines> m_boardsWithLines;
    std::uint64_t m_nextOrder = 0;
    LineClock* m_lineClock = nullptr;
    StoreDraft m_store;
    std::optional<std::vector<ProcessDraft>> m_processes;
};

} // namespace kvlsim
