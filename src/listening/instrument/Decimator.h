#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// Brings a sound to a lower rate by a whole factor, without the frequencies that would fold down (40 dB).
///
/// @cost  Eight multiplications for each sample of the original.
class Decimator {
  public:
    /// The factor that comes nearest to the wished rate, but at least 1.
    Decimator(double sampleRate, double wishedRate);

    /// Samples a second of what comes out.
    double sampleRate() const { return rate_; }
    /// Appends the sound at the lower rate, one sample for every factor begun. REQUIRES: finite samples.
    void append(std::span<const float> samples, std::vector<float>& lower) const;

  private:
    float filtered(std::span<const float> samples, std::size_t middle) const;

    std::size_t factor_;
    double rate_;
    std::vector<float> taps_;  // an odd number; the middle one lies at the sample
};

}  // namespace qvct
