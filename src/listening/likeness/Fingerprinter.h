#pragma once

#include "listening/instrument/Decimator.h"
#include "listening/likeness/SoundFingerprint.h"

#include <complex>
#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// Takes fingerprints: the moments at which the waveform, smoothed to about 1 kHz, is steepest in 3 ms, and
/// there the quadrants of the phases of 16 wavelets from 110 Hz to 1.7 kHz. Level and equalisation leave
/// phases alone, and most of what lossy formats add is too weak to turn one into another quadrant.
///
/// @cost  About 0.09 ms for each second at 44.1 kHz. One object is used from one thread.
class Fingerprinter {
  public:
    /// No more of a sound is looked at.
    static constexpr double kMostSeconds = 15;
    /// Lower rates do not hold the wavelets.
    static constexpr double kLowestRate = 4500;

    /// REQUIRES: 1 <= sampleRate <= 64 kHz.
    explicit Fingerprinter(double sampleRate);

    /// The fingerprint; empty for silence, for sounds of less than a millisecond, and at lower rates.
    /// REQUIRES: samples are finite and within +-16.
    SoundFingerprint of(std::span<const float> samples);

  private:
    struct Peak {
        double at;     // in samples of the lower rate
        float height;  // without sign
    };
    struct Wavelet {
        double cyclesPerSample;
        std::vector<float> real, imaginary;  // the middle one lies at the peak
    };
    static bool isHigher(const Peak& one, const Peak& other);
    void measureLowerRate(std::span<const float> samples);
    void measureSlope();
    void findPeaks();
    void keepHighestPeaks();
    void keepWhereFewerAreHigher(std::size_t most, double seconds);
    SoundFingerprint::Landmark landmarkAt(const Peak& peak) const;
    std::complex<float> phasorAt(double at, const Wavelet& wavelet) const;

    double sampleRate_;
    bool halves_;  // the rate at first, which is cheap
    Decimator decimator_;
    std::vector<float> slopeTaps_;  // of one side
    std::vector<Wavelet> wavelets_;

    // Of the sound at hand.
    std::vector<float> half_, lower_, slope_;
    std::vector<Peak> peaks_, kept_;
};

}  // namespace qvct
