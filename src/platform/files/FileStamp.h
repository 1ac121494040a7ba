#pragma once

#include "platform/base/Export.h"

#include <cstdint>
#include <string>

struct stat;

namespace qvct {

/// Tells one state of a file from another. An empty stamp stands for no file.
struct QVCT_API FileStamp {
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    std::uint64_t size = 0;
    std::int64_t modifiedNanoseconds = 0;

    /// Of what the system says of a file.
    static FileStamp of(const struct stat& status);
    /// Of the file that stands at `path` now, links followed; empty where there is none.
    static FileStamp ofFile(const std::string& path);
    bool operator==(const FileStamp&) const = default;
};

}  // namespace qvct
