#pragma once

#include "listening/rhythm/Note.h"

#include <cstdint>
#include <string>
#include <vector>

namespace qvct {

/// What a picture of a loop's rhythm shows. Times are those that were measured.
struct RhythmPlot {
    /// The lowest and highest sample of one slice of the loop, [-1, 1].
    struct Peak {
        float low = 0, high = 0;
    };

    std::string title;
    double tempo = 0;  ///< Quarter notes a minute.
    std::int32_t beatCount = 0, signatureTop = 0, signatureBottom = 0;
    float density = 0, complexity = 0;

    std::vector<Peak> waveform;  ///< Equal slices of the loop; empty draws the notes as a piano roll.
    std::vector<Note> notes;
    std::vector<double> onsets;
    std::vector<float>
        metricWeights;  ///< Strength of each cell, 1 on a downbeat; empty when the metre has none.
    std::vector<std::int32_t> divisions;  ///< Parts into which each level cuts the one above, coarsest first.
    std::vector<float> levelScores;       ///< One a level, [0, 1].

    /// The picture as an SVG document: waveform or piano roll with the cell grid and the onsets, below it the
    /// metric weights with the cells that hold an onset marked, below that each level's score.
    ///
    /// Values that are not finite are left out; a loop without beats has empty panels. The size of the
    /// document is bounded by about 5,000 elements and the notes and onsets within the loop.
    std::string svg() const;
};

}  // namespace qvct
