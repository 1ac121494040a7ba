#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// Mixes interleaved channels to one and averages runs of frames to bring the rate down to about 44 kHz:
/// soft strokes on cymbals show best above 9 kHz.
///
/// A plain average suffices: the high frequencies that it folds down (aliasing) are still energy of the same
/// moment, and the search for onsets needs no more. The channels weigh unequally, so that opposite ones do
/// not cancel.
class DownMixer {
  public:
    DownMixer(double sampleRate, int channels);

    /// Frames that become one sample.
    std::size_t factor() const { return factor_; }
    std::size_t channels() const { return gains_.size(); }

    /// Appends the samples of the next frames to `mixed`, all of them finite and within 16 times full scale.
    /// A run that the block leaves incomplete goes on with the next block.
    void mix(std::span<const float> frames, std::vector<float>& mixed);

  private:
    float mixedFrame(const float* frame) const;

    std::size_t factor_;
    std::vector<float> gains_;
    float run_ = 0;  // sum of an incomplete run
    std::size_t runLength_ = 0;
};

}  // namespace qvct
