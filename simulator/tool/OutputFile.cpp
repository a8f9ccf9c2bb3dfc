// SPDX-License-Identifier: BSD-2-Clause
// Writes a file whole or not at all.
#include "simulator/tool/OutputFile.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>

#include "simulator/tool/ControlClient.h"

namespace kvlsim {

void writeWholeFile(std::string const& path, std::string const& text) {
    struct stat target {};
    // A pipe or a terminal cannot be replaced; a file that is written aside would be a new one.
    bool const special = stat(path.c_str(), &target) == 0 && !S_ISREG(target.st_mode);
    std::string aside = special ? path : path + ".XXXXXX";
    int const fd = special ? -1 : mkstemp(aside.data());
    std::FILE* const file =
        special ? std::fopen(path.c_str(), "we") : (fd < 0 ? nullptr : fdopen(fd, "w"));
    bool good = file != nullptr;
    int error = errno;
    if (good) {
        good = special || fchmod(fd, S_IRUSR | S_IWUSR | S_IRGRP | S_IROTH) == 0;
        good = std::fwrite(text.data(), 1, text.size(), file) == text.size() && good;
        good = std::fclose(file) == 0 && good;
        good = (special || (good && rename(aside.c_str(), path.c_str()) == 0)) && good;
        error = errno;
    }
    if (good) return;
    if (fd >= 0) unlink(aside.c_str());
    throw ToolError(path + ": cannot be written (" + std::strerror(error) +
                    "); choose a place that is writable and has room");
}

} // namespace kvlsim
