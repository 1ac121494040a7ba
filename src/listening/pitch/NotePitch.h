#pragma once

#include "listening/pitch/SpectralPeaks.h"
#include "listening/pitch/SteadySpectrum.h"

#include <optional>
#include <span>
#include <vector>

namespace qvct {

/// The note that a one-shot sounds.
struct NotePitch {
    int note = 0;      ///< MIDI number, 60 for middle C; 18 to 109.
    double cents = 0;  ///< By which it lies above that note in equal temperament at A = 440 Hz: -50 to 50.
    double hertz = 0;  ///< Of the fundamental, whether it sounds itself or not.
    double confidence = 0;  ///< That the sound has a pitch, and that it is this one: 0.5 to 1.
};

/// Finds the note of one-shots: the candidate for the fundamental for whose partials the spectrum of the
/// steady part speaks best (`SteadySpectrum`, `HarmonicSeries`).
///
/// About 0.15 ms a sound, of which at most the first 3 s are looked at; building a detector takes ten times
/// as long. One serves any number of sounds of any rates, from one thread.
class NotePitchDetector {
  public:
    /// Nothing for silence, noise, drums without pitch and sounds under 20 ms.
    ///
    /// @param mono  Finite samples within 16 times full scale, any number of them.
    /// @param sampleRate  In Hz, 1 or more.
    std::optional<NotePitch> pitchOf(std::span<const float> mono, double sampleRate);

  private:
    SteadySpectrum spectrum_;
    std::vector<SpectralPeak> peaks_;
};

}  // namespace qvct
