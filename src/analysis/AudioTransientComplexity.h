#pragma once

#include "analysis/Note.h"
#include "platform/Url.h"

#include <cstdint>
#include <span>
#include <vector>

namespace qvct {

/// Tempo, length and signature of a loop.
struct LoopMetre {
    float bpm = 0;
    std::int32_t beatCount = 0;
    std::int32_t signatureTop = 0;
    std::int32_t signatureBottom = 0;

    /// Whether the rhythm of such a loop is graded: tempo, length and signature are known, and a bar has
    /// neither 5 nor 7 beats.
    bool isMeasured() const {
        return bpm != 0 && beatCount != 0 && signatureTop != 0 && signatureBottom != 0 && signatureTop != 5 &&
               signatureTop != 7;
    }
};

/// Onsets at sample-frame positions as notes of equal loudness, in single precision; none where a beat has no
/// frames.
std::vector<Note> notesOfOnsets(std::span<const std::int64_t> onsets, std::int64_t frames,
                                std::int32_t beatCount);

/// Rhythmic density and complexity of an audio loop: its onsets are measured as notes of equal loudness.
///
/// The first success is kept: later calls give it again, whatever they are asked. Not safe to use from two
/// threads at once.
class AudioTransientComplexity {
  public:
    /// Measures the onsets of the loop at a URL: those of a fresh search, or the transient markers that are
    /// stored in the file without a first one at its start and a last one at its end.
    ///
    /// False, with the stored values left as they are, when the extension is not exactly "aif" or "caf", the
    /// file cannot be read, its metre is not measured or there is no onset.
    ///
    /// @cost  A fresh search decodes the whole file, in constant memory.
    bool computeRhythmicDensityAndComplexityUsingTransients(const URL& url, bool withNewAnalysis);

    /// Measures onsets at ascending sample-frame positions of a loop of `frames` frames.
    ///
    /// Onsets past the last beat are folded back by `QVCTMidiAnalysis`. False, with the stored values left as
    /// they are, when the metre is not measured, a beat has no frames or there is no onset.
    bool computeRhythmicDensityAndComplexity(std::span<const std::int64_t> onsets, std::int64_t frames,
                                             const LoopMetre& metre);

    /// The last complexity in [0, 1]; 0 before a success.
    float getComplexity() const { return complexity_; }
    /// The last density in [0, 1]; 0 before a success.
    float getDensity() const { return density_; }

  private:
    bool alreadyComputed_ = false;
    float complexity_ = 0;
    float density_ = 0;
};

}  // namespace qvct
