#include "platform/FileAccess.h"

#include "platform/Text.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <utility>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {
namespace {

class Descriptor {
  public:
    explicit Descriptor(int number) : number_(number) {}
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    ~Descriptor() {
        if (number_ >= 0) ::close(number_);
    }
    int number() const { return number_; }
    bool isOpen() const { return number_ >= 0; }
    /// Whether the system accepted all that was written.
    bool close() { return ::close(std::exchange(number_, -1)) == 0; }

  private:
    int number_;
};

bool failFor(Error* error, ErrorCode code, std::string_view path, std::string_view reason) {
    return fail(error, code, fmt::format("{}: {}", printable(path), reason));
}

bool failWithErrno(Error* error, ErrorCode code, std::string_view path) {
    return failFor(error, code, path, std::strerror(errno));
}

bool statOf(const std::string& path, struct stat& status) {
    return ::stat(path.c_str(), &status) == 0;
}

bool writeAll(int descriptor, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t written = ::write(descriptor, bytes.data(), bytes.size());
        if (written < 0 && errno == EINTR) continue;
        if (written <= 0) return false;
        bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return true;
}

void flushFolder(const std::string& folder) {
    const Descriptor descriptor(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (descriptor.isOpen()) ::fsync(descriptor.number());
}

/// Makes a file that nobody else has, beside `target`; its mode follows the process's mask.
int makeFileBeside(const std::string& target, std::string& name) {
    for (int attempt = 0; attempt < 100; ++attempt) {
        name = fmt::format("{}.{}-{}.tmp", target, ::getpid(), attempt);
        const int descriptor = ::open(name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        if (descriptor >= 0 || errno != EEXIST) return descriptor;
    }
    return -1;
}

bool takeOverMode(const std::string& from, int descriptor) {
    struct stat status {};
    return !statOf(from, status) || ::fchmod(descriptor, status.st_mode & 07777U) == 0;
}

}  // namespace

bool fileExists(const std::string& path) {
    struct stat status {};
    return statOf(path, status);
}

bool isDirectory(const std::string& path) {
    struct stat status {};
    return statOf(path, status) && S_ISDIR(status.st_mode);
}

bool isRegularFile(const std::string& path) {
    struct stat status {};
    return statOf(path, status) && S_ISREG(status.st_mode);
}

std::optional<std::vector<std::uint8_t>> readFile(const std::string& path, Error* error,
                                                  std::uint64_t limit) {
    // Without O_NONBLOCK, opening a named pipe would wait for a writer for ever.
    const Descriptor descriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat status {};
    if (!descriptor.isOpen() || ::fstat(descriptor.number(), &status) != 0) {
        failWithErrno(error, kErrorUnreadable, path);
        return std::nullopt;
    }
    if (!S_ISREG(status.st_mode)) {
        failFor(error, kErrorUnreadable, path,
                S_ISDIR(status.st_mode) ? "is a folder" : "is not a regular file");
        return std::nullopt;
    }
    const auto size = static_cast<std::uint64_t>(status.st_size);
    if (size > limit) {
        failFor(error, kErrorTooLarge, path, fmt::format("{} bytes are over the limit of {}", size, limit));
        return std::nullopt;
    }
    std::vector<std::uint8_t> bytes(size);
    std::size_t filled = 0;
    while (filled < bytes.size()) {
        const ssize_t got = ::read(descriptor.number(), bytes.data() + filled, bytes.size() - filled);
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) {
            failWithErrno(error, kErrorUnreadable, path);
            return std::nullopt;
        }
        if (got == 0) break;  // the file shrank while it was read
        filled += static_cast<std::size_t>(got);
    }
    bytes.resize(filled);
    return bytes;
}

std::optional<std::string> readTextFile(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error);
    if (!bytes) return std::nullopt;
    std::string text(bytes->begin(), bytes->end());
    if (!isValidUtf8(text)) {
        failFor(error, kErrorMalformed, path, "is not UTF-8 text");
        return std::nullopt;
    }
    return text;
}

bool replaceFile(const std::string& path, std::string_view bytes, Error* error) {
    std::error_code notThere;
    const std::filesystem::path resolved = std::filesystem::canonical(path, notThere);
    const std::string target = notThere ? path : resolved.string();
    const std::size_t slash = target.rfind('/');
    const std::string folder = slash == std::string::npos ? "." : target.substr(0, slash + 1);

    std::string temporary;
    Descriptor descriptor(makeFileBeside(target, temporary));
    if (!descriptor.isOpen()) return failWithErrno(error, kErrorUnwritable, path);
    const bool written = takeOverMode(target, descriptor.number()) && writeAll(descriptor.number(), bytes) &&
                         ::fsync(descriptor.number()) == 0 && descriptor.close() &&
                         ::rename(temporary.c_str(), target.c_str()) == 0;
    if (!written) {
        failWithErrno(error, kErrorUnwritable, path);
        ::unlink(temporary.c_str());
        return false;
    }
    flushFolder(folder);
    return true;
}

}  // namespace qvct
