#include "contentdb/RunLock.h"

#include "platform/Text.h"

#include <cerrno>
#include <cstring>

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

namespace qvct::contentdb {

std::unique_ptr<RunLock> RunLock::acquire(const std::string& database, Error* error) {
    const std::string path = database + "-lock";
    const int file = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
    if (file < 0) {
        qvct::fail(error, kErrorUnwritable,
                   fmt::format("{}: cannot be written here: {}", printable(database), std::strerror(errno)));
        return nullptr;
    }
    struct flock lock {};
    lock.l_type = F_WRLCK;
    lock.l_whence = SEEK_SET;
    if (::fcntl(file, F_SETLK, &lock) == 0) return std::unique_ptr<RunLock>(new RunLock(file));
    struct flock holder = lock;
    const bool isKnown = ::fcntl(file, F_GETLK, &holder) == 0 && holder.l_type != F_UNLCK;
    ::close(file);
    qvct::fail(error, kErrorUnwritable,
               fmt::format("{}: another run is writing to it{}; try again when it has ended",
                           printable(database), isKnown ? fmt::format(" (process {})", holder.l_pid) : ""));
    return nullptr;
}

RunLock::~RunLock() {
    ::close(file_);
}

}  // namespace qvct::contentdb
