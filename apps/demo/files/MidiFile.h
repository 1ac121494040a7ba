#pragma once

#include "demo/Sound.h"

#include <optional>
#include <string>
#include <vector>

namespace qvct::demo {

/// A standard MIDI file of format 0, 480 ticks to the quarter note, with the tempo and meter where given.
std::string midiBytes(const std::vector<Note>& notes, const std::optional<LoopFacts>& facts);

}  // namespace qvct::demo
