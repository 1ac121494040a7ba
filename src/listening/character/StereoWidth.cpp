#include "listening/character/StereoWidth.h"

#include "listening/character/Emphasis.h"
#include "platform/base/Lanes.h"

#include <algorithm>
#include <cstddef>

namespace qvct {

double stereoWidth(std::span<const float> left, std::span<const float> right, double sampleRate) {
    constexpr std::size_t kRun = 4096;  // short enough for sums in single precision
    const float feedback = emphasisFeedback(sampleRate);
    double middle = 0, side = 0;
    for (std::size_t at = 1; at < left.size(); at += kRun) {
        Lanes middleRun(0), sideRun(0);
        const std::size_t end = std::min(left.size(), at + kRun);
        for (std::size_t i = at; i + 4 <= end; i += 4) {
            const Lanes leftNow = emphasized(&left[i], feedback), rightNow = emphasized(&right[i], feedback);
            const Lanes sum = leftNow + rightNow, difference = leftNow - rightNow;
            middleRun += sum * sum;
            sideRun += difference * difference;
        }
        middle += sumOf(middleRun);
        side += sumOf(sideRun);
    }
    return side > 0 ? side / (middle + side) : 0;
}

}  // namespace qvct
