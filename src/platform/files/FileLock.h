#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <utility>

namespace qvct {

struct FileLockAttempt;

/// Keeps a file to one holder at a time, in this process and all others. The system lifts it when the process
/// ends, however it ends; a process that is forked has no part in it. Safe from every thread.
class FileLock {
  public:
    /// Makes the file when there is none.
    static FileLockAttempt acquire(const std::string& path);
    /// Whether somebody has it, here or elsewhere.
    static bool isHeld(const std::string& path);
    FileLock(const FileLock&) = delete;
    FileLock& operator=(const FileLock&) = delete;
    ~FileLock();

  private:
    explicit FileLock(int file) : file_(file) {}

    int file_;
};

struct FileLockAttempt {
    std::unique_ptr<FileLock> lock;  ///< None when it was refused.
    std::string reason;  ///< Why the file cannot be opened; empty when another holder has the lock.
    int holder = 0;      ///< Its process; 0 where the system does not tell.
};

}  // namespace qvct
