#include "platform/files/EmptyFile.h"

#include "platform/files/FileDescriptor.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {

bool makeEmptyFileLike(const std::string& model, const std::string& path, Error* error) {
    struct stat status {};
    const bool isThere = ::stat(model.c_str(), &status) == 0;
    const mode_t mode = isThere ? status.st_mode & 0777U : 0666U;
    const FileDescriptor file(::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode));
    if (!file.isOpen() || (isThere && ::fchmod(file.number(), mode) != 0))
        return fail(error, kErrorUnwritable, fmt::format("cannot be made: {}", std::strerror(errno)), {path});
    if (isThere) [[maybe_unused]]
        const int ignored = ::fchown(file.number(), status.st_uid, status.st_gid);
    return true;
}

}  // namespace qvct
