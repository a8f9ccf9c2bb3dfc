// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/CallWatch.h"

#include <utility>

#include "agent/notifications/StandardNotifications.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// isdnBearerOperStatus.
constexpr int kIdle = 1;

/// isdnBearerCallOrigin of a channel that has had no call.
constexpr int kNoOrigin = 1;

bool hasFailed(BearerRow const& row) {
    return row.operStatus == kIdle && row.call.origin != kNoOrigin && !row.call.connected;
}

} // namespace

void CallWatch::update(Rows<BearerRow> const& bearers, Clock::time_point begun) {
    std::vector<Call> calls;
    calls.reserve(bearers.size());
    auto former = m_calls.begin();
    for (BearerRow const& row : bearers) {
        Call const now{row.ifIndex, row.call.setupTime, row.call.connected, hasFailed(row)};
        while (former != m_calls.end() && former->ifIndex < row.ifIndex)
            ++former;
        bool const stayed = former != m_calls.end() && former->ifIndex == row.ifIndex;
        bool const isNew = stayed && former->setupTime != now.setupTime;
        bool const connected = stayed && now.connected && (isNew || !former->connected);
        bool const failed = stayed && now.failed && (isNew || !former->failed);
        if ((connected || failed) && isEnabled(row)) {
            if (connected) m_failed.erase(row.call.peerAddress);
            if (connected || isFirstFailure(row.call.peerAddress))
                m_queue.push(callInformation(row, m_counters, begun));
        }
        calls.push_back(now);
    }
    m_calls = std::move(calls);
}

bool CallWatch::isEnabled(BearerRow const& row) const {
    return m_settings.find({Setting::CallInformationTraps, row.signalling}) == kEnabled;
}

bool CallWatch::isFirstFailure(std::string const& peer) {
    if (m_failed.size() >= kMostPeers) m_failed.clear();
    return m_failed.insert(peer).second;
}

} // namespace kvloamd
