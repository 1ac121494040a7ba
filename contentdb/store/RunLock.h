#pragma once

#include "platform/base/Error.h"

#include <memory>
#include <string>

namespace qvct::contentdb {

/// Keeps a database to one writing run at a time, in this process and all others, by a lock on the file
/// "<database>-lock". The system lifts it when the process ends, however it ends.
class RunLock {
  public:
    /// Null, and an error that names the other process, when a run is going on already.
    static std::unique_ptr<RunLock> acquire(const std::string& database, Error* error);
    /// Whether a run is going on, here or elsewhere.
    static bool isHeld(const std::string& database);
    RunLock(const RunLock&) = delete;
    RunLock& operator=(const RunLock&) = delete;
    ~RunLock();

  private:
    explicit RunLock(int file) : file_(file) {}

    int file_;
};

}  // namespace qvct::contentdb
