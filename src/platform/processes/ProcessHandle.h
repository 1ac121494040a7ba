#pragma once

#include "platform/files/FileDescriptor.h"

#include <chrono>
#include <optional>
#include <string>

namespace qvct {

/// How a process came to its end.
struct ProcessEnd {
    bool isKnown = false;  ///< Not when somebody else has asked, or nobody may: the host ignores SIGCHLD.
    int status = 0;        ///< What it answered.
    std::string signal;    ///< The signal that ended it, in the system's words; empty for none.
};

/// A process that this one has started. It is held by a descriptor where the system has these, since the
/// number of one that the host has asked about, or that went by itself, may be another process's by now.
class ProcessHandle {
  public:
    explicit ProcessHandle(int id);

    void kill() const;
    /// How it ended, or nothing if it still runs then. The system tells it once: later calls answer
    /// isKnown = false.
    std::optional<ProcessEnd> awaitEnd(std::chrono::milliseconds patience) const;

  private:
    int id_;
    FileDescriptor descriptor_;
};

}  // namespace qvct
