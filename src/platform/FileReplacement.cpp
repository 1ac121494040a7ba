#include "platform/FileReplacement.h"

#include "platform/FileDescriptor.h"
#include "platform/Text.h"
#include "platform/Url.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>
#include <filesystem>
#include <string_view>
#include <vector>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

namespace qvct {
namespace {

bool failFor(Error* error, std::string_view path, std::string_view reason) {
    return fail(error, kErrorUnwritable, fmt::format("{}: {}", printable(path), reason));
}

bool failWithErrno(Error* error, std::string_view path, std::string_view action) {
    return failFor(error, path, fmt::format("{}: {}", action, std::strerror(errno)));
}

bool writeAll(int descriptor, std::string_view bytes, std::uint64_t position) {
    while (!bytes.empty()) {
        const ssize_t written =
            ::pwrite(descriptor, bytes.data(), bytes.size(), static_cast<off_t>(position));
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return false;
        bytes.remove_prefix(static_cast<std::size_t>(written));
        position += static_cast<std::uint64_t>(written);
    }
    return true;
}

/// A stretch of one file, and where it goes in the other.
struct Copy {
    int from;
    std::uint64_t offset;
    std::uint64_t length;
    int to;
    std::uint64_t position;

    void advance(std::uint64_t count) {
        offset += count;
        length -= count;
        position += count;
    }
};

/// Where the kernel cannot copy by itself, and where no whole block is left to share.
bool copyThroughBuffer(Copy copy) {
    std::vector<char> buffer(std::min<std::uint64_t>(copy.length, 1U << 18U));
    while (copy.length > 0) {
        const ssize_t got =
            ::pread(copy.from, buffer.data(), std::min<std::uint64_t>(copy.length, buffer.size()),
                    static_cast<off_t>(copy.offset));
        if (got < 0 && errno == EINTR) continue;
        if (got == 0) errno = ESTALE;  // the old file shrank
        if (got <= 0) return false;
        const auto count = static_cast<std::size_t>(got);
        if (!writeAll(copy.to, {buffer.data(), count}, copy.position)) return false;
        copy.advance(count);
    }
    return true;
}

/// By the kernel, which shares whole blocks that keep their place within a block where it can.
bool copyRange(Copy copy) {
    constexpr std::uint64_t kBlock = 4096;
    while (copy.length >= kBlock) {
        auto from = static_cast<off_t>(copy.offset);
        auto to = static_cast<off_t>(copy.position);
        const std::uint64_t step = std::min<std::uint64_t>(copy.length, SSIZE_MAX / 2) / kBlock * kBlock;
        const ssize_t copied = ::copy_file_range(copy.from, &from, copy.to, &to, step, 0);
        if (copied < 0 && errno == EINTR) continue;
        const bool isFinal = errno == ENOSPC || errno == EFBIG || errno == EIO || errno == EDQUOT;
        if (copied < 0 && isFinal) return false;
        if (copied <= 0) break;
        copy.advance(static_cast<std::uint64_t>(copied));
    }
    return copyThroughBuffer(copy);
}

std::uint64_t lengthOf(const FilePiece& piece) {
    return piece.length > 0 ? piece.length : piece.bytes.size();
}

/// Where the ranges end that keep their place in the file, from its beginning on. They are copied in one go,
/// which is fastest and shares most, and the new bytes between them are then written over it.
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

/// Makes a file that nobody else has in the folder; its mode follows the process's mask.
int makeFileIn(const std::string& folder, std::string& name) {
    for (int attempt = 0; attempt < 100; ++attempt) {
        name = fmt::format("{}.qvct-{}-{}.tmp", folder, ::getpid(), attempt);
        const int descriptor = ::open(name.c_str(), O_RDWR | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (descriptor >= 0 || errno != EEXIST) return descriptor;
    }
    return -1;
}

void flushFolder(const std::string& folder) {
    const FileDescriptor descriptor(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (descriptor.isOpen()) ::fsync(descriptor.number());
}

/// A user's attributes must come along; labels that the system guards are its own affair.
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

/// The owner first, since changing it clears bits of the mode.
bool takeOverOwnerAndMode(const struct stat& old, int to) {
    mode_t mode = old.st_mode & 07777U;
    const bool owned =
        ::fchown(to, old.st_uid, old.st_gid) == 0 || ::fchown(to, static_cast<uid_t>(-1), old.st_gid) == 0;
    struct stat now {};
    if (!owned || ::fstat(to, &now) != 0 || now.st_uid != old.st_uid) mode &= 01777U;
    return ::fchmod(to, mode) == 0;
}

bool takeOverTimes(const struct stat& old, int to) {
    const struct timespec times[2] = {old.st_atim, old.st_mtim};
    return ::futimens(to, times) == 0;
}

/// One replacement under way: the new file disappears unless it took its place.
class Replacement {
  public:
    Replacement(const std::string& path, const FileReplacementOptions& options, Error* error)
        : path_(path), options_(options), error_(error) {
        std::error_code notThere;
        const std::filesystem::path resolved = std::filesystem::canonical(path, notThere);
        target_ = notThere ? path : resolved.string();
        const std::size_t slash = target_.rfind('/');
        folder_ = slash == std::string::npos ? "./" : target_.substr(0, slash + 1);
    }
    Replacement(const Replacement&) = delete;
    Replacement& operator=(const Replacement&) = delete;
    ~Replacement() {
        if (!temporary_.empty()) ::unlink(temporary_.c_str());
    }

    bool run(std::span<const FilePiece> pieces) {
        if (!openOld()) return false;
        const FileDescriptor created(makeFileIn(folder_, temporary_));
        if (!created.isOpen()) {
            temporary_.clear();
            return failWithErrno(error_, path_, "cannot make a file beside it");
        }
        const int to = created.number();
        return write(pieces, to) && takeOver(to) && finish(to);
    }

  private:
    /// False only when there is an old file that must not be replaced.
    bool openOld() {
        struct stat status {};
        if (::stat(target_.c_str(), &status) != 0) {
            return !options_.expected || failWithErrno(error_, path_, "cannot be opened");
        }
        if (!S_ISREG(status.st_mode)) return failFor(error_, path_, "is not a regular file");
        constexpr mode_t kAnyWrite = S_IWUSR | S_IWGRP | S_IWOTH;
        if ((status.st_mode & kAnyWrite) == 0 ||
            ::faccessat(AT_FDCWD, target_.c_str(), W_OK, AT_EACCESS) != 0) {
            return failFor(error_, path_, "is protected from writing");
        }
        old_.emplace(::open(target_.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
        if (!old_->isOpen() || ::fstat(old_->number(), &status_) != 0) {
            return failWithErrno(error_, path_, "cannot be opened");
        }
        return isAsExpected();
    }

    bool isAsExpected() const {
        struct stat now {};
        if (!options_.expected) return true;
        return (::fstat(old_->number(), &now) == 0 && FileStamp::of(now) == *options_.expected) ||
               failFor(error_, path_, "was changed by another program meanwhile");
    }

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
        return true;
    }

    bool copy(std::uint64_t offset, std::uint64_t length, int to, std::uint64_t position) const {
        if (!old_) return failFor(error_, path_, "does not exist");
        return copyRange({old_->number(), offset, length, to, position}) || failToWrite(position);
    }

    bool failToWrite(std::uint64_t position) const {
        return failWithErrno(error_, path_,
                             fmt::format("cannot write the new contents at byte {}", position));
    }

    bool takeOver(int to) const {
        if (!old_) return true;
        if (!takeOverOwnerAndMode(status_, to)) return failWithErrno(error_, path_, "cannot keep its mode");
        if (!takeOverAttributes(old_->number(), to)) {
            return failWithErrno(error_, path_, "cannot keep its extended attributes");
        }
        return !options_.keepsTimes || takeOverTimes(status_, to) ||
               failWithErrno(error_, path_, "cannot keep its times");
    }

    bool finish(int to) {
        if (::fsync(to) != 0) return failWithErrno(error_, path_, "cannot be flushed");
        if (options_.check && !options_.check(temporary_, error_)) return false;
        if (!isAsExpected()) return false;
        if (::rename(temporary_.c_str(), target_.c_str()) != 0) {
            return failWithErrno(error_, path_, "cannot be replaced");
        }
        temporary_.clear();
        flushFolder(folder_);
        return true;
    }

    const std::string& path_;
    const FileReplacementOptions& options_;
    Error* error_;
    std::string target_;
    std::string folder_;
    std::string temporary_;
    std::optional<FileDescriptor> old_;
    struct stat status_ {};
};

}  // namespace

FileStamp FileStamp::of(const struct stat& status) {
    return {status.st_dev, status.st_ino, static_cast<std::uint64_t>(status.st_size),
            std::int64_t{status.st_mtim.tv_sec} * 1'000'000'000 + status.st_mtim.tv_nsec};
}

bool replaceFileByPieces(const std::string& path, std::span<const FilePiece> pieces,
                         const FileReplacementOptions& options, Error* error) {
    if (isURLText(path)) {
        return fail(error, kErrorInvalidArgument, fmt::format("{}: is no file URL", printable(path)));
    }
    return Replacement(path, options, error).run(pieces);
}

}  // namespace qvct
