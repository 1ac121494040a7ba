#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// An onset as rhythm hears it.
struct Stroke {
    double seconds = 0;
    double accent = 0;  ///< By what share it is louder than the mean of all, below 0 for softer ones.
};

/// How regularly onsets come, by frequency: the Fourier transform of impulses at their times (a Fourier
/// tempogram of one frame) over their number.
///
/// Sampled eight times as finely as the length of the sound resolves, so that a whole number of periods is
/// always hit. O(onsets · seconds), about 0.1 ms for a loop.
class OnsetSpectrum {
  public:
    static constexpr std::size_t kOversampling = 8;
    static constexpr double kMostSeconds = 60;  ///< More are not resolved better.
    static constexpr double kHighestHertz = 22;

    /// REQUIRES: 0 < seconds.
    OnsetSpectrum(std::span<const Stroke> strokes, double seconds);

    double hertzPerBin() const { return hertzPerBin_; }
    /// 1 where all onsets lie on one grid of that frequency. By interpolation; 0 beyond kHighestHertz.
    double at(double hertz) const { return between(regularity_, hertz); }
    /// How far louder onsets fall on the grid of that frequency that begins with the sound, and softer ones
    /// between: below 0 if it is the other way round.
    double accentAt(double hertz) const { return between(accents_, hertz); }

  private:
    double between(const std::vector<float>& values, double hertz) const;

    double hertzPerBin_;
    std::vector<float> regularity_, accents_;
};

}  // namespace qvct
