// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/SnmpHandler.h"

#include <algorithm>
#include <limits>
#include <span>
#include <utility>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

#include "agent/fronts/PendingChange.h"
#include "agent/fronts/snmp/SnmpValues.h"
#include "agent/fronts/snmp/Visible.h"

namespace kvloamd {

namespace {

constexpr oid kHighest = std::numeric_limits<std::uint32_t>::max();

constexpr char kSnapshotKey[] = "kvloam_snapshot";
constexpr char kSetKey[] = "kvloam_set";

using HeldSnapshot = std::shared_ptr<Snapshot const>;

void freeSnapshot(void* held) {
    delete static_cast<HeldSnapshot*>(held);
}

void freeChange(void* held) {
    delete static_cast<PendingChange*>(held);
}

} // namespace

/// A `Call` is one call of the library with the variables of one PDU that are below our names.
struct SnmpHandler::Call {
    SnmpHandler const& handler;
    Facts facts;
    netsnmp_pdu* pdu;
    Instance instance;
    std::vector<oid> name;
    OidView seenObject;           ///< the object whose view was asked for last
    bool seesWholeObject = false; ///< whether the client may see all instances of it

    static int answer(netsnmp_mib_handler* library, netsnmp_handler_registration* /*place*/,
                      netsnmp_agent_request_info* info, netsnmp_request_info* requests);

    static Snapshot const& snapshotOf(SnmpHandler const& handler, netsnmp_agent_request_info* info);
    /// The part of the variable's name below the arc. A name outside the arc becomes one that
    /// sorts before or after all of ours.
    Oid relative(netsnmp_variable_list const* variable, bool& orEqual) const;
    /// Sets `name` to an absolute name.
    void setName(OidView relativeName);
    /// Asks the library whether the client may see all of a subtree, some of it, or nothing.
    int viewOf(OidView subtree);
    /// Whether the client may see the instance. Asks the library once for each object, and for each
    /// instance only if the client may see some instances of the object and not others.
    bool shows(Instance const& found);
    void get(netsnmp_request_info* request);
    void getNext(netsnmp_request_info* request);
    void getBulk(netsnmp_request_info* request);
    /// Checks whether it can be set. The library tests all variables before it sets the first.
    void testSet(netsnmp_request_info* request);
    static PendingChange* pendingChange(netsnmp_request_info* request);
    void commitSet(netsnmp_request_info* request);
    /// Undoes the changes that were made, last to first.
    void undoSets(netsnmp_request_info* requests);
};

int SnmpHandler::Call::answer(netsnmp_mib_handler* library, netsnmp_handler_registration* /*place*/,
                              netsnmp_agent_request_info* info, netsnmp_request_info* requests) {
    auto const& handler = *static_cast<SnmpHandler const*>(library->myvoid);
    Call call{handler,
              {snapshotOf(handler, info), handler.m_counters, &handler.m_settings},
              info->asp->pdu,
              {},
              {},
              {}};
    if (info->mode == MODE_SET_UNDO) {
        call.undoSets(requests);
        return SNMP_ERR_NOERROR;
    }
    for (netsnmp_request_info* request = requests; request != nullptr; request = request->next) {
        if (request->processed != 0) continue;
        switch (info->mode) {
        case MODE_GET:
            call.get(request);
            break;
        case MODE_GETNEXT:
            call.getNext(request);
            break;
        case MODE_GETBULK:
            call.getBulk(request);
            break;
        case MODE_SET_RESERVE1:
            call.testSet(request);
            break;
        case MODE_SET_ACTION:
            call.commitSet(request);
            break;
        default: // the other steps of a SET have nothing to do
            break;
        }
    }
    return SNMP_ERR_NOERROR;
}

Snapshot const& SnmpHandler::Call::snapshotOf(SnmpHandler const& handler,
                                              netsnmp_agent_request_info* info) {
    // The library may call several times for one PDU; all of its variables come from one snapshot.
    auto* held = static_cast<HeldSnapshot*>(netsnmp_agent_get_list_data(info, kSnapshotKey));
    if (held == nullptr) {
        held = new HeldSnapshot(handler.m_takeSnapshot());
        netsnmp_agent_add_list_data(info,
                                    netsnmp_create_data_list(kSnapshotKey, held, freeSnapshot));
    }
    return **held;
}

Oid SnmpHandler::Call::relative(netsnmp_variable_list const* variable, bool& orEqual) const {
    Oid const& arc = handler.m_arc;
    std::span<oid const> const asked(variable->name, variable->name_length);
    auto const [differs, differsFrom] = std::ranges::mismatch(asked, arc);
    if (differsFrom == arc.end()) {
        Oid rest(static_cast<std::size_t>(asked.end() - differs));
        std::transform(differs, asked.end(), rest.begin(), [](oid number) {
            return static_cast<std::uint32_t>(std::min(number, kHighest));
        });
        return rest;
    }
    orEqual = true;
    bool const before = differs == asked.end() || *differs < *differsFrom;
    return before ? Oid{} : Oid{static_cast<std::uint32_t>(kHighest)};
}

void SnmpHandler::Call::get(netsnmp_request_info* request) {
    bool orEqual = false;
    switch (handler.m_tree.find(facts, relative(request->requestvb, orEqual), instance)) {
    case Lookup::Found:
        setVariable(request->requestvb, instance.type, instance.value);
        break;
    case Lookup::NoSuchObject:
        netsnmp_request_set_error(request, SNMP_NOSUCHOBJECT);
        break;
    case Lookup::NoSuchInstance:
        netsnmp_request_set_error(request, SNMP_NOSUCHINSTANCE);
        break;
    }
}

void SnmpHandler::Call::setName(OidView relativeName) {
    name.assign(handler.m_arc.begin(), handler.m_arc.end());
    name.insert(name.end(), relativeName.begin(), relativeName.end());
}

int SnmpHandler::Call::viewOf(OidView subtree) {
    setName(subtree);
    return netsnmp_acm_check_subtree(pdu, name.data(), name.size());
}

bool SnmpHandler::Call::shows(Instance const& found) {
    if (found.object.data() != seenObject.data()) {
        seenObject = found.object;
        // The first version hides instances by their type, too.
        seesWholeObject = pdu->version != SNMP_VERSION_1 && viewOf(found.object) == VACM_SUCCESS;
    }
    if (seesWholeObject) return true;
    setName(found.name);
    std::size_t length = name.size();
    return in_a_view(name.data(), &length, pdu, asnTypeOf(found.type)) == VACM_SUCCESS;
}

void SnmpHandler::Call::getNext(netsnmp_request_info* request) {
    bool orEqual = request->inclusive != 0;
    Oid const after = relative(request->requestvb, orEqual);
    auto const isEnd = [&](OidView found) {
        setName(found);
        return snmp_oid_compare(name.data(), name.size(), request->range_end,
                                request->range_end_len) >= 0;
    };
    // The library checks access only for a GETBULK's first variable; check every one here.
    View const view{[&](Instance const& found) { return shows(found); },
                    [&](OidView subtree) {
                        int const seen = viewOf(subtree);
                        return seen != VACM_SUCCESS && seen != VACM_SUBTREE_UNKNOWN;
                    }};
    // If a variable is left unchanged, the library asks the handler of the names after ours.
    if (!nextVisible(handler.m_tree, facts, after, orEqual, isEnd, view, instance)) return;
    setName(instance.name);
    snmp_set_var_objid(request->requestvb, name.data(), name.size());
    setVariable(request->requestvb, instance.type, instance.value);
}

void SnmpHandler::Call::getBulk(netsnmp_request_info* request) {
    for (;;) {
        getNext(request);
        if (request->requestvb->type == ASN_NULL || request->requestvb->type == ASN_PRIV_RETRY)
            return;
        if (request->repeat <= 0 || request->requestvb->next_variable == nullptr) return;
        --request->repeat;
        netsnmp_variable_list const* const answered = request->requestvb;
        request->requestvb = request->requestvb->next_variable;
        snmp_set_var_objid(request->requestvb, answered->name, answered->name_length);
        request->requestvb->type = ASN_PRIV_RETRY;
        request->inclusive = 0;
    }
}

void SnmpHandler::Call::testSet(netsnmp_request_info* request) {
    netsnmp_variable_list const& variable = *request->requestvb;
    Value asked;
    if (variable.type == ASN_INTEGER)
        asked = std::int64_t{*variable.val.integer};
    else if (variable.type == ASN_OCTET_STR)
        asked =
            std::string_view(reinterpret_cast<char const*>(variable.val.string), variable.val_len);
    bool orEqual = false;
    std::optional<Change> change;
    SetFault const fault = handler.m_tree.test(facts, relative(&variable, orEqual), asked, change);
    if (fault != SetFault::None || !change) {
        netsnmp_request_set_error(request, errorStatusOf(fault));
        return;
    }
    netsnmp_request_add_list_data(
        request,
        netsnmp_create_data_list(kSetKey, new PendingChange(*std::move(change)), freeChange));
}

PendingChange* SnmpHandler::Call::pendingChange(netsnmp_request_info* request) {
    return static_cast<PendingChange*>(netsnmp_request_get_list_data(request, kSetKey));
}

void SnmpHandler::Call::commitSet(netsnmp_request_info* request) {
    if (PendingChange* const change = pendingChange(request)) change->commit(handler.m_settings);
}

void SnmpHandler::Call::undoSets(netsnmp_request_info* requests) {
    netsnmp_request_info* last = requests;
    while (last->next != nullptr)
        last = last->next;
    for (netsnmp_request_info* request = last; request != nullptr; request = request->prev)
        if (PendingChange* const change = pendingChange(request)) change->undo(handler.m_settings);
}

SnmpHandler::SnmpHandler(ObjectTree const& tree, Counters const& counters, Oid arc,
                         TakeSnapshot takeSnapshot, Settings& settings)
    : m_tree(tree),
      m_counters(counters),
      m_arc(std::move(arc)),
      m_takeSnapshot(std::move(takeSnapshot)),
      m_settings(settings) {}

bool SnmpHandler::serve(Oid const& place) {
    std::vector<oid> root(m_arc.begin(), m_arc.end());
    root.insert(root.end(), place.begin(), place.end());
    netsnmp_handler_registration* const registration =
        netsnmp_create_handler_registration("kvloam", &Call::answer, root.data(), root.size(),
                                            HANDLER_CAN_RWRITE | HANDLER_CAN_GETBULK);
    if (registration == nullptr) return false;
    registration->handler->myvoid = this;
    return netsnmp_register_handler(registration) == MIB_REGISTERED_OK;
}

} // namespace kvloamd
