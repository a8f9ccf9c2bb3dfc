// SPDX-License-Identifier: BSD-2-Clause
// docs/openapi.json against the lists that the agent writes.
#include <algorithm>
#include <fstream>
#include <set>

#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "agent/fronts/http/Documents.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {
namespace {

using OpenApi = nlohmann::json;

class OpenApiTest : public ::testing::Test {
  protected:
    OpenApiTest() { std::ifstream(DOCS_DIR "/openapi.json") >> m_api; }

    OpenApi const& followed(OpenApi const& schema) {
        if (!schema.contains("$ref")) return schema;
        std::string const reference = schema["$ref"];
        return m_api.at(OpenApi::json_pointer(reference.substr(1)));
    }
    /// The schema of the document at `address`.
    OpenApi const& document(std::string const& address) {
        return m_api.at("paths")
            .at(address)
            .at("get")
            .at("responses")
            .at("200")
            .at("content")
            .at("application/json")
            .at("schema");
    }
    static std::set<std::string> keysOf(OpenApi const& schema) {
        std::set<std::string> keys;
        for (auto const& [key, value] : schema.at("properties").items())
            keys.insert(key);
        return keys;
    }

    OpenApi m_api;
};

TEST_F(OpenApiTest, EveryListHasTheKeysOfItsRows) {
    for (Resource const& resource : resources()) {
        OpenApi const& schema = document("/api/v1/" + std::string(resource.name));
        for (List const& list : resource.lists) {
            OpenApi const& row =
                followed(schema.at("properties").at(std::string(list.key)).at("items"));
            auto const fields = fieldsOf(list);
            EXPECT_EQ(keysOf(row), std::set<std::string>(fields.begin(), fields.end()))
                << resource.name << ' ' << list.key;
        }
    }
}

TEST_F(OpenApiTest, EveryObjectInARowHasItsColumns) {
    for (Resource const& resource : resources())
        for (List const& list : resource.lists) {
            std::map<std::string_view, std::set<std::string>> objects;
            for (Part const& part : list.parts)
                for (std::size_t i = 0; !part.object.empty() && i < part.table->columnCount();
                     ++i) {
                    ColumnHead const head = part.table->column(i);
                    if (std::ranges::find(part.without, head.name) == part.without.end())
                        objects[part.object].insert(keyOf(head.name, part.prefix, head.type));
                }
            OpenApi const& row = followed(document("/api/v1/" + std::string(resource.name))
                                              .at("properties")
                                              .at(std::string(list.key))
                                              .at("items"));
            for (auto const& [object, keys] : objects)
                EXPECT_EQ(
                    keysOf(followed(row.at("properties").at(std::string(object))["anyOf"][0])),
                    keys)
                    << list.key << ' ' << object;
        }
}

TEST_F(OpenApiTest, HealthHasTheAgentsScalars) {
    std::set<std::string> keys{"host", "agentStarted", "channels", "channelsInUse"};
    for (auto const& [key, scalar] : healthScalars({scalars(), standardScalars()}))
        keys.insert(key);
    EXPECT_EQ(keysOf(followed(document("/api/v1/health").at("properties").at("health"))), keys);
}

TEST_F(OpenApiTest, NamesOfEnumerationsAreThoseOfTheColumns) {
    for (Resource const& resource : resources())
        for (List const& list : resource.lists) {
            OpenApi const& row = followed(document("/api/v1/" + std::string(resource.name))
                                              .at("properties")
                                              .at(std::string(list.key))
                                              .at("items"));
            for (Part const& part : list.parts)
                for (std::size_t i = 0; i < part.table->columnCount(); ++i) {
                    ColumnHead const head = part.table->column(i);
                    std::string const key = keyOf(head.name, part.prefix, head.type);
                    if (!part.object.empty() || !row["properties"].contains(key)) continue;
                    OpenApi const& schema = row["properties"][key];
                    if (!schema.contains("enum") || !head.details.bits.empty()) continue;
                    std::set<std::string> names;
                    for (NamedNumber const& named : head.details.names)
                        names.insert(named.name);
                    std::set<std::string> described;
                    for (auto const& name : schema["enum"])
                        if (name.is_string()) described.insert(name);
                    EXPECT_EQ(described, names) << list.key << ' ' << key;
                }
        }
}

} // namespace
} // namespace kvloamd
