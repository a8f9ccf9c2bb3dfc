// SPDX-License-Identifier: BSD-2-Clause
// Every value that SNMP shows is the same over HTTP.
#include <algorithm>
#include <ctime>
#include <fstream>
#include <map>
#include <set>
#include <sstream>

#include <gmock/gmock.h>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"
#include "tests/e2e/HttpFixture.h"

namespace kvloamd::e2e {
namespace {

/// One instance as a walk shows it.
struct Walked {
    std::string type;
    std::string value; ///< a number in decimal, octets as themselves, a name with dots
};

/// The octets of "4E 58 ".
std::string octetsOf(std::string const& digits) {
    std::istringstream words(digits);
    std::string octets;
    for (std::string word; words >> word;)
        octets += static_cast<char>(std::stoi(word, nullptr, 16));
    return octets;
}

/// Reads what snmpbulkwalk -On -Oe -Ox -Ot prints, where long octets take several lines.
std::map<std::string, Walked> parsed(std::string const& output) {
    std::map<std::string, Walked> instances;
    std::string name;
    for (std::string const& line : linesOf(output)) {
        if (!line.starts_with('.')) {
            if (!name.empty()) instances[name].value += octetsOf(line);
            continue;
        }
        std::size_t const equals = line.find(" = ");
        name = line.substr(1, equals - 1);
        std::string const text = line.substr(equals + 3);
        std::size_t const colon = text.find(": ");
        std::string const type = text == "\"\"" ? "STRING" : text.substr(0, colon);
        std::string const value = colon == std::string::npos ? text : text.substr(colon + 2);
        if (type == "Hex-STRING")
            instances[name] = {type, octetsOf(value)};
        else if (text == "\"\"")
            instances[name] = {type, ""};
        else if (type == "OID")
            instances[name] = {type, value.substr(1)};
        else
            instances[name] = {type, value};
    }
    return instances;
}

std::string dotted(OidView name) {
    std::string text;
    for (std::uint32_t const number : name)
        text += (text.empty() ? "" : ".") + std::to_string(number);
    return text;
}

using Json = nlohmann::json;

Json nameOf(Names names, std::int64_t number) {
    for (NamedNumber const& named : names)
        if (named.number == number)
            return std::string_view(named.name) == "true"    ? Json(true)
                   : std::string_view(named.name) == "false" ? Json(false)
                                                             : Json(named.name);
    return number;
}

/// A date in the form that the agent gives it, from the octets of SNMP.
Json dateOf(std::string const& octets) {
    if (octets.size() < 8 || octets[2] == 0) return nullptr;
    auto const at = [&](std::size_t i) {
        return static_cast<int>(static_cast<unsigned char>(octets[i]));
    };
    std::tm date{};
    date.tm_year = at(0) * 256 + at(1) - 1900;
    date.tm_mon = at(2) - 1;
    date.tm_mday = at(3);
    date.tm_hour = at(4);
    date.tm_min = at(5);
    date.tm_sec = at(6);
    std::time_t time = timegm(&date);
    if (octets.size() > 8) {
        long const zone = at(9) * 3600L + at(10) * 60L;
        time -= octets[8] == '+' ? zone : -zone;
    }
    gmtime_r(&time, &date);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%S", &date);
    return text + (at(7) == 0 ? std::string() : "." + std::to_string(at(7))) + "Z";
}

/// What HTTP has to show for an instance.
Json expected(ColumnHead const& head, Walked const& walked) {
    if (head.type == ValueType::ObjectId) return walked.value;
    if (head.type == ValueType::Date) return dateOf(walked.value);
    if (head.type == ValueType::Octets && !head.details.names.empty()) {
        Json set = Json::array();
        for (std::size_t bit = 0; bit < walked.value.size() * 8; ++bit)
            if ((static_cast<unsigned char>(walked.value[bit / 8]) & (0x80U >> bit % 8)) != 0)
                set.push_back(nameOf(head.details.names, static_cast<std::int64_t>(bit)));
        return set;
    }
    if (head.type == ValueType::Octets && !head.details.writable) {
        std::ostringstream text;
        for (std::size_t i = 0; i < walked.value.size(); ++i) {
            char digits[4];
            std::snprintf(digits, sizeof digits, "%02x",
                          static_cast<unsigned char>(walked.value[i]));
            text << (i == 0 ? "" : ":") << digits;
        }
        return text.str();
    }
    if (head.type == ValueType::Text || head.type == ValueType::Octets) return walked.value;
    if (head.type == ValueType::Counter64) return std::stoull(walked.value);
    std::int64_t const number = std::stoll(walked.value);
    if (!head.details.bits.empty()) {
        Json sum = Json::array();
        for (unsigned shift = 0; shift < 31; ++shift)
            if ((number >> shift & 1) != 0)
                sum.push_back(nameOf(head.details.bits, std::int64_t{1} << shift));
        return sum;
    }
    return nameOf(head.details.names, number);
}

class HttpValuesTest : public HttpFixture {
  protected:
    struct Served {
        Table const* table;
        Oid entry; ///< absolute
    };
    HttpValuesTest() {
        Oid const enterprise{1, 3, 6, 1, 4, 1, 32473};
        for (Table const* const table : tables())
            m_tables.push_back({table, joined(enterprise, table->entry())});
        for (Table const* const table : standardTables())
            m_tables.push_back({table, joined(kStandardArc, table->entry())});
    }

    std::map<std::string, Walked> walked(std::string const& from) const {
        Result const result = run({"snmpbulkwalk", "-v2c", "-c", "public", "-m", "", "-On", "-Oe",
                                   "-Ox", "-Ot", "-Cr40", address(), from});
        return parsed(result.output);
    }
    Json rows(Served const& served) const {
        return document(std::string("tables/") + served.table->name())["rows"];
    }

    /// Compares one table. Returns what is different, and counts the values.
    std::vector<std::string> differences(Served const& served, std::size_t& values) const {
        std::vector<std::string> found;
        Json const before = rows(served);
        auto instances = walked(dotted(served.entry));
        Json const after = rows(served);
        if (before.size() != after.size()) return {"rows come and go"};
        for (std::size_t row = 0; row < before.size(); ++row) {
            auto const index = before[row]["index"].get<Oid>();
            for (std::size_t column = 0; column < served.table->columnCount(); ++column) {
                ColumnHead const head = served.table->column(column);
                std::string const name =
                    dotted(served.entry) + '.' + std::to_string(head.number) + '.' + dotted(index);
                auto const instance = instances.extract(name);
                // Both are there, and neither may hide what the other shows.
                Json const value = instance.empty() ? Json() : expected(head, instance.mapped());
                if (!before[row].contains(head.name) ||
                    !isBetween(before[row][head.name], value, after[row][head.name]))
                    found.push_back(std::string(head.name) + '.' + dotted(index) + ": SNMP " +
                                    value.dump() + ", HTTP " + before[row][head.name].dump() +
                                    " and then " + after[row][head.name].dump());
                if (!value.is_null()) ++values;
            }
        }
        for (auto const& [name, instance] : instances)
            if (instance.type.find("No Such") == std::string::npos &&
                instance.type.find("No more") == std::string::npos)
                found.push_back(name + ": SNMP has it, HTTP does not");
        return found;
    }

    /// Compares all tables. Returns how many values there are.
    std::size_t compareAll() {
        std::size_t values = 0;
        for (Served const& served : m_tables) {
            std::vector<std::string> found;
            std::size_t ofTable = 0;
            // Once in a quarter of an hour, all intervals move by one between two of the requests.
            for (int attempt = 0; attempt < 3; ++attempt) {
                ofTable = 0;
                found = differences(served, ofTable);
                if (found.empty()) break;
            }
            EXPECT_THAT(found, ::testing::IsEmpty()) << served.table->name();
            if (ofTable > 0) m_compared.insert(served.table->name());
            values += ofTable;
        }
        return values;
    }

    std::vector<Served> m_tables;
    std::set<std::string> m_compared; ///< the tables that had values
};

TEST_F(HttpValuesTest, EveryTableHasTheValuesThatSnmpHas) {
    startHttpAgent();
    sim({"fail", "3"}); // so that there is an alarm
    EXPECT_TRUE(eventually([this] { return !document("alarms")["alarms"].empty(); }));
    EXPECT_GT(compareAll(), 2000U);
    stopAgent();
    // A chassis with what the bundled one lacks.
    std::ifstream chassis(E2E_DIR "/expected.yaml");
    useChassis({std::istreambuf_iterator<char>(chassis), {}});
    startHttpAgent();
    sim({"fault", "2", "17"});
    EXPECT_TRUE(eventually([this] { return !document("faults")["faults"].empty(); }));
    EXPECT_GT(compareAll(), 500U);
    std::set<std::string> others;
    for (Served const& served : m_tables)
        if (!m_compared.contains(served.table->name())) others.insert(served.table->name());
    // The comparison itself works: hardly a table has no values in both.
    EXPECT_LE(others.size(), 4U) << ::testing::PrintToString(others);
}

TEST_F(HttpValuesTest, EveryScalarHasTheValueThatSnmpHas) {
    startHttpAgent();
    // These count the requests of the test itself.
    std::set<std::string> const moving{"kvlRequests",    "kvlSnapshots",   "kvlSnapshotAge",
                                       "kvlAgentUpTime", "kvlRefreshTime", "kvlLongestRefreshTime"};
    auto const arcs = {std::pair{Oid{1, 3, 6, 1, 4, 1, 32473}, scalars()},
                       std::pair{Oid(kStandardArc), standardScalars()}};
    std::size_t compared = 0;
    for (auto const& [arc, described] : arcs) {
        for (Scalar const& scalar : described) {
            std::string const name = dotted(joined(arc, scalar.place)) + ".0";
            ColumnHead const head{scalar.name, 0, scalar.type, scalar.details};
            std::string difference;
            // SNMP shows counters as they are, HTTP as they were when the snapshot was first asked.
            auto const isSame = [&] {
                Json const before = document("scalars")["scalars"][scalar.name];
                auto const instances = walked(name);
                Json const after = document("scalars")["scalars"][scalar.name];
                auto const instance = instances.find(name);
                bool const isThere = instance != instances.end() &&
                                     instance->second.type.find("No ") == std::string::npos;
                Json const value = isThere ? expected(head, instance->second) : Json();
                difference =
                    "SNMP " + value.dump() + ", HTTP " + before.dump() + ", " + after.dump();
                return isBetween(before, value, after);
            };
            EXPECT_TRUE(moving.contains(scalar.name) || eventually(isSame))
                << scalar.name << ": " << difference;
            ++compared;
        }
    }
    EXPECT_EQ(compared, scalars().size() + standardScalars().size());
}

} // namespace
} // namespace kvloamd::e2e
