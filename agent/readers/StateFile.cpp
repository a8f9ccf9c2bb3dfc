// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StateFile.h"

#include <algorithm>
#include <filesystem>
#include <system_error>
#include <utility>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr std::int64_t kApplicationId = 0x4b764978; // "KvIx"
constexpr std::int64_t kVersion = 1;
constexpr char kHeader[] = "PRAGMA application_id = 1266043256; PRAGMA user_version = 1;";
static_assert(kApplicationId == 1266043256 && kVersion == 1);

/// A newer version of the agent has written the file.
class NewerFile : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

bool isEmpty(Database& database) {
    return database.number("SELECT count(*) FROM sqlite_master") == 0 &&
           database.number("PRAGMA application_id") == 0;
}

} // namespace

StateFile::StateFile(std::string path, std::string things, std::chrono::milliseconds patience)
    : m_path(std::move(path)), m_things(std::move(things)), m_patience(patience) {}

void StateFile::open() {
    if (m_path.empty()) return;
    m_contents = Contents::Awaited;
    tryOpen(m_patience);
}

void StateFile::save() {
    if (m_path.empty() || m_leftAlone) return;
    if (!m_database) return tryOpen(std::chrono::milliseconds::zero());
    bool const changed =
        std::ranges::any_of(m_parts, [](StatePart const* part) { return part->hasChanges(); });
    if (m_state == Persistence::Kept && !changed) return;
    guard([this] { write(); });
}

void StateFile::tryOpen(std::chrono::milliseconds patience) {
    guard([&] { openOnce(patience); });
}

void StateFile::guard(std::function<void()> const& use) {
    try {
        try {
            use();
        } catch (DatabaseDamaged const& error) {
            setAside(error.what());
            openOnce(std::chrono::milliseconds::zero());
        }
    } catch (DatabaseInUse const& error) {
        if (m_contents != Contents::Known) m_database.reset();
        fail(Persistence::InUse, error.what());
    } catch (std::runtime_error const& error) {
        m_database.reset();
        if (m_contents == Contents::Awaited) m_contents = Contents::Unreadable;
        fail(Persistence::Failing, error.what());
    }
}

void StateFile::openOnce(std::chrono::milliseconds patience) {
    m_database = std::make_unique<Database>(m_path);
    m_database->setPatience(patience);
    if (m_contents == Contents::Awaited)
        read();
    else
        m_rewrite = true;
    write();
    m_database->setPatience(std::chrono::milliseconds::zero());
}

void StateFile::read() {
    Transaction transaction(*m_database, Transaction::Kind::Read);
    if (!isEmpty(*m_database)) checkContents();
    for (StatePart* const part : m_parts)
        part->load(*m_database);
    transaction.commit();
    m_contents = Contents::Known;
}

void StateFile::write() {
    Transaction transaction(*m_database, Transaction::Kind::Write);
    if (m_database->isReadOnly()) throw DatabaseFault("it can only be read");
    if (isEmpty(*m_database)) {
        m_database->execute(kHeader);
        m_rewrite = true;
    } else if (m_contents == Contents::Unreadable) {
        throw DatabaseFault("it can be read now, but numbers have been given without it; restart "
                            "the agent to use it");
    } else if (m_rewrite) {
        checkContents();
    }
    for (StatePart* const part : m_parts) {
        part->createTables(*m_database);
        if (m_rewrite)
            part->writeAll(*m_database);
        else
            part->writeChanges(*m_database);
    }
    transaction.commit();
    for (StatePart* const part : m_parts)
        part->written();
    m_rewrite = false;
    m_contents = Contents::Known;
    works();
}

void StateFile::checkContents() {
    if (m_database->number("PRAGMA application_id") != kApplicationId)
        throw DatabaseDamaged("it is another program's");
    auto const version = m_database->number("PRAGMA user_version");
    if (version > kVersion) {
        m_leftAlone = true;
        throw NewerFile("a newer version of kvloamd has written it (its format is " +
                        std::to_string(version) + ", this version knows " +
                        std::to_string(kVersion) +
                        "); it is left alone: install that version again, or move the file away");
    }
    if (version != kVersion) throw DatabaseDamaged("it has no known format");
    Statement check(*m_database, "PRAGMA quick_check(1)");
    check.step();
    if (check.text(0) != "ok") throw DatabaseDamaged(check.text(0));
}

void StateFile::setAside(std::string const& why) {
    m_database.reset();
    bool const fromMemory = m_contents == Contents::Known;
    // A second time, memory is what contradicts itself.
    if (fromMemory && std::exchange(m_begunAnew, true)) {
        m_leftAlone = true;
        throw DatabaseFault(why);
    }
    std::string const aside = nameForDamaged(m_path);
    std::error_code fault;
    std::filesystem::rename(m_path, aside, fault);
    if (fault) throw DatabaseFault(why + ", and it cannot be renamed: " + fault.message());
    // Left behind, it would be taken for the new file's.
    std::filesystem::rename(m_path + "-journal", aside + "-journal", fault);
    log(LogLevel::Warning,
        m_path + ": the file is damaged (" + why + "); it is kept as " + aside + ", and " +
            (fromMemory ? "a new one is written from memory"
                        : m_things + " are numbered anew, and what was set for them is lost"));
}

std::string StateFile::subject() const {
    return m_path + ": the indices of " + m_things + " and what is set for them are ";
}

void StateFile::fail(Persistence state, std::string const& why) {
    if (std::exchange(m_state, state) == state) return;
    std::string text = subject() + "not kept across restarts: " + why;
    if (!contentsKnown())
        text = m_path + ": the indices of " + m_things + " cannot be read yet: " + why +
               "; those without a known index are not shown until then";
    else if (!m_leftAlone)
        text += "; the agent keeps trying";
    log(LogLevel::Warning, text);
}

void StateFile::works() {
    if (std::exchange(m_state, Persistence::Kept) != Persistence::Kept)
        log(LogLevel::Info, subject() + "kept across restarts again");
}

} // namespace kvloamd
