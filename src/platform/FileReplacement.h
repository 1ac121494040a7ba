#pragma once

#include "platform/Error.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <span>
#include <string>

struct stat;

namespace qvct {

/// One stretch of a file to be made: new bytes, or a range of the file that is being replaced.
struct FilePiece {
    std::string bytes;         ///< Used when `length` is 0.
    std::uint64_t offset = 0;  ///< In the old file.
    std::uint64_t length = 0;
};

/// What tells one state of a file from another.
struct FileStamp {
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    std::uint64_t size = 0;
    std::int64_t modifiedNanoseconds = 0;

    static FileStamp of(const struct stat& status);
    bool operator==(const FileStamp&) const = default;
};

struct FileReplacementOptions {
    bool keepsTimes = false;  ///< The new file takes over the times of access and change.
    /// The state of the old file that the pieces were made for; another one is an error.
    std::optional<FileStamp> expected;
    /// Asked with the path of the finished new file before it takes its place; false abandons it.
    std::function<bool(const std::string& newFile, Error* error)> check;
};

/// Replaces the file at `path` (or makes it) so that at any instant, and after a crash at any instant, either
/// the old or the new contents stand there, whole. Every write of the framework goes through here.
///
/// The pieces go, one after the other, to a new file in the same folder, which takes over the old one's mode,
/// owner (where permitted) and extended attributes, is flushed and renamed over it; then the folder is
/// flushed. Ranges of the old file share their blocks with it where the file system can. A symbolic link at
/// `path` is followed, so that the link stays. Another hard link to the old file keeps the old contents: a
/// backup made of hard links must not change. A file without write permission is refused, although its folder
/// would allow to replace it. On failure the old file stands untouched and the new one is removed.
bool replaceFileByPieces(const std::string& path, std::span<const FilePiece> pieces,
                         const FileReplacementOptions& options = {}, Error* error = nullptr);

}  // namespace qvct
