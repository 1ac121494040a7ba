#pragma once

#include <cstdint>
#include <vector>

/// The calls by which this process changes files (write, flush, rename, remove and their kin), counted, and
/// one of them cut. Calls on anything but regular files and folders, such as pipes and terminals, go by
/// unseen.
namespace qvct::test {

enum class Cut {
    none,         ///< only count
    error,        ///< the call fails and does nothing
    shortWrite,   ///< half of a write is done, and the next one finds the disk full
    deathBefore,  ///< the process dies in place of the call
    deathAfter,   ///< the process dies when the call is done
};

/// From now on the calls are counted from 0, and the one numbered `point` is cut.
void cutCall(Cut cut, std::uint64_t point);

/// Of each call since then, whether it was one that can be done by half.
std::vector<bool> callsMade();

/// The status that a process which died of a cut ends with.
constexpr int kDiedOfCut = 137;

}  // namespace qvct::test
