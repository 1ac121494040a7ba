#pragma once

#include "listening/pitch/SpectralPeaks.h"
#include "listening/sound/FourSpectra.h"

#include <array>
#include <optional>
#include <span>
#include <vector>

namespace qvct {

/// How much of each of the 12 notes there is in a sound, whatever the octave; the first is C.
struct Chroma {
    std::array<double, 12> bass{};    ///< Below 180 Hz. The sum is 1, or all are 0.
    std::array<double, 12> treble{};  ///< From 180 Hz on. The sum is 1, or all are 0.
    double tuning = 0;                ///< Cents by which the sound's notes lie above A = 440 Hz, -50 to 50.
    double tuned = 0;                 ///< How clearly its peaks agree on that tuning: about 1 for noise.
};

/// Measures the notes of the first 30 s of a sound: peaks of spectra of 0.74 s, each given to the note that
/// it is nearest to in the sound's own tuning, with the root of its amplitude as weight.
///
/// One serves any number of sounds, from one thread.
class Chromagram {
  public:
    /// Nothing where there is no peak between 40 and 2000 Hz.
    std::optional<Chroma> of(std::span<const float> mono, double sampleRate);

  private:
    /// A peak as a MIDI number with a fraction.
    struct Tone {
        double pitch, level;
    };

    void findTones(double rate);

    static constexpr std::size_t kSize = 4096;  // samples of a transform

    FourSpectra spectra_{kSize};
    std::vector<float> samples_, powers_;
    std::vector<SpectralPeak> peaks_;
    std::vector<Tone> tones_;
};

}  // namespace qvct
