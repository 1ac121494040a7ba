#pragma once

namespace qvct {

struct LCAudioFacts;
class AiffFile;

/// Adds what the chunks `NAME`, `INST`, `MARK` and `MIDI` say about the music. What is out of range counts as
/// not said.
void readAiffMusic(const AiffFile& file, LCAudioFacts& facts);

}  // namespace qvct
