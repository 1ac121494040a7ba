#include "platform/files/reading/RandomAccessReader.h"

#include "platform/files/FileAccess.h"

#include <cerrno>
#include <cstring>

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
    struct stat status {};
    FileDescriptor descriptor = openRegularFile(path, error, &status);
    if (!descriptor.isOpen()) return nullptr;
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

std::optional<std::vector<std::uint8_t>> readAll(const RandomAccessReader& reader, std::string_view name,
                                                 std::uint64_t limit, Error* error) {
    if (reader.size() > limit) {
        fail(error, kErrorTooLarge, fmt::format("{} bytes are over the limit of {}", reader.size(), limit),
             {std::string(name)});
        return std::nullopt;
    }
    std::vector<std::uint8_t> bytes(reader.size());
    errno = 0;
    if (reader.read(0, bytes)) return bytes;
    fail(error, kErrorUnreadable, errno != 0 ? std::strerror(errno) : "shrank while it was read",
         {std::string(name)});
    return std::nullopt;
}

}  // namespace qvct
