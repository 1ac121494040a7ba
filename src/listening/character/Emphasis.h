#pragma once

#include "platform/base/Lanes.h"

#include <cmath>
#include <numbers>

namespace qvct {

inline double sumOf(Lanes lanes) {
    return double{lanes.v[0]} + lanes.v[1] + lanes.v[2] + lanes.v[3];
}

/// A filter that lets through 6 dB more with every octave above 500 Hz: a sample less so much of the one
/// before.
inline float emphasisFeedback(double sampleRate) {
    constexpr double kCornerHertz = 500;
    return static_cast<float>(std::exp(-2 * std::numbers::pi * kCornerHertz / sampleRate));
}

/// Four samples of what it lets through. REQUIRES: there is a sample before the first.
inline Lanes emphasized(const float* samples, float feedback) {
    return lanesAt(samples) - lanesAt(samples - 1) * feedback;
}

}  // namespace qvct
