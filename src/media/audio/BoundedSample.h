#pragma once

#include <algorithm>

namespace qvct {

/// A sample that analyses can compute with: what is not finite becomes silence, and what is louder than 16
/// times full scale is clipped to that.
inline float boundedSample(float sample) {
    constexpr float kLargest = 16;
    const float clipped = std::clamp(sample, -kLargest, kLargest);
    return sample * 0 == 0 ? clipped : 0;  // infinity and NaN times 0 are NaN
}

}  // namespace qvct
