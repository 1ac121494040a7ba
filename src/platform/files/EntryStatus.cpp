#include "platform/files/EntryStatus.h"

#include <cerrno>

#include <sys/stat.h>

namespace qvct {
namespace {

EntryKind kindOf(mode_t mode) {
    if (S_ISREG(mode)) return EntryKind::file;
    if (S_ISDIR(mode)) return EntryKind::folder;
    return S_ISLNK(mode) ? EntryKind::link : EntryKind::other;
}

std::int64_t nanoseconds(const timespec& time) {
    constexpr std::int64_t second = 1'000'000'000;
    return time.tv_sec * second + time.tv_nsec;
}

}  // namespace

EntryStatus EntryStatus::of(const struct stat& status) {
    return {kindOf(status.st_mode),
            status.st_dev,
            status.st_ino,
            static_cast<std::uint64_t>(status.st_size),
            nanoseconds(status.st_mtim),
            nanoseconds(status.st_ctim)};
}

Presence lookAt(const std::string& path, Links links, EntryStatus& status) {
    struct stat found {};
    const int failure = links == Links::follow ? ::stat(path.c_str(), &found) : ::lstat(path.c_str(), &found);
    if (failure != 0) return errno == ENOENT || errno == ENOTDIR ? Presence::absent : Presence::unknown;
    status = EntryStatus::of(found);
    return Presence::there;
}

}  // namespace qvct
