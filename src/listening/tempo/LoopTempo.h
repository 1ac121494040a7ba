#pragma once

#include "listening/onsets/OnsetDetector.h"

#include <cstdint>
#include <span>
#include <vector>

namespace qvct {

/// A tempo that a loop may have.
struct TempoCandidate {
    double bpm = 0;         ///< Beats a minute, 43 to 333.
    double beats = 0;       ///< That the loop lasts, its tail included.
    bool isWhole = false;   ///< Whether those are taken for whole or half beats, which then give the tempo.
    double confidence = 0;  ///< That the tempo is within 1 % of this one.
};

/// The tempos that a loop may have, by its onsets and its length.
///
/// That a loop lasts a whole number of beats is evidence for a tempo, above all where that tempo is a whole
/// number, but not taken for granted: loops may have tails.
struct LoopTempo {
    /// At most 5, the most likely first, each more than 2 % from those before it; their confidences add up to
    /// 1 at most. None without an onset.
    std::vector<TempoCandidate> candidates;

    /// Whether the loop is taken to last a whole number of beats or half beats.
    bool isWhole() const { return !candidates.empty() && candidates.front().isWhole; }

    /// Of a loop that begins on a beat. Onsets are ascending positions in it, as `OnsetDetector` gives them;
    /// at most 512 in the first minute count. Well under 1 ms; any thread.
    ///
    /// @param frames  The length of the loop.
    /// @param sampleRate  In Hz, more than 0.
    static LoopTempo of(std::span<const Onset> onsets, std::int64_t frames, double sampleRate);
};

}  // namespace qvct
