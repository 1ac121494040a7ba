#include "listening/character/ShortTimeSpectra.h"

#include <algorithm>
#include <cmath>
#include <numbers>

namespace qvct {
namespace {

constexpr double kWindowSeconds = 0.0929;
constexpr std::size_t kSmallestWindow = 64;

}  // namespace

ShortTimeSpectra::ShortTimeSpectra(double sampleRate)
    : transforms_(FourTransforms::sizeFor(kWindowSeconds, sampleRate, kSmallestWindow)),
      window_(transforms_.size()) {
    const auto size = static_cast<double>(window_.size());
    binHertz_ = sampleRate / size;
    for (std::size_t i = 0; i < window_.size(); ++i) {
        const double phase = 2 * std::numbers::pi * static_cast<double>(i) / size;
        window_[i] = static_cast<float>((1 - std::cos(phase)) * 2 / size);
    }
}

std::size_t ShortTimeSpectra::windowsOf(std::size_t samples) const {
    if (samples == 0) return 0;
    const std::size_t half = window_.size() / 2;
    return std::min(kMostWindows, (samples + half - 1) / half + 1);
}

void ShortTimeSpectra::load(std::span<const float> samples, float mean, std::size_t lane,
                            std::size_t window) {
    const std::size_t size = window_.size();
    const std::size_t windows = windowsOf(samples.size());
    float* input = reinterpret_cast<float*>(transforms_.input().data()) + lane;
    if (window >= windows) {
        for (std::size_t i = 0; i < size; ++i) input[kTogether * i] = 0;
        return;
    }
    const std::size_t center = window * samples.size() / (windows - 1);
    // From and to which places of the window there are samples.
    const std::size_t from = center >= size / 2 ? 0 : size / 2 - center;
    const std::size_t to = std::min(size, samples.size() + size / 2 - center);
    const float* sample = samples.data() + (center + from - size / 2);
    for (std::size_t i = 0; i < from; ++i) input[kTogether * i] = 0;
    for (std::size_t i = from; i < to; ++i) input[kTogether * i] = (sample[i - from] - mean) * window_[i];
    for (std::size_t i = to; i < size; ++i) input[kTogether * i] = 0;
}

std::span<const std::complex<Lanes>> ShortTimeSpectra::at(std::span<const float> samples, float mean,
                                                          std::size_t first) {
    for (std::size_t lane = 0; lane < kTogether; ++lane) load(samples, mean, lane, first + lane);
    return transforms_.transform();
}

}  // namespace qvct
