#include "contentdb/store/RunLock.h"

#include "platform/text/Text.h"

#include <cerrno>
#include <cstring>
#include <mutex>
#include <optional>
#include <set>
#include <utility>

#include <fcntl.h>
#include <fmt/format.h>
#include <sys/stat.h>
#include <unistd.h>

namespace qvct::contentdb {
namespace {

using Identity = std::pair<dev_t, ino_t>;

/// The locks that this process has: the system tells it of others' only, and lifts its own as soon as the
/// file is closed anywhere in the process. So no lock of ours is looked at, and looking is done by one thread
/// at a time.
struct Own {
    std::mutex mutex;
    std::set<Identity> locks;
};

Own& own() {
    static Own own;
    return own;
}

std::string lockPath(const std::string& database) {
    return database + "-lock";
}

/// Of the file at the path, or that is open.
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

/// The process that has the lock; not the one that asks.
std::optional<pid_t> holderOf(int file) {
    struct flock lock = wholeFile();
    const bool isHeld = ::fcntl(file, F_GETLK, &lock) == 0 && lock.l_type != F_UNLCK;
    return isHeld ? std::optional(lock.l_pid) : std::nullopt;
}

std::unique_ptr<RunLock> refuse(Error* error, const std::string& database, std::optional<pid_t> holder) {
    qvct::fail(error, kErrorUnwritable,
               fmt::format("{}: another run is writing to it{}; try again when it has ended",
                           printable(database), holder ? fmt::format(" (process {})", *holder) : ""));
    return nullptr;
}

}  // namespace

std::unique_ptr<RunLock> RunLock::acquire(const std::string& database, Error* error) {
    const std::string path = lockPath(database);
    const std::lock_guard guard(own().mutex);
    if (isOwn(path)) return refuse(error, database, ::getpid());
    const int file = ::open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0666);
    if (file < 0) {
        qvct::fail(error, kErrorUnwritable,
                   fmt::format("{}: cannot be written here: {}", printable(database), std::strerror(errno)));
        return nullptr;
    }
    struct flock lock = wholeFile();
    if (::fcntl(file, F_SETLK, &lock) == 0) {
        own().locks.insert(identityOf(file));
        return std::unique_ptr<RunLock>(new RunLock(file));
    }
    const auto holder = holderOf(file);
    ::close(file);
    return refuse(error, database, holder);
}

bool RunLock::isHeld(const std::string& database) {
    const std::string path = lockPath(database);
    const std::lock_guard guard(own().mutex);
    if (isOwn(path)) return true;
    const int file = ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_CLOEXEC);
    if (file < 0) return false;
    const bool isHeld = holderOf(file).has_value();
    ::close(file);
    return isHeld;
}

RunLock::~RunLock() {
    const std::lock_guard guard(own().mutex);
    own().locks.erase(identityOf(file_));
    ::close(file_);
}

}  // namespace qvct::contentdb
