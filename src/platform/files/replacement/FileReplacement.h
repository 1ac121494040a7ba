#pragma once

#include "platform/base/Error.h"
#include "platform/files/FileStamp.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <span>
#include <string>

namespace qvct {

/// One stretch of a file to be made: new bytes, or a range of the file that is being replaced.
struct FilePiece {
    std::string bytes;         ///< Used when `length` is 0.
    std::uint64_t offset = 0;  ///< In the old file.
    std::uint64_t length = 0;
};

struct FileReplacementOptions {
    bool keepsTimes = false;    ///< The new file takes over the times of access and change.
    bool isDryRun = false;      ///< All checks are made, but nothing is written.
    bool makesFolders = false;  ///< Folders that are missing on the way to the file are made.
    /// The state of the old file that the pieces were made for (an empty stamp: there was none). If anything
    /// else stands at the path when the new file is to take its place, it stays, and that is an error.
    std::optional<FileStamp> expected;
    /// Asked with the path of the finished new file before it takes its place; false abandons it.
    std::function<bool(const std::string& newFile, Error* error)> check;
};

/// Replaces the file at `path` (or makes it) so that at any instant, and after a crash at any instant, either
/// the old or the new contents stand there, whole. Every write of the framework goes through here.
///
/// The pieces go, one after the other, to a new file in the same folder, which nobody else may read. When it
/// is complete it takes over the old one's owner and group (where permitted), extended attributes and mode,
/// is flushed and takes its place; then the folder is flushed. Nobody can read it who could not read the old
/// one. Holes stay holes, and ranges of the old file share their blocks with it where the file system can. A
/// symbolic link at `path` is followed, so that the link stays. Another hard link to the old file keeps the
/// old contents: a backup made of hard links must not change. A file without write permission is refused,
/// although its folder would allow replacing it. On failure the old file stands untouched and the new one is
/// removed.
///
/// With an `expected` state the two files are exchanged, so that the file that was really at the path can be
/// examined afterwards: if another program saved there at the last moment, its file is put back. Where the
/// file system cannot exchange files, the path is only checked right before the renaming.
///
/// What a killed process leaves behind is a hidden file, which the next write in that folder removes (see
/// `UnfinishedFile`): the new contents, or the old ones after the exchange. Only if another program saved in
/// the microseconds before an exchange, and the process died in those after it, does the hidden file hold
/// what that program saved; it is then never removed.
bool replaceFileByPieces(const std::string& path, std::span<const FilePiece> pieces,
                         const FileReplacementOptions& options = {}, Error* error = nullptr);

/// Renames a file whose contents have been flushed, over another one if there is any, and flushes the folder,
/// so that it stands there after a crash, too. Both paths lie in the same folder.
bool renameFlushed(const std::string& from, const std::string& to, Error* error = nullptr);

}  // namespace qvct
