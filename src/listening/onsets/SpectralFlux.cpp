#include "listening/onsets/SpectralFlux.h"

#include "platform/base/Lanes.h"

#include <algorithm>
#include <cmath>
#include <complex>
#include <numbers>

#include <kissfft.hh>

namespace qvct {
namespace {

constexpr double kWindowSeconds = 0.0232;
constexpr double kFramesPerSecond = 200;
constexpr std::size_t kSmallestWindow = 64;
constexpr double kLowestHertz = 40;
constexpr double kHighestHertz = 16000;
constexpr double kBandsPerOctave = 8;
constexpr float kCompression = 1000;  // The scale is logarithmic from 60 dB below the loudest band on.
constexpr float kQuietest = 0.001F;   // Signals below do not get louder.
constexpr double kForgetting = 0.1;   // share of the loudest level forgotten in a second

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

// Compares each frame with the one two before it: the last two of the former four frames, then the first two
// of these.
Lanes twoBefore(Lanes former, Lanes these) {
    return Lanes(__builtin_shufflevector(former.v, these.v, 2, 3, 4, 5));
}

}  // namespace

struct SpectralFlux::Transform {
    explicit Transform(std::size_t size)
        : plan(size / 2, false), input(size), bins(size / 2), magnitudes(size / 2) {}

    kissfft<Lanes> plan;
    std::vector<Lanes> input;
    std::vector<std::complex<Lanes>> bins;
    std::vector<Lanes> magnitudes;
    std::vector<Lanes> levels, formerLevels;  // by band: of these four frames and of the four before
};

SpectralFlux::SpectralFlux(double sampleRate)
    : hop_(std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(sampleRate / kFramesPerSecond)))),
      framesPerSecond_(sampleRate / static_cast<double>(hop_)),
      window_(windowSizeFor(sampleRate)),
      loudest_(kQuietest),
      transform_(std::make_unique<Transform>(window_.size())) {
    makeWindow();
    makeBands(sampleRate);
    transform_->levels.resize(bands_.size());
    transform_->formerLevels.resize(bands_.size());
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
    for (int step = 0;; ++step) {
        const double hertz = kLowestHertz * std::exp2(step / kBandsPerOctave);
        if (hertz > highest) break;
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
    auto& [plan, input, bins, magnitudes, levels, formerLevels] = *transform_;
    for (std::size_t i = 0; i < window_.size(); ++i) {
        const float* sample = samples + i;
        const Lanes::Vector four = {sample[0], sample[hop_], sample[2 * hop_], sample[3 * hop_]};
        input[i] = Lanes(four) * window_[i];
    }
    plan.transform_real(input.data(), bins.data());
    for (std::size_t i = 0; i < bins.size(); ++i) {
        magnitudes[i] = squareRoot(bins[i].real() * bins[i].real() + bins[i].imag() * bins[i].imag());
    }
}

void SpectralFlux::measureBands() {
    std::vector<Lanes>& levels = transform_->levels;
    Lanes loudest(kQuietest);
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        const Band& band = bands_[b];
        const Lanes* magnitude = &transform_->magnitudes[band.firstBin];
        const float* weight = &weights_[band.firstWeight];
        Lanes level(0);
        for (std::size_t i = 0; i < band.count; ++i) level += magnitude[i] * weight[i];
        levels[b] = level;
        loudest = larger(loudest, level);
    }
    Lanes scale;
    const auto kept = static_cast<float>(1 - std::min(1.0, kForgetting / framesPerSecond_));
    for (int frame = 0; frame < 4; ++frame) {
        loudest_ = std::max(loudest.v[frame], loudest_ * kept);
        scale.v[frame] = kCompression / loudest_;
    }
    for (Lanes& level : levels) level = roughLog2(Lanes(1) + scale * level);
}

std::array<float, SpectralFlux::kTogether> SpectralFlux::next(const float* samples) {
    std::array<float, kTogether> rises{};
    const std::size_t count = bands_.size();
    if (count == 0) return rises;  // The rate is too low to hear anything.
    transform_->levels.swap(transform_->formerLevels);
    transform(samples);
    measureBands();

    const std::vector<Lanes>& now = transform_->levels;
    const std::vector<Lanes>& former = transform_->formerLevels;
    const auto past = [&](std::size_t band) { return twoBefore(former[band], now[band]); };
    Lanes rise(0);
    Lanes below = past(0);
    Lanes here = below;
    for (std::size_t b = 0; b < count; ++b) {
        const Lanes above = b + 1 < count ? past(b + 1) : here;
        rise += larger(Lanes(0), now[b] - larger(here, larger(below, above)));
        below = here;
        here = above;
    }
    for (std::size_t frame = 0; frame < kTogether; ++frame) {
        rises[frame] = rise.v[frame] / static_cast<float>(count);
    }
    return rises;
}

}  // namespace qvct
