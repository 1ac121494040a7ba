#include "contentdb/store/sqlite/Reading.h"

#include "contentdb/store/sqlite/DatabaseFiles.h"
#include "contentdb/store/sqlite/RunLock.h"
#include "contentdb/store/sqlite/Schema.h"
#include "platform/files/FileAccess.h"

#include <chrono>
#include <thread>

namespace qvct::contentdb {
namespace {

constexpr std::chrono::seconds kPatience{10};
constexpr std::chrono::milliseconds kPause{20};

/// Null when the running run has stored nothing yet.
std::unique_ptr<Connection> openUnlessEmpty(const std::string& path) {
    if (!fileExists(path)) return nullptr;
    auto connection = openDatabase(path, Access::read);
    return connection->number("SELECT EXISTS (SELECT 1 FROM item)") != 0 ? std::move(connection) : nullptr;
}

void finishRebuild(const std::string& path) {
    Error error;
    if (!isRebuilt(path)) return;
    const auto lock = RunLock::acquire(path, &error);
    if (!lock) throw DatabaseFailure(error);
    if (isRebuilt(path)) putAside(path);
}

}  // namespace

std::unique_ptr<Connection> openToRead(const std::string& name) {
    const std::string path = pathOfDatabase(name);
    const auto end = std::chrono::steady_clock::now() + kPatience;
    // Asked before the database is looked at, so that a run that has ended has stored everything by then.
    while (RunLock::isHeld(path)) {
        if (auto connection = openUnlessEmpty(path)) return connection;
        if (std::chrono::steady_clock::now() > end) {
            throw DatabaseFailure(kErrorUnreadable,
                                  "is being made, and nothing is in it yet; try again when the run "
                                  "that makes it has stored something",
                                  path);
        }
        std::this_thread::sleep_for(kPause);
    }
    finishRebuild(path);
    return openDatabase(path, Access::read);
}

}  // namespace qvct::contentdb
