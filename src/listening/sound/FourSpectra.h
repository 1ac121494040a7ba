#pragma once

#include "listening/sound/FourTransforms.h"
#include "platform/base/Lanes.h"

#include <array>
#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// Power spectra of four frames at once, each under a Hann window.
///
/// @cost  About that of one real FFT. One object is used from one thread.
class FourSpectra {
  public:
    /// REQUIRES: size is even.
    explicit FourSpectra(std::size_t size);

    /// The next even product of small primes from `seconds` of samples on, which transforms quickly.
    static std::size_t sizeFor(double seconds, double sampleRate);

    std::size_t size() const { return window_.size(); }
    std::size_t bins() const { return window_.size() / 2; }
    /// A bin a lane for each frame, from 0 Hz on, valid until the next call; a sine of amplitude 1 has about
    /// power 1. REQUIRES: size() finite samples at each pointer.
    std::span<const Lanes> powers(const std::array<const float*, 4>& frames);
    /// The same of shorter frames, under a window of their length and with silence behind them.
    /// REQUIRES: length <= size(), so many finite samples at each pointer.
    std::span<const Lanes> powers(const std::array<const float*, 4>& frames, std::size_t length);

  private:
    std::span<const Lanes> powersOfInput();

    FourTransforms transforms_;
    std::vector<float> window_;
    std::vector<Lanes> powers_;
};

}  // namespace qvct
