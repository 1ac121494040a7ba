#include "platform/loopfile/RandomAccessReader.h"

#include "platform/Text.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {

bool MemoryReader::read(std::uint64_t offset, std::span<std::uint8_t> into) const {
    if (offset > bytes_.size() || into.size() > bytes_.size() - offset) return false;
    if (!into.empty()) std::memcpy(into.data(), bytes_.data() + offset, into.size());
    return true;
}

std::shared_ptr<FileReader> FileReader::open(const std::string& path, Error* error) {
    const auto refuse = [&](const char* reason) {
        fail(error, kErrorUnreadable, fmt::format("{}: {}", printable(path), reason));
        return nullptr;
    };
    // Without O_NONBLOCK, opening a named pipe would wait for a writer for ever.
    FileDescriptor descriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat status {};
    if (!descriptor.isOpen() || ::fstat(descriptor.number(), &status) != 0) {
        return refuse(std::strerror(errno));
    }
    if (!S_ISREG(status.st_mode)) return refuse("is not a regular file");
    return std::shared_ptr<FileReader>(new FileReader(std::move(descriptor), FileStamp::of(status)));
}

bool FileReader::read(std::uint64_t offset, std::span<std::uint8_t> into) const {
    while (!into.empty()) {
        const ssize_t got =
            ::pread(descriptor_.number(), into.data(), into.size(), static_cast<off_t>(offset));
        if (got < 0 && errno == EINTR) continue;
        if (got <= 0) return false;
        into = into.subspan(static_cast<std::size_t>(got));
        offset += static_cast<std::uint64_t>(got);
    }
    return true;
}

}  // namespace qvct
