#include "listening/onsets/OnsetPicker.h"

#include <algorithm>
#include <cmath>

namespace qvct {
namespace {

constexpr double kBefore = 0.020, kAfter = 0.005;              // seconds
constexpr double kMedianBefore = 0.100, kMedianAfter = 0.050;  // seconds
constexpr double kLongMedian = 2;                              // seconds
constexpr double kDistance = 0.030;                            // seconds
constexpr float kThreshold = 0.12F, kMedianFactor = 1.2F;
constexpr float kLongThreshold = 0.05F, kLongMedianFactor = 4;

std::size_t framesIn(double seconds, double framesPerSecond) {
    return std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(seconds * framesPerSecond)));
}

}  // namespace

OnsetPicker::OnsetPicker(double framesPerSecond)
    : before_(framesIn(kBefore, framesPerSecond)),
      after_(framesIn(kAfter, framesPerSecond)),
      medianBefore_(framesIn(kMedianBefore, framesPerSecond)),
      medianAfter_(framesIn(kMedianAfter, framesPerSecond)),
      longMedian_(framesIn(kLongMedian, framesPerSecond)),
      distance_(static_cast<std::int64_t>(framesIn(kDistance, framesPerSecond))),
      values_(longMedian_ + medianAfter_ + 1),
      last_(-distance_ - 1) {}

std::optional<std::int64_t> OnsetPicker::next(float value) {
    values_[static_cast<std::size_t>(count_) % values_.size()] = value;
    const std::int64_t frame = count_++ - static_cast<std::int64_t>(medianAfter_);
    if (frame < 0 || frame - last_ <= distance_ || !isLargest(frame)) return {};
    const float peak = at(frame);
    if (!isMedianAtMost((peak - kThreshold) / kMedianFactor, frame, medianBefore_) ||
        !isMedianAtMost((peak - kLongThreshold) / kLongMedianFactor, frame, longMedian_)) {
        return {};
    }
    last_ = frame;
    return frame;
}

bool OnsetPicker::isLargest(std::int64_t frame) const {
    const float peak = at(frame);
    const std::int64_t first = std::max<std::int64_t>(0, frame - static_cast<std::int64_t>(before_));
    for (std::int64_t i = first; i < frame; ++i) {
        if (at(i) >= peak) return false;
    }
    for (std::int64_t i = frame + 1; i <= frame + static_cast<std::int64_t>(after_); ++i) {
        if (at(i) > peak) return false;
    }
    return true;
}

// Counting takes less time than to find the median.
bool OnsetPicker::isMedianAtMost(float bound, std::int64_t frame, std::size_t before) const {
    const auto size = static_cast<std::int64_t>(values_.size());
    const std::int64_t first = std::max<std::int64_t>(0, frame - static_cast<std::int64_t>(before));
    std::int64_t small = 0;
    for (std::int64_t i = first; i < count_;) {
        const std::int64_t end = std::min(count_, i + size - i % size);  // of a run in the ring
        const float* run = &values_[static_cast<std::size_t>(i % size)];
        small += std::count_if(run, run + (end - i), [=](float value) { return value <= bound; });
        i = end;
    }
    return small > (count_ - first - 1) / 2;
}

}  // namespace qvct
