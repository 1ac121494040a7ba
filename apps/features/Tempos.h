#pragma once

namespace qvct {

/// Answers what speaks for the tempos of loops. Reads loops from standard input, each as its rate in Hz, its
/// length in frames, the number of its onsets (32-bit numbers), and each onset's frame (a 32-bit number) and
/// loudness (a 32-bit float). Writes how many numbers there are to a candidate (a 32-bit number), then for
/// each loop the number of its candidates (the same) and of each candidate the tempo and the features of
/// `BeatGrid` (32-bit floats). False if what was read is cut off.
bool writeTempoFeatures();

}  // namespace qvct
