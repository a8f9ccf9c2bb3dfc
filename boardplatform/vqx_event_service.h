// SPDX-License-Identifier: BSD-2-Clause
// The board platform's event service: consumers subscribe to message identifiers of a channel.
#pragma once

#include <cstddef>
#include <cstdint>

#pragma GCC visibility push(default)

/// An `AdminCallbackMsg` is one delivered message. The layout is the platform's; words are
/// little-endian.
struct AdminCallbackMsg {
    std::uint32_t id;
    unsigned char reserved[12];
    void* payload;
};

static_assert(offsetof(AdminCallbackMsg, payload) == 16);
static_assert(sizeof(AdminCallbackMsg) == 16 + sizeof(void*));

namespace VqxEventService {

/// A `CEventHandlerAdaptor` receives messages. `HandleEvent` is called on the event service's
/// delivery thread, for one message at a time; the message and its payload live only during the
/// call.
class CEventHandlerAdaptor {
  public:
    virtual int HandleEvent(AdminCallbackMsg* message, void* context) = 0;

  protected:
    ~CEventHandlerAdaptor() = default;
};

namespace AdminConsumer {

/// A `FilterCallbackAssoc` is one subscription: which message goes to which handler.
struct FilterCallbackAssoc {
    CEventHandlerAdaptor* handler;
    void* context;
    std::uint32_t id;
    std::uint32_t enabled;
};

static_assert(offsetof(FilterCallbackAssoc, context) == sizeof(void*));
static_assert(offsetof(FilterCallbackAssoc, id) == 2 * sizeof(void*));
static_assert(offsetof(FilterCallbackAssoc, enabled) == 2 * sizeof(void*) + 4);
static_assert(sizeof(FilterCallbackAssoc) == 2 * sizeof(void*) + 8);

} // namespace AdminConsumer

/// A `VqxAdminConsumer` is a consumer of one channel. It receives messages from `Start()` until it
/// is destroyed; the destructor waits for a delivery under way on another thread.
class VqxAdminConsumer {
  public:
    VqxAdminConsumer(char const* channel, wchar_t const* consumer,
                     AdminConsumer::FilterCallbackAssoc* filters, int count, char const* text,
                     int flags);
    ~VqxAdminConsumer();
    VqxAdminConsumer(VqxAdminConsumer const&) = delete;
    VqxAdminConsumer& operator=(VqxAdminConsumer const&) = delete;

    /// Begins delivery. Returns 0 on success.
    int Start();

  private:
    void* m_impl;
};

} // namespace VqxEventService

#pragma GCC visibility pop
