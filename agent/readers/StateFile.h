// SPDX-License-Identifier: BSD-2-Clause
// A file of the persistent directory that keeps what must survive a restart.
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "agent/readers/Database.h"
#include "agent/rows/Persistence.h"

namespace kvloamd {

/// A `StatePart` is data that a `StateFile` keeps in tables of its own.
///
/// The data in memory is what counts: once `load` has been called, the file only follows it.
class StatePart {
  public:
    /// Checks the part's tables and reads them; those that are missing are empty. The data of a
    /// former call is dropped. Throws `DatabaseDamaged`.
    virtual void load(Database& database) = 0;
    /// Creates the part's tables where they are missing.
    virtual void createTables(Database& database) = 0;
    /// Whether something is in memory that the file does not have yet.
    virtual bool hasChanges() const = 0;
    virtual void writeChanges(Database& database) = 0;
    /// Replaces the contents of the part's tables by the data in memory.
    virtual void writeAll(Database& database) = 0;
    /// What `writeChanges` or `writeAll` wrote is on disk.
    virtual void written() = 0;

  protected:
    ~StatePart() = default;
};

/// A `StateFile` is an SQLite file that keeps indices and settings across restarts.
///
/// It never blocks the agent and never ends its service:
/// - A write that fails is retried by every later `save`, with everything that has changed
///   meanwhile. The log says when writing begins to fail and when it works again.
/// - A file that another process has locked is waited for; `contentsKnown` is false meanwhile.
/// - A damaged file, or another program's, is renamed to `<name>.damaged-<date>` and begun anew
///   from memory.
/// - A file that a newer version of the agent has written is left alone.
///
/// Unsynchronised.
class StateFile {
  public:
    /// How long the start waits for another process to unlock the file.
    static constexpr std::chrono::milliseconds kPatience{5000};

    /// `path` is empty: nothing is kept, which is not logged. `things`: what the file is about,
    /// for the log, such as "interfaces".
    StateFile(std::string path, std::string things, std::chrono::milliseconds patience = kPatience);

    /// `part` outlives the file's last operation. Before `open`.
    void add(StatePart& part) { m_parts.push_back(&part); }
    /// Reads the file into its parts, and creates it if it is missing.
    void open();
    /// Writes what has changed. Does not wait for a locked file.
    void save();

    /// False while the file is locked and has not been read yet: nothing that depends on its
    /// contents may be decided.
    bool contentsKnown() const { return m_contents != Contents::Awaited; }
    Persistence state() const { return m_state; }

  private:
    enum class Contents {
        Awaited,   ///< the file has not been read yet because it is locked
        Known,     ///< memory has everything that the file has
        Unreadable ///< the file could not be read, so memory began empty
    };

    void tryOpen(std::chrono::milliseconds patience);
    /// Calls `use`, and does what its faults require.
    void guard(std::function<void()> const& use);
    void openOnce(std::chrono::milliseconds patience);
    void read();
    void write();
    void checkContents();
    void setAside(std::string const& why);
    void fail(Persistence state, std::string const& why);
    void works();
    std::string subject() const;

    std::string m_path;
    std::string m_things;
    std::chrono::milliseconds m_patience;
    std::vector<StatePart*> m_parts;
    Contents m_contents = Contents::Known;
    Persistence m_state = Persistence::Kept;
    bool m_rewrite = false;               ///< the file does not have all that memory has
    bool m_leftAlone = false;             ///< this run does not touch the file any more
    bool m_begunAnew = false;             ///< from memory, in this run
    std::unique_ptr<Database> m_database; ///< null: not open
};

} // namespace kvloamd
