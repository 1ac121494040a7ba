#include "listening/instrument/LoopMeasures.h"

#include <algorithm>
#include <cmath>
#include <numeric>

namespace qvct {
namespace {

// Fitted by training/qvct_training/loops.py: a weight for each measure, and what is added.
constexpr std::array<double, LoopMeasures::kCount> kWeights{0.9, -0.04, -3.34, 3.09, 0.48};
constexpr double kBias = -1.41;

constexpr double kFloor = 1e-6;  // -60 dB

double meanPower(std::span<const float> samples) {
    double sum = 0;
    for (const float sample : samples) sum += static_cast<double>(sample) * static_cast<double>(sample);
    return samples.empty() ? 0 : sum / static_cast<double>(samples.size());
}

}  // namespace

LoopMeasures LoopMeasures::of(std::span<const float> samples, double sampleRate,
                              std::span<const std::int64_t> onsets) {
    const double power = meanPower(samples);
    if (power == 0) return {};
    const auto length = static_cast<double>(samples.size());
    double last = 0, longest = 0;
    for (const std::int64_t onset : onsets) {
        const double at = std::clamp(static_cast<double>(onset), last, length);
        longest = std::max(longest, at - last);
        last = at;
    }
    longest = std::max(longest, length - last);
    const double end = meanPower(samples.last((samples.size() + 9) / 10)) / power;
    const double later = onsets.empty() ? 0 : static_cast<double>(onsets.size() - 1);
    return {{static_cast<float>(std::log2(later + 1)), static_cast<float>(last / length),
             static_cast<float>(longest / length),
             static_cast<float>(std::log2(std::max(length / sampleRate, 0.01))),
             static_cast<float>(std::log10(std::max(end, kFloor)))}};
}

double LoopMeasures::likelihood() const {
    double sum = kBias;
    for (std::size_t i = 0; i < kCount; ++i) sum += kWeights[i] * static_cast<double>(values[i]);
    return 1 / (1 + std::exp(-sum));
}

}  // namespace qvct
