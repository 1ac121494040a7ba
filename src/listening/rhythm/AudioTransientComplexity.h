#pragma once

#include "listening/rhythm/LoopRhythm.h"
#include "platform/text/Url.h"

#include <cstdint>
#include <span>

namespace qvct {

class LCFileData;

/// Rhythmic density and complexity of an audio loop: its onsets are measured as notes of equal loudness.
///
/// The first success is kept: later calls give it again, whatever their arguments. Not safe to use from two
/// threads at once.
class AudioTransientComplexity {
  public:
    /// Measures the onsets of the loop at a URL: those of a fresh search, or else the transient markers
    /// stored in the file, leaving out a first one at its start and a last one at its end.
    ///
    /// False, with the stored values left as they are, when the extension is not exactly "aif" or "caf", the
    /// file cannot be read, its metre is not measured or there is no onset.
    ///
    /// @cost  A fresh search decodes the whole file, in constant memory.
    bool computeRhythmicDensityAndComplexityUsingTransients(const URL& url, bool withNewAnalysis);
    /// The same for a caller that has the file's data already; while `LCFileData::openFile` is not null,
    /// nothing is opened.
    bool computeRhythmicDensityAndComplexityUsingTransients(const URL& url, const LCFileData& data,
                                                            bool withNewAnalysis);

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
