#pragma once

#include <cstdint>
#include <ctime>
#include <functional>
#include <string>
#include <vector>

/// The calls by which this process changes files (making, writing, flushing, renaming, removing and their
/// kin), counted, and one of them cut. Calls on anything but regular files and folders, such as pipes and
/// terminals, go by unseen.
namespace qvct::test {

enum class Cut {
    none,           ///< only count
    ioError,        ///< the call fails with EIO and does nothing
    diskFull,       ///< the call fails with ENOSPC and does nothing
    interrupted,    ///< the call fails with EINTR and does nothing; asked again, it goes through
    shortWrite,     ///< half of a write is done, and the next call finds the disk full
    death,          ///< the process dies in place of the call
    halfThenDeath,  ///< half of a write is done, then the process dies
    termination,    ///< another thread handles the signal to end right before the call
};

struct CutPlan {
    Cut cut = Cut::none;
    std::uint64_t point = 0;  ///< The number of the call to cut.
    /// What another program does right before the call numbered `interruptedAt`; its calls are not counted.
    std::function<void()> otherProgram = nullptr;
    std::uint64_t interruptedAt = 0;
    bool hasNoLocks = false;  ///< As on a file system that knows none.
    std::time_t ahead = 0;    ///< Seconds by which the clock is.
};

struct Call {
    std::string name;
    std::string path;  ///< Of what it changes; of a rename, "from > to".
    bool canBeHalf = false;
};

/// From now on the calls are counted from 0.
void planCut(CutPlan plan);

/// The calls since then.
std::vector<Call> callsMade();

/// The status that a process which died of a cut ends with.
constexpr int kDiedOfCut = 137;

}  // namespace qvct::test
