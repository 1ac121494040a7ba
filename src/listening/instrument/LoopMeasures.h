#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>

namespace qvct {

/// What tells a loop from a one-shot, measured on the whole sound or on its beginning.
struct LoopMeasures {
    static constexpr std::size_t kCount = 5;

    /// Octaves of the number of onsets after the first, plus one; the last onset and the longest time without
    /// one as shares of the length; octaves of the length in seconds; and the level of the last tenth beside
    /// that of the whole, in units of 10 dB. All 0 for no samples.
    std::array<float, kCount> values{};

    /// `onsets` are positions of samples, as `OnsetDetector` finds them. REQUIRES: finite samples, rate >= 1.
    static LoopMeasures of(std::span<const float> samples, double sampleRate,
                           std::span<const std::int64_t> onsets);

    /// How likely it is that the sound is a loop, 0 to 1: 0.1 to 0.9 is best taken as "cannot tell".
    double likelihood() const;
};

}  // namespace qvct
