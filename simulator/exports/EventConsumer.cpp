// SPDX-License-Identifier: BSD-2-Clause
// The platform's consumer object over the simulated event service.
#include "boardplatform/vqx_event_service.h"

#include <memory>
#include <system_error>

#include "simulator/exports/Start.h"

namespace VqxEventService {

namespace {

using Shared = std::shared_ptr<kvlsim::EventConsumer>;

Shared& consumerOf(void* impl) {
    return *static_cast<Shared*>(impl);
}

constexpr int kStarted = 0;
constexpr int kNoSuchChannel = 1;
constexpr int kNoThread = 2;

} // namespace

VqxAdminConsumer::VqxAdminConsumer(char const* channel, wchar_t const* /*consumer*/,
                                   AdminConsumer::FilterCallbackAssoc* filters, int count,
                                   char const* /*text*/, int /*flags*/)
    : m_impl(new Shared(std::make_shared<kvlsim::EventConsumer>())) {
    kvlsim::startedPlatform();
    auto& consumer = *consumerOf(m_impl);
    if (channel != nullptr) consumer.channel = channel;
    if (filters != nullptr && count > 0) consumer.filters.assign(filters, filters + count);
}

VqxAdminConsumer::~VqxAdminConsumer() {
    kvlsim::Platform::instance().events().close(consumerOf(m_impl));
    delete static_cast<Shared*>(m_impl);
}

int VqxAdminConsumer::Start() {
    auto const& consumer = consumerOf(m_impl);
    if (consumer->channel != "ADMIN" && consumer->channel != "FAULT") return kNoSuchChannel;
    try {
        kvlsim::Platform::instance().events().start(consumer);
    } catch (std::system_error const&) {
        return kNoThread;
    }
    return kStarted;
}

} // namespace VqxEventService
