#pragma once

#include <cstdint>
#include <string>

struct stat;

namespace qvct {

/// What stands under a name.
enum class EntryKind : unsigned char {
    file,
    folder,
    link,
    other  ///< A pipe, a socket or a device.
};

enum class Links { follow, keep };

/// What the system says of an entry. Times are nanoseconds since 1970.
struct EntryStatus {
    EntryKind kind = EntryKind::other;
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    std::uint64_t size = 0;
    std::int64_t modified = 0;
    std::int64_t changed = 0;

    static EntryStatus of(const struct stat& status);
};

enum class Presence {
    there,
    absent,
    unknown  ///< It cannot be looked at: a folder that may not be entered, a disk that fails.
};

/// What stands at the path; `status` is filled in when something does.
Presence lookAt(const std::string& path, Links links, EntryStatus& status);

}  // namespace qvct
