#pragma once

#include <cstddef>
#include <span>
#include <vector>

namespace qvct {

/// How the level of a sound runs: its attack, its decay, how many strokes it begins with, how it flutters.
struct EnvelopeShape {
    static constexpr std::size_t kValues = 31;

    /// Appends kValues numbers, all finite and mostly within -10 and 10: times as binary logarithms, levels
    /// in units of 10 dB. REQUIRES: sampleRate > 0, finite samples, not all 0.
    static void append(std::span<const float> samples, double sampleRate, std::vector<float>& values);
};

}  // namespace qvct
