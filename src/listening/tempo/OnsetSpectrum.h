#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// How regularly onsets come, by frequency: the magnitude of the Fourier transform of impulses at their times
/// (a Fourier tempogram of one frame) over their number, 1 where all lie on one grid of that frequency.
///
/// Sampled eight times as finely as the length of the sound resolves, so that a whole number of periods is
/// always hit. O(onsets · seconds), about 0.1 ms for a loop.
class OnsetSpectrum {
  public:
    static constexpr std::size_t kOversampling = 8;
    static constexpr double kMostSeconds = 60;  ///< More are not resolved better.
    static constexpr double kHighestHertz = 20;

    /// Times in seconds. REQUIRES: 0 < seconds.
    OnsetSpectrum(std::span<const double> times, double seconds);

    double hertzPerBin() const { return hertzPerBin_; }
    /// By interpolation; 0 beyond kHighestHertz.
    double at(double hertz) const;

  private:
    double hertzPerBin_;
    std::vector<float> magnitudes_;
};

}  // namespace qvct
