#pragma once

#include "listening/instrument/Decimator.h"
#include "listening/sound/FourSpectra.h"

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// The partial tones of a sound soon after its attack and later: how much of the energy they hold, where they
/// lie, whether they are harmonics of one fundamental, and how the lowest of them glides.
///
/// @cost  An FFT of 93 ms at about 22 kHz four times. One object is used from one thread.
class PartialTones {
  public:
    static constexpr std::size_t kPeaks = 6, kHarmonics = 10, kMoments = 4;
    static constexpr std::size_t kValuesOfMoment = 5 + 2 * kPeaks + kHarmonics;
    static constexpr std::size_t kValues = kMoments * kValuesOfMoment;

    explicit PartialTones(double sampleRate);

    /// Appends kValues numbers, all finite: levels in units of 10 dB, frequencies in octaves above 440 Hz or
    /// above the strongest partial. REQUIRES: finite samples.
    void append(std::span<const float> samples, std::vector<float>& values);

  private:
    struct Peak {
        float bin, power;
    };

    void findPeaks(std::span<const float> powers);
    void appendMoment(std::span<const float> powers, std::vector<float>& values);
    float fundamentalOf(std::span<const float> powers) const;
    float powerNear(std::span<const float> powers, float bin) const;

    Decimator decimator_;
    FourSpectra spectra_;
    double binWidth_;
    std::vector<float> lower_;
    std::vector<float> powers_;
    std::vector<Peak> peaks_;
};

}  // namespace qvct
