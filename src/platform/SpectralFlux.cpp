#include "platform/SpectralFlux.h"

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <numbers>

#include <kiss_fftr.h>

namespace qvct {
namespace {

constexpr double kWindowSeconds = 0.0232;
constexpr double kFramesPerSecond = 200;
constexpr std::size_t kSmallestWindow = 64;
constexpr double kLowestHertz = 40;
constexpr double kHighestHertz = 16000;
constexpr double kBandsPerOctave = 8;
constexpr std::size_t kLag = 2;       // frames to the one that is compared with
constexpr float kCompression = 1000;  // The scale is logarithmic from 60 dB below the loudest band on.
constexpr float kQuietest = 0.001F;   // Signals below do not get louder.
constexpr double kForgetting = 0.1;   // share of the loudest level forgotten in a second

/// Binary logarithm to about 0.006, for x >= 1; in a form that compilers vectorise.
float roughLog2(float x) {
    const auto bits = std::bit_cast<std::uint32_t>(x);
    const auto exponent = static_cast<float>(static_cast<std::int32_t>(bits >> 23) - 127);
    const float mantissa = std::bit_cast<float>((bits & 0x7FFFFFU) | 0x3F800000U);
    return exponent + (2.0F - 0.33582878F * mantissa) * mantissa - 1.65871022F;
}

std::size_t windowSizeFor(double sampleRate) {
    const auto wanted = static_cast<int>(std::lround(sampleRate * kWindowSeconds));
    return std::max<std::size_t>(kSmallestWindow,
                                 static_cast<std::size_t>(kiss_fftr_next_fast_size_real(wanted)));
}

}  // namespace

struct SpectralFlux::Transform {
    explicit Transform(std::size_t size)
        : plan(kiss_fftr_alloc(static_cast<int>(size), 0, nullptr, nullptr)),
          input(size),
          bins(size / 2 + 1) {}
    Transform(const Transform&) = delete;
    Transform& operator=(const Transform&) = delete;
    ~Transform() { kiss_fftr_free(plan); }

    kiss_fftr_cfg plan;
    std::vector<float> input;
    std::vector<kiss_fft_cpx> bins;
};

SpectralFlux::SpectralFlux(double sampleRate)
    : hop_(std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(sampleRate / kFramesPerSecond)))),
      framesPerSecond_(sampleRate / static_cast<double>(hop_)),
      window_(windowSizeFor(sampleRate)),
      magnitudes_(window_.size() / 2 + 1),
      loudest_(kQuietest),
      transform_(std::make_unique<Transform>(window_.size())) {
    makeWindow();
    makeBands(sampleRate);
    levels_.resize((kLag + 1) * bands_.size());
}

SpectralFlux::~SpectralFlux() = default;

// A Hann window, scaled so that a sine has its amplitude as magnitude.
void SpectralFlux::makeWindow() {
    const auto size = static_cast<double>(window_.size());
    for (std::size_t i = 0; i < window_.size(); ++i) {
        const double phase = 2 * std::numbers::pi * (static_cast<double>(i) + 0.5) / size;
        window_[i] = static_cast<float>((1 - std::cos(phase)) * 2 / size);
    }
}

// Triangles from one centre to the next; where bins are wider than a band, one band a bin.
void SpectralFlux::makeBands(double sampleRate) {
    const double binWidth = sampleRate / static_cast<double>(window_.size());
    const double highest = std::min(kHighestHertz, sampleRate / 2 - binWidth);
    std::vector<std::size_t> centers;
    for (double hertz = kLowestHertz; hertz <= highest; hertz *= std::exp2(1 / kBandsPerOctave)) {
        const auto bin = static_cast<std::size_t>(std::lround(hertz / binWidth));
        if (bin >= 1 && (centers.empty() || bin > centers.back())) centers.push_back(bin);
    }
    for (std::size_t i = 1; i + 1 < centers.size(); ++i) {
        const std::size_t low = centers[i - 1], center = centers[i], high = centers[i + 1];
        bands_.push_back({low + 1, weights_.size(), high - low - 1});
        for (std::size_t bin = low + 1; bin < high; ++bin) {
            weights_.push_back(bin <= center
                                   ? static_cast<float>(bin - low) / static_cast<float>(center - low)
                                   : static_cast<float>(high - bin) / static_cast<float>(high - center));
        }
    }
}

void SpectralFlux::transform(const float* samples) {
    float* input = transform_->input.data();
    for (std::size_t i = 0; i < window_.size(); ++i) input[i] = samples[i] * window_[i];
    kiss_fftr(transform_->plan, input, transform_->bins.data());
    const kiss_fft_cpx* bins = transform_->bins.data();
    for (std::size_t i = 0; i < magnitudes_.size(); ++i) {
        magnitudes_[i] = std::sqrt(bins[i].r * bins[i].r + bins[i].i * bins[i].i);
    }
}

void SpectralFlux::measureBands(float* levels) {
    float loudest = kQuietest;
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        const Band& band = bands_[b];
        const float* magnitude = &magnitudes_[band.firstBin];
        const float* weight = &weights_[band.firstWeight];
        float level = 0;
        for (std::size_t i = 0; i < band.count; ++i) level += magnitude[i] * weight[i];
        levels[b] = level;
        loudest = std::max(loudest, level);
    }
    loudest_ =
        std::max(loudest, loudest_ * static_cast<float>(1 - std::min(1.0, kForgetting / framesPerSecond_)));
    const float scale = kCompression / loudest_;
    for (std::size_t b = 0; b < bands_.size(); ++b) levels[b] = roughLog2(1 + scale * levels[b]);
}

float SpectralFlux::next(const float* samples) {
    const std::size_t count = bands_.size();
    if (count == 0) return 0;  // The rate is too low to hear anything.
    transform(samples);
    float* now = &levels_[row_ * count];
    measureBands(now);
    row_ = (row_ + 1) % (kLag + 1);

    const float* past = &levels_[row_ * count];
    float rise = 0;
    for (std::size_t b = 0; b < count; ++b) {
        const float below = past[b > 0 ? b - 1 : 0];
        const float above = past[std::min(b + 1, count - 1)];
        rise += std::max(0.0F, now[b] - std::max({past[b], below, above}));
    }
    return rise / static_cast<float>(count);
}

}  // namespace qvct
