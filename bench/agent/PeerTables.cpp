// SPDX-License-Identifier: BSD-2-Clause
#include "PeerTables.h"

#include <stdexcept>
#include <vector>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

#include "IntervalRows.h"

namespace {

using kvloamd::InterfaceRows;
using kvloamd::LineCounts;
using kvloamd::LineRow;
using kvloamd::Oid;

/// A closed interval.
struct Row {
    long line;
    long interval;
    LineCounts counts;
};

constexpr unsigned kLastColumn = kFirstCounterColumn + kCounters;

void answer(netsnmp_request_info* request, Row const* row) {
    netsnmp_table_request_info const* const asked = netsnmp_extract_table_info(request);
    if (row == nullptr || asked == nullptr) return;
    long value = 0;
    u_char type = ASN_INTEGER;
    if (asked->colnum == 1) {
        value = row->line;
    } else if (asked->colnum == 2) {
        value = row->interval;
    } else if (asked->colnum == kLastColumn) {
        value = row->interval < static_cast<long>(kIntervalsOfALine) ? 1 : 2;
    } else {
        type = ASN_GAUGE;
        value = row->counts[asked->colnum - kFirstCounterColumn];
    }
    snmp_set_var_typed_value(request->requestvb, type, &value, sizeof value);
}

int answerTableData(netsnmp_mib_handler* /*handler*/, netsnmp_handler_registration* /*place*/,
                    netsnmp_agent_request_info* /*info*/, netsnmp_request_info* requests) {
    for (; requests != nullptr; requests = requests->next)
        if (requests->processed == 0)
            answer(requests, static_cast<Row const*>(netsnmp_extract_table_row_data(requests)));
    return SNMP_ERR_NOERROR;
}

int answerIterator(netsnmp_mib_handler* /*handler*/, netsnmp_handler_registration* /*place*/,
                   netsnmp_agent_request_info* /*info*/, netsnmp_request_info* requests) {
    for (; requests != nullptr; requests = requests->next)
        if (requests->processed == 0)
            answer(requests, static_cast<Row const*>(netsnmp_extract_iterator_context(requests)));
    return SNMP_ERR_NOERROR;
}

std::vector<Row>& allRows(InterfaceRows const& lines) {
    // The library keeps addresses of rows until the process ends.
    static std::vector<Row> rows;
    if (!rows.empty()) return rows;
    for (LineRow const& line : lines.lines)
        for (std::size_t n = 0; n < line.closedIntervals(); ++n)
            rows.push_back({line.ifIndex, static_cast<long>(n + 1), line.closed->counts[n]});
    return rows;
}

netsnmp_handler_registration* registration(char const* name, Oid const& place,
                                           Netsnmp_Node_Handler* handler) {
    std::vector<oid> root(place.begin(), place.end());
    auto* const made = netsnmp_create_handler_registration(name, handler, root.data(), root.size(),
                                                           HANDLER_CAN_RONLY);
    if (made == nullptr) throw std::runtime_error("the SNMP library refuses a table");
    return made;
}

netsnmp_variable_list* pointAt(std::vector<Row> const& rows, std::size_t row, void** loop,
                               void** data, netsnmp_variable_list* index) {
    if (row >= rows.size()) return nullptr;
    *loop = const_cast<Row*>(&rows[row]);
    *data = *loop;
    snmp_set_var_typed_integer(index, ASN_INTEGER, rows[row].line);
    snmp_set_var_typed_integer(index->next_variable, ASN_INTEGER, rows[row].interval);
    return index;
}

netsnmp_variable_list* firstRow(void** loop, void** data, netsnmp_variable_list* index,
                                netsnmp_iterator_info* info) {
    return pointAt(*static_cast<std::vector<Row>*>(info->myvoid), 0, loop, data, index);
}

netsnmp_variable_list* nextRow(void** loop, void** data, netsnmp_variable_list* index,
                               netsnmp_iterator_info* info) {
    auto const& rows = *static_cast<std::vector<Row>*>(info->myvoid);
    auto const row = static_cast<std::size_t>(static_cast<Row const*>(*loop) - rows.data());
    return pointAt(rows, row + 1, loop, data, index);
}

} // namespace

void serveByTableData(InterfaceRows const& lines) {
    netsnmp_table_data* const table = netsnmp_create_table_data("intervals");
    netsnmp_table_data_add_index(table, ASN_INTEGER);
    netsnmp_table_data_add_index(table, ASN_INTEGER);
    for (Row& row : allRows(lines)) {
        netsnmp_table_row* const entered = netsnmp_create_table_data_row();
        netsnmp_table_row_add_index(entered, ASN_INTEGER, &row.line, sizeof row.line);
        netsnmp_table_row_add_index(entered, ASN_INTEGER, &row.interval, sizeof row.interval);
        entered->data = &row;
        netsnmp_table_data_add_row(table, entered);
    }
    auto* const info = SNMP_MALLOC_TYPEDEF(netsnmp_table_registration_info);
    netsnmp_table_helper_add_indexes(info, ASN_INTEGER, ASN_INTEGER, 0);
    info->min_column = 1;
    info->max_column = kLastColumn;
    if (netsnmp_register_read_only_table_data(
            registration("table_data", kTableDataPlace, answerTableData), table, info) !=
        MIB_REGISTERED_OK)
        throw std::runtime_error("the SNMP library refuses the table_data helper");
}

void serveByIterator(InterfaceRows const& lines) {
    auto* const table = SNMP_MALLOC_TYPEDEF(netsnmp_table_registration_info);
    netsnmp_table_helper_add_indexes(table, ASN_INTEGER, ASN_INTEGER, 0);
    table->min_column = 1;
    table->max_column = kLastColumn;
    auto* const info = SNMP_MALLOC_TYPEDEF(netsnmp_iterator_info);
    info->get_first_data_point = firstRow;
    info->get_next_data_point = nextRow;
    info->table_reginfo = table;
    info->myvoid = &allRows(lines);
    if (netsnmp_register_table_iterator(
            registration("table_iterator", kIteratorPlace, answerIterator), info) !=
        MIB_REGISTERED_OK)
        throw std::runtime_error("the SNMP library refuses the table_iterator helper");
}
