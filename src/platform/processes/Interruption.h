#pragma once

namespace qvct {

/// Has the interrupt of a terminal remembered instead of ending the program; a second one ends it as always.
/// For programs of our own.
void interruptGently();

/// Whether it was interrupted since then.
bool wasInterrupted();

}  // namespace qvct
