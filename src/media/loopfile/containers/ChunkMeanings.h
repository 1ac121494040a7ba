#pragma once

#include "media/loopfile/LCFileParser.h"

namespace qvct {

class Container;

/// The container as one chunk that holds all others, each with its meaning, in the order of the file.
std::vector<LCChunk> describeChunks(const Container& container);

}  // namespace qvct
