#pragma once

#include "platform/base/Error.h"
#include "platform/files/FileLock.h"

#include <memory>
#include <string>

namespace qvct::contentdb {

/// Keeps a database to one writing run at a time, in this process and all others, by a lock on the file
/// "<database>-lock".
class RunLock {
  public:
    /// Null, and an error that names the other process, when a run is going on already.
    static std::unique_ptr<FileLock> acquire(const std::string& database, Error* error);
    /// Whether a run is going on, here or elsewhere.
    static bool isHeld(const std::string& database);
};

}  // namespace qvct::contentdb
