#pragma once

#include "listening/rhythm/Note.h"

#include <cstdint>
#include <utility>
#include <vector>

namespace qvct {

class NoteLookup;

/// How much a rhythm differs from itself across a hierarchy of metric subdivisions.
///
/// The length is cut into equal parts, each part again, and so on. At every level the siblings are compared
/// cell by cell on a fine grid of time, by the velocity of the note that starts in each cell. The level
/// scores are combined by weights into one number in [0, 1].
///
/// The hierarchy is three vectors of one entry a level, the coarsest first: `divisions`, the number of parts
/// into which each interval of the level above is cut, which is also the size of the groups that are compared
/// (groups of 2 and 3 score, others score 0 but still weigh); `resolutions`, the width of the grid's cell in
/// beats; `weights`, the share of the level in the sum.
///
/// A hierarchy that has no cell to compare gives a result that is not a number; `QVCTMidiAnalysis` turns that
/// into 0. The steps are in single precision where the code says `float`. Stateless.
///
/// @cost  O(levels * cells * log notes).
class FractalComplexity {
  public:
    using Interval = std::pair<double, double>;  ///< Start and end in beats.

    /// The weighted complexity of notes over `length` beats; 0 for an empty hierarchy or vectors of unequal
    /// size. `levelScores`, if asked for, receives each level's score before its weight, coarsest first.
    float computeComplexity(const std::vector<Note>& notes, double length,
                            const std::vector<std::int32_t>& divisions,
                            const std::vector<double>& resolutions, const std::vector<float>& weights,
                            std::vector<float>* levelScores = nullptr) const;
    /// The weighted sum of the scores of `level` and of those below it; `intervals` are those of `level`.
    float computeComplexity(const std::vector<Note>& notes, const std::vector<Interval>& intervals, int level,
                            const std::vector<std::int32_t>& divisions,
                            const std::vector<double>& resolutions, const std::vector<float>& weights) const;

    /// Dissimilarity of the `groupSize` intervals from `first` on, in [0, 1]; not a number when the first is
    /// shorter than a cell. Every sibling is scanned with the first one's count of cells.
    float distance(const std::vector<Note>& notes, const std::vector<Interval>& intervals, int first,
                   int groupSize, double resolution) const;

    /// The integral from a to b of the line that falls from 2 at 0 to 0 at 1, so that small differences weigh
    /// more than large ones: (2b - b^2) - (2a - a^2).
    float definiteIntegralLinearDownward(float a, float b) const;

    /// The velocity of the first note, in vector order, with from <= startTime < to; 0 without one. A scan.
    int thereExistsANoteInRange(const std::vector<Note>& notes, double from, double to) const;

    /// Compares two equal halves of 16 even notes; their distance, which is 0.
    float testDistance() const;

  private:
    struct Hierarchy;

    static float complexityFrom(const NoteLookup& notes, const std::vector<Interval>& intervals,
                                std::size_t level, const Hierarchy& hierarchy,
                                std::vector<float>* levelScores);
    static float groupDistance(const NoteLookup& notes, const std::vector<Interval>& intervals,
                               std::size_t first, int groupSize, double resolution);
};

}  // namespace qvct
