#pragma once

#include "listening/character/ShortTimeSpectra.h"

#include <cstddef>
#include <optional>
#include <span>
#include <vector>

namespace qvct {

/// What the spectra of a sound say of its character, in physical units; docs/character.md has the formulas
/// and where they come from. None of it depends on the level.
struct SpectralMeasures {
    double sharpness;  ///< acum: 0.11 for the lowest sounds, 1 for a narrow noise at 1 kHz, above 4 for hiss
    double warmth;     ///< share of the loudness below 400 Hz, 0 to 1
    double roughness;  ///< about asper: 1 for a tone of 1 kHz whose amplitude swings wholly at 70 Hz
    double flatness;   ///< dB: about -3 for noise, below -30 for pure tones
    double height;     ///< Hz: mean on the scale of octaves
    double partials;   ///< how many of equal strength would be as many: 1 for a sine, hundreds for noise
};

/// Measures the spectra of a sound. Windows weigh by their amplitude: halfway between energy, by which one
/// loud stroke would decide, and length, by which the tail would.
///
/// @cost  About 15 us for four windows besides their transform. Tables are made once; one object serves one
///        thread.
class SpectralCharacter {
  public:
    /// REQUIRES: 1 <= sampleRate <= 64,000.
    explicit SpectralCharacter(double sampleRate);

    /// Of the samples less their mean. Nothing for silence, a constant, or a rate too low for what the
    /// measures listen to.
    std::optional<SpectralMeasures> measure(std::span<const float> samples, float mean);

  private:
    struct Band {
        std::size_t begin, end;  // bins
    };
    struct Sums;

    void add(std::span<const std::complex<Lanes>> bins, Sums& sums);
    Lanes flatness(Lanes energy) const;
    Lanes roughness(std::span<const std::complex<Lanes>> bins, Lanes energy) const;
    Lanes logPartials(Lanes energy) const;
    SpectralMeasures measuresOf(const Sums& sums) const;

    ShortTimeSpectra spectra_;
    std::vector<Band> bands_;        // critical bands
    std::vector<Lanes> powers_;      // of the four windows, by bin
    std::vector<Lanes> bandPowers_;  // of the four windows, by band
    std::vector<Lanes> bandAmplitudes_;
    std::vector<float> octaves_;     // of each bin above 1 Hz
    std::vector<float> lagWeights_;  // how rough a swing is whose frequency is that of so many bins
};

}  // namespace qvct
