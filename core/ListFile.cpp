// SPDX-License-Identifier: BSD-2-Clause
#include "core/ListFile.h"

#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

namespace KVL {

namespace {

/// A program that closes all descriptors may have opened another file in the place of ours.
bool isOurs(ListPlace const& place) {
    struct stat now {};
    return place.file >= 0 && fstat(place.file, &now) == 0 && now.st_dev == place.device &&
           now.st_ino == place.inode;
}

std::size_t wholePages(std::size_t size) {
    auto const page = static_cast<std::size_t>(sysconf(_SC_PAGESIZE));
    return (size + page - 1) / page * page;
}

} // namespace

ListFile& ListFile::instance() {
    static auto* const file = new ListFile;
    return *file;
}

ListPlace ListFile::append(std::size_t size, std::function<void(void*)> const& construct) {
    std::scoped_lock const guard(m_mutex);
    if ((m_process != getpid() || !isOurs(m_end)) && !open()) return {};
    size = wholePages(size);
    if (ftruncate(m_end.file, m_end.offset + static_cast<off_t>(size)) != 0) return {};
    void* const block =
        mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, m_end.file, m_end.offset);
    if (block == MAP_FAILED) return {};
    construct(block);
    munmap(block, size);
    ListPlace place = m_end;
    place.size = size;
    m_end.offset += static_cast<off_t>(size);
    return place;
}

bool ListFile::open() {
    m_process = getpid();
    m_end = {};
    m_end.file = memfd_create("kvloam-lists", MFD_CLOEXEC);
    struct stat status {};
    if (m_end.file < 0 || fstat(m_end.file, &status) != 0) return false;
    m_end.device = status.st_dev;
    m_end.inode = status.st_ino;
    return true;
}

void* ListFile::map(ListPlace const& place) {
    if (!isOurs(place)) return nullptr;
    void* const block = mmap(nullptr, place.size, PROT_READ | PROT_WRITE,
                             MAP_PRIVATE | MAP_NORESERVE, place.file, place.offset);
    return block == MAP_FAILED ? nullptr : block;
}

} // namespace KVL
