#include "platform/files/replacement/FileCopy.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <vector>

#include <sys/stat.h>
#include <unistd.h>

namespace qvct {
namespace {

/// Copies by reading and writing: where the kernel cannot copy, and where no whole block is left to share.
bool copyThroughBuffer(FileRange range) {
    std::vector<char> buffer(std::min<std::uint64_t>(range.length, 1U << 18U));
    while (range.length > 0) {
        const ssize_t got =
            ::pread(range.from, buffer.data(), std::min<std::uint64_t>(range.length, buffer.size()),
                    static_cast<off_t>(range.offset));
        if (got < 0 && errno == EINTR) continue;
        if (got == 0) errno = ESTALE;  // the old file shrank
        if (got <= 0) return false;
        const auto count = static_cast<std::size_t>(got);
        if (!writeAll(range.to, {buffer.data(), count}, range.position)) return false;
        range.advance(count);
    }
    return true;
}

/// By the kernel, which shares blocks where it can.
bool copyData(FileRange range) {
    constexpr std::uint64_t kBlock = 4096;
    while (range.length >= kBlock) {
        auto from = static_cast<off_t>(range.offset);
        auto to = static_cast<off_t>(range.position);
        const std::uint64_t step = std::min<std::uint64_t>(range.length, SSIZE_MAX / 2) / kBlock * kBlock;
        const ssize_t copied = ::copy_file_range(range.from, &from, range.to, &to, step, 0);
        if (copied < 0 && errno == EINTR) continue;
        const bool isFinal = errno == ENOSPC || errno == EFBIG || errno == EIO || errno == EDQUOT;
        if (copied < 0 && isFinal) return false;
        if (copied <= 0) break;
        range.advance(static_cast<std::uint64_t>(copied));
    }
    return copyThroughBuffer(range);
}

/// Whether all of a stretch without data lies within the file.
bool isHole(const FileRange& range) {
    struct stat status {};
    if (::fstat(range.from, &status) != 0) return false;
    errno = ESTALE;
    return range.offset + range.length <= static_cast<std::uint64_t>(status.st_size);
}

}  // namespace

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

bool copyRange(FileRange range) {
    while (range.length > 0) {
        const off_t data = ::lseek(range.from, static_cast<off_t>(range.offset), SEEK_DATA);
        if (data < 0) return errno == ENXIO ? isHole(range) : copyData(range);
        range.advance(std::min(range.length, static_cast<std::uint64_t>(data) - range.offset));
        const off_t hole = ::lseek(range.from, data, SEEK_HOLE);
        FileRange filled = range;
        if (hole > data) filled.length = std::min(range.length, static_cast<std::uint64_t>(hole - data));
        if (!copyData(filled)) return false;
        range.advance(filled.length);
    }
    return true;
}

}  // namespace qvct
