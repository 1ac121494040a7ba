#include "platform/files/FileLock.h"

#include <cerrno>
#include <cstring>
#include <mutex>
#include <optional>
#include <set>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct {
namespace {

using Identity = std::pair<dev_t, ino_t>;

/// The locks that this process holds. The system reports only other processes' locks, and lifts ours as soon
/// as any descriptor of the file is closed in this process. So a file that we hold is never opened again, and
/// one thread at a time checks.
struct Own {
    std::mutex mutex;
    std::set<Identity> locks;
};

Own& own() {
    static Own own;
    return own;
}

/// The identity of the file at the path; the second one takes an open file.
std::optional<Identity> identityOf(const std::string& path) {
    struct stat status {};
    return ::stat(path.c_str(), &status) == 0 ? std::optional(Identity(status.st_dev, status.st_ino))
                                              : std::nullopt;
}
Identity identityOf(int file) {
    struct stat status {};
    ::fstat(file, &status);
    return {status.st_dev, status.st_ino};
}

bool isOwn(const std::string& path) {
    const auto identity = identityOf(path);
    return identity && own().locks.contains(*identity);
}

struct flock wholeFile() {
    struct flock lock {};
    lock.l_type = F_WRLCK;
    lock.l_whence = SEEK_SET;
    return lock;
}

/// The other process that has the lock, if there is one.
std::optional<pid_t> holderOf(int file) {
    struct flock lock = wholeFile();
    const bool isHeld = ::fcntl(file, F_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
    return isHeld ? std::optional(lock.l_pid) : std::nullopt;
}

}  // namespace

FileLockAttempt FileLock::acquire(const std::string& path) {
    const std::lock_guard guard(own().mutex);
    if (isOwn(path)) return {nullptr, {}, ::getpid()};
    const int file = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
    if (file < 0) return {nullptr, std::strerror(errno), 0};
    struct flock lock = wholeFile();
    if (::fcntl(file, F_SETLK, &lock) == 0) {
        own().locks.insert(identityOf(file));
        return {std::unique_ptr<FileLock>(new FileLock(file)), {}, 0};
    }
    const auto holder = holderOf(file);
    ::close(file);
    return {nullptr, {}, holder.value_or(0)};
}

bool FileLock::isHeld(const std::string& path) {
    const std::lock_guard guard(own().mutex);
    if (isOwn(path)) return true;
    const int file = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
    if (file < 0) return false;
    const bool isHeld = holderOf(file).has_value();
    ::close(file);
    return isHeld;
}

FileLock::~FileLock() {
    const std::lock_guard guard(own().mutex);
    own().locks.erase(identityOf(file_));
    ::close(file_);
}

}  // namespace qvct
