// SPDX-License-Identifier: BSD-2-Clause
// Prints the agent's description of its objects, one on each line: scalar or column, name, number,
// type, table, and the range that can be set.
#include <cstdio>
#include <string>

#include "agent/objects/OwnObjects.h"
#include "agent/objects/StandardObjects.h"

namespace {

using namespace kvloamd;

char const* typeName(ValueType type) {
    switch (type) {
    case ValueType::Integer:
        return "Integer";
    case ValueType::Counter:
        return "Counter";
    case ValueType::Counter64:
        return "Counter64";
    case ValueType::Gauge:
        return "Gauge";
    case ValueType::TimeTicks:
        return "TimeTicks";
    case ValueType::TimeStamp:
    case ValueType::BeginStamp:
        return "TimeStamp";
    case ValueType::Text:
        return "Text";
    case ValueType::Octets:
        return "Octets";
    case ValueType::Date:
        return "Date";
    case ValueType::ObjectId:
        return "ObjectId";
    }
    return "?";
}

std::string number(Oid const& arc, Oid const& place) {
    std::string text;
    for (Oid const& part : {arc, place})
        for (std::uint32_t const each : part)
            text += (text.empty() ? "" : ".") + std::to_string(each);
    return text;
}

char const* kindName(Kind kind) {
    switch (kind) {
    case Kind::Information:
        return "information";
    case Kind::State:
        return "state";
    case Kind::Counter:
        return "counter";
    case Kind::Gauge:
        return "gauge";
    case Kind::Time:
        break;
    }
    return "time";
}

/// What people need, a line each.
void printDetails(char const* name, ValueType type, Details const& details) {
    std::printf("help %s %s\n", name, details.help);
    std::printf("kind %s %s%s\n", name, kindName(kindOf(type, details)),
                details.isIdentifying ? " identifying" : "");
    if (*details.unit != '\0') std::printf("unit %s %s\n", name, details.unit);
    if (details.names.empty()) return;
    std::printf("%s %s", details.hasOtherNumbers ? "some-names" : "names", name);
    for (NamedNumber const& named : details.names)
        std::printf(" %d=%s", named.number, named.name);
    std::printf("\n");
}

void printScalars(Oid const& arc, std::span<Scalar const> scalars) {
    for (Scalar const& scalar : scalars) {
        std::printf("scalar %s %s %s\n", scalar.name, number(arc, scalar.place).c_str(),
                    typeName(scalar.type));
        printDetails(scalar.name, scalar.type, scalar.details);
    }
}

void printTables(Oid const& arc, std::vector<Table const*> const& tables) {
    for (Table const* const table : tables)
        for (std::size_t column = 0; column < table->columnCount(); ++column) {
            ColumnHead const head = table->column(column);
            Oid place = table->entry();
            place.push_back(head.number);
            std::printf("column %s %s %s %s", head.name, number(arc, place).c_str(),
                        typeName(head.type), table->name());
            if (auto const& writable = head.details.writable)
                std::printf(" %d %d", writable->lowest, writable->highest);
            std::printf("\n");
            printDetails(head.name, head.type, head.details);
        }
}

} // namespace

int main() {
    Oid const enterprise{1, 3, 6, 1, 4, 1, 32473};
    printScalars(enterprise, scalars());
    printTables(enterprise, tables());
    printScalars(kStandardArc, standardScalars());
    printTables(kStandardArc, standardTables());
}
