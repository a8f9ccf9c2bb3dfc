// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/metrics/ProcessUsage.h"

#include <sys/resource.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <system_error>
#include <vector>

namespace kvloamd {

namespace {

// The places of fields in /proc/self/stat behind the program's name, which is in parentheses.
constexpr std::size_t kUserTicks = 11;
constexpr std::size_t kSystemTicks = 12;
constexpr std::size_t kThreads = 17;
constexpr std::size_t kVirtualBytes = 20;
constexpr std::size_t kResidentPages = 21;

std::vector<std::int64_t> statFields() {
    std::ifstream file("/proc/self/stat");
    std::string const text{std::istreambuf_iterator<char>(file), {}};
    auto const name = text.rfind(')');
    if (name == std::string::npos || name + 2 >= text.size()) return {};
    std::istringstream rest(text.substr(name + 3)); // the state is a letter
    std::vector<std::int64_t> fields{0};
    for (std::string field; fields.size() <= kResidentPages && rest >> field;) {
        std::istringstream number(field);
        std::int64_t value = 0;
        number >> value;
        fields.push_back(value);
    }
    return fields;
}

std::optional<std::int64_t> countDescriptors() {
    std::error_code error;
    std::filesystem::directory_iterator entries("/proc/self/fd", error);
    std::int64_t count = 0;
    for (; !error && entries != std::filesystem::directory_iterator(); entries.increment(error))
        ++count;
    if (error) return std::nullopt;
    return count - 1; // the one of the folder itself
}

} // namespace

ProcessUsage readProcessUsage() {
    ProcessUsage usage;
    auto const fields = statFields();
    if (fields.size() > kResidentPages) {
        usage.cpuSeconds = static_cast<double>(fields[kUserTicks] + fields[kSystemTicks]) /
                           static_cast<double>(sysconf(_SC_CLK_TCK));
        usage.threads = fields[kThreads];
        usage.virtualBytes = fields[kVirtualBytes];
        usage.residentBytes = fields[kResidentPages] * sysconf(_SC_PAGESIZE);
    }
    usage.openDescriptors = countDescriptors();
    rlimit limit{};
    if (getrlimit(RLIMIT_NOFILE, &limit) == 0 && limit.rlim_cur != RLIM_INFINITY)
        usage.mostDescriptors = static_cast<std::int64_t>(limit.rlim_cur);
    return usage;
}

} // namespace kvloamd
