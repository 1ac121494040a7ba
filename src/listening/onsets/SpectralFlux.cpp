#include "listening/onsets/SpectralFlux.h"

#include "listening/sound/FourTransforms.h"
#include "platform/base/Lanes.h"

#include <algorithm>
#include <cmath>
#include <complex>

namespace qvct {
namespace {

constexpr double kWindowSeconds = 0.0232;
constexpr double kFramesPerSecond = 200;
constexpr std::size_t kSmallestWindow = 64;
constexpr double kLowestHertz = 40;
constexpr double kHighestHertz = 16000;
constexpr double kBandsPerOctave = 8;
constexpr float kCompression = 300;   // The scale is logarithmic from 50 dB below the reference on.
constexpr float kQuietest = 0.001F;   // Signals below do not get louder.
constexpr double kForgetting = 0.1;   // share of the loudest level forgotten in a second
constexpr double kPeakSeconds = 0.5;  // time in which the peak of a band falls to 1/e
constexpr float kLowestPeak = 0.1F;   // of the loudest level
constexpr float kFall = 0.25F;        // octaves of magnitude by which a held level falls in a frame
constexpr double kHigh = 7000;        // Hz from which on rises count for themselves, too
constexpr float kHighShare = 0.6F;    // their weight

// The frames two before these four: the last two of the former four, then the first two of these.
Lanes twoBefore(Lanes former, Lanes these) {
    return Lanes(__builtin_shufflevector(former.v, these.v, 2, 3, 4, 5));
}

}  // namespace

struct SpectralFlux::Transform {
    explicit Transform(std::size_t size) : four(size), magnitudes(size / 2) {}

    FourTransforms four;
    std::vector<Lanes> magnitudes;
    // By band: of these four frames and of the four before, and what these are compared with.
    std::vector<Lanes> levels, formerLevels, heldLevels;
};

SpectralFlux::SpectralFlux(double sampleRate)
    : hop_(std::max<std::size_t>(1, static_cast<std::size_t>(std::lround(sampleRate / kFramesPerSecond)))),
      framesPerSecond_(sampleRate / static_cast<double>(hop_)),
      window_(FourTransforms::window(FourTransforms::sizeFor(kWindowSeconds, sampleRate, kSmallestWindow))),
      loudest_(kQuietest),
      transform_(std::make_unique<Transform>(window_.size())) {
    makeBands(sampleRate);
    transform_->levels.resize(bands_.size());
    transform_->formerLevels.resize(bands_.size());
    transform_->heldLevels.resize(bands_.size());
    peaks_.resize(bands_.size());
}

SpectralFlux::~SpectralFlux() = default;

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
        if (static_cast<double>(center) * binWidth < kHigh) firstHigh_ = i;
        bands_.push_back({low + 1, weights_.size(), high - low - 1});
        for (std::size_t bin = low + 1; bin < high; ++bin) {
            weights_.push_back(bin <= center
                                   ? static_cast<float>(bin - low) / static_cast<float>(center - low)
                                   : static_cast<float>(high - bin) / static_cast<float>(high - center));
        }
    }
}

void SpectralFlux::transform(const float* samples) {
    transform_->four.load({samples, samples + hop_, samples + 2 * hop_, samples + 3 * hop_}, window_);
    const std::span<const std::complex<Lanes>> bins = transform_->four.transform();
    for (std::size_t i = 0; i < bins.size(); ++i) {
        transform_->magnitudes[i] =
            squareRoot(bins[i].real() * bins[i].real() + bins[i].imag() * bins[i].imag());
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
    const auto kept = static_cast<float>(1 - std::min(1.0, kForgetting / framesPerSecond_));
    for (int frame = 0; frame < 4; ++frame)
        loudest.v[frame] = loudest_ = std::max(loudest.v[frame], loudest_ * kept);
    scaleBands(loudest);
}

// Half way from the loudest level of the whole to the peak of each band, as ears adapt to what goes on.
void SpectralFlux::scaleBands(Lanes loudest) {
    const auto kept = static_cast<float>(std::exp(-1 / (kPeakSeconds * framesPerSecond_)));
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        Lanes& level = transform_->levels[b];
        Lanes peak;
        for (int frame = 0; frame < 4; ++frame) {
            peaks_[b] = std::max({level.v[frame], peaks_[b] * kept, kLowestPeak * loudest.v[frame]});
            peak.v[frame] = peaks_[b];
        }
        level = roughLog2(Lanes(1) + kCompression * level / squareRoot(peak * loudest));
    }
}

// What a band is compared with: its level two frames before, or what is left of higher ones before that.
void SpectralFlux::holdLevels() {
    for (std::size_t b = 0; b < bands_.size(); ++b) {
        Lanes& held = transform_->heldLevels[b];
        const Lanes past = twoBefore(transform_->formerLevels[b], transform_->levels[b]);
        float last = held.v[3];
        for (int frame = 0; frame < 4; ++frame) held.v[frame] = last = std::max(past.v[frame], last - kFall);
    }
}

std::array<float, SpectralFlux::kTogether> SpectralFlux::next(const float* samples) {
    std::array<float, kTogether> rises{};
    const std::size_t count = bands_.size();
    if (count == 0) return rises;  // The rate is too low to hear anything.
    transform_->levels.swap(transform_->formerLevels);
    transform(samples);
    measureBands();

    holdLevels();

    const std::vector<Lanes>& now = transform_->levels;
    const std::vector<Lanes>& held = transform_->heldLevels;
    Lanes all(0), high(0);
    Lanes below = held[0];
    for (std::size_t b = 0; b < count; ++b) {
        const Lanes above = held[std::min(b + 1, count - 1)];
        const Lanes rise = larger(Lanes(0), now[b] - larger(held[b], larger(below, above)));
        all += rise;
        if (b >= firstHigh_) high += rise;
        below = held[b];
    }
    const auto highCount = static_cast<float>(std::max<std::size_t>(1, count - firstHigh_));
    const Lanes rise = larger(all / static_cast<float>(count), high * (kHighShare / highCount));
    for (std::size_t frame = 0; frame < kTogether; ++frame) rises[frame] = rise.v[frame];
    return rises;
}

}  // namespace qvct
