#include "listening/likeness/Fingerprinter.h"

#include <algorithm>
#include <array>
#include <cmath>
#include <numbers>

namespace qvct {
namespace {

constexpr double kLowRate = 5512, kWorthHalving = 20'000;  // Hz
constexpr double kSmoothing = 0.0004;                      // seconds, standard deviation
constexpr float kQuietest = 0.01F;                         // of the highest peak
constexpr double kAlone = 0.003;                           // seconds around a peak without a higher one
// So that of a long sound not only the loudest moment is known, which may be cut off.
constexpr double kNearby = 0.05;  // seconds around a peak
constexpr std::size_t kMostNearby = 8;

constexpr std::size_t kBands = 16;
constexpr double kLowestBand = 110, kBandStep = 1.2;  // Hz, and the ratio of neighbours
constexpr double kCycles = 0.8;                       // in the standard deviation of a wavelet
constexpr double kReach = 2.5;                        // standard deviations
constexpr float kFaint = 3e-2F;                       // of the strongest band: noise decides its phase

}  // namespace

Fingerprinter::Fingerprinter(double sampleRate)
    : sampleRate_(sampleRate),
      halves_(sampleRate >= kWorthHalving),
      decimator_(halves_ ? sampleRate / 2 : sampleRate, kLowRate) {
    const double rate = decimator_.sampleRate();
    const double width = std::max(kSmoothing * rate, 0.5);
    for (int i = 1; i <= static_cast<int>(std::ceil(3.5 * width)); ++i)
        slopeTaps_.push_back(static_cast<float>(i * std::exp(-i * i / (2 * width * width))));
    for (std::size_t b = 0; b < kBands; ++b) {
        const double cycles = kLowestBand * std::pow(kBandStep, static_cast<double>(b)) / rate;
        Wavelet& wavelet = wavelets_.emplace_back(Wavelet{cycles, {}, {}});
        const double deviation = kCycles / cycles;
        const int reach = static_cast<int>(kReach * deviation);
        for (int i = -reach; i <= reach; ++i) {
            const double level = std::exp(-i * i / (2 * deviation * deviation)) / deviation;
            const double angle = 2 * std::numbers::pi * cycles * i;
            wavelet.real.push_back(static_cast<float>(level * std::cos(angle)));
            wavelet.imaginary.push_back(static_cast<float>(-level * std::sin(angle)));
        }
    }
}

void Fingerprinter::measureLowerRate(std::span<const float> samples) {
    lower_.clear();
    if (!halves_) return decimator_.append(samples, lower_);
    half_.resize(samples.size() / 2);
    for (std::size_t i = 0; i < half_.size(); ++i) half_[i] = samples[2 * i] + samples[2 * i + 1];
    decimator_.append(half_, lower_);
}

void Fingerprinter::measureSlope() {
    const std::size_t side = slopeTaps_.size();
    slope_.assign(lower_.size(), 0);
    lower_.insert(lower_.begin(), side, 0);
    lower_.resize(lower_.size() + side, 0);
    for (std::size_t tap = 1; tap <= side; ++tap) {
        const float weight = slopeTaps_[tap - 1];
        const float* const before = lower_.data() + side - tap;
        const float* const after = lower_.data() + side + tap;
        for (std::size_t i = 0; i < slope_.size(); ++i) slope_[i] += weight * (after[i] - before[i]);
    }
    lower_.erase(lower_.begin(), lower_.begin() + static_cast<std::ptrdiff_t>(side));
    lower_.resize(slope_.size());
}

// Where the slope is steepest, between samples: the top of a parabola through three of them.
void Fingerprinter::findPeaks() {
    peaks_.clear();
    for (std::size_t i = 1; i + 1 < slope_.size(); ++i) {
        const float here = std::abs(slope_[i]);
        if (here <= std::abs(slope_[i - 1]) || here < std::abs(slope_[i + 1])) continue;
        const float before = slope_[i - 1], after = slope_[i + 1];
        const float bend = before - 2 * slope_[i] + after;
        const float off = bend == 0 ? 0 : std::clamp(0.5F * (before - after) / bend, -0.5F, 0.5F);
        const float height = std::abs(slope_[i] - 0.25F * (before - after) * off);
        peaks_.push_back({static_cast<double>(i) + static_cast<double>(off), height});
    }
}

// Those that are the highest nearby, but of a stretch of time and of the whole only the highest ones of them.
void Fingerprinter::keepHighestPeaks() {
    float highest = 0;
    for (const Peak& peak : peaks_) highest = std::max(highest, peak.height);
    std::erase_if(peaks_,
                  [&](const Peak& peak) { return peak.height < kQuietest * highest || peak.height <= 0; });
    keepWhereFewerAreHigher(1, kAlone);
    keepWhereFewerAreHigher(kMostNearby, kNearby);
    std::sort(peaks_.begin(), peaks_.end(), isHigher);
}

// Of equally high ones the first counts as higher.
bool Fingerprinter::isHigher(const Peak& one, const Peak& other) {
    return one.height > other.height || (one.height == other.height && one.at < other.at);
}

/// Keeps the peaks that have fewer than `most` higher ones within so many seconds to both sides.
void Fingerprinter::keepWhereFewerAreHigher(std::size_t most, double seconds) {
    const double reach = seconds * decimator_.sampleRate();
    kept_.clear();
    std::size_t first = 0;
    for (const Peak& peak : peaks_) {
        while (peak.at - peaks_[first].at > reach) ++first;
        std::size_t higher = 0;
        for (std::size_t k = first; k < peaks_.size() && peaks_[k].at - peak.at <= reach && higher < most;
             ++k)
            if (isHigher(peaks_[k], peak)) ++higher;
        if (higher < most) kept_.push_back(peak);
    }
    peaks_.swap(kept_);
}

std::complex<float> Fingerprinter::phasorAt(double at, const Wavelet& wavelet) const {
    const auto middle = static_cast<std::ptrdiff_t>(std::lround(at));
    const auto reach = static_cast<std::ptrdiff_t>(wavelet.real.size() / 2);
    const auto size = static_cast<std::ptrdiff_t>(lower_.size());
    const auto from = std::max<std::ptrdiff_t>(0, middle - reach), end = std::min(size, middle + reach + 1);
    const float* const sample = lower_.data() + from;
    const float* const real = wavelet.real.data() + (from - middle + reach);
    const float* const imaginary = wavelet.imaginary.data() + (from - middle + reach);
    std::array<float, 4> reals{}, imaginaries{};
    std::ptrdiff_t i = 0;
    for (; i + 4 <= end - from; i += 4) {
        for (std::ptrdiff_t k = 0; k < 4; ++k) {
            reals[static_cast<std::size_t>(k)] += sample[i + k] * real[i + k];
            imaginaries[static_cast<std::size_t>(k)] += sample[i + k] * imaginary[i + k];
        }
    }
    for (; i < end - from; ++i) {
        reals[0] += sample[i] * real[i];
        imaginaries[0] += sample[i] * imaginary[i];
    }
    const auto off = static_cast<float>(2 * std::numbers::pi * wavelet.cyclesPerSample *
                                        (at - static_cast<double>(middle)));
    return std::complex<float>(reals[0] + reals[1] + reals[2] + reals[3],
                               imaginaries[0] + imaginaries[1] + imaginaries[2] + imaginaries[3]) *
           std::polar(1.0F, off);
}

SoundFingerprint::Landmark Fingerprinter::landmarkAt(const Peak& peak) const {
    std::array<std::complex<float>, kBands> phasors{};
    float strongest = 0;
    for (std::size_t b = 0; b < wavelets_.size(); ++b) {
        phasors[b] = phasorAt(peak.at, wavelets_[b]);
        strongest = std::max(strongest, std::abs(phasors[b]));
    }
    SoundFingerprint::Landmark found;
    for (std::size_t b = 0; b < wavelets_.size(); ++b) {
        const float level = std::abs(phasors[b]);
        if (level <= kFaint * strongest) continue;
        const float real = phasors[b].real(), imaginary = phasors[b].imag();
        found.hash |= (real < 0 ? 1U : 0U) << (2 * b) | (imaginary < 0 ? 2U : 0U) << (2 * b);
    }
    const double seconds = peak.at / decimator_.sampleRate();
    found.frame = static_cast<std::uint16_t>(std::lround(seconds / SoundFingerprint::kFrameSeconds));
    return found;
}

SoundFingerprint Fingerprinter::of(std::span<const float> samples) {
    if (sampleRate_ < kLowestRate) return {};
    const auto most = static_cast<std::size_t>(kMostSeconds * sampleRate_);
    measureLowerRate(samples.first(std::min(samples.size(), most)));
    measureSlope();
    findPeaks();
    keepHighestPeaks();
    SoundFingerprint print;
    for (const Peak& peak : peaks_) {
        if (print.landmarks.size() == SoundFingerprint::kMostLandmarks) break;
        print.landmarks.push_back(landmarkAt(peak));
    }
    std::sort(print.landmarks.begin(), print.landmarks.end(),
              [](const auto& one, const auto& other) { return one.frame < other.frame; });
    return print;
}

}  // namespace qvct
