// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StateDirectory.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <stdexcept>
#include <system_error>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr char const* kFiles[] = {
    "kvloamd.conf",           "kvloamd.lock",       "ifindex.sqlite",
    "ifindex.sqlite-journal", "entity.sqlite",      "entity.sqlite-journal",
    "journal.sqlite",         "journal.sqlite-wal", "journal.sqlite-shm"};

[[noreturn]] void refuse(std::string const& path, std::string const& why) {
    throw std::runtime_error(path + ": " + why +
                             "; correct this, or choose another directory with --persistent-dir");
}

bool isTrusted(uid_t owner) {
    return owner == geteuid() || owner == 0;
}

void checkDirectory(std::string const& path) {
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0) return; // what is missing cannot be planted
    if (S_ISLNK(status.st_mode)) refuse(path, "the persistent directory is a symbolic link");
    if (!S_ISDIR(status.st_mode)) return;
    if (!isTrusted(status.st_uid)) refuse(path, "the persistent directory belongs to another user");
    if ((status.st_mode & S_IWOTH) != 0)
        refuse(path, "every user can write to the persistent directory");
}

void checkFile(std::string const& path) {
    struct stat status {};
    if (lstat(path.c_str(), &status) != 0) return;
    if (!S_ISREG(status.st_mode)) refuse(path, "is not a regular file");
    if (!isTrusted(status.st_uid)) refuse(path, "belongs to another user");
}

/// The directory holds keys, too.
void makeDirectory(std::string const& path) {
    std::error_code ignored; // a directory that cannot be created cannot be used either
    if (std::filesystem::create_directories(path, ignored))
        std::filesystem::permissions(path, std::filesystem::perms::owner_all, ignored);
}

/// The process id in a lock file; empty if there is none yet.
std::string ownerIn(int descriptor) {
    char text[16] = {};
    ssize_t const length = pread(descriptor, text, sizeof text - 1, 0);
    std::string owner(text, length < 0 ? 0 : static_cast<std::size_t>(length));
    owner.erase(std::ranges::find_if(owner, [](char c) { return c < '0' || c > '9'; }),
                owner.end());
    return owner;
}

std::string withoutSlash(std::string path) {
    // With one, the directory behind a link would be looked at.
    while (path.size() > 1 && path.ends_with('/'))
        path.pop_back();
    return path;
}

} // namespace

StateDirectory::StateDirectory(std::string const& path) {
    if (path.empty()) return;
    std::string const directory = withoutSlash(path);
    makeDirectory(directory);
    check(directory);
    lock(directory + "/kvloamd.lock");
}

void StateDirectory::check(std::string const& path) {
    if (path.empty()) return;
    std::string const directory = withoutSlash(path);
    checkDirectory(directory);
    for (char const* const file : kFiles)
        checkFile(directory + "/" + file);
}

StateDirectory::~StateDirectory() {
    if (m_lock != -1) close(m_lock);
}

void StateDirectory::lock(std::string const& file) {
    m_lock = open(file.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, S_IRUSR | S_IWUSR);
    if (m_lock == -1) {
        log(LogLevel::Warning, file + ": cannot be created: " + std::strerror(errno) +
                                   "; state is not kept across restarts; check --persistent-dir");
        return;
    }
    if (flock(m_lock, LOCK_EX | LOCK_NB) != 0) {
        int const error = errno;
        std::string const owner = ownerIn(m_lock);
        close(m_lock);
        m_lock = -1;
        if (error != EWOULDBLOCK) {
            log(LogLevel::Warning, file + ": cannot be locked: " + std::strerror(error));
            return;
        }
        throw std::runtime_error(file + ": another kvloamd" +
                                 (owner.empty() ? "" : " (process " + owner + ")") +
                                 " uses this persistent directory; stop it, or choose another "
                                 "directory with --persistent-dir");
    }
    std::string const id = std::to_string(getpid()) + "\n";
    if (ftruncate(m_lock, 0) != 0 ||
        pwrite(m_lock, id.data(), id.size(), 0) != static_cast<ssize_t>(id.size()))
        log(LogLevel::Warning, file + ": cannot be written: " + std::strerror(errno));
}

} // namespace kvloamd
