#pragma once

namespace qvct {

struct LCAudioFacts;
class WavFile;

/// Adds what the chunks of other makers say about the music: `acid`, `smpl`, `inst`, `cue ` and `LIST`.
/// What is out of range counts as not said.
void readWavMusic(const WavFile& file, LCAudioFacts& facts);

}  // namespace qvct
