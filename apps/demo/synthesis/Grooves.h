#pragma once

#include "demo/synthesis/Drums.h"

#include <string_view>
#include <vector>

/// Rhythms and melodies as texts with one character for each sixteenth note; blanks are for readability only.
namespace qvct::demo {

/// "x" a hit, "X" an accent, "o" a soft hit, "." nothing. A lane that is shorter than the loop starts over.
struct DrumLane {
    Drum drum;
    std::string_view steps;
    double pan = 0;  ///< From -1, left, to 1, right.
};

struct Groove {
    std::string_view name;
    std::vector<DrumLane> lanes;
    int beatsPerBar = 4;
    double swing =
        50;  ///< Where the second of two sixteenths falls between the first and the next, in percent.
};

/// "1" to "9" a degree of the scale, "-" holds the note before, "." nothing.
struct Phrase {
    std::string_view name;
    std::string_view steps;
    bool chords = false;  ///< Each degree is played as the seventh chord on it.
    double swing = 50;
};

/// Throws std::out_of_range for an unknown name.
const Groove& groove(std::string_view name);
const Phrase& phrase(std::string_view name);

}  // namespace qvct::demo
