#pragma once

#include "platform/base/Lanes.h"

#include <array>
#include <complex>
#include <cstddef>
#include <memory>
#include <span>
#include <vector>

namespace qvct {

/// Fourier transforms of four frames of real samples at once, a frame in each lane.
///
/// @cost  About that of one real FFT. One object is used from one thread.
class FourTransforms {
  public:
    /// REQUIRES: size is even.
    explicit FourTransforms(std::size_t size);
    ~FourTransforms();

    /// The next even product of small primes from `seconds` of samples and from `smallest` on, which
    /// transforms quickly.
    static std::size_t sizeFor(double seconds, double sampleRate, std::size_t smallest);
    /// A Hann window over the middles of samples, scaled so that a sine of amplitude 1 has magnitude 1.
    static std::vector<float> window(std::size_t size);

    std::size_t size() const;
    /// The frames, to be written before each transform. It keeps what was written.
    std::span<Lanes> input();
    /// Writes four frames under a window. REQUIRES: size() samples at each pointer and in the window.
    void load(const std::array<const float*, 4>& frames, std::span<const float> window);
    /// Half as many bins as a frame has samples, valid until the next call. The first one holds the amplitude
    /// at half the rate as its imaginary part.
    std::span<const std::complex<Lanes>> transform();

  private:
    struct Buffers;

    std::unique_ptr<Buffers> buffers_;
};

}  // namespace qvct
