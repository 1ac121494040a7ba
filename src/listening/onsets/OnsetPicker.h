#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

namespace qvct {

/// Picks the peaks of a novelty curve as it comes, with a delay of a few frames.
///
/// A peak is the largest value of its nearest neighbours and exceeds, by a fixed amount and a factor, the
/// median of the curve around it and, by more, the median of the last 2 s, so that steady noise raises the
/// bar. Of peaks within 30 ms the first counts: a flam begins with its first stroke.
class OnsetPicker {
  public:
    explicit OnsetPicker(double framesPerSecond);

    /// The number of the frame that turned out to be a peak, now that one more value is known; frames count
    /// from 0.
    std::optional<std::int64_t> next(float value);
    /// Frames by which `next` is late.
    std::size_t delay() const { return medianAfter_; }

  private:
    float at(std::int64_t frame) const { return values_[static_cast<std::size_t>(frame) % values_.size()]; }
    bool isLargest(std::int64_t frame) const;
    bool isMedianAtMost(float bound, std::int64_t frame, std::size_t before) const;

    std::size_t before_, after_;              // frames within which a peak is the largest
    std::size_t medianBefore_, medianAfter_;  // frames of the short median
    std::size_t longMedian_;                  // frames of the long one before the peak
    std::int64_t distance_;                   // frames that peaks keep from each other
    std::vector<float> values_;               // a ring of the last ones
    std::int64_t count_ = 0;
    std::int64_t last_;
};

}  // namespace qvct
