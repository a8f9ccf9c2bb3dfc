// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/http/Documents.h"

#include <unistd.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <chrono>
#include <optional>

#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

constexpr std::int64_t kInterval = 900'000; // milliseconds
constexpr std::int64_t kSecond = 1000;

/// When a closed interval of a line began.
void intervalStart(JsonWriter& json, View const& view, OidView index) {
    auto const& lines = view.snapshot().interfaces.lines;
    auto const line = std::ranges::lower_bound(lines, index[0], {}, &LineRow::ifIndex);
    std::int64_t const start = view.moment().taken - line->timeElapsed.value_or(0) * kSecond -
                               std::int64_t{index[1]} * kInterval;
    json.key("start").text(rfc3339(start / kSecond * kSecond));
}

/// The rows of one line's history. Their index is in the address.
List const& intervals() {
    static List const list{"intervals",
                           {},
                           {{&dsx1IntervalTable(), "dsx1Interval", {}, {"dsx1IntervalIndex"}}},
                           intervalStart};
    return list;
}

/// The number that the whole of `text` is.
template <class Number>
std::optional<Number> numberIn(std::string_view text) {
    Number number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return number;
}

/// A relative name such as "1000.5".
std::optional<Oid> indexIn(std::string_view text) {
    Oid index;
    for (;;) {
        std::size_t const end = std::min(text.find('.'), text.size());
        auto const number = numberIn<std::uint32_t>(text.substr(0, end));
        if (!number) return std::nullopt;
        index.push_back(*number);
        if (end == text.size()) return index;
        text.remove_prefix(end + 1);
    }
}

std::string dotted(OidView name) {
    std::string text;
    for (std::uint32_t const number : name)
        text += (text.empty() ? "" : ".") + std::to_string(number);
    return text;
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
        if (name == "health") return health(view);
        if (name == "scalars") return scalars(view);
        if (name == "tables") return tables(view);
        for (Lists const& lists : m_lists)
            if (lists.name == name) return resource(view, lists);
    }
    if (segments.size() == 4) {
        if (segments[2] == "boards") return board(view, segments[3]);
        if (segments[2] == "lines") return line(view, segments[3]);
        if (segments[2] == "tables") return table(view, segments[3], target);
    }
    throw HttpFault(404, "there is nothing at this address");
}

std::string Documents::resource(View const& view, Lists const& lists) const {
    JsonWriter json = begun(view);
    for (ListWriter const& writer : lists.writers) {
        json.key(writer.key());
        writer.writeAll(json, view);
    }
    return ended(json);
}

std::string Documents::board(View const& view, std::string_view name) const {
    auto const& boards = view.snapshot().boards;
    auto found = std::ranges::find(boards, name, &BoardRow::serialNumber);
    if (auto const index = numberIn<std::uint32_t>(name); found == boards.end() && index)
        found = std::ranges::find(boards, *index, &BoardRow::boardIndex);
    if (found == boards.end()) throw HttpFault(404, noSuch("board", name));
    JsonWriter json = begun(view);
    json.key("board").beginObject();
    writerOf("boards").writeKeys(json, view, found->index());
    json.endObject();
    for (std::string_view const key : {"lines", "devices", "processors"}) {
        json.key(key);
        writerOf(key).writeAll(json, view, found->boardIndex);
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
    Oid after;
    if (std::string const* const asked = target.parameter("after"); asked != nullptr) {
        auto index = indexIn(*asked);
        if (!index) throw HttpFault(400, "'after' is not an index; write it like 1000.5");
        after = *std::move(index);
    }
    std::size_t most = kMostRows;
    if (std::string const* const asked = target.parameter("limit"); asked != nullptr) {
        auto const number = numberIn<std::size_t>(*asked);
        if (!number || *number < 1 || *number > kMostRows)
            throw HttpFault(400, "'limit' is not a number from 1 to " + std::to_string(kMostRows));
        most = *number;
    }
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
