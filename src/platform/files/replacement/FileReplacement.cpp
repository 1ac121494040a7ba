#include "platform/files/replacement/FileReplacement.h"

#include "platform/files/FileDescriptor.h"
#include "platform/files/replacement/FileCopy.h"
#include "platform/files/replacement/UnfinishedFile.h"
#include "platform/text/Text.h"
#include "platform/text/Url.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <string_view>

#include <fcntl.h>
#include <fmt/format.h>
#include <linux/magic.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/vfs.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace qvct {
namespace {

std::uint64_t lengthOf(const FilePiece& piece) {
    return piece.length > 0 ? piece.length : piece.bytes.size();
}

/// The end of the leading ranges that keep their place in the file. All up to there is copied in one go,
/// which is fastest and shares most blocks; the new bytes between the ranges are then written over the copy.
std::uint64_t endOfUnmoved(std::span<const FilePiece> pieces) {
    std::uint64_t position = 0;
    std::uint64_t end = 0;
    for (const FilePiece& piece : pieces) {
        const bool isRange = piece.length > 0;
        if (isRange && piece.offset != position) break;
        position += lengthOf(piece);
        if (isRange) end = position;
    }
    return end;
}

void flushFolder(const std::string& folder) {
    const FileDescriptor descriptor(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (descriptor.isOpen()) ::fsync(descriptor.number());
}

std::string folderOf(const std::string& path) {
    const std::size_t slash = path.rfind('/');
    return slash == std::string::npos ? "./" : path.substr(0, slash + 1);
}

/// Renames the file and flushes its folder, so that the new name is on the disk. False, and `errno` says why,
/// when it cannot be renamed.
bool renameOnDisk(const std::string& from, const std::string& to) {
    if (::rename(from.c_str(), to.c_str()) != 0) return false;
    flushFolder(folderOf(to));
    return true;
}

/// Attributes that the system guards may be left behind; a user's may not.
bool isOptionalAttribute(std::string_view name) {
    return name.starts_with("security.") || name.starts_with("trusted.");
}

bool takeOverAttributes(int from, int to) {
    const ssize_t length = ::flistxattr(from, nullptr, 0);
    if (length <= 0) return length == 0 || errno == ENOTSUP;
    std::string names(static_cast<std::size_t>(length), '\0');
    const ssize_t listed = ::flistxattr(from, names.data(), names.size());
    if (listed < 0) return false;
    names.resize(static_cast<std::size_t>(listed));
    for (std::size_t at = 0; at < names.size(); at += std::strlen(&names[at]) + 1) {
        const char* name = &names[at];
        const ssize_t size = ::fgetxattr(from, name, nullptr, 0);
        std::string value(static_cast<std::size_t>(std::max<ssize_t>(size, 0)), '\0');
        const bool taken = size >= 0 && ::fgetxattr(from, name, value.data(), value.size()) == size &&
                           ::fsetxattr(to, name, value.data(), value.size(), 0) == 0;
        if (!taken && !isOptionalAttribute(name)) return false;
    }
    return true;
}

/// The mode for a file that could not keep its group: the new group may do no more than everybody may.
mode_t withoutGroup(mode_t mode) {
    const mode_t others = mode & 07U;
    return (mode & ~mode_t{070}) | (mode & (others << 3U));
}

void takeOverOwner(const struct stat& old, int to) {
    if (::fchown(to, old.st_uid, old.st_gid) == 0) return;
    [[maybe_unused]] const int ignored = ::fchown(to, static_cast<uid_t>(-1), old.st_gid);
}

/// To be called after the owner was changed, which clears bits of the mode, and after the attributes were,
/// some of which control access.
bool takeOverMode(const struct stat& old, int to) {
    struct stat now {};
    if (::fstat(to, &now) != 0) return false;
    mode_t mode = old.st_mode & 07777U;
    if (now.st_uid != old.st_uid) mode &= 01777U;
    if (now.st_gid != old.st_gid) mode = withoutGroup(mode & 01777U);
    return ::fchmod(to, mode) == 0;
}

bool takeOverTimes(const struct stat& old, int to) {
    const struct timespec times[2] = {old.st_atim, old.st_mtim};
    return ::futimens(to, times) == 0;
}

/// Whether the error means that the file system does not support this kind of renaming.
bool isUnsupported(int reason) {
    return reason == EINVAL || reason == ENOSYS || reason == ENOTSUP;
}

/// Whether files keep their inode number when they are renamed: on an overlay they may not.
bool keepsInodes(int file) {
    struct statfs system {};
    return ::fstatfs(file, &system) != 0 || system.f_type != OVERLAYFS_SUPER_MAGIC;
}

/// One replacement under way.
class Replacement {
  public:
    Replacement(const std::string& path, const FileReplacementOptions& options, Error* error)
        : path_(path), options_(options), error_(error) {
        std::error_code notThere;
        const std::filesystem::path resolved = std::filesystem::canonical(path, notThere);
        target_ = notThere ? path : resolved.string();
        folder_ = folderOf(target_);
    }

    bool run(std::span<const FilePiece> pieces) {
        if (!openOld()) return false;
        if (options_.isDryRun) return canMakeFile();
        std::error_code notMade;  // making the file will fail, and say why
        if (options_.makesFolders) std::filesystem::create_directories(folder_, notMade);
        removeLeftFiles(folder_);
        UnfinishedFile made(folder_, old_ ? 0600 : 0666);
        if (!made.isOpen()) return failToMake();
        if (!write(pieces, made.descriptor())) return false;
        if (options_.check && !options_.check(made.path(), error_)) return false;
        return takeOver(made) && takePlace(made);
    }

  private:
    /// Opens the old file, if there is one. False when it must not be replaced, or that cannot be found out.
    bool openOld() {
        struct stat status {};
        if (::stat(target_.c_str(), &status) != 0) {
            if (errno != ENOENT) return refuseFor("cannot be opened");
            const bool isLink = ::lstat(target_.c_str(), &status) == 0;
            return isLink ? refuse("is a link that leads nowhere") : isExpected({});
        }
        if (!S_ISREG(status.st_mode)) return refuse("is not a regular file");
        constexpr mode_t kAnyWrite = S_IWUSR | S_IWGRP | S_IWOTH;
        if ((status.st_mode & kAnyWrite) == 0 ||
            ::faccessat(AT_FDCWD, target_.c_str(), W_OK, AT_EACCESS) != 0) {
            return refuse("is protected from writing");
        }
        old_.emplace(::open(target_.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
        if (!old_->isOpen() || ::fstat(old_->number(), &status_) != 0) {
            return refuseFor("cannot be opened");
        }
        return isReplaceable() && isExpected(FileStamp::of(status_));
    }

    /// In a folder where everybody may make files (such as that for temporary files), only its owner may
    /// replace a file.
    bool isReplaceable() const {
        struct stat folder {};
        const uid_t user = ::geteuid();
        if (user == 0 || user == status_.st_uid || ::stat(folder_.c_str(), &folder) != 0) return true;
        if ((folder.st_mode & S_ISVTX) == 0 || user == folder.st_uid) return true;
        return refuse("lies in a folder where only its owner may replace it");
    }

    bool canMakeFile() const {
        std::filesystem::path folder = folder_;
        std::error_code unknown;
        while (options_.makesFolders && !exists(folder, unknown) && folder.has_relative_path())
            folder = folder.parent_path();
        // The dot makes it an error when that is no folder.
        return ::faccessat(AT_FDCWD, (folder / ".").c_str(), W_OK | X_OK, AT_EACCESS) == 0 || failToMake();
    }

    bool refuse(std::string reason) const {
        return fail(error_, kErrorUnwritable, std::move(reason), {path_});
    }

    /// With what the system says.
    bool refuseFor(std::string_view action) const {
        return refuse(fmt::format("{}: {}", action, std::strerror(errno)));
    }

    bool failToMake() const { return refuseFor("cannot make a file beside it"); }

    bool isExpected(const FileStamp& stamp) const {
        return !options_.expected || stamp == *options_.expected || failForOtherSave();
    }

    bool failForOtherSave() const { return refuse("was changed by another program meanwhile"); }

    bool write(std::span<const FilePiece> pieces, int to) const {
        const std::uint64_t unmoved = endOfUnmoved(pieces);
        if (unmoved > 0 && !copy(0, unmoved, to, 0)) return false;
        std::uint64_t position = 0;
        for (const FilePiece& piece : pieces) {
            const std::uint64_t end = position + lengthOf(piece);
            const bool isRange = piece.length > 0;
            const bool isDone = isRange && end <= unmoved;
            if (isRange && !isDone && !copy(piece.offset, piece.length, to, position)) return false;
            if (!isRange && !writeAll(to, piece.bytes, position)) return failToWrite(position);
            position = end;
        }
        return endsAt(position, to) || failToWrite(position);
    }

    /// A hole at the end was not written, so the file must be extended to its full length.
    static bool endsAt(std::uint64_t size, int to) {
        struct stat status {};
        if (::fstat(to, &status) != 0) return false;
        return static_cast<std::uint64_t>(status.st_size) == size ||
               ::ftruncate(to, static_cast<off_t>(size)) == 0;
    }

    bool copy(std::uint64_t offset, std::uint64_t length, int to, std::uint64_t position) const {
        if (!old_) return refuse("does not exist");
        return copyRange({old_->number(), offset, length, to, position}) || failToWrite(position);
    }

    bool failToWrite(std::uint64_t position) const {
        return refuseFor(fmt::format("cannot write the new contents at byte {}", position));
    }

    bool takeOver(const UnfinishedFile& made) const {
        const int to = made.descriptor();
        if (!old_) {
            return ::fchmod(to, made.modeAtCreation()) == 0 || refuseFor("cannot be given its mode");
        }
        takeOverOwner(status_, to);
        if (!takeOverAttributes(old_->number(), to)) {
            return refuseFor("cannot keep its extended attributes");
        }
        if (!takeOverMode(status_, to)) return refuseFor("cannot keep its mode");
        return !options_.keepsTimes || takeOverTimes(status_, to) || refuseFor("cannot keep its times");
    }

    bool takePlace(UnfinishedFile& made) const {
        if (::fsync(made.descriptor()) != 0) return refuseFor("cannot be flushed");
        if (options_.expected && !isExpected(FileStamp::ofFile(target_))) return false;
        const EndingSignalsHeld held;
        const bool isDone = !options_.expected ? takePlaceOfAny(made)
                            : old_             ? exchange(made)
                                               : takeEmptyPlace(made);
        made.remove();
        return isDone;
    }

    bool takePlaceOfAny(UnfinishedFile& made) const {
        if (!renameOnDisk(made.path(), target_)) return refuseFor("cannot be replaced");
        made.release();
        return true;
    }

    bool takeEmptyPlace(UnfinishedFile& made) const {
        const int done =
            ::renameat2(AT_FDCWD, made.path().c_str(), AT_FDCWD, target_.c_str(), RENAME_NOREPLACE);
        if (done != 0 && errno == EEXIST) return failForOtherSave();
        if (done != 0 && isUnsupported(errno)) return takePlaceOfAny(made);
        if (done != 0) return refuseFor("cannot be made");
        made.release();
        flushFolder(folder_);
        return true;
    }

    bool exchange(UnfinishedFile& made) const {
        ::flock(old_->number(), LOCK_SH | LOCK_NB);  // so that nobody removes it as left behind
        if (!made.renameForExchangeWith(*options_.expected)) {
            return refuseFor("cannot be replaced");
        }
        const FileStamp placed = FileStamp::ofFile(made.path());
        if (!exchangeOnce(made)) {
            if (errno == ENOENT) return failForOtherSave();
            if (isUnsupported(errno)) return takePlaceOfAny(made);
            return refuseFor("cannot be replaced");
        }
        if (!isOld(FileStamp::ofFile(made.path()))) return putBack(made, placed);
        // The old file is removed only after the new one's name is on the disk.
        flushFolder(folder_);
        return true;
    }

    bool exchangeOnce(const UnfinishedFile& made) const {
        return ::renameat2(AT_FDCWD, made.path().c_str(), AT_FDCWD, target_.c_str(), RENAME_EXCHANGE) == 0;
    }

    bool isOld(FileStamp stamp) const {
        if (!keepsInodes(old_->number())) {
            stamp.device = options_.expected->device;
            stamp.inode = options_.expected->inode;
        }
        return stamp == *options_.expected;
    }

    /// Exchanges the files back; repeats if the other program saved again, until the file taken out is ours.
    bool putBack(UnfinishedFile& made, FileStamp placed) const {
        for (bool isDone = false; !isDone;) {
            const FileStamp saved = FileStamp::ofFile(made.path());
            if (!exchangeOnce(made)) {
                refuseFor(
                    fmt::format("was changed by another program meanwhile, whose contents stand in "
                                "{} and cannot be put back",
                                printable(made.path())));
                made.release();
                return false;
            }
            isDone = FileStamp::ofFile(made.path()) == placed;
            placed = saved;
        }
        return failForOtherSave();
    }

    const std::string& path_;
    const FileReplacementOptions& options_;
    Error* error_;
    std::string target_;
    std::string folder_;
    std::optional<FileDescriptor> old_;
    struct stat status_ {};
};

}  // namespace

FileStamp FileStamp::of(const struct stat& status) {
    return {status.st_dev, status.st_ino, static_cast<std::uint64_t>(status.st_size),
            std::int64_t{status.st_mtim.tv_sec} * 1'000'000'000 + status.st_mtim.tv_nsec};
}

FileStamp FileStamp::ofFile(const std::string& path) {
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 ? of(status) : FileStamp{};
}

bool replaceFileByPieces(const std::string& path, std::span<const FilePiece> pieces,
                         const FileReplacementOptions& options, Error* error) {
    if (isURLText(path)) {
        return fail(error, kErrorInvalidArgument, "is no file URL", {path});
    }
    return Replacement(path, options, error).run(pieces);
}

bool renameFlushed(const std::string& from, const std::string& to, Error* error) {
    return renameOnDisk(from, to) ||
           fail(error, kErrorUnwritable, fmt::format("cannot be moved: {}", std::strerror(errno)), {from});
}

}  // namespace qvct
