#include "listening/instrument/Decimator.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>

namespace qvct {
namespace {

constexpr double kCutoff = 0.42;      // of the lower rate
constexpr std::size_t kReach = 4;     // samples of the lower rate on each side of a tap's middle
constexpr std::size_t kTogether = 8;  // partial sums, which the compiler computes at once

}  // namespace

Decimator::Decimator(double sampleRate, double wishedRate)
    : factor_(std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(sampleRate / wishedRate)))),
      rate_(sampleRate / static_cast<double>(factor_)) {
    if (factor_ == 1) return;
    const auto side = static_cast<double>(kReach * factor_);
    double sum = 0;
    for (std::size_t i = 0; i <= 2 * kReach * factor_; ++i) {
        const double at = static_cast<double>(i) - side;
        const double angle = 2 * std::numbers::pi * kCutoff * at / static_cast<double>(factor_);
        const double sinc = at == 0 ? 1 : std::sin(angle) / angle;
        const double window = 0.5 + 0.5 * std::cos(std::numbers::pi * at / (side + 1));
        taps_.push_back(static_cast<float>(sinc * window));
        sum += sinc * window;
    }
    for (float& tap : taps_) tap /= static_cast<float>(sum);
}

float Decimator::filtered(std::span<const float> samples, std::size_t middle) const {
    const std::size_t side = taps_.size() / 2;
    const std::size_t from = middle < side ? side - middle : 0;  // taps before the sound
    const std::size_t end = std::min(taps_.size(), samples.size() + side - middle);
    const float* sample = samples.data() + (middle + from - side);
    std::array<float, kTogether> sums{};
    std::size_t i = from;
    for (; i + kTogether <= end; i += kTogether, sample += kTogether) {
        for (std::size_t k = 0; k < kTogether; ++k) sums[k] += taps_[i + k] * sample[k];
    }
    for (; i < end; ++i) sums[0] += taps_[i] * *sample++;
    float sum = 0;
    for (const float part : sums) sum += part;
    return sum;
}

void Decimator::append(std::span<const float> samples, std::vector<float>& lower) const {
    if (factor_ == 1) {
        lower.insert(lower.end(), samples.begin(), samples.end());
        return;
    }
    for (std::size_t at = 0; at < samples.size(); at += factor_) lower.push_back(filtered(samples, at));
}

}  // namespace qvct
