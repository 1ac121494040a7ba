#include "listening/character/ShortTimeSpectra.h"

#include <algorithm>
#include <cmath>
#include <numbers>

#include <kissfft.hh>

namespace qvct {
namespace {

constexpr double kWindowSeconds = 0.0929;
constexpr std::size_t kSmallestWindow = 64;

// An even product of small primes, which transforms quickly.
std::size_t windowSizeFor(double sampleRate) {
    auto half =
        std::max(kSmallestWindow, static_cast<std::size_t>(std::lround(sampleRate * kWindowSeconds))) / 2;
    for (;; ++half) {
        std::size_t rest = half;
        for (const std::size_t prime : {2U, 3U, 5U}) {
            while (rest % prime == 0) rest /= prime;
        }
        if (rest == 1) return 2 * half;
    }
}

}  // namespace

struct ShortTimeSpectra::Transform {
    explicit Transform(std::size_t size) : plan(size / 2, false), input(size), bins(size / 2) {}

    kissfft<Lanes> plan;
    std::vector<Lanes> input;
    std::vector<std::complex<Lanes>> bins;
};

ShortTimeSpectra::ShortTimeSpectra(double sampleRate)
    : window_(windowSizeFor(sampleRate)), transform_(std::make_unique<Transform>(window_.size())) {
    const auto size = static_cast<double>(window_.size());
    binHertz_ = sampleRate / size;
    for (std::size_t i = 0; i < window_.size(); ++i) {
        const double phase = 2 * std::numbers::pi * static_cast<double>(i) / size;
        window_[i] = static_cast<float>((1 - std::cos(phase)) * 2 / size);
    }
}

ShortTimeSpectra::~ShortTimeSpectra() = default;

std::size_t ShortTimeSpectra::windowsOf(std::size_t samples) const {
    if (samples == 0) return 0;
    const std::size_t half = window_.size() / 2;
    return std::min(kMostWindows, (samples + half - 1) / half + 1);
}

void ShortTimeSpectra::load(std::span<const float> samples, float mean, std::size_t lane,
                            std::size_t window) {
    const std::size_t size = window_.size();
    const std::size_t windows = windowsOf(samples.size());
    float* input = reinterpret_cast<float*>(transform_->input.data()) + lane;
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
    transform_->plan.transform_real(transform_->input.data(), transform_->bins.data());
    return transform_->bins;
}

}  // namespace qvct
