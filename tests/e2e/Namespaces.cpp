// SPDX-License-Identifier: BSD-2-Clause
#include "tests/e2e/Namespaces.h"

#include <sched.h>
#include <sys/mount.h>
#include <unistd.h>

#include <fstream>
#include <string>

namespace kvloamd::e2e {

namespace {

/// Makes the user root of a new user namespace.
bool enterUserNamespace(int kinds) {
    std::string const user = std::to_string(geteuid());
    std::string const group = std::to_string(getegid());
    if (unshare(CLONE_NEWUSER | kinds) != 0) return false;
    std::ofstream("/proc/self/setgroups") << "deny";
    std::ofstream users("/proc/self/uid_map");
    std::ofstream groups("/proc/self/gid_map");
    users << "0 " << user << " 1" << std::flush;
    groups << "0 " << group << " 1" << std::flush;
    return users.good() && groups.good();
}

} // namespace

bool enterNamespaces(int kinds) {
    if (unshare(kinds) != 0 && !enterUserNamespace(kinds)) return false;
    return (kinds & CLONE_NEWNS) == 0 ||
           mount(nullptr, "/", nullptr, MS_REC | MS_PRIVATE, nullptr) == 0;
}

} // namespace kvloamd::e2e
