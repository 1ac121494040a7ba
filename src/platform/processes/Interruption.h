#pragma once

namespace qvct {

/// Makes the first interrupt from a terminal be remembered instead of ending the program; a second one ends
/// it as usual. For programs of our own.
void interruptGently();

/// Whether there was an interrupt since `interruptGently` was called.
bool wasInterrupted();

}  // namespace qvct
