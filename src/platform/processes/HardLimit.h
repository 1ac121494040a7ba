#pragma once

#include "platform/base/Export.h"

#include <chrono>
#include <cstddef>
#include <string>

namespace qvct {

/// The last resort against work that nothing inside a process can interrupt: while it lives, the process is
/// looked at a hundred times a second, and ended when the work takes more time, or the process grows by more
/// memory. A message on standard error says why; the status is 1.
///
/// Does nothing in processes that did not ask for it: a library must not end its host. One inside another
/// changes nothing. Use it from one thread at a time.
/// @cost  Some microseconds.
class QVCT_API HardLimit {
  public:
    /// For programs of our own, where a run or a worker may be lost. Takes the signal SIGALRM and the
    /// process's interval timer. `prepare` is called before each work, to write what must not be lost.
    static void enable(void (*prepare)() = nullptr);

    /// `work` stands in the message.
    HardLimit(std::chrono::milliseconds time, std::size_t bytes, const std::string& work);
    HardLimit(const HardLimit&) = delete;
    HardLimit& operator=(const HardLimit&) = delete;
    ~HardLimit();
};

}  // namespace qvct
