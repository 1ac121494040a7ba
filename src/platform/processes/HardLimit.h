#pragma once

#include "platform/base/Export.h"

#include <chrono>
#include <cstddef>
#include <string>

namespace qvct {

/// The last resort against work that nothing inside a process can interrupt: while this object lives, the
/// process is checked a hundred times a second, and ended when the work takes longer than `time`, or the
/// process grows by more than `bytes`. A message on standard error says why; the exit status is 1.
///
/// Does nothing in processes that did not ask for it: a library must not end its host. A limit inside the
/// lifetime of another has no effect. Use it from one thread at a time.
/// @cost  Some microseconds.
class QVCT_API HardLimit {
  public:
    /// For programs of our own, which may be ended in the middle of a run. Takes the signal SIGALRM and the
    /// process's interval timer. `prepare` is called before each work, to write what must not be lost.
    static void enable(void (*prepare)() = nullptr);

    /// `work` names the work in the message.
    HardLimit(std::chrono::milliseconds time, std::size_t bytes, const std::string& work);
    HardLimit(const HardLimit&) = delete;
    HardLimit& operator=(const HardLimit&) = delete;
    ~HardLimit();
};

}  // namespace qvct
