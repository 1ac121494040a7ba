#pragma once

namespace qvct {

struct LCAudioFacts;
class CafFile;

/// Adds what the chunks `info`, `inst`, `mark` and `midi` say about the music. What is out of range counts as
/// not said.
void readCafMusic(const CafFile& file, LCAudioFacts& facts);

}  // namespace qvct
