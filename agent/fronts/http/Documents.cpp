// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Documents.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <chrono>

#include "agent/fronts/http/Parameters.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

constexpr std::int64_t kInterval = 900'000; // milliseconds
constexpr std::int64_t kSecond = 1000;
constexpr std::uint32_t kMostIndex = 0xffffffff;

/// When a closed interval of a line began.
void intervalStart(JsonWriter& json, View const& view, OidView index) {
    auto const& lines = view.snapshot().interfaces.lines;
    auto const line = std::ranges::lower_bound(lines, index[0], {}, &LineRow::ifIndex);
    std::int64_t const start = view.moment().taken - line->timeElapsed.value_or(0) * kSecond -
                               std::int64_t{index[1]} * kInterval;
    json.text(rfc3339(start / kSecond * kSecond));
}

/// The rows of one line's history. Their index is in the address.
List const& intervals() {
    static List const list{"intervals",
                           {},
                           {{&dsx1IntervalTable(), "dsx1Interval", {}, {"dsx1IntervalIndex"}}},
                           {{"start", intervalStart}}};
    return list;
}

/// Begins a document and says which snapshot it shows.
JsonWriter begun(View const& view) {
    JsonWriter json;
    json.beginObject().key("snapshot").number(std::int64_t{view.moment().number});
    json.key("time").text(rfc3339(view.moment().taken));
    json.key("ageSeconds").decimal(std::max<std::int64_t>(view.moment().age, 0), 3);
    return json;
}

std::string ended(JsonWriter& json) {
    json.endObject();
    return json.take();
}

std::string hostName() {
    std::array<char, 256> name{};
    gethostname(name.data(), name.size() - 1);
    return name.data();
}

std::string noSuch(std::string_view what, std::string_view name) {
    return "there is no " + std::string(what) + " '" + std::string(name) + "'";
}

/// The board that has `name` as its serial number, else as its index. Throws when there is none.
BoardRow const& findBoard(View const& view, std::string_view name) {
    auto const& boards = view.snapshot().boards;
    auto found = std::ranges::find(boards, name, &BoardRow::serialNumber);
    if (auto const index = numberIn<std::uint32_t>(name); found == boards.end() && index)
        found = std::ranges::find(boards, *index, &BoardRow::boardIndex);
    if (found == boards.end()) throw HttpFault(404, noSuch("board", name));
    return *found;
}

/// The keys that `target` asks for. Throws when no list has one of them.
Fields fieldsIn(Target const& target, std::vector<ListWriter> const& writers) {
    Fields fields = wordsParameter(target, "fields");
    std::vector<std::string> known;
    for (ListWriter const& writer : writers)
        for (std::string& field : fieldsOf(writer.list()))
            known.push_back(std::move(field));
    for (std::string const& field : fields)
        if (std::ranges::find(known, field) == known.end())
            throw HttpFault(400, "'fields': rows have no key '" + field + "'");
    return fields;
}

RowFilter filterIn(View const& view, Target const& target) {
    RowFilter filter;
    if (std::string const* const name = target.parameter("board"); name != nullptr)
        filter.boardIndex = findBoard(view, *name).boardIndex;
    filter.line = numberParameter<std::uint32_t>(target, "line", 1, kMostIndex).value_or(0);
    for (std::string const& word : wordsParameter(target, "ifIndex")) {
        auto const number = numberIn<std::uint32_t>(word);
        if (!number) throw HttpFault(400, "'ifIndex' is not a list of numbers like 1000,1001");
        filter.ifIndices.push_back(*number);
    }
    std::ranges::sort(filter.ifIndices);
    return filter;
}

/// The name of a number of kvlAlarmSeverity, or null.
void writeSeverity(JsonWriter& json, View const& view, int severity) {
    Table const& table = alarmTable();
    for (std::size_t column = 0; column < table.columnCount(); ++column) {
        ColumnHead const head = table.column(column);
        if (std::string_view(head.name) == "kvlAlarmSeverity")
            writeValue(json, head.type, head.details,
                       severity == 0 ? Value{} : Value{std::int64_t{severity}}, view.counters(),
                       Manner::People);
    }
}

void writeText(JsonWriter& json, std::string_view text) {
    text.empty() ? json.null() : json.text(text);
}

} // namespace

Documents::Documents(DescribedObjects objects)
    : m_objects(std::move(objects)), m_intervals(intervals()) {
    for (Resource const& resource : resources()) {
        Lists lists{resource.name, {}};
        for (List const& list : resource.lists)
            lists.writers.emplace_back(list);
        m_lists.push_back(std::move(lists));
    }
}

std::string Documents::write(View const& view, Target const& target) const {
    auto const& segments = target.segments;
    if (segments.size() == 3) {
        std::string const& name = segments[2];
        bool const hasLists = name != "health" && name != "scalars" && name != "tables";
        if (!hasLists) checkParameters(target, {});
        if (name == "health") return health(view);
        if (name == "scalars") return scalars(view);
        if (name == "tables") return tables(view);
        for (Lists const& lists : m_lists)
            if (lists.name == name) return resource(view, lists, target);
    }
    if (segments.size() == 4) {
        if (segments[2] != "tables") checkParameters(target, {});
        if (segments[2] == "boards") return board(view, segments[3]);
        if (segments[2] == "lines") return line(view, segments[3]);
        if (segments[2] == "tables") return table(view, segments[3], target);
    }
    throw HttpFault(404, "there is nothing at this address");
}

std::string Documents::resource(View const& view, Lists const& lists, Target const& target) {
    std::string_view const first = lists.writers.front().list().index.front();
    if (lists.name == "channels")
        checkParameters(target, {"fields", "board", "line", "ifIndex"});
    else if (first == "ifIndex")
        checkParameters(target, {"fields", "board", "ifIndex"});
    else if (first == "boardIndex")
        checkParameters(target, {"fields", "board"});
    else
        checkParameters(target, {"fields"});
    Fields const fields = fieldsIn(target, lists.writers);
    RowFilter const filter = filterIn(view, target);
    JsonWriter json = begun(view);
    for (ListWriter const& writer : lists.writers) {
        json.key(writer.key());
        if (fields.empty())
            writer.writeAll(json, view, filter);
        else
            ListWriter(writer.list(), fields).writeAll(json, view, filter);
    }
    return ended(json);
}

JournalQuery Documents::journalQuery(Target const& target) {
    checkParameters(target, {"after", "limit"});
    JournalQuery query;
    query.after = numberParameter<std::uint32_t>(target, "after", 0, kMostIndex);
    query.limit =
        numberParameter<std::size_t>(target, "limit", 1, kMostEntries).value_or(query.limit);
    return query;
}

std::string Documents::journal(View const& view, JournalPage const& page) {
    JsonWriter json = begun(view);
    json.key("newest").number(std::int64_t{page.newest});
    json.key("entries").beginArray();
    for (JournalRow const& row : page.rows) {
        InterfaceRow const* const interface = view.interface(row.ifIndex);
        auto const date = std::chrono::floor<std::chrono::milliseconds>(row.date);
        json.beginObject().key("number").number(std::int64_t{row.number});
        json.key("date").text(rfc3339(std::int64_t{date.time_since_epoch().count()}));
        json.key("event").text(row.event).key("text").text(row.text);
        json.key("board");
        writeText(json, row.board);
        json.key("ifIndex");
        row.ifIndex == 0 ? json.null() : json.number(std::int64_t{row.ifIndex});
        json.key("line");
        writeText(json, interface == nullptr ? std::string_view() : interface->name);
        json.key("kind");
        writeText(json, row.alarm);
        json.key("severity");
        writeSeverity(json, view, row.severity);
        json.key("times");
        row.alarm.empty() ? json.null() : json.number(std::int64_t{row.times});
        json.endObject();
    }
    json.endArray();
    return ended(json);
}

std::string Documents::board(View const& view, std::string_view name) const {
    BoardRow const& found = findBoard(view, name);
    RowFilter filter;
    filter.boardIndex = found.boardIndex;
    JsonWriter json = begun(view);
    json.key("board").beginObject();
    writerOf("boards").writeKeys(json, view, found.index());
    json.endObject();
    for (std::string_view const key : {"lines", "devices", "processors"}) {
        json.key(key);
        writerOf(key).writeAll(json, view, filter);
    }
    return ended(json);
}

std::string Documents::line(View const& view, std::string_view name) const {
    auto const& lines = view.snapshot().interfaces.lines;
    auto const isNamed = [&](LineRow const& line) {
        InterfaceRow const* const interface = view.interface(line.ifIndex);
        return interface != nullptr && interface->name == name;
    };
    auto found = std::ranges::find_if(lines, isNamed);
    if (found != lines.end() && std::find_if(found + 1, lines.end(), isNamed) != lines.end())
        throw HttpFault(409, "several lines have the name '" + std::string(name) +
                                 "'; use the ifIndex of the line instead");
    if (auto const index = numberIn<std::uint32_t>(name); found == lines.end() && index)
        found = std::ranges::find(lines, *index, &LineRow::ifIndex);
    if (found == lines.end()) throw HttpFault(404, noSuch("line", name));
    JsonWriter json = begun(view);
    json.key("line").beginObject();
    writerOf("lines").writeKeys(json, view, found->index());
    json.key("intervals").beginArray();
    for (std::uint32_t interval = 1; interval <= found->closedIntervals(); ++interval) {
        json.beginObject();
        m_intervals.writeKeys(json, view, std::array{found->ifIndex, interval});
        json.endObject();
    }
    json.endArray().endObject();
    return ended(json);
}

std::string Documents::health(View const& view) const {
    using namespace std::chrono;
    JsonWriter json = begun(view);
    json.key("health").beginObject();
    json.key("host").text(hostName());
    auto const started = system_clock::now() - (Clock::now() - view.counters().started);
    json.key("agentStarted")
        .text(rfc3339(floor<seconds>(started.time_since_epoch()).count() * kSecond));
    View::Channels const channels = view.allChannels();
    json.key("channels").number(channels.all).key("channelsInUse").number(channels.inUse);
    Facts const facts = view.facts();
    for (auto const& [key, scalar] : healthScalars(m_objects.scalars)) {
        json.key(key);
        writeValue(json, scalar->type, scalar->details, scalar->get(facts), view.counters(),
                   Manner::People);
    }
    json.endObject();
    return ended(json);
}

std::string Documents::scalars(View const& view) const {
    JsonWriter json;
    json.beginObject().key("snapshot").number(std::int64_t{view.moment().number});
    json.key("scalars").beginObject();
    Facts const facts = view.facts();
    for (std::span<Scalar const> const module : m_objects.scalars) {
        for (Scalar const& scalar : module) {
            json.key(scalar.name);
            writeValue(json, scalar.type, scalar.details, scalar.get(facts), view.counters(),
                       Manner::Module);
        }
    }
    json.endObject();
    return ended(json);
}

std::string Documents::tables(View const& view) const {
    JsonWriter json;
    json.beginObject().key("snapshot").number(std::int64_t{view.moment().number});
    json.key("tables").beginArray();
    for (Table const* const table : m_objects.tables)
        json.text(table->name());
    json.endArray();
    return ended(json);
}

std::string Documents::table(View const& view, std::string_view name, Target const& target) const {
    auto const found = std::ranges::find(
        m_objects.tables, name, [](Table const* table) { return std::string_view(table->name()); });
    if (found == m_objects.tables.end()) throw HttpFault(404, noSuch("table", name));
    checkParameters(target, {"after", "limit"});
    Oid after;
    if (std::string const* const asked = target.parameter("after"); asked != nullptr) {
        auto index = indexIn(*asked);
        if (!index) throw HttpFault(400, "'after' is not an index; write it like 1000.5");
        after = *std::move(index);
    }
    std::size_t const most =
        numberParameter<std::size_t>(target, "limit", 1, kMostRows).value_or(kMostRows);
    JsonWriter json;
    json.beginObject().key("snapshot").number(std::int64_t{view.moment().number});
    json.key("table").text((*found)->name()).key("rows");
    Oid const last = writeTable(json, view, **found, after, most);
    json.key("next");
    last.empty() ? json.null() : json.text(dotted(last));
    return ended(json);
}

ListWriter const& Documents::writerOf(std::string_view key) const {
    for (Lists const& lists : m_lists)
        for (ListWriter const& writer : lists.writers)
            if (writer.key() == key) return writer;
    throw std::logic_error("no list has the key " + std::string(key));
}

std::vector<std::pair<std::string, Scalar const*>>
healthScalars(std::vector<std::span<Scalar const>> const& scalars) {
    std::vector<std::pair<std::string, Scalar const*>> found;
    for (std::span<Scalar const> const module : scalars)
        for (Scalar const& scalar : module) {
            std::string_view const name = scalar.name;
            // The others beginning so repeat a scalar for the agent's state of health.
            if (name.starts_with("kvl") && !name.starts_with("kvlHealth"))
                found.emplace_back(keyOf(name, "kvl", scalar.type), &scalar);
        }
    return found;
}

} // namespace kvloamd
