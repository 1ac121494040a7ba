#include "listening/character/TruePeak.h"

#include "listening/character/Emphasis.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <cstddef>
#include <numbers>
#include <vector>

namespace qvct {
namespace {

constexpr std::size_t kTaps = 12;
constexpr std::size_t kBefore = kTaps / 2 - 1;  // taps before the sample that a value follows
constexpr std::size_t kBlock = 16;              // samples that are looked at, or passed over, together

// The filter for the values at a quarter, a half and three quarters of the way to the next sample.
struct Interpolation {
    std::array<std::array<float, kTaps>, 3> phases{};
    float bound = 0;  // No value is larger than this many times the largest sample around.

    Interpolation() {
        for (std::size_t p = 0; p < phases.size(); ++p) {
            float sum = 0;
            for (std::size_t tap = 0; tap < kTaps; ++tap) {
                const double time =
                    static_cast<double>(tap) - double{kBefore} - static_cast<double>(p + 1) / 4;
                const double angle = std::numbers::pi * time;
                const double window = 0.5 + 0.5 * std::cos(angle / (double{kTaps} / 2));
                phases[p][tap] = static_cast<float>(window * std::sin(angle) / angle);
                sum += std::abs(phases[p][tap]);
            }
            bound = std::max(bound, sum);
        }
    }
};

float largestOf(Lanes lanes) {
    return std::max({lanes.v[0], lanes.v[1], lanes.v[2], lanes.v[3]});
}

// One channel, cut into blocks.
class Channel {
  public:
    explicit Channel(std::span<const float> samples)
        : samples_(samples), peaks_((samples.size() + kBlock - 1) / kBlock + 1) {
        for (std::size_t block = 0; block + 1 < peaks_.size(); ++block) peaks_[block] = peakOf(block);
    }

    float samplePeak() const { return *std::max_element(peaks_.begin(), peaks_.end()); }

    // The largest value between samples, if it is larger than `peak`.
    float truePeak(float peak, const Interpolation& filter) const {
        for (std::size_t block = 0; block < peaks_.size(); ++block) {
            float around = peaks_[block];
            if (block > 0) around = std::max(around, peaks_[block - 1]);
            if (block + 1 < peaks_.size()) around = std::max(around, peaks_[block + 1]);
            if (around * filter.bound > peak) peak = std::max(peak, peakBetween(block, filter));
        }
        return peak;
    }

  private:
    float peakOf(std::size_t block) const {
        const auto part =
            samples_.subspan(block * kBlock).first(std::min(kBlock, samples_.size() - block * kBlock));
        if (part.size() < kBlock) {
            float peak = 0;
            for (const float sample : part) peak = std::max(peak, std::abs(sample));
            return peak;
        }
        Lanes peak(0);
        for (std::size_t i = 0; i < kBlock; i += 4) {
            const Lanes four = lanesAt(&part[i]);
            peak = larger(peak, larger(four, -four));
        }
        return largestOf(peak);
    }

    // Of the values that follow the samples of a block.
    float peakBetween(std::size_t block, const Interpolation& filter) const {
        std::array<float, kBlock + kTaps> edge{};
        const std::size_t begin = block * kBlock;
        const float* samples = edge.data();
        if (begin >= kBefore && begin + kBlock + kTaps <= samples_.size() + kBefore) {
            samples = samples_.data() + (begin - kBefore);
        } else {
            for (std::size_t i = 0; i < edge.size(); ++i) {
                const std::size_t at = begin + i;
                if (at >= kBefore && at - kBefore < samples_.size()) edge[i] = samples_[at - kBefore];
            }
        }
        Lanes peak(0);
        for (std::size_t i = 0; i < kBlock; i += 4) {
            for (const auto& taps : filter.phases) {
                Lanes value(0);
                for (std::size_t tap = 0; tap < kTaps; ++tap) value += lanesAt(samples + i + tap) * taps[tap];
                peak = larger(peak, larger(value, -value));
            }
        }
        return largestOf(peak);
    }

    std::span<const float> samples_;
    std::vector<float> peaks_;  // of each block, and of the silence behind the last
};

}  // namespace

std::optional<double> truePeak(std::span<const float> left, std::span<const float> right) {
    static const Interpolation filter;
    const Channel first(left), second(right);
    const float samplePeak = std::max(first.samplePeak(), second.samplePeak());
    const float peak = second.truePeak(first.truePeak(samplePeak, filter), filter);
    if (peak <= 0) return std::nullopt;
    return 20 * std::log10(double{peak});
}

}  // namespace qvct
