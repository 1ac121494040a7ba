#pragma once

#include "listening/instrument/BandPicture.h"
#include "listening/instrument/Decimator.h"
#include "listening/instrument/PartialTones.h"

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

namespace qvct {

/// What the first two seconds of a sound are like, as a list of numbers that an `InstrumentModel` judges:
/// the energy of bands over time, how each band decays, the shape of the envelope, spectra of attack, body
/// and tail, partial tones and their glide. Neither loudness nor an offset matters, nor does silence before
/// the attack unless the sound begins off the middle.
///
/// @cost  About 0.3 ms for half a second at 44.1 kHz; less than 2 MB. One object is used from one thread.
class SoundFeatures {
  public:
    /// Changes when the numbers mean something else, so that a model made for others is told.
    static constexpr std::uint32_t kVersion = 2;
    /// Lower rates leave too little to hear.
    static constexpr double kLowestRate = 2000;
    static constexpr double kMostSeconds = 2;

    /// REQUIRES: kLowestRate <= sampleRate <= 64 kHz.
    explicit SoundFeatures(double sampleRate);

    /// How many numbers there are, at every rate.
    static std::size_t count();

    /// The numbers, all finite; empty for silence and for no samples. REQUIRES: samples are finite and within
    /// +-16.
    std::vector<float> of(std::span<const float> samples);

  private:
    std::span<const float> centred(std::span<const float> samples);
    std::span<const float> soundIn(std::span<const float> samples) const;
    void appendPicture(std::vector<float>& values) const;
    void appendBands(const BandPicture& picture, std::vector<float>& values) const;
    void appendGlide(std::vector<float>& values) const;
    void appendSpectra(std::vector<float>& values) const;
    void appendCrossings(std::span<const float> sound, std::vector<float>& values) const;

    double rate_;
    Decimator decimator_;
    BandPicture low_, high_;
    PartialTones partials_;
    std::vector<float> centred_, padded_, lower_;
};

}  // namespace qvct
