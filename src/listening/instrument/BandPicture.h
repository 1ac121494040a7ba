#pragma once

#include "listening/sound/FourSpectra.h"

#include <array>
#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// The energy of a sound in bands of frequency over time: frames of equal distance, the first one centred on
/// the sound's first sample.
///
/// @cost  An FFT of a frame each hop. One object is used from one thread.
class BandPicture {
  public:
    /// Bands lie between neighbouring edges, in Hz; those above half the rate stay empty. Frames overlap by
    /// `size / hop`. REQUIRES: edges ascend.
    BandPicture(double sampleRate, double frameSeconds, std::size_t overlap, std::vector<double> edges);

    /// The parts of a sound whose mean spectra are kept: from which second on, and until when.
    struct Part {
        double from, end;
    };
    static constexpr std::array<Part, 3> kParts{{{0, 0.02}, {0.02, 0.12}, {0.12, 0.6}}};

    /// Measures a sound that is to be found at `padded` from `lead()` on: before it zeros, and after it
    /// `trail()` of them. REQUIRES: finite samples.
    void measure(std::span<const float> padded);
    std::size_t lead() const { return spectra_.size() / 2; }
    std::size_t trail() const { return spectra_.size() + 3 * hop_; }

    std::size_t bands() const { return edges_.size() - 1; }
    std::size_t frames() const { return energies_.size() / bands(); }
    double framesPerSecond() const { return rate_ / static_cast<double>(hop_); }
    std::span<const float> frame(std::size_t index) const {
        return std::span(energies_).subspan(index * bands(), bands());
    }
    /// The mean power of each bin in a part of the sound; all 0 where the sound is shorter.
    std::span<const float> meanSpectrum(std::size_t part) const { return means_[part]; }
    double binWidth() const { return rate_ / static_cast<double>(spectra_.size()); }

  private:
    struct Band {
        std::size_t firstBin, endBin;
    };

    void addFrames(std::span<const Lanes> powers, std::size_t first, std::size_t count);

    double rate_;
    FourSpectra spectra_;
    std::size_t hop_;
    std::vector<double> edges_;
    std::vector<Band> bands_;
    std::vector<float> energies_;  // by frame, then band
    std::array<std::vector<float>, kParts.size()> means_;
};

}  // namespace qvct
