#include "platform/files/FileAccess.h"

#include "platform/files/FileDescriptor.h"
#include "platform/files/reading/RandomAccessReader.h"
#include "platform/files/replacement/FileReplacement.h"
#include "platform/text/Text.h"
#include "platform/text/Url.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {
namespace {

bool statOf(const std::string& path, struct stat& status) {
    return !isURLText(path) && ::stat(path.c_str(), &status) == 0;
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

bool mayRead(const std::string& path, Error* error) {
    return ::access(path.c_str(), R_OK) == 0 || fail(error, kErrorUnreadable, std::strerror(errno), {path});
}

bool mayWrite(const std::string& path) {
    return ::access(path.c_str(), W_OK) == 0;
}

FileDescriptor openRegularFile(const std::string& path, Error* error, struct stat* status) {
    if (isURLText(path)) {
        fail(error, kErrorInvalidArgument, "is no file URL", {path});
        return FileDescriptor(-1);
    }
    // Without O_NONBLOCK, opening a named pipe would wait for a writer for ever.
    FileDescriptor descriptor(::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    struct stat own {};
    if (status == nullptr) status = &own;
    if (!descriptor.isOpen() || ::fstat(descriptor.number(), status) != 0) {
        fail(error, kErrorUnreadable, std::strerror(errno), {path});
    } else if (!S_ISREG(status->st_mode)) {
        fail(error, kErrorUnreadable, S_ISDIR(status->st_mode) ? "is a folder" : "is not a regular file",
             {path});
    } else {
        return descriptor;
    }
    return FileDescriptor(-1);
}

std::optional<std::vector<std::uint8_t>> readFile(const std::string& path, Error* error,
                                                  std::uint64_t limit) {
    const auto file = FileReader::open(path, error);
    return file ? readAll(*file, path, limit, error) : std::nullopt;
}

std::optional<std::string> readTextFile(const std::string& path, Error* error) {
    const auto bytes = readFile(path, error);
    if (!bytes) return std::nullopt;
    std::string text(bytes->begin(), bytes->end());
    if (!isValidUtf8(text)) {
        fail(error, kErrorMalformed, "is not UTF-8 text", {path});
        return std::nullopt;
    }
    return text;
}

bool replaceFile(const std::string& path, std::string_view bytes, Error* error) {
    const FilePiece whole{.bytes = std::string(bytes)};
    return replaceFileByPieces(path, {&whole, 1}, {}, error);
}

}  // namespace qvct
