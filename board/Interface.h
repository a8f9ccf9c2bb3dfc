// SPDX-License-Identifier: BSD-2-Clause
// The abstract network interface.
#pragma once

#include <string>

#include "core/IID.h"
#include "core/Object.h"

namespace KVL {

/// The result of a query that an interface does not support.
inline constexpr int kNotSupported = -2;

/// An `Interface` is a network interface with the queries of the interfaces group (RFC 1213,
/// section 3.5; the values are those of IF-MIB). Every query has a body that returns
/// `kNotSupported` and leaves its arguments alone; a concrete class calls it for a query that it
/// does not support. The concrete class says which queries are thread-safe.
class KVLOAM_API Interface : public virtual Object {
  public:
    Interface();
    ~Interface() override;

    virtual int GetDescription(std::string& description) = 0;
    virtual int GetType() = 0;
    virtual int GetMTU() = 0;
    virtual int GetSpeed() = 0; ///< bit/s
    /// Fills `buffer` and sets `length` to the number of octets.
    virtual int GetPhysAddress(char* buffer, int& length) = 0;
    virtual int GetAdminStatus() = 0;
    virtual int SetAdminStatus(int status) = 0;
    virtual int GetOperStatus() = 0;
    /// The time at which the interface entered its present state: seconds and microseconds.
    virtual int GetLastChange(int& seconds, int& microseconds) = 0;
    virtual int GetInOctets() = 0;
    virtual int GetInUcastPkts() = 0;
    virtual int GetInDiscards() = 0;
    virtual int GetInErrors() = 0;
    virtual int GetInUnknownProtos() = 0;
    virtual int GetOutOctets() = 0;
    virtual int GetOutUcastPkts() = 0;
    virtual int GetOutDiscards() = 0;
    virtual int GetOutErrors() = 0;

    static IID iid() { return IID("N3KVL9InterfaceE"); }
};

} // namespace KVL
