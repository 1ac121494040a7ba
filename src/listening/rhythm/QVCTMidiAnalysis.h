#pragma once

#include "listening/rhythm/Note.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace qvct {

/// How a complexity came about, for showing it to a person.
struct RhythmDetail {
    std::vector<Note> notes;              ///< One note a cluster, on the grid of an eighth of a beat.
    std::vector<std::int32_t> divisions;  ///< Parts into which each level cuts the one above, coarsest first.
    std::vector<float> levelScores;       ///< One a level, [0, 1]; not a number below the grid.
    /// Weighted sum of the level scores on a logarithmic curve; not a number where no level can be scored.
    float selfDissimilarity = 0;
    /// What the metric weights add, [-0.2, 0.2]; not a number where they do not cover the loop.
    float syncopation = 0;
    /// Why the complexity is 0, in words for a person; empty where it is not.
    std::string reasonForZero;
};

/// Rhythmic density and complexity of the notes of one loop.
///
/// Density is the share of grid cells that hold an onset. Complexity is how much the rhythm differs from
/// itself over the levels of its metre (`FractalComplexity`), raised or lowered by how many notes fall on
/// weak cells.
///
/// Nothing fails: a loop that cannot be measured has complexity 0. Both results are in [0, 1] and never NaN.
/// Not safe to use from two threads at once, since the first measurement shifts the notes.
class QVCTMidiAnalysis {
  public:
    /// Longest loop, in beats, whose complexity is measured; longer ones have complexity 0.
    static constexpr std::int32_t kLongestLoop = 16384;

    static std::shared_ptr<QVCTMidiAnalysis> initWithTempo(float bpm, std::int32_t beatCount,
                                                           std::int32_t topTimeSig,
                                                           std::int32_t bottomTimeSig);

    void addNote(Note note) { notes_.push_back(note); }
    const std::vector<Note>& notes() const { return notes_; }
    /// Writes tempo, length, signature and every note to standard output, for debugging.
    void printNotes() const;

    /// Share of the loop's grid cells in which at least one note starts, on a curve that rises steeply for
    /// sparse loops.
    ///
    /// The grid is an eighth of a beat (a quarter when the denominator is not 4). Several notes in one cell
    /// count once. Shifts the notes into the loop first, once.
    ///
    /// @cost  O(n log n).
    float computeRhythmicDensity();

    /// Self-dissimilarity of the loop over the levels of its metre, plus its syncopation.
    ///
    /// Notes within an eighth of a beat count as one, at the earliest's time, on the nearest eighth. 0 for
    /// no notes, 5 or 7 beats a bar, and where no metric weights exist for the whole loop: numerators other
    /// than 2, 3, 4, 6, 9, 12, a length that is no whole number of bars, signatures such as 4/8. `detail`, if
    /// asked for, is filled as far as the measurement came.
    ///
    /// @cost  O(n log n + cells * levels).
    float computeRhythmicComplexity(RhythmDetail* detail = nullptr);

    /// How weak each eighth of a beat is in the metre (0 on a downbeat), for all whole bars of the loop;
    /// empty for a numerator without a pattern.
    std::vector<float> getSyncopationMask() const;

    /// Shifts the notes by whole loop lengths so that the last one starts within the loop. Only the first
    /// call that finds notes does so.
    void adjustNoteTimesToZero();

  private:
    QVCTMidiAnalysis(float bpm, std::int32_t beatCount, std::int32_t topTimeSig, std::int32_t bottomTimeSig)
        : bpm_(bpm), beatCount_(beatCount), timeSigTop_(topTimeSig), timeSigBottom_(bottomTimeSig) {}

    std::vector<Note> reducedNotes() const;
    float selfDissimilarity(RhythmDetail& detail) const;
    float syncopation(const std::vector<Note>& reduced) const;
    float measureComplexity(RhythmDetail& found);
    std::string reasonForZero(const RhythmDetail& found) const;

    std::vector<Note> notes_;
    float bpm_;
    std::int32_t beatCount_;
    std::int32_t timeSigTop_;
    std::int32_t timeSigBottom_;
    bool adjustedNoteTimes_ = false;
};

}  // namespace qvct
