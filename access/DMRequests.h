// SPDX-License-Identifier: BSD-2-Clause
// Attribute requests and searches as the device mapper's record classes make them.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "boardplatform/dm_client.h"

namespace KVL {

/// The size of a text's buffer in a request.
inline constexpr int kDMTextSize = 128;

/// What a missing text reads as.
inline constexpr char const* kDMUnknown = "unknown";

/// A `DMNumber` is a four-byte number as the client writes it. API numbers are `long`, which may be
/// wider, so the client never writes into one.
class DMNumber {
  public:
    explicit DMNumber(std::int32_t start = 0) : m_word(start) {}

    DMAttribute request(char const* name) { return {name, &m_word, 0, 0, sizeof m_word}; }
    /// The four bytes as the client left them: what it wrote, or the start value.
    long word() const { return m_word; }
    /// What the client wrote, sign-extended if it wrote two bytes; otherwise the start value.
    long extended(DMAttribute const& request) const;
    /// The answer to `request` for a number that the record reads in place: the four bytes as they
    /// are, and -1 only if the number is missing and the request failed in part (`result`).
    long inPlace(DMAttribute const& request, int result) const {
        return result == kDMSomeAttributesFailed && request.status != 0 ? -1 : word();
    }
    /// The answer to `request`, sign-extended if it has two bytes; -1 if there is none.
    long answer(DMAttribute const& request) const;

  private:
    std::int32_t m_word;
};

/// A `DMText` is a text as the client writes it. A text that fills the buffer has no terminator.
class DMText {
  public:
    DMAttribute request(char const* name) { return {name, m_buffer, 0, 0, kDMTextSize}; }
    /// The text that the client wrote.
    std::string text() const;
    /// The answer to `request`, or `missing` if there is none.
    std::string answer(DMAttribute const& request, char const* missing) const;

  private:
    char m_buffer[kDMTextSize] = {};
};

/// Asks for an address descriptor, which the client writes in place.
inline DMAttribute descriptor_request(char const* name, QCompDesc& descriptor) {
    return {name, &descriptor, 0, 0, sizeof descriptor};
}

/// Appends the objects under `parent` that match `criterion` to `found`, at most
/// `kDMSearchCapacity`; nothing if the search fails.
void append_matches(DeviceMapperClient& client, long parent, DMAttribute criterion,
                    std::vector<long>& found);

/// The same for the objects whose "TYPE" is `type`.
void append_objects_of_type(DeviceMapperClient& client, long parent, int type,
                            std::vector<long>& found);

} // namespace KVL
