#pragma once

#include "listening/sound/FourTransforms.h"
#include "platform/base/Lanes.h"

#include <complex>
#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// The spectra of a sound in overlapping windows of 93 ms, four at once: the one transform that all spectral
/// measures share.
///
/// The windows (Hann) are centred on the first sample, on the end, and evenly in between, at most half a
/// window apart; further in sounds of more than 3 s, so that these take no longer. What lies outside the
/// sound counts as silence, so the attack of a short sound weighs as much as what follows.
///
/// @cost  20 us for four windows. The tables are made once; one object serves one thread.
class ShortTimeSpectra {
  public:
    /// REQUIRES: 1 <= sampleRate <= 64,000.
    explicit ShortTimeSpectra(double sampleRate);

    /// Windows that are looked at in one sound, at most.
    static constexpr std::size_t kMostWindows = 64;
    static constexpr std::size_t kTogether = 4;

    std::size_t windowSize() const { return window_.size(); }
    double binHertz() const { return binHertz_; }
    std::size_t bins() const { return window_.size() / 2; }
    /// Windows that a sound of so many samples is looked at in.
    std::size_t windowsOf(std::size_t samples) const;

    /// The spectra of the windows `first` to `first + 3` of a sound, less its mean; those behind the last are
    /// 0. A sine of amplitude 1 has a magnitude of 1. Valid until the next call.
    std::span<const std::complex<Lanes>> at(std::span<const float> samples, float mean, std::size_t first);

  private:
    void load(std::span<const float> samples, float mean, std::size_t lane, std::size_t window);

    double binHertz_;
    FourTransforms transforms_;
    std::vector<float> window_;
};

}  // namespace qvct
