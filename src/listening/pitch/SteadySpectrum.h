#pragma once

#include "listening/sound/FourSpectra.h"

#include <span>
#include <vector>

namespace qvct {

/// The spectrum of the part of a one-shot in which it sounds steadily: after the attack, while it is loud, at
/// most a second.
///
/// Four frames of at most 186 ms, spread over that part, weigh by the roots of their energies, so that
/// neither the loud beginning nor the noise of the end decides alone. What lies above 8 kHz is not looked at.
class SteadySpectrum {
  public:
    /// Looks at no more than the first 3 s. False where there is too little sound: less than 20 ms, or
    /// silence.
    bool measure(std::span<const float> mono, double sampleRate);

    std::span<const float> powers() const { return powers_; }
    double hertzPerBin() const { return rate_ / static_cast<double>(kSize); }
    /// Seconds of the steady part.
    double seconds() const { return seconds_; }

  private:
    static constexpr std::size_t kSize = 4096;  // samples of a transform

    struct Section {
        std::size_t begin, end;
    };

    Section steadySection() const;

    FourSpectra spectra_{kSize};
    double rate_ = 1, seconds_ = 0;
    std::vector<float> samples_, powers_;
};

}  // namespace qvct
