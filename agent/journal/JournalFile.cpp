// SPDX-License-Identifier: BSD-2-Clause
#include "agent/journal/JournalFile.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <utility>

namespace kvloamd {

namespace {

using Date = std::chrono::system_clock::time_point;

constexpr std::int64_t kApplicationId = 0x4b764a6c; // "KvJl"
constexpr std::int64_t kVersion = 1;

constexpr char kCreate[] =
    "PRAGMA application_id = 1266043500; PRAGMA user_version = 1;"
    "CREATE TABLE entry (sequence INTEGER PRIMARY KEY, date INTEGER NOT NULL, event INTEGER NOT "
    "NULL,"
    " text TEXT NOT NULL, board TEXT NOT NULL, ifindex INTEGER NOT NULL, kind INTEGER NOT NULL,"
    " severity INTEGER NOT NULL, times INTEGER NOT NULL);"
    "CREATE TABLE alarm (kind INTEGER NOT NULL, board TEXT NOT NULL, number INTEGER NOT NULL,"
    " sequence INTEGER NOT NULL, severity INTEGER NOT NULL, resource TEXT NOT NULL,"
    " boardindex INTEGER NOT NULL, ifindex INTEGER NOT NULL, text TEXT NOT NULL, place TEXT NOT "
    "NULL,"
    " began INTEGER NOT NULL, raised INTEGER NOT NULL, times INTEGER NOT NULL,"
    " PRIMARY KEY (kind, board, number)) WITHOUT ROWID;"
    // A variable of a notification; the one at position 0 is the notification itself.
    "CREATE TABLE variable (sequence INTEGER NOT NULL, position INTEGER NOT NULL, name TEXT NOT "
    "NULL,"
    " type INTEGER NOT NULL, value NOT NULL, PRIMARY KEY (sequence, position)) WITHOUT ROWID;"
    "CREATE TABLE state (reserved INTEGER NOT NULL);"
    "INSERT INTO state VALUES (0);";
static_assert(kApplicationId == 1266043500 && kVersion == 1);

/// Pruning costs about as much as writing; it need not follow every entry.
constexpr std::size_t kPrunePause = 1000;

std::int64_t milliseconds(Date date) {
    return std::chrono::duration_cast<std::chrono::milliseconds>(date.time_since_epoch()).count();
}

/// "1.3.6", and back.
std::string textOf(Oid const& name) {
    std::string text;
    for (std::uint32_t const part : name)
        text += (text.empty() ? "" : ".") + std::to_string(part);
    return text;
}

Oid oidOf(std::string const& text) {
    Oid name;
    char const* at = text.data();
    char const* const end = at + text.size();
    while (at < end) {
        std::uint32_t part = 0;
        auto const [next, error] = std::from_chars(at, end, part);
        if (error != std::errc()) break;
        name.push_back(part);
        at = next + 1;
    }
    return name;
}

Date dateOf(std::int64_t milliseconds) {
    return Date(std::chrono::milliseconds(milliseconds));
}

} // namespace

JournalFile::JournalFile(std::string const& path, JournalLimits limits)
    : m_database(path), m_limits(limits) {
    m_database.setPatience(std::chrono::milliseconds(1000));
    // What was committed survives the end of the process; only a loss of power may cost the last
    // entries.
    m_database.execute("PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL;"
                       "PRAGMA journal_size_limit = 4194304;");
    Transaction transaction(m_database, Transaction::Kind::Write);
    if (m_database.number("SELECT count(*) FROM sqlite_master") == 0) m_database.execute(kCreate);
    if (m_database.number("PRAGMA application_id") != kApplicationId)
        throw DatabaseDamaged("it is another program's");
    if (m_database.number("PRAGMA user_version") != kVersion)
        throw DatabaseFault("another version of kvloamd has written it");
    transaction.commit();
    Statement check(m_database, "PRAGMA quick_check(1)");
    check.step();
    if (check.text(0) != "ok") throw DatabaseDamaged(check.text(0));
    m_reserved = nextSequence() - 1;
}

std::uint32_t JournalFile::nextSequence() {
    std::int64_t const last = std::max(m_database.number("SELECT reserved FROM state"),
                                       m_database.number("SELECT max(sequence) FROM entry"));
    return static_cast<std::uint32_t>(
        std::min<std::int64_t>(last + 1, std::numeric_limits<std::uint32_t>::max()));
}

std::uint32_t JournalFile::newest() {
    return static_cast<std::uint32_t>(m_database.number("SELECT max(sequence) FROM entry"));
}

void JournalFile::write(std::span<JournalEntry const> entries, std::uint32_t next) {
    Transaction transaction(m_database, Transaction::Kind::Write);
    std::uint32_t const reserved = m_reserved;
    if (next + kReserved / 2 > m_reserved) reserve(next + kReserved);
    for (JournalEntry const& entry : entries)
        insert(entry);
    m_unpruned += entries.size();
    if (m_unpruned >= kPrunePause && !entries.empty()) prune(entries.back().date);
    try {
        transaction.commit();
    } catch (DatabaseFault const&) {
        m_reserved = reserved;
        throw;
    }
}

void JournalFile::close(std::vector<Alarm> const& active, std::uint32_t next) {
    Transaction transaction(m_database, Transaction::Kind::Write);
    m_database.execute("DELETE FROM alarm");
    for (Alarm const& alarm : active)
        keepAlarm(alarm);
    prune(std::chrono::system_clock::now());
    reserve(next - 1);
    transaction.commit();
}

void JournalFile::reserve(std::uint32_t upTo) {
    Statement statement(m_database, "UPDATE state SET reserved = ?");
    statement.bind(1, std::int64_t{upTo}).run();
    m_reserved = upTo;
}

Statement& JournalFile::prepared(std::optional<Statement>& statement, char const* sql) {
    if (!statement) statement.emplace(m_database, sql);
    return *statement;
}

void JournalFile::insert(JournalEntry const& entry) {
    Statement& statement =
        prepared(m_insert, "INSERT INTO entry VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?)");
    statement.bind(1, std::int64_t{entry.sequence})
        .bind(2, milliseconds(entry.date))
        .bind(3, static_cast<std::int64_t>(entry.event))
        .bind(4, entry.text)
        .bind(5, entry.board)
        .bind(6, std::int64_t{entry.ifIndex});
    Alarm const* const alarm = entry.alarm ? &*entry.alarm : nullptr;
    statement.bind(7, std::int64_t{alarm == nullptr ? 0 : int(alarm->condition.key.kind)})
        .bind(8, std::int64_t{alarm == nullptr ? 0 : int(alarm->severity)})
        .bind(9, std::int64_t{alarm == nullptr ? 0 : alarm->count})
        .run();
    if (entry.notification) {
        insertVariable(entry.sequence, 0, {{}, VariableType::ObjectId, entry.notification->name});
        int position = 0;
        for (LoggedVariable const& variable : entry.notification->variables)
            insertVariable(entry.sequence, ++position, variable);
    }
    if (alarm == nullptr) return;
    if (entry.event == JournalEvent::AlarmCleared) return dropAlarm(alarm->condition.key);
    Alarm kept = *alarm;
    if (entry.event == JournalEvent::AlarmRaised) kept.number = entry.sequence;
    keepAlarm(kept);
}

void JournalFile::insertVariable(std::uint32_t sequence, int position,
                                 LoggedVariable const& variable) {
    Statement& statement =
        prepared(m_insertVariable, "INSERT INTO variable VALUES (?, ?, ?, ?, ?)");
    std::string const name = textOf(variable.name);
    statement.bind(1, std::int64_t{sequence})
        .bind(2, std::int64_t{position})
        .bind(3, name)
        .bind(4, static_cast<std::int64_t>(variable.type));
    std::string text;
    if (auto const* const number = std::get_if<std::int64_t>(&variable.value)) {
        statement.bind(5, *number);
    } else if (auto const* const octets = std::get_if<std::string>(&variable.value)) {
        statement.bindBlob(5, *octets);
    } else {
        text = textOf(std::get<Oid>(variable.value));
        statement.bind(5, text);
    }
    statement.run();
}

void JournalFile::keepAlarm(Alarm const& alarm) {
    Statement& statement = prepared(
        m_keepAlarm, "INSERT OR REPLACE INTO alarm VALUES (?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?, ?)");
    Condition const& condition = alarm.condition;
    statement.bind(1, static_cast<std::int64_t>(condition.key.kind))
        .bind(2, condition.key.board)
        .bind(3, std::int64_t{condition.key.number})
        .bind(4, std::int64_t{alarm.number})
        .bind(5, static_cast<std::int64_t>(alarm.severity))
        .bind(6, condition.resource)
        .bind(7, std::int64_t{condition.boardIndex})
        .bind(8, std::int64_t{condition.ifIndex})
        .bind(9, condition.text)
        .bind(10, condition.place)
        .bind(11, milliseconds(alarm.began))
        .bind(12, milliseconds(alarm.raised))
        .bind(13, std::int64_t{alarm.count})
        .run();
}

void JournalFile::dropAlarm(AlarmKey const& key) {
    Statement& statement =
        prepared(m_dropAlarm, "DELETE FROM alarm WHERE kind = ? AND board = ? AND number = ?");
    statement.bind(1, static_cast<std::int64_t>(key.kind))
        .bind(2, key.board)
        .bind(3, std::int64_t{key.number})
        .run();
}

void JournalFile::prune(Date now) {
    Statement byNumber(m_database,
                       "DELETE FROM entry WHERE sequence < (SELECT min(sequence) FROM (SELECT "
                       "sequence FROM entry ORDER BY sequence DESC LIMIT ?))");
    byNumber.bind(1, static_cast<std::int64_t>(m_limits.entries)).run();
    Statement byAge(m_database, "DELETE FROM entry WHERE date < ?");
    byAge.bind(1, milliseconds(now - m_limits.age)).run();
    m_database.execute("DELETE FROM variable WHERE sequence < "
                       "(SELECT ifnull(min(sequence), 4294967296) FROM entry)");
    m_unpruned = 0;
}

std::vector<Alarm> JournalFile::activeAlarms() {
    Statement statement(m_database, "SELECT * FROM alarm ORDER BY kind, board, number");
    std::vector<Alarm> alarms;
    while (statement.step()) {
        auto const kind = static_cast<AlarmKind>(statement.number(0));
        // Of a later version of the agent.
        if (std::ranges::none_of(alarmKinds(), [&](auto const& info) { return info.kind == kind; }))
            continue;
        Alarm alarm;
        alarm.condition.key = {kind, statement.text(1),
                               static_cast<std::uint32_t>(statement.number(2))};
        alarm.number = static_cast<std::uint32_t>(statement.number(3));
        alarm.severity = static_cast<AlarmSeverity>(statement.number(4));
        alarm.condition.resource = statement.text(5);
        alarm.condition.boardIndex = static_cast<std::uint32_t>(statement.number(6));
        alarm.condition.ifIndex = static_cast<std::uint32_t>(statement.number(7));
        alarm.condition.text = statement.text(8);
        alarm.condition.place = statement.text(9);
        alarm.began = dateOf(statement.number(10));
        alarm.raised = dateOf(statement.number(11));
        alarm.count = static_cast<std::uint32_t>(statement.number(12));
        alarms.push_back(std::move(alarm));
    }
    return alarms;
}

std::vector<JournalEntry> JournalFile::notifications(std::size_t most) {
    Statement statement(
        m_database,
        "SELECT entry.sequence, date, text, name, type, value FROM entry JOIN variable USING "
        "(sequence) WHERE sequence >= (SELECT ifnull(min(sequence), 0) FROM (SELECT sequence FROM "
        "variable WHERE position = 0 ORDER BY sequence DESC LIMIT ?)) ORDER BY sequence, position");
    statement.bind(1, static_cast<std::int64_t>(most));
    std::vector<JournalEntry> all;
    while (statement.step()) {
        auto const sequence = static_cast<std::uint32_t>(statement.number(0));
        if (all.empty() || all.back().sequence != sequence) {
            JournalEntry entry;
            entry.event = JournalEvent::Notification;
            entry.sequence = sequence;
            entry.date = dateOf(statement.number(1));
            entry.text = statement.text(2);
            entry.notification = {oidOf(statement.text(5)), {}};
            all.push_back(std::move(entry));
            continue;
        }
        LoggedVariable variable;
        variable.name = oidOf(statement.text(3));
        variable.type = static_cast<VariableType>(statement.number(4));
        switch (variable.type) {
        case VariableType::OctetString:
            variable.value = statement.blob(5);
            break;
        case VariableType::ObjectId:
            variable.value = oidOf(statement.text(5));
            break;
        default:
            variable.value = statement.number(5);
            break;
        }
        all.back().notification->variables.push_back(std::move(variable));
    }
    return all;
}

std::vector<JournalEntry> JournalFile::entries(std::size_t most) {
    Statement statement(m_database,
                        "SELECT * FROM (SELECT sequence, date, event, text, board, ifindex FROM "
                        "entry ORDER BY sequence DESC LIMIT ?) ORDER BY sequence");
    statement.bind(1, static_cast<std::int64_t>(most));
    std::vector<JournalEntry> all;
    while (statement.step()) {
        JournalEntry entry;
        entry.sequence = static_cast<std::uint32_t>(statement.number(0));
        entry.date = dateOf(statement.number(1));
        entry.event = static_cast<JournalEvent>(statement.number(2));
        entry.text = statement.text(3);
        entry.board = statement.text(4);
        entry.ifIndex = static_cast<std::uint32_t>(statement.number(5));
        all.push_back(std::move(entry));
    }
    return all;
}

} // namespace kvloamd
