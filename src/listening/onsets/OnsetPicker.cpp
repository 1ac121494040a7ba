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
      last_(-distance_ - 1) {
    sorted_.reserve(values_.size());
}

std::optional<std::int64_t> OnsetPicker::next(float value) {
    values_[static_cast<std::size_t>(count_) % values_.size()] = value;
    const std::int64_t frame = count_++ - static_cast<std::int64_t>(medianAfter_);
    if (frame < 0 || frame - last_ <= distance_ || !isLargest(frame)) return {};
    const float peak = at(frame);
    if (peak < kThreshold || peak < kThreshold + kMedianFactor * medianSince(frame, medianBefore_) ||
        peak < kLongThreshold + kLongMedianFactor * medianSince(frame, longMedian_)) {
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

float OnsetPicker::medianSince(std::int64_t frame, std::size_t before) {
    sorted_.clear();
    for (std::int64_t i = std::max<std::int64_t>(0, frame - static_cast<std::int64_t>(before)); i < count_;
         ++i) {
        sorted_.push_back(at(i));
    }
    const auto middle = sorted_.begin() + static_cast<std::ptrdiff_t>((sorted_.size() - 1) / 2);
    std::nth_element(sorted_.begin(), middle, sorted_.end());
    return *middle;
}

}  // namespace qvct
