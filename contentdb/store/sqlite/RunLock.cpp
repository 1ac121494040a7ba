#include "contentdb/store/sqlite/RunLock.h"

#include <fmt/format.h>

namespace qvct::contentdb {
namespace {

std::string lockPath(const std::string& database) {
    return database + "-lock";
}

}  // namespace

std::unique_ptr<FileLock> RunLock::acquire(const std::string& database, Error* error) {
    FileLockAttempt attempt = FileLock::acquire(lockPath(database));
    if (attempt.lock) return std::move(attempt.lock);
    const std::string holder = attempt.holder != 0 ? fmt::format(" (process {})", attempt.holder) : "";
    qvct::fail(error, kErrorUnwritable,
               attempt.reason.empty()
                   ? fmt::format("another run is writing to it{}; try again when it has ended", holder)
                   : fmt::format("cannot be written here: {}", attempt.reason),
               {database});
    return nullptr;
}

bool RunLock::isHeld(const std::string& database) {
    return FileLock::isHeld(lockPath(database));
}

}  // namespace qvct::contentdb
